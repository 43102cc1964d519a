#include "params/ui/QenDsSTEd.h"

#include "instrument/QenStatus.h"
#include "params/ValueText.h"

QenDsSTEd::QenDsSTEd(QWidget* parent) : QLineEdit(parent), BoundControl(this, "QenDsSTEd") {
  connect(this, &QLineEdit::returnPressed, this, &QenDsSTEd::HitReturn);
}

int QenDsSTEd::Refresh(ConditionList& list) {
  Dstring reply;
  const int status = Binding().Query(false, reply, list);
  if (status == 0 && Binding().GetDs() != nullptr) {
    setText(ValueText::IsNoValue(reply) ? QString() : QString::fromStdString(reply));
    setModified(false);
    mRefused = false;
  }
  ShowSourceState();
  return status;
}

int QenDsSTEd::SendValue(ConditionList& list) {
  if (isReadOnly()) return 0;
  setModified(false);
  // A refused text stays in the field for the user to correct.
  const int status = Binding().Write(false, text().toStdString(), list);
  mRefused = status != 0 && status != QenStatus::kLocked;
  ShowSourceState();
  return status;
}

void QenDsSTEd::HitReturn() {
  ConditionList list;
  SendValue(list);
  Report(list);
}

// Leaving the field, or its window while it has the focus, writes the text as it stands; the
// text just refused goes out again only once changed (the error dialog itself takes the focus).
void QenDsSTEd::focusOutEvent(QFocusEvent* event) {
  if (!mRefused || isModified()) {
    ConditionList list;
    SendValue(list);
    Report(list);
  }
  QLineEdit::focusOutEvent(event);
}
