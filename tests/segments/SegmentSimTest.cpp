// The segment sources against a qensim process over a real socket.
#include <gtest/gtest.h>

#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <map>
#include <memory>
#include <random>
#include <sstream>
#include <string>

#include "common/SigrokCli.h"
#include "common/SimProcess.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "instrument/QenTcpInstrument.h"
#include "segments/QenSegmentDs.h"
#include "segments/QenSegmentPool.h"
#include "segments/SegmentBuffer.h"
#include "segments/SegmentSimFixture.h"
#include "segments/SegmentTextFile.h"
#include "segments/SegmentVcdWriter.h"
#include "support/QenEnvironment.h"

namespace {

class SegmentSimTest : public SegmentSimFixture {
 protected:
  // Every state of the window, trace by trace.
  std::string States(QenSegmentDs* ds, SegmentBuffer* buffer) {
    long width = 0;
    ds->GetWidth(width, mList);
    std::string out;
    for (long t = 0; t < width; ++t) {
      for (long v = ds->GetBufferStart(buffer); v < ds->GetBufferStart(buffer) + ds->GetBufferLength(buffer);
           ++v) {
        char s = 0;
        EXPECT_EQ(ds->GetState(buffer, v, t, s, mList), 0);
        out += s;
      }
    }
    return out;
  }

