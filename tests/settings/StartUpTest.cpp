#include <gtest/gtest.h>

#include <deque>
#include <fstream>
#include <optional>

#include "SimClientFixture.h"
#include "common/InstrumentFixture.h"
#include "settings/MemoryRegistryStore.h"
#include "settings/OpenSettingDs.h"
#include "settings/QENSystemProfile.h"
#include "settings/RegistryStore.h"
#include "settings/SettingMRU.h"
#include "settings/SettingStartUp.h"
#include "settings/SettingsStatus.h"
#include "settings/StartUpConfig.h"
#include "toolkit/HeadlessToolkit.h"
#include "toolkit/Toolkit.h"

namespace {

using Start = StartUpConfig::Start;

void* Root() { return RegistryStore::CurrentUser(); }

StartUpConfig Config(Start start, const char* name = "bench", bool cableDelay = false, bool dialog = false) {
  StartUpConfig config;
  config.SetStart(start);
  config.SetSettingName(name);
  config.SetCableDelay(cableDelay);
  config.SetShowDialog(dialog);
  return config;
}

// A start-up dialog that answers from a script (a choice, or nothing to cancel) and keeps
// what it was shown.
class ScriptedDialog : public SettingStartUp::Dialog {
 public:
  struct Shown {
    DstringList names;
    Dstring problems;
  };
  bool Ask(StartUpConfig& config, const DstringList& names, const ConditionList& problems) override {
    shown.push_back({names, problems.ToText()});
    if (answers.empty() || !answers.front()) return false;
    config = *answers.front();
    answers.pop_front();
    return true;
  }
  std::deque<std::optional<StartUpConfig>> answers;
  std::vector<Shown> shown;
};

// One command of a start and the instrument's answer.
struct Step {
  Dstring cmd;
  Dstring reply;
  int status = 0;
};

class StartUpWire : public InstrumentFixture {
 protected:
  void SetUp() override {
    InstrumentFixture::SetUp();
    QENRegistryProfile::SetStore(&mRegistry);
    Toolkit::Install(&mToolkit);
    mSetting.SetStampSource([] { return Dstring("S1"); });
  }
  void TearDown() override {
    SettingStartUp::SetDialog(nullptr);
    Toolkit::Install(nullptr);
    QENRegistryProfile::SetStore(nullptr);
    InstrumentFixture::TearDown();
  }
  void Script(const std::vector<Step>& steps) {
    for (const Step& step : steps) Inst().Expect(step.cmd, step.reply, step.status);
  }
  Dstring Alerts() const {
    Dstring all;
    for (const Dstring& alert : mToolkit.Alerts()) all += alert + "\n";
    return all;
  }
  int Run() { return SettingStartUp::Run(0, mToolkit, mMru, mSetting); }

  MemoryRegistryStore mRegistry;
  HeadlessToolkit mToolkit;
  SettingMRU mMru;
  OpenSettingDs mSetting;
};

const Step kReadProfile{"_H:CONF:CSET:PROF:EXPR?", ""};

struct StartCase {
  const char* what;
  std::optional<StartUpConfig> config;
  std::vector<Step> wire;
  const char* title;
  std::vector<const char*> said;
};

void PrintTo(const StartCase& c, std::ostream* os) { *os << c.what; }

class ConfiguredStarts : public StartUpWire, public testing::WithParamInterface<StartCase> {};

}  // namespace

// Connecting changes the instrument only when the configuration asks for it; every start ends
// knowing what the instrument holds.
TEST_P(ConfiguredStarts, SendExactlyTheStartAndRecordIt) {
  const StartCase& c = GetParam();
  if (c.config) {
    ASSERT_EQ(c.config->Write(0, mList), 0);
  }
  Script(c.wire);
  EXPECT_EQ(Run(), 0);
  EXPECT_EQ(mSetting.Title(), c.title);
  const Dstring alerts = Alerts();
  for (const char* text : c.said) EXPECT_NE(alerts.find(text), Dstring::npos) << text << " in\n" << alerts;
  if (c.said.empty()) {
    EXPECT_EQ(alerts, "");
  }
}

