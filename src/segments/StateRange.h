#pragma once

// A rectangle of states: first and last trace, first and last vector (all inclusive). Range
// commands send it as first trace, first vector, last trace, last vector.
class StateRange {
 public:
  StateRange() = default;
  StateRange(long firstTrace, long firstVector, long lastTrace, long lastVector)
      : mFirstTrace(firstTrace), mFirstVector(firstVector), mLastTrace(lastTrace), mLastVector(lastVector) {}

  long GetFirstTrace() const { return mFirstTrace; }
  long GetFirstVector() const { return mFirstVector; }
  long GetLastTrace() const { return mLastTrace; }
  long GetLastVector() const { return mLastVector; }

  bool operator==(const StateRange&) const = default;

 private:
  long mFirstTrace = 0;
  long mFirstVector = 0;
  long mLastTrace = 0;
  long mLastVector = 0;
};
