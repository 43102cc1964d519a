#pragma once

#include "segments/ui/GridDisp.h"

// The grid column of vector addresses, as a resource names it ("AddrDisp").
class AddrDisp : public GridDisp {
  Q_OBJECT

 public:
  explicit AddrDisp(QWidget* parent = nullptr) : GridDisp(Kind::kAddr, parent) {}
};
