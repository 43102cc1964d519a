// Export and import of a setting between the instrument and a local file: the texts on the wire
// to the byte, files checked whole before anything is sent, replies never trusted, the user's
// file and the instrument left as they were when anything fails; qensim's refusal of a file,
// and a setting that outlives qensim. (The round trip and a lock through the File menu are in
// tests/windows/SettingFileWinTest.cpp.)
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <unistd.h>

#include "SimClientFixture.h"
#include "common/InstrumentFixture.h"
#include "settings/QENSystemProfile.h"
#include "settings/SettingTransfer.h"

namespace {

using Kind = SettingText::Kind;

constexpr const char* kText =
    "qen setting 1\nvalue :CGR1:PER 2e-09\nprofile\nsequence (3.0,,\n  (BLOCK,0,512,0,\"\",(),PAUSE,0,0))\nend\n";

std::string Slurp(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  std::stringstream text;
  text << in.rdbuf();
  return text.str();
}

void Put(const std::string& path, const std::string& text) { std::ofstream(path, std::ios::binary) << text; }

Dstring Block(const std::string& text) {
  const std::string digits = std::to_string(text.size());
  return "#" + std::to_string(digits.size()) + digits + text;
}

// A file of the test's own in a folder that goes with it.
class TempFiles {
 public:
  TempFiles()
      : mDir(std::filesystem::temp_directory_path() / ("qengui-transfer-" + std::to_string(::getpid()))) {
    std::filesystem::create_directories(mDir);
  }
  ~TempFiles() { std::filesystem::remove_all(mDir); }
  std::string Path(const char* name) const { return (mDir / name).string(); }
  std::size_t Count() const {
    return static_cast<std::size_t>(std::distance(std::filesystem::directory_iterator(mDir), {}));
  }

 private:
  std::filesystem::path mDir;
};

class TransferWire : public InstrumentFixture {
 protected:
  TempFiles mFiles;
};

}  // namespace

TEST_F(TransferWire, ExportAsksForTheTextAndWritesWhatItRead) {
  Inst().Expect(":_H:MMEM:SETT:DATA?", Block(kText));
  const std::string path = mFiles.Path("bench.qen");
  ASSERT_EQ(SettingTransfer::Export(Kind::kSetting, path, mList), 0) << mList.ToText();
  EXPECT_EQ(Slurp(path), kText);
  EXPECT_EQ(mFiles.Count(), 1u) << "no temporary file stays behind";
}

TEST_F(TransferWire, ImportSendsTheCheckedTextWithTheCableDelayChoiceAndForgetsTheOpenName) {
  const std::string path = mFiles.Path("bench.qen");
  Put(path, std::string(kText).insert(14, "# from bench 2\n"));
  Inst().Expect(":_H:MMEM:SETT:DATA ON," + Block(kText), "");
  Inst().Expect("_H:CONF:PROF \"OPENSETTING_NAME\",\"\"", "");
  EXPECT_EQ(SettingTransfer::ImportSetting(path, true, mList), 0) << mList.ToText();
  EXPECT_TRUE(Inst().AllConsumed());
}

struct BadFile {
  const char* name;
  const char* text;
  const char* line;  // how the condition names it
};

class TransferBadFile : public TransferWire, public testing::WithParamInterface<BadFile> {};

TEST_P(TransferBadFile, IsRefusedNamingItsLineAndNothingIsSent) {
  const std::string path = mFiles.Path("edited.qen");
  Put(path, GetParam().text);
  EXPECT_EQ(SettingTransfer::ImportSetting(path, true, mList), 1);
  EXPECT_TRUE(Inst().Sent().empty()) << Inst().Sent().Join("\n");
  ASSERT_EQ(mList.Size(), 2u) << mList.ToText();
  EXPECT_EQ(mList[0].GetKey(), "GUI_SETTING_TEXT_LINE");
  EXPECT_EQ(mList[0].GetMessage().rfind(Dstring(GetParam().line) + path + " cannot be read: ", 0), 0u) << mList[0].GetMessage();
  EXPECT_EQ(mList[1].GetKey(), "GUI_SETTING_NOT_IMPORTED");
  EXPECT_EQ(mList[1].GetMessage(), "The setting of " + path + " was not imported: the instrument holds what it held before.");
}

