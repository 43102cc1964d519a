#include "params/ui/QenDsRBut.h"

QenDsRBut::QenDsRBut(QWidget* parent) : QRadioButton(parent), BoundControl(this, "QenDsRBut") {
  connect(this, &QRadioButton::clicked, this, &QenDsRBut::HitButton);
}

// An exclusive group will not let its selected button go; the instrument may deselect it.
void QenDsRBut::Select(bool on) {
  if (isChecked() == on) return;
  const bool exclusive = autoExclusive();
  setAutoExclusive(false);
  setChecked(on);
  setAutoExclusive(exclusive);
}

int QenDsRBut::Refresh(ConditionList& list) {
  Dstring reply;
  const int status = Binding().Query(IsSetupConfigFunction(), reply, list);
  if (status == 0 && Binding().GetDs() != nullptr) Select(QString::fromStdString(reply) == mOnValue);
  ShowSourceState();
  return status;
}

void QenDsRBut::HitButton(bool checked) {
  if (!checked) return;
  ConditionList list;
  if (Binding().Write(IsSetupConfigFunction(), mOnValue.toStdString(), list) != 0 && parentWidget() != nullptr) {
    // The group shows the instrument's choice again, not the one refused.
    for (auto* button : parentWidget()->findChildren<QenDsRBut*>(QString(), Qt::FindDirectChildrenOnly)) {
      if (button->GetDsName() == GetDsName()) button->Refresh(list);
    }
  }
  Report(list);
}
