#include "SimSegmentRows.h"

#include <algorithm>
#include <cstring>

namespace {

unsigned BitAt(const std::uint8_t* bytes, std::size_t bit) {
  return (bytes[bit >> 3] >> (7 - (bit & 7))) & 1u;
}

void PutBit(std::uint8_t* bytes, std::size_t bit, unsigned value) {
  const auto mask = static_cast<std::uint8_t>(0x80u >> (bit & 7));
  bytes[bit >> 3] = value ? (bytes[bit >> 3] | mask) : (bytes[bit >> 3] & ~mask);
}

// Copies `count` bits between two packed rows, a byte at a time once the target is aligned.
void CopyBits(std::uint8_t* dst, std::size_t dstBit, const std::uint8_t* src, std::size_t srcBit,
              std::size_t count) {
  while (count > 0 && (dstBit & 7) != 0) {
    PutBit(dst, dstBit++, BitAt(src, srcBit++));
    --count;
  }
  const std::size_t shift = srcBit & 7;
  const std::uint8_t* from = src + (srcBit >> 3);
  std::uint8_t* to = dst + (dstBit >> 3);
  const std::size_t whole = count / 8;
  if (shift == 0) {
    if (whole > 0) std::memcpy(to, from, whole);
  } else {
    for (std::size_t i = 0; i < whole; ++i) {
      to[i] = static_cast<std::uint8_t>((from[i] << shift) | (from[i + 1] >> (8 - shift)));
    }
  }
  for (std::size_t i = whole * 8; i < count; ++i) PutBit(dst, dstBit + i, BitAt(src, srcBit + i));
}

}  // namespace

SimSegmentRows::SimSegmentRows(long width, long length, int stateWidth)
    : mLength(length),
      mStateWidth(stateWidth),
      mRows(static_cast<std::size_t>(width), std::vector<std::uint8_t>(RowBytes(length, stateWidth), 0)) {}

unsigned SimSegmentRows::Get(long trace, long vector) const {
  const std::uint8_t* row = Row(trace).data();
  std::size_t bit = static_cast<std::size_t>(vector) * static_cast<std::size_t>(mStateWidth);
  unsigned value = 0;
  for (int i = 0; i < mStateWidth; ++i) value = (value << 1) | BitAt(row, bit++);
  return value;
}

void SimSegmentRows::Set(long trace, long vector, unsigned value) {
  std::uint8_t* row = Row(trace).data();
  std::size_t bit = static_cast<std::size_t>(vector) * static_cast<std::size_t>(mStateWidth);
  for (int i = mStateWidth - 1; i >= 0; --i) PutBit(row, bit++, (value >> i) & 1u);
}

void SimSegmentRows::FlipBits(long trace, long vector, long count) {
  std::uint8_t* row = Row(trace).data();
  auto bit = static_cast<std::size_t>(vector);
  const std::size_t end = bit + static_cast<std::size_t>(count);
  for (; bit < end && (bit & 7) != 0; ++bit) row[bit >> 3] ^= static_cast<std::uint8_t>(0x80u >> (bit & 7));
  for (; bit + 8 <= end; bit += 8) row[bit >> 3] = static_cast<std::uint8_t>(~row[bit >> 3]);
  for (; bit < end; ++bit) row[bit >> 3] ^= static_cast<std::uint8_t>(0x80u >> (bit & 7));
}

void SimSegmentRows::Fill(long trace, long vector, long count, unsigned value) {
  // Two-state rows fill whole bytes at once; the ends go state by state.
  if (mStateWidth == 1) {
    std::uint8_t* row = Row(trace).data();
    long v = vector;
    const long end = vector + count;
    for (; v < end && (v & 7) != 0; ++v) Set(trace, v, value);
    const long whole = (end - v) / 8;
    if (whole > 0) std::memset(row + v / 8, value ? 0xff : 0x00, static_cast<std::size_t>(whole));
    for (v += std::max(0L, whole) * 8; v < end; ++v) Set(trace, v, value);
    return;
  }
  for (long v = vector; v < vector + count; ++v) Set(trace, v, value);
}

