// The steps back and forward that the sequence editors share.
#include <gtest/gtest.h>

#include "sequences/SequenceFixture.h"
#include "sequences/SequenceUndo.h"

namespace {

struct UndoCase {
  const char* name;
  // a, b, c: edits setting block 1's length to 1000, 2000, 3000; u undo; r redo; o another
  // client sets 4096 and the sequence is read; f an edit to 5000 the server refuses; l an undo
  // while another client holds the instrument.
  const char* steps;
  std::size_t maxSteps;
  unsigned long length;  // block 1's length on the server at the end
  bool canUndo;
  bool canRedo;
};

class SequenceUndoTable : public SequenceFixture, public testing::WithParamInterface<UndoCase> {
 protected:
  void Do(char step, SequenceUndo& undo) {
    ConditionList list;
    auto length = [&](unsigned long n) {
      return undo.Run([&](ConditionList& l) { return mSeq.SetBlockLength(1, n, l); }, list);
    };
    switch (step) {
      case 'a':
        EXPECT_EQ(length(1000), 0) << list.ToText();
        break;
      case 'b':
        EXPECT_EQ(length(2000), 0) << list.ToText();
        break;
      case 'c':
        EXPECT_EQ(length(3000), 0) << list.ToText();
        break;
      case 'u':
        EXPECT_EQ(undo.Undo(list), 0) << list.ToText();
        break;
      case 'r':
        EXPECT_EQ(undo.Redo(list), 0) << list.ToText();
        break;
      case 'o':
        mFake.sequence = Seq(Blk(4096));
        EXPECT_EQ(mSeq.ReadSequence(list, 0), 0);
        break;
      case 'f':
        mFake.refuse = 1;
        EXPECT_NE(length(5000), 0);
        mFake.refuse = 0;
        break;
      case 'l':
        mFake.locked = true;
        EXPECT_EQ(undo.Undo(list), -19);
        mFake.locked = false;
        break;
      default:
        FAIL() << step;
    }
  }
};

TEST_P(SequenceUndoTable, StepsReachTheServer) {
  const UndoCase& c = GetParam();
  Load(Seq(Blk(512)));
  SequenceUndo undo(mSeq, c.maxSteps);
  for (const char* s = c.steps; *s; ++s) Do(*s, undo);
  EXPECT_EQ(mFake.sequence, Seq(Blk(c.length)));
  EXPECT_EQ(mSeq.GetBlockLength(1), c.length) << "the model shows what the server holds";
  EXPECT_EQ(undo.CanUndo(), c.canUndo);
  EXPECT_EQ(undo.CanRedo(), c.canRedo);
  EXPECT_FALSE(undo.IsEditing());
}

INSTANTIATE_TEST_SUITE_P(
    Table, SequenceUndoTable,
    testing::Values(UndoCase{"Nothing", "u", 50, 512, false, false},
                    UndoCase{"OneBack", "au", 50, 512, false, true},
                    UndoCase{"BackAndForth", "aur", 50, 1000, true, false},
                    UndoCase{"TwoBack", "abuu", 50, 512, false, true},
                    UndoCase{"TwoBackOneForth", "abuur", 50, 1000, true, true},
                    UndoCase{"AnEditDropsTheStepsForward", "abuc", 50, 3000, true, false},
                    UndoCase{"AnotherClientForgetsTheSteps", "abou", 50, 4096, false, false},
                    UndoCase{"ARefusedEditIsNoStep", "afu", 50, 512, false, true},
                    UndoCase{"TheOldestStepGoesFirst", "abcuuu", 2, 1000, false, true},
                    UndoCase{"ALockedUndoKeepsTheStep", "alu", 50, 512, false, true}),
    [](const testing::TestParamInfo<UndoCase>& info) { return std::string(info.param.name); });

// A step back writes the whole text the server held, exactly, in one write.
TEST_F(SequenceFixture, AStepBackWritesTheTextBeforeWhole) {
  const std::string before = Seq("(SEQ," + Blk(512) + ",\"x\"," + Blk(64, "\"Seg/A\"") + ")", "go");
  Load(before);
  SequenceUndo undo(mSeq);
  ConditionList list;
  ASSERT_EQ(undo.Run([&](ConditionList& l) { return mSeq.DeleteBlock(2, l); }, list), 0);
  mFake.received.clear();
  ASSERT_EQ(undo.Undo(list), 0) << list.ToText();
  ASSERT_EQ(mFake.Writes().size(), 1u);
  EXPECT_EQ(mFake.Writes()[0], before);
  EXPECT_EQ(mSeq.GetNumBlocks(), 2u);
}

}  // namespace
