#include "SimSteadyClock.h"

#include <chrono>

long long SimSteadyClock::NowMs() const {
  using namespace std::chrono;
  return duration_cast<milliseconds>(steady_clock::now().time_since_epoch()).count();
}