INSTANTIATE_TEST_SUITE_P(
    Files, TransferBadFile,
    testing::Values(BadFile{"Binary", "\x7f" "ELF\x02\x01\x01", "Line 1 of "},
                    BadFile{"ASequence", "qen sequence 1\nsequence (3.0,,)\nend\n", "Line 1 of "},
                    BadFile{"AnInjection", "qen setting 1\nvalue :CGR1:PER 1;:TEST:DIE\nend\n", "Line 2 of "},
                    BadFile{"ATypo", "qen setting 1\nvalue :CGR1:PER 2e-09\nvalu :TRIG:MODE SEQ\nend\n", "Line 3 of "},
                    BadFile{"CutShort", "qen setting 1\nvalue :CGR1:PER 2e-09\n", "Line 3 of "}),
    [](const testing::TestParamInfo<BadFile>& info) { return std::string(info.param.name); });

TEST_F(TransferWire, AFileTooLargeIsNotEvenRead) {
  const std::string path = mFiles.Path("huge.qen");
  std::ofstream(path) << std::string(SettingTransfer::kMaxFileBytes + 1, '#');
  EXPECT_EQ(SettingTransfer::ImportSetting(path, false, mList), 1);
  EXPECT_TRUE(Inst().Sent().empty());
  EXPECT_TRUE(mList.HasKey("GUI_SETTING_TEXT_TOO_BIG"));
  EXPECT_TRUE(SettingTransfer::ImportSetting(mFiles.Path("missing.qen"), false, mList) == 1 &&
              mList.HasKey("GUI_IMPORT_READ"));
}

struct BadReply {
  const char* name;
  int status;
  const char* reply;
  const char* key;
};

class TransferBadReply : public TransferWire, public testing::WithParamInterface<BadReply> {};

// The user's file is replaced only by a whole text read from the instrument.
TEST_P(TransferBadReply, LeavesTheUsersFileAsItWas) {
  const std::string path = mFiles.Path("kept.qen");
  Put(path, "the user's own\n");
  Inst().Expect(":_H:MMEM:SETT:DATA?", GetParam().reply, GetParam().status);
  EXPECT_NE(SettingTransfer::Export(Kind::kSetting, path, mList), 0);
  EXPECT_TRUE(mList.HasKey(GetParam().key)) << mList.ToText();
  EXPECT_TRUE(mList.HasKey("GUI_SETTING_NOT_EXPORTED"));
  EXPECT_EQ(Slurp(path), "the user's own\n");
  EXPECT_EQ(mFiles.Count(), 1u);
}

INSTANTIATE_TEST_SUITE_P(
    Replies, TransferBadReply,
    testing::Values(BadReply{"Locked", -19, "", "GUI_SETTING_TRANSFER_LOCKED"},
                    BadReply{"NotABlock", 0, "\"qen setting 1\"", "GUI_SETTING_TEXT_NOT_BLOCK"},
                    BadReply{"TwoBlocks", 0, "#10,#10", "GUI_SETTING_TEXT_NOT_BLOCK"},
                    BadReply{"CutShort", 0, "#216qen setting 1\nva", "GUI_SETTING_TEXT_REPLY"},
                    BadReply{"NoSequence", 0, "#218qen setting 1\nend\n", "GUI_SETTING_TEXT_REPLY"}),
    [](const testing::TestParamInfo<BadReply>& info) { return std::string(info.param.name); });

TEST_F(TransferWire, AnExportIntoAFolderThatIsNotThereSaysSo) {
  Inst().Expect(":_H:MMEM:SETT:DATA?", Block(kText));
  EXPECT_EQ(SettingTransfer::Export(Kind::kSetting, mFiles.Path("no/such/folder.qen"), mList), 1);
  EXPECT_TRUE(mList.HasKey("GUI_EXPORT_FAILED")) << mList.ToText();
  EXPECT_TRUE(mList.HasKey("GUI_SETTING_NOT_EXPORTED"));
}

TEST_F(TransferWire, AnImportTheInstrumentRefusesOrCannotTakeKeepsTheOpenName) {
  const std::string path = mFiles.Path("bench.qen");
  Put(path, kText);
  Inst().Expect(":_H:MMEM:SETT:DATA OFF," + Block(kText), "", -19);
  EXPECT_EQ(SettingTransfer::ImportSetting(path, false, mList), -19);
  EXPECT_TRUE(mList.HasKey("GUI_SETTING_TRANSFER_LOCKED"));
  EXPECT_TRUE(mList.HasKey("GUI_SETTING_NOT_IMPORTED"));
  // The guard asks whether the lock is gone before anything is sent again.
  Inst().Expect("_H:SGEN:GLOB:INIT:CONT?", "OFF");
  Inst().Expect(":_H:MMEM:SETT:DATA OFF," + Block(kText), "", 1);
  Inst().Expect(":_H:SYST:ERR?", "-250,\"Mass storage error; line 2: this instrument has no parameter :CGR1:PER\"");
  Inst().Expect(":_H:SYST:ERR?", "0,\"No error\"");
  mList.Clear();
  EXPECT_EQ(SettingTransfer::ImportSetting(path, false, mList), 1);
  ASSERT_EQ(mList.Size(), 2u) << mList.ToText();
  EXPECT_EQ(mList[0].GetCode(), -250);
  EXPECT_TRUE(Inst().AllConsumed()) << "the open setting stays what it was";
}

