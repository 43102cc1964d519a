#include "params/UnitsDialogTable.h"

const std::array<UnitsDialogTable::PrefixButton, 8>& UnitsDialogTable::PrefixButtons() {
  static const std::array<PrefixButton, 8> kButtons = {{
      {"RButUnitGiga", 9},  {"RButUnitMega", 6},  {"RButUnitKilo", 3},  {"RBut1Unit", 0},
      {"RButUnitMilli", -3}, {"RButUnitMicro", -6}, {"RButUnitNano", -9}, {"RButUnitPico", -12},
  }};
  return kButtons;
}

const std::array<UnitsDialogTable::StepButton, 7>& UnitsDialogTable::StepButtons() {
  static const std::array<StepButton, 7> kButtons = {{
      {"RButStep1000", 1000},
      {"RButStep100", 100},
      {"RButStep10", 10},
      {"RButStep1", 1},
      {"RButStep_1", 0.1},
      {"RButStep_01", 0.01},
      {"RButStep_001", 0.001},
  }};
  return kButtons;
}

int UnitsDialogTable::StepButtonIndex(double step) {
  static const double kThresholds[] = {500, 50, 5, 0.5, 0.05, 0.005};
  int count = 0;
  for (double t : kThresholds) count += t > step ? 1 : 0;
  return count;
}
