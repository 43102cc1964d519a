// The capture's bit planes: the summary must say exactly what a range holds, at any length and
// alignment, and the block layout must land on the right vectors.
#include <gtest/gtest.h>

#include <random>
#include <string>

#include "capture/CaptureData.h"

namespace {

// A row of `length` bits packed most significant bit first, as the instrument sends it.
std::string Pack(const std::vector<bool>& bits) {
  std::string row((bits.size() + 7) / 8, '\0');
  for (std::size_t v = 0; v < bits.size(); ++v) {
    if (bits[v]) row[v / 8] = static_cast<char>(static_cast<unsigned char>(row[v / 8]) | (0x80u >> (v % 8)));
  }
  return row;
}

// Long quiet stretches with busy ones between, so that every level sees both kinds.
std::vector<bool> Bursty(long length, std::mt19937& random) {
  std::vector<bool> bits(static_cast<std::size_t>(length));
  bool level = false;
  for (long v = 0; v < length;) {
    const long run = std::uniform_int_distribution<long>(1, random() % 4 == 0 ? 40000 : 30)(random);
    for (long i = 0; i < run && v < length; ++i, ++v) bits[static_cast<std::size_t>(v)] = level;
    level = !level;
  }
  return bits;
}

class CapturePlaneTest : public ::testing::TestWithParam<long> {};

TEST_P(CapturePlaneTest, FlagsAndSearchesAgreeWithTheBits) {
  const long length = GetParam();
  std::mt19937 random(static_cast<unsigned>(length));
  const std::vector<bool> bits = Bursty(length, random);
  CapturePlane plane;
  plane.Reset(length);
  // Put in two pieces, the first a multiple of 64, the way the reader does.
  const long first = length / 128 * 64;
  if (first > 0) plane.Put(0, first, Pack({bits.begin(), bits.begin() + first}));
  plane.Put(first, length - first, Pack({bits.begin() + first, bits.end()}));
  plane.Summarise();
  std::vector<long> ones(static_cast<std::size_t>(length) + 1, 0);  // prefix counts
  for (long v = 0; v < length; ++v) ones[static_cast<std::size_t>(v) + 1] = ones[static_cast<std::size_t>(v)] + bits[static_cast<std::size_t>(v)];
  for (int i = 0; i < 3000; ++i) {
    long from = std::uniform_int_distribution<long>(0, length - 1)(random);
    long to = std::uniform_int_distribution<long>(from + 1, i % 2 ? length : std::min(length, from + 200))(random);
    const long set = ones[static_cast<std::size_t>(to)] - ones[static_cast<std::size_t>(from)];
    const int expected = (set > 0 ? CapturePlane::kHigh : 0) | (set < to - from ? CapturePlane::kLow : 0);
    ASSERT_EQ(plane.Flags(from, to), expected) << from << ".." << to;
    long next = from;
    while (next < length && !bits[static_cast<std::size_t>(next)]) ++next;
    ASSERT_EQ(plane.NextSet(from), next == length ? -1 : next) << from;
    long previous = from;
    while (previous >= 0 && !bits[static_cast<std::size_t>(previous)]) --previous;
    ASSERT_EQ(plane.PreviousSet(from), previous) << from;
  }
  EXPECT_EQ(plane.CountSet(), ones.back());
}

INSTANTIATE_TEST_SUITE_P(Lengths, CapturePlaneTest, ::testing::Values(1L, 63L, 64L, 65L, 1025L, 70000L, 1100000L));

TEST(CaptureDataTest, BlocksOfTheWrongSizeOrPlaceAreRefused) {
  CaptureData data;
  data.Reset(3, 100, 1e-9);
  const std::string rows(3 * 13, '\xA5');
  EXPECT_FALSE(data.Put(0, 100, rows.substr(1), false));
  EXPECT_FALSE(data.Put(32, 68, std::string(3 * 9, '\0'), false));
  EXPECT_FALSE(data.Put(64, 64, std::string(3 * 8, '\0'), false));
  ASSERT_TRUE(data.Put(0, 100, rows, false));
  data.Summarise();
  // 0xA5 = 10100101: vector 0 high, 1 low, 2 high.
  EXPECT_EQ(data.Value(0, 2, 0), 7u);
  EXPECT_EQ(data.Value(0, 2, 1), 0u);
  EXPECT_EQ(data.Value(1, 2, 5), 3u);
  EXPECT_EQ(data.ErrorVectors(), 0);
  EXPECT_EQ(data.NextError(-1), -1);
}

TEST(CaptureDataTest, AnErrorOnAnyTraceMarksItsVector) {
  CaptureData data;
  data.Reset(2, 64, 1e-9);
  std::string errors(16, '\0');
  errors[1] = '\x01';        // trace 0, vector 15
  errors[8 + 4] = '\x80';    // trace 1, vector 32
  errors[8 + 1] = '\x01';    // trace 1, vector 15 again
  ASSERT_TRUE(data.Put(0, 64, errors, true));
  data.Summarise();
  EXPECT_EQ(data.ErrorVectors(), 2);
  EXPECT_EQ(data.NextError(-1), 15);
  EXPECT_EQ(data.NextError(15), 32);
  EXPECT_EQ(data.PreviousError(32), 15);
  EXPECT_EQ(data.PreviousError(15), -1);
  EXPECT_EQ(data.Flags(1, 30, 40), CaptureData::kLow | CaptureData::kError);
  EXPECT_EQ(data.Flags(0, 30, 40), CaptureData::kLow);
}

}  // namespace
