#pragma once

#include "params/ui/QenParField.h"

// The parameter field with the unit label UnitEd and the units dialog of "unitsdlg".
class QenParEd : public QenParField {
  Q_OBJECT

 public:
  explicit QenParEd(QWidget* parent = nullptr);
};
