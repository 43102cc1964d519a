#pragma once

// The simulated instrument the simulator's fuzz targets run their inputs on: qensim's command
// processor on the default configuration and a clock that stands still. It is made anew every
// kRenew inputs and connection 1 is dropped at every input, so state carries over a little,
// which reaches deeper, but memory cannot pile up: segments stay in memory while qensim runs.
#include <memory>

#include "SimClock.h"
#include "SimCommandProcessor.h"
#include "SimConfigLoader.h"

extern const char* const kSimDefaultConfigText;

namespace fuzzinstrument {

constexpr int kRenew = 64;

inline void Check(bool ok) {
  if (!ok) __builtin_trap();
}

class FixedClock : public SimClock {
 public:
  long long NowMs() const override { return 1000; }
};

inline const SimParamTable& Configured() {
  static const SimParamTable table = [] {
    SimParamTable t;
    ConditionList list;
    Check(SimConfigLoader::Load(kSimDefaultConfigText, t, list) == 0);
    return t;
  }();
  return table;
}

// The instrument for the next input, with connection 1 fresh.
inline SimCommandProcessor& Instrument() {
  static const FixedClock clock;
  static std::unique_ptr<SimCommandProcessor> sim;
  static int runs = 0;
  if (runs++ % kRenew == 0) sim = std::make_unique<SimCommandProcessor>(Configured(), clock, false);
  sim->Disconnect(1);
  return *sim;
}

}  // namespace fuzzinstrument
