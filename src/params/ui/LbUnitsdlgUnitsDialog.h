#pragma once

#include "params/LbUnitsData.h"
#include "params/ui/UnitsDialog.h"

// The units dialog of QenParLb fields, from the resource library "lbundlg".
class LbUnitsdlgUnitsDialog : public UnitsDialog {
  Q_OBJECT

 public:
  explicit LbUnitsdlgUnitsDialog(QWidget* parent = nullptr) : UnitsDialog("lbundlg", parent) {}
  unsigned LoadProcess(LbUnitsData* units, ConditionList& list) { return UnitsDialog::LoadProcess(units, list); }
};
