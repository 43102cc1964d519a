#include "SimFixture.h"

namespace {

using SimTestControlTest = SimFixture;

TEST_F(SimTestControlTest, PhantomLockRefusesEverythingButTestControl) {
  EXPECT_EQ(Text(":TEST:LOCK ON"), "");
  for (int conn : {kConn, 2}) {
    SimReply r = Reply(":_H:CGR1:PER?", conn);
    EXPECT_EQ(r.status, -19);
    EXPECT_EQ(r.text, "");
  }
  EXPECT_EQ(Text(":TEST:ERR _H,-300,\"Device error\";:TEST:STAT SYST,FIN"), "");
  EXPECT_EQ(Text(":TEST:LOCK OFF"), "");
  EXPECT_EQ(Text(":_H:SYST:ERR?;:_H:SYST:ERR?;:_H:SGEN:GLOB:SYST:STAT?"),
            "-300,\"Device error\";0,\"No error\";FIN");
  EXPECT_EQ(Text(":TEST:LOCK ON", 2), "");
  mSim.Disconnect(3);
  EXPECT_EQ(Reply(":_H:CGR1:PER?").status, -19);
  mSim.Disconnect(2);
  EXPECT_EQ(Reply(":_H:CGR1:PER?").status, 0);
}

TEST_F(SimTestControlTest, DelayAppliesToTheNextRepliesOfThatConnection) {
  EXPECT_EQ(Reply(":TEST:DELAY 250,2").delayMs, 0);
  EXPECT_EQ(Reply(":_H:CGR1:PER?", 2).delayMs, 0);
  EXPECT_EQ(Reply(":_H:CGR1:PER?").delayMs, 250);
  EXPECT_EQ(Reply(":_H:FOO?").delayMs, 250);
  EXPECT_EQ(Reply(":_H:CGR1:PER?").delayMs, 0);
  EXPECT_EQ(Reply(":TEST:DELAY 50").delayMs, 0);
  EXPECT_EQ(Reply(":_H:CGR1:PER?").delayMs, 50);
  EXPECT_EQ(Reply(":_H:CGR1:PER?").delayMs, 0);
}

TEST_F(SimTestControlTest, DelayOfAllSlowsEveryOtherConnectionOpenNow) {
  Reply(":_H:CGR1:PER?", 2);
  EXPECT_EQ(Reply(":TEST:DELAY 300,1,ALL").delayMs, 0);
  EXPECT_EQ(Reply(":_H:CGR1:PER?").delayMs, 0) << "not the connection that asked";
  EXPECT_EQ(Reply(":_H:CGR1:PER?", 2).delayMs, 300);
  EXPECT_EQ(Reply(":_H:CGR1:PER?", 2).delayMs, 0);
}

TEST_F(SimTestControlTest, MalformedReplyReplacesOneMatchingReplyOnly) {
  EXPECT_EQ(Text(":TEST:MALF \":syst:err?\",\"garbage, \"\"quoted\"\"\""), "");
  EXPECT_EQ(Text(":_H:CGR1:PER?"), "1.000000000000E-09");
  EXPECT_EQ(Text(":_H:SYST:ERR?", 2), "0,\"No error\"");
  EXPECT_EQ(Text(":_H:SYST:ERR?"), "garbage, \"quoted\"");
  EXPECT_EQ(Text(":_H:SYST:ERR?"), "0,\"No error\"");
}

TEST_F(SimTestControlTest, ReplyTextCanBeKeptForACountOrForGood) {
  EXPECT_EQ(Text(":TEST:MALF \":CGR1:PER?\",\"1E-9\",2"), "");
  EXPECT_EQ(Text(":_H:CGR1:PER?"), "1E-9");
  EXPECT_EQ(Text(":_H:CGR1:PER?"), "1E-9");
  EXPECT_EQ(Text(":_H:CGR1:PER?"), "1.000000000000E-09");
  EXPECT_EQ(Text(":TEST:MALF \":CGR1:PER?\",\"2E-9\",0"), "");
  for (int i = 0; i < 3; ++i) EXPECT_EQ(Text(":_H:CGR1:PER?"), "2E-9");
  EXPECT_EQ(Text(":TEST:MALF \":CGR1:PER?\",\"3E-9\""), "") << "arming again replaces it";
  EXPECT_EQ(Text(":_H:CGR1:PER?"), "3E-9");
  EXPECT_EQ(Text(":_H:CGR1:PER?"), "1.000000000000E-09");
}

TEST_F(SimTestControlTest, ActionsAndBigReplies) {
  EXPECT_EQ(Reply(":TEST:DROP;:_H:TRIG:MODE CLOC").action, SimReplyAction::Drop);
  EXPECT_EQ(Text(":_H:TRIG:MODE?"), "SEQ");
  EXPECT_EQ(Reply(":TEST:DIE").action, SimReplyAction::Die);
  std::string big = Text(":TEST:BIG 17000000");
  EXPECT_EQ(big.size(), 17000000u);
  EXPECT_EQ(big.substr(0, 12), "012345678901");
  EXPECT_EQ(Text(":TEST:BIG 0"), "");
}

TEST_F(SimTestControlTest, BadArgumentsQueueOnTheConnection) {
  struct Case {
    const char* command;
    const char* error;
  };
  const Case cases[] = {
      {":TEST:LOCK", "-109,\"Missing parameter\""},
      {":TEST:LOCK MAYBE", "-224,\"Illegal parameter value\""},
      {":TEST:DELAY x", "-104,\"Data type error\""},
      {":TEST:DELAY -1", "-222,\"Data out of range\""},
      {":TEST:DELAY 10,0", "-222,\"Data out of range\""},
      {":TEST:DELAY 10,1,SOME", "-224,\"Illegal parameter value\""},
      {":TEST:ERR _NOPE,1,\"x\"", "-224,\"Illegal parameter value\""},
      {":TEST:ERR _H,x,\"x\"", "-104,\"Data type error\""},
      {":TEST:ERR _H,1", "-109,\"Missing parameter\""},
      {":TEST:MALF \":SYST:ERR?\"", "-109,\"Missing parameter\""},
      {":TEST:MALF \":SYST:ERR?\",\"x\",-1", "-222,\"Data out of range\""},
      {":TEST:BIG 99999999999", "-222,\"Data out of range\""},
      {":TEST:SET :CGR1:PER", "-109,\"Missing parameter\""},
      {":TEST:STAT RUN,PROG", "-224,\"Illegal parameter value\""},
      {":TEST:NOPE", "-113,\"Undefined header\""},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(Reply(c.command).status, 1) << c.command;
    EXPECT_EQ(Text(":TEST:SYST:ERR?"), c.error) << c.command;
  }
  EXPECT_EQ(Text(":_H:SYST:ERR?"), "0,\"No error\"");
}

TEST_F(SimTestControlTest, WithoutTestControlTheTestWordIsUnknown) {
  SimCommandProcessor sim(Load(kSimDefaultConfigText), mClock, false);
  for (const char* cmd : {":TEST:LOCK ON", ":TEST:DIE", ":TEST:DROP"}) {
    SimReply r = sim.Execute(kConn, cmd);
    EXPECT_EQ(r.status, 1) << cmd;
    EXPECT_EQ(r.action, SimReplyAction::Send) << cmd;
    EXPECT_EQ(sim.Execute(kConn, ":TEST:SYST:ERR?").text, "-113,\"Undefined header\"") << cmd;
  }
  EXPECT_EQ(sim.Execute(kConn, ":QEN:INST:HAND:CRE? _H,\"PSX\",\"SIM\"").text, "_H");
  EXPECT_EQ(sim.Execute(kConn, ":_H:CGR1:PER?").status, 0);
}

}  // namespace
