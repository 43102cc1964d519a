#pragma once

#include "params/ui/UnitLabel.h"

// The unit label of QenParLb; its units dialog is "lbundlg.UnitsDialog".
class LbUnitEd : public UnitLabel {
  Q_OBJECT

 public:
  explicit LbUnitEd(QWidget* parent = nullptr);

 protected:
  unsigned ProcessUnitsDialog(UnitsRecord& units, ConditionList& list) override;
};
