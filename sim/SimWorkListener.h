#pragma once

// The client side of a long command, seen from the work: after each step it hears how far the
// work is (done of total) and says whether the client still wants it. The step's own time
// (`waitMs`, the pace of a slow instrument) passes inside, listening for a cancel.
class SimWorkListener {
 public:
  virtual ~SimWorkListener() = default;
  virtual bool Step(long long done, long long total, int waitMs) = 0;
};
