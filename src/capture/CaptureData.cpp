#include "capture/CaptureData.h"

void CaptureData::Reset(long width, long length, double periodSeconds) {
  mLength = length;
  mPeriod = periodSeconds;
  mTraces.assign(static_cast<std::size_t>(width), CapturePlane());
  mErrors.assign(static_cast<std::size_t>(width), CapturePlane());
  for (CapturePlane& plane : mTraces) plane.Reset(length);
  for (CapturePlane& plane : mErrors) plane.Reset(length);
  mAnyError.Reset(length);
  mErrorVectors = 0;
}

bool CaptureData::Put(long start, long count, std::string_view block, bool errors) {
  const std::size_t rowBytes = static_cast<std::size_t>((count + 7) / 8);
  if (start < 0 || start % 64 != 0 || count < 1 || start > mLength - count || block.size() != rowBytes * mTraces.size()) {
    return false;
  }
  std::vector<CapturePlane>& planes = errors ? mErrors : mTraces;
  for (std::size_t t = 0; t < planes.size(); ++t) planes[t].Put(start, count, block.substr(t * rowBytes, rowBytes));
  return true;
}

void CaptureData::Summarise() {
  mAnyError.Reset(mLength);
  for (CapturePlane& plane : mErrors) mAnyError.OrWith(plane);
  for (CapturePlane& plane : mTraces) plane.Summarise();
  for (CapturePlane& plane : mErrors) plane.Summarise();
  mAnyError.Summarise();
  mErrorVectors = mAnyError.CountSet();
}

std::uint8_t CaptureData::Flags(long trace, long from, long to, bool anyError) const {
  const auto t = static_cast<std::size_t>(trace);
  const bool error = anyError && (mErrors[t].Flags(from, to) & kHigh) != 0;
  return static_cast<std::uint8_t>(mTraces[t].Flags(from, to) | (error ? kError : 0));
}

std::uint64_t CaptureData::Value(long low, long high, long vector) const {
  std::uint64_t value = 0;
  for (long t = high; t >= low; --t) value = (value << 1) | (Bit(t, vector) ? 1u : 0u);
  return value;
}
