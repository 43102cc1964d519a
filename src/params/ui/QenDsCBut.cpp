#include "params/ui/QenDsCBut.h"

QenDsCBut::QenDsCBut(QWidget* parent) : QCheckBox(parent), BoundControl(this, "QenDsCBut") {
  connect(this, &QCheckBox::clicked, this, &QenDsCBut::HitButton);
}

int QenDsCBut::Refresh(ConditionList& list) {
  Dstring reply;
  const int status = Binding().Query(IsSetupConfigFunction(), reply, list);
  if (status == 0 && Binding().GetDs() != nullptr) {
    const QString value = QString::fromStdString(reply);
    if (value == mOnValue) {
      setChecked(true);
    } else if (value == mOffValue) {
      setChecked(false);
    }
  }
  ShowSourceState();
  update();
  return status;
}

void QenDsCBut::HitButton(bool checked) {
  ConditionList list;
  const QString& value = checked ? mOnValue : mOffValue;
  if (Binding().Write(IsSetupConfigFunction(), value.toStdString(), list) != 0) Refresh(list);
  Report(list);
}