INSTANTIATE_TEST_SUITE_P(
    Table, ConfiguredStarts,
    testing::Values(
        StartCase{"nothing configured keeps what the instrument holds",
                  std::nullopt,
                  {{"_H:CONF:PROF:LIST?", "\"OPENSETTING_NAME\",\"OPENSETTING_MODIFIED\""},
                   {"_H:CONF:PROF? \"OPENSETTING_NAME\"", "\"bench2\""},
                   {"_H:CONF:PROF? \"OPENSETTING_MODIFIED\"", "(1u)"},
                   kReadProfile},
                  "bench2 *",
                  {}},
        StartCase{"keep on a fresh instrument",
                  Config(Start::kKeepSetting),
                  {{"_H:CONF:PROF:LIST?", ""}, kReadProfile},
                  "UNTITLED",
                  {}},
        StartCase{"a new setting",
                  Config(Start::kNewSetting),
                  {{":_H:MMEM:SETT:NEW", ""},
                   {"_H:CONF:PROF \"OPENSETTING_NAME\",\"\"", ""},
                   {"_H:CONF:PROF \"OPENSETTING_STAMP\",\"S1\"", ""},
                   {"_H:CONF:PROF \"OPENSETTING_MODIFIED\",(0u)", ""},
                   kReadProfile},
                  "UNTITLED",
                  {}},
        StartCase{"a load with its cable delays",
                  Config(Start::kLoadSetting, "bench", true),
                  {{":_H:MMEM:SETT:LOAD \"bench\", ON", ""},
                   {"_H:CONF:PROF \"OPENSETTING_NAME\",\"bench\"", ""},
                   {"_H:CONF:PROF \"OPENSETTING_CABLEDELAY\",(1u)", ""},
                   {"_H:CONF:PROF \"OPENSETTING_STAMP\",\"S1\"", ""},
                   {"_H:CONF:PROF \"OPENSETTING_MODIFIED\",(0u)", ""},
                   kReadProfile},
                  "bench",
                  {}},
        StartCase{"a load the instrument refuses keeps what it holds",
                  Config(Start::kLoadSetting, "gone"),
                  {{":_H:MMEM:SETT:LOAD \"gone\", OFF", "", 1},
                   {":_H:SYST:ERR?", "-256,\"File name not found\""},
                   {":_H:SYST:ERR?", "0,\"No error\""},
                   {"_H:CONF:PROF:LIST?", "\"OPENSETTING_NAME\""},
                   {"_H:CONF:PROF? \"OPENSETTING_NAME\"", "\"bench2\""},
                   kReadProfile},
                  "bench2",
                  {"The setting \"gone\" was not loaded", "File name not found"}},
        StartCase{"a load under another client's lock",
                  Config(Start::kLoadSetting, "bench"),
                  {{":_H:MMEM:SETT:LOAD \"bench\", OFF", "", -19},
                   {"_H:CONF:PROF:LIST?", "", -19},
                   {"_H:CONF:CSET:PROF:EXPR?", "", -19}},
                  "UNTITLED",
                  {"The setting \"bench\" was not loaded", "Another client holds the instrument."}},
        StartCase{"a name that would break the command keeps what the instrument holds",
                  Config(Start::kLoadSetting, "a\"b"),
                  {{"_H:CONF:PROF:LIST?", ""}, kReadProfile},
                  "UNTITLED",
                  {"cannot be sent", "the instrument keeps the setting it holds"}}));

