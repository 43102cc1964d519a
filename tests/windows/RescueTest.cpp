#include <gtest/gtest.h>

#include <unistd.h>
#include <QTest>
#include <filesystem>
#include <fstream>
#include <memory>
#include <sstream>
#include <string>

#include "common/gui/GuiSimFixture.h"
#include "core/RescueFolder.h"
#include "core/ServerDeathRescue.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "segments/QenSegmentPool.h"
#include "segments/ui/SegmentGridManager.h"
#include "sequences/CSequence.h"
#include "sequences/SequenceService.h"
#include "support/QenEnvironment.h"
#include "windows/dataedit/DataeditSegmentEditWin.h"

namespace {

namespace fs = std::filesystem;

std::string Slurp(const fs::path& path) {
  std::ifstream in(path, std::ios::binary);
  std::ostringstream text;
  text << in.rdbuf();
  return text.str();
}

std::vector<Dstring>& Deaths() {
  static std::vector<Dstring> deaths;
  return deaths;
}

// The test's death handler: the message is kept instead of shown, the rescue runs as the default
// handler runs it, and the process goes on.
void RecordDeath(const Dstring& message) {
  Deaths().push_back(message);
  QenGuiInst::RunBeforeServerDeathExit();
}

// The server dies with unsaved work in the segment editors and a sequence read; the next start
// offers it back. Each test kills its qensim, so each has its own, on a data directory that
// outlives the qensim, as an instrument's files do.
class RescueTest : public GuiSimFixture {
 protected:
  static void SetUpTestSuite() { EnsureApplication(); }

  void SetUp() override {
    const fs::path base = fs::temp_directory_path() / ("qengui-rescue-" + std::to_string(::getpid()));
    mLogDir = (base / "log").string();
    sDataDir = (base / "data").string();
    fs::remove_all(base);
    fs::create_directories(mLogDir.c_str());
    QenEnvironment::SetLogDirectory(mLogDir);
    Start();
    Deaths().clear();
  }
  void TearDown() override {
    Stop();
    QenEnvironment::SetLogDirectory(std::nullopt);
    fs::remove_all(fs::path(mLogDir.c_str()).parent_path());
  }
  // A start of the program against a qensim on the data directory.
  void Start() {
    sSim = new SimProcess({"--test-control", "--data-dir", sDataDir});
    GuiSimFixture::SetUp();
    QenGuiInst::SetServerDeathHandler(&RecordDeath);
    ASSERT_EQ(CSequence::InitNumLoopLevels(mList), 0) << mList.ToText();
  }
  void Stop() {
    mWindows.clear();
    GuiSimFixture::TearDown();
    delete sSim;
    sSim = nullptr;
  }
  DataeditSegmentEditWin* Editor(const Dstring& name, long length, long width) {
    auto win = std::make_unique<DataeditSegmentEditWin>();
    EXPECT_EQ(win->Load(mList), 0) << mList.ToText();
    SegmentProperties properties;
    properties.name = name;
    properties.length = length;
    properties.width = width;
    EXPECT_EQ(win->CreateSegment(properties, mList), 0) << mList.ToText();
    // Tall enough to hold the whole of these short segments.
    win->resize(900, 600);
    win->show();
    mWindows.push_back(std::move(win));
    return mWindows.back().get();
  }
  // The sequence as this client last read it, after it set the first block's length.
  Dstring EditSequence() {
    CSequence* sequence = SequenceService::GetSequence();
    EXPECT_EQ(sequence->ReadSequence(mList, 1), 0) << mList.ToText();
    EXPECT_EQ(sequence->SetBlockLength(1, 777, mList), 0) << mList.ToText();
    return sequence->GetLastExpression();
  }
  // qensim ends itself; the next poll finds it gone.
  void KillServer() {
    Dstring ignored;
    mOther->Call(":TEST:DIE", ignored);
    mOther.reset();
    Poll();
  }
  fs::path Root() const { return fs::path(mLogDir.c_str()) / "rescue"; }
  fs::path OnlyFolder() const {
    std::vector<fs::path> folders;
    for (const auto& entry : fs::directory_iterator(Root())) folders.push_back(entry.path());
    EXPECT_EQ(folders.size(), 1u);
    return folders.empty() ? fs::path() : folders.front();
  }
  std::string Log() const { return Slurp(fs::path(mLogDir.c_str()) / "qengui.log"); }
  // The digits of a vector as another client reads the segment from its saved file.
  std::string OtherRow(const Dstring& name, long vector, long width) {
    const Dstring number = Other(":EDIT:SEGM:OPEN? \"" + name + "\"");
    const Dstring block = Other(":EDIT:SEGM" + number +
                                Dstring::Format(":PATT:DATA? 0,%ld,%ld,%ld,BIN", vector, width - 1, vector));
    Other(":EDIT:SEGM" + number + ":CLOS");
    std::string digits;
    for (long d = width / 4 - 1; d >= 0; --d) {
      int value = 0;
      for (long t = 4 * d + 3; t >= 4 * d; --t)
        value = value * 2 + ((static_cast<unsigned char>(block[7 + t]) & 0x80) ? 1 : 0);
      digits += "0123456789abcdef"[value];
    }
    return digits;
  }

