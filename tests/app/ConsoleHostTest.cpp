#include <gtest/gtest.h>

#include <algorithm>
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
                    OptionsCase{{"--console", "host"}, 0, false, "host", 7130},
                    OptionsCase{{"--console", "[::1]"}, 0, false, "::1", 7130},
                    OptionsCase{{"--console", "[::1]:7131"}, 0, false, "::1", 7131},
                    OptionsCase{{"--console", "[::1]7131"}, 1, false, "", 0},
                    OptionsCase{{"--console", "[::1"}, 1, false, "", 0},
                    OptionsCase{{"--console", "[]:7130"}, 1, false, "", 0},
                    OptionsCase{{"--console", "host:"}, 1, false, "", 0},
                    OptionsCase{{"--console", ":7130"}, 1, false, "", 0},
                    OptionsCase{{"--console", "host:65535"}, 0, false, "host", 65535},
                    OptionsCase{{"--console", "host:0"}, 1, false, "", 0},
                    OptionsCase{{"--console", "host:70000"}, 1, false, "", 0},
                    OptionsCase{{"--console"}, 0, true, "127.0.0.1", 7130}, OptionsCase{{"--bogus"}, 1, false, "", 0},
                    OptionsCase{{"--param-set", "x"}, 1, false, "", 0}));

struct WatchCase {
  const char* arg;
  const char* stored;  // empty: refused
};

class WatchOption : public testing::TestWithParam<WatchCase> {};

TEST_P(WatchOption, HeaderWithOrWithoutItsColon) {
  HostOptions options;
  ConditionList list;
  const int status = HostOptions::Parse({"--headless", "--watch", GetParam().arg}, options, list);
  if (*GetParam().stored == '\0') {
    EXPECT_EQ(status, 1);
    EXPECT_NE(list.ToText().find(GetParam().arg), std::string::npos) << list.ToText();
    return;
  }
  ASSERT_EQ(status, 0) << list.ToText();
  EXPECT_EQ(options.watch, std::vector<std::string>{GetParam().stored});
}

INSTANTIATE_TEST_SUITE_P(Table, WatchOption,
                         testing::Values(WatchCase{":TRIG:MODE", ":TRIG:MODE"}, WatchCase{"TRIG:MODE", ":TRIG:MODE"},
                                         WatchCase{"X", ":X"}, WatchCase{":", ""}, WatchCase{"::TRIG", ""},
                                         WatchCase{"TRIG:MODE;:X 1", ""}, WatchCase{"TRIG MODE", ""}));

struct ResultCase {
  int status;
  const char* reply;
  std::vector<std::pair<long, const char*>> conditions;
  const char* line;
};

class ConsoleResult : public testing::TestWithParam<ResultCase> {};

TEST_P(ConsoleResult, OneLineInTheErrorQueuesForm) {
  ConditionList list;
  for (const auto& [code, text] : GetParam().conditions) list.Add(code, text);
  EXPECT_EQ(ConsoleHost::ResultLine(GetParam().status, GetParam().reply, list), GetParam().line);
}

INSTANTIATE_TEST_SUITE_P(
    Table, ConsoleResult,
    testing::Values(ResultCase{0, "", {}, "OK"}, ResultCase{0, "SEQ;CLOC", {}, "SEQ;CLOC"},
                    ResultCase{1, "", {{-224, "Illegal parameter value"}}, "ERROR -224,\"Illegal parameter value\""},
                    ResultCase{1, "SEQ", {{-113, "Undefined header"}}, "ERROR -113,\"Undefined header\""},
                    ResultCase{0, "", {{-222, "Data \"x\"\nout"}}, "ERROR -222,\"Data \"\"x\"\" out\""},
                    ResultCase{1, "", {{-222, "A"}, {-109, "B"}}, "ERROR -222,\"A\";-109,\"B\""},
                    ResultCase{-5, "", {}, "ERROR -5,\"Command failed\""}));

namespace {

// Runs the built qengui with the given stdin text and returns what it printed (on standard
// output only, or with its error stream) and its code.
std::string RunHost(const std::string& args, const std::string& input, int& code, bool withErrors = true) {
  std::string name = testing::UnitTest::GetInstance()->current_test_info()->name();
  std::replace(name.begin(), name.end(), '/', '-');
  const std::string inputFile = testing::TempDir() + "qengui-console-" + std::to_string(::getpid()) + "-" + name + ".txt";
  std::ofstream(inputFile) << input;
  std::string cmd = std::string(QENGUI_PATH) + " " + args + " < " + inputFile + (withErrors ? " 2>&1" : " 2>/dev/null");
  FILE* pipe = popen(cmd.c_str(), "r");
  std::string out;
  char buf[4096];
  while (std::size_t n = std::fread(buf, 1, sizeof buf, pipe)) out.append(buf, n);
  int status = pclose(pipe);
  code = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  return out;
}

}  // namespace

struct ScriptCase {
  const char* input;
  const char* output;
  int code;
};

class ConsoleScript : public testing::TestWithParam<ScriptCase> {};

// Input from a file: no greeting, no prompt, one line per line; any failure makes the code 1.
TEST_P(ConsoleScript, OneOutputLinePerInputLine) {
  SimProcess sim;
  ASSERT_NE(sim.Port(), 0);
  int code = -1;
  const std::string out = RunHost("--log-dir " + testing::TempDir() + " --console 127.0.0.1:" + std::to_string(sim.Port()),
                                  GetParam().input, code, false);
  EXPECT_EQ(out, GetParam().output);
  EXPECT_EQ(code, GetParam().code) << out;
}

