// qensim's sequencer over a real socket, and the sequence model driven against it.
#include <gtest/gtest.h>

#include <unistd.h>
#include <filesystem>
#include <fstream>
#include <memory>
#include <sstream>

#include "common/SimProcess.h"
#include "data/DirtyFlagDs.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenTcpInstrument.h"
#include "sequences/CPortInfo.h"
#include "sequences/CSequence.h"
#include "sequences/CSequenceBlock.h"
#include "sequences/SequenceFixture.h"
#include "sequences/SequenceService.h"
#include "sequences/SequenceTransfer.h"
#include "support/QenEnvironment.h"

namespace {

// One connection with its own handle.
class SimClient {
 public:
  SimClient(unsigned short port, const std::string& proposal) {
    EXPECT_EQ(mInst.Connect("127.0.0.1", port), 0);
    mInst.SetReplyTimeoutMs(10000);
    Dstring handle;
    EXPECT_EQ(mInst.Call(":QEN:INST:HAND:CRE? " + proposal + ",\"PSX\",\"T\"", handle), 0);
    mHandle = handle;
  }
  // Sends ":<handle><rest>"; the frame status.
  int Call(const std::string& rest, std::string* reply = nullptr) {
    Dstring text;
    const int status = mInst.Call(":" + mHandle + rest, text);
    if (reply) *reply = text;
    return status;
  }
  std::string Text(const std::string& rest) {
    std::string reply;
    EXPECT_EQ(Call(rest, &reply), 0) << rest;
    return reply;
  }
  // The code of the oldest queued error.
  int Error() {
    const std::string entry = Text(":SYST:ERR?");
    return std::stoi(entry.substr(0, entry.find(',')));
  }
  const Dstring& Handle() const { return mHandle; }

 private:
  QenTcpInstrument mInst;
  Dstring mHandle;
};

std::string ReadFile(const std::string& path) {
  std::ifstream in(path);
  std::stringstream text;
  text << in.rdbuf();
  return text.str();
}

// The built-in rack with a central module and a measurement mode, as a configuration file.
std::string CentralConfig() {
  const std::string path =
      (std::filesystem::temp_directory_path() / ("qengui-seq-" + std::to_string(::getpid()) + ".qsc"))
          .string();
  // The built-in rack with a central module, capturing.
  std::string rack = ReadFile(QEN_SOURCE_DIR "/sim/config/default.qsc");
  const std::string mode = "param :MEAS:MODE      enum   PATT";
  const std::size_t at = rack.find(mode);
  EXPECT_NE(at, std::string::npos);
  if (at != std::string::npos) rack.replace(at, mode.size(), "param :MEAS:MODE enum CAPT");
  std::ofstream out(path);
  out << "param :CENT:TYPE string \"K2200A\" readonly\n" << rack;
  return path;
}

const std::string kP = "PAUSE,0,0,";
const std::string kP0 = "PAUSE0,0,0,";

// The initial sequence of the built-in rack: ten data ports, generators pausing, analysers at 0.
std::string InitialOf(const std::string& generator) {
  const std::string g = generator + ",0,0,";
  std::string ports = g + g + g + g + kP0 + kP0 + g + g + kP0 + "PAUSE0,0,0";
  return "(3.0,\"\",(BLOCK,0,512,0,\"\",()," + ports + "))";
}

std::string Block10(unsigned long length, const std::string& first = "PAUSE") {
  return "(BLOCK,0," + std::to_string(length) + ",0,\"\",()," + first + ",0,0," + kP + kP + kP + kP0 + kP0 +
         kP + kP + kP0 + "PAUSE0,0,0)";
}

class SimSequenceTest : public testing::Test {
 protected:
  static void SetUpTestSuite() {
    sDefault = new SimProcess({"--test-control"});
    sConfig = CentralConfig();
    sCentral = new SimProcess({"--test-control", "--config", sConfig});
  }
  static void TearDownTestSuite() {
    delete sDefault;
    delete sCentral;
    std::filesystem::remove(sConfig);
  }
  void SetUp() override {
    ASSERT_NE(sDefault->Port(), 0);
    ASSERT_NE(sCentral->Port(), 0);
  }

