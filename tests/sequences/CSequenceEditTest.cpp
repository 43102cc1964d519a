// The editing operations: loop rules, clipboard, moves, checks, and the write after each edit.
#include <gtest/gtest.h>

#include "sequences/CSequenceBlock.h"
#include "sequences/SequenceFixture.h"

namespace {

class EditTest : public SequenceFixture {
 protected:
  // Blocks of lengths 1..5; a level-1 loop over blocks 2..4 and a level-2 one over block 5.
  void LoadFive() {
    Load(Seq("(SEQ," + Blk(1) + ",\"\",(LOOP1,0,3,\"\",(SEQ," + Blk(2) + ",\"\"," + Blk(3) + ",\"\"," +
             Blk(4) + ")),\"\",(LOOP2,0,4,\"\"," + Blk(5) + "))"));
  }
  std::vector<unsigned long> Lengths() const {
    std::vector<unsigned long> out;
    for (unsigned long b = 1; b <= mSeq.GetNumBlocks(); ++b) out.push_back(mSeq.GetBlockLength(b));
    return out;
  }
  // After every successful edit the model is what the server holds.
  void ExpectInStep() {
    EXPECT_EQ(mSeq.GetLastExpression(), mFake.sequence);
    EXPECT_EQ(Written(), mFake.sequence);
  }
};

TEST_F(EditTest, InsertingBeforeALoopsFirstBlockOnlyMovesIt) {
  LoadFive();
  ASSERT_EQ(mSeq.AddBlockBefore(2, mList), 0) << mList.ToText();
  EXPECT_EQ(Lengths(), (std::vector<unsigned long>{1, 512, 2, 3, 4, 5}));
  EXPECT_EQ(mSeq.GetLoopStart(3, 1), 3u);
  EXPECT_EQ(mSeq.GetLoopLength(3, 1), 3u);
  EXPECT_EQ(mSeq.GetLoopStatus(2, 1), CSequence::LOOP_NONE);
  EXPECT_EQ(mSeq.GetLoopStart(6, 2), 6u);
  ExpectInStep();
  EXPECT_EQ(mFake.Writes().size(), 1u);
}

TEST_F(EditTest, InsertingBeforeALoopsLastBlockLengthensIt) {
  LoadFive();
  ASSERT_EQ(mSeq.AddBlockBefore(4, mList), 0);
  EXPECT_EQ(Lengths(), (std::vector<unsigned long>{1, 2, 3, 512, 4, 5}));
  EXPECT_EQ(mSeq.GetLoopStart(4, 1), 2u);
  EXPECT_EQ(mSeq.GetLoopLength(4, 1), 4u);
  EXPECT_EQ(mSeq.GetLoopStatus(5, 1), CSequence::LOOP_END);
  ExpectInStep();
}

TEST_F(EditTest, AddingAfterALoopsLastBlockLeavesItAndAfterItsFirstJoinsIt) {
  LoadFive();
  ASSERT_EQ(mSeq.AddBlockAfter(4, mList), 0);
  EXPECT_EQ(mSeq.GetLoopLength(2, 1), 3u);
  EXPECT_EQ(mSeq.GetLoopStatus(5, 1), CSequence::LOOP_NONE);
  ASSERT_EQ(mSeq.AddBlockAfter(2, mList), 0);
  EXPECT_EQ(mSeq.GetLoopLength(2, 1), 4u);
  EXPECT_EQ(mSeq.GetLoopStatus(3, 1), CSequence::LOOP_INSIDE);
  ExpectInStep();
}

TEST_F(EditTest, AddingAfterAOneBlockLoopKeepsItOneBlockLong) {
  LoadFive();
  ASSERT_EQ(mSeq.AddBlockAfter(5, mList), 0);
  EXPECT_EQ(mSeq.GetLoopStatus(5, 2), CSequence::LOOP_SINGLE);
  EXPECT_EQ(mSeq.GetLoopStatus(6, 2), CSequence::LOOP_NONE);
  ExpectInStep();
}

TEST_F(EditTest, AddingTheFirstBlockAndAGivenBlock) {
  LoadFive();
  auto given = mSeq.GetBlock(5)->CloneContent();
  ASSERT_EQ(mSeq.AddBlockAfter(0, mList, std::move(given)), 0);
  EXPECT_EQ(Lengths(), (std::vector<unsigned long>{5, 1, 2, 3, 4, 5}));
  EXPECT_EQ(mSeq.GetLoopStart(3, 1), 3u);
  ExpectInStep();
}

TEST_F(EditTest, DeletingAOneBlockLoopsBlockDeletesTheLoop) {
  LoadFive();
  ASSERT_EQ(mSeq.DeleteBlock(5, mList), 0);
  EXPECT_EQ(mSeq.GetLoops().size(), 1u);
  ASSERT_EQ(mSeq.DeleteBlock(3, mList), 0);
  EXPECT_EQ(Lengths(), (std::vector<unsigned long>{1, 2, 4}));
  EXPECT_EQ(mSeq.GetLoopLength(2, 1), 2u);
  ASSERT_EQ(mSeq.DeleteBlock(1, mList), 0);
  EXPECT_EQ(mSeq.GetLoopStart(1, 1), 1u);
  ExpectInStep();
}

TEST_F(EditTest, DeletingTheLastBlockLeavesOneFreshBlockInOneWrite) {
  Load(Seq(Blk(7, "\"a\"")));
  ASSERT_EQ(mSeq.DeleteBlock(1, mList), 0);
  ASSERT_EQ(mSeq.GetNumBlocks(), 1u);
  EXPECT_EQ(mSeq.GetBlockLength(1), CSequence::kDefaultBlockLength);
  EXPECT_EQ(mFake.Writes(), DstringList{Seq(Blk(512))});
}

TEST_F(EditTest, SetLoopOverARangeThatHoldsALoopChangesNothing) {
  LoadFive();
  EXPECT_EQ(mSeq.SetLoop(3, 1, mList, 3, 5, 0, ""), 0);
  EXPECT_TRUE(mFake.Writes().empty());
  EXPECT_TRUE(mList.IsEmpty());
  EXPECT_EQ(mSeq.GetLoops().size(), 2u);
}

TEST_F(EditTest, TheTopLevelLoopsForEverAndBelowItZeroBecomesTwo) {
  Load(Seq("(SEQ," + Blk(1) + ",\"\"," + Blk(2) + ")"));
  ASSERT_EQ(mSeq.SetLoop(1, 3, mList, 2, 9, 1, "v"), 0);
  EXPECT_EQ(mSeq.GetNumIterations(1, 3), 0u);
  ASSERT_EQ(mSeq.SetLoop(2, 1, mList, 1, 0, 0, ""), 0);
  EXPECT_EQ(mSeq.GetNumIterations(2, 1), 2u);
  EXPECT_EQ(mFake.sequence,
            Seq("(LOOP3,1,INF,\"v\",(SEQ," + Blk(1) + ",\"\",(LOOP1,0,2,\"\"," + Blk(2) + ")))"));
  ASSERT_EQ(mSeq.SetNumIterations(2, 1, 0, mList), 0);
  EXPECT_EQ(mSeq.GetNumIterations(2, 1), 2u);
  ASSERT_EQ(mSeq.SetNumIterations(1, 3, 4, mList), 0);
  EXPECT_EQ(mSeq.GetNumIterations(1, 3), 0u);
  ExpectInStep();
}

TEST_F(EditTest, LoopSettersAndDeleteLoop) {
  LoadFive();
  ASSERT_EQ(mSeq.SetLoopTrigger(3, 1, 6, mList), 0);
  ASSERT_EQ(mSeq.SetLoopVXITrigger(3, 1, "TTL2", mList), 0);
  EXPECT_EQ(mSeq.GetLoopTrigger(2, 1), 6u);
  EXPECT_EQ(mSeq.GetLoopVXITrigger(4, 1), "TTL2");
  ASSERT_EQ(mSeq.DeleteLoop(4, 1, mList), 0);
  EXPECT_EQ(mSeq.GetLoopStatus(3, 1), CSequence::LOOP_NONE);
  EXPECT_EQ(mSeq.DeleteLoop(4, 1, mList), 1);
  EXPECT_EQ(LastKey(), "GUI_SEQUENCE_NO_LOOP");
  ExpectInStep();
}

TEST_F(EditTest, ALoopThatWouldOverlapIsRefusedByTheWriterAndUndone) {
  LoadFive();
  const Dstring before = mFake.sequence;
  EXPECT_EQ(mSeq.SetLoop(1, 2, mList, 2, 2, 0, ""), 1);
  EXPECT_EQ(LastKey(), "GUI_SEQUENCE_IMPOSSIBLE_NESTING_LOOPS");
  EXPECT_TRUE(mFake.Writes().empty());
  EXPECT_EQ(mSeq.GetLoops().size(), 2u);
  EXPECT_EQ(Written(), before);
  EXPECT_EQ(mSeq.GetLastExpression(), before);
}

TEST_F(EditTest, BlockAttributesAndReactions) {
  Load(Seq(Blk(1)));
  ASSERT_EQ(mSeq.SetBlockLength(1, 99, mList), 0);
  ASSERT_EQ(mSeq.SetLabel(1, "go", mList), 0);
  ASSERT_EQ(mSeq.SetBlockTrigger(1, 3, mList), 0);
  ASSERT_EQ(mSeq.SetBlockMeasurementStart(1, 8, mList), 0);
  ASSERT_EQ(mSeq.SetBlockVXITrigger(1, "ECL0", mList), 0);
  ASSERT_EQ(mSeq.NewReact(1, mList), 0);
  ASSERT_EQ(mSeq.NewReact(1, mList), 0);
  ASSERT_EQ(mSeq.SetReactIf(1, 1, "ERR", mList), 0);
  ASSERT_EQ(mSeq.SetReactGoto(1, 1, "go", mList), 0);
  ASSERT_EQ(mSeq.SetReactTrig(1, 1, 2, mList), 0);
  ASSERT_EQ(mSeq.SetReactVxi(1, 1, "v", mList), 0);
  ASSERT_EQ(mSeq.DeleteReact(1, 0, mList), 0);
  EXPECT_EQ(mFake.sequence,
            "(3.0,\"go\",(BLOCK,3,99,8,\"ECL0\",((\"ERR\",\"go\",2,\"v\")),PAUSE,0,0,PAUSE0,0,0))");
  EXPECT_EQ(mSeq.GetBlockNumBranches(1), 1u);
  EXPECT_EQ(mSeq.GetReactGoto(1, 0), "go");
  ASSERT_EQ(mSeq.SetBlockSync(1, 1, mList), 0);
  EXPECT_TRUE(mSeq.HasBlockSync());
  // A synchronisation block has no branch table on the wire.
  EXPECT_EQ(mSeq.GetBlockNumBranches(1), 0u);
  ASSERT_EQ(mSeq.SetBlockSync(1, 0, mList), 0);
  ASSERT_EQ(mSeq.NewReact(1, mList), 0);
  ASSERT_EQ(mSeq.ClearBranchTable(1, mList), 0);
  EXPECT_EQ(mSeq.GetBlockNumBranches(1), 0u);
  ExpectInStep();
}

TEST_F(EditTest, ClearExistingStartLabel) {
  Load(Seq(Blk(1), "start"));
  ASSERT_EQ(mSeq.ClearExistingStartLabel(mList), 0);
  EXPECT_EQ(mFake.sequence, Seq(Blk(1)));
  mFake.received.clear();
  ASSERT_EQ(mSeq.ClearExistingStartLabel(mList), 0);
  EXPECT_TRUE(mFake.Writes().empty()) << "no label, nothing to write";
}

TEST_F(EditTest, SegmentsByNameAndByKind) {
  Load(Seq(Blk(1)));
  ASSERT_EQ(mSeq.SetSegment(1, 1, "ramp", mList), 0);
  ASSERT_EQ(mSeq.SetSegment(1, 2, "", mList, CSequence::SEG_EXPECTED0), 0);
  EXPECT_EQ(mFake.sequence, Seq(Blk(1, "\"ramp\"", "EXPECTED0")));
  EXPECT_EQ(mSeq.SetSegment(1, 1, "", mList), 1);
  EXPECT_EQ(LastKey(), "GUI_SEQUENCE_BAD_SEGMENT");
  EXPECT_EQ(mSeq.SetSegment(1, 1, "x", mList, static_cast<CSequence::SeqSegType>(8)), 1);
  EXPECT_EQ(mSeq.SetSegment(1, 3, "x", mList), 1);
  EXPECT_EQ(LastKey(), "GUI_SEQUENCE_NO_PORT");
}

TEST_F(EditTest, DefaultSegmentsFollowThePortTypeAndTheMode) {
  Load(Seq(Blk(1, "\"a\"", "\"b\"")));
  ASSERT_EQ(mSeq.SetDefaultSegment(1, 1, mList), 0) << mList.ToText();
  ASSERT_EQ(mSeq.SetDefaultSegment(1, 2, mList), 0);
  EXPECT_EQ(mFake.sequence, Seq(Blk(1, "PAUSE", "PAUSE0")));
  mFake.configuration = Dstring(FakeSequencer::kConfiguration).replace(1, 4, "CAPT");
  ASSERT_EQ(mSeq.SetSegment(1, 1, "a", mList), 0);
  ASSERT_EQ(mSeq.SetDefaultSegment(1, 1, mList), 0);
  EXPECT_EQ(mFake.sequence, Seq(Blk(1, "ACQUIRE", "PAUSE0")));
  EXPECT_EQ(CPortInfo::GetMode(), "CAPT") << "the reply is taken as the configuration known";
}

// The model knows the system only as the value its port source hands over: the items of a new
// block and whether there are events come from it, whatever the port information holds.
TEST_F(EditTest, NewBlocksAndEventsFollowThePortSourceOnly) {
  static SequencePorts given;
  const SequencePorts::Source source = [](SequencePorts::Ask, SequencePorts& out, ConditionList&) {
    out = given;
    return 0;
  };
  mSeq.SetPortSource(source);
  const struct {
    bool capture;
    std::vector<Dstring> types;
    std::vector<std::string> items;
  } cases[] = {
      {true, {"OUTPUT_PORT", "INPUT_PORT", "OUTPUT_PORT"}, {"ACQUIRE", "PAUSE0", "ACQUIRE"}},
      {false, {"INPUT_PORT", "OUTPUT_PORT"}, {"PAUSE0", "PAUSE"}},
  };
  for (const auto& c : cases) {
    given = SequencePorts{true, false, c.capture, c.types};
    ASSERT_EQ(mSeq.fromExpression("(3.0,,)", mList), 0) << mList.ToText();
    ASSERT_EQ(mSeq.GetNumPorts(), c.items.size());
    for (unsigned long p = 1; p <= c.items.size(); ++p) EXPECT_EQ(mSeq.GetSegment(1, p), c.items[p - 1]) << p;
  }
  given = SequencePorts{true, true, false, {"OUTPUT_PORT"}};
  Load(Seq(Blk(1)));
  ASSERT_EQ(mSeq.SetEvent(0, {"Arm", 3, {}}, mList), 0) << mList.ToText();
  EXPECT_EQ(mSeq.GetEvents().GetEvent(0).name, "Arm");
  mSeq.SetPortSource(nullptr);
  ASSERT_EQ(mSeq.fromExpression("(3.0,,)", mList), 0);
  EXPECT_EQ(mSeq.GetNumPorts(), 0u) << "without a source there are no ports";
}

TEST_F(EditTest, CutCopyAndPaste) {
  EXPECT_FALSE(CSequence::IsPasteBlockPossible());
  LoadFive();
  EXPECT_EQ(mSeq.PasteBlockAfter(1, mList), 1);
  EXPECT_EQ(LastKey(), "GUI_SEQUENCE_CLIPBOARD_EMPTY");
  mFake.received.clear();
  ASSERT_EQ(mSeq.CopyBlock(3, mList), 0);
  EXPECT_TRUE(mFake.received.empty()) << "copying sends nothing";
  EXPECT_TRUE(CSequence::IsPasteBlockPossible());
  ASSERT_EQ(mSeq.PasteBlockBefore(1, mList), 0);
  ASSERT_EQ(mSeq.CutBlock(1, mList), 0);
  ASSERT_EQ(mSeq.PasteBlockAfter(5, mList), 0);
  // Pasted after the last block of the level-2 loop: outside it.
  EXPECT_EQ(Lengths(), (std::vector<unsigned long>{1, 2, 3, 4, 5, 3}));
  EXPECT_EQ(mSeq.GetLoopStatus(6, 2), CSequence::LOOP_NONE);
  ExpectInStep();
}

TEST_F(EditTest, APastedBlockKeepsItsLabelOnlyWhileNoOtherBlockHasIt) {
  Load(Seq("(SEQ," + Blk(1) + ",\"here\"," + Blk(2) + ")"));
  ASSERT_EQ(mSeq.CopyBlock(2, mList), 0);
  ASSERT_EQ(mSeq.PasteBlockAfter(2, mList), 0);
  EXPECT_EQ(mSeq.GetLabel(3), "");
  ASSERT_EQ(mSeq.CutBlock(2, mList), 0);
  ASSERT_EQ(mSeq.PasteBlockBefore(1, mList), 0);
  EXPECT_EQ(mSeq.GetLabel(1), "here");
  ExpectInStep();
}

TEST_F(EditTest, MovingABlockUpAndDown) {
  LoadFive();
  ASSERT_EQ(mSeq.MoveBlock(1, 2, mList), 0);
  // Down past block 3: after it, inside the loop.
  EXPECT_EQ(Lengths(), (std::vector<unsigned long>{2, 3, 1, 4, 5}));
  EXPECT_EQ(mSeq.GetLoopStart(3, 1), 1u);
  EXPECT_EQ(mSeq.GetLoopLength(3, 1), 4u);
  ASSERT_EQ(mSeq.MoveBlock(4, 1, mList), 0);
  // Down past the last block of the loop and onto the one-block loop's block: outside both.
  EXPECT_EQ(Lengths(), (std::vector<unsigned long>{2, 3, 1, 5, 4}));
  EXPECT_EQ(mSeq.GetLoopLength(1, 1), 3u);
  EXPECT_EQ(mSeq.GetLoopStatus(5, 2), CSequence::LOOP_NONE);
  EXPECT_EQ(mSeq.GetLoopStatus(4, 2), CSequence::LOOP_SINGLE);
  ASSERT_EQ(mSeq.MoveBlock(4, -3, mList), 0);
  // Up before the first block of the loop: outside it.
  EXPECT_EQ(Lengths(), (std::vector<unsigned long>{5, 2, 3, 1, 4}));
  EXPECT_EQ(mSeq.GetLoopStart(2, 1), 2u);
  // Taken out as DeleteBlock takes it: its one-block loop went, and does not travel along.
  EXPECT_EQ(mSeq.GetLoopStatus(1, 2), CSequence::LOOP_NONE);
  EXPECT_EQ(mSeq.GetLoops().size(), 1u);
  ExpectInStep();
  mFake.received.clear();
  EXPECT_EQ(mSeq.MoveBlock(2, 0, mList), 0);
  EXPECT_TRUE(mFake.Writes().empty());
  EXPECT_EQ(mSeq.MoveBlock(2, 4, mList), 1);
  EXPECT_EQ(LastKey(), "GUI_SEQUENCE_BAD_MOVE");
}

TEST_F(EditTest, MovingTheOnlyBlockOfAOneBlockLoopDeletesTheLoop) {
  LoadFive();
  ASSERT_EQ(mSeq.MoveBlock(5, -4, mList), 0);
  EXPECT_EQ(mSeq.GetLoops().size(), 1u);
  ExpectInStep();
}

struct BadCase {
  const char* name;
  int (*edit)(CSequence&, ConditionList&);
  const char* key;
};

class BadNumbers : public SequenceFixture, public testing::WithParamInterface<BadCase> {};

TEST_P(BadNumbers, AreRefusedWithoutWriting) {
  Load(Seq(Blk(1)));
  EXPECT_EQ(GetParam().edit(mSeq, mList), 1) << GetParam().name;
  EXPECT_EQ(LastKey(), GetParam().key);
  EXPECT_TRUE(mFake.received.empty());
}

INSTANTIATE_TEST_SUITE_P(
    Table, BadNumbers,
    testing::Values(
        BadCase{"before 0", [](CSequence& s, ConditionList& l) { return s.AddBlockBefore(0, l); },
                "GUI_SEQUENCE_NO_BLOCK"},
        BadCase{"after 2", [](CSequence& s, ConditionList& l) { return s.AddBlockAfter(2, l); },
                "GUI_SEQUENCE_NO_BLOCK"},
        BadCase{"delete 2", [](CSequence& s, ConditionList& l) { return s.DeleteBlock(2, l); },
                "GUI_SEQUENCE_NO_BLOCK"},
        BadCase{"copy 0", [](CSequence& s, ConditionList& l) { return s.CopyBlock(0, l); },
                "GUI_SEQUENCE_NO_BLOCK"},
        BadCase{"length 3", [](CSequence& s, ConditionList& l) { return s.SetBlockLength(3, 1, l); },
                "GUI_SEQUENCE_NO_BLOCK"},
        BadCase{"level 4", [](CSequence& s, ConditionList& l) { return s.SetLoop(1, 4, l, 1, 1, 0, ""); },
                "GUI_SEQUENCE_NO_LOOP_LEVEL"},
        BadCase{"level 0", [](CSequence& s, ConditionList& l) { return s.SetLoop(1, 0, l, 1, 1, 0, ""); },
                "GUI_SEQUENCE_NO_LOOP_LEVEL"},
        BadCase{"too long", [](CSequence& s, ConditionList& l) { return s.SetLoop(1, 1, l, 2, 1, 0, ""); },
                "GUI_SEQUENCE_BAD_LOOP_RANGE"},
        BadCase{"no loop", [](CSequence& s, ConditionList& l) { return s.SetNumIterations(1, 1, 3, l); },
                "GUI_SEQUENCE_NO_LOOP"},
        BadCase{"no reaction", [](CSequence& s, ConditionList& l) { return s.SetReactTrig(1, 0, 3, l); },
                "GUI_SEQUENCE_NO_REACTION"},
        BadCase{"port 0", [](CSequence& s, ConditionList& l) { return s.SetDefaultSegment(1, 0, l); },
                "GUI_SEQUENCE_NO_PORT"}));

TEST_F(EditTest, TextThatWouldBreakTheCommandIsRefusedBeforeAnythingIsSent) {
  Load(Seq(Blk(1)));
  for (const char* text : {"a\"b", "a;b", "a\nb"}) {
    EXPECT_NE(mSeq.SetLabel(1, text, mList), 0) << text;
    EXPECT_EQ(LastKey(), "GUI_COMMAND_BAD_TEXT");
    EXPECT_NE(mSeq.SetSegment(1, 1, text, mList), 0) << text;
  }
  EXPECT_TRUE(mFake.received.empty());
  EXPECT_EQ(mSeq.GetLabel(1), "");
}

TEST_F(EditTest, AWriteTheServerRefusesIsUndoneAndTheServersSequenceRead) {
  LoadFive();
  const Dstring before = mFake.sequence;
  mFake.refuse = 1;
  EXPECT_EQ(mSeq.AddBlockAfter(1, mList), 1);
  ASSERT_FALSE(mList.IsEmpty());
  EXPECT_EQ(mList[0].GetCode(), -224);
  EXPECT_EQ(mSeq.GetNumBlocks(), 5u);
  EXPECT_EQ(Written(), before);
  EXPECT_EQ(mSeq.GetLastExpression(), before);
  // The views never saw the edit, so they hear nothing of its undoing.
  EXPECT_TRUE(mObserver.log.empty());
}

TEST_F(EditTest, AWriteTheServerTakesButIgnoresLeavesTheModelAsTheServerHasIt) {
  LoadFive();
  const Dstring before = mFake.sequence;
  mFake.ignore = true;
  EXPECT_EQ(mSeq.SetBlockLength(1, 99, mList), 0);
  EXPECT_EQ(mSeq.GetBlockLength(1), 1u);
  EXPECT_EQ(Written(), before);
  EXPECT_TRUE(mObserver.log.empty());
}

TEST_F(EditTest, WhileTheInstrumentIsHeldEditsAreRefusedWithoutAnError) {
  LoadFive();
  mFake.locked = true;
  EXPECT_EQ(mSeq.DeleteBlock(1, mList), -19);
  EXPECT_EQ(mSeq.GetNumBlocks(), 5u) << "the edit is undone";
  EXPECT_TRUE(mList.IsEmpty());
  mFake.received.clear();
  EXPECT_EQ(mSeq.DeleteBlock(1, mList), -19);
  // The guard asks the server once whether it is still held, and sends nothing else.
  EXPECT_EQ(mFake.received.size(), 1u);
  mFake.locked = false;
  EXPECT_EQ(mSeq.DeleteBlock(1, mList), 0);
  EXPECT_EQ(mSeq.GetNumBlocks(), 4u);
}

// Edits the sequence from within a report.
class MeddlingObserver : public CSequenceObserver {
 public:
  explicit MeddlingObserver(CSequence& seq) : mSeq(seq) {}
  int NfySequence(ConditionList& list) override { return mStatus = mSeq.AddBlockAfter(1, list), 0; }
  int NfyBlockInserted(unsigned long, ConditionList& list) override {
    return mStatus = mSeq.DeleteBlock(1, list), 0;
  }
  int mStatus = 0;

