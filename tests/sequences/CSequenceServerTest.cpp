// The exchange with the server: loop levels, events, the dirty flag and segment sync.
#include <gtest/gtest.h>

#include <algorithm>

#include "data/DirtyFlagDs.h"
#include "sequences/CSequenceBlock.h"
#include "sequences/SequenceFixture.h"
#include "sequences/SequenceSegmentSync.h"
#include "sequences/SequenceService.h"
#include "support/MessageCatalogue.h"

namespace {

using ServerTest = SequenceFixture;

const std::string kCentral =
    "\"PATT\",\"K2200A\",(\":CGR1:MOD1:CONN1\",\"PDAT\",\"OUTPUT_PORT\",\"K2268A\"),"
    "(\":CGR1:MOD2:CONN1\",\"PDAT\",\"INPUT_PORT\",\"K2270A\")";
const std::string kEvents =
    "(3.0,(\"Start\",1,(('a','b''c','',7),('x','y','z',ARM))),(\"\",0,()),(\"\",0,()),"
    "(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"E10\",-2,()))";

struct LevelsCase {
  const char* reply;
  int status;
  unsigned long levels;
};

class LoopLevels : public SequenceFixture, public testing::WithParamInterface<LevelsCase> {};

TEST_P(LoopLevels, AreReadOnceAsADecimalNumber) {
  CSequence::EndNumLoopLevels();
  mFake.levels = GetParam().reply;
  EXPECT_EQ(CSequence::InitNumLoopLevels(mList), GetParam().status);
  EXPECT_EQ(CSequence::GetNumLoopLevels(), GetParam().levels);
  EXPECT_TRUE(CSequence::IsNumLoopLevelsInitialized()) << "set whatever the outcome";
  if (GetParam().status == 1) {
    EXPECT_EQ(LastKey(), "GUI_SEQUENCE_BAD_LOOP_LEVELS");
  }
}

INSTANTIATE_TEST_SUITE_P(Table, LoopLevels,
                         testing::Values(LevelsCase{"4", 0, 4}, LevelsCase{" 3 ", 0, 3},
                                         LevelsCase{"0", 0, 0}, LevelsCase{"x", 1, 0}, LevelsCase{"-1", 1, 0},
                                         LevelsCase{"17", 1, 0}, LevelsCase{"2.5", 1, 0}));

TEST_F(ServerTest, AFailedLoopLevelQueryPassesItsStatusOn) {
  CSequence::EndNumLoopLevels();
  mFake.locked = true;
  EXPECT_EQ(CSequence::InitNumLoopLevels(mList), -19);
  EXPECT_TRUE(CSequence::IsNumLoopLevelsInitialized());
}

TEST_F(ServerTest, WithACentralModuleTheEventsAreReadFirstAndWrittenAfterTheSequence) {
  ASSERT_EQ(CPortInfo::SetConfiguration(kCentral, mList), 0);
  mFake.events = kEvents;
  Load(Seq(Blk(1)));
  mFake.sequence = Seq(Blk(2));
  ASSERT_EQ(mSeq.ReadSequence(mList, 0), 0);
  EXPECT_EQ(mFake.received, (DstringList{":_H:SGEN:GLOB:SEQ:EVEN?", ":_H:SGEN:GLOB:SEQ?"}));
  const auto& first = mSeq.GetEvents().GetEvent(0);
  EXPECT_EQ(first.name, "Start");
  EXPECT_EQ(first.number, 1);
  ASSERT_EQ(first.items.size(), 2u);
  EXPECT_EQ(first.items[0].second, "b'c");
  EXPECT_EQ(first.items[0].bare, "7");
  EXPECT_EQ(first.items[1].bare, "ARM");
  EXPECT_EQ(mSeq.GetEvents().GetEvent(9).number, -2);

  mFake.received.clear();
  ASSERT_EQ(mSeq.SetBlockLength(1, 3, mList), 0);
  ASSERT_EQ(mFake.received.size(), 4u);
  EXPECT_EQ(mFake.received[0], ":_H:SGEN:GLOB:SEQ " + Seq(Blk(3)));
  // The events go back as read.
  EXPECT_EQ(mFake.received[1], ":_H:SGEN:GLOB:SEQ:EVEN " + kEvents);
  EXPECT_EQ(mFake.received[2], ":_H:SGEN:GLOB:SEQ:EVEN?");
}

TEST_F(ServerTest, WithoutACentralModuleTheEventsAreEmptyAndNeverAsked) {
  ASSERT_EQ(CPortInfo::SetConfiguration(kCentral, mList), 0);
  mFake.events = kEvents;
  Load(Seq(Blk(1)));
  ASSERT_EQ(CPortInfo::SetConfiguration(FakeSequencer::kConfiguration, mList), 0);
  ASSERT_EQ(mSeq.ReadSequence(mList, 1), 0);
  EXPECT_EQ(mSeq.GetEvents().GetEvent(0).name, "");
  for (const Dstring& cmd : mFake.received) EXPECT_EQ(cmd.find("EVEN"), Dstring::npos) << cmd;
}

TEST_F(ServerTest, UnreadableEventsFailTheRead) {
  ASSERT_EQ(CPortInfo::SetConfiguration(kCentral, mList), 0);
  for (const char* bad :
       {"(3.0,(\"a\",1,()))", "(3.5,(\"\",0,()))", "((\"\",0,()))",
        "(3.0,(\"\",x,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),"
        "(\"\",0,()),(\"\",0,()),(\"\",0,()))"}) {
    mFake.events = bad;
    mList.Clear();
    EXPECT_EQ(mSeq.ReadSequence(mList, 1), 1) << bad;
    EXPECT_EQ(LastKey(), "GUI_SEQUENCE_EVENT_EXPR_SYNTAX");
  }
}

TEST_F(ServerTest, TheEventExpressionRoundTrips) {
  CSequenceEvents events;
  ASSERT_EQ(events.FromExpression(kEvents, mList), 0);
  EXPECT_EQ(events.BuildExpression(), kEvents);
  EXPECT_EQ(events.GetLastBuilt(), kEvents);
  events.Reset();
  EXPECT_EQ(events.BuildExpression(), FakeSequencer().events);
}

TEST_F(ServerTest, AnUnreadableReplyFailsTheReadAndKeepsTheModel) {
  Load(Seq(Blk(1)));
  mFake.sequence = "(3.0,\"\",(NOPE))";
  EXPECT_EQ(mSeq.ReadSequence(mList, 0), 1);
  EXPECT_EQ(LastKey(), "GUI_SEQUENCE_SYNTAX");
  EXPECT_EQ(mSeq.GetBlockLength(1), 1u);
  EXPECT_EQ(mSeq.GetLastExpression(), Seq(Blk(1)));
  EXPECT_TRUE(mObserver.log.empty());
}

struct MatchCase {
  const char* name;
  bool matches;
};

class DirtyFlagNames : public SequenceFixture, public testing::WithParamInterface<MatchCase> {};

TEST_P(DirtyFlagNames, Table) {
  EXPECT_EQ(mSeq.NfyMatchDirtyFlag(GetParam().name), GetParam().matches);
}

INSTANTIATE_TEST_SUITE_P(Table, DirtyFlagNames,
                         testing::Values(MatchCase{"ALL", true}, MatchCase{":_H:SGEN:GLOB:SEQ", true},
                                         MatchCase{":_H:SGEN:GLOB:SEQ:EVEN", true},
                                         MatchCase{":_H:SGEN:GLOB:SEQ:FORC", false},
                                         MatchCase{":_X:SGEN:GLOB:SEQ", false},
                                         MatchCase{"_H:SGEN:GLOB:SEQ", false},
                                         MatchCase{":_H:SGEN:GLOB:CONF", false}, MatchCase{"all", false}));

// Through the services as the application starts them: the dirty flag tells the port
// information and the sequence; a changed configuration re-reads the sequence by force.
TEST_F(ServerTest, TheDirtyFlagReachesTheSequenceAndThePortInformation) {
  auto* dirty = new DirtyFlagDs;
  CPortInfo::Init(dirty, &SequenceService::NfyPortInfo);
  SequenceService::Init(dirty, &CPortInfo::GetSequencePorts);
  CSequence& seq = *SequenceService::GetSequence();
  EXPECT_EQ(CPortInfo::GetSequence(), &seq);
  RecordingObserver observer;
  seq.AddObserver(&observer);
  ASSERT_EQ(seq.ReadSequence(mList, 1), 0);
  observer.log.clear();

  mFake.sequence = Seq(Blk(4));
  mFake.dirty = "\":_H:SGEN:GLOB:SEQ\"";
  ASSERT_EQ(dirty->UpdateFromFW(mList), 0) << mList.ToText();
  EXPECT_EQ(observer.log, std::vector<std::string>{"BlockLengthChanged 1"});
  EXPECT_EQ(seq.GetBlockLength(1), 4u);

  observer.log.clear();
  mFake.dirty = "\":_H:SGEN:GLOB:CONF\"";
  ASSERT_EQ(dirty->UpdateFromFW(mList), 0);
  EXPECT_TRUE(observer.log.empty()) << "the same configuration tells nobody";
  mFake.configuration = kCentral;
  mFake.dirty = "\":_H:SGEN:GLOB:CONF\"";
  ASSERT_EQ(dirty->UpdateFromFW(mList), 0);
  EXPECT_TRUE(CPortInfo::HasCentral());
  EXPECT_EQ(observer.log, std::vector<std::string>{"Sequence"});

  seq.RemoveObserver(&observer);
  SequenceService::End();
  CPortInfo::End();
  EXPECT_EQ(SequenceService::GetSequence(), nullptr);
  EXPECT_EQ(CPortInfo::GetSequence(), nullptr);
  EXPECT_EQ(dirty->NumViews(), 0u) << "End unregisters both";
  dirty->Release();
}

class RecordingSync : public SequenceSegmentSync {
 public:
  int SyncSegment(const Dstring& name, ConditionList& list) override {
    names.push_back(name);
    if (name == failOn) {
      list.Add(7, "cannot write " + name);
      return 7;
    }
    return 0;
  }
  int FindMissing(const std::vector<Dstring>& asked, std::vector<Dstring>& out, ConditionList&) override {
    questions.push_back(asked);
    out.clear();
    for (const Dstring& name : asked) {
      if (std::find(missing.begin(), missing.end(), name) != missing.end()) out.push_back(name);
    }
    return 0;
  }
  DstringList names;
  Dstring failOn;
  DstringList missing;
  std::vector<std::vector<Dstring>> questions;
};

TEST_F(ServerTest, SyncSegmentsHandsEveryNamedSegmentOnceInOrder) {
  Load(Seq("(SEQ," + Blk(1, "\"b\"", "\"a\"") + ",\"\"," + Blk(2, "PAUSE", "\"b\"") + ",\"\"," +
           Blk(3, "\"c\"") + ")"));
  EXPECT_EQ(mSeq.SyncSegments(mList), 0) << "without a sync there is nothing to do";
  RecordingSync sync;
  mSeq.SetSegmentSync(&sync);
  EXPECT_EQ(mSeq.SyncSegments(mList), 0);
  EXPECT_EQ(sync.names, (DstringList{"b", "a", "c"}));
  sync.names.clear();
  sync.failOn = "a";
  EXPECT_EQ(mSeq.SyncSegments(mList), 7);
  EXPECT_EQ(sync.names, (DstringList{"b", "a"}));
  EXPECT_TRUE(mFake.received.empty()) << "syncing sends no sequence command";
  mSeq.SetSegmentSync(nullptr);
}

// A segment the instrument does not have stops everything before the first write, and the
// refusal names every such segment with the blocks that play it.
TEST_F(ServerTest, SyncSegmentsRefusesMissingSegmentsNamingTheirBlocks) {
  Load(Seq("(SEQ," + Blk(1, "\"walkB8\"", "\"a\"") + ",\"\"," + Blk(2, "PAUSE", "\"cnt32\"") + ",\"\"," +
           Blk(3, "\"walkB8\"") + ",\"\"," + Blk(4, "\"walkB8\"", "\"walkB8\"") + ")"));
  RecordingSync sync;
  mSeq.SetSegmentSync(&sync);
  struct Case {
    DstringList missing;
    const char* text;
  };
  const Case cases[] = {
      {{"cnt32"},
       "The sequence names the segment \"cnt32\" (block 2), which the instrument does not have; nothing was "
       "started. Put a segment in its place or make it again."},
      {{"walkB8", "cnt32"},
       "The sequence names segments the instrument does not have: \"walkB8\" (blocks 1, 3 and 4), "
       "\"cnt32\" (block 2); nothing was started. Put segments in their place or make them again."},
  };
  for (const Case& c : cases) {
    sync.missing = c.missing;
    sync.names.clear();
    sync.questions.clear();
    ConditionList list;
    EXPECT_EQ(mSeq.SyncSegments(list), CSequence::kStatusError);
    ASSERT_EQ(list.Size(), 1u);
    EXPECT_EQ(list[0].GetMessage(), c.text);
    EXPECT_TRUE(sync.names.empty()) << "nothing is written back";
    EXPECT_EQ(sync.questions, (std::vector<std::vector<Dstring>>{{"walkB8", "a", "cnt32"}}))
        << "one question, each once";
  }
  sync.missing.clear();
  EXPECT_EQ(mSeq.SyncSegments(mList), 0);
  EXPECT_EQ(sync.names, (DstringList{"walkB8", "a", "cnt32"}));
  mSeq.SetSegmentSync(nullptr);
}

TEST_F(ServerTest, TheFirstGenerationIsReadFromTheServerAndWrittenBackInTheThird) {
  Load("(1.0,\"\",(BLOCK,64,PAUSE,PAUSE0))");
  ASSERT_EQ(mSeq.SetBlockTrigger(1, 1, mList), 0);
  EXPECT_EQ(mFake.sequence, "(3.0,\"\",(BLOCK,1,64,0,\"\",(),PAUSE,0,0,PAUSE0,0,0))");
}

TEST(SequenceMessages, EveryKeyOfTheSubsystemHasAText) {
  for (const char* key : {"GUI_SEQUENCE_SYNTAX",
                          "GUI_SEQUENCE_WRONG_VERSION",
                          "GUI_SEQUENCE_IMPOSSIBLE_NESTING_LOOPS",
                          "GUI_SEQUENCE_EVENT_EXPR_SYNTAX",
                          "GUI_SEQUENCE_NO_BLOCK",
                          "GUI_SEQUENCE_NO_PORT",
                          "GUI_SEQUENCE_NO_LOOP_LEVEL",
                          "GUI_SEQUENCE_NO_LOOP",
                          "GUI_SEQUENCE_NO_REACTION",
                          "GUI_SEQUENCE_BAD_LOOP_RANGE",
                          "GUI_SEQUENCE_BAD_SEGMENT",
                          "GUI_SEQUENCE_BAD_MOVE",
                          "GUI_SEQUENCE_CLIPBOARD_EMPTY",
                          "GUI_SEQUENCE_BAD_LOOP_LEVELS",
                          "GUI_SEQUENCE_MISSING_SEGMENT",
                          "GUI_SEQUENCE_MISSING_SEGMENTS",
                          "GUI_PORTINFO_BAD_CONFIGURATION",
                          "GUI_PORTINFO_NO_PORT",
                          "GUI_OPERATION_BUSY",
                          "GUI_COMMAND_BAD_TEXT"}) {
    EXPECT_NE(MessageCatalogue::Find(key), nullptr) << key;
  }
}

}  // namespace