  static inline SimProcess* sDefault = nullptr;
  static inline SimProcess* sCentral = nullptr;
  static inline std::string sConfig;
};

TEST_F(SimSequenceTest, TheBuiltInRack) {
  SimClient a(sDefault->Port(), "_CONF");
  EXPECT_EQ(a.Text(":SGEN:GLOB:SEQ:LLEV?"), "3");
  const std::string conf = a.Text(":SGEN:GLOB:CONF?");
  EXPECT_EQ(conf.substr(0, 10), "\"PATT\",\"\",");
  EXPECT_NE(conf.find("(\":CGR1:MOD1:CONN3\",\"PCLK\",\"OUTPUT_PORT\",\"K2268A\")"), std::string::npos)
      << conf;
  EXPECT_NE(conf.find("(\":CGR2:MOD2:CONN2\",\"PDAT\",\"INPUT_PORT\",\"K2270A\")"), std::string::npos)
      << conf;
  EXPECT_NE(conf.find("(\":CGR1:MOD2:CONN1\",\"PDAT\",\"OUTPUT_PORT\",\"K2269B\")"), std::string::npos)
      << conf;
  EXPECT_EQ(a.Text(":SGEN:GLOB:SEQ?"), InitialOf("PAUSE"));
  // No central module, no events.
  EXPECT_EQ(a.Call(":SGEN:GLOB:SEQ:EVEN?"), 1);
  EXPECT_EQ(a.Error(), -113);
  EXPECT_EQ(a.Call(":SGEN:GLOB:SEQ:LLEV 4"), 1);
  EXPECT_EQ(a.Error(), -200);
  EXPECT_EQ(a.Text(":SGEN:GLOB:SEQ:ITER:MAX?"), "1048576");
  EXPECT_EQ(a.Call(":SGEN:GLOB:SEQ:ITER:MAX 5"), 1);
  EXPECT_EQ(a.Error(), -200);
  EXPECT_EQ(a.Call(":SGEN:GLOB:CONF \"x\""), 1);
  EXPECT_EQ(a.Error(), -200);
}

struct WriteCase {
  std::string text;
  int error;
};

TEST_F(SimSequenceTest, WritesAreCheckedAndOnlyGoodOnesStored) {
  SimClient a(sDefault->Port(), "_CHK");
  const std::string good = "(3.0,\"s\",(SEQ," + Block10(1) + ",\"l\",(LOOP3,0,INF,\"\",(LOOP1,2,5,\"v\"," +
                           Block10(2, "\"ramp\"") + "))))";
  const WriteCase cases[] = {
      {"(3.0,\"\",(BLOCK", -104},
      {"(3.0,\"\",(BLOCK,0,1,0,\"\",(),PAUSE,0,0))", -224},
      {"(3.5,\"\"," + Block10(1) + ")", -224},
      {"(1.0,\"\"," + Block10(1) + ")", -224},
      {"(3.0,\"\",(LOOP4,0,2,\"\"," + Block10(1) + "))", -224},
      {"(3.0,\"\",(LOOP1,0,2,\"\",(LOOP1,0,2,\"\"," + Block10(1) + ")))", -224},
      {"(3.0,\"\"," + Block10(1, "WAIT") + ")", -224},
      {"(3.0,\"\"," + Block10(1, "\"\"") + ")", -224},
      {"(3.0,\"\",(SEQ," + Block10(1) + "," + Block10(2) + "))", -104},
      {"(3.0,\"\",(BLOCK,0,-1,0,\"\",()," + Block10(1).substr(19) + ")", -104},
      {"(3.0,\"\",(LOOP1,0,2,\"\"," + Block10(1) + ",1))", -104},
      {"(3.0,\"\",(LOOP1,0,1048577,\"\"," + Block10(1) + "))", -222},
      {"(3.0,\"\",(LOOP1,0,1048576,\"\"," + Block10(1) + "))", 0},
      {good, 0},
      {"(3.0,,)", 0},
      {good, 0},
  };
  std::string stored = InitialOf("PAUSE");
  a.Call(":SGEN:GLOB:SEQ " + stored);
  for (const WriteCase& c : cases) {
    EXPECT_EQ(a.Call(":SGEN:GLOB:SEQ " + c.text), c.error == 0 ? 0 : 1) << c.text;
    if (c.error != 0) {
      EXPECT_EQ(a.Error(), c.error) << c.text;
    } else {
      stored = c.text;
    }
    EXPECT_EQ(a.Text(":SGEN:GLOB:SEQ?"), stored);
  }
  EXPECT_EQ(a.Call(":SGEN:GLOB:SEQ"), 1);
  EXPECT_EQ(a.Error(), -109);
}

TEST_F(SimSequenceTest, OneSequencePerInstrumentAndOthersHearOfChanges) {
  SimClient a(sDefault->Port(), "_ONE");
  SimClient b(sDefault->Port(), "_TWO");
  a.Text(":DFL?");
  b.Text(":DFL?");
  const std::string text = "(3.0,\"\"," + Block10(77) + ")";
  ASSERT_EQ(a.Call(":SGEN:GLOB:SEQ " + text), 0);
  EXPECT_EQ(b.Text(":SGEN:GLOB:SEQ?"), text);
  EXPECT_EQ(b.Text(":DFL?"), "\":_TWO:SGEN:GLOB:SEQ\"");
  EXPECT_EQ(a.Text(":DFL?"), "") << "the writer is not told of its own write";
  ASSERT_EQ(a.Call(":SGEN:GLOB:SEQ " + text), 0);
  EXPECT_EQ(b.Text(":DFL?"), "") << "the same text again is no change";
}

TEST_F(SimSequenceTest, WithACentralModule) {
  SimClient a(sCentral->Port(), "_CA");
  SimClient b(sCentral->Port(), "_CB");
  EXPECT_EQ(a.Text(":SGEN:GLOB:SEQ:LLEV?"), "4");
  EXPECT_EQ(a.Text(":SGEN:GLOB:CONF?").substr(0, 16), "\"CAPT\",\"K2200A\",");
  EXPECT_EQ(a.Text(":SGEN:GLOB:SEQ?"), InitialOf("ACQUIRE"));
  const std::string empty = a.Text(":SGEN:GLOB:SEQ:EVEN?");
  EXPECT_EQ(empty.substr(0, 16), "(3.0,(\"\",0,()),(");
  const std::string events =
      "(3.0,(\"Go\",1,(('a','b','c',2))),(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),"
      "(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()),(\"\",0,()))";
  b.Text(":DFL?");
  EXPECT_EQ(a.Call(":SGEN:GLOB:SEQ:EVEN (3.0,(\"\",0,()))"), 1);
  EXPECT_EQ(a.Error(), -104);
  EXPECT_EQ(a.Call(":SGEN:GLOB:SEQ:EVEN " + events), 0);
  EXPECT_EQ(b.Text(":SGEN:GLOB:SEQ:EVEN?"), events);
  EXPECT_EQ(b.Text(":DFL?"), "\":_CB:SGEN:GLOB:SEQ:EVEN\"");
  // The configuration follows the mode, and everyone hears of it.
  a.Text(":DFL?");
  ASSERT_EQ(a.Call(":MEAS:MODE PATT"), 0);
  EXPECT_EQ(a.Text(":SGEN:GLOB:CONF?").substr(0, 7), "\"PATT\",");
  EXPECT_EQ(a.Text(":DFL?"), "\":_CA:SGEN:GLOB:CONF\"");
  const std::string heard = b.Text(":DFL?");
  EXPECT_NE(heard.find("\":_CB:SGEN:GLOB:CONF\""), std::string::npos) << heard;
  EXPECT_NE(heard.find("\":_CB:MEAS:MODE\""), std::string::npos) << heard;
  // Four levels: a level-4 loop is playable here.
  EXPECT_EQ(a.Call(":SGEN:GLOB:SEQ (3.0,\"\",(LOOP4,0,INF,\"\"," + Block10(1) + "))"), 0);
}

// The model against the simulator, as the application runs it: the port information and the
// sequence on the dirty-flag source, one GUI handle, and a second client editing alongside.
class SimModelTest : public SimSequenceTest {
 protected:
  void SetUp() override {
    SimSequenceTest::SetUp();
    mDir =
        (std::filesystem::temp_directory_path() / ("qengui-seqlog-" + std::to_string(::getpid()))).string();
    QenEnvironment::SetLogDirectory(Dstring(mDir));
    QenGuiInst::Init();
    auto inst = std::make_unique<QenTcpInstrument>();
    ASSERT_EQ(inst->Connect("127.0.0.1", sDefault->Port()), 0);
    Dstring handle;
    ASSERT_EQ(inst->Call(":QEN:INST:HAND:CRE? _GUI,\"PSX\",\"T\"", handle), 0);
    QenGuiInst::SetInstrument(std::move(inst));
    QenGuiInst::SetAppHandle(handle);
    mDirty = new DirtyFlagDs;
    CPortInfo::Init(mDirty, &SequenceService::NfyPortInfo);
    SequenceService::Init(mDirty, &CPortInfo::GetSequencePorts);
    SequenceService::GetSequence()->AddObserver(&mObserver);
    ASSERT_EQ(CSequence::InitNumLoopLevels(mList), 0);
    mOther = std::make_unique<SimClient>(sDefault->Port(), "_OTHER");
    ASSERT_EQ(mOther->Call(":SGEN:GLOB:SEQ " + InitialOf("PAUSE")), 0);
    ASSERT_EQ(Seq().ReadSequence(mList, 1), 0) << mList.ToText();
    ConditionList dropped;
    mDirty->UpdateFromFW(dropped);
    mObserver.log.clear();
  }
  void TearDown() override {
    SequenceService::GetSequence()->RemoveObserver(&mObserver);
    SequenceService::End();
    CPortInfo::End();
    mDirty->Release();
    mOther.reset();
    QenGuiInst::End();
    QenEnvironment::SetLogDirectory(std::nullopt);
    std::filesystem::remove_all(mDir);
  }
  CSequence& Seq() { return *SequenceService::GetSequence(); }

