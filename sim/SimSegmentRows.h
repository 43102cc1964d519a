#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

// The pattern memory of one segment: a row per trace of `length` states of `stateWidth` bits,
// packed most significant bit first with no gaps and padded to whole bytes, the layout of the
// data block on the wire. A 16M x 64 two-state segment takes 128 MiB.
class SimSegmentRows {
 public:
  SimSegmentRows() = default;
  // All states 0.
  SimSegmentRows(long width, long length, int stateWidth);

  long GetWidth() const { return static_cast<long>(mRows.size()); }
  long GetLength() const { return mLength; }
  int GetStateWidth() const { return mStateWidth; }
  static std::size_t RowBytes(long length, int stateWidth) {
    return (static_cast<std::size_t>(length) * static_cast<std::size_t>(stateWidth) + 7) / 8;
  }

  unsigned Get(long trace, long vector) const;
  void Set(long trace, long vector, unsigned value);
  // States `count` from `vector` of one trace set to `value`.
  void Fill(long trace, long vector, long count, unsigned value);
  // One-bit states `count` from `vector` of one trace turned to the other state.
  void FlipBits(long trace, long vector, long count);

  // The block of traces t0..t1 and vectors v0..v1, appended to `out`: one padded row per
  // trace, in trace order.
  void ReadBlock(long t0, long v0, long t1, long v1, std::string& out) const;
  void WriteBlock(long t0, long v0, long t1, long v1, std::string_view block);
  // Whether every state of the block is below `limit`.
  static bool BlockBelow(std::string_view block, long traces, long vectors, int stateWidth, unsigned limit);

  void InsertVectors(long at, long count);
  void DeleteVectors(long at, long count);
  void InsertTraces(long at, long count);
  void DeleteTraces(long at, long count);

  const std::vector<std::uint8_t>& Row(long trace) const { return mRows[static_cast<std::size_t>(trace)]; }
  std::vector<std::uint8_t>& Row(long trace) { return mRows[static_cast<std::size_t>(trace)]; }

 private:
  long mLength = 0;
  int mStateWidth = 1;
  std::vector<std::vector<std::uint8_t>> mRows;
};
