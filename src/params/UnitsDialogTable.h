#pragma once

#include <array>
#include <cstdint>

// The buttons of the units dialog and the values they stand for.
class UnitsDialogTable {
 public:
  // Labelled with the prefix of its exponent (UnitsRecord::PrefixOf) and the unit.
  struct PrefixButton {
    const char* name;
    std::int32_t exp;
  };
  struct StepButton {
    const char* name;
    double step;
  };

  static const std::array<PrefixButton, 8>& PrefixButtons();
  // Ordered from the largest step down.
  static const std::array<StepButton, 7>& StepButtons();
  // The step button selected for `step`: the count of thresholds 500, 50, 5, 0.5, 0.05,
  // 0.005 that exceed it (a step of 20 shows as 10, one of 0.3 as 0.1).
  static int StepButtonIndex(double step);
};