  // Random states of `coding` written into the window; returns them as States() reads them.
  std::string Scribble(QenSegmentDs* ds, SegmentBuffer* buffer, const Dstring& coding, unsigned seed) {
    std::mt19937 random(seed);
    long width = 0;
    ds->GetWidth(width, mList);
    for (long t = 0; t < width; ++t) {
      for (long v = ds->GetBufferStart(buffer); v < ds->GetBufferStart(buffer) + ds->GetBufferLength(buffer);
           ++v) {
        EXPECT_EQ(ds->SetState(buffer, v, t, coding[random() % coding.size()], mList), 0);
      }
    }
    return States(ds, buffer);
  }

};

TEST_F(SegmentSimTest, ASegmentLivesThroughEditsSavesAndARestart) {
  QenSegmentDs* ds = Make("Work/Round", "01", 1001, 24);
  SegmentBuffer* buffer = Window(ds, 0, 1001);
  const std::string written = Scribble(ds, buffer, "01", 7);
  ASSERT_EQ(ds->Write(mList), 0) << mList.ToText();
  SegmentBuffer* fresh = Window(ds, 0, 1001);
  EXPECT_EQ(States(ds, fresh), written);

  ASSERT_EQ(ds->ModifyFill(StateRange(2, 10, 3, 19), 1, mList), 0);
  ASSERT_EQ(ds->ModifyInvert(StateRange(3, 15, 3, 24), mList), 0);
  std::string expected = written;
  for (long v = 10; v <= 19; ++v) expected[2 * 1001 + v] = expected[3 * 1001 + v] = '1';
  for (long v = 15; v <= 24; ++v) expected[3 * 1001 + v] = expected[3 * 1001 + v] == '1' ? '0' : '1';
  EXPECT_EQ(States(ds, buffer), expected);
  EXPECT_EQ(States(ds, fresh), expected);

  // Trace 2 holds ten ones from vector 10: the next such run after vector 9 starts there.
  long vector = -1, trace = -1;
  ASSERT_EQ(ds->FindPattern(vector, trace, 9, 2, "1111111111", DataFormat::kBin, FindDirection::kNext,
                            VectorTrace::kTrace, mList),
            0);
  EXPECT_EQ(vector, 10);
  EXPECT_EQ(trace, 2);
  ASSERT_EQ(ds->Save(mList), 0);
  EXPECT_FALSE(ds->IsDirty());
  ASSERT_EQ(ds->Close(mList), 0);
  QenSegmentPool::FreeDs(ds);

  mSim.reset();
  mOther.Disconnect();
  StartServer();
  std::vector<Dstring> names;
  ASSERT_EQ(QenSegmentPool::Catalog(names, mList), 0) << mList.ToText();
  EXPECT_NE(std::find(names.begin(), names.end(), Dstring("Work/Round")), names.end());
  ds = QenSegmentPool::AllocDs("Work/Round");
  ASSERT_EQ(ds->Open(mList), 0) << mList.ToText();
  EXPECT_FALSE(ds->IsDirty());
  EXPECT_EQ(States(ds, Window(ds, 0, 1001)), expected);
  ASSERT_EQ(ds->Close(mList), 0);
  QenSegmentPool::FreeDs(ds);
  // Made again under its name, it starts afresh.
  ds = Make("Work/Round", "01X", 9, 2);
  EXPECT_EQ(States(ds, Window(ds, 0, 9)), std::string(18, '0'));
  ASSERT_EQ(ds->Close(mList), 0);
  QenSegmentPool::FreeDs(ds);
  bool exists = false;
  ASSERT_EQ(QenSegmentPool::Delete("Work/Round", mList), 0);
  ASSERT_EQ(QenSegmentPool::Exists("Work/Round", exists, mList), 0);
  EXPECT_FALSE(exists);
  ASSERT_EQ(QenSegmentPool::Catalog(names, mList), 0);
  EXPECT_EQ(std::find(names.begin(), names.end(), Dstring("Work/Round")), names.end());
}

// The other user removes vectors, so the range written back no longer exists.
TEST_F(SegmentSimTest, FailedWritesKeepTheEditsAndTheWindow) {
  QenSegmentDs* ds = Make("Faults", "01X", 200, 2);
  SegmentBuffer* buffer = Window(ds, 100, 49);
  const std::string edited = Scribble(ds, buffer, "01X", 3);
  ASSERT_EQ(Other(":PATT:MOD:DEL 0,VECT,120", ds->GetNumber()), 0);  // 80 vectors left
  EXPECT_NE(ds->Write(mList), 0);
  EXPECT_EQ(mList.Last().GetCode(), -222);
  EXPECT_TRUE(ds->IsBufferDirty(buffer));
  EXPECT_NE(ds->SetBufferStart(buffer, 0, mList), 0);
  EXPECT_EQ(ds->GetBufferStart(buffer), 100);
  EXPECT_EQ(States(ds, buffer), edited);

  ASSERT_EQ(Other(":PATT:MOD:INS 0,VECT,BEF,120", ds->GetNumber()), 0);
  ASSERT_EQ(ds->SetBufferStart(buffer, 0, mList), 0) << mList.ToText();
  EXPECT_FALSE(ds->IsBufferDirty(buffer));
  EXPECT_EQ(States(ds, Window(ds, 100, 49)), edited);

  // A locked instrument refuses the write; the edits wait for it.
  ASSERT_EQ(ds->SetState(buffer, 0, 0, 'X', mList), 0);
  Dstring reply;
  ASSERT_EQ(mOther.Call(":TEST:LOCK ON", reply), 0);
  EXPECT_EQ(ds->Write(buffer, mList), QenStatus::kLocked);
  EXPECT_TRUE(ds->IsBufferDirty(buffer));
  ASSERT_EQ(mOther.Call(":TEST:LOCK OFF", reply), 0);
  EXPECT_EQ(ds->Write(buffer, mList), 0);
  char state = 0;
  ds->GetState(Window(ds, 0, 1), 0, 0, state, mList);
  EXPECT_EQ(state, 'X');
  ds->Release();
}

TEST_F(SegmentSimTest, MultiStateCodingsTravelPacked) {
  const std::pair<const char*, long> codings[] = {
      {"LHXZ01", 331}, {"npkrX", 331}, {"01X", 333}, {"LH", 1001}};
  for (const auto& [coding, length] : codings) {
    QenSegmentDs* ds = Make(Dstring("Codings/") + coding, coding, length, 5);
    const std::string written = Scribble(ds, Window(ds, 0, length), coding, 11);
    ASSERT_EQ(ds->Write(mList), 0) << mList.ToText();
    EXPECT_EQ(States(ds, Window(ds, 0, length)), written) << coding;
    long bits = 0;
    EXPECT_EQ(ds->GetStateWidth(bits, mList, true), 0);
    EXPECT_EQ(bits, SegmentBuffer::StateWidthOf(coding));
    ds->Release();
  }
}

TEST_F(SegmentSimTest, SearchesWrapAroundAndSkipDontCares) {
  QenSegmentDs* ds = Make("Search", "01X", 8, 4);
  SegmentBuffer* buffer = Window(ds, 0, 8);
  // Along trace 1, "101" is at vectors 0 (through the X) and 5; "0x0" first at 1.
  for (long v = 0; v < 8; ++v) ds->SetState(buffer, v, 1, "1X100101"[v], mList);
  struct Case {
    FindDirection direction;
    long startVector;
    const char* pattern;
    long vector;
  } cases[] = {{FindDirection::kFirst, 0, "101", 0}, {FindDirection::kNext, 0, "101", 5},
               {FindDirection::kNext, 5, "101", 0},  {FindDirection::kPrevious, 0, "101", 5},
               {FindDirection::kNext, 0, "0x0", 1},  {FindDirection::kFirst, 0, "1111", -1}};
  for (const Case& c : cases) {
    long vector = 0, trace = 0;
    ASSERT_EQ(ds->FindPattern(vector, trace, c.startVector, 1, c.pattern, DataFormat::kBin, c.direction,
                              VectorTrace::kTrace, mList),
              0)
        << mList.ToText();
    EXPECT_EQ(vector, c.vector) << c.pattern << " from " << c.startVector;
    EXPECT_EQ(trace, c.vector < 0 ? -1 : 1) << c.pattern;
  }
  ds->Release();
}

TEST_F(SegmentSimTest, ErrorSearchFindsTheErroredStatesOfAnAnalyserSegment) {
  QenSegmentDs* ds = Make("Analyzer1", "npkr", 6, 3);
  SegmentBuffer* buffer = Window(ds, 0, 6);
  ds->SetState(buffer, 1, 2, 'k', mList);
  ds->SetState(buffer, 4, 0, 'r', mList);
  long vector = 0, trace = 0;
  ASSERT_EQ(ds->GetFirstError(vector, trace, mList), 0);
  EXPECT_EQ(std::make_pair(trace, vector), std::make_pair(2L, 1L));
  ASSERT_EQ(ds->GetNextError(vector, trace, 1, 2, mList), 0);
  EXPECT_EQ(std::make_pair(trace, vector), std::make_pair(0L, 4L));
  ASSERT_EQ(ds->GetNextError(vector, trace, 4, 0, mList), 0);  // round again
  EXPECT_EQ(std::make_pair(trace, vector), std::make_pair(2L, 1L));
  ASSERT_EQ(ds->GetPrevError(vector, trace, 1, 2, mList), 0);
  EXPECT_EQ(std::make_pair(trace, vector), std::make_pair(0L, 4L));
  ds->Release();
}

TEST_F(SegmentSimTest, TheClipboardIsSharedAndPastesWhereItFits) {
  QenSegmentDs* from = Make("Clip/From", "01", 16, 2);
  QenSegmentDs* to = Make("Clip/To", "01X", 16, 4);
  SegmentBuffer* source = Window(from, 0, 16);
  from->SetState(source, 3, 1, '1', mList);
  ASSERT_EQ(from->ModifyCopy(StateRange(0, 2, 1, 5), mList), 0);  // written back first
  bool possible = false;
  ASSERT_EQ(to->IsPastePossible(2, 12, possible, mList), 0);
  EXPECT_TRUE(possible);
  ASSERT_EQ(to->IsPastePossible(3, 12, possible, mList), 0);
  EXPECT_FALSE(possible);
  ASSERT_EQ(from->IsPastePossible(0, 0, possible, mList), 0);
  EXPECT_TRUE(possible);
  SegmentBuffer* target = Window(to, 0, 16);
  ASSERT_EQ(to->ModifyPaste(2, 12, mList), 0);
  char state = 0;
  to->GetState(target, 13, 3, state, mList);
  EXPECT_EQ(state, '1');
  EXPECT_EQ(to->GetChangeKind(), QenSegmentDs::kStatesChanged);
  from->Release();
  to->Release();
}

struct PrbsCase {
  const char* polynomial;
  int n, m;
};

class PseudoRandom : public SegmentSimTest, public testing::WithParamInterface<PrbsCase> {};

// The stream obeys its recurrence, runs its full period and has 2^(n-1) ones in it.
TEST_P(PseudoRandom, SegmentsFollowTheirPolynomial) {
  const PrbsCase& c = GetParam();
  SegmentProperties p;
  p.name = Dstring("GlobalSegments/") + c.polynomial;
  p.type = SegmentType::kPrbs;
  p.polynomial = c.polynomial;
  unsigned created = 0;
  ASSERT_EQ(QenSegmentPool::Create(p, created, mList), 0) << mList.ToText();
  SegmentProperties read;
  QenSegmentDs* ds = nullptr;
  ASSERT_EQ(QenSegmentPool::Open(p.name, read, ds, mList), 0) << mList.ToText();
  EXPECT_EQ(read.type, SegmentType::kPrbs);
  EXPECT_EQ(read.polynomial, c.polynomial);
  EXPECT_EQ(read.coding, "01");
  const long period = (1L << c.n) - 1;
  ASSERT_EQ(read.length, period);
  SegmentBuffer* buffer = Window(ds, 0, period);
  const std::string bits = States(ds, buffer);
  long ones = 0;
  for (long i = 0; i < period; ++i) {
    ones += bits[static_cast<std::size_t>(i)] == '1';
    if (i < c.n) continue;
    ASSERT_EQ(bits[i] - '0', (bits[i - c.n] - '0') ^ (bits[i - c.m] - '0')) << i;
  }
  EXPECT_EQ(ones, 1L << (c.n - 1));
  // Inverted logic flips every bit.
  ASSERT_EQ(ds->SetPRxSLogic(PRxSLogic::kInverted, mList), 0);
  const std::string inverted = States(ds, buffer);
  for (long i = 0; i < period; ++i) ASSERT_NE(inverted[i], bits[i]) << i;
  ds->Close(mList);
  ds->Release();
}

INSTANTIATE_TEST_SUITE_P(Polynomials, PseudoRandom,
                         testing::Values(PrbsCase{"2^7-1", 7, 6}, PrbsCase{"2^9-1", 9, 5},
                                         PrbsCase{"2^11-1", 11, 9}));

TEST_F(SegmentSimTest, GeneratorKindsAndFramesShapeTheStream) {
  SegmentProperties p;
  p.name = "LocalSegments/Frame";
  p.type = SegmentType::kSfi5;
  p.polynomial = "2^7-1";
  p.sfi5FramingBytes = "f628";
  p.sfi5ExpansionHeader = "a5";
  unsigned created = 0;
  ASSERT_EQ(QenSegmentPool::Create(p, created, mList), 0) << mList.ToText();
  SegmentProperties read;
  QenSegmentDs* ds = nullptr;
  ASSERT_EQ(QenSegmentPool::Open(p.name, read, ds, mList), 0) << mList.ToText();
  EXPECT_EQ(read.sfi5FramingBytes, "f628");
  EXPECT_EQ(read.sfi5ExpansionHeader, "a5");
  EXPECT_EQ(read.length, 16 * (16 + 8 + 1024));
  EXPECT_EQ(States(ds, Window(ds, 0, 24)), "111101100010100010100101");
  // An extended run of ones: the stream's n ones become n + 5.
  ASSERT_EQ(ds->SetType(SegmentType::kPrbs, mList), 0);
  ASSERT_EQ(ds->SetPRxSSubType(PRxSSubType::kExtendedOne, mList), 0);
  ASSERT_EQ(ds->SetPRxSExtensionNumber(5, mList), 0);
  long length = 0;
  ds->GetLength(length, mList);
  EXPECT_EQ(length, 127 + 5);
  EXPECT_EQ(States(ds, Window(ds, 0, 14)), "11111111111100");
  ASSERT_EQ(ds->SetPRxSSubType(PRxSSubType::kErrored, mList), 0);
  EXPECT_NE(ds->SetPRxSErrors(200, mList), 0);  // more errors than bits
  EXPECT_EQ(mList.Last().GetCode(), -222);
  // Made memory data, the stream stays as it was.
  ASSERT_EQ(ds->SetType(SegmentType::kMemory, mList), 0);
  ds->GetLength(length, mList);
  EXPECT_EQ(length, 127);
  EXPECT_EQ(States(ds, Window(ds, 0, 9)), "111111100");
  ds->Close(mList);
  ds->Release();
}

TEST_F(SegmentSimTest, ASixteenMegavectorSegmentOfSixtyFourTracesFits) {
  QenSegmentDs* ds = Make("Big", "01", 16L << 20, 64);
  SegmentBuffer* buffer = Window(ds, (16L << 20) - 1000, 1000);
  ASSERT_EQ(ds->SetState(buffer, (16L << 20) - 1, 63, '1', mList), 0);
  ASSERT_EQ(ds->Write(mList), 0) << mList.ToText();
  char state = 0;
  ds->GetState(Window(ds, (16L << 20) - 8, 8), (16L << 20) - 1, 63, state, mList);
  EXPECT_EQ(state, '1');
  ds->Release();
}


// A server may answer the coding in any item form: quoted, bare, or as a number (01); the
// segment still opens, shows and edits.
TEST_F(SegmentSimTest, CodingsInEveryReplyFormAreTaken) {
  QenSegmentDs* ds = Make("Work/Plain", "01", 16, 2);
  const Dstring header = Dstring::Format(":EDIT:SEGM%u:PATT:COD?", ds->GetNumber());
  for (const char* form : {"01", "\"\"01\"\"", "(01)", "01,"}) {
    Dstring reply;
    ASSERT_EQ(QenGuiInst::Call(":TEST:MALF \"" + header + "\",\"" + form + "\",0", reply, mList), 0) << form;
    SegmentBuffer* buffer = Window(ds, 0, 16);
    Dstring coding;
    ASSERT_EQ(ds->GetCoding(coding, mList, true), 0) << form << mList.ToText();
    EXPECT_EQ(coding, "01") << form;
    const std::string written = Scribble(ds, buffer, "01", 3);
    ASSERT_EQ(ds->Write(mList), 0) << mList.ToText();
    EXPECT_EQ(States(ds, Window(ds, 0, 16)), written) << form;
  }
  ds->Close(mList);
  QenSegmentPool::FreeDs(ds);
}

}  // namespace

