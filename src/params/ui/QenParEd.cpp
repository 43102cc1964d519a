#include "params/ui/QenParEd.h"

#include "params/ui/UnitEd.h"

QenParEd::QenParEd(QWidget* parent) : QenParField(parent, "QenParEd", new UnitEd) {}
