#include "SimFixture.h"

#include <algorithm>

namespace {

constexpr int kOther = 2;

// Handle "_H" on connection 1 and "_B" on connection 2.
class SimStateTest : public SimFixture {
 protected:
  SimStateTest() { EXPECT_EQ(Handle("_B", kOther), "_B"); }
  std::string Dirty(const char* handle, int conn) { return Text(std::string(":") + handle + ":DFL?", conn); }
};

TEST_F(SimStateTest, DirtyFlagNamesOthersChangesOnceAndForgetsThemWhenRead) {
  Reply(
      ":_H:CGR1:MOD1:CONN1:VOLT:AMPL 2;:_H:TRIG:MODE CLOC;:_H:TRIG:MODE SEQ;:_H:CGR1:PER:ATTR "
      "(\"s\",-12,0,-12,1d)");
  // A unit attribute is applied by every client when the change set names it, the writer too.
  EXPECT_EQ(Dirty("_H", kConn), "\":_H:CGR1:PER:ATTR\"");
  EXPECT_EQ(
      Dirty("_B", kOther),
      "\":_B:CGR1:MOD1:CONN1:VOLT:AMPL\",\":_B:CGR1:MOD1:CONN1:VOLT:HIGH\",\":_B:CGR1:MOD1:CONN1:VOLT:LOW\","
      "\":_B:TRIG:MODE\",\":_B:CGR1:PER:ATTR\"");
  EXPECT_EQ(Dirty("_B", kOther), "");
  Reply(":_B:CGR1:MOD1:CONN1:VOLT:AMPL 2", kOther);
  EXPECT_EQ(Dirty("_H", kConn), "");
}

TEST_F(SimStateTest, InstrumentChangesReachEveryHandle) {
  EXPECT_EQ(Text(":TEST:SET :CGR1:PER,2E-9"), "");
  const char* expected = "\":%s:CGR1:FREQ\",\":%s:CGR1:PER\",\":%s:SGEN:GLOB:PLL:STAT\"";
  EXPECT_EQ(Dirty("_H", kConn), Dstring::Format(expected, "_H", "_H", "_H"));
  EXPECT_EQ(Dirty("_B", kOther), Dstring::Format(expected, "_B", "_B", "_B"));
  EXPECT_EQ(Reply(":TEST:SET :CGR1:PER,1").status, 1);
  EXPECT_EQ(Text(":TEST:SYST:ERR?"), "-222,\"Data out of range\"");
  EXPECT_EQ(Reply(":TEST:SET :CGR1:NOPE,1").status, 1);
  EXPECT_EQ(Text(":TEST:SYST:ERR?"), "-113,\"Undefined header\"");
  mSim.MarkAllDirty();
  Reply(":_B:TRIG:MODE CLOC", kOther);
  EXPECT_EQ(Dirty("_H", kConn), "\"ALL\"");
  EXPECT_EQ(Dirty("_H", kConn), "");
}

TEST_F(SimStateTest, TooManyChangedNamesBecomeAll) {
  std::string config;
  for (int i = 0; i <= 256; ++i) config += "param :P" + std::to_string(i) + " integer 0\n";
  SimCommandProcessor sim(Load(config.c_str()), mClock, true);
  sim.Execute(kConn, ":QEN:INST:HAND:CRE? _H,\"PSX\",\"SIM\"");
  for (int i = 0; i < 256; ++i) sim.Execute(kConn, ":TEST:SET :P" + std::to_string(i) + ",1");
  std::string names = sim.Execute(kConn, ":_H:DFL?").text;
  EXPECT_TRUE(names.starts_with("\":_H:P0\",\":_H:P1\",")) << names.substr(0, 40);
  EXPECT_TRUE(names.ends_with(",\":_H:P255\"")) << names.substr(names.size() - 40);
  EXPECT_EQ(std::count(names.begin(), names.end(), ','), 255);
  for (int i = 0; i <= 256; ++i) sim.Execute(kConn, ":TEST:SET :P" + std::to_string(i) + ",2");
  EXPECT_EQ(sim.Execute(kConn, ":_H:DFL?").text, "\"ALL\"");
}

TEST_F(SimStateTest, RunStateFollowsTheClock) {
  struct Step {
    long long advanceMs;
    const char* command;
    const char* reply;
  };
  const char* syst = ":_H:SGEN:GLOB:SYST:STAT?";
  const char* pll = ":_H:SGEN:GLOB:PLL:STAT?";
  const Step steps[] = {
      {0, ":_H:SGEN:GLOB:INIT:CONT?", "OFF"},
      {0, syst, "PROG"},
      {0, pll, "LOCK"},
      {0, ":_H:SGEN:GLOB:INIT:CONT ON", ""},
      {0, syst, "SYNC"},
      {0, pll, "UNKN"},
      {299, pll, "UNKN"},
      {1, pll, "LOCK"},
      {199, syst, "SYNC"},
      {1, syst, "RUNN"},
      {0, ":_H:SGEN:GLOB:SEQ:FORC", ""},
      {499, syst, "SYNC"},
      {1, syst, "RUNN"},
      {0, ":_H:SGEN:GLOB:INIT:CONT 0", ""},
      {0, syst, "PROG"},
      {0, ":_H:SGEN:GLOB:SEQ:FORC", ""},
      {0, syst, "PROG"},
      {0, ":_H:CGR2:FREQ 2E9", ""},
      {0, pll, "UNKN"},
      {300, pll, "LOCK"},
      {0, ":TEST:STAT SYST,HALT", ""},
      {0, syst, "HALT"},
      {0, ":TEST:STAT pll,udat", ""},
      {1000, pll, "UDAT"},
      {0, ":_H:SGEN:GLOB:CONN?", "OFF"},
      {0, ":_H:SGEN:GLOB:CONN ON", ""},
      {0, ":_H:SGEN:GLOB:CONN?", "ON"},
  };
  for (const Step& s : steps) {
    mClock.Advance(s.advanceMs);
    EXPECT_EQ(Text(s.command), s.reply) << s.command << " at " << mClock.NowMs();
  }
  EXPECT_EQ(Reply(":TEST:STAT SYST,LOCK").status, 1);
  EXPECT_EQ(Text(syst), "HALT");
}

// The writer knows the state it set, not what followed from it: that it hears with everyone.
TEST_F(SimStateTest, StateChangesMarkEveryoneButTheWriterOfTheSwitchItSet) {
  struct Step {
    long long advanceMs;
    const char* command;  // of "_H"
    const char* writer;   // what "_H" hears, "%s" for its handle
    const char* other;    // what "_B" hears
  };
  const Step steps[] = {
      {0, ":_H:SGEN:GLOB:INIT:CONT ON", "\":%s:SGEN:GLOB:SYST:STAT\",\":%s:SGEN:GLOB:PLL:STAT\"",
       "\":%s:SGEN:GLOB:INIT:CONT\",\":%s:SGEN:GLOB:SYST:STAT\",\":%s:SGEN:GLOB:PLL:STAT\""},
      {500, ":_H:CGR1:PER?", "\":%s:SGEN:GLOB:SYST:STAT\",\":%s:SGEN:GLOB:PLL:STAT\"",
       "\":%s:SGEN:GLOB:SYST:STAT\",\":%s:SGEN:GLOB:PLL:STAT\""},
      {0, ":_H:SGEN:GLOB:SEQ:FORC", "\":%s:SGEN:GLOB:SYST:STAT\",\":%s:SGEN:GLOB:PLL:STAT\"",
       "\":%s:SGEN:GLOB:SYST:STAT\",\":%s:SGEN:GLOB:PLL:STAT\""},
      {500, ":_H:SGEN:GLOB:INIT:CONT OFF", "\":%s:SGEN:GLOB:SYST:STAT\",\":%s:SGEN:GLOB:PLL:STAT\"",
       "\":%s:SGEN:GLOB:SYST:STAT\",\":%s:SGEN:GLOB:PLL:STAT\",\":%s:SGEN:GLOB:INIT:CONT\""},
      {0, ":_H:SGEN:GLOB:INIT:CONT OFF", "", ""},
      {0, ":_H:SGEN:GLOB:CONN ON", "", "\":%s:SGEN:GLOB:CONN\""},
      {0, ":_H:CGR1:PER 2E-9", "\":%s:SGEN:GLOB:PLL:STAT\"",
       "\":%s:CGR1:FREQ\",\":%s:CGR1:PER\",\":%s:SGEN:GLOB:PLL:STAT\""},
  };
  for (const Step& s : steps) {
    mClock.Advance(s.advanceMs);
    Reply(s.command);
    EXPECT_EQ(Dirty("_H", kConn), Dstring::Format(s.writer, "_H", "_H", "_H")) << s.command;
    EXPECT_EQ(Dirty("_B", kOther), Dstring::Format(s.other, "_B", "_B", "_B")) << s.command;
  }
}

TEST_F(SimStateTest, LockHolderAloneIsServedUntilItLetsGoOrLeaves) {
  EXPECT_EQ(Text(":_H:SYST:LOCK ON;:_H:SYST:LOCK?"), "ON");
  const char* refused[] = {":_B:CGR1:PER?", ":_B:SYST:LOCK ON", ":QEN:INST:HAND:CRE? _C,\"PSX\",\"SIM\"",
                           ":VC:_B:CGR1:PER 2E-9", ":TEST:LOCK OFF;:_B:CGR1:PER?"};
  for (const char* cmd : refused) {
    SimReply r = Reply(cmd, kOther);
    EXPECT_EQ(r.status, -19) << cmd;
    EXPECT_EQ(r.text, "") << cmd;
  }
  EXPECT_EQ(Text(":_H:CGR1:PER?"), "1.000000000000E-09");
  EXPECT_EQ(Text(":_H:SYST:LOCK OFF;:_H:SYST:LOCK?"), "OFF");
  EXPECT_EQ(Text(":_B:SYST:LOCK ON", kOther), "");
  EXPECT_EQ(Reply(":_H:CGR1:PER?").status, -19);
  mSim.Disconnect(kOther);
  EXPECT_EQ(Text(":_H:CGR1:PER?"), "1.000000000000E-09");
}

}  // namespace
