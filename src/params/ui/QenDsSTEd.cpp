#include "params/ui/QenDsSTEd.h"

#include <QEvent>

#include "instrument/QenStatus.h"
#include "params/ValueText.h"
#include "support/DataParcel.h"
#include "support/ParserExpression.h"

namespace {

// A reply that is one quoted string, as the text inside; anything else as it came.
QString PlainText(const Dstring& reply) {
  DataParcel parcel;
  ConditionList ignored;
  if (ParserExpression::Parse(reply, parcel, ignored) == 0 && parcel.size() == 1 && parcel[0].IsText()) {
    return QString::fromStdString(Dstring(parcel[0].GetText()));
  }
  return QString::fromStdString(reply);
}

}  // namespace

QenDsSTEd::QenDsSTEd(QWidget* parent) : QLineEdit(parent), BoundControl(this, "QenDsSTEd") {
  connect(this, &QLineEdit::returnPressed, this, &QenDsSTEd::HitReturn);
}

int QenDsSTEd::Refresh(ConditionList& list) {
  Dstring reply;
  const int status = Binding().Query(false, reply, list);
  if (status == 0 && Binding().GetDs() != nullptr) {
    if (ValueText::IsNoValue(reply)) {
      setText(QString());
    } else {
      setText(isReadOnly() ? PlainText(reply) : QString::fromStdString(reply));
    }
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

void QenDsSTEd::changeEvent(QEvent* event) {
  if (event->type() == QEvent::ReadOnlyChange) {
    setFrame(!isReadOnly());
    QPalette shown = palette();
    shown.setColor(QPalette::Base, isReadOnly() ? shown.color(QPalette::Window) : QPalette().color(QPalette::Base));
    setPalette(shown);
  }
  QLineEdit::changeEvent(event);
}
