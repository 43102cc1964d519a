// The table of sequence events edited through the model, and its changes reported.
#include <gtest/gtest.h>

#include "sequences/SequenceFixture.h"

namespace {

const std::string kCentral =
    "\"PATT\",\"K2200A\",(\":CGR1:MOD1:CONN1\",\"PDAT\",\"OUTPUT_PORT\",\"K2268A\"),"
    "(\":CGR1:MOD2:CONN1\",\"PDAT\",\"INPUT_PORT\",\"K2270A\")";
const std::string kEmpty = "(\"\",0,())";

std::string Events(const std::string& first) {
  std::string text = "(3.0," + first;
  for (int i = 1; i < 10; ++i) text += "," + kEmpty;
  return text + ")";
}

class EventsChanged : public RecordingObserver {
 public:
  int NfyEventsChanged(ConditionList&) override {
    ++count;
    return 0;
  }
  int count = 0;
};

class EventEditTest : public SequenceFixture {
 protected:
  void SetUp() override {
    SequenceFixture::SetUp();
    ASSERT_EQ(CPortInfo::SetConfiguration(kCentral, mList), 0);
    mFake.events = Events(kEmpty);
    Load(Seq(Blk(1)));
    mSeq.AddObserver(&mEvents);
  }
  void TearDown() override {
    mSeq.RemoveObserver(&mEvents);
    SequenceFixture::TearDown();
  }
  EventsChanged mEvents;
};

TEST_F(EventEditTest, AnEventIsWrittenAsTheTableAndReadBack) {
  CSequenceEvents::Event event{"Arm", 3, {{"a", "b'c", "", "ARM"}}};
  ASSERT_EQ(mSeq.SetEvent(0, event, mList), 0) << mList.ToText();
  EXPECT_EQ(mFake.events, Events("(\"Arm\",3,(('a','b''c','',ARM)))"));
  EXPECT_EQ(mSeq.GetEvents().GetEvent(0), event);
  EXPECT_EQ(mSeq.GetLastExpression(), Seq(Blk(1)));
}

struct Refused {
  const char* name;
  std::size_t index;
  CSequenceEvents::Event event;
  const char* key;
};

class EventRefusals : public EventEditTest, public testing::WithParamInterface<Refused> {};

TEST_P(EventRefusals, LeaveTheTableAndWriteNothing) {
  const Refused& c = GetParam();
  EXPECT_NE(mSeq.SetEvent(c.index, c.event, mList), 0);
  EXPECT_EQ(mList.Last().GetKey(), c.key);
  EXPECT_TRUE(mFake.Writes().empty());
  EXPECT_EQ(mSeq.GetEvents().GetEvent(0).name, "");
}

INSTANTIATE_TEST_SUITE_P(
    Table, EventRefusals,
    testing::Values(Refused{"NoSuchEvent", 10, {"x", 1, {}}, "GUI_SEQUENCE_NO_EVENT"},
                    Refused{"QuoteInName", 0, {"a\"b", 1, {}}, "GUI_COMMAND_BAD_TEXT"},
                    Refused{"TwoWords", 0, {"x", 1, {{"a", "b", "c", "A B"}}}, "GUI_SEQUENCE_BAD_EVENT_TEXT"},
                    Refused{"EmptyWord", 0, {"x", 1, {{"a", "b", "c", ""}}}, "GUI_SEQUENCE_BAD_EVENT_TEXT"}),
    [](const testing::TestParamInfo<Refused>& info) { return std::string(info.param.name); });

// A refused write (here: another client's lock) puts the table back as it was.
TEST_F(EventEditTest, ALockedWriteLeavesTheTable) {
  mFake.locked = true;
  EXPECT_EQ(mSeq.SetEvent(0, {"Arm", 3, {}}, mList), -19);
  mFake.locked = false;
  EXPECT_EQ(mSeq.GetEvents().GetEvent(0).name, "");
}

TEST_F(EventEditTest, WithoutACentralModuleThereAreNoEventsToSet) {
  ASSERT_EQ(CPortInfo::SetConfiguration(FakeSequencer::kConfiguration, mList), 0);
  EXPECT_NE(mSeq.SetEvent(0, {"Arm", 3, {}}, mList), 0);
  EXPECT_EQ(mList.Last().GetKey(), "GUI_SEQUENCE_NO_EVENTS");
  EXPECT_TRUE(mFake.received.empty());
}

// Another client's events reach the views even when the sequence stayed.
TEST_F(EventEditTest, AnotherClientsEventsAreReported) {
  mFake.events = Events("(\"Go\",1,())");
  ASSERT_EQ(mSeq.ReadSequence(mList, 0), 0);
  EXPECT_EQ(mEvents.count, 1);
  EXPECT_TRUE(mEvents.log.empty()) << "the sequence stayed";
  ASSERT_EQ(mSeq.ReadSequence(mList, 0), 0);
  EXPECT_EQ(mEvents.count, 1);
}

}  // namespace
