#pragma once

#include <string_view>

#include "SimParamTable.h"
#include "support/ConditionList.h"

// Reads the instrument configuration (docs/simulator.md, "Configuration"): models, unit
// defaults, global parameters, the clock groups with their modules and ports, and the
// templates that give each of them its parameters and coupling rules.
class SimConfigLoader {
 public:
  // Fills an empty table. Returns 0, or 1 with a condition naming the line of the first problem.
  static int Load(std::string_view text, SimParamTable& table, ConditionList& list);
};