// Text out and back in, for a two-state coding in every format and for a coding of more states;
// 13 traces leave the top hex digit one trace and the top octal digit one trace.
TEST_F(SegmentSimTest, TextExportsAndImportsBackBitIdentical) {
  const std::pair<const char*, DataFormat> cases[] = {
      {"01", DataFormat::kHex}, {"01", DataFormat::kOct}, {"LH", DataFormat::kBin}, {"LHXZ01", DataFormat::kHex}};
  const Dstring path = mDir + "/out.txt";
  for (const auto& [coding, format] : cases) {
    SCOPED_TRACE(coding);
    QenSegmentDs* from = Make("Text/From", coding, 300, 13);
    const std::string written = Scribble(from, Window(from, 0, 300), coding, 5);
    ASSERT_EQ(from->Write(mList), 0) << mList.ToText();
    ASSERT_EQ(SegmentTextFile::Export(*from, format, path, mList), 0) << mList.ToText();
    QenSegmentDs* to = Make("Text/To", coding, 7, 13);
    ASSERT_EQ(SegmentTextFile::Import(*to, format, path, mList), 0) << mList.ToText();
    long length = 0;
    ASSERT_EQ(to->GetLength(length, mList, true), 0);
    EXPECT_EQ(length, 300);
    EXPECT_EQ(States(to, Window(to, 0, 300)), written);
    for (QenSegmentDs* ds : {from, to}) {
      ds->Close(mList);
      QenSegmentPool::FreeDs(ds);
    }
  }
}