  std::string mDir;
  DirtyFlagDs* mDirty = nullptr;
  RecordingObserver mObserver;
  std::unique_ptr<SimClient> mOther;
  ConditionList mList;
};

TEST_F(SimModelTest, EditsReachTheServerAndTheOtherClient) {
  EXPECT_EQ(CSequence::GetNumLoopLevels(), 3u);
  ASSERT_EQ(Seq().GetNumPorts(), 10u);
  ASSERT_EQ(Seq().AddBlockAfter(1, mList), 0) << mList.ToText();
  ASSERT_EQ(Seq().SetSegment(2, 1, "ramp", mList), 0) << mList.ToText();
  ASSERT_EQ(Seq().SetLoop(1, 3, mList, 2, 0, 0, ""), 0) << mList.ToText();
  ASSERT_EQ(Seq().SetLoop(2, 1, mList, 1, 0, 0, ""), 0) << mList.ToText();
  ASSERT_EQ(Seq().SetLabel(2, "body", mList), 0) << mList.ToText();
  const std::string expected = "(3.0,\"\",(LOOP3,0,INF,\"\",(SEQ," + Block10(512) +
                               ",\"body\",(LOOP1,0,2,\"\"," + Block10(512, "\"ramp\"") + "))))";
  EXPECT_EQ(mOther->Text(":SGEN:GLOB:SEQ?"), expected);
  EXPECT_EQ(Seq().GetLastExpression(), expected);
  EXPECT_EQ(mOther->Text(":DFL?"), "\":_OTHER:SGEN:GLOB:SEQ\"");
  EXPECT_EQ(mObserver.log, (std::vector<std::string>{
                               "BlockInserted 2", "SegmentChanged 2,1", "LoopInserted 3,1,2,0", "UpdateLoops",
                               "LoopInserted 1,2,1,2", "UpdateLoops", "BlockLabelChanged 2"}));
}

TEST_F(SimModelTest, AForeignBlockIsFittedToThePorts) {
  auto foreign = std::make_unique<CSequence::CSequenceBlock>();
  foreign->Segments().push_back(DataItem::MakeString("x"));
  ASSERT_EQ(Seq().AddBlockAfter(1, mList, std::move(foreign)), 0) << mList.ToText();
  EXPECT_EQ(Seq().GetNumBlocks(), 2u);
  EXPECT_EQ(Seq().GetSegment(2, 1), "x");
  EXPECT_EQ(Seq().GetType(2, 2), CSequence::SEG_PAUSE);
  EXPECT_EQ(Seq().GetType(2, 5), CSequence::SEG_PAUSE0);
}

TEST_F(SimModelTest, AWriteTheServerRefusesIsUndone) {
  // The model thinks there are four levels; the instrument has three and refuses LOOP4.
  CSequence::SetNumLoopLevels(4);
  const Dstring before = Seq().GetLastExpression();
  EXPECT_EQ(Seq().SetLoop(1, 4, mList, 1, 0, 0, ""), 1);
  ASSERT_FALSE(mList.IsEmpty());
  EXPECT_EQ(mList[0].GetCode(), -224);
  EXPECT_TRUE(Seq().GetLoops().empty());
  EXPECT_EQ(Seq().GetLastExpression(), before);
  EXPECT_EQ(mOther->Text(":SGEN:GLOB:SEQ?"), before);
  EXPECT_TRUE(mObserver.log.empty());
}

TEST_F(SimModelTest, ChangesByTheOtherClientArriveThroughTheDirtyFlag) {
  const std::string text = "(3.0,\"\",(SEQ," + Block10(1) + ",\"\",(LOOP2,0,3,\"\"," + Block10(2) + ")))";
  ASSERT_EQ(mOther->Call(":SGEN:GLOB:SEQ " + text), 0);
  ASSERT_EQ(mDirty->UpdateFromFW(mList), 0) << mList.ToText();
  EXPECT_EQ(Seq().GetLastExpression(), text);
  EXPECT_EQ(Seq().GetLoopStatus(2, 2), CSequence::LOOP_SINGLE);
  EXPECT_EQ(mObserver.log, (std::vector<std::string>{"BlockLengthChanged 1", "BlockInserted 2",
                                                     "LoopInserted 2,2,1,3", "UpdateLoops"}));
}

TEST_F(SimModelTest, DefaultSegmentsFromTheServersConfiguration) {
  ASSERT_EQ(Seq().SetSegment(1, 5, "a", mList), 0);
  ASSERT_EQ(Seq().SetSegment(1, 1, "b", mList), 0);
  ASSERT_EQ(Seq().SetDefaultSegment(1, 5, mList), 0) << mList.ToText();
  ASSERT_EQ(Seq().SetDefaultSegment(1, 1, mList), 0);
  EXPECT_EQ(Seq().GetType(1, 5), CSequence::SEG_PAUSE0);
  EXPECT_EQ(Seq().GetType(1, 1), CSequence::SEG_PAUSE);
  EXPECT_EQ(mOther->Text(":SGEN:GLOB:SEQ?"), InitialOf("PAUSE"));
}


// A server may answer the start label in any plain form; the model takes its text and writes
// it back quoted.
TEST_F(SimModelTest, StartLabelsInEveryReplyFormAreReadAndKept) {
  const std::pair<const char*, const char*> forms[] = {{"5", "5"}, {"start", "start"}, {"2.5", "2.5"}, {"\"5\"", "5"}};
  unsigned long length = 7;
  for (const auto& [form, label] : forms) {
    // The reply text travels as a quoted argument: its quotes doubled.
    Dstring served = "(3.0," + Dstring(form) + "," + Block10(length) + ")";
    for (std::size_t at = 0; (at = served.find('"', at)) != Dstring::npos; at += 2) served.insert(at, 1, '"');
    Dstring reply;
    ASSERT_EQ(QenGuiInst::Call(":TEST:MALF \":SGEN:GLOB:SEQ?\",\"" + served + "\"", reply, mList), 0);
    ASSERT_EQ(Seq().ReadSequence(mList, 1), 0) << form << mList.ToText();
    EXPECT_EQ(Seq().GetLabel(1), label) << form;
    ASSERT_EQ(Seq().SetBlockLength(1, ++length, mList), 0) << mList.ToText();
    EXPECT_EQ(mOther->Text(":SGEN:GLOB:SEQ?"), "(3.0,\"" + std::string(label) + "\"," + Block10(length) + ")");
  }
}

}  // namespace

