#pragma once

#include <vector>

#include "core/InstrumentTask.h"
#include "support/ConditionList.h"
#include "support/Dstring.h"

// The instrument's self test (":SYST:TEST", an InstrumentTask) and the outcome per module. The
// window that runs it is the Tool, which the window layer registers; uiapp::DoSelfTest hands
// over to it.
class SelfTest {
 public:
  struct ModuleResult {
    Dstring module;  // ":CGR1:MOD2"
    Dstring model;
    Dstring result;  // "PASS", "FAIL" or "NRUN" (not run: the test was cancelled first)
    Dstring detail;
    bool operator==(const ModuleResult&) const = default;
  };

  class Tool {
   public:
    virtual ~Tool() = default;
    // Starts the test and shows it.
    virtual int Run(ConditionList& list) = 0;
  };
  static void SetTool(Tool* tool) { sTool = tool; }
  static Tool* GetTool() { return sTool; }

  static InstrumentTask Task() { return InstrumentTask(":SYST:TEST"); }
  static int Results(std::vector<ModuleResult>& out, ConditionList& list);

 private:
  static inline Tool* sTool = nullptr;
};
