#include "params/ui/QenParLb.h"

#include "params/ui/LbUnitEd.h"

QenParLb::QenParLb(QWidget* parent) : QenParField(parent, "QenParLb", new LbUnitEd) {}
