#pragma once

#include <functional>

// A running clock in seconds since the last Reset. The clock source can be replaced,
// so that the poller is driven by a fake clock in tests.
class MeasTimer {
 public:
  using Clock = std::function<double()>;

  MeasTimer();
  explicit MeasTimer(Clock clock);

  void Reset() { mStart = mClock(); }
  double Get() const { return mClock() - mStart; }
  void SetClock(Clock clock);

  // Seconds of a monotonic clock.
  static double SteadySeconds();

 private:
  Clock mClock;
  double mStart = 0.0;
};