 private:
  CSequence& mSeq;
};

TEST_F(EditTest, AnEditFromAReportIsRefusedAsBusy) {
  MeddlingObserver meddler(mSeq);
  mSeq.AddObserver(&meddler);
  Load(Seq(Blk(1)));
  EXPECT_EQ(meddler.mStatus, -21);
  EXPECT_TRUE(mList.HasKey("GUI_OPERATION_BUSY"));
  mList.Clear();
  ASSERT_EQ(mSeq.AddBlockAfter(1, mList), 0);
  EXPECT_EQ(meddler.mStatus, -21);
  EXPECT_EQ(mSeq.GetNumBlocks(), 2u);
  mSeq.RemoveObserver(&meddler);
}

TEST_F(EditTest, ReadersGiveNeutralValuesOutOfRange) {
  Load(Seq(Blk(1)));
  EXPECT_EQ(mSeq.GetSegment(2, 1), "");
  EXPECT_EQ(mSeq.GetSegment(1, 3), "");
  EXPECT_EQ(mSeq.GetType(0, 1), CSequence::SEG_NAMED);
  EXPECT_EQ(mSeq.GetBlockLength(9), 0u);
  EXPECT_EQ(mSeq.GetReactIf(1, 0), "");
  EXPECT_EQ(mSeq.GetLoopStatus(9, 1), CSequence::LOOP_NONE);
  EXPECT_EQ(mSeq.GetHighestLoopLevel(1, 0), 0u);
  EXPECT_EQ(mSeq.GetBlock(0), nullptr);
}

}  // namespace
