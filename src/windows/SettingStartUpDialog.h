#pragma once

#include <QDialog>

#include "settings/SettingStartUp.h"

class QCheckBox;
class QComboBox;
class QLabel;
class QRadioButton;

// The start-up dialog: keep what the instrument holds, start a new setting, or load one of the
// settings the instrument keeps (with or without its cable delays), and whether to ask again
// at the next start. The choice becomes the start-up configuration of the parameter set. When
// the last choice did not check out, it says why above the buttons.
class SettingStartUpDialog : public QDialog, public SettingStartUp::Dialog {
  Q_OBJECT

 public:
  explicit SettingStartUpDialog(QWidget* parent = nullptr);

  bool Ask(StartUpConfig& config, const DstringList& names, const ConditionList& problems) override;

  // Shows the dialog over `config` without running it (a picture, a test that answers it).
  void Fill(const StartUpConfig& config, const DstringList& names, const ConditionList& problems);
  void Take(StartUpConfig& config) const;

  QRadioButton* KeepButton() const { return mKeep; }
  QRadioButton* NewButton() const { return mNew; }
  QRadioButton* LoadButton() const { return mLoad; }
  QComboBox* NameBox() const { return mName; }
  QCheckBox* CableDelayBox() const { return mCableDelay; }
  QCheckBox* ShowDialogBox() const { return mShowDialog; }
  QLabel* ProblemLabel() const { return mProblem; }

 private:
  void NfyChoiceChanged();

  QRadioButton* mKeep;
  QRadioButton* mNew;
  QRadioButton* mLoad;
  QComboBox* mName;
  QCheckBox* mCableDelay;
  QCheckBox* mShowDialog;
  QLabel* mProblem;
};
