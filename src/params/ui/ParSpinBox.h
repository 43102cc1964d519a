#pragma once

#include <QAbstractSpinBox>

class QenParField;

// The editor inside a parameter field: a text element between a step-up arrow (box element
// 0) and a step-down arrow (box element 2). It hands keys, steps and focus loss to its field.
class ParSpinBox : public QAbstractSpinBox {
 public:
  explicit ParSpinBox(QenParField& field);

  void stepBy(int steps) override;
  // Replaces the text without it counting as the user's.
  void ShowText(const QString& text);
  bool IsUpdating() const { return mUpdating; }
  QString Text() const;

 protected:
  StepEnabled stepEnabled() const override;
  bool event(QEvent* event) override;
  void keyPressEvent(QKeyEvent* event) override;
  // From the keyboard (the menu key) the unit's prefix and step menu, from the mouse the text's.
  void contextMenuEvent(QContextMenuEvent* event) override;
  void focusOutEvent(QFocusEvent* event) override;
  void wheelEvent(QWheelEvent* event) override;

 private:
  QenParField& mField;
  bool mUpdating = false;
};
