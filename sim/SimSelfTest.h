#pragma once

#include <vector>

#include "SimTimedTask.h"

// The instrument's self test (":SYST:TEST", see SimTimedTask): every module is tested in turn,
// 0.6 s each. Besides the task's commands:
//   ":SYST:TEST:RES?"  ("<module>","<model>",PASS|FAIL|NRUN,"<detail>"),... of the last test
//   ":SYST:TEST:FAIL \"<module>\"" (test control) makes that module fail from then on; "" clears.
class SimSelfTest : public SimTimedTask {
 public:
  SimSelfTest() : SimTimedTask(":SYST:TEST", 0.6) {}

 protected:
  std::size_t Begin(SimContext& context) override;
  void ItemDone(std::size_t item, SimContext& context) override;
  void Aborted(std::size_t, SimContext&) override {}
  bool RunTaskCommand(const Dstring& what, const SimCommand& cmd, SimContext& context) override;

 private:
  struct Module {
    Dstring path;  // ":CGR1:MOD2"
    Dstring model;
    Dstring result;
    Dstring detail;
  };

  std::vector<Module> mModules;
  Dstring mFailing;
};
