#include <gtest/gtest.h>

#include <csignal>
#include <fstream>
#include <sstream>
#include <unistd.h>

#include "common/HostProcess.h"
#include "common/SimProcess.h"
#include "instrument/QenTcpInstrument.h"
#include "settings/FileRegistryStore.h"
#include "settings/QENRegistryProfile.h"
#include "settings/StartUpConfig.h"

namespace {

// A headless host and a second client on the same qensim.
class HeadlessHostTest : public testing::Test {
 protected:
  void SetUp() override {
    ASSERT_NE(mSim.Port(), 0);
    mLogDir = testing::TempDir() + "qengui-headless-" + std::to_string(::getpid()) + "-" +
              testing::UnitTest::GetInstance()->current_test_info()->name();
    ASSERT_EQ(mOther.Connect("127.0.0.1", mSim.Port()), 0);
    ASSERT_EQ(mOther.Call(":QEN:INST:HAND:CRE? _OTHER,\"PSX\",\"OTHER\"", mOtherHandle), 0);
  }
  std::vector<std::string> Args(std::vector<std::string> more) {
    std::vector<std::string> args = {"--log-dir", mLogDir, "--headless", "127.0.0.1:" + std::to_string(mSim.Port())};
    args.insert(args.end(), more.begin(), more.end());
    return args;
  }
  int Other(const Dstring& cmd) {
    Dstring reply;
    return mOther.Call(cmd, reply);
  }

  SimProcess mSim;
  QenTcpInstrument mOther;
  Dstring mOtherHandle;
  std::string mLogDir;
};

constexpr int kPatience = 15000;

}  // namespace

TEST_F(HeadlessHostTest, ChangeByAnotherClientShowsUp) {
  HostProcess host(Args({"--watch", ":TRIG:MODE", "--watch", ":CGR1:FREQ"}));
  ASSERT_TRUE(host.WaitForOutput(":TRIG:MODE = SEQ\n", kPatience)) << host.Output();
  ASSERT_TRUE(host.WaitForOutput("run: OFF\n", kPatience)) << host.Output();
  ASSERT_EQ(Other(":" + mOtherHandle + ":TRIG:MODE CLOC"), 0);
  EXPECT_TRUE(host.WaitForOutput(":TRIG:MODE = CLOC\n", kPatience)) << host.Output();
  // A coupled change made elsewhere reaches the watched partner too.
  ASSERT_EQ(Other(":" + mOtherHandle + ":CGR1:PER 2E-9"), 0);
  EXPECT_TRUE(host.WaitForOutput(":CGR1:FREQ = 5.000000000000E+08\n", kPatience)) << host.Output();
  ASSERT_EQ(Other(":" + mOtherHandle + ":SGEN:GLOB:INIT:CONT ON"), 0);
  EXPECT_TRUE(host.WaitForOutput("run: ON\n", kPatience)) << host.Output();
  EXPECT_TRUE(host.WaitForOutput("system: RUNN\n", kPatience)) << host.Output();
  host.Signal(SIGTERM);
  EXPECT_EQ(host.WaitForExit(kPatience), 0) << host.Output();
}

TEST_F(HeadlessHostTest, LockByAnotherClientLocksAndReleasesTheInterface) {
  HostProcess host(Args({}));
  ASSERT_TRUE(host.WaitForOutput("locked by another client: no\n", kPatience)) << host.Output();
  ASSERT_EQ(Other(":TEST:LOCK ON"), 0);
  EXPECT_TRUE(host.WaitForOutput("locked by another client: yes\n", kPatience)) << host.Output();
  ASSERT_EQ(Other(":TEST:LOCK OFF"), 0);
  EXPECT_TRUE(host.WaitForOutput("locked by another client: no\n", kPatience)) << host.Output();
  EXPECT_EQ(host.Output().find("ERROR"), std::string::npos) << host.Output();
  host.Signal(SIGINT);
  EXPECT_EQ(host.WaitForExit(kPatience), 0);
}

TEST_F(HeadlessHostTest, ServerDeathEndsTheHostWithCodeZeroAndALogLine) {
  HostProcess host(Args({}));
  ASSERT_TRUE(host.WaitForOutput("run: OFF\n", kPatience)) << host.Output();
  Other(":TEST:DIE");
  EXPECT_EQ(host.WaitForExit(kPatience), 0) << host.Output();
  EXPECT_NE(host.Output().find("because the firmware server has died."), std::string::npos) << host.Output();
  std::ifstream log(mLogDir + "/qengui.log");
  std::stringstream text;
  text << log.rdbuf();
  EXPECT_NE(text.str().find("Server has terminated. Shutdown.\n"), std::string::npos);
}

TEST_F(HeadlessHostTest, TimeLimitEndsTheHostInOrder) {
  HostProcess host(Args({"--seconds", "1.5"}));
  EXPECT_EQ(host.WaitForExit(kPatience), 0) << host.Output();
  // Once it has gone, its handle is free again.
  Dstring handle;
  ASSERT_EQ(mOther.Call(":QEN:INST:HAND:CRE? _QEN1X,\"PSX\",\"QEN1\"", handle), 0);
  EXPECT_EQ(handle, "_QEN1X");
}

TEST_F(HeadlessHostTest, CtrlCEndsTheHostAtOnceWhileTheInstrumentIsSlow) {
  HostProcess host(Args({}));
  ASSERT_TRUE(host.WaitForOutput("run: OFF\n", kPatience)) << host.Output();
  // The host's next poll is answered in a minute.
  ASSERT_EQ(Other(":TEST:DELAY 60000,1,ALL"), 0);
  // Within one poll period the host is waiting for that reply.
  EXPECT_FALSE(host.WaitForOutput("not printed", 1500));
  host.Signal(SIGINT);
  EXPECT_EQ(host.WaitForExit(2000), 0) << host.Output();
}

// Hosts that only look never load nor start a setting, whatever the start-up configuration of
// the registry they share with the window host asks for.
TEST_F(HeadlessHostTest, LookingHostsLeaveTheInstrumentsSettingAlone) {
  FileRegistryStore registry("/tmp/qengui-test-config-" + std::to_string(::getpid()) + "/qengui/registry");
  QENRegistryProfile::SetStore(&registry);
  StartUpConfig config;
  config.SetStart(StartUpConfig::Start::kNewSetting);
  ConditionList list;
  ASSERT_EQ(config.Write(0, list), 0) << list.ToText();
  QENRegistryProfile::SetStore(nullptr);
  ASSERT_EQ(Other(":" + mOtherHandle + ":CGR1:PER 4E-9"), 0);
  Dstring reply;
  ASSERT_EQ(mOther.Call(":" + mOtherHandle + ":DFL?", reply), 0);

  HostProcess headless(Args({"--seconds", "1"}));
  EXPECT_EQ(headless.WaitForExit(kPatience), 0) << headless.Output();
  const std::string picture = mLogDir + ".png";
  HostProcess shot({"--log-dir", mLogDir, "127.0.0.1:" + std::to_string(mSim.Port()), "--screenshot", picture});
  EXPECT_EQ(shot.WaitForExit(60000), 0) << shot.Output();
  std::remove(picture.c_str());

  ASSERT_EQ(mOther.Call(":" + mOtherHandle + ":CGR1:PER?", reply), 0);
  EXPECT_EQ(reply, "4.000000000000E-09");
  ASSERT_EQ(mOther.Call(":" + mOtherHandle + ":DFL?", reply), 0);
  EXPECT_EQ(reply.find("ALL"), Dstring::npos) << reply;
}