TEST_F(SegmentSimTest, AnImportThatDoesNotFitChangesNothing) {
  QenSegmentDs* ds = Make("Text/Kept", "01", 20, 6);
  const std::string before = Scribble(ds, Window(ds, 0, 20), "01", 9);
  ASSERT_EQ(ds->Write(mList), 0);
  const Dstring path = mDir + "/bad.txt";
  // Six traces are two hex digits, the upper one holding two traces (0-3).
  const std::pair<const char*, const char*> files[] = {
      {"# fine\n3f\n1 0\n2a1\n", "Line 4 of"},   // three digits
      {"3f\n4f\n", "Line 2 of"},                   // 4 needs a third trace
      {"3f\n0g\n", "\"g\" at column 2"},
      {"# nothing\n\n", "holds no vectors"},
  };
  for (const auto& [text, expected] : files) {
    std::ofstream(path, std::ios::trunc) << text;
    ConditionList list;
    EXPECT_NE(SegmentTextFile::Import(*ds, DataFormat::kHex, path, list), 0) << text;
    EXPECT_NE(list.ToText().find(expected), std::string::npos) << list.ToText();
  }
  ConditionList list;
  EXPECT_NE(SegmentTextFile::Import(*ds, static_cast<DataFormat>(7), path, list), 0);
  EXPECT_NE(SegmentTextFile::Import(*ds, DataFormat::kHex, mDir + "/missing.txt", list), 0);
  EXPECT_NE(list.ToText().find("could not be read"), std::string::npos) << list.ToText();
  long length = 0;
  ASSERT_EQ(ds->GetLength(length, mList, true), 0);
  EXPECT_EQ(length, 20);
  EXPECT_EQ(States(ds, Window(ds, 0, 20)), before);
  ds->Close(mList);
  QenSegmentPool::FreeDs(ds);
}

