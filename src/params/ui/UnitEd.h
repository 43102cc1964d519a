#pragma once

#include "params/ui/UnitLabel.h"

// The unit label of QenParEd; its units dialog is "unitsdlg.UnitsDialog".
class UnitEd : public UnitLabel {
  Q_OBJECT

 public:
  explicit UnitEd(QWidget* parent = nullptr);

 protected:
  unsigned ProcessUnitsDialog(UnitsRecord& units, ConditionList& list) override;
};
