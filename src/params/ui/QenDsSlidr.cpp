#include "params/ui/QenDsSlidr.h"

#include <QWheelEvent>
#include <cmath>

#include "params/ValueText.h"
#include "support/FWBlocker.h"

QenDsSlidr::QenDsSlidr(QWidget* parent) : QSlider(parent), BoundControl(this, "QenDsSlidr") {
  setTracking(false);
  setFocusPolicy(Qt::StrongFocus);
  connect(this, &QSlider::valueChanged, this, &QenDsSlidr::HitValue);
}

void QenDsSlidr::NfyInit() {
  if (!IsInitialised()) mThumbNormal = palette();
  BoundControl::NfyInit();
}

void QenDsSlidr::ShowPosition(double value) {
  mUpdating = true;
  setSliderPosition(static_cast<int>(std::trunc(value * Denominator())));
  setValue(sliderPosition());
  mUpdating = false;
}

void QenDsSlidr::ShowThumbColour() {
  QPalette thumb = mThumbNormal;
  QColor colour;
  if (Binding().IsFailed()) {
    colour = mColorFailed;
  } else if (Binding().IsClashing()) {
    colour = mColorClashing;
  }
  if (colour.isValid()) {
    thumb.setColor(QPalette::Button, colour);
    thumb.setColor(QPalette::Highlight, colour);
  }
  setPalette(thumb);
  setToolTip(QString::fromStdString(Binding().ToolTip()));
}

int QenDsSlidr::Refresh(ConditionList& list) {
  Dstring reply;
  const int status = Binding().Query(false, reply, list);
  const double value = ValueText::ReadReplyNumber(reply);
  if (status == 0 && Binding().GetDs() != nullptr && !std::isnan(value) && !ValueText::IsNoValue(reply)) {
    ShowPosition(value);
  }
  ShowThumbColour();
  return status;
}

int QenDsSlidr::NfyPropose(int position, ConditionList& list) {
  FWBlocker blocker("QenDsSlidr::NfyPropose", list);
  if (int blocked = blocker.Block()) return blocked;
  if (Binding().GetDs() == nullptr || DsBinding::IsDesignMode()) return 0;
  const double asked = position / Denominator();
  int status = Binding().Write(false, Dstring::Format("%g", asked), list);
  Dstring reply;
  if (status == 0) status = Binding().Query(false, reply, list);
  const double held = ValueText::ReadReplyNumber(reply);
  if (status == 0 && !std::isnan(held)) {
    ShowPosition(held);
    if (static_cast<int>(std::trunc(held * Denominator())) != position) {
      MarkAdjusted(QString::number(held, 'g', 12), QString::number(asked, 'g', 12));
    }
  } else {
    Refresh(list);
  }
  ShowThumbColour();
  return status;
}

void QenDsSlidr::HitValue(int position) {
  if (mUpdating) return;
  ConditionList list;
  NfyPropose(position, list);
  Report(list);
}

void QenDsSlidr::wheelEvent(QWheelEvent* event) {
  if (hasFocus()) return QSlider::wheelEvent(event);
  event->ignore();
}