namespace {

// A file of the test's own.
std::string TempPath(const char* name) {
  return (std::filesystem::temp_directory_path() / (std::string("qengui-seqfile-") + std::to_string(::getpid()) + name))
      .string();
}

}  // namespace

TEST_F(SimModelTest, ASequenceGoesToAFileAndComesBackWholeToEveryEditor) {
  const std::string stored =
      "(3.0,\"start\",(SEQ," + Block10(640, "\"cnt32\"") + ",\"two\",(LOOP1,0,5,\"\"," + Block10(64) + ")))";
  ASSERT_EQ(mOther->Call(":SGEN:GLOB:SEQ " + stored), 0);
  ASSERT_EQ(Seq().ReadSequence(mList, 0), 0) << mList.ToText();
  const std::string path = TempPath("whole.qseq");
  ASSERT_EQ(SequenceTransfer::Export(path, mList), 0) << mList.ToText();
  const std::string file = ReadFile(path);
  EXPECT_EQ(file.rfind("qen sequence 1\nsequence (3.0,\"start\",\n  (SEQ,\n    (BLOCK,0,640,0,\"\",(),\"cnt32\",", 0), 0u)
      << file;
  EXPECT_EQ(file.find("events"), std::string::npos) << "without a central module there are none";

  ASSERT_EQ(mOther->Call(":SGEN:GLOB:SEQ " + InitialOf("PAUSE")), 0);
  ASSERT_EQ(Seq().ReadSequence(mList, 0), 0);
  mOther->Text(":DFL?");
  mObserver.log.clear();
  ASSERT_EQ(SequenceTransfer::Import(path, mList), 0) << mList.ToText();
  EXPECT_EQ(mOther->Text(":SGEN:GLOB:SEQ?"), stored) << "as exported, to the byte";
  EXPECT_EQ(Seq().GetLastExpression(), stored) << "the model follows at once";
  EXPECT_EQ(Seq().GetNumBlocks(), 2u);
  EXPECT_FALSE(mObserver.log.empty());
  EXPECT_EQ(mOther->Text(":DFL?"), "\":_OTHER:SGEN:GLOB:SEQ\"");
  std::filesystem::remove(path);
}