TEST_F(StartUpWire, TheDialogIsShownAgainUntilTheChoiceChecksOutAndTheChoiceIsKept) {
  ASSERT_EQ(Config(Start::kKeepSetting, "UNTITLED", false, true).Write(0, mList), 0);
  ScriptedDialog dialog;
  dialog.answers = {Config(Start::kLoadSetting, "nosuch", true, true), Config(Start::kLoadSetting, "", true, true),
                    Config(Start::kLoadSetting, "bench", true, false)};
  SettingStartUp::SetDialog(&dialog);
  Script({{":_H:MMEM:SETT:CAT?", "\"bench\",\"other\""},
          {":_H:MMEM:SETT:LOAD \"bench\", ON", ""},
          {"_H:CONF:PROF \"OPENSETTING_NAME\",\"bench\"", ""},
          {"_H:CONF:PROF \"OPENSETTING_CABLEDELAY\",(1u)", ""},
          {"_H:CONF:PROF \"OPENSETTING_STAMP\",\"S1\"", ""},
          {"_H:CONF:PROF \"OPENSETTING_MODIFIED\",(0u)", ""},
          kReadProfile});
  EXPECT_EQ(Run(), 0);
  ASSERT_EQ(dialog.shown.size(), 3u);
  EXPECT_EQ(dialog.shown[0].names, (DstringList{"bench", "other"}));
  EXPECT_EQ(dialog.shown[0].problems, "");
  EXPECT_NE(dialog.shown[1].problems.find("no setting named \"nosuch\""), Dstring::npos) << dialog.shown[1].problems;
  EXPECT_NE(dialog.shown[2].problems.find("needs a name"), Dstring::npos) << dialog.shown[2].problems;
  StartUpConfig kept;
  ASSERT_EQ(kept.Read(0, mList), 0);
  EXPECT_EQ(kept.GetStart(), Start::kLoadSetting);
  EXPECT_EQ(kept.GetSettingName(), "bench");
  EXPECT_TRUE(kept.GetCableDelay());
  EXPECT_FALSE(kept.GetShowDialog());
  EXPECT_EQ(mMru.GetNames(), DstringList{"bench"});
  EXPECT_EQ(Alerts(), "");
}

TEST_F(StartUpWire, ShiftShowsTheDialogAndCancelEndsTheStartWithNothingChanged) {
  ScriptedDialog dialog;
  dialog.answers = {std::nullopt};
  SettingStartUp::SetDialog(&dialog);
  mToolkit.SetShiftDown(true);
  Script({{":_H:MMEM:SETT:CAT?", "\"bench\""}});
  EXPECT_EQ(Run(), SettingsStatus::kStartCancelled);
  EXPECT_EQ(dialog.shown.size(), 1u);
  int exists = 1;
  EXPECT_EQ(QENRegistryProfile::KeyExists(Root(), StartUpConfig::KeyOf(0), exists, mList), 0);
  EXPECT_EQ(exists, 0) << "a cancelled dialog keeps no choice";
}

TEST_F(StartUpWire, ACatalogueUnderTheLockIsSaidInTheDialogAndNamesAreNotChecked) {
  ScriptedDialog dialog;
  dialog.answers = {Config(Start::kLoadSetting, "typed")};
  SettingStartUp::SetDialog(&dialog);
  mToolkit.SetShiftDown(true);
  Script({{":_H:MMEM:SETT:CAT?", "", -19},
          {"_H:SGEN:GLOB:INIT:CONT?", ""},
          {":_H:MMEM:SETT:LOAD \"typed\", OFF", ""},
          {"_H:CONF:PROF \"OPENSETTING_NAME\",\"typed\"", ""},
          {"_H:CONF:PROF \"OPENSETTING_CABLEDELAY\",(0u)", ""},
          {"_H:CONF:PROF \"OPENSETTING_STAMP\",\"S1\"", ""},
          {"_H:CONF:PROF \"OPENSETTING_MODIFIED\",(0u)", ""},
          kReadProfile});
  EXPECT_EQ(Run(), 0);
  ASSERT_EQ(dialog.shown.size(), 1u);
  EXPECT_NE(dialog.shown[0].problems.find("Another client holds the instrument."), Dstring::npos);
  EXPECT_EQ(mSetting.Title(), "typed");
}

