// What a setting holds: every writable parameter (coupled levels to the digit, the measurement
// mode, the port delays under both cable-delay choices), the setting profile, the sequence with
// its events and the connections; saved, changed, loaded and compared whole. A load or a
// ":MMEM:SETT:DATA" that is refused names the line and changes nothing.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <string>
#include <unistd.h>

#include "SimFixture.h"

namespace {

// The built-in rack with a central module, so that the sequence has events.
const std::string kCentralConfig = std::string("param :CENT:TYPE string \"K2200A\" readonly\n") + kSimDefaultConfigText;

// A block of the ten data ports of the built-in rack, all playing `segment`.
std::string Block(const char* length, const char* segment) {
  std::string block = std::string("(BLOCK,0,") + length + ",0,\"\",()";
  for (int port = 0; port < 10; ++port) block += std::string(",") + segment + ",0,0";
  return block + ")";
}

const std::string kSequence =
    "(3.0,\"start\",(SEQ," + Block("640", "\"cnt32\"") + ",\"two\",(LOOP1,0,5,\"\"," + Block("64", "PAUSE1") + ")))";
const std::string kEvents = [] {
  std::string events = "(3.0,(\"go\",1,(('a','b','c',X)))";
  for (int i = 1; i < 10; ++i) events += ",(\"\",0,())";
  return events + ")";
}();

SimParamTable CentralRack() {
  SimParamTable table;
  ConditionList list;
  EXPECT_EQ(SimConfigLoader::Load(kCentralConfig, table, list), 0) << list.ToText();
  return table;
}

class SimSettingTest : public testing::Test {
 protected:
  static constexpr int kConn = 1;
  static constexpr int kOther = 2;

  SimSettingTest()
      : mDir((std::filesystem::temp_directory_path() / ("qensim-setting-" + std::to_string(::getpid()))).string()),
        mSim(CentralRack(), mClock, true, mDir) {
    Text(":QEN:INST:HAND:CRE? _H,\"PSX\",\"SIM\"");
    Text(":QEN:INST:HAND:CRE? _B,\"PSX\",\"SIM\"", kOther);
  }
  ~SimSettingTest() override { std::filesystem::remove_all(mDir); }

  std::string Text(const std::string& text, int conn = kConn) {
    SimReply r = mSim.Execute(conn, text);
    EXPECT_EQ(r.status, 0) << text << " " << mSim.Execute(conn, ":_H:SYST:ERR?").text;
    return r.text;
  }
  // The frame status and the error it queued.
  std::pair<int, std::string> Refusal(const std::string& command) {
    const int status = mSim.Execute(kConn, command).status;
    return {status, mSim.Execute(kConn, ":_H:SYST:ERR?").text};
  }
  // The whole setting as the instrument sends it, without its block header.
  std::string Data() {
    const std::string reply = Text(":_H:MMEM:SETT:DATA?");
    EXPECT_EQ(reply.substr(0, 1), "#");
    return reply.substr(2 + static_cast<std::size_t>(reply[1] - '0'));
  }
  static std::string Block(const std::string& text) {
    const std::string digits = std::to_string(text.size());
    return "#" + std::to_string(digits.size()) + digits + text;
  }
  // Every parameter as a client reads it, one "header=value" a line.
  std::string Replies() {
    std::string out;
    std::string list = Text(":L:_H?");
    for (std::size_t at = 0; at < list.size();) {
      const std::size_t end = list.find('"', at + 1);
      const std::string header = list.substr(at + 1, end - at - 1);
      out += header + "=" + Text(header + "?") + "\n";
      at = end + 2;
    }
    return out;
  }
  // Changes every part of a setting away from the start.
  void ChangeEverything() {
    for (const char* write :
         {":_H:CGR1:MOD1:CONN1:VOLT:AMPL 1.511", ":_H:CGR1:MOD1:CONN2:VOLT:HIGH 1.511", ":_H:CGR1:PER 3E-9",
          ":_H:MEAS:MODE BER", ":_H:TRIG:MODE CLOC", ":_H:CGR1:MOD1:CONN3:OUTP ON", ":_H:CGR1:MOD1:CONN3:DIV 7",
          ":_H:CGR2:MOD1:UCAS DMUX", ":_H:MEAS:GATE:TIME 2.5", ":_H:CGR1:MOD1:CONN1:PULS:DEL 1.23E-10",
          ":_H:CGR1:MOD3:CONN2:PULS:DEL 4.5E-11", ":_H:CONF:CSET:PROF:EXPR (2.0,(\"Zoom\",\"(4i)\"))",
          ":_H:CONF:CONN:DEL \":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\"",
          ":_H:CONF:CONN:ADD \":CGR1:MOD2:CONN1\",\":CGR1:MOD3:CONN1\""}) {
      Text(write);
    }
    Text(":_H:SGEN:GLOB:SEQ " + kSequence);
    Text(":_H:SGEN:GLOB:SEQ:EVEN " + kEvents);
  }

