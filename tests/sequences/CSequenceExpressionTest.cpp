// The sequence expression: the writer, both readers, and what they refuse.
#include <gtest/gtest.h>

#include "sequences/CLoop.h"
#include "sequences/CSequenceBlock.h"
#include "sequences/CSequenceStructure.h"
#include "sequences/CSequenceWriter.h"
#include "sequences/SequenceFixture.h"

namespace {

using ExpressionTest = SequenceFixture;

TEST_F(ExpressionTest, AnEmptySequenceIsWrittenAsEmpty) {
  CSequence empty;
  Dstring out;
  EXPECT_EQ(empty.asExpression(out, mList), 0);
  EXPECT_EQ(out, "(3.0,,)");
}

TEST_F(ExpressionTest, ReadingTheEmptySequenceGivesOneDefaultBlock) {
  ASSERT_EQ(mSeq.fromExpression("(3.0,,)", mList), 0) << mList.ToText();
  ASSERT_EQ(mSeq.GetNumBlocks(), 1u);
  // The ports come from the configuration: port 1 a generator, port 2 an analyser.
  EXPECT_EQ(mSeq.GetNumPorts(), 2u);
  EXPECT_EQ(mSeq.GetType(1, 1), CSequence::SEG_PAUSE);
  EXPECT_EQ(mSeq.GetType(1, 2), CSequence::SEG_PAUSE0);
  EXPECT_EQ(mSeq.GetBlockLength(1), CSequence::kDefaultBlockLength);
  EXPECT_EQ(Written(), Seq(Blk(512)));
}

class RoundTrip : public SequenceFixture, public testing::WithParamInterface<const char*> {};

// Each text is what the writer writes for what the reader makes of it.
TEST_P(RoundTrip, WritesBackWhatItRead) {
  ASSERT_EQ(mSeq.fromExpression(GetParam(), mList), 0) << mList.ToText();
  EXPECT_EQ(Written(), GetParam());
  // Without its outer parentheses the text is the same expression, read from one whole tree
  // instead of an item at a time.
  const std::string bare(GetParam() + 1, std::char_traits<char>::length(GetParam()) - 2);
  ASSERT_EQ(mSeq.fromExpression(bare, mList), 0) << mList.ToText();
  EXPECT_EQ(Written(), GetParam());
}

INSTANTIATE_TEST_SUITE_P(
    Texts, RoundTrip,
    testing::Values(
        "(3.0,\"start\",(BLOCK,1,2,3,\"v\",(),PAUSE,0,0,\"seg\",0,0))",
        "(3.0,\"\",(BLOCK,0,64,0,\"\",((\"c\",\"L2\",4,\"x\"),(\"\",\"\",0,\"\")),PAUSE1,0,0,DONTCARE,0,0))",
        "(3.0,\"\",(BLOCK,0,64,0,\"\",SYNC,ACQUIRE,0,0,EXPECTED1,0,0))",
        "(3.0,\"a\",(SEQ,(BLOCK,0,1,0,\"\",(),PAUSE,0,0,PAUSE0,0,0),\"b\",(BLOCK,0,2,0,\"\",(),PAUSE,0,0,"
        "PAUSE0,0,0)))",
        "(3.0,\"\",(LOOP1,7,5,\"vx\",(BLOCK,0,1,0,\"\",(),PAUSE,0,0,PAUSE0,0,0)))",
        "(3.0,\"\",(SEQ,(BLOCK,0,1,0,\"\",(),PAUSE,0,0,PAUSE0,0,0),\"\",(LOOP2,0,3,\"\",(SEQ,(LOOP1,0,2,\"\","
        "(BLOCK,0,2,0,\"\",(),PAUSE,0,0,PAUSE0,0,0)),\"in\",(BLOCK,0,3,0,\"\",(),PAUSE,0,0,PAUSE0,0,0))),"
        "\"\","
        "(BLOCK,0,4,0,\"\",(),PAUSE,0,0,PAUSE0,0,0)))",
        "(3.0,\"x\",(LOOP3,0,INF,\"\",(SEQ,(BLOCK,0,1,0,\"\",(),PAUSE,0,0,PAUSE0,0,0),\"\","
        "(LOOP1,0,2,\"\",(BLOCK,0,2,0,\"\",(),PAUSE,0,0,PAUSE0,0,0)))))",
        "(3.0,\"a\"\"b\",(BLOCK,0,1,0,\"q\"\"\",((\"i\"\"f\",\"\",0,\"\")),\"se\"\"g\",0,0,PAUSE0,0,0))"));

TEST_F(ExpressionTest, ReadsTheStructureOfLoops) {
  const std::string text = Seq("(SEQ," + Blk(1) + ",\"\",(LOOP2,0,3,\"\",(SEQ,(LOOP1,4,2,\"t\"," + Blk(2) +
                               "),\"\"," + Blk(3) + ")),\"\"," + Blk(4) + ")");
  ASSERT_EQ(mSeq.fromExpression(text, mList), 0) << mList.ToText();
  ASSERT_EQ(mSeq.GetNumBlocks(), 4u);
  EXPECT_EQ(mSeq.GetLoopStatus(1, 2), CSequence::LOOP_NONE);
  EXPECT_EQ(mSeq.GetLoopStatus(2, 2), CSequence::LOOP_START);
  EXPECT_EQ(mSeq.GetLoopStatus(3, 2), CSequence::LOOP_END);
  EXPECT_EQ(mSeq.GetLoopStatus(2, 1), CSequence::LOOP_SINGLE);
  EXPECT_EQ(mSeq.GetLoopTrigger(2, 1), 4u);
  EXPECT_EQ(mSeq.GetLoopVXITrigger(2, 1), "t");
  EXPECT_EQ(mSeq.GetNumIterations(2, 2), 3u);
  EXPECT_EQ(mSeq.GetLoopEnd(2, 2), 3u);
  EXPECT_EQ(mSeq.GetHighestLoopLevel(2, 3), 2u);
  EXPECT_EQ(mSeq.GetHighestLoopLevel(3, 1), 0u);
  EXPECT_TRUE(mSeq.IsBlockInLoop(3, 2));
  EXPECT_FALSE(mSeq.IsBlockInLoop(3, 1));
  EXPECT_FALSE(mSeq.IsBlockInLoop(9, 3));
  EXPECT_EQ(mSeq.GetNumIterations(1, 1), 1u) << "a block in no loop repeats once";
}

TEST_F(ExpressionTest, VersionOneIsReadByTheFirstGenerationReader) {
  const std::string text =
      "(1.0,\"s\",(SEQ,(BLOCK,100,PAUSE,\"a\"),\"l\",(LOOP,3,(SEQ,(BLOCK,200,PAUSE0,PAUSE),\"\","
      "(LOOP,INF,(BLOCK,300,PAUSE,PAUSE))))))";
  ASSERT_EQ(mSeq.fromExpression(text, mList), 0) << mList.ToText();
  ASSERT_EQ(mSeq.GetNumBlocks(), 3u);
  EXPECT_EQ(mSeq.GetLabel(1), "s");
  EXPECT_EQ(mSeq.GetLabel(2), "l");
  EXPECT_EQ(mSeq.GetSegment(1, 2), "a");
  EXPECT_EQ(mSeq.GetType(1, 2), CSequence::SEG_NAMED);
  // A first-generation loop is one level above the loops inside it.
  EXPECT_EQ(mSeq.GetLoopStatus(2, 2), CSequence::LOOP_START);
  EXPECT_EQ(mSeq.GetLoopStatus(3, 1), CSequence::LOOP_SINGLE);
  EXPECT_EQ(mSeq.GetNumIterations(3, 1), 0u);
  EXPECT_EQ(Written(),
            "(3.0,\"s\",(SEQ,(BLOCK,0,100,0,\"\",(),PAUSE,0,0,\"a\",0,0),\"l\",(LOOP2,0,3,\"\",(SEQ,"
            "(BLOCK,0,200,0,\"\",(),PAUSE0,0,0,PAUSE,0,0),\"\",(LOOP1,0,INF,\"\","
            "(BLOCK,0,300,0,\"\",(),PAUSE,0,0,PAUSE,0,0))))))");
}

TEST_F(ExpressionTest, VersionsTwoAndThreeAreReadBySecondGenerationAndAboveThreeRefused) {
  for (const char* version : {"2.0", "3.0", "3"}) {
    CSequence seq;
    ConditionList list;
    EXPECT_EQ(seq.fromExpression(Dstring("(") + version + ",\"\"," + Blk(5) + ")", list), 0) << version;
    EXPECT_EQ(seq.GetBlockLength(1), 5u) << version;
  }
  // A second-generation text is no first-generation one.
  EXPECT_EQ(mSeq.fromExpression("(1.0,\"\"," + Blk(5) + ")", mList), 1);
  EXPECT_EQ(LastKey(), "GUI_SEQUENCE_SYNTAX");
  mList.Clear();
  EXPECT_EQ(mSeq.fromExpression("(3.5,\"\"," + Blk(5) + ")", mList), 1);
  ASSERT_EQ(LastKey(), "GUI_SEQUENCE_WRONG_VERSION");
  EXPECT_EQ(mList.Last().GetArgs(), std::vector<Dstring>{"3.5"});
}

// A label is any plain item: a server may send a number or a bare word unquoted.
TEST_F(ExpressionTest, LabelsThatAreNumbersOrBareWordsAreRead) {
  ASSERT_EQ(mSeq.fromExpression("(3.0,5,(BLOCK,0,5,0,\"\",(),PAUSE,0,0,PAUSE0,0,0))", mList), 0) << mList.ToText();
  EXPECT_EQ(mSeq.GetLabel(1), "5");
  ASSERT_EQ(mSeq.fromExpression("(3.0,start,(SEQ," + Blk(1) + ",2.5," + Blk(2) + "))", mList), 0) << mList.ToText();
  EXPECT_EQ(mSeq.GetLabel(1), "start");
  EXPECT_EQ(mSeq.GetLabel(2), "2.5");
}

class Refused : public SequenceFixture, public testing::WithParamInterface<std::string> {};

TEST_P(Refused, IsASyntaxErrorAndLeavesNothing) {
  ASSERT_EQ(mSeq.fromExpression(Seq(Blk(1)), mList), 0);
  EXPECT_EQ(mSeq.fromExpression(GetParam(), mList), 1);
  EXPECT_EQ(LastKey(), "GUI_SEQUENCE_SYNTAX");
  EXPECT_EQ(mSeq.GetNumBlocks(), 0u);
  EXPECT_EQ(mSeq.GetNumPorts(), 0u);
  EXPECT_TRUE(mSeq.GetLoops().empty());
  EXPECT_FALSE(mSeq.IsReading());
}

INSTANTIATE_TEST_SUITE_P(
    Texts, Refused,
    testing::Values(
        "", "(3.0", "(3.0,\"\")", "((3.0),\"\"," + Blk(1) + ")", "(X,\"\"," + Blk(1) + ")",
        "(3.0,(\"\")," + Blk(1) + ")", "(3.0,\"\",5)", "(3.0,\"\",(FOO))", "(3.0,\"\",())",
        "(3.0,\"\",(BLOCK,0,1,0,\"\",(),PAUSE,0))", "(3.0,\"\",(BLOCK,-1,1,0,\"\",(),PAUSE,0,0,PAUSE0,0,0))",
        "(3.0,\"\",(BLOCK,0,1,0,\"\",((\"a\",\"b\",1)),PAUSE,0,0))",
        "(3.0,\"\",(BLOCK,0,1,0,\"\",(),(PAUSE),0,0))", "(3.0,\"\",(BLOCK,0,1,0,\"\",(),,0,0))",
        "(3.0,\"\",(SEQ," + Blk(1) + "," + Blk(2) + "))",
        "(3.0,\"\",(SEQ," + Blk(1) + ",\"\",(BLOCK,0,1,0,\"\",(),PAUSE,0,0)))",
        "(3.0,\"\",(SEQ," + Blk(1) + ",\"\"))", "(3.0,\"\",(SEQ," + Blk(1) + ",(\"x\")," + Blk(2) + "))",
        "(3.0,\"\",(LOOP1,0,2,\"\",(LOOP1,0,2,\"\"," + Blk(1) + ")))",
        "(3.0,\"\",(LOOP1,0,2,\"\",(LOOP2,0,2,\"\"," + Blk(1) + ")))",
        "(3.0,\"\",(LOOP0,0,2,\"\"," + Blk(1) + "))", "(3.0,\"\",(LOOP17,0,2,\"\"," + Blk(1) + "))",
        "(3.0,\"\",(LOOP1,0,ALL,\"\"," + Blk(1) + "))", "(3.0,\"\",(LOOP1,0,2," + Blk(1) + "))",
        // Faults after the first items were already read.
        "(3.0,\"\",(SEQ," + Blk(1) + ",\"\"," + Blk(2) + "),\"open)",
        "(3.0,\"\",(SEQ," + Blk(1) + ",\"\",(BLOCK,0,1 1)))", "(3.0,\"\",(SEQ," + Blk(1) + ")),(x)",
        "(3.0,\"\",(SEQ," + Blk(1) + ",\"\"," + Blk(2) + ",\"\",(LOOP1,0,0,\"\",(LOOP2,0,1,\"\"," + Blk(3) + "))))"));

TEST_F(ExpressionTest, TheWriterRefusesOverlappingLoops) {
  ASSERT_EQ(mSeq.fromExpression(Seq("(SEQ," + Blk(1) + ",\"\"," + Blk(2) + ",\"\"," + Blk(3) + ")"), mList),
            0);
  CSequence::Content content;
  content.numPorts = 2;
  for (unsigned long b = 1; b <= 3; ++b) content.blocks.push_back(mSeq.GetBlock(b)->CloneContent());
  CSequenceStructure::AddLoop(content, &mSeq, 1, 2, 2);
  CSequenceStructure::AddLoop(content, &mSeq, 2, 2, 1);
  Dstring out;
  EXPECT_EQ(CSequenceWriter::Write(content, 3, out, mList), 1);
  ASSERT_EQ(LastKey(), "GUI_SEQUENCE_IMPOSSIBLE_NESTING_LOOPS");
  EXPECT_EQ(mList.Last().GetArgs(), (std::vector<Dstring>{"2", "1"}));
}

TEST_F(ExpressionTest, ALoopBeyondTheLevelsIsStillWritten) {
  // Read before the number of levels was known: the loop is kept and written, not dropped.
  CSequence::EndNumLoopLevels();
  const std::string text = Seq("(LOOP2,0,2,\"\"," + Blk(1) + ")");
  ASSERT_EQ(mSeq.fromExpression(text, mList), 0);
  EXPECT_EQ(Written(), text);
}

TEST_F(ExpressionTest, KeywordsAreReadInAnyCaseAndWrittenInCapitals) {
  ASSERT_EQ(mSeq.fromExpression("(3.0,\"\",(block,0,1,0,\"\",sync,pause1,0,0,Acquire,0,0))", mList), 0)
      << mList.ToText();
  EXPECT_EQ(mSeq.GetType(1, 1), CSequence::SEG_PAUSE1);
  EXPECT_EQ(mSeq.GetType(1, 2), CSequence::SEG_ACQUIRE);
  EXPECT_EQ(mSeq.GetBlockSync(1), 1u);
  EXPECT_EQ(Written(), "(3.0,\"\",(BLOCK,0,1,0,\"\",SYNC,PAUSE1,0,0,ACQUIRE,0,0))");
}

struct KindCase {
  const char* item;
  CSequence::SeqSegType type;
};

class SegmentKinds : public SequenceFixture, public testing::WithParamInterface<KindCase> {};

TEST_P(SegmentKinds, Table) {
  ASSERT_EQ(mSeq.fromExpression(Seq(Blk(1, GetParam().item)), mList), 0) << mList.ToText();
  EXPECT_EQ(mSeq.GetType(1, 1), GetParam().type);
}

INSTANTIATE_TEST_SUITE_P(Table, SegmentKinds,
                         testing::Values(KindCase{"\"PAUSE\"", CSequence::SEG_NAMED},
                                         KindCase{"PAUSE", CSequence::SEG_PAUSE},
                                         KindCase{"PAUSE0", CSequence::SEG_PAUSE0},
                                         KindCase{"PAUSE1", CSequence::SEG_PAUSE1},
                                         KindCase{"ACQUIRE", CSequence::SEG_ACQUIRE},
                                         KindCase{"EXPECTED0", CSequence::SEG_EXPECTED0},
                                         KindCase{"EXPECTED1", CSequence::SEG_EXPECTED1},
                                         KindCase{"DONTCARE", CSequence::SEG_DONTCARE},
                                         KindCase{"SOMETHING", CSequence::SEG_NAMED}));

}  // namespace
