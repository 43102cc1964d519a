#pragma once

#include <QCheckBox>

#include "params/ui/BoundControl.h"

// A check button bound to a parameter: checked when the instrument holds OnValue, unchecked
// for OffValue; a click writes the one it now stands for.
class QenDsCBut : public QCheckBox, public BoundControl {
  Q_OBJECT
  Q_PROPERTY(QString DsBaseName READ DsBaseNameProperty WRITE SetDsBaseNameProperty)
  Q_PROPERTY(QString DsCmdName READ DsCmdNameProperty WRITE SetDsCmdNameProperty)
  Q_PROPERTY(QString OnValue MEMBER mOnValue)
  Q_PROPERTY(QString OffValue MEMBER mOffValue)
  Q_PROPERTY(QColor BgColorFailed MEMBER mBgColorFailed)
  Q_PROPERTY(QColor FgColorFailed MEMBER mFgColorFailed)
  Q_PROPERTY(bool IsSetupConfigFunction READ IsSetupConfigFunction WRITE SetIsSetupConfigFunction)
  Q_PROPERTY(bool IsSetupConfigParameter READ IsSetupConfigParameter WRITE SetIsSetupConfigParameter)

 public:
  explicit QenDsCBut(QWidget* parent = nullptr);

  int Refresh(ConditionList& list) override;

  QString mOnValue;
  QString mOffValue;

 private:
  void HitButton(bool checked);

};
