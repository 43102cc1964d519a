// The rack's front-end information and its connection table: the replies to the byte, every
// refusal with its reason and nothing changed, the other clients' dirty flags, and what an
// analyser receives and counts when nothing drives it.
#include <gtest/gtest.h>

#include <string>

#include "SimFixture.h"

namespace {

constexpr const char* kDefaultTable =
    "(\":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\"),(\":CGR1:MOD1:CONN2\",\":CGR1:MOD3:CONN2\"),"
    "(\":CGR2:MOD1:CONN1\",\":CGR2:MOD2:CONN1\"),(\":CGR2:MOD1:CONN2\",\":CGR2:MOD2:CONN2\")";

class SimCablingTest : public SimFixture {
 protected:
  static constexpr int kOther = 2;
  SimCablingTest() { EXPECT_EQ(Handle("_B", kOther), "_B"); }

  std::string Table() { return Text(":_H:CONF:CONN?"); }
  // The frame status and the error it queued.
  std::pair<int, std::string> Refusal(const std::string& command) {
    const int status = Reply(command).status;
    return {status, Text(":_H:SYST:ERR?")};
  }
  static std::string Add(const char* from, const char* to) {
    return std::string(":_H:CONF:CONN:ADD \"") + from + "\",\"" + to + "\"";
  }
  static std::string Del(const char* from, const char* to) {
    return std::string(":_H:CONF:CONN:DEL \"") + from + "\",\"" + to + "\"";
  }
};

TEST_F(SimCablingTest, FrontendOfTheBuiltInRack) {
  EXPECT_EQ(
      Text(":_H:CONF:FRON?"),
      "(1,(\":CGR1:MOD1\",\"K2268A\",GEN,1,(\":CGR1:MOD1:CONN1\",\"PDAT\",8),(\":CGR1:MOD1:CONN2\",\"PDAT\","
      "8),"
      "(\":CGR1:MOD1:CONN3\",\"PCLK\",1)),"
      "(\":CGR1:MOD2\",\"K2269B\",GEN,2,(\":CGR1:MOD2:CONN1\",\"PDAT\",8),(\":CGR1:MOD2:CONN2\",\"PDAT\",8)),"
      "(\":CGR1:MOD3\",\"K2270A\",ANA,3,(\":CGR1:MOD3:CONN1\",\"PDAT\",8),(\":CGR1:MOD3:CONN2\",\"PDAT\",8)))"
      ","
      "(2,(\":CGR2:MOD1\",\"K2268B\",GEN,4,(\":CGR2:MOD1:CONN1\",\"PDAT\",8),(\":CGR2:MOD1:CONN2\",\"PDAT\","
      "8),"
      "(\":CGR2:MOD1:CONN3\",\"PCLK\",1)),"
      "(\":CGR2:MOD2\",\"K2270A\",ANA,5,(\":CGR2:MOD2:CONN1\",\"PDAT\",8),(\":CGR2:MOD2:CONN2\",\"PDAT\",8))"
      ")");
  EXPECT_EQ(Refusal(":_H:CONF:FRON 1"), std::make_pair(1, std::string("-200,\"Execution error\"")));
}

TEST_F(SimCablingTest, StartsWithTheDefaultWiringAndFollowsChanges) {
  EXPECT_EQ(Table(), kDefaultTable);
  Text(Del(":CGR1:MOD1:CONN1", ":cgr1:mod3:conn1"));
  EXPECT_EQ(Text(":_B:DFL?", kOther), "\":_B:CONF:CONN\"");
  EXPECT_EQ(Text(":_H:DFL?"), "");
  Text(Add(":CGR1:MOD2:CONN1", ":CGR1:MOD3:CONN1"));
  EXPECT_EQ(Table(),
            "(\":CGR1:MOD2:CONN1\",\":CGR1:MOD3:CONN1\"),(\":CGR1:MOD1:CONN2\",\":CGR1:MOD3:CONN2\"),"
            "(\":CGR2:MOD1:CONN1\",\":CGR2:MOD2:CONN1\"),(\":CGR2:MOD1:CONN2\",\":CGR2:MOD2:CONN2\")");
  EXPECT_EQ(Text(":_B:DFL?", kOther), "\":_B:CONF:CONN\"");
}

TEST_F(SimCablingTest, RefusesWhatARackForbidsAndKeepsTheTable) {
  Text(Del(":CGR1:MOD1:CONN2", ":CGR1:MOD3:CONN2"));
  const std::string before = Table();
  Text(":_B:DFL?", kOther);
  struct Case {
    std::string command;
    const char* error;
  };
  const Case cases[] = {
      {Add(":CGR1:MOD2:CONN1", ":CGR1:MOD3:CONN1"),
       "-221,\"Settings conflict; :CGR1:MOD3:CONN1 is driven by :CGR1:MOD1:CONN1 already\""},
      {Add(":CGR1:MOD1:CONN1", ":CGR1:MOD3:CONN2"),
       "-221,\"Settings conflict; :CGR1:MOD1:CONN1 drives :CGR1:MOD3:CONN1 already\""},
      {Add(":CGR2:MOD1:CONN1", ":CGR1:MOD3:CONN2"),
       "-221,\"Settings conflict; the ports are in different clock groups\""},
      {Add(":CGR1:MOD1:CONN3", ":CGR1:MOD3:CONN2"),
       "-221,\"Settings conflict; :CGR1:MOD1:CONN3 is a clock port; only data ports are connected\""},
      {Add(":CGR1:MOD3:CONN1", ":CGR1:MOD3:CONN2"),
       "-221,\"Settings conflict; :CGR1:MOD3:CONN1 is an analyser port; a connection starts at a generator "
       "port\""},
      {Add(":CGR1:MOD2:CONN2", ":CGR1:MOD2:CONN1"),
       "-221,\"Settings conflict; :CGR1:MOD2:CONN1 is a generator port; a connection ends at an analyser "
       "port\""},
      {Add(":CGR9:MOD1:CONN1", ":CGR1:MOD3:CONN2"),
       "-224,\"Illegal parameter value; the rack has no port :CGR9:MOD1:CONN1\""},
      {Add("a\"\"b", ":CGR1:MOD3:CONN2"), "-224,\"Illegal parameter value; the rack has no port a\"\"b\""},
      {Del(":CGR1:MOD2:CONN1", ":CGR1:MOD3:CONN1"),
       "-224,\"Illegal parameter value; :CGR1:MOD2:CONN1 does not drive :CGR1:MOD3:CONN1\""},
      {":_H:CONF:CONN:ADD", "-109,\"Missing parameter\""},
      {":_H:CONF:CONN:ADD \":CGR1:MOD2:CONN1\"", "-104,\"Data type error\""},
      {":_H:CONF:CONN:ADD :CGR1:MOD2:CONN1,:CGR1:MOD3:CONN2", "-104,\"Data type error\""},
      {":_H:CONF:CONN:DEL? \":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\"", "-113,\"Undefined header\""},
      {":_H:CONF:CONN (1)", "-200,\"Execution error\""},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(Refusal(c.command), std::make_pair(1, std::string(c.error))) << c.command;
  }
  EXPECT_EQ(Table(), before);
  EXPECT_EQ(Text(":_B:DFL?", kOther), "");
}

TEST_F(SimCablingTest, PortsOfDifferentWidthsAreNotConnected) {
  SimCommandProcessor sim(
      Load("model G generator terminals=16\nmodel N generator terminals=4\nmodel A analyser terminals=16\n"
           "template port\nparam {port}:OUTP bool OFF\nend\n"
           "group 1\nmodule 1 G slot=7\nport 1 PDAT\nmodule 2 N\nport 1 PDAT\nmodule 3 A\nport 1 PDAT\n"),
      mClock, false);
  sim.Execute(kConn, ":QEN:INST:HAND:CRE? _H,\"PSX\",\"SIM\"");
  EXPECT_EQ(sim.Execute(kConn, ":_H:CONF:FRON?").text,
            "(1,(\":CGR1:MOD1\",\"G\",GEN,7,(\":CGR1:MOD1:CONN1\",\"PDAT\",16)),"
            "(\":CGR1:MOD2\",\"N\",GEN,2,(\":CGR1:MOD2:CONN1\",\"PDAT\",4)),"
            "(\":CGR1:MOD3\",\"A\",ANA,3,(\":CGR1:MOD3:CONN1\",\"PDAT\",16)))");
  EXPECT_EQ(sim.Execute(kConn, ":_H:CONF:CONN:DEL \":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\"").status, 0);
  EXPECT_EQ(sim.Execute(kConn, ":_H:CONF:CONN:ADD \":CGR1:MOD2:CONN1\",\":CGR1:MOD3:CONN1\"").status, 1);
  EXPECT_EQ(sim.Execute(kConn, ":_H:SYST:ERR?").text,
            "-221,\"Settings conflict; :CGR1:MOD2:CONN1 has 4 terminals, :CGR1:MOD3:CONN1 has 16\"");
  EXPECT_EQ(sim.Execute(kConn, ":_H:CONF:CONN?").text, "");
}

TEST_F(SimCablingTest, AnAnalyserNothingDrivesComparesNothing) {
  Text(Del(":CGR1:MOD1:CONN1", ":CGR1:MOD3:CONN1"));
  Text(":_H:SGEN:GLOB:INIT:CONT ON");
  Text(":_H:DFL?");  // the counts start with the first frame that finds it running
  mClock.Advance(1000);
  EXPECT_EQ(Text(":_H:CGR1:MOD3:CONN1:BER?"), "0,0,0.000000000000E+000");
  EXPECT_GT(std::stod(Text(":_H:CGR1:MOD3:CONN2:BER?")), 9e8);
}

}  // namespace
