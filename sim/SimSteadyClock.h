#pragma once

#include "SimClock.h"

// The real monotonic clock.
class SimSteadyClock : public SimClock {
 public:
  long long NowMs() const override;
};