  Dstring mLogDir;
  std::vector<std::unique_ptr<DataeditSegmentEditWin>> mWindows;
};

// The lines of a segment of `length` vectors, "0" digits but for the given ones.
std::string Lines(long length, long digits, const std::map<long, std::string>& rows) {
  std::string text;
  for (long v = 0; v < length; ++v) {
    const auto it = rows.find(v);
    text += (it == rows.end() ? std::string(static_cast<std::size_t>(digits), '0') : it->second) + "\n";
  }
  return text;
}

}  // namespace

// "cnt32": a fill written to the instrument but not saved, and digits typed and not yet written;
// "walkB8": digits typed only (the rest is its saved file); the sequence with a block length set.
// The death writes all of it, byte for byte, says where in the log's second line and a second
// message; the next start puts it back and saves it, and does not ask again.
TEST_F(RescueTest, TheServersDeathWritesTheUnsavedWorkAndTheNextStartPutsItBack) {
  SegmentGridManager* counter = Editor("cnt32", 64, 16)->Grid();
  ASSERT_EQ(counter->SetSelection(0, 0, 3, 0, 3, 0, mList), 0) << mList.ToText();
  counter->SetFillState(1);
  ASSERT_EQ(counter->ModifyFill(mList), 0) << mList.ToText();
  ASSERT_EQ(counter->GoToVectorTrace(40, 12, mList), 0);
  QTest::keyClicks(counter, QStringLiteral("beef"));
  SegmentGridManager* walk = Editor("walkB8", 32, 8)->Grid();
  ASSERT_EQ(walk->GoToVectorTrace(7, 4, mList), 0);
  QTest::keyClicks(walk, QStringLiteral("a5"));
  const Dstring expression = EditSequence();
  mAlerts.clear();

  KillServer();
  ASSERT_EQ(Deaths(), (std::vector<Dstring>{QenGuiInst::kServerDeathMessage}));
  const fs::path folder = OnlyFolder();
  EXPECT_EQ(Log(),
            "Server has terminated. Shutdown.\nUnsaved work was written to " + folder.string() + ".\n");
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_EQ(mAlerts[0],
            "The work that was not saved, the segments \"cnt32\" and \"walkB8\" and the sequence, was "
            "written to\n" +
                folder.string() + "\nThe next start offers to put it back.");
  EXPECT_EQ(Slurp(folder / "segment-1.txt"),
            "# segment cnt32: 64 vectors of 16 traces, coding \"01\", HEX, vector 0 first\n" +
                Lines(64, 4, {{0, "ffff"}, {1, "ffff"}, {2, "ffff"}, {3, "ffff"}, {40, "beef"}}));
  EXPECT_EQ(Slurp(folder / "segment-2.txt"),
            "# segment walkB8: vectors 0 to 31 of 32 vectors of 8 traces, coding \"01\", HEX\n" +
                Lines(32, 2, {{7, "a5"}}));
  EXPECT_EQ(Slurp(folder / "sequence.txt"), expression + "\n");
  const std::string list = Slurp(folder / "rescue.txt");
  const std::size_t at = list.find("written\t");
  ASSERT_NE(at, std::string::npos) << list;
  const std::string written = list.substr(at + 8, 19);
  std::string stamp = written;
  stamp[10] = '_';
  stamp[13] = stamp[16] = '-';
  EXPECT_EQ(folder.filename().string(), stamp);
  EXPECT_EQ(list,
            "# Work that was not saved when the server died at " + written +
                ".\n"
                "# Each segment file is in the segment editor's text form: Segment > Import Text reads it.\n"
                "written\t" +
                written +
                "\n"
                "segment\tsegment-1.txt\tcnt32\t01\t16\t64\t0\t64\twhole\n"
                "segment\tsegment-2.txt\twalkB8\t01\t8\t32\t0\t32\tpart\n"
                "sequence\tsequence.txt\n"
                "end\n");

  Stop();
  Start();
  EXPECT_EQ(OtherRow("cnt32", 0, 16), "0000") << "the instrument lost what was not saved";
  mToolkit.QueueAnswer(ToolkitPort::kYes);
  ConditionList refused;
  EXPECT_EQ(ServerDeathRescue::OfferPutBack(refused), 0) << refused.ToText();
  for (const auto& [vector, digits] :
       std::map<long, std::string>{{0, "ffff"}, {3, "ffff"}, {4, "0000"}, {40, "beef"}}) {
    EXPECT_EQ(OtherRow("cnt32", vector, 16), digits) << "vector " << vector;
  }
  EXPECT_EQ(OtherRow("walkB8", 7, 8), "a5");
  EXPECT_EQ(OtherRow("walkB8", 6, 8), "00");
  EXPECT_EQ(Other(":SGEN:GLOB:SEQ?"), expression);
  EXPECT_EQ(Slurp(folder / RescueFolder::kAnswerName), "put back\n");
  EXPECT_TRUE(RescueFolder::Pending(Root().string()).empty());
}

