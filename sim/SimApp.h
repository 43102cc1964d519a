#pragma once

#include "SimOptions.h"

// Puts the simulator together from its options: configuration, data directory, command
// processor and server; then serves until stopped.
class SimApp {
 public:
  // The process exit code: 0 after a stop signal or a test-control "die", 1 when it
  // could not start.
  static int Run(const SimOptions& options);
};
