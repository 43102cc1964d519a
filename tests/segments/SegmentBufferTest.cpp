#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "SegmentFixture.h"
#include "segments/SegmentStatus.h"
#include "segments/TraceRange.h"

namespace {

struct State {
  long vector;
  long trace;
  char state;
};

// A window of a segment and the exact block that holds the given states (all others the
// coding's first state).
struct PackingCase {
  const char* what;
  const char* coding;
  long length, width, start, bufferLength;
  std::vector<State> states;
  std::string block;
};

class Packing : public SegmentFixture, public testing::WithParamInterface<PackingCase> {};

TEST_P(Packing, ReadsAndWritesTheServersBlockBitForBit) {
  const PackingCase& c = GetParam();
  QenSegmentDs* ds = OpenSegment();
  // Read: the block gives the states.
  SegmentBuffer* read = Load(ds, c.coding, c.length, c.width, c.start, c.bufferLength, c.block);
  for (const State& s : c.states) {
    char state = 0;
    ASSERT_EQ(ds->GetState(read, s.vector, s.trace, state, mList), 0);
    EXPECT_EQ(state, s.state) << c.what << " vector " << s.vector << " trace " << s.trace;
  }
  // Write: the states give the block, with its five-digit header.
  SegmentBuffer* written =
      Load(ds, c.coding, c.length, c.width, c.start, c.bufferLength, std::string(c.block.size(), '\0'));
  for (const State& s : c.states) ASSERT_EQ(ds->SetState(written, s.vector, s.trace, s.state, mList), 0);
  Inst().Expect(
      Seg(Dstring::Format(":PATT:DATA 0,%ld,%ld,%ld,", c.start, c.width - 1, c.start + c.bufferLength - 1)) +
          Block(c.block),
      "");
  EXPECT_EQ(ds->Write(written, mList), 0);
  EXPECT_FALSE(ds->IsBufferDirty(written));
  EXPECT_FALSE(ds->IsBufferDirty(read));
  ds->Release();
}

INSTANTIATE_TEST_SUITE_P(
    Cases, Packing,
    testing::Values(PackingCase{"two states, 9 vectors: rows of 2 bytes",
                                "01",
                                9,
                                3,
                                0,
                                9,
                                {{0, 0, '1'}, {8, 0, '1'}, {7, 1, '1'}, {1, 2, '1'}, {2, 2, '0'}},
                                std::string("\x80\x80\x01\x00\x40\x00", 6)},
                    PackingCase{"three states take two bits",
                                "01X",
                                5,
                                2,
                                0,
                                5,
                                {{0, 0, 'X'}, {4, 0, '1'}, {3, 1, 'X'}, {2, 1, '0'}},
                                std::string("\x80\x40\x02\x00", 4)},
                    PackingCase{"six states take three bits across a byte",
                                "LHXZ01",
                                3,
                                1,
                                0,
                                3,
                                {{0, 0, '1'}, {1, 0, 'Z'}, {2, 0, 'H'}},
                                std::string("\xac\x80", 2)},
                    PackingCase{"a window counts from its start",
                                "01",
                                40,
                                2,
                                30,
                                10,
                                {{30, 0, '1'}, {39, 1, '1'}, {38, 1, '0'}},
                                std::string("\x80\x00\x00\x40", 4)}),
    [](const auto& info) { return std::to_string(info.index); });

using SegmentBufferTest = SegmentFixture;

TEST_F(SegmentBufferTest, PositionsOutsideTheWindowChangeNothing) {
  QenSegmentDs* ds = OpenSegment();
  SegmentBuffer* buffer = Load(ds, "01X", 40, 3, 10, 9, std::string(9, '\0'));
  struct Case {
    long vector, trace;
    char state;
    const char* key;
  } cases[] = {
      {19, 0, '1', "GUI_SEGMENTBUFFER_VECTOR_NOT_IN_BUFFER"},
      {9, 0, '1', "GUI_SEGMENTBUFFER_VECTOR_NOT_IN_BUFFER"},
      {10, 3, '1', "GUI_SEGMENTBUFFER_TRACE_NOT_IN_RANGE"},
      {10, -1, '1', "GUI_SEGMENTBUFFER_TRACE_NOT_IN_RANGE"},
      {10, 0, 'Z', "GUI_SEGMENTBUFFER_UNKNOWN_STATE_CODE"},
  };
  for (const Case& c : cases) {
    mList.Clear();
    EXPECT_NE(ds->SetState(buffer, c.vector, c.trace, c.state, mList), 0);
    EXPECT_TRUE(mList.HasKey(c.key)) << mList.ToText();
  }
  EXPECT_EQ(mList.Last().GetArgs(), (std::vector<Dstring>{"Z", "01X"}));
  EXPECT_FALSE(ds->IsBufferDirty(buffer));
  EXPECT_FALSE(ds->IsDirty());
  ds->Release();
}

TEST_F(SegmentBufferTest, ToggleSwapsPartnersAndLeavesOthers) {
  QenSegmentDs* ds = OpenSegment();
  SegmentBuffer* buffer = Load(ds, "01X", 4, 1, 0, 4, std::string("\x08", 1));  // 0,0,X,0
  char state = 0;
  ASSERT_EQ(ds->ToggleState(buffer, 0, 0, mList), 0);
  ASSERT_EQ(ds->ToggleState(buffer, 2, 0, mList), 0);
  ds->GetState(buffer, 0, 0, state, mList);
  EXPECT_EQ(state, '1');
  ds->GetState(buffer, 2, 0, state, mList);
  EXPECT_EQ(state, 'X');
  EXPECT_EQ(ds->GetChangeKind(), QenSegmentDs::kStatesChanged);
  ds->Release();
}

struct DigitCase {
  const char* coding;
  const char* traces;  // the states of traces 0, 1, ... at vector 0
  DataFormat format;
  long trace;
  char digit;
};

class Digits : public SegmentFixture, public testing::WithParamInterface<DigitCase> {};

TEST_P(Digits, ReadTheHighestTraceAsTheTopBit) {
  const DigitCase& c = GetParam();
  const long width = static_cast<long>(std::string(c.traces).size());
  QenSegmentDs* ds = OpenSegment();
  SegmentBuffer* buffer =
      Load(ds, c.coding, 1, width, 0, 1, std::string(static_cast<std::size_t>(width), '\0'));
  for (long t = 0; t < width; ++t) ASSERT_EQ(ds->SetState(buffer, 0, t, c.traces[t], mList), 0);
  char digit = 0;
  ASSERT_EQ(ds->GetDigit(buffer, 0, c.trace, c.format, digit, mList), 0) << mList.ToText();
  EXPECT_EQ(digit, c.digit) << c.traces;
  ds->Release();
}

INSTANTIATE_TEST_SUITE_P(Cases, Digits,
                         testing::Values(DigitCase{"01", "101100", DataFormat::kHex, 0, 'd'},
                                         DigitCase{"01", "101100", DataFormat::kHex, 5, '0'},
                                         DigitCase{"01", "101101", DataFormat::kHex, 4, '2'},
                                         DigitCase{"01", "1011011", DataFormat::kOct, 3, '5'},
                                         DigitCase{"01", "1011011", DataFormat::kOct, 6, '1'},
                                         DigitCase{"01", "01", DataFormat::kBin, 1, '1'},
                                         DigitCase{"LH", "HLHH", DataFormat::kHex, 0, 'd'},
                                         DigitCase{"01X", "10X1", DataFormat::kHex, 0, '?'},
                                         DigitCase{"npkr", "nprk", DataFormat::kHex, 0, '6'},
                                         DigitCase{"npkrX", "npkX", DataFormat::kHex, 0, '!'},
                                         DigitCase{"npkrX", "npnX", DataFormat::kHex, 0, '?'}));

struct SetDigitCase {
  const char* coding;
  long width;
  DataFormat format;
  long trace;
  char digit;
  const char* after;  // the states of traces 0, 1, ...; null when refused
};

class SetDigits : public SegmentFixture, public testing::WithParamInterface<SetDigitCase> {};

TEST_P(SetDigits, SetTheLowestTraceFromTheLowestBit) {
  const SetDigitCase& c = GetParam();
  QenSegmentDs* ds = OpenSegment();
  SegmentBuffer* buffer =
      Load(ds, c.coding, 1, c.width, 0, 1, std::string(static_cast<std::size_t>(c.width), '\0'));
  const int status = ds->SetDigit(buffer, 0, c.trace, c.format, c.digit, mList);
  EXPECT_EQ(status == 0, c.after != nullptr) << mList.ToText();
  std::string states;
  for (long t = 0; t < c.width; ++t) {
    char s = 0;
    ds->GetState(buffer, 0, t, s, mList);
    states += s;
  }
  EXPECT_EQ(states, c.after ? c.after : std::string(static_cast<std::size_t>(c.width), c.coding[0]));
  ds->Release();
}

INSTANTIATE_TEST_SUITE_P(Cases, SetDigits,
                         testing::Values(SetDigitCase{"01", 6, DataFormat::kHex, 5, 'f', "000011"},
                                         SetDigitCase{"01", 6, DataFormat::kHex, 0, 'a', "010100"},
                                         SetDigitCase{"01X", 6, DataFormat::kHex, 1, 'X', "XXXX00"},
                                         SetDigitCase{"01", 6, DataFormat::kOct, 3, '6', "000011"},
                                         SetDigitCase{"01", 6, DataFormat::kHex, 0, 'F', nullptr},
                                         SetDigitCase{"01", 6, DataFormat::kHex, 8, '1', nullptr},
                                         SetDigitCase{"LH", 4, DataFormat::kHex, 0, '1', nullptr}));

TEST(MaxDigit, LastDigitOfEachFormat) {
  struct Case {
    DataFormat format;
    long width, max;
  } cases[] = {{DataFormat::kHex, 6, 1},          {DataFormat::kHex, 8, 1}, {DataFormat::kHex, 9, 2},
               {DataFormat::kBin, 5, 4},          {DataFormat::kOct, 1, 0}, {DataFormat::kOct, 7, 2},
               {static_cast<DataFormat>(7), 9, 0}};
  for (const Case& c : cases) EXPECT_EQ(QenSegmentDs::MaxDigitOf(c.format, c.width), c.max) << c.width;
  TraceRange range(5, 13);
  EXPECT_EQ(range.GetStartDigit(DataFormat::kHex), 1);
  EXPECT_EQ(range.GetEndDigit(DataFormat::kOct), 4);
  EXPECT_EQ(range.GetEndDigit(static_cast<DataFormat>(3)), 0);
}

// Replies that are not the expected block leave the buffer as it was.
TEST_F(SegmentBufferTest, AWrongBlockChangesNothing) {
  QenSegmentDs* ds = OpenSegment();
  SegmentBuffer* buffer = Load(ds, "01", 9, 3, 0, 9, std::string("\xff\x80\x00\x00\x00\x00", 6));
  ASSERT_EQ(ds->SetState(buffer, 1, 1, '1', mList), 0);
  const std::vector<Dstring> replies = {"1,2", Block("12345"), Block("1234567"), Block("123456") + ",1", ""};
  for (const Dstring& reply : replies) {
    mList.Clear();
    Inst().Expect(Seg(":PATT:DATA? 0,0,2,8,BIN"), reply);
    EXPECT_EQ(ds->Read(buffer, mList), SegmentStatus::kBadReply) << reply;
    EXPECT_TRUE(mList.HasKey("GUI_SEGMENTBUFFER_BAD_BLOCK"));
    char a = 0, b = 0;
    ds->GetState(buffer, 8, 0, a, mList);
    ds->GetState(buffer, 1, 1, b, mList);
    EXPECT_EQ(std::string() + a + b, "11");
    EXPECT_TRUE(ds->IsBufferDirty(buffer));
  }
  ds->Release();
}

TEST_F(SegmentBufferTest, AFailedWriteKeepsTheEditsAndSendsThemAgain) {
  QenSegmentDs* ds = OpenSegment();
  SegmentBuffer* buffer = Load(ds, "01", 9, 1, 0, 9, std::string(2, '\0'));
  ASSERT_EQ(ds->SetState(buffer, 0, 0, '1', mList), 0);
  const Dstring write = Seg(":PATT:DATA 0,0,0,8,") + Block(std::string("\x80\x00", 2));
  Inst().Expect(write, "", 1);
  ExpectErrors("-222,\"Data out of range\"");
  EXPECT_EQ(ds->Write(mList), 1);
  EXPECT_EQ(mList.Last().GetCode(), -222);
  EXPECT_TRUE(ds->IsBufferDirty(buffer));
  Inst().Expect(write, "");
  EXPECT_EQ(ds->Write(mList), 0);
  EXPECT_FALSE(ds->IsBufferDirty(buffer));
  EXPECT_EQ(ds->Write(mList), 0);  // nothing left to send
  ds->Release();
}

// The write-back and the read of the new window go in one frame, the write first.
TEST_F(SegmentBufferTest, AMoveWritesBackFirstAndKeepsTheWindowWhenAnythingFails) {
  QenSegmentDs* ds = OpenSegment();
  SegmentBuffer* buffer = Load(ds, "01", 100, 1, 0, 8, std::string(1, '\0'));
  ASSERT_EQ(ds->SetState(buffer, 7, 0, '1', mList), 0);
  const Dstring write = Seg(":PATT:DATA 0,0,0,7,") + Block("\x01") + ";";
  Inst().Expect(write + Seg(":PATT:DATA? 0,50,0,57,BIN"), "", 1);
  ExpectErrors("-222,\"Data out of range\"");
  EXPECT_EQ(ds->SetBufferStart(buffer, 50, mList), 1);
  EXPECT_EQ(ds->GetBufferStart(buffer), 0);
  EXPECT_TRUE(ds->IsBufferDirty(buffer));
  // A reply that is not the new window: still the old window, its states and its edits.
  Inst().Expect(write + Seg(":PATT:DATA? 0,50,0,65,BIN"), "garbage");
  EXPECT_EQ(ds->SetBufferStartAndLength(buffer, 50, 16, mList), SegmentStatus::kBadReply);
  EXPECT_EQ(ds->GetBufferStart(buffer), 0);
  EXPECT_EQ(ds->GetBufferLength(buffer), 8);
  EXPECT_TRUE(ds->IsBufferDirty(buffer));
  char state = 0;
  EXPECT_EQ(ds->GetState(buffer, 7, 0, state, mList), 0);
  EXPECT_EQ(state, '1');
  Inst().Expect(write + Seg(":PATT:DATA? 0,50,0,65,BIN"), Block("\xf0\x0f"));
  EXPECT_EQ(ds->SetBufferStartAndLength(buffer, 50, 16, mList), 0);
  EXPECT_FALSE(ds->IsBufferDirty(buffer));
  EXPECT_EQ(ds->GetState(buffer, 50, 0, state, mList), 0);
  EXPECT_EQ(state, '1');
  // Nothing to write back: the read alone.
  Inst().Expect(Seg(":PATT:DATA? 0,0,0,15,BIN"), Block(std::string(2, '\0')));
  EXPECT_EQ(ds->SetBufferStart(buffer, 0, mList), 0);
  ds->Release();
}

TEST_F(SegmentBufferTest, WindowsAreRefusedBeforeAnythingIsSent) {
  QenSegmentDs* ds = OpenSegment();
  SegmentBuffer* buffer = Load(ds, "01", 10000, 100, 0, 0, "");
  struct Case {
    long start, length;
    const char* key;
  } cases[] = {{0, 8000, "GUI_SEGMENTBUFFER_BLOCK_TOO_LARGE"},
               {0, 7993, "GUI_SEGMENTBUFFER_BLOCK_TOO_LARGE"},
               {-1, 8, "GUI_SEGMENTBUFFER_BAD_WINDOW"},
               {9999, 2, "GUI_SEGMENTBUFFER_BAD_WINDOW"}};
  for (const Case& c : cases) {
    mList.Clear();
    EXPECT_NE(ds->SetBufferStartAndLength(buffer, c.start, c.length, mList), 0);
    EXPECT_TRUE(mList.HasKey(c.key)) << c.length;
  }
  EXPECT_EQ(mList.Last().GetArgs(), (std::vector<Dstring>{"9999", "2", "10000"}));
  Inst().Expect(Seg(":PATT:DATA? 0,0,99,7991,BIN"), Block(std::string(99900, '\0')));
  EXPECT_EQ(ds->SetBufferLength(buffer, 7992, mList), 0) << mList.ToText();
  ds->Release();
}

TEST_F(SegmentBufferTest, EmptyWindowsAndSegmentsMoveNoData) {
  QenSegmentDs* ds = OpenSegment();
  SegmentBuffer* empty = Load(ds, "01", 10, 0, 0, 0, "");
  EXPECT_EQ(ds->SetBufferStartAndLength(empty, 2, 5, mList), 0);
  EXPECT_EQ(ds->Read(mList), 0);
  EXPECT_EQ(ds->Write(mList), 0);
  ds->Release();
}

}  // namespace

