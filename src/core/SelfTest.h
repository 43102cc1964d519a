#pragma once

#include <vector>

#include "support/ConditionList.h"
#include "support/Dstring.h"

// The instrument's self test, as the self test tool drives it: start, ask how far it is,
// read the outcome per module, cancel. A test runs on the instrument for some seconds; the
// tool asks its progress while the program goes on. The window that shows it is the Tool,
// which the Qt layer registers; uiapp::DoSelfTest hands over to it.
class SelfTest {
 public:
  enum class State { Idle, Running, Done, Aborted };
  struct Progress {
    State state = State::Idle;
    unsigned long done = 0;
    unsigned long total = 0;
  };
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

  static int Start(ConditionList& list);
  static int Ask(Progress& out, ConditionList& list);
  static int Results(std::vector<ModuleResult>& out, ConditionList& list);
  static int Cancel(ConditionList& list);

 private:
  static inline Tool* sTool = nullptr;
};
