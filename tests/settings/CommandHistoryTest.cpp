#include <gtest/gtest.h>

#include "settings/CommandHistory.h"
#include "settings/MemoryRegistryStore.h"
#include "settings/QENRegistryProfile.h"

namespace {

class CommandHistoryTest : public testing::Test {
 protected:
  void SetUp() override { QENRegistryProfile::SetStore(&mStore); }
  void TearDown() override { QENRegistryProfile::SetStore(nullptr); }
  MemoryRegistryStore mStore;
  ConditionList mList;
};

}  // namespace

TEST_F(CommandHistoryTest, WalksBackAndForthToTheTextBegun) {
  CommandHistory history;
  for (const char* line : {"::A?", "::B?", "::B?", "::C?"}) history.Add(line);
  EXPECT_EQ(history.Lines().size(), 3u) << "a repeat of the newest line is kept once";
  EXPECT_EQ(history.Previous("::par"), "::C?");
  EXPECT_EQ(history.Previous("ignored"), "::B?");
  EXPECT_EQ(history.Previous(""), "::A?");
  EXPECT_EQ(history.Previous(""), "::A?") << "the oldest line stays";
  EXPECT_EQ(history.Next(), "::B?");
  EXPECT_EQ(history.Next(), "::C?");
  EXPECT_EQ(history.Next(), "::par");
  EXPECT_EQ(history.Next(), "::par");
  CommandHistory empty;
  EXPECT_EQ(empty.Previous("x"), "x");
}

TEST_F(CommandHistoryTest, IsKeptAcrossRunsAndBounded) {
  CommandHistory first;
  for (std::size_t i = 0; i < CommandHistory::kLength + 5; ++i) first.Add(Dstring::Format("::P%zu?", i));
  first.Add("::Q \"a;b\"");
  ASSERT_EQ(first.Write(mList), 0) << mList.ToText();
  CommandHistory second;
  ASSERT_EQ(second.Read(mList), 0) << mList.ToText();
  ASSERT_EQ(second.Lines().size(), CommandHistory::kLength);
  EXPECT_EQ(second.Lines().back(), "::Q \"a;b\"");
  EXPECT_EQ(second.Lines().front(), "::P6?");
  CommandHistory none;
  MemoryRegistryStore fresh;
  QENRegistryProfile::SetStore(&fresh);
  EXPECT_EQ(none.Read(mList), 0);
  EXPECT_TRUE(none.Lines().empty());
}
