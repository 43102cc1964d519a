#include <gtest/gtest.h>

#include <fstream>
#include <sstream>

#include "SimClientFixture.h"
#include "instrument/QenStatus.h"
#include "settings/OpenSettingDs.h"
#include "settings/QENSystemProfile.h"
#include "settings/SettingMRU.h"
#include "settings/SettingsStatus.h"

namespace {

// This client follows the setting through its watch handle; a second connection plays another
// client (a script, or another interface that records what it does).
class OpenSettingTest : public SimClientFixture {
 protected:
  void SetUp() override {
    SimClientFixture::SetUp();
    ASSERT_EQ(mOther.Connect("127.0.0.1", sSim->Port()), 0);
    ASSERT_EQ(mOther.Call(":QEN:INST:HAND:CRE? _O,\"PSX\",\"O\"", mOtherHandle), 0);
    ASSERT_EQ(mSetting.Follow("T", mList), 0) << mList.ToText();
    // One qensim serves the suite: each test starts from the same period.
    ASSERT_EQ(Send(":CGR1:PER 1E-9"), 0);
    ASSERT_EQ(mSetting.Save("bench1", mMru, mList), 0) << mList.ToText();
  }
  void TearDown() override {
    Dstring ignored;
    mOther.Call(":TEST:LOCK OFF", ignored);
    mSetting.EndFollow(mList);
    SimClientFixture::TearDown();
  }
  // A command of the other client under its handle; test control goes as it is.
  void Other(const Dstring& rest) {
    Dstring reply;
    const Dstring cmd = rest.StartsWith(":TEST:") ? rest : Dstring(":" + mOtherHandle + rest);
    ASSERT_EQ(mOther.Call(cmd, reply), 0) << rest;
  }
  void Poll() { EXPECT_EQ(mSetting.UpdateFromFW(mList), 0) << mList.ToText(); }
  Dstring FileText(const char* name) {
    std::ifstream in(sDataDir + "/settings/" + name + ".qset");
    std::stringstream text;
    text << in.rdbuf();
    return text.str();
  }

  QenTcpInstrument mOther;
  Dstring mOtherHandle;
  SettingMRU mMru;
  OpenSettingDs mSetting;
};

struct ChangeCase {
  const char* what;
  bool byOther;
  const char* command;
  bool marks;
};

void PrintTo(const ChangeCase& c, std::ostream* os) { *os << c.what; }

class ChangesOfTheSetting : public OpenSettingTest, public testing::WithParamInterface<ChangeCase> {};

}  // namespace

// Whoever changes it, a change of what a setting holds marks it; the instrument's states, its
// outputs and the display of a value do not.
TEST_P(ChangesOfTheSetting, MarkItModifiedForEveryClientAndTheNextStart) {
  const ChangeCase& c = GetParam();
  Poll();
  ASSERT_EQ(mSetting.Title(), "bench1");
  if (c.byOther) {
    Other(c.command);
  } else {
    ASSERT_EQ(Send(c.command), 0);
  }
  Poll();
  EXPECT_EQ(mSetting.Title(), c.marks ? "bench1 *" : "bench1");
  OpenSettingDs restarted;
  ASSERT_EQ(restarted.Read(mList), 0);
  EXPECT_EQ(restarted.Title(), mSetting.Title()) << "the record on the instrument says the same";
  Send(":SGEN:GLOB:INIT:CONT OFF");
  Send(":SGEN:GLOB:CONN OFF");
}

INSTANTIATE_TEST_SUITE_P(
    Table, ChangesOfTheSetting,
    testing::Values(ChangeCase{"a parameter by this client", false, ":CGR1:PER 2.5E-9", true},
                    ChangeCase{"a parameter by another", true, ":CGR1:MOD1:CONN1:VOLT:AMPL 0.5", true},
                    ChangeCase{"the setting profile", false, ":CONF:CSET:PROF:EXPR (2.0,(\"Zoom\",\"(3i)\"))", true},
                    ChangeCase{"the instrument itself", true, ":TEST:SET :CGR1:PER,3E-9", true},
                    ChangeCase{"running", false, ":SGEN:GLOB:INIT:CONT ON", false},
                    ChangeCase{"the outputs by another", true, ":SGEN:GLOB:CONN ON", false},
                    ChangeCase{"the system profile by another", true, ":CONF:PROF \"ELSE\",(1i)", false}));

