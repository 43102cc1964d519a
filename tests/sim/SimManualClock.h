#pragma once

#include "SimClock.h"

// Time that moves only when a test says so.
class SimManualClock : public SimClock {
 public:
  long long NowMs() const override { return mNowMs; }
  void Advance(long long ms) { mNowMs += ms; }

 private:
  long long mNowMs = 1000;
};
