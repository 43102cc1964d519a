#pragma once

#include <cstdint>
#include <string_view>
#include <vector>

// One row of bits over a capture's vectors (a trace, or where its errors are), with a summary
// per 256, 1,024, 4,096 … vectors of whether the bits there are low, high or both. Asking
// what a range holds costs a few steps per level whatever its length, so that drawing follows
// the pixels and not the samples.
class CapturePlane {
 public:
  enum Flag : std::uint8_t { kLow = 1, kHigh = 2 };

  void Reset(long length);
  long GetLength() const { return mLength; }
  // Bits `start` … of a row packed most significant bit first (the wire's layout); `start`
  // is a multiple of 64 and the bits must lie inside.
  void Put(long start, long count, std::string_view row);
  // After the last Put.
  void Summarise();

  bool At(long vector) const { return (mWords[static_cast<std::size_t>(vector >> 6)] >> (vector & 63)) & 1u; }
  // kLow and/or kHigh for the bits of [from, to), which lies inside; 0 when it is empty.
  std::uint8_t Flags(long from, long to) const;
  // The first set bit at or after `from` (the last at or before it); -1 when there is none.
  long NextSet(long from) const;
  long PreviousSet(long from) const;
  long CountSet() const;
  void OrWith(const CapturePlane& other);

 private:
  static constexpr int kLevelShift = 2;  // 4 buckets of a level make one of the next
  static long BucketOf(int level) { return 64L << (kLevelShift * level); }
  std::uint8_t WordFlags(std::size_t word, std::uint64_t mask) const;

  long mLength = 0;
  std::vector<std::uint64_t> mWords;                 // vector v is bit v % 64 of word v / 64
  std::vector<std::vector<std::uint8_t>> mLevels;    // level l: flags per BucketOf(l + 1) vectors
};