// The dump read back as a viewer reads it gives every state of the segment at its vector.
TEST_F(SegmentSimTest, TheValueChangeDumpHoldsEveryState) {
  QenSegmentDs* ds = Make("Vcd/Seg", "npkrX", 90, 5);
  const std::string states = Scribble(ds, Window(ds, 0, 90), "npkrX", 3);
  ASSERT_EQ(ds->Write(mList), 0);
  std::ostringstream out;
  ASSERT_EQ(SegmentVcdWriter::Write(*ds, out, mList), 0) << mList.ToText();
  std::istringstream in(out.str());
  std::map<std::string, long> ids;  // identifier -> trace, 5 for the error wire
  std::string word, line;
  while (in >> word && word != "$enddefinitions") {
    if (word != "$var") continue;
    std::string kind, size, id, name;
    in >> kind >> size >> id >> name;
    ids[id] = name == "error" ? 5 : std::stol(name.substr(1));
  }
  ASSERT_EQ(ids.size(), 6u);
  std::string now(6, '?');
  long time = -1;
  auto check = [&](long upTo) {
    for (long v = time; v >= 0 && v < upTo; ++v) {
      bool error = false;
      for (long t = 0; t < 5; ++t) {
        const char s = states[static_cast<std::size_t>(t * 90 + v)];
        error = error || s == 'k' || s == 'r';
        const char want = s == 'n' || s == 'k' ? '0' : s == 'p' || s == 'r' ? '1' : 'x';
        ASSERT_EQ(now[static_cast<std::size_t>(t)], want) << "vector " << v << " trace " << t;
      }
      ASSERT_EQ(now[5], error ? '1' : '0') << "vector " << v;
    }
  };
  std::getline(in, line);  // the rest of the definitions line
  while (std::getline(in, line)) {
    if (line.empty() || line[0] == '$') continue;
    if (line[0] == '#') {
      const long next = std::stol(line.substr(1));
      check(next);
      time = next;
      continue;
    }
    ASSERT_TRUE(ids.count(line.substr(1))) << line;
    now[static_cast<std::size_t>(ids[line.substr(1)])] = line[0];
  }
  EXPECT_EQ(time, 90);
  ds->Close(mList);
  QenSegmentPool::FreeDs(ds);
}

