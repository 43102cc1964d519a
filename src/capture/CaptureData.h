#pragma once

#include <cstdint>
#include <string_view>
#include <vector>

#include "capture/CapturePlane.h"
#include "support/Dstring.h"

// What an analyser port captured, held once: a bit plane per trace, one per trace of where
// its errors are, and one of the vectors with any error, each with its summary.
class CaptureData {
 public:
  enum Flag : std::uint8_t { kLow = CapturePlane::kLow, kHigh = CapturePlane::kHigh, kError = 4 };

  void Reset(long width, long length, double periodSeconds);
  // Rows as the instrument sends them: one per trace of `count` bits from `start` (a multiple of
  // 64), packed most significant bit first, each padded to a byte. False when `block` is not
  // that size or the range is not inside; nothing is taken then.
  bool Put(long start, long count, std::string_view block, bool errors);
  // After the last Put: the summaries and the error count.
  void Summarise();

  long GetWidth() const { return static_cast<long>(mTraces.size()); }
  long GetLength() const { return mLength; }
  double GetPeriod() const { return mPeriod; }
  bool Bit(long trace, long vector) const { return mTraces[static_cast<std::size_t>(trace)].At(vector); }
  bool IsError(long trace, long vector) const { return mErrors[static_cast<std::size_t>(trace)].At(vector); }
  // kLow, kHigh and kError for a trace over [from, to); `anyError` says whether HasError(from,
  // to), which a caller asking every trace over the same range asks once.
  std::uint8_t Flags(long trace, long from, long to, bool anyError) const;
  std::uint8_t Flags(long trace, long from, long to) const { return Flags(trace, from, to, HasError(from, to)); }
  bool HasError(long from, long to) const { return (mAnyError.Flags(from, to) & kHigh) != 0; }
  // The traces low … high (at most 64) of a vector as a number, trace `low` its least bit.
  std::uint64_t Value(long low, long high, long vector) const;
  // The next error vector after `vector` (the previous before it); -1 when there is none.
  long NextError(long vector) const { return mAnyError.NextSet(vector + 1); }
  long PreviousError(long vector) const { return mAnyError.PreviousSet(vector - 1); }
  long ErrorVectors() const { return mErrorVectors; }

 private:
  long mLength = 0;
  double mPeriod = 0;
  std::vector<CapturePlane> mTraces;
  std::vector<CapturePlane> mErrors;
  CapturePlane mAnyError;
  long mErrorVectors = 0;
};
