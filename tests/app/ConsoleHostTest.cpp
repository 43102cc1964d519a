#include <gtest/gtest.h>

#include <cstdio>
#include <fstream>
#include <sstream>
#include <sys/wait.h>
#include <unistd.h>

#include "ConsoleHost.h"
#include "instrument/CommandText.h"
#include "HostOptions.h"
#include "common/SimProcess.h"

struct ExpandCase {
  const char* line;
  const char* sent;
};

class ConsoleExpand : public testing::TestWithParam<ExpandCase> {};

TEST_P(ConsoleExpand, DoubleColonStandsForTheHandle) {
  EXPECT_EQ(CommandText::ExpandHandle(GetParam().line, "_QEN1X"), GetParam().sent);
}

INSTANTIATE_TEST_SUITE_P(
    Table, ConsoleExpand,
    testing::Values(ExpandCase{"::TRIG:MODE?", ":_QEN1X:TRIG:MODE?"},
                    ExpandCase{"::CGR1:PER 1E-9;::CGR1:FREQ?", ":_QEN1X:CGR1:PER 1E-9;:_QEN1X:CGR1:FREQ?"},
                    ExpandCase{":_OTHER:DFL?", ":_OTHER:DFL?"},
                    ExpandCase{"::A \"x;::B\"", ":_QEN1X:A \"x;::B\""},
                    ExpandCase{":VC::X 1", ":VC::X 1"}));

struct OptionsCase {
  std::vector<std::string> args;
  int status;
  bool simulate;
  const char* host;
  unsigned short port;
};

class HostOptionsParse : public testing::TestWithParam<OptionsCase> {};

TEST_P(HostOptionsParse, Table) {
  HostOptions options;
  ConditionList list;
  const auto& c = GetParam();
  ASSERT_EQ(HostOptions::Parse(c.args, options, list), c.status);
  EXPECT_EQ(list.IsEmpty(), c.status == 0);
  if (c.status != 0) return;
  EXPECT_EQ(options.simulate, c.simulate);
  EXPECT_EQ(options.host, c.host);
  EXPECT_EQ(options.port, c.port);
}

INSTANTIATE_TEST_SUITE_P(
    Table, HostOptionsParse,
    testing::Values(OptionsCase{{}, 0, false, "127.0.0.1", 7130}, OptionsCase{{"lab-pg:7131"}, 0, false, "lab-pg", 7131},
                    OptionsCase{{"--screenshot", "a.png"}, 0, true, "127.0.0.1", 7130},
                    OptionsCase{{"--screenshot", "a.png", "--size", "10x10"}, 1, false, "", 0},
                    OptionsCase{{"a:1", "b:2"}, 1, false, "", 0},
                    OptionsCase{{"--console", "lab-pg:7131"}, 0, false, "lab-pg", 7131},
                    OptionsCase{{"--console", "::1:7130"}, 0, false, "::1", 7130},
                    OptionsCase{{"--console", "host"}, 1, false, "", 0},
                    OptionsCase{{"--console", "host:0"}, 1, false, "", 0},
                    OptionsCase{{"--console", "host:70000"}, 1, false, "", 0},
                    OptionsCase{{"--console"}, 0, true, "127.0.0.1", 7130}, OptionsCase{{"--bogus"}, 1, false, "", 0},
                    OptionsCase{{"--param-set", "x"}, 1, false, "", 0}));

namespace {

// Runs the built qengui with the given stdin text and returns what it printed and its code.
std::string RunHost(const std::string& args, const std::string& input, int& code) {
  std::string inputFile = testing::TempDir() + "qengui-console-" + std::to_string(::getpid()) + "-" +
                          testing::UnitTest::GetInstance()->current_test_info()->name() + ".txt";
  std::ofstream(inputFile) << input;
  std::string cmd = std::string(QENGUI_PATH) + " " + args + " < " + inputFile + " 2>&1";
  FILE* pipe = popen(cmd.c_str(), "r");
  std::string out;
  char buf[4096];
  while (std::size_t n = std::fread(buf, 1, sizeof buf, pipe)) out.append(buf, n);
  int status = pclose(pipe);
  code = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  return out;
}

}  // namespace

TEST(ConsoleHostProcess, SendsLinesAndPrintsRepliesAndQueuedErrors) {
  SimProcess sim;
  ASSERT_NE(sim.Port(), 0);
  int code = -1;
  std::string out = RunHost("--log-dir " + testing::TempDir() + " --console 127.0.0.1:" + std::to_string(sim.Port()),
                            "::TRIG:MODE?\n::TRIG:MODE BOGUS\nhandle\nquit\n", code);
  EXPECT_EQ(code, 0) << out;
  EXPECT_NE(out.find("application handle _QEN1X"), std::string::npos) << out;
  EXPECT_NE(out.find("qen> SEQ\n"), std::string::npos) << out;
  EXPECT_NE(out.find("status 1\nerror -224: Illegal parameter value"), std::string::npos) << out;
  EXPECT_NE(out.find("qen> _QEN1X\n"), std::string::npos) << out;
}

TEST(ConsoleHostProcess, SimulateStartsAPrivateServer) {
  int code = -1;
  std::string out = RunHost("--log-dir " + testing::TempDir() + " --console --simulate", "::SGEN:GLOB:INIT:CONT?\n", code);
  EXPECT_EQ(code, 0) << out;
  EXPECT_NE(out.find("Started qensim on 127.0.0.1:"), std::string::npos) << out;
  EXPECT_NE(out.find("qen> OFF\n"), std::string::npos) << out;
}

TEST(ConsoleHostProcess, ServerDeathEndsTheHostWithCodeZero) {
  SimProcess sim;
  ASSERT_NE(sim.Port(), 0);
  int code = -1;
  const std::string logDir = testing::TempDir() + "qengui-death-" + std::to_string(::getpid());
  std::string out = RunHost("--log-dir " + logDir + " --console 127.0.0.1:" + std::to_string(sim.Port()),
                            ":TEST:DIE\n::TRIG:MODE?\n", code);
  EXPECT_EQ(code, 0);
  EXPECT_NE(out.find("because the firmware server has died."), std::string::npos) << out;
  std::ifstream log(logDir + "/qengui.log");
  std::stringstream text;
  text << log.rdbuf();
  EXPECT_EQ(text.str(), "Server has terminated. Shutdown.\n");
}
