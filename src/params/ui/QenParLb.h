#pragma once

#include "params/ui/QenParField.h"

// The list-box twin of QenParEd: the unit label LbUnitEd and the units dialog of "lbundlg".
class QenParLb : public QenParField {
  Q_OBJECT

 public:
  explicit QenParLb(QWidget* parent = nullptr);
};
