// The tables of the simple sequence editor and of a block's reactions, without a widget: what
// a cell shows, which cells take an edit, and what an edit writes.
#include <gtest/gtest.h>

#include "sequences/BlockReactionTable.h"
#include "sequences/SequenceBlockTable.h"
#include "sequences/SequenceFixture.h"

namespace {

const std::string kReacting = "(BLOCK,0,64,0,\"\",((\"ERR\",\"start\",5,\"V1\")),\"walk\",0,0,PAUSE1,0,0)";
const std::string kSync = "(BLOCK,0,32,0,\"\",SYNC,PAUSE,0,0,PAUSE0,0,0)";

struct Typed {
  const char* name;
  unsigned long column;
  const char* text;
  const char* written;  // found in the expression written; null: refused, nothing written
};

class SequenceTablesTest : public SequenceFixture {
 protected:
  void SetUp() override {
    SequenceFixture::SetUp();
    Load(Seq("(SEQ," + Blk(512) + ",\"two\"," + kReacting + ",\"\"," + kSync + ")", "start"));
  }
  // One write with `written` in it, or a refusal saying `refusal` that wrote nothing.
  void ExpectWritten(int status, const Typed& t, const char* refusal);

  SequenceBlockTable mBlocks{mSeq};
};

struct Shown {
  unsigned long block;
  unsigned long column;
  const char* text;
  const char* named;
};

TEST_F(SequenceTablesTest, ABlockCellShowsTheModelAndNamesOnlyASegment) {
  ASSERT_EQ(mBlocks.Rows(), 3u);
  ASSERT_EQ(mBlocks.Columns(), 4u);
  const Shown cells[] = {
      {1, 0, "start", ""}, {1, 1, "512", ""},   {1, 2, "PAUSE", ""},  {1, 3, "PAUSE0", ""},
      {2, 0, "two", ""},   {2, 1, "64", ""},    {2, 2, "walk", "walk"}, {2, 3, "PAUSE1", ""},
      {0, 0, "", ""},      {4, 1, "", ""},      {1, 4, "", ""},       {4, 2, "", ""},
  };
  for (const Shown& c : cells) {
    EXPECT_EQ(mBlocks.Text(c.block, c.column), c.text) << c.block << "," << c.column;
    EXPECT_EQ(mBlocks.NamedSegment(c.block, c.column), c.named) << c.block << "," << c.column;
  }
  EXPECT_EQ(SequenceBlockTable::PortOf(1), 0u);
  EXPECT_EQ(SequenceBlockTable::PortOf(2), 1u);
  EXPECT_EQ(SequenceBlockTable::PortOf(3), 2u);
}

TEST_F(SequenceTablesTest, CellsTakeEditsOnlyWithoutLoopsAndWithoutTheLock) {
  EXPECT_TRUE(mBlocks.IsEditable(false));
  EXPECT_FALSE(mBlocks.IsEditable(true));
  Load(Seq("(LOOP1,0,2,\"\"," + Blk(512) + ")"));
  EXPECT_FALSE(mBlocks.IsEditable(false));
  EXPECT_FALSE(mBlocks.IsEditable(true));
}

void SequenceTablesTest::ExpectWritten(int status, const Typed& t, const char* refusal) {
  if (t.written == nullptr) {
    EXPECT_EQ(status, 1);
    EXPECT_NE(mList.ToText().find(refusal), std::string::npos) << mList.ToText();
    EXPECT_TRUE(mFake.Writes().empty());
    return;
  }
  ASSERT_EQ(status, 0) << mList.ToText();
  ASSERT_EQ(mFake.Writes().size(), 1u);
  EXPECT_NE(mFake.Writes()[0].find(t.written), std::string::npos) << mFake.Writes()[0];
}

class BlockWrites : public SequenceTablesTest, public testing::WithParamInterface<Typed> {};

TEST_P(BlockWrites, AreOneEditOrARefusal) {
  ExpectWritten(mBlocks.Write(1, GetParam().column, GetParam().text, mList), GetParam(), "is no block length");
}

INSTANTIATE_TEST_SUITE_P(
    Table, BlockWrites,
    testing::Values(Typed{"LabelTrimmed", 0, "  first ", "(3.0,\"first\","},
                    Typed{"LengthOne", 1, "1", "(BLOCK,0,1,0,"},
                    Typed{"LengthWithBlanks", 1, " 1024 ", "(BLOCK,0,1024,0,"},
                    Typed{"LengthZero", 1, "0", nullptr},
                    Typed{"LengthNoNumber", 1, "lots", nullptr},
                    Typed{"LengthNegative", 1, "-5", nullptr},
                    Typed{"WordInAnyCase", 2, "pause1", ",PAUSE1,0,0,PAUSE0,0,0)"},
                    Typed{"SecondPort", 3, "DontCare", ",PAUSE,0,0,DONTCARE,0,0)"}),
    [](const testing::TestParamInfo<Typed>& info) { return std::string(info.param.name); });

TEST_F(SequenceTablesTest, ALockedWriteChangesNothing) {
  mFake.locked = true;
  EXPECT_EQ(mBlocks.Write(1, 1, "1024", mList), -19);
  EXPECT_EQ(mBlocks.Text(1, 1), "512");
}

TEST_F(SequenceTablesTest, AReactionCellShowsTheModel) {
  BlockReactionTable reactions(mSeq, 2);
  ASSERT_EQ(reactions.Rows(), 1u);
  const char* row[] = {"ERR", "start", "5", "V1"};
  for (unsigned long c = 0; c < BlockReactionTable::kColumns; ++c) EXPECT_EQ(reactions.Text(0, c), row[c]) << c;
  EXPECT_EQ(reactions.Text(1, 0), "");
  EXPECT_EQ(reactions.Text(0, BlockReactionTable::kColumns), "");
  reactions.SetBlock(4);
  EXPECT_FALSE(reactions.HasBlock());
  EXPECT_EQ(reactions.Rows(), 0u);
}

struct Editable {
  unsigned long block;
  bool locked;
  bool editable;
};

TEST_F(SequenceTablesTest, ReactionsTakeEditsOnAPresentBlockWithoutSyncOrLock) {
  const Editable cases[] = {{1, false, true}, {2, false, true}, {2, true, false}, {3, false, false}, {4, false, false}, {0, false, false}};
  for (const Editable& c : cases)
    EXPECT_EQ(BlockReactionTable(mSeq, c.block).IsEditable(c.locked), c.editable) << c.block << " locked " << c.locked;
}

class TriggerWrites : public SequenceTablesTest, public testing::WithParamInterface<Typed> {};

TEST_P(TriggerWrites, AreAWholeNumberFromZero) {
  const Typed& t = GetParam();
  ExpectWritten(BlockReactionTable(mSeq, 2).Write(0, t.column, t.text, mList), t, "is no trigger: a whole number from 0.");
}

INSTANTIATE_TEST_SUITE_P(
    Table, TriggerWrites,
    testing::Values(Typed{"Zero", 2, "0", "((\"ERR\",\"start\",0,\"V1\"))"},
                    Typed{"WithBlanks", 2, " 7 ", "((\"ERR\",\"start\",7,\"V1\"))"},
                    Typed{"Empty", 2, "", nullptr},
                    Typed{"Negative", 2, "-1", nullptr},
                    Typed{"Letters", 2, "5x", nullptr},
                    Typed{"TooLarge", 2, "99999999999999999999", nullptr},
                    Typed{"IfTrimmed", 0, " HALT ", "((\"HALT\",\"start\",5,\"V1\"))"},
                    Typed{"Goto", 1, "end", "((\"ERR\",\"end\",5,\"V1\"))"},
                    Typed{"Vxi", 3, "V2", "((\"ERR\",\"start\",5,\"V2\"))"}),
    [](const testing::TestParamInfo<Typed>& info) { return std::string(info.param.name); });

}  // namespace