  std::string mDir;
  SimManualClock mClock;
  SimCommandProcessor mSim;
};

class SimSettingLoad : public SimSettingTest, public testing::WithParamInterface<bool> {};

}  // namespace

// 1.511 V of amplitude puts the high level at 1.2555 V, off the 1 mV grid: a load that wrote
// the levels again rounded them and brought the amplitude back as 1.512 V.
TEST_P(SimSettingLoad, BringsBackEverythingSavedExactly) {
  const bool cable = GetParam();
  ChangeEverything();
  EXPECT_EQ(Text(":_H:CGR1:MOD1:CONN1:VOLT:HIGH?"), "1.255500000000E+00");
  const std::string saved = Data();
  const std::string savedReplies = Replies();
  const std::string sequence = Text(":_H:SGEN:GLOB:SEQ?");
  const std::string connections = Text(":_H:CONF:CONN?");
  Text(":_H:MMEM:SETT:SAVE \"whole\"");

  Text(":_H:MMEM:SETT:NEW");
  EXPECT_NE(Text(":_H:SGEN:GLOB:SEQ?"), sequence) << "a new setting starts the sequence afresh";
  EXPECT_NE(Text(":_H:CONF:CONN?"), connections) << "and the default wiring";
  Text(":_H:CGR1:MOD1:CONN1:PULS:DEL 7E-11");
  Text(":_H:CGR1:MOD3:CONN2:PULS:DEL 9E-12");
  const std::string delaysBefore = Text(":_H:CGR1:MOD1:CONN1:PULS:DEL?;:_H:CGR1:MOD3:CONN2:PULS:DEL?");
  Text(":_B:DFL?", kOther);

  Text(std::string(":_H:MMEM:SETT:LOAD \"whole\",") + (cable ? "ON" : "OFF"));
  EXPECT_EQ(Text(":_H:CGR1:MOD1:CONN1:VOLT:AMPL?"), "1.511000000000E+00");
  EXPECT_EQ(Text(":_H:CGR1:MOD1:CONN2:VOLT:OFFS?"), "7.555000000000E-01");
  EXPECT_EQ(Text(":_H:SGEN:GLOB:SEQ?"), sequence);
  EXPECT_EQ(Text(":_H:SGEN:GLOB:SEQ:EVEN?"), kEvents);
  EXPECT_EQ(Text(":_H:CONF:CONN?"), connections);
  EXPECT_EQ(Text(":_H:CONF:CSET:PROF:EXPR?"), "(2.0,(\"Zoom\",\"(4i)\"))");
  EXPECT_EQ(Text(":_B:DFL?", kOther), "\"ALL\"");
  const std::string delays = Text(":_H:CGR1:MOD1:CONN1:PULS:DEL?;:_H:CGR1:MOD3:CONN2:PULS:DEL?");
  if (cable) {
    EXPECT_EQ(delays, "1.230000000000E-10;4.500000000000E-11");
    EXPECT_EQ(Data(), saved) << "the whole setting, every value to its last digit";
    EXPECT_EQ(Replies(), savedReplies);
  } else {
    EXPECT_EQ(delays, delaysBefore) << "the delays of the instrument stay";
    Text(":_H:CGR1:MOD1:CONN1:PULS:DEL 1.23E-10");
    Text(":_H:CGR1:MOD3:CONN2:PULS:DEL 4.5E-11");
    EXPECT_EQ(Data(), saved) << "everything else as saved";
  }
}