void SimSegmentRows::ReadBlock(long t0, long v0, long t1, long v1, std::string& out) const {
  const long vectors = v1 - v0 + 1;
  const std::size_t rowBytes = RowBytes(vectors, mStateWidth);
  const std::size_t first = static_cast<std::size_t>(v0 * mStateWidth);
  const std::size_t bits = static_cast<std::size_t>(vectors * mStateWidth);
  if (first % 8 == 0 && bits % 8 == 0) {
    // Whole bytes: the rows are appended as they are, with nothing to clear first.
    out.reserve(out.size() + rowBytes * static_cast<std::size_t>(t1 - t0 + 1));
    for (long t = t0; t <= t1; ++t) out.append(reinterpret_cast<const char*>(Row(t).data()) + first / 8, rowBytes);
    return;
  }
  const std::size_t at = out.size();
  out.resize(at + rowBytes * static_cast<std::size_t>(t1 - t0 + 1), '\0');
  auto* to = reinterpret_cast<std::uint8_t*>(out.data() + at);
  for (long t = t0; t <= t1; ++t, to += rowBytes) {
    CopyBits(to, 0, Row(t).data(), first, bits);
  }
}

void SimSegmentRows::WriteBlock(long t0, long v0, long t1, long v1, std::string_view block) {
  const long vectors = v1 - v0 + 1;
  const std::size_t rowBytes = RowBytes(vectors, mStateWidth);
  const auto* in = reinterpret_cast<const std::uint8_t*>(block.data());
  for (long t = t0; t <= t1; ++t, in += rowBytes) {
    CopyBits(Row(t).data(), static_cast<std::size_t>(v0 * mStateWidth), in, 0,
             static_cast<std::size_t>(vectors * mStateWidth));
  }
}

bool SimSegmentRows::BlockBelow(std::string_view block, long traces, long vectors, int stateWidth,
                                unsigned limit) {
  if (limit >= (1u << stateWidth)) return true;
  const std::size_t rowBytes = RowBytes(vectors, stateWidth);
  const auto* bytes = reinterpret_cast<const std::uint8_t*>(block.data());
  for (long t = 0; t < traces; ++t, bytes += rowBytes) {
    std::size_t bit = 0;
    for (long v = 0; v < vectors; ++v) {
      unsigned value = 0;
      for (int i = 0; i < stateWidth; ++i) value = (value << 1) | BitAt(bytes, bit++);
      if (value >= limit) return false;
    }
  }
  return true;
}

void SimSegmentRows::InsertVectors(long at, long count) {
  const auto sw = static_cast<std::size_t>(mStateWidth);
  for (auto& row : mRows) {
    std::vector<std::uint8_t> grown(RowBytes(mLength + count, mStateWidth), 0);
    CopyBits(grown.data(), 0, row.data(), 0, static_cast<std::size_t>(at) * sw);
    CopyBits(grown.data(), static_cast<std::size_t>(at + count) * sw, row.data(),
             static_cast<std::size_t>(at) * sw, static_cast<std::size_t>(mLength - at) * sw);
    row = std::move(grown);
  }
  mLength += count;
}

void SimSegmentRows::DeleteVectors(long at, long count) {
  const auto sw = static_cast<std::size_t>(mStateWidth);
  for (auto& row : mRows) {
    std::vector<std::uint8_t> shrunk(RowBytes(mLength - count, mStateWidth), 0);
    CopyBits(shrunk.data(), 0, row.data(), 0, static_cast<std::size_t>(at) * sw);
    CopyBits(shrunk.data(), static_cast<std::size_t>(at) * sw, row.data(),
             static_cast<std::size_t>(at + count) * sw, static_cast<std::size_t>(mLength - at - count) * sw);
    row = std::move(shrunk);
  }
  mLength -= count;
}

void SimSegmentRows::InsertTraces(long at, long count) {
  mRows.insert(mRows.begin() + at, static_cast<std::size_t>(count),
               std::vector<std::uint8_t>(RowBytes(mLength, mStateWidth), 0));
}

void SimSegmentRows::DeleteTraces(long at, long count) {
  mRows.erase(mRows.begin() + at, mRows.begin() + at + count);
}
