// Where a new loop may go and which counts a loop may have.
#include <gtest/gtest.h>

#include "sequences/SequenceFixture.h"
#include "sequences/SequenceLoopRules.h"

namespace {

// Blocks 1 .. 6; a loop on level 2 over blocks 2 .. 4 holding one on level 1 over 2 .. 3.
const std::string kNested =
    Seq("(SEQ," + Blk(1) + ",\"\",(LOOP2,0,3,\"\",(SEQ,(LOOP1,0,4,\"\",(SEQ," + Blk(2) + ",\"\"," + Blk(3) +
        ")),\"\"," + Blk(4) + ")),\"\"," + Blk(5) + ",\"\"," + Blk(6) + ")");

struct PlaceCase {
  unsigned long first;
  unsigned long last;
  unsigned long level;
  const char* key;  // "" when the loop may go there
};

class LoopPlaces : public SequenceFixture, public testing::WithParamInterface<PlaceCase> {};

TEST_P(LoopPlaces, AreCheckedBeforeAnythingIsWritten) {
  Load(kNested);
  const PlaceCase& c = GetParam();
  ConditionList list;
  EXPECT_EQ(SequenceLoopRules::Check(mSeq, c.first, c.last, c.level, list), *c.key ? 1 : 0);
  EXPECT_EQ(list.IsEmpty() ? "" : list.Last().GetKey(), c.key);
  EXPECT_TRUE(mFake.Writes().empty());
}

INSTANTIATE_TEST_SUITE_P(Table, LoopPlaces,
                         testing::Values(PlaceCase{5, 6, 1, ""}, PlaceCase{4, 4, 1, ""},
                                         PlaceCase{1, 4, 3, ""}, PlaceCase{1, 6, 3, ""},
                                         PlaceCase{5, 5, 2, ""},
                                         PlaceCase{2, 3, 1, "GUI_SEQUENCE_LOOP_TAKEN"},
                                         PlaceCase{1, 2, 2, "GUI_SEQUENCE_LOOP_TAKEN"},
                                         PlaceCase{4, 5, 1, "GUI_SEQUENCE_LOOP_CROSSES"},
                                         PlaceCase{3, 4, 3, "GUI_SEQUENCE_LOOP_CROSSES"},
                                         PlaceCase{1, 3, 3, "GUI_SEQUENCE_LOOP_CROSSES"}));

TEST_F(SequenceFixture, TheFreeLevelIsTheLowestThatFits) {
  Load(kNested);
  ConditionList list;
  EXPECT_EQ(SequenceLoopRules::FreeLevel(mSeq, 5, 6, list), 1u);
  EXPECT_EQ(SequenceLoopRules::FreeLevel(mSeq, 2, 4, list), 3u);
  EXPECT_EQ(SequenceLoopRules::FreeLevel(mSeq, 1, 4, list), 3u);
  EXPECT_TRUE(list.IsEmpty());
  EXPECT_EQ(SequenceLoopRules::FreeLevel(mSeq, 3, 4, list), 0u);
  EXPECT_EQ(list.Last().GetKey(), "GUI_SEQUENCE_LOOP_NO_LEVEL");
}

struct CountCase {
  const char* text;
  unsigned long largest;
  unsigned long count;  // 0: refused
};

class LoopCounts : public testing::TestWithParam<CountCase> {};

TEST_P(LoopCounts, AreWholeNumbersFromOneToTheLargest) {
  const CountCase& c = GetParam();
  ConditionList list;
  unsigned long count = 99;
  EXPECT_EQ(SequenceLoopRules::ParseCount(c.text, c.largest, count, list), c.count == 0 ? 1 : 0);
  EXPECT_EQ(count, c.count == 0 ? 99 : c.count);
  if (c.count == 0) {
    EXPECT_EQ(list.Last().GetKey(), "GUI_SEQUENCE_LOOP_COUNT");
  }
}

INSTANTIATE_TEST_SUITE_P(Table, LoopCounts,
                         testing::Values(CountCase{"4", 1048576, 4}, CountCase{" 7 ", 0, 7},
                                         CountCase{"1048576", 1048576, 1048576},
                                         CountCase{"1048577", 1048576, 0}, CountCase{"0", 1048576, 0},
                                         CountCase{"", 1048576, 0}, CountCase{"-3", 1048576, 0},
                                         CountCase{"12a", 0, 0}, CountCase{"99999999999999999999", 0, 0}));

}  // namespace