TEST_F(OpenSettingTest, ASaveOrLoadByAnotherInterfaceIsFollowedAndAScriptsLoadIsAChange) {
  Other(":CGR1:PER 2E-9");
  Poll();
  ASSERT_EQ(mSetting.Title(), "bench1 *");
  // Another interface saves and records it: the instrument now holds what is saved.
  Other(":MMEM:SETT:SAVE \"bench2\"");
  Other(":CONF:PROF \"OPENSETTING_NAME\",\"bench2\"");
  Other(":CONF:PROF \"OPENSETTING_STAMP\",\"other-1\"");
  Other(":CONF:PROF \"OPENSETTING_MODIFIED\",(0u)");
  Poll();
  EXPECT_EQ(mSetting.Title(), "bench2");
  // A script loads without a record: nothing says the instrument holds a saved setting.
  Other(":MMEM:SETT:LOAD \"bench1\"");
  Poll();
  EXPECT_EQ(mSetting.Title(), "bench2 *");
  // Another interface loads and records it.
  Other(":MMEM:SETT:LOAD \"bench1\"");
  Other(":CONF:PROF \"OPENSETTING_NAME\",\"bench1\"");
  Other(":CONF:PROF \"OPENSETTING_STAMP\",\"other-2\"");
  Other(":CONF:PROF \"OPENSETTING_MODIFIED\",(0u)");
  Poll();
  EXPECT_EQ(mSetting.Title(), "bench1");
}

TEST_F(OpenSettingTest, ASaveAsAsksBeforeReplacingAndANoSavesNothing) {
  ASSERT_EQ(mSetting.Save("bench2", mMru, mList), 0);
  ASSERT_EQ(mSetting.Load("bench1", false, mMru, mList), 0);
  ASSERT_EQ(Send(":CGR1:PER 2E-9"), 0);
  const Dstring saved = FileText("bench2");
  DstringList asked;
  auto no = [&](const Dstring& name) { return asked.push_back(name), false; };
  EXPECT_EQ(mSetting.Save("bench2", mMru, mList, no), SettingsStatus::kDeclined);
  EXPECT_TRUE(mList.IsEmpty()) << mList.ToText();
  EXPECT_EQ(asked, DstringList{"bench2"});
  EXPECT_EQ(FileText("bench2"), saved);
  EXPECT_EQ(mSetting.Save("fresh", mMru, mList, no), 0) << "a new name asks nothing";
  EXPECT_EQ(asked.size(), 1u);
  EXPECT_EQ(mSetting.Title(), "fresh");
  EXPECT_EQ(mMru.GetNames().front(), "fresh");
}

struct LockedCase {
  const char* what;
  std::function<int(OpenSettingDs&, SettingMRU&, ConditionList&)> run;
  const char* said;
};

void PrintTo(const LockedCase& c, std::ostream* os) { *os << c.what; }

class UnderTheLock : public OpenSettingTest, public testing::WithParamInterface<LockedCase> {};

// Another client takes the instrument before the operation reaches it: the instrument, the
// saved settings and the title stay as they were, and the words say why.
TEST_P(UnderTheLock, ChangesNothingAndSaysSo) {
  ASSERT_EQ(Send(":CGR1:PER 2E-9"), 0);
  Poll();
  ASSERT_EQ(mSetting.Title(), "bench1 *");
  const Dstring saved = FileText("bench1");
  Dstring ignored;
  ASSERT_EQ(mOther.Call(":TEST:LOCK ON", ignored), 0);
  ConditionList list;
  EXPECT_EQ(GetParam().run(mSetting, mMru, list), QenStatus::kLocked);
  ASSERT_GE(list.Size(), 2u);
  EXPECT_NE(list[0].GetMessage().find(GetParam().said), Dstring::npos) << list.ToText();
  EXPECT_TRUE(list.HasKey("GUI_SETTING_LOCKED")) << list.ToText();
  EXPECT_EQ(mSetting.Title(), "bench1 *");
  ASSERT_EQ(mOther.Call(":TEST:LOCK OFF", ignored), 0);
  EXPECT_EQ(FileText("bench1"), saved);
  Dstring period;
  ASSERT_EQ(Send(":CGR1:PER?", &period), 0);
  EXPECT_EQ(period, "2.000000000000E-09");
  Poll();
  EXPECT_EQ(mSetting.Title(), "bench1 *");
}

INSTANTIATE_TEST_SUITE_P(
    Table, UnderTheLock,
    testing::Values(
        LockedCase{"save", [](OpenSettingDs& s, SettingMRU& m, ConditionList& l) { return s.Save("bench1", m, l); },
                   "was not saved as \"bench1\""},
        LockedCase{"load", [](OpenSettingDs& s, SettingMRU& m, ConditionList& l) { return s.Load("bench1", false, m, l); },
                   "\"bench1\" was not loaded"},
        LockedCase{"new", [](OpenSettingDs& s, SettingMRU&, ConditionList& l) { return s.New(l); },
                   "No new setting was started"}));
