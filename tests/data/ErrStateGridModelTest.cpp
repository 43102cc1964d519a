#include <gtest/gtest.h>

#include "data/ErrStateGridModel.h"

namespace {

BerSvr::PortResult Port(const char* name, unsigned long long errors, std::size_t channels) {
  BerSvr::PortResult port;
  port.port = name;
  port.errors = errors;
  port.channels.assign(channels, 0);
  return port;
}

// Three ports of 6, 2 and no channels; two lines and three channel cells shown.
class ErrStateGridModelTest : public testing::Test {
 protected:
  void SetUp() override { mModel.SetResults({Port(":A", 0, 6), Port(":B", 7, 2), Port(":C", 0, 0)}); }
  ErrStateGridModel mModel;
};

TEST_F(ErrStateGridModelTest, KeysStopAtTheEdgesAndTheChannelsShownFollow) {
  using K = ErrStateGridModel::Key;
  const struct {
    long line, channel;
    K key;
    long toLine, toChannel, offset;
  } cases[] = {
      {0, 0, K::kUp, 0, 0, 0},       {0, 0, K::kLeft, 0, 0, 0},     {0, 2, K::kRight, 0, 3, 1},
      {0, 5, K::kRight, 0, 5, 3},    {0, 0, K::kEnd, 0, 5, 3},      {0, 5, K::kHome, 0, 0, 0},
      {0, 5, K::kDown, 1, 1, 1},     {1, 1, K::kDown, 2, 0, 0},     {2, 0, K::kDown, 2, 0, 0},
      {2, 0, K::kEnd, 2, 0, 0},      {0, 0, K::kPageDown, 1, 0, 0}, {2, 0, K::kPageUp, 1, 0, 0},
  };
  for (const auto& c : cases) {
    mModel.SetCursor(c.line, 0, 3);
    mModel.SetChannelOffset(0);
    mModel.SetCursor(c.line, c.channel, 3);
    mModel.PressKey(c.key, 2, 3);
    EXPECT_EQ(mModel.CursorLine(), c.toLine) << c.line << "," << c.channel;
    EXPECT_EQ(mModel.CursorChannel(), c.toChannel) << c.line << "," << c.channel;
    EXPECT_EQ(mModel.ChannelOffset(), c.offset) << c.line << "," << c.channel;
  }
}

TEST_F(ErrStateGridModelTest, NewCountsKeepTheCursorWhereItStillExists) {
  mModel.SetCursor(1, 1, 3);
  mModel.SetResults({Port(":A", 0, 6), Port(":B", 0, 1)});
  EXPECT_EQ(mModel.CursorLine(), 1);
  EXPECT_EQ(mModel.CursorChannel(), 0);
  mModel.SetResults({Port(":A", 1, 6)});
  EXPECT_EQ(mModel.CursorLine(), 0);
  EXPECT_TRUE(mModel.HasErrors(0));
  EXPECT_FALSE(mModel.HasErrors(1));
  mModel.SetResults({});
  mModel.PressKey(ErrStateGridModel::Key::kDown, 2, 3);
  EXPECT_EQ(mModel.CursorLine(), 0);
  EXPECT_EQ(mModel.MostChannels(), 0);
  mModel.SetChannelOffset(4);
  EXPECT_EQ(mModel.ChannelOffset(), 0);
}

TEST(ErrStateGridCountText, ShortensLargeCountsToThreeFigures) {
  const std::pair<unsigned long long, const char*> kCases[] = {
      {0, "0"},         {9999, "9\u2009999"}, {10000, "10.0k"},         {123456, "123k"},
      {999499, "999k"}, {999500, "1.00M"},    {4560000000ull, "4.56G"}, {18446744073709551615ull, "18.4E"}};
  for (const auto& [count, text] : kCases) EXPECT_EQ(ErrStateGridModel::CountText(count), text) << count;
}

}  // namespace
