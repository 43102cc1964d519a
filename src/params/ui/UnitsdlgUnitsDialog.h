#pragma once

#include "params/UnitsData.h"
#include "params/ui/UnitsDialog.h"

// The units dialog of QenParEd fields, from the resource library "unitsdlg".
class UnitsdlgUnitsDialog : public UnitsDialog {
  Q_OBJECT

 public:
  explicit UnitsdlgUnitsDialog(QWidget* parent = nullptr) : UnitsDialog("unitsdlg", parent) {}
  unsigned LoadProcess(UnitsData* units, ConditionList& list) { return UnitsDialog::LoadProcess(units, list); }
};
