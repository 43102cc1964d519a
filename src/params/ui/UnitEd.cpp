#include "params/ui/UnitEd.h"

UnitEd::UnitEd(QWidget* parent) : UnitLabel("unitsdlg") { setParent(parent); }
