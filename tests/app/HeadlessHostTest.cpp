#include <gtest/gtest.h>

#include <csignal>
#include <fstream>
#include <regex>
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

// Every line of the output begins with the UTC time to the millisecond.
bool EveryLineStamped(const std::string& output) {
  static const std::regex kStamped(R"(\d{4}-\d\d-\d\dT\d\d:\d\d:\d\d\.\d{3}Z \S.*)");
  std::istringstream lines(output);
  std::string line;
  int count = 0;
  while (std::getline(lines, line)) {
    if (!std::regex_match(line, kStamped)) return false;
    ++count;
  }
  return count > 0;
}

TEST_F(HeadlessHostTest, ChangeByAnotherClientShowsUp) {
  HostProcess host(Args({"--watch", "TRIG:MODE", "--watch", ":CGR1:FREQ"}));
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
  EXPECT_TRUE(EveryLineStamped(host.Output())) << host.Output();
}

TEST_F(HeadlessHostTest, UnknownWatchHeaderEndsWithCodeTwoNamingIt) {
  HostProcess host(Args({"--watch", ":TRIG:MODE", "--watch", "CGR1:BOGUS"}));
  EXPECT_EQ(host.WaitForExit(kPatience), 2) << host.Output();
  EXPECT_NE(host.Output().find("--watch :CGR1:BOGUS: the instrument cannot read it (-113: Undefined header)"),
            std::string::npos)
      << host.Output();
  EXPECT_EQ(host.Output().find("run:"), std::string::npos) << host.Output();
}

// While another client holds the instrument the counts cannot be read: the host says so
// instead of printing zeros, and prints the counts again once the instrument is free.
TEST_F(HeadlessHostTest, LockByAnotherClientLocksAndReleasesTheInterface) {
  HostProcess host(Args({}));
  ASSERT_TRUE(host.WaitForOutput("locked by another client: no\n", kPatience)) << host.Output();
  ASSERT_TRUE(host.WaitForOutput("ber :CGR1:MOD3:CONN1:BER compared=", kPatience)) << host.Output();
  ASSERT_EQ(Other(":TEST:LOCK ON"), 0);
  EXPECT_TRUE(host.WaitForOutput("locked by another client: yes\n", kPatience)) << host.Output();
  EXPECT_TRUE(host.WaitForOutput(" ber: not counted while another client holds the instrument\n", kPatience))
      << host.Output();
  const std::size_t locked = host.Output().size();
  ASSERT_EQ(Other(":TEST:LOCK OFF"), 0);
  EXPECT_TRUE(host.WaitForOutput("locked by another client: no\n", kPatience, locked)) << host.Output();
  EXPECT_TRUE(host.WaitForOutput("ber :CGR1:MOD3:CONN1:BER compared=", kPatience, locked)) << host.Output();
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
// the registry they share with the window host asks for: the setting and the sequence the
// instrument holds are as before after each of them ran.
TEST_F(HeadlessHostTest, LookingHostsLeaveTheInstrumentsSettingAlone) {
  FileRegistryStore registry("/tmp/qengui-test-config-" + std::to_string(::getpid()) + "/qengui/registry");
  QENRegistryProfile::SetStore(&registry);
  StartUpConfig config;
  config.SetStart(StartUpConfig::Start::kNewSetting);
  ConditionList list;
  ASSERT_EQ(config.Write(0, list), 0) << list.ToText();
  QENRegistryProfile::SetStore(nullptr);
  const std::string h = ":" + mOtherHandle;
  ASSERT_EQ(Other(h + ":CGR1:PER 4E-9"), 0);
  std::string ports;
  for (int port = 0; port < 10; ++port) ports += ",PAUSE1,0,0";
  ASSERT_EQ(Other(h + ":SGEN:GLOB:SEQ (3.0,\"kept\",(LOOP1,0,3,\"\",(BLOCK,0,64,0,\"\",()" + ports + ")))"), 0);
  Dstring setting, sequence, reply;
  ASSERT_EQ(mOther.Call(h + ":MMEM:SETT:DATA?", setting), 0);
  ASSERT_EQ(mOther.Call(h + ":SGEN:GLOB:SEQ:DATA?", sequence), 0);
  ASSERT_NE(sequence.find("kept"), Dstring::npos) << sequence;
  ASSERT_EQ(mOther.Call(h + ":DFL?", reply), 0);

  const std::string picture = mLogDir + ".png";
  const std::vector<std::vector<std::string>> hosts = {
      Args({"--seconds", "1"}),
      {"--log-dir", mLogDir, "--console", "127.0.0.1:" + std::to_string(mSim.Port())},
      {"--log-dir", mLogDir, "127.0.0.1:" + std::to_string(mSim.Port()), "--screenshot", picture}};
  for (const auto& args : hosts) {
    HostProcess host(args, "::TRIG:MODE?\nquit\n");
    EXPECT_EQ(host.WaitForExit(60000), 0) << host.Output();
    ASSERT_EQ(mOther.Call(h + ":MMEM:SETT:DATA?", reply), 0);
    EXPECT_EQ(reply, setting) << args[2];
    ASSERT_EQ(mOther.Call(h + ":SGEN:GLOB:SEQ:DATA?", reply), 0);
    EXPECT_EQ(reply, sequence) << args[2];
    ASSERT_EQ(mOther.Call(h + ":DFL?", reply), 0);
    EXPECT_EQ(reply.find("ALL"), Dstring::npos) << args[2] << ": " << reply;
  }
  std::remove(picture.c_str());
}