TEST_F(StartUpWire, WithoutADialogTheConfiguredStartIsMadeAndThatIsSaid) {
  ASSERT_EQ(Config(Start::kNewSetting, "x", false, true).Write(0, mList), 0);
  Script({{":_H:MMEM:SETT:NEW", ""},
          {"_H:CONF:PROF \"OPENSETTING_NAME\",\"\"", ""},
          {"_H:CONF:PROF \"OPENSETTING_STAMP\",\"S1\"", ""},
          {"_H:CONF:PROF \"OPENSETTING_MODIFIED\",(0u)", ""},
          kReadProfile});
  EXPECT_EQ(Run(), 0);
  EXPECT_NE(Alerts().find("start-up dialog cannot be shown here"), Dstring::npos) << Alerts();
}

TEST_F(StartUpWire, AStartWordOfAFormerReleaseIsSaidAndKeeps) {
  const Dstring former = StartUpConfig::FormerKeyOf(0);
  ASSERT_EQ(QENRegistryProfile::SetValue(Root(), former, "Start", Dstring("RESET"), mList), 0);
  ASSERT_EQ(QENRegistryProfile::SetValue(Root(), former, "ShowDialog", 1.5, mList), 0);
  Script({{"_H:CONF:PROF:LIST?", ""}, kReadProfile});
  EXPECT_EQ(Run(), 0);
  EXPECT_NE(Alerts().find("only KEEP, NEW and LOAD are known"), Dstring::npos) << Alerts();
  EXPECT_NE(Alerts().find("not of the expected type"), Dstring::npos) << "read from the former key";
}

// The save happened but the lock came before it could be noted: the title names what the
// instrument holds, the words say what is missing, and the next poll writes the record.
TEST_F(StartUpWire, ARecordThatCannotBeWrittenIsSaidAndWrittenAtTheNextPoll) {
  Script({{":QEN:INST:HAND:CRE? _HW,\"PSX\",\"T\"", "_HW"},
          {":_H:MMEM:SETT:SAVE \"bench\"", ""},
          {"_H:CONF:PROF \"OPENSETTING_NAME\",\"bench\"", "", -19},
          {"_HW:DFL?", ""},
          {"_H:CONF:PROF \"OPENSETTING_NAME\",\"bench\"", ""},
          {"_H:CONF:PROF \"OPENSETTING_STAMP\",\"S1\"", ""},
          {"_H:CONF:PROF \"OPENSETTING_MODIFIED\",(0u)", ""},
          {"_HW:DFL?", ""}});
  ASSERT_EQ(mSetting.Follow("T", mList), 0);
  EXPECT_EQ(mSetting.Save("bench", mMru, mList), -19);
  EXPECT_TRUE(mList.HasKey("GUI_SETTING_NOT_RECORDED")) << mList.ToText();
  EXPECT_TRUE(mList.HasKey("GUI_SETTING_LOCKED")) << mList.ToText();
  EXPECT_EQ(mSetting.Title(), "bench");
  EXPECT_EQ(mMru.GetNames(), DstringList{"bench"});
  mList.Clear();
  EXPECT_EQ(mSetting.UpdateFromFW(mList), 0) << mList.ToText();
  EXPECT_EQ(mSetting.Title(), "bench");
}

