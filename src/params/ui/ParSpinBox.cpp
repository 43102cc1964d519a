#include "params/ui/ParSpinBox.h"

#include <QContextMenuEvent>
#include <QKeyEvent>
#include <QLineEdit>

#include "params/ui/QenParField.h"
#include "params/ui/UnitLabel.h"

ParSpinBox::ParSpinBox(QenParField& field) : QAbstractSpinBox(&field), mField(field) {
  setFocusPolicy(Qt::StrongFocus);
  setKeyboardTracking(false);
  setButtonSymbols(QAbstractSpinBox::UpDownArrows);
}

// The field always shows what the instrument holds, also over text the user is typing.
void ParSpinBox::ShowText(const QString& text) {
  mUpdating = true;
  lineEdit()->setText(text);
  lineEdit()->setModified(false);
  mUpdating = false;
}

QString ParSpinBox::Text() const { return lineEdit()->text(); }

void ParSpinBox::stepBy(int steps) { mField.Step(steps); }

QAbstractSpinBox::StepEnabled ParSpinBox::stepEnabled() const {
  if (!mField.CanStep()) return StepNone;
  return StepUpEnabled | StepDownEnabled;
}

// Tab moves the focus before a key handler sees it: the guard goes on here, and the focus
// loss that follows commits and clears it.
bool ParSpinBox::event(QEvent* event) {
  if (event->type() == QEvent::KeyPress) {
    const int key = static_cast<QKeyEvent*>(event)->key();
    if (key == Qt::Key_Tab || key == Qt::Key_Backtab) mField.GuardUntilFocusLoss();
  }
  return QAbstractSpinBox::event(event);
}

void ParSpinBox::contextMenuEvent(QContextMenuEvent* event) {
  if (event->reason() != QContextMenuEvent::Keyboard || mField.GetUnitLabel() == nullptr) {
    QAbstractSpinBox::contextMenuEvent(event);
    return;
  }
  mField.GetUnitLabel()->ShowPopupMenu(mapToGlobal(QPoint(0, height())));
}

void ParSpinBox::keyPressEvent(QKeyEvent* event) {
  if (event->key() == Qt::Key_F10 && event->modifiers() == Qt::ShiftModifier) {
    QContextMenuEvent menu(QContextMenuEvent::Keyboard, QPoint(0, height()), mapToGlobal(QPoint(0, height())));
    contextMenuEvent(&menu);
    return;
  }
  switch (event->key()) {
    case Qt::Key_Return:
    case Qt::Key_Enter:
      lineEdit()->setModified(false);
      mField.CommitOnKey();
      lineEdit()->selectAll();
      return;
    case Qt::Key_PageUp:
    case Qt::Key_PageDown:
      return;
    case Qt::Key_Escape:
      lineEdit()->setModified(false);
      ShowText(QString::fromStdString(mField.State().DisplayText()));
      return;
    default:
      QAbstractSpinBox::keyPressEvent(event);
  }
}

void ParSpinBox::focusOutEvent(QFocusEvent* event) {
  lineEdit()->setModified(false);
  mField.CommitOnFocusLoss();
  QAbstractSpinBox::focusOutEvent(event);
}

void ParSpinBox::wheelEvent(QWheelEvent* event) {
  if (hasFocus()) return QAbstractSpinBox::wheelEvent(event);
  event->ignore();
}
