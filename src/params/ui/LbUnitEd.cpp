#include "params/ui/LbUnitEd.h"

LbUnitEd::LbUnitEd(QWidget* parent) : UnitLabel("lbundlg") { setParent(parent); }
