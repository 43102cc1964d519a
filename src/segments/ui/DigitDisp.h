#pragma once

#include "segments/ui/GridDisp.h"

// The grid column of the data digits, as a resource names it ("DigitDisp").
class DigitDisp : public GridDisp {
  Q_OBJECT

 public:
  explicit DigitDisp(QWidget* parent = nullptr) : GridDisp(Kind::kDigit, parent) {}
};
