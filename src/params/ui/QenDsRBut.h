#pragma once

#include <QRadioButton>

#include "params/ui/BoundControl.h"

// A radio button bound to a parameter: selected while the instrument holds its OnValue; a
// click that selects it writes that value.
class QenDsRBut : public QRadioButton, public BoundControl {
  Q_OBJECT
  Q_PROPERTY(QString DsBaseName READ DsBaseNameProperty WRITE SetDsBaseNameProperty)
  Q_PROPERTY(QString DsCmdName READ DsCmdNameProperty WRITE SetDsCmdNameProperty)
  Q_PROPERTY(QString OnValue MEMBER mOnValue)
  Q_PROPERTY(QColor BgColorFailed MEMBER mBgColorFailed)
  Q_PROPERTY(QColor FgColorFailed MEMBER mFgColorFailed)
  Q_PROPERTY(bool IsDisabled READ IsDisabled WRITE SetIsDisabled)
  Q_PROPERTY(bool IsSetupConfigFunction READ IsSetupConfigFunction WRITE SetIsSetupConfigFunction)
  Q_PROPERTY(bool IsSetupConfigParameter READ IsSetupConfigParameter WRITE SetIsSetupConfigParameter)

 public:
  explicit QenDsRBut(QWidget* parent = nullptr);

  int Refresh(ConditionList& list) override;

  QString mOnValue;

 private:
  void HitButton(bool checked);
  void Select(bool on);

};
