#include "capture/CapturePlane.h"

#include <algorithm>
#include <array>
#include <bit>

namespace {

// The bits of a byte in reverse order: the wire's first vector is a byte's top bit.
constexpr std::array<std::uint8_t, 256> kReversed = [] {
  std::array<std::uint8_t, 256> table{};
  for (unsigned b = 0; b < 256; ++b) {
    unsigned r = 0;
    for (int i = 0; i < 8; ++i) r |= ((b >> i) & 1u) << (7 - i);
    table[b] = static_cast<std::uint8_t>(r);
  }
  return table;
}();

std::uint64_t LowBits(long count) { return count >= 64 ? ~0ULL : (1ULL << count) - 1; }

}  // namespace

void CapturePlane::Reset(long length) {
  mLength = length;
  mWords.assign(static_cast<std::size_t>((length + 63) / 64), 0);
  mLevels.clear();
}

void CapturePlane::Put(long start, long count, std::string_view row) {
  const auto* bytes = reinterpret_cast<const unsigned char*>(row.data());
  const std::size_t used = static_cast<std::size_t>((count + 7) / 8);
  for (std::size_t i = 0; i < used; ++i) {
    std::uint64_t& word = mWords[static_cast<std::size_t>(start / 64) + i / 8];
    word |= static_cast<std::uint64_t>(kReversed[bytes[i]]) << (8 * (i % 8));
  }
  // The row's padding is not the capture's.
  const long end = start + count;
  if (end % 64 != 0) mWords[static_cast<std::size_t>(end / 64)] &= LowBits(end % 64);
}

std::uint8_t CapturePlane::WordFlags(std::size_t word, std::uint64_t mask) const {
  const std::uint64_t bits = mWords[word] & mask;
  return static_cast<std::uint8_t>((bits != 0 ? kHigh : 0) | (bits != mask ? kLow : 0));
}

void CapturePlane::Summarise() {
  mLevels.clear();
  for (int level = 0; BucketOf(level) < mLength; ++level) {
    const long bucket = BucketOf(level + 1);
    std::vector<std::uint8_t> flags(static_cast<std::size_t>((mLength + bucket - 1) / bucket), 0);
    for (std::size_t i = 0; i < flags.size() * (1u << kLevelShift); ++i) {
      std::uint8_t child = 0;
      if (level == 0) {
        if (i >= mWords.size()) break;
        const long left = mLength - static_cast<long>(i) * 64;
        child = WordFlags(i, LowBits(left));
      } else {
        if (i >= mLevels.back().size()) break;
        child = mLevels.back()[i];
      }
      flags[i >> kLevelShift] |= child;
    }
    mLevels.push_back(std::move(flags));
  }
}

std::uint8_t CapturePlane::Flags(long from, long to) const {
  std::uint8_t flags = 0;
  long at = from;
  if (at % 64 != 0 || to - at < 64) {
    const long end = std::min(to, (at | 63) + 1);
    flags |= WordFlags(static_cast<std::size_t>(at / 64), LowBits(end - at) << (at % 64));
    at = end;
  }
  // Up through the levels while the place is aligned to the next bucket, then down as the
  // rest gets shorter: a few buckets per level.
  const int top = static_cast<int>(mLevels.size());
  int level = 0;
  while (to - at >= 64 && flags != (kLow | kHigh)) {
    while (level < top && (at & (BucketOf(level + 1) - 1)) == 0 && to - at >= BucketOf(level + 1)) ++level;
    while (to - at < BucketOf(level)) --level;
    flags |= level == 0 ? WordFlags(static_cast<std::size_t>(at / 64), ~0ULL)
                        : mLevels[static_cast<std::size_t>(level - 1)][static_cast<std::size_t>(at / BucketOf(level))];
    at += BucketOf(level);
  }
  if (at < to && flags != (kLow | kHigh)) flags |= WordFlags(static_cast<std::size_t>(at / 64), LowBits(to - at));
  return flags;
}

long CapturePlane::NextSet(long from) const {
  if (from < 0) from = 0;
  for (std::size_t w = static_cast<std::size_t>(from / 64); w < mWords.size(); ++w) {
    std::uint64_t bits = mWords[w];
    if (w == static_cast<std::size_t>(from / 64)) bits &= ~LowBits(from % 64);
    if (bits != 0) return static_cast<long>(w * 64) + std::countr_zero(bits);
  }
  return -1;
}

long CapturePlane::PreviousSet(long from) const {
  if (from >= mLength) from = mLength - 1;
  for (long w = from / 64; from >= 0 && w >= 0; --w) {
    std::uint64_t bits = mWords[static_cast<std::size_t>(w)];
    if (w == from / 64) bits &= LowBits(from % 64 + 1);
    if (bits != 0) return w * 64 + 63 - std::countl_zero(bits);
  }
  return -1;
}

long CapturePlane::CountSet() const {
  long count = 0;
  for (std::uint64_t word : mWords) count += std::popcount(word);
  return count;
}

void CapturePlane::OrWith(const CapturePlane& other) {
  for (std::size_t i = 0; i < mWords.size() && i < other.mWords.size(); ++i) mWords[i] |= other.mWords[i];
}