struct SequenceFileCase {
  const char* name;
  const char* text;
  const char* message;  // the start of the first condition, after the path
};

class SimSequenceFile : public SimModelTest, public testing::WithParamInterface<SequenceFileCase> {};

TEST_P(SimSequenceFile, ThatCannotBeTakenIsRefusedNamingItsLineAndChangesNothing) {
  const std::string path = TempPath(GetParam().name);
  std::ofstream(path) << GetParam().text;
  const std::string before = mOther->Text(":SGEN:GLOB:SEQ?");
  EXPECT_NE(SequenceTransfer::Import(path, mList), 0);
  ASSERT_GE(mList.Size(), 2u) << mList.ToText();
  EXPECT_EQ(mList[0].GetMessage().find(GetParam().message), 0u) << mList[0].GetMessage();
  EXPECT_EQ(mList[mList.Size() - 1].GetMessage(),
            "The sequence of " + path + " was not imported: the instrument holds what it held before.");
  EXPECT_EQ(mOther->Text(":SGEN:GLOB:SEQ?"), before);
  EXPECT_EQ(mOther->Text(":DFL?"), "");
  std::filesystem::remove(path);
}

INSTANTIATE_TEST_SUITE_P(
    Files, SimSequenceFile,
    testing::Values(
        SequenceFileCase{"Unreadable", "qen sequence 1\n# edited\nsequence (3.0,\"\",(FOO,1,2))\nend\n",
                         "Line 3 of "},
        SequenceFileCase{"EventsWithoutCentral",
                         "qen sequence 1\nsequence (3.0,,)\nevents (3.0,(\"\",0,()))\nend\n", "Line 3 of "},
        SequenceFileCase{"ASetting", "qen setting 1\nend\n", "Line 1 of "},
        SequenceFileCase{"PortsOfAnotherRack", "qen sequence 1\nsequence (3.0,\"\",(BLOCK,0,512,0,\"\",(),PAUSE,0,0))\nend\n",
                         "Illegal parameter value; line 2: the sequence does not fit this instrument of 10 data ports"}),
    [](const testing::TestParamInfo<SequenceFileCase>& info) { return std::string(info.param.name); });
