#pragma once

#include "segments/DataFormat.h"

// A run of traces, first to last, as the grid editors address columns.
class TraceRange {
 public:
  TraceRange() = default;
  TraceRange(long startTrace, long endTrace) : mStartTrace(startTrace), mEndTrace(endTrace) {}

  long GetStartTrace() const { return mStartTrace; }
  void SetStartTrace(long trace) { mStartTrace = trace; }
  long GetEndTrace() const { return mEndTrace; }
  void SetEndTrace(long trace) { mEndTrace = trace; }

  // The digit of `format` holding the start (end) trace; 0 for a format outside the enumeration.
  long GetStartDigit(DataFormat format) const { return DigitOf(mStartTrace, format); }
  long GetEndDigit(DataFormat format) const { return DigitOf(mEndTrace, format); }

 private:
  static long DigitOf(long trace, DataFormat format) {
    const int k = InfoOf(format).tracesPerDigit;
    return k == 0 ? 0 : trace / k;
  }

  long mStartTrace = 0;
  long mEndTrace = 0;
};
