#include "params/ui/QenDsCBox.h"

#include <QStyleOptionComboBox>
#include <QStylePainter>
#include <QWheelEvent>

#include "params/ValueText.h"

QenDsCBox::QenDsCBox(QWidget* parent) : QComboBox(parent), BoundControl(this, "QenDsCBox") {
  setFocusPolicy(Qt::StrongFocus);
  setPlaceholderText(QString::fromLatin1(kNoValueText));
  connect(this, &QComboBox::activated, this, &QenDsCBox::HitItem);
}

void QenDsCBox::NfyInit() {
  if (!IsInitialised()) ReInitList();
  BoundControl::NfyInit();
}

void QenDsCBox::ReInitList() {
  mItems.clear();
  for (int i = 0; i < count(); ++i) {
    mItems.push_back(CBoxItem::FromLabel(itemText(i).toStdString()));
    setItemText(i, QString::fromStdString(mItems.back().shown));
  }
}

int QenDsCBox::Refresh(ConditionList& list) {
  Dstring reply;
  const int status = Binding().Query(IsSetupConfigFunction(), reply, list);
  if (status == 0 && Binding().GetDs() != nullptr) {
    mNoValue = ValueText::IsNoValue(reply);
    if (!mNoValue) {
      setCurrentIndex(-1);
      setCurrentIndex(CBoxItem::Choose(mItems, reply));
    }
    update();
  }
  ShowSourceState();
  return status;
}

QString QenDsCBox::ShownText() const {
  if (mNoValue || currentIndex() < 0) return QString::fromLatin1(kNoValueText);
  return currentText();
}

void QenDsCBox::paintEvent(QPaintEvent* event) {
  if (!mNoValue) return QComboBox::paintEvent(event);
  QStylePainter painter(this);
  QStyleOptionComboBox option;
  initStyleOption(&option);
  painter.drawComplexControl(QStyle::CC_ComboBox, option);
  option.palette.setBrush(QPalette::ButtonText, option.palette.placeholderText());
  option.currentText = ShownText();
  option.currentIcon = QIcon();
  painter.drawControl(QStyle::CE_ComboBoxLabel, option);
}

void QenDsCBox::HitItem(int index) {
  if (index < 0 || static_cast<std::size_t>(index) >= mItems.size()) return;
  ConditionList list;
  if (Binding().Write(IsSetupConfigFunction(), mItems[static_cast<std::size_t>(index)].ValueText(), list) != 0) Refresh(list);
  Report(list);
}

void QenDsCBox::wheelEvent(QWheelEvent* event) {
  if (hasFocus()) return QComboBox::wheelEvent(event);
  event->ignore();
}
