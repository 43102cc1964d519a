#pragma once

#include <QWidget>

#include "params/ParFieldState.h"
#include "params/ui/BoundControl.h"

class ParSpinBox;
class UnitLabel;

// A numeric parameter field with its unit label beside it: the value in base units shown
// scaled by the prefix the server keeps for it (":ATTR"), stepped by its step. QenParEd and
// QenParLb are its two names.
//
// Keys, in the terms of the field's commit table: Return is code 8 and Enter (keypad) code 10
// (commit); Tab and Backtab are code 7 (guard on; the focus loss that follows commits); Page
// Up and Page Down are codes 20 and 28 (swallowed: a page step is too coarse for a setting).
// Up and Down step by one, like the arrows, which are box elements 0 (up) and 2 (down).
// Escape brings back the value shown. The wheel steps only while the field has the focus.
class QenParField : public QWidget, public BoundControl {
  Q_OBJECT
  Q_PROPERTY(QString DsBaseName READ DsBaseNameProperty WRITE SetDsBaseNameProperty)
  Q_PROPERTY(QString DsCmdName READ DsCmdNameProperty WRITE SetDsCmdNameProperty)
  Q_PROPERTY(QColor BgColorFailed MEMBER mBgColorFailed)
  Q_PROPERTY(QColor FgColorFailed MEMBER mFgColorFailed)
  Q_PROPERTY(bool IsEnabled READ IsEnabled WRITE SetIsEnabled)
  Q_PROPERTY(bool ShowUnits READ ShowUnits WRITE SetShowUnits)
  Q_PROPERTY(bool IsSetupConfigParameter READ IsSetupConfigParameter WRITE SetIsSetupConfigParameter)

 public:
  ~QenParField() override;

  void NfyInit() override;
  // Reads the value, then the unit label reads the attribute and redisplays.
  int Refresh(ConditionList& list) override;
  int RefreshUnits(ConditionList& list) override;

  Dstring FormatValue(double value) const;
  void DisplayValue(double value);
  // Parses the text, adds `steps` steps and writes (see ParFieldState). A commit marks the
  // field, and tells the status bar, when it left part of the text out (Notice()).
  int AdjustAndSend(int steps, ConditionList& list);
  // The field and its unit label together.
  void SetEnabledComplete(bool enabled);

  bool IsEnabled() const { return mIsEnabled; }
  void SetIsEnabled(bool enabled);
  bool ShowUnits() const { return mShowUnits; }
  void SetShowUnits(bool show);

  ParFieldState& State() { return mState; }
  const ParFieldState& State() const { return mState; }
  UnitLabel* GetUnitLabel() const { return mUnitLabel; }
  ParSpinBox* Editor() const { return mSpin; }

  // The commit table, as the editor calls it.
  void CommitOnFocusLoss();
  void CommitOnKey();
  void GuardUntilFocusLoss();
  bool IsSending() const { return mSending; }
  bool CanStep() const;
  void Step(int steps);

 protected:
  QenParField(QWidget* parent, std::string_view className, UnitLabel* unitLabel);

 private:
  void Commit(int steps);
  // Marks the field when the instrument holds another value than the one just asked.
  void ShowAdjusted();

  ParFieldState mState;
  ParSpinBox* mSpin;
  UnitLabel* mUnitLabel;
  bool mSending = false;
  bool mIsEnabled = true;
  bool mShowUnits = true;
};
