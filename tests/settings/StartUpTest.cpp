#include <gtest/gtest.h>

#include <fstream>

#include "SimClientFixture.h"
#include "common/InstrumentFixture.h"
#include "settings/MemoryRegistryStore.h"
#include "settings/QENSystemProfile.h"
#include "settings/RegistryStore.h"
#include "settings/SettingMRU.h"
#include "settings/SettingStartUp.h"
#include "settings/StartUpConfig.h"
#include "toolkit/HeadlessToolkit.h"

namespace {

void* Root() { return RegistryStore::CurrentUser(); }

StartUpConfig LoadConfig(const char* name, bool cableDelay) {
  StartUpConfig config;
  config.SetStart(StartUpConfig::Start::kLoadSetting);
  config.SetSettingName(name);
  config.SetCableDelay(cableDelay);
  return config;
}

class StartUpSim : public SimClientFixture {
 protected:
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
  ASSERT_EQ(LoadConfig("bench one", GetParam().cableDelay).Write(7, mList), 0);
  ASSERT_EQ(mMru.Read(7, mList), 0);
  mMru.Add("older");
  ASSERT_EQ(mMru.Write(mList), 0);
  mToolkit.SetShiftDown(true);

  EXPECT_EQ(SettingStartUp::Run(7, mToolkit, mMru, mList), 0) << mList.ToText();
  ASSERT_EQ(mList.Size(), 1u);
  EXPECT_EQ(mList[0].GetKey(), "GUI_STARTUP_NO_DIALOG");
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

namespace {

class StartUpWire : public InstrumentFixture {
 protected:
  void SetUp() override {
    InstrumentFixture::SetUp();
    QENRegistryProfile::SetStore(&mRegistry);
  }
  void TearDown() override {
    QENRegistryProfile::SetStore(nullptr);
    InstrumentFixture::TearDown();
  }
  MemoryRegistryStore mRegistry;
  HeadlessToolkit mToolkit;
  SettingMRU mMru;
};

}  // namespace

TEST_F(StartUpWire, LoadIsSentAsConfiguredAndRecorded) {
  ASSERT_EQ(LoadConfig("bench", true).Write(0, mList), 0);
  Inst().Expect(":_H:MMEM:SETT:LOAD \"bench\", ON", "");
  Inst().Expect("_H:CONF:PROF \"OPENSETTING_NAME\",\"bench\"", "");
  Inst().Expect("_H:CONF:PROF \"OPENSETTING_CABLEDELAY\",(1u)", "");
  Inst().Expect("_H:CONF:CSET:PROF:EXPR?", "");
  EXPECT_EQ(SettingStartUp::Run(0, mToolkit, mMru, mList), 0) << mList.ToText();
  EXPECT_TRUE(mList.IsEmpty());
  EXPECT_EQ(mMru.GetNames(), DstringList{"bench"});
}

TEST_F(StartUpWire, ConfigurationThatDoesNotCheckOutStartsANewSetting) {
  const Dstring former = StartUpConfig::FormerKeyOf(3);
  ASSERT_EQ(QENRegistryProfile::SetValue(Root(), former, "Start", Dstring("LOAD"), mList), 0);
  ASSERT_EQ(QENRegistryProfile::SetValue(Root(), former, "SettingName", Dstring("a\"b"), mList), 0);
  ASSERT_EQ(QENRegistryProfile::SetValue(Root(), former, "ShowDialog", 1.5, mList), 0);
  Inst().Expect(":_H:MMEM:SETT:NEW", "");
  Inst().Expect("_H:CONF:CSET:PROF:EXPR?", "");
  EXPECT_NE(SettingStartUp::Run(3, mToolkit, mMru, mList), 0);
  EXPECT_TRUE(mList.HasKey("GUI_REGISTRY_PROFILE_UNEXPEXPECTED_VALUEDATA")) << "read from the former key";
  EXPECT_TRUE(mList.HasKey("GUI_COMMAND_BAD_TEXT"));
  EXPECT_FALSE(mList.HasKey("GUI_STARTUP_NO_DIALOG"));
}

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