// A logic analyser program reads the file the editor exports: a sample a vector, the states of
// every trace as bits (a state that is neither, X, as 0) and the error wire.
TEST_F(SegmentSimTest, SigrokReadsEveryStateOfTheExportedSegment) {
  if (!SigrokCli::IsInstalled()) GTEST_SKIP() << "sigrok-cli is not installed";
  QenSegmentDs* ds = Make("Vcd/Sigrok", "npkrX", 300, 100);
  const std::string states = Scribble(ds, Window(ds, 0, 300), "npkrX", 3);
  ASSERT_EQ(ds->Write(mList), 0);
  const Dstring path = mDir + "/sigrok.vcd";
  ASSERT_EQ(SegmentVcdWriter::WriteFile(*ds, path, mList), 0) << mList.ToText();
  std::map<std::string, std::string> channels;
  std::string error;
  ASSERT_TRUE(SigrokCli::Read(path, "", channels, error)) << error;
  ASSERT_EQ(channels.size(), 101u);
  std::string errored(300, '0');
  for (long t = 0; t < 100; ++t) {
    const std::string& samples = channels["t" + std::to_string(t)];
    ASSERT_EQ(samples.size(), 300u) << t;
    for (long v = 0; v < 300; ++v) {
      const char s = states[static_cast<std::size_t>(t * 300 + v)];
      if (s == 'k' || s == 'r') errored[static_cast<std::size_t>(v)] = '1';
      ASSERT_EQ(samples[static_cast<std::size_t>(v)], s == 'p' || s == 'r' ? '1' : '0')
          << "trace " << t << ", vector " << v;
    }
  }
  EXPECT_EQ(channels["error"], errored);
  ds->Close(mList);
  QenSegmentPool::FreeDs(ds);
}

