#include "params/ui/UnitEd.h"

#include "params/ui/UnitsdlgUnitsDialog.h"

UnitEd::UnitEd(QWidget* parent) { setParent(parent); }

unsigned UnitEd::ProcessUnitsDialog(UnitsRecord& units, ConditionList& list) {
  return RunUnitsDialog<UnitsdlgUnitsDialog, UnitsData>(units, list);
}