INSTANTIATE_TEST_SUITE_P(CableDelay, SimSettingLoad, testing::Bool(),
                         [](const testing::TestParamInfo<bool>& info) { return info.param ? "On" : "Off"; });

TEST_F(SimSettingTest, DataTakesTheSettingTextAsALoadWouldAndTellsEveryone) {
  ChangeEverything();
  const std::string saved = Data();
  EXPECT_NE(saved.find("value :CGR1:MOD1:CONN1:VOLT:HIGH 1.2555\n"), std::string::npos) << saved;
  EXPECT_NE(saved.find("connection \":CGR1:MOD2:CONN1\",\":CGR1:MOD3:CONN1\"\n"), std::string::npos);
  EXPECT_EQ(saved.find(":TYPE"), std::string::npos) << "read-only values are not the setting's";
  Text(":_H:MMEM:SETT:NEW");
  Text(":_H:DFL?");
  Text(":_H:MMEM:SETT:DATA ON," + Block(saved));
  EXPECT_EQ(Data(), saved);
  EXPECT_EQ(Text(":_H:DFL?"), "\"ALL\"") << "the writer hears it too: everything changed";
}

TEST_F(SimSettingTest, ASettingOfAnOlderQensimLeavesTheSequenceAndTheConnections) {
  ChangeEverything();
  const std::string sequence = Text(":_H:SGEN:GLOB:SEQ?");
  const std::string connections = Text(":_H:CONF:CONN?");
  std::filesystem::create_directories(mDir + "/settings");
  std::ofstream(mDir + "/settings/old.qset") << "qensim setting 1\nvalue :CGR1:PER 2.0000000000000001e-09\nprofile \nend\n";
  Text(":_H:MMEM:SETT:LOAD \"old\"");
  EXPECT_EQ(Text(":_H:CGR1:FREQ?"), "5.000000000000E+08");
  EXPECT_EQ(Text(":_H:CGR1:MOD1:CONN1:VOLT:AMPL?"), "1.000000000000E+00");
  EXPECT_EQ(Text(":_H:SGEN:GLOB:SEQ?"), sequence);
  EXPECT_EQ(Text(":_H:CONF:CONN?"), connections);
}

struct TextRefusal {
  const char* name;
  const char* from;  // a line of the saved text
  const char* to;    // what it becomes
  int status;
  const char* error;  // the start of the queued error
};

class SimSettingRefusal : public SimSettingTest, public testing::WithParamInterface<TextRefusal> {};

// The line is changed in a saved text; both a load of it and a DATA of it are refused, name the
// line and leave the setting whole.
TEST_P(SimSettingRefusal, NamesTheLineAndChangesNothing) {
  ChangeEverything();
  std::string text = Data();
  const std::size_t at = text.find(GetParam().from);
  ASSERT_NE(at, std::string::npos) << text;
  text.replace(at, std::string(GetParam().from).size(), GetParam().to);
  Text(":_H:MMEM:SETT:NEW");
  const std::string before = Data();
  Text(":_B:DFL?", kOther);

  const auto [status, error] = Refusal(":_H:MMEM:SETT:DATA " + Block(text));
  EXPECT_EQ(status, 1);
  EXPECT_EQ(error.rfind(GetParam().error, 0), 0u) << error;
  std::filesystem::create_directories(mDir + "/settings");
  std::ofstream(mDir + "/settings/edited.qset") << text;
  const auto [loadStatus, loadError] = Refusal(":_H:MMEM:SETT:LOAD \"edited\",ON");
  EXPECT_EQ(loadStatus, 1);
  const std::string code = std::string(GetParam().error).substr(0, 4);
  const std::string fileCode = GetParam().status == -104 ? "-250" : code;
  EXPECT_EQ(loadError.rfind(fileCode, 0), 0u) << loadError;
  EXPECT_NE(loadError.find("edited, line "), std::string::npos) << loadError;
  EXPECT_EQ(Data(), before);
  EXPECT_EQ(Text(":_B:DFL?", kOther), "");
}