// A long export reports each block, and stopping it leaves no file behind.
TEST_F(SegmentSimTest, AStoppedExportLeavesTheFileAsItWas) {
  QenSegmentDs* ds = Make("Text/Long", "01", 40000, 64);
  const Dstring path = mDir + "/long.txt";
  std::vector<long> done;
  {
    const SegmentTextFile::ProgressScope scope([&done](long d, long total) {
      EXPECT_EQ(total, 40000);
      done.push_back(d);
      return true;
    });
    ASSERT_EQ(SegmentTextFile::Export(*ds, DataFormat::kHex, path, mList), 0) << mList.ToText();
  }
  EXPECT_EQ(done, (std::vector<long>{12496, 24992, 37488, 40000}));
  const auto whole = std::filesystem::file_size(path.c_str());
  {
    const SegmentTextFile::ProgressScope scope([](long d, long) { return d < 20000; });
    EXPECT_NE(SegmentTextFile::Export(*ds, DataFormat::kHex, path, mList), 0);
  }
  EXPECT_NE(mList.ToText().find("Stopped after 24992 of 40000 vectors"), std::string::npos) << mList.ToText();
  EXPECT_EQ(std::filesystem::file_size(path.c_str()), whole) << "the export before stays whole";
  for (const auto& entry : std::filesystem::directory_iterator(mDir)) {
    EXPECT_NE(entry.path().filename().string().rfind("long.txt.", 0), 0u) << "nothing stays beside it";
  }
  std::filesystem::remove(path.c_str());
  {
    const SegmentTextFile::ProgressScope scope([](long d, long) { return d < 20000; });
    EXPECT_NE(SegmentTextFile::Export(*ds, DataFormat::kHex, path, mList), 0);
  }
  EXPECT_FALSE(std::filesystem::exists(path.c_str())) << "a stopped first export leaves no file";
  ds->Close(mList);
  QenSegmentPool::FreeDs(ds);
}
