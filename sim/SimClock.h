#pragma once

// The time base of the simulator's timed state changes. Injected so that tests move time
// by hand instead of sleeping.
class SimClock {
 public:
  virtual ~SimClock() = default;
  // Milliseconds since an arbitrary fixed origin; never decreases.
  virtual long long NowMs() const = 0;
};
