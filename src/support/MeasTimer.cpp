#include "support/MeasTimer.h"

#include <chrono>

MeasTimer::MeasTimer() : MeasTimer(&MeasTimer::SteadySeconds) {}

MeasTimer::MeasTimer(Clock clock) : mClock(std::move(clock)) { Reset(); }

void MeasTimer::SetClock(Clock clock) {
  mClock = std::move(clock);
  Reset();
}

double MeasTimer::SteadySeconds() {
  using namespace std::chrono;
  return duration<double>(steady_clock::now().time_since_epoch()).count();
}
