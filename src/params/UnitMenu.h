#pragma once

#include "params/UnitsRecord.h"

// The logic of a unit label's popup menu. Prefix items carry the id 100 + exponent, step
// items 200 + the decimal exponent of the step; 300 opens the units dialog.
class UnitMenu {
 public:
  static constexpr int kPrefixMenu = 100;
  static constexpr int kStepMenu = 200;
  static constexpr int kUnitsDialog = 300;
  // The prefix items in menu order, and the first and last step exponent offered.
  static constexpr const char* kPrefixLetters = "GMk munp";
  static constexpr int kFirstStepExp = 3;
  static constexpr int kLastStepExp = -3;

  // The id of the prefix item at `index` of kPrefixLetters (G is 109, p is 88).
  static int PrefixItemId(int index) { return kPrefixMenu + 9 - 3 * index; }
  static bool IsPrefixItemVisible(int id, const UnitsRecord& units) {
    return units.minExp + kPrefixMenu <= id && id <= units.maxExp + kPrefixMenu;
  }
  // The prefix item's label: its letter and the unit.
  static Dstring PrefixItemLabel(int index, const UnitsRecord& units);
  // The step item checked for `step`: the nearest power of ten.
  static int CheckedStepItemId(double step);
  static Dstring StepItemLabel(int id);
  // Applies a menu choice to `units`; false when the id is none of the label's own.
  static bool Apply(int id, UnitsRecord& units);
};
