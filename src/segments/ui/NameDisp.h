#pragma once

#include "segments/ui/GridDisp.h"

// The grid column of names (traces, segments), as a resource names it ("NameDisp").
class NameDisp : public GridDisp {
  Q_OBJECT

 public:
  explicit NameDisp(QWidget* parent = nullptr) : GridDisp(Kind::kName, parent) {}
};
