// The change analysis of a read: which reports the views get, and in which order.
#include <gtest/gtest.h>

#include "sequences/SequenceFixture.h"

namespace {

using Log = std::vector<std::string>;

class AnalysisTest : public SequenceFixture {
 protected:
  // Loads `before`, puts `after` on the server, reads it and returns the reports.
  Log Reports(const std::string& before, const std::string& after) {
    Load(before);
    mFake.sequence = after;
    EXPECT_EQ(mSeq.ReadSequence(mList, 0), 0) << mList.ToText();
    EXPECT_EQ(Written(), after);
    return mObserver.log;
  }
  static std::string Three(const std::string& b1, const std::string& b2, const std::string& b3) {
    return Seq("(SEQ," + b1 + ",\"\"," + b2 + ",\"\"," + b3 + ")");
  }
};

TEST_F(AnalysisTest, ABlockInsertedInTheMiddle) {
  EXPECT_EQ(Reports(Three(Blk(1), Blk(2), Blk(3)),
                    Seq("(SEQ," + Blk(1) + ",\"\"," + Blk(9) + ",\"\"," + Blk(2) + ",\"\"," + Blk(3) + ")")),
            Log{"BlockInserted 2"});
}

TEST_F(AnalysisTest, ABlockDeleted) {
  EXPECT_EQ(Reports(Three(Blk(1), Blk(2), Blk(3)), Seq("(SEQ," + Blk(1) + ",\"\"," + Blk(3) + ")")),
            Log{"BlockDeleted 2"});
}

TEST_F(AnalysisTest, TheAttributesOfABlockThatStayedInTheirOrder) {
  const std::string changed = "(BLOCK,5,2,1,\"v\",((\"\",\"\",0,\"\")),\"x\",0,0,PAUSE1,0,0)";
  EXPECT_EQ(Reports(Three(Blk(1), Blk(2), Blk(3)), Three(Blk(1), changed, Blk(3))),
            (Log{"BlockMeasureChanged 2", "BlockTriggerChanged 2", "BlockVXITriggerChanged 2",
                 "BlockReactionsChanged 2", "SegmentChanged 2,1", "SegmentChanged 2,2"}));
}

TEST_F(AnalysisTest, LabelLengthAndSync) {
  EXPECT_EQ(Reports(Three(Blk(1), Blk(2), Blk(3)),
                    Seq("(SEQ," + Blk(1) + ",\"here\",(BLOCK,0,7,0,\"\",SYNC,PAUSE,0,0,PAUSE0,0,0),\"\"," +
                        Blk(3) + ")")),
            (Log{"BlockLabelChanged 2", "BlockLengthChanged 2", "BlockSyncChanged 2"}));
}

TEST_F(AnalysisTest, ARemovedAndTwoAddedBlocksAreOneChangeAndOneInsert) {
  EXPECT_EQ(Reports(Three(Blk(1), Blk(2), Blk(3)),
                    Seq("(SEQ," + Blk(1) + ",\"\"," + Blk(8) + ",\"\"," + Blk(9) + ",\"\"," + Blk(3) + ")")),
            (Log{"BlockLengthChanged 2", "BlockInserted 3"}));
}

TEST_F(AnalysisTest, AMovedBlockIsDeletedAndInsertedInTheViewsNumbering) {
  EXPECT_EQ(Reports(Three(Blk(1), Blk(2), Blk(3)), Three(Blk(2), Blk(3), Blk(1))),
            (Log{"BlockDeleted 1", "BlockInserted 3"}));
}

TEST_F(AnalysisTest, ALoopInserted) {
  EXPECT_EQ(Reports(Seq("(SEQ," + Blk(1) + ",\"\"," + Blk(2) + ")"),
                    Seq("(SEQ," + Blk(1) + ",\"\",(LOOP1,0,2,\"\"," + Blk(2) + "))")),
            (Log{"LoopInserted 1,2,1,2", "UpdateLoops"}));
}

TEST_F(AnalysisTest, TheFieldsOfALoopThatStayed) {
  EXPECT_EQ(
      Reports(Seq("(SEQ," + Blk(1) + ",\"\",(LOOP1,0,2,\"\"," + Blk(2) + "))"),
              Seq("(SEQ," + Blk(1) + ",\"\",(LOOP1,4,5,\"x\"," + Blk(2) + "))")),
      (Log{"LoopIterationsChanged 1,2,1,5", "LoopTriggerChanged 1,2,1,5", "LoopVXITriggerChanged 1,2,1,5"}));
}

TEST_F(AnalysisTest, ABlockInsertedBeforeALoopLeavesTheLoop) {
  EXPECT_EQ(Reports(Seq("(SEQ," + Blk(1) + ",\"\",(LOOP1,0,2,\"\"," + Blk(2) + "))"),
                    Seq("(SEQ," + Blk(1) + ",\"\"," + Blk(9) + ",\"\",(LOOP1,0,2,\"\"," + Blk(2) + "))")),
            Log{"BlockInserted 2"});
}

TEST_F(AnalysisTest, ABlockInsertedInsideALoopReplacesTheLoop) {
  EXPECT_EQ(
      Reports(Seq("(SEQ," + Blk(1) + ",\"\",(LOOP1,0,2,\"\",(SEQ," + Blk(2) + ",\"\"," + Blk(3) + ")))"),
              Seq("(SEQ," + Blk(1) + ",\"\",(LOOP1,0,2,\"\",(SEQ," + Blk(2) + ",\"\"," + Blk(9) + ",\"\"," +
                  Blk(3) + ")))")),
      (Log{"BlockInserted 3", "LoopDeleted 1,2,2,2", "LoopInserted 1,2,3,2", "UpdateLoops"}));
}

TEST_F(AnalysisTest, AChangeOfThePortsRefreshesTheWholeView) {
  EXPECT_EQ(Reports(Seq(Blk(1)), Seq("(BLOCK,0,1,0,\"\",(),PAUSE,0,0)")), Log{"Sequence"});
}

TEST_F(AnalysisTest, AForcedReadOfTheSameTextRefreshesAndAnUnforcedOneDoesNothing) {
  Load(Seq(Blk(1)));
  ASSERT_EQ(mSeq.ReadSequence(mList, 0), 0);
  EXPECT_TRUE(mObserver.log.empty());
  EXPECT_EQ(mFake.received, DstringList{":_H:SGEN:GLOB:SEQ?"});
  ASSERT_EQ(mSeq.ReadSequence(mList, 1), 0);
  EXPECT_EQ(mObserver.log, Log{"Sequence"});
}

TEST_F(AnalysisTest, AReportThatFailsFailsTheReadAndPutsTheModelBack) {
  Load(Three(Blk(1), Blk(2), Blk(3)));
  mObserver.failWith = 5;
  mFake.sequence = Seq(Blk(4));
  EXPECT_EQ(mSeq.ReadSequence(mList, 0), 5);
  EXPECT_EQ(mSeq.GetNumBlocks(), 3u);
  EXPECT_EQ(mSeq.GetLastExpression(), Three(Blk(1), Blk(2), Blk(3)));
  // The next read tries again.
  mObserver.failWith = 0;
  mObserver.log.clear();
  ASSERT_EQ(mSeq.ReadSequence(mList, 0), 0);
  EXPECT_EQ(mSeq.GetNumBlocks(), 1u);
}

TEST_F(AnalysisTest, AfterTheCachedTextIsEmptiedTheSameTextIsReadAgainQuietly) {
  Load(Three(Blk(1), Blk(2), Blk(3)));
  mSeq.ClearLastExpression();
  ASSERT_EQ(mSeq.ReadSequence(mList, 0), 0);
  EXPECT_EQ(mFake.received, DstringList{":_H:SGEN:GLOB:SEQ?"});
  EXPECT_TRUE(mObserver.log.empty());
  EXPECT_EQ(mSeq.GetLastExpression(), Three(Blk(1), Blk(2), Blk(3)));
}

TEST_F(AnalysisTest, AnEditIsReportedByTheReadBackNotByTheEdit) {
  Load(Three(Blk(1), Blk(2), Blk(3)));
  ASSERT_EQ(mSeq.SetBlockLength(2, 8, mList), 0);
  EXPECT_EQ(mObserver.log, Log{"BlockLengthChanged 2"});
}

TEST_F(AnalysisTest, AnObserverThatLeavesIsNotToldAgain) {
  class Leaving : public CSequenceObserver {
   public:
    explicit Leaving(CSequence& s) : seq(s) {}
    int NfyBlockInserted(unsigned long, ConditionList&) override {
      ++told;
      seq.RemoveObserver(this);
      return 0;
    }
    CSequence& seq;
    int told = 0;
  } leaving(mSeq);
  Load(Seq(Blk(1)));
  mSeq.AddObserver(&leaving);
  mFake.sequence = Three(Blk(1), Blk(2), Blk(3));
  ASSERT_EQ(mSeq.ReadSequence(mList, 0), 0);
  EXPECT_EQ(leaving.told, 1);
  EXPECT_EQ(mObserver.log, (Log{"BlockInserted 2", "BlockInserted 3"}));
}

}  // namespace
