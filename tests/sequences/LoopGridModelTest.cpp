// The loop grid's model on the fake sequencer: three loop levels, two data ports, so a line's
// fields are the lanes of levels 3, 2 and 1 (0 .. 2), the label (3), the length (4) and the
// ports (5, 6).
#include <gtest/gtest.h>

#include <functional>

#include "sequences/LoopGridModel.h"
#include "sequences/SequenceFixture.h"
#include "sequences/SequenceUndo.h"

namespace {

class LoopGridModelTest : public SequenceFixture {
 protected:
  void SetUp() override {
    SequenceFixture::SetUp();
    Load(Seq("(SEQ," + Blk(1) + ",\"\"," + Blk(2) + ",\"\"," + Blk(3) + ",\"\"," + Blk(4) + ")"));
    mModel.SetSequence(&mSeq);
  }
  void TearDown() override {
    mModel.SetSequence(nullptr);
    SequenceFixture::TearDown();
  }
  // The block lengths in order: which block is where.
  std::vector<unsigned long> Lengths() const {
    std::vector<unsigned long> out;
    for (unsigned long b = 1; b <= mSeq.GetNumBlocks(); ++b) out.push_back(mSeq.GetBlockLength(b));
    return out;
  }

  LoopGridModel mModel;
};

TEST_F(LoopGridModelTest, FieldsNameTheirLevelAndPortAndNothingBeyond) {
  EXPECT_EQ(mModel.NumFields(), 7);
  EXPECT_EQ(mModel.CursorField(), 3) << "a new grid starts on the label";
  const std::pair<int, unsigned long> levels[] = {{-1, 0}, {0, 3}, {2, 1}, {3, 0}, {5, 0}};
  for (const auto& [field, level] : levels) EXPECT_EQ(mModel.LevelOf(field), level) << field;
  const std::pair<int, unsigned long> ports[] = {{2, 0}, {4, 0}, {5, 1}, {6, 2}, {7, 0}};
  for (const auto& [field, port] : ports) EXPECT_EQ(mModel.PortOf(field), port) << field;
  EXPECT_EQ(mModel.CellText(2, mModel.LengthField()), "2");
  EXPECT_EQ(mModel.CellText(2, mModel.PortField(2)), "PAUSE0");
  EXPECT_EQ(mModel.CellText(2, mModel.LaneField(1)), "");
  EXPECT_EQ(mModel.CellText(5, mModel.LengthField()), "") << "past the last block";
  EXPECT_EQ(mModel.NamedSegment(2, 1), "") << "a built-in kind is no segment";
}

// Three lines shown: a page moves two blocks.
TEST_F(LoopGridModelTest, KeysStopAtTheEdges) {
  using K = LoopGridModel::Key;
  const struct {
    unsigned long block;
    int field;
    K key;
    bool far;
    unsigned long toBlock;
    int toField;
  } cases[] = {
      {1, 3, K::kUp, false, 1, 3},       {4, 3, K::kDown, false, 4, 3},     {1, 0, K::kLeft, false, 1, 0},
      {1, 6, K::kRight, false, 1, 6},    {1, 5, K::kRight, false, 1, 6},    {2, 3, K::kPageDown, false, 4, 3},
      {3, 3, K::kPageDown, false, 4, 3}, {3, 3, K::kPageUp, false, 1, 3},   {2, 3, K::kPageUp, false, 1, 3},
      {2, 6, K::kHome, false, 2, 3},     {2, 0, K::kEnd, false, 2, 6},      {3, 5, K::kHome, true, 1, 5},
      {2, 5, K::kEnd, true, 4, 5},
  };
  for (const auto& c : cases) {
    mModel.SetCursor(c.block, c.field);
    mModel.PressKey(c.key, false, c.far, 3);
    EXPECT_EQ(mModel.CursorBlock(), c.toBlock) << c.block << "," << c.field;
    EXPECT_EQ(mModel.CursorField(), c.toField) << c.block << "," << c.field;
    EXPECT_FALSE(mModel.IsSelected(c.toBlock));
  }
  mModel.SetCursor(2, 3);
  mModel.PressKey(K::kDown, true, false, 3);
  mModel.PressKey(K::kDown, true, false, 3);
  EXPECT_EQ(std::make_pair(mModel.FirstSelected(), mModel.LastSelected()), std::make_pair(2ul, 4ul));
  EXPECT_FALSE(mModel.IsSelected(1));
  EXPECT_TRUE(mModel.IsSelected(4));
  mModel.SetCursor(9, 99);
  EXPECT_EQ(mModel.CursorBlock(), 4u);
  EXPECT_EQ(mModel.CursorField(), 6);
}

// Each command from block 2 (blocks 2 .. 3 selected where it says, the cursor on 3), what it leaves and where
// the cursor goes; while the instrument is held it is refused, writes nothing and keeps the
// cursor, and no step back is made.
struct Command {
  const char* name;
  bool select;
  std::function<int(LoopGridModel&, ConditionList&)> run;
  std::vector<unsigned long> lengths;
  unsigned long cursor;
};

class LoopGridCommandTest : public LoopGridModelTest, public testing::WithParamInterface<Command> {};

TEST_P(LoopGridCommandTest, RunsAsOneStepAndTheLockChangesNothing) {
  const Command& c = GetParam();
  const auto place = [&] {
    mModel.SetCursor(2, mModel.LabelField());
    if (c.select) {
      mModel.SetCursor(3, mModel.LabelField(), true);
    }
  };
  place();
  const unsigned long cursor = mModel.CursorBlock();
  const Dstring before = mFake.sequence;
  mFake.locked = true;
  EXPECT_EQ(c.run(mModel, mList), -19);
  EXPECT_EQ(mFake.sequence, before);
  EXPECT_EQ(Lengths(), std::vector<unsigned long>({1, 2, 3, 4}));
  EXPECT_EQ(mModel.CursorBlock(), cursor);
  EXPECT_TRUE(mModel.IsSelected(cursor) == c.select);
  EXPECT_FALSE(mModel.Steps()->CanUndo());
  mFake.locked = false;

  place();
  ConditionList list;
  ASSERT_EQ(c.run(mModel, list), 0) << list.ToText();
  if (!c.lengths.empty()) {
    EXPECT_EQ(Lengths(), c.lengths);
  }
  EXPECT_EQ(mModel.CursorBlock(), c.cursor);
  ASSERT_TRUE(mModel.Steps()->CanUndo());
  ASSERT_EQ(mModel.Undo(list), 0) << list.ToText();
  EXPECT_EQ(mFake.sequence, before);
}

const Command kCommands[] = {
    {"InsertAfter", false, [](LoopGridModel& m, ConditionList& l) { return m.InsertBlock(false, l); }, {}, 3},
    {"InsertBefore", false, [](LoopGridModel& m, ConditionList& l) { return m.InsertBlock(true, l); }, {}, 2},
    {"Delete", false, &LoopGridModel::DeleteBlock, {1, 3, 4}, 2},
    {"MoveDown", false, [](LoopGridModel& m, ConditionList& l) { return m.MoveBlock(1, l); }, {1, 3, 2, 4}, 3},
    {"MoveUp", false, [](LoopGridModel& m, ConditionList& l) { return m.MoveBlock(-1, l); }, {2, 1, 3, 4}, 1},
    {"Cut", false, &LoopGridModel::CutBlock, {1, 3, 4}, 2},
    {"Label", false, [](LoopGridModel& m, ConditionList& l) { return m.SetCellText(2, 3, "here", l); },
     {1, 2, 3, 4}, 2},
    {"Length", false, [](LoopGridModel& m, ConditionList& l) { return m.SetCellText(2, 4, "7", l); },
     {1, 7, 3, 4}, 2},
    {"AddLoop", true, &LoopGridModel::AddLoop, {1, 2, 3, 4}, 3},
};

INSTANTIATE_TEST_SUITE_P(Commands, LoopGridCommandTest, testing::ValuesIn(kCommands),
                         [](const testing::TestParamInfo<Command>& info) { return std::string(info.param.name); });

TEST_F(LoopGridModelTest, ALoopGoesOnTheLowestFreeLevelOrTheCursorsLaneAndComesOffAgain) {
  mModel.SetCursor(2, mModel.LabelField());
  mModel.SetCursor(3, mModel.LabelField(), true);
  ASSERT_EQ(mModel.AddLoop(mList), 0) << mList.ToText();
  EXPECT_EQ(mSeq.GetLoopStatus(2, 1), CSequence::LOOP_START);
  EXPECT_EQ(mSeq.GetLoopStatus(3, 1), CSequence::LOOP_END);
  EXPECT_EQ(mModel.CellText(2, mModel.LaneField(1)), "2");
  // The same blocks again: level 1 is taken, level 2 is next.
  ASSERT_EQ(mModel.AddLoop(mList), 0) << mList.ToText();
  EXPECT_EQ(mSeq.GetLoopStatus(2, 2), CSequence::LOOP_START);
  // The top level's loop runs for ever.
  mModel.SetCursor(4, mModel.LaneField(3));
  ASSERT_EQ(mModel.AddLoop(mList), 0) << mList.ToText();
  EXPECT_EQ(mModel.CellText(4, mModel.LaneField(3)), "INF");
  // On a lane the loop of that lane goes; elsewhere the innermost of the block.
  mModel.SetCursor(2, mModel.LabelField());
  ASSERT_EQ(mModel.RemoveLoop(mList), 0);
  EXPECT_EQ(mSeq.GetLoopStatus(2, 1), CSequence::LOOP_NONE);
  EXPECT_EQ(mSeq.GetLoopStatus(2, 2), CSequence::LOOP_START);
  mFake.received.clear();
  mModel.SetCursor(1, mModel.LabelField());
  EXPECT_EQ(mModel.RemoveLoop(mList), 0);
  EXPECT_TRUE(mFake.Writes().empty()) << "no loop, nothing written";
}

}  // namespace