INSTANTIATE_TEST_SUITE_P(
    Lines, SimSettingRefusal,
    testing::Values(
        TextRefusal{"UnknownParameter", "value :TRIG:MODE CLOC", "value :TRIG:NOPE CLOC", -250,
                    "-250,\"Mass storage error; line 2: this instrument has no parameter :TRIG:NOPE"},
        TextRefusal{"BeyondItsRange", "value :CGR1:PER 3e-09", "value :CGR1:PER 3", -222,
                    "-222,\"Data out of range; line 10: :CGR1:PER does not take 3"},
        TextRefusal{"NotAWord", "value :TRIG:MODE CLOC", "value :TRIG:MODE SIDEWAYS", -224,
                    "-224,\"Illegal parameter value; line 2: :TRIG:MODE does not take SIDEWAYS"},
        TextRefusal{"LevelsDisagree", "VOLT:HIGH 1.2555", "VOLT:HIGH 1.3", -221,
                    "-221,\"Settings conflict; line 15: the values of :CGR1:MOD1:CONN1:VOLT:AMPL, "
                    ":CGR1:MOD1:CONN1:VOLT:OFFS, :CGR1:MOD1:CONN1:VOLT:HIGH, :CGR1:MOD1:CONN1:VOLT:LOW do not agree"},
        TextRefusal{"ForbiddenConnection", "\":CGR1:MOD2:CONN1\",\":CGR1:MOD3:CONN1\"",
                    "\":CGR2:MOD1:CONN1\",\":CGR1:MOD3:CONN1\"", -221,
                    "-221,\"Settings conflict; line "},
        TextRefusal{"NoSuchPort", "\":CGR1:MOD2:CONN1\",", "\":CGR9:MOD2:CONN1\",", -224,
                    "-224,\"Illegal parameter value; line "},
        TextRefusal{"SequenceOfOtherPorts", "(BLOCK,0,640,0,\"\",(),\"cnt32\",0,0,", "(BLOCK,0,640,0,\"\",(),", -224,
                    "-224,\"Illegal parameter value; line "},
        TextRefusal{"Malformed", "\nprofile", "\nprofil", -104, "-104,\"Data type error; line "}),
    [](const testing::TestParamInfo<TextRefusal>& info) { return std::string(info.param.name); });

TEST_F(SimSettingTest, TheSequenceTravelsWithItsEventsAsOneText) {
  ChangeEverything();
  const std::string reply = Text(":_H:SGEN:GLOB:SEQ:DATA?");
  const std::string text = reply.substr(2 + static_cast<std::size_t>(reply[1] - '0'));
  EXPECT_EQ(text.rfind("qen sequence 1\nsequence (3.0,\"start\",\n  (SEQ,\n    (BLOCK,0,640,", 0), 0u) << text;
  Text(":_H:MMEM:SETT:NEW");
  Text(":_B:DFL?", kOther);
  Text(":_H:SGEN:GLOB:SEQ:DATA " + Block(text));
  EXPECT_EQ(Text(":_H:SGEN:GLOB:SEQ?"), kSequence);
  EXPECT_EQ(Text(":_H:SGEN:GLOB:SEQ:EVEN?"), kEvents);
  EXPECT_EQ(Text(":_B:DFL?", kOther), "\":_B:SGEN:GLOB:SEQ\",\":_B:SGEN:GLOB:SEQ:EVEN\"");

  Text(":_H:MMEM:SETT:NEW");
  const std::string sequence = Text(":_H:SGEN:GLOB:SEQ?");
  std::string bad = text;
  bad.replace(bad.find("LOOP1,0,5,"), 10, "LOOP1,0,2000000,");
  EXPECT_EQ(Refusal(":_H:SGEN:GLOB:SEQ:DATA " + Block(bad)).second.rfind("-222,\"Data out of range; line 2: a loop", 0),
            0u);
  EXPECT_EQ(Refusal(":_H:SGEN:GLOB:SEQ:DATA " + Block("qen setting 1\nend\n")).second,
            "-104,\"Data type error; line 1: this is a setting text, not a sequence\"");
  EXPECT_EQ(Text(":_H:SGEN:GLOB:SEQ?"), sequence);
  EXPECT_EQ(Text(":_B:DFL?", kOther), "\"ALL\"") << "from the NEW alone";
}
