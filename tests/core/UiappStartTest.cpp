#include <gtest/gtest.h>

#include <vector>

#include "common/InstrumentFixture.h"
#include "core/uiapp.h"
#include "settings/MemoryRegistryStore.h"
#include "settings/OpenSettingDs.h"
#include "settings/QENRegistryProfile.h"
#include "settings/SettingStartUp.h"
#include "settings/SettingsStatus.h"
#include "settings/StartUpConfig.h"
#include "toolkit/HeadlessToolkit.h"
#include "toolkit/Toolkit.h"

namespace {

struct Step {
  Dstring cmd;
  Dstring reply;
  int status = 0;
};

// RegistrationFinished against a scripted instrument: what a start sends, to the byte and in
// order, with the start-up configuration in a registry of memory.
class UiappStartTest : public InstrumentFixture {
 protected:
  void SetUp() override {
    Toolkit::Install(&mToolkit);
    QENRegistryProfile::SetStore(&mRegistry);
    ASSERT_EQ(uiapp::Init(mList), 0);
    InstrumentFixture::SetUp();
    uiapp::GetOpenSettingDs()->SetStampSource([] { return Dstring("S1"); });
    uiapp::GetTime().SetClock([this] { return mNow; });
  }
  // uiapp::End ends the call path and the scripted instrument with it.
  void TearDown() override {
    EXPECT_TRUE(Inst().AllConsumed()) << "the script expected more commands";
    uiapp::EndPolling();
    SettingStartUp::SetDialog(nullptr);
    QenGuiInst::SetAppHandle("");
    Inst().SetHandler([](const Dstring&, Dstring&) { return 0; });
    uiapp::End(mList);
    QENRegistryProfile::SetStore(nullptr);
    Toolkit::Install(nullptr);
  }
  void Configure(StartUpConfig::Start start, bool dialog = false) {
    StartUpConfig config;
    config.SetStart(start);
    config.SetSettingName("bench");
    config.SetShowDialog(dialog);
    ASSERT_EQ(config.Write(uiapp::GetConfigParamSet(), mList), 0);
  }
  void Script(const std::vector<Step>& steps) {
    for (const Step& step : steps) Inst().Expect(step.cmd, step.reply, step.status);
  }

  HeadlessToolkit mToolkit;
  MemoryRegistryStore mRegistry;
  double mNow = 0.0;
};

class CancellingDialog : public SettingStartUp::Dialog {
 public:
  bool Ask(StartUpConfig&, const DstringList&, const ConditionList&) override { return false; }
};

const std::vector<Step> kLoadBench = {{":_H:MMEM:SETT:LOAD \"bench\", OFF", ""},
                                      {"_H:CONF:PROF \"OPENSETTING_NAME\",\"bench\"", ""},
                                      {"_H:CONF:PROF \"OPENSETTING_CABLEDELAY\",(0u)", ""},
                                      {"_H:CONF:PROF \"OPENSETTING_STAMP\",\"S1\"", ""},
                                      {"_H:CONF:PROF \"OPENSETTING_MODIFIED\",(0u)", ""},
                                      {"_H:CONF:CSET:PROF:EXPR?", ""}};

}  // namespace

TEST_F(UiappStartTest, AConfiguredLoadIsSentThenTheSettingIsFollowedThenTheLoopLevelsRead) {
  Configure(StartUpConfig::Start::kLoadSetting);
  Script(kLoadBench);
  Script({{":QEN:INST:HAND:CRE? _HW,\"PSX\",\"QEN1\"", "_HW"}, {":_H:SGEN:GLOB:SEQ:LLEV?", "4"}});
  EXPECT_EQ(uiapp::RegistrationFinished(), 0);
  EXPECT_TRUE(mToolkit.Alerts().empty()) << mToolkit.Alerts().front();
  EXPECT_EQ(uiapp::GetOpenSettingDs()->Title(), "bench");
  EXPECT_TRUE(uiapp::GetOpenSettingDs()->IsFollowing());
}

// A host that only looks (a picture, a headless watcher) reads the record and nothing else,
// whatever the configuration says.
TEST_F(UiappStartTest, OnlyLookingNeverLoadsNorStartsASetting) {
  Configure(StartUpConfig::Start::kNewSetting, true);
  Script({{"_H:CONF:PROF:LIST?", "\"OPENSETTING_NAME\""},
          {"_H:CONF:PROF? \"OPENSETTING_NAME\"", "\"bench2\""},
          {":_H:SGEN:GLOB:SEQ:LLEV?", "4"}});
  EXPECT_EQ(uiapp::RegistrationFinished(uiapp::StartUse::kOnlyLook), 0);
  EXPECT_EQ(uiapp::GetOpenSettingDs()->Title(), "bench2");
  EXPECT_FALSE(uiapp::GetOpenSettingDs()->IsFollowing());
  EXPECT_TRUE(mToolkit.Questions().empty());
}

TEST_F(UiappStartTest, CancellingTheStartUpDialogEndsTheStartBeforeAnythingIsChanged) {
  Configure(StartUpConfig::Start::kNewSetting, true);
  CancellingDialog dialog;
  SettingStartUp::SetDialog(&dialog);
  Script({{":_H:MMEM:SETT:CAT?", "\"bench\""}});
  EXPECT_EQ(uiapp::RegistrationFinished(), SettingsStatus::kStartCancelled);
  EXPECT_FALSE(uiapp::GetOpenSettingDs()->IsFollowing());
}

// Each poll asks the watch handle after the application's own change set; this client's own
// write marks the setting, once, in the record too.
TEST_F(UiappStartTest, ThePollFollowsTheSettingThroughTheWatchHandle) {
  Configure(StartUpConfig::Start::kLoadSetting);
  Script(kLoadBench);
  Script({{":QEN:INST:HAND:CRE? _HW,\"PSX\",\"QEN1\"", "_HW"}, {":_H:SGEN:GLOB:SEQ:LLEV?", "4"}});
  ASSERT_EQ(uiapp::RegistrationFinished(), 0);
  Script({{"_H:DFL?", ""},
          {"_HW:DFL?", "\":_HW:SGEN:GLOB:INIT:CONT\""},
          {"_H:DFL?", ""},
          {"_HW:DFL?", "\":_HW:CGR1:PER\",\":_HW:SGEN:GLOB:INIT:CONT\""},
          {"_H:CONF:PROF \"OPENSETTING_MODIFIED\",(1u)", ""},
          {"_H:DFL?", ""},
          {"_HW:DFL?", "\":_HW:CGR1:MOD1:CONN1:VOLT:AMPL\""}});
  uiapp::AsyncAlarmProc(nullptr);
  EXPECT_EQ(uiapp::GetOpenSettingDs()->Title(), "bench");
  uiapp::AsyncAlarmProc(nullptr);
  EXPECT_EQ(uiapp::GetOpenSettingDs()->Title(), "bench *");
  uiapp::AsyncAlarmProc(nullptr);
  EXPECT_EQ(uiapp::GetOpenSettingDs()->Title(), "bench *");
}