namespace {

class StartUpSim : public SimClientFixture {
 protected:
  void SetUp() override {
    SimClientFixture::SetUp();
    Toolkit::Install(&mToolkit);
  }
  void TearDown() override {
    Toolkit::Install(nullptr);
    SimClientFixture::TearDown();
  }
  // Saves a setting with this period, delay and profile value, then starts a new one.
  void SaveSetting(const char* name, const char* period, const char* delay) {
    ASSERT_EQ(Send(Dstring(":CGR1:PER ") + period), 0);
    ASSERT_EQ(Send(Dstring(":CGR1:MOD1:CONN1:PULS:DEL ") + delay), 0);
    ASSERT_EQ(QENSettingProfile::SetValue("Zoom", 4L, mList), 0);
    ASSERT_EQ(QENSettingProfile::Write(mList), 0);
    ASSERT_EQ(Send(Dstring(":MMEM:SETT:SAVE \"") + name + "\""), 0);
    ASSERT_EQ(Send(":MMEM:SETT:NEW"), 0);
  }
  Dstring Query(const char* header) {
    Dstring reply;
    EXPECT_EQ(Send(header, &reply), 0) << header;
    return reply;
  }
  HeadlessToolkit mToolkit;
  SettingMRU mMru;
  OpenSettingDs mSetting;
};

struct CableCase {
  bool cableDelay;
  const char* delay;
};

class StartUpLoads : public StartUpSim, public testing::WithParamInterface<CableCase> {};

}  // namespace

TEST_P(StartUpLoads, ConfiguredSettingIsLoadedAndRecorded) {
  SaveSetting("bench one", "2E-9", "3E-10");
  ASSERT_EQ(Send(":CGR1:MOD1:CONN1:PULS:DEL 1E-10"), 0);
  ASSERT_EQ(Config(Start::kLoadSetting, "bench one", GetParam().cableDelay).Write(7, mList), 0);
  ASSERT_EQ(mMru.Read(7, mList), 0);
  mMru.Add("older");
  ASSERT_EQ(mMru.Write(mList), 0);

  EXPECT_EQ(SettingStartUp::Run(7, mToolkit, mMru, mSetting), 0);
  EXPECT_TRUE(mToolkit.Alerts().empty()) << mToolkit.Alerts().front();
  EXPECT_EQ(Query(":CGR1:PER?"), "2.000000000000E-09");
  EXPECT_EQ(Query(":CGR1:MOD1:CONN1:PULS:DEL?"), GetParam().delay);
  Dstring name;
  unsigned long cable = 9;
  EXPECT_EQ(QENSystemProfile::GetValue("OPENSETTING_NAME", name, mList), 0);
  EXPECT_EQ(QENSystemProfile::GetValue("OPENSETTING_CABLEDELAY", cable, mList), 0);
  EXPECT_EQ(name, "bench one");
  EXPECT_EQ(cable, GetParam().cableDelay ? 1UL : 0UL);
  long zoom = 0;
  EXPECT_EQ(QENSettingProfile::GetValue("Zoom", zoom, mList), 0) << "the loaded setting's profile is read";
  EXPECT_EQ(zoom, 4);
  SettingMRU stored;
  ASSERT_EQ(stored.Read(7, mList), 0);
  EXPECT_EQ(stored.GetNames(), (DstringList{"bench one", "older"}));
}

INSTANTIATE_TEST_SUITE_P(CableDelay, StartUpLoads,
                         testing::Values(CableCase{true, "3.000000000000E-10"}, CableCase{false, "1.000000000000E-10"}));

TEST_F(StartUpSim, AStartThatKeepsLeavesEveryValueAndTellsNoClientOfAChange) {
  ASSERT_EQ(Send(":CGR1:PER 4E-9"), 0);
  QenTcpInstrument other;
  Dstring handle, reply;
  ASSERT_EQ(other.Connect("127.0.0.1", sSim->Port()), 0);
  ASSERT_EQ(other.Call(":QEN:INST:HAND:CRE? _B,\"PSX\",\"T\"", handle), 0);
  ASSERT_EQ(other.Call(":" + handle + ":DFL?", reply), 0);
  EXPECT_EQ(SettingStartUp::Run(8, mToolkit, mMru, mSetting), 0);
  EXPECT_EQ(Query(":CGR1:PER?"), "4.000000000000E-09");
  ASSERT_EQ(other.Call(":" + handle + ":DFL?", reply), 0);
  EXPECT_EQ(reply, "");
}