INSTANTIATE_TEST_SUITE_P(
    Table, ConsoleScript,
    testing::Values(ScriptCase{"::TRIG:MODE?\n::TRIG:MODE BOGUS\nhandle\n\n::TRIG:MODE CLOC;::TRIG:MODE?\nquit\n::TRIG:MODE?\n",
                               "SEQ\nERROR -224,\"Illegal parameter value\"\n_QEN1X\nOK\nCLOC\n", 1},
                    ScriptCase{"::CGR1:PER 2E-9\n::CGR1:FREQ?", "OK\n5.000000000000E+08\n", 0},
                    ScriptCase{"::CGR1:PER 5\n::SYST:ERR?\n", "ERROR -222,\"Data out of range\"\n0,\"No error\"\n", 1},
                    ScriptCase{"", "", 0}));

TEST(ConsoleHostProcess, SimulateStartsAPrivateServer) {
  int code = -1;
  std::string out = RunHost("--log-dir " + testing::TempDir() + " --console --simulate", "::SGEN:GLOB:INIT:CONT?\n", code);
  EXPECT_EQ(code, 0) << out;
  EXPECT_NE(out.find("Started qensim on 127.0.0.1:"), std::string::npos) << out;
  EXPECT_NE(out.find("\nOFF\n"), std::string::npos) << out;
}

TEST(ConsoleHostProcess, ServerDeathEndsTheHostWithCodeOne) {
  SimProcess sim;
  ASSERT_NE(sim.Port(), 0);
  int code = -1;
  const std::string logDir = testing::TempDir() + "qengui-death-" + std::to_string(::getpid());
  std::string out = RunHost("--log-dir " + logDir + " --console 127.0.0.1:" + std::to_string(sim.Port()),
                            ":TEST:DIE\n::TRIG:MODE?\n", code);
  EXPECT_EQ(code, 1);
  EXPECT_NE(out.find("because the firmware server has died."), std::string::npos) << out;
  std::ifstream log(logDir + "/qengui.log");
  std::stringstream text;
  text << log.rdbuf();
  EXPECT_EQ(text.str(), "Server has terminated. Shutdown.\n");
}

struct CommandLineCase {
  const char* program;  // "qengui" or "qensim"
  const char* args;
  int code;
  const char* printed;  // a text the output must hold
};

class ProgramCommandLine : public testing::TestWithParam<CommandLineCase> {};

// Both programs tell their version, and name what is wrong with a command line.
TEST_P(ProgramCommandLine, AnswersAndNamesTheWrongOption) {
  const auto& c = GetParam();
  const std::string program = std::string(c.program) == "qengui" ? QENGUI_PATH : QENSIM_PATH;
  // Without a display of any kind, whatever the test's own environment holds.
  const std::string cmd = "env -u QT_QPA_PLATFORM -u DISPLAY -u WAYLAND_DISPLAY " + program + " " + c.args + " 2>&1";
  FILE* pipe = popen(cmd.c_str(), "r");
  ASSERT_NE(pipe, nullptr);
  std::string out;
  char buf[4096];
  while (std::size_t n = std::fread(buf, 1, sizeof buf, pipe)) out.append(buf, n);
  const int status = pclose(pipe);
  EXPECT_EQ(WIFEXITED(status) ? WEXITSTATUS(status) : -1, c.code) << out;
  EXPECT_NE(out.find(c.printed), std::string::npos) << out;
}

INSTANTIATE_TEST_SUITE_P(
    Table, ProgramCommandLine,
    testing::Values(CommandLineCase{"qengui", "--version", 0, "qengui 0."},
                    CommandLineCase{"qensim", "--version", 0, "qensim 0."},
                    CommandLineCase{"qengui", "--bogus", 2, "Unknown or incomplete option: --bogus"},
                    CommandLineCase{"qensim", "--bogus", 2, "qensim: unknown option --bogus\n"},
                    CommandLineCase{"qensim", "--port", 2, "qensim: option --port needs a port number 0..65535\n"},
                    CommandLineCase{"qensim", "--vxi11-port 65536", 2, "option --vxi11-port needs a port number"},
                    CommandLineCase{"qensim", "--portmap-port 0", 2, "--portmap-port needs --vxi11-port"},
                    CommandLineCase{"qengui", "--simulate", 2, "qengui: there is no display to show the window on"},
                    CommandLineCase{"qengui", "127.0.0.1:1", 2, "use --console, --headless or --screenshot FILE"}));

// Every option qensim reads is in its help, with what it does; --open names every window.
TEST(ProgramHelp, NamesEveryOptionAndWindow) {
  auto help = [](const std::string& program) {
    FILE* pipe = popen((program + " --help").c_str(), "r");
    std::string out;
    char buf[4096];
    while (std::size_t n = std::fread(buf, 1, sizeof buf, pipe)) out.append(buf, n);
    pclose(pipe);
    return out;
  };
  const std::string sim = help(QENSIM_PATH);
  for (const char* option : {"--port N ", "--scpi-port N ", "--vxi11-port N ", "--portmap-port N ", "--bind ADDR ",
                             "--config FILE ", "--data-dir DIR ", "--test-control ", "--quiet ", "--version ", "--help "}) {
    EXPECT_NE(sim.find(std::string("\n  ") + option), std::string::npos) << option << "\n" << sim;
  }
  const std::string gui = help(QENGUI_PATH);
  EXPECT_EQ(gui, HostOptions::Usage());
  for (const char* window : {"paramedit.ParamEd", "seqedit.SeqEdWin", "ber.BerWin", "wavewin.WaveWin", "selftest.Result"}) {
    EXPECT_NE(gui.find(window), std::string::npos) << window;
  }
}