// A closed segment's window only stores its numbers; it is fitted to the segment when the
// dimension is read again, as the segment may have changed meanwhile.
TEST_F(SegmentBufferTest, AClosedSegmentsWindowMovesWithoutAskingAndFitsWhenReadAgain) {
  QenSegmentDs* ds = OpenSegment();
  SegmentBuffer* buffer = Load(ds, "01", 100, 1, 0, 30, std::string(4, '\0'));
  Inst().Expect(Seg(":CLOS"), "");
  EXPECT_EQ(ds->Close(mList), 0);
  const std::size_t sent = Inst().Sent().size();
  EXPECT_EQ(ds->SetBufferStart(buffer, 95, mList), 0) << mList.ToText();
  EXPECT_EQ(ds->GetBufferStart(buffer), 95);
  EXPECT_EQ(ds->SetBufferStartAndLength(buffer, 95, 40, mList), 0) << mList.ToText();
  EXPECT_EQ(ds->GetBufferLength(buffer), 40);
  EXPECT_EQ(Inst().Sent().size(), sent) << "nothing is sent for a closed segment";
  EXPECT_NE(ds->SetBufferStart(buffer, -1, mList), 0);
  EXPECT_EQ(ds->GetBufferStart(buffer), 95);

  OpenSegment();
  ExpectDimension("01", 110, 1);
  EXPECT_EQ(ds->ReadDimension(buffer, mList), 0) << mList.ToText();
  EXPECT_EQ(ds->GetBufferStart(buffer), 70);
  EXPECT_EQ(ds->GetBufferLength(buffer), 40);
  ds->Release();
  ds->Release();
}

// A coding of no characters is read as it is, and the state width stays what it was; a forced
// read of the width then keeps it too.
TEST_F(SegmentBufferTest, AnEmptyCodingKeepsTheStateWidth) {
  QenSegmentDs* ds = OpenSegment();
  SegmentBuffer* buffer = Load(ds, "01X", 8, 2, 0, 8, std::string(4, '\0'));
  ExpectDimension("", 8, 2);
  ASSERT_EQ(ds->ReadDimension(buffer, mList), 0) << mList.ToText();
  long bits = 0;
  EXPECT_EQ(ds->GetStateWidth(bits, mList), 0);
  EXPECT_EQ(bits, 2);
  Dstring coding = "kept";
  EXPECT_EQ(ds->GetCoding(coding, mList), 0);
  EXPECT_EQ(coding, "");
  Inst().Expect(Seg(":PATT:COD?"), "\"\"");
  bits = 0;
  EXPECT_EQ(ds->GetStateWidth(bits, mList, true), 0);
  EXPECT_EQ(bits, 2);
  EXPECT_TRUE(mList.IsEmpty()) << mList.ToText();
  ds->Release();
}