TEST_F(StartUpSim, LoadingTellsEveryClientThatEverythingChanged) {
  SaveSetting("shared", "4E-9", "0");
  QenTcpInstrument other;
  Dstring handle, reply;
  ASSERT_EQ(other.Connect("127.0.0.1", sSim->Port()), 0);
  ASSERT_EQ(other.Call(":QEN:INST:HAND:CRE? _B,\"PSX\",\"T\"", handle), 0);
  ASSERT_EQ(other.Call(":" + handle + ":DFL?", reply), 0);
  ASSERT_EQ(Send(":CONF:CSET:PROF:EXPR (2.0)"), 0);
  ASSERT_EQ(other.Call(":" + handle + ":DFL?", reply), 0);
  EXPECT_EQ(reply, "\":" + handle + ":CONF:CSET:PROF:EXPR\"");
  ASSERT_EQ(Send(":MMEM:SETT:LOAD \"shared\",OFF"), 0);
  ASSERT_EQ(other.Call(":" + handle + ":DFL?", reply), 0);
  EXPECT_EQ(reply, "\"ALL\"");
  EXPECT_EQ(Query(":DFL?"), "\"ALL\"");
}

struct SimRefusal {
  const char* command;
  long error;
};

class SimSettingRefusals : public StartUpSim, public testing::WithParamInterface<SimRefusal> {
 protected:
  void SetUp() override {
    StartUpSim::SetUp();
    std::filesystem::create_directories(sDataDir + "/settings");
    std::ofstream(sDataDir + "/settings/cut.qset") << "qensim setting 1\nvalue :CGR1:PER 2E-9\nprofile \n";
  }
};

TEST_P(SimSettingRefusals, BadRequestsQueueTheirErrorAndChangeNothing) {
  ASSERT_EQ(Send(":CGR1:PER 5E-9"), 0);
  Dstring reply;
  EXPECT_EQ(QenGuiInst::Call(":" + QenGuiInst::GetAppHandle() + GetParam().command, reply, mList), 1);
  ASSERT_EQ(mList.Size(), 1u);
  EXPECT_EQ(mList[0].GetCode(), GetParam().error) << mList.ToText();
  EXPECT_EQ(Query(":CGR1:PER?"), "5.000000000000E-09");
}

INSTANTIATE_TEST_SUITE_P(Commands, SimSettingRefusals,
                         testing::Values(SimRefusal{":MMEM:SETT:LOAD \"nowhere\"", -256},
                                         SimRefusal{":MMEM:SETT:LOAD \"../etc\"", -257},
                                         SimRefusal{":MMEM:SETT:LOAD \"cut\"", -250},
                                         SimRefusal{":MMEM:SETT:LOAD \"x\",SIDEWAYS", -224},
                                         SimRefusal{":MMEM:SETT:SAVE", -109},
                                         SimRefusal{":CONF:PROF? \"never written\"", -224},
                                         SimRefusal{":CONF:PROF NAME,(1i)", -104},
                                         SimRefusal{":CONF:PROF \"NAME\",", -109},
                                         SimRefusal{":CONF:CSET:PROF:EXPR (2.0,(\"A\"", -104}));

TEST(SettingMRUOrder, MostRecentFirstEachOnceAndNoMoreThanItsLength) {
  const std::pair<std::vector<const char*>, DstringList> cases[] = {
      {{"a", "b", "c"}, {"c", "b", "a"}},
      {{"a", "b", "a"}, {"a", "b"}},
      {{"a", "", "A"}, {"A", "a"}},
      {{"1", "2", "3", "4", "5", "6", "7", "8", "9", "2"}, {"2", "9", "8", "7", "6", "5", "4", "3"}}};
  for (const auto& [added, expected] : cases) {
    SettingMRU mru;
    for (const char* name : added) mru.Add(name);
    EXPECT_EQ(mru.GetNames(), expected);
  }
}
