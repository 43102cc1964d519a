#include "params/ui/LbUnitEd.h"

#include "params/ui/LbUnitsdlgUnitsDialog.h"

LbUnitEd::LbUnitEd(QWidget* parent) { setParent(parent); }

unsigned LbUnitEd::ProcessUnitsDialog(UnitsRecord& units, ConditionList& list) {
  return RunUnitsDialog<LbUnitsdlgUnitsDialog, LbUnitsData>(units, list);
}