// Under another client's lock nothing is put back and the folder is offered again; No keeps it,
// changes nothing, and is not asked again.
TEST_F(RescueTest, ALockPutsNothingBackAndNoKeepsTheFolder) {
  SegmentGridManager* walk = Editor("walkB8", 32, 8)->Grid();
  QTest::keyClicks(walk, QStringLiteral("3c"));
  const Dstring expression = EditSequence();
  KillServer();
  const fs::path folder = OnlyFolder();
  Stop();
  Start();
  const Dstring initial = Other(":SGEN:GLOB:SEQ?");
  ASSERT_NE(initial, expression);

  Control(":TEST:LOCK ON");
  mToolkit.QueueAnswer(ToolkitPort::kYes);
  ConditionList refused;
  EXPECT_EQ(ServerDeathRescue::OfferPutBack(refused), QenStatus::kLocked);
  EXPECT_NE(refused.ToText().find("Another client holds the instrument, so nothing more was put back"),
            std::string::npos)
      << refused.ToText();
  EXPECT_FALSE(fs::exists(folder / RescueFolder::kAnswerName));
  Control(":TEST:LOCK OFF");
  EXPECT_EQ(OtherRow("walkB8", 0, 8), "00");
  EXPECT_EQ(Other(":SGEN:GLOB:SEQ?"), initial);

  mToolkit.QueueAnswer(ToolkitPort::kNo);
  refused.Clear();
  EXPECT_EQ(ServerDeathRescue::OfferPutBack(refused), 0) << refused.ToText();
  EXPECT_EQ(Slurp(folder / RescueFolder::kAnswerName), "kept\n");
  EXPECT_TRUE(fs::exists(folder / "segment-1.txt"));
  EXPECT_TRUE(RescueFolder::Pending(Root().string()).empty());
  EXPECT_EQ(OtherRow("walkB8", 0, 8), "00");
  EXPECT_EQ(Other(":SGEN:GLOB:SEQ?"), initial);
}

// A rescue folder that cannot be made is said in the log and on standard error, and the exit
// still happens (the death handler returns to it).
TEST_F(RescueTest, AFolderThatCannotBeWrittenIsSaidAndTheExitGoesOn) {
  std::ofstream(Root()) << "in the way\n";
  EditSequence();
  mAlerts.clear();
  testing::internal::CaptureStderr();
  KillServer();
  const std::string said = testing::internal::GetCapturedStderr();
  ASSERT_EQ(Deaths().size(), 1u);
  const std::string log = Log();
  const std::string second = "Unsaved work could not be written to " + Root().string() + "/";
  ASSERT_EQ(log.rfind("Server has terminated. Shutdown.\n" + second, 0), 0u) << log;
  const std::string line = log.substr(log.find('\n') + 1);
  EXPECT_NE(line.find(". The file " + Root().string() + "/"), std::string::npos) << line;
  EXPECT_NE(said.find("qengui: " + line), std::string::npos) << said;
  ASSERT_EQ(mAlerts.size(), 1u);
  EXPECT_EQ(mAlerts[0].rfind("The work that was not saved, the sequence, could not be written to\n", 0), 0u)
      << mAlerts[0];
  EXPECT_TRUE(fs::is_regular_file(Root()));
}
