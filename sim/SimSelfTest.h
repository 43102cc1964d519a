#pragma once

#include <vector>

#include "SimCommandModule.h"

// The instrument's self test: every module is tested in turn, kSecondsPerModule each, while
// the client asks how far it is. Commands under the handle:
//   ":SYST:TEST:STAR"   starts it (-200 while the instrument runs or a test is going on)
//   ":SYST:TEST:STAT?"  "IDLE|RUNN|DONE|ABOR",<modules done>,<modules>
//   ":SYST:TEST:RES?"   ("<module>","<model>","PASS|FAIL|NRUN","<detail>"),... of the last test
//   ":SYST:TEST:ABOR"   stops it; modules not yet tested are "NRUN"
//   ":SYST:TEST:FAIL \"<module>\"" (test control) makes that module fail from then on; "" clears.
//   ":SYST:TEST:PACE MS" (test control) the time one module takes, kSecondsPerModule at start.
class SimSelfTest : public SimCommandModule {
 public:
  static constexpr double kSecondsPerModule = 0.6;

  bool RunHandleCommand(const Dstring& rest, const SimCommand& cmd, SimContext& context) override;
  void Advance(SimContext& context) override;

 private:
  enum class State { Idle, Running, Done, Aborted };
  struct Module {
    Dstring path;  // ":CGR1:MOD2"
    Dstring model;
    Dstring result;
    Dstring detail;
  };

  void Start(SimContext& context);
  void Finish(std::size_t upTo);
  static const char* Word(State state);

  State mState = State::Idle;
  std::vector<Module> mModules;
  long long mStartMs = 0;
  std::size_t mDone = 0;
  Dstring mFailing;
  double mSecondsPerModule = kSecondsPerModule;
};
