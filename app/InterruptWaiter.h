#pragma once

#include <atomic>

#include "instrument/CallWaiter.h"

// Gives up a wait for the instrument as soon as the user interrupts the program (Ctrl+C), so
// that a host without a window answers at once, also while the instrument is slow.
class InterruptWaiter : public CallWaiter {
 public:
  // Safe in a signal handler.
  static void Interrupt() { sInterrupted = true; }
  static bool IsInterrupted() { return sInterrupted; }

  bool Wait(const Dstring&, long long) override { return sInterrupted; }

 private:
  static inline std::atomic<bool> sInterrupted{false};
};