namespace {

class TransferSim : public SimClientFixture {
 protected:
  Dstring Data() {
    Dstring reply;
    EXPECT_EQ(Send(":MMEM:SETT:DATA?", &reply), 0);
    return reply.substr(2 + static_cast<std::size_t>(reply[1] - '0'));
  }
  Dstring OpenName() {
    Dstring name;
    EXPECT_EQ(QENSystemProfile::GetValue("OPENSETTING_NAME", name, mList), 0);
    return name;
  }
  TempFiles mFiles;
};

}  // namespace

TEST_F(TransferSim, WhatTheInstrumentRefusesChangesNothingAndNamesTheLine) {
  ASSERT_EQ(Send(":CGR1:MOD1:CONN1:VOLT:AMPL 2"), 0);
  ASSERT_EQ(QENSystemProfile::SetValue("OPENSETTING_NAME", Dstring("bench"), mList), 0);
  const Dstring held = Data();
  std::string text = held;
  text.insert(text.find("\nvalue") + 1, "value :CGR7:PER 1e-09\n");
  const std::string path = mFiles.Path("other rack.qen");
  Put(path, text);
  EXPECT_EQ(SettingTransfer::ImportSetting(path, true, mList), 1);
  ASSERT_EQ(mList.Size(), 2u) << mList.ToText();
  EXPECT_EQ(mList[0].GetMessage(), "Mass storage error; line 2: this instrument has no parameter :CGR7:PER");
  EXPECT_EQ(mList[1].GetKey(), "GUI_SETTING_NOT_IMPORTED");
  EXPECT_EQ(Data(), held);
  EXPECT_EQ(OpenName(), "bench");
}

// A setting saved in the data directory is there, whole and exact, for the next qensim.
TEST(SettingAcrossRestart, ASavedSettingLoadsExactlyInTheNextQensim) {
  TempFiles files;
  const std::string dir = files.Path("data");
  auto data = [](QenTcpInstrument& inst) {
    Dstring reply;
    EXPECT_EQ(inst.Call(":_R:MMEM:SETT:DATA?", reply), 0);
    return reply;
  };
  auto connect = [](SimProcess& sim, QenTcpInstrument& inst) {
    Dstring handle;
    ASSERT_EQ(inst.Connect("127.0.0.1", sim.Port()), 0);
    ASSERT_EQ(inst.Call(":QEN:INST:HAND:CRE? _R,\"PSX\",\"T\"", handle), 0);
  };
  Dstring saved;
  {
    SimProcess sim({"--data-dir", dir});
    QenTcpInstrument inst;
    connect(sim, inst);
    Dstring reply;
    for (const char* write :
         {":_R:CGR1:MOD1:CONN2:VOLT:HIGH 1.511", ":_R:MEAS:MODE BER", ":_R:CGR2:MOD1:CONN1:PULS:DEL 3.3E-11",
          ":_R:CONF:CONN:DEL \":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\"",
          ":_R:SGEN:GLOB:SEQ (3.0,\"go\",(BLOCK,0,96,0,\"\",(),\"walk\",0,0,PAUSE,0,0,PAUSE,0,0,PAUSE,0,0,PAUSE0,0,0,"
          "PAUSE0,0,0,PAUSE,0,0,PAUSE,0,0,PAUSE0,0,0,PAUSE0,0,0))",
          ":_R:MMEM:SETT:SAVE \"bench two\""}) {
      ASSERT_EQ(inst.Call(write, reply), 0) << write;
    }
    saved = data(inst);
  }
  SimProcess sim({"--data-dir", dir});
  QenTcpInstrument inst;
  connect(sim, inst);
  ASSERT_NE(data(inst), saved);
  Dstring reply;
  ASSERT_EQ(inst.Call(":_R:MMEM:SETT:LOAD \"bench two\",ON", reply), 0);
  EXPECT_EQ(data(inst), saved);
  EXPECT_NE(saved.find("value :CGR1:MOD1:CONN2:VOLT:OFFS 0.7555\n"), Dstring::npos) << saved;
}
