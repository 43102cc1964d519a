#include "SimFixture.h"

namespace {

using SimHandleTest = SimFixture;

TEST_F(SimHandleTest, ProposalsGetFreeNamesThatNeverEndInADigit) {
  struct Case {
    const char* proposal;
    const char* handle;
  };
  const Case cases[] = {
      {"_abc", "_ABC"}, {"_ABC", "_ABCA"}, {"_abc", "_ABCB"},    {"_h", "_HA"},
      {"vc", "VCA"},    {"TEST", "TESTA"}, {"_DEV1X", "_DEV1X"}, {"_dev1x", "_DEV1XA"},
  };
  for (const Case& c : cases) EXPECT_EQ(Handle(c.proposal), c.handle) << c.proposal;
}

TEST_F(SimHandleTest, VariantsRunPastZToTwoLetters) {
  std::string last;
  for (int i = 0; i < 28; ++i) last = Handle("_Q");
  EXPECT_EQ(last, "_QAA");
}

TEST_F(SimHandleTest, BadHandleRequestsQueueOnTheConnection) {
  struct Case {
    const char* args;
    const char* error;
  };
  const Case cases[] = {
      {"", "-109,\"Missing parameter\""},
      {" _X,\"PSX\"", "-109,\"Missing parameter\""},
      {" _X,\"ABC\",\"SIM\"", "-224,\"Illegal parameter value\""},
      {" \"_X Y\",\"PSX\",\"SIM\"", "-224,\"Illegal parameter value\""},
      {" _X,\"PSX\",\"SIM\",4", "-104,\"Data type error\""},
      {" (_X,\"PSX\",\"SIM\"", "-104,\"Data type error\""},
  };
  for (const Case& c : cases) {
    SimReply r = Reply(std::string(":QEN:INST:HAND:CRE?") + c.args);
    EXPECT_EQ(r.status, 1) << c.args;
    EXPECT_EQ(r.text, "") << c.args;
    EXPECT_EQ(Text(":QEN:SYST:ERR?"), c.error) << c.args;
  }
  EXPECT_EQ(Text(":_X:SYST:ERR?"), "0,\"No error\"");
}

TEST_F(SimHandleTest, DestroyedHandleIsUnknownAfterwards) {
  EXPECT_EQ(Text(":QEN:INST:HAND:DEST _h"), "");
  EXPECT_EQ(Reply(":_H:CGR1:PER?").status, 1);
  EXPECT_EQ(Text(":_H:SYST:ERR?"), "-113,\"Undefined header\"");
  EXPECT_EQ(Reply(":QEN:INST:HAND:DEST _H").status, 1);
  EXPECT_EQ(Text(":QEN:SYST:ERR?"), "-224,\"Illegal parameter value\"");
  EXPECT_EQ(Handle("_H"), "_H");
}

TEST_F(SimHandleTest, HandlesDieWithTheirConnectionOnly) {
  EXPECT_EQ(Handle("_B", 2), "_B");
  mSim.Disconnect(kConn);
  EXPECT_EQ(Reply(":_H:CGR1:PER?", 2).status, 1);
  EXPECT_EQ(Text(":_B:CGR1:PER?", 2), "1.000000000000E-09");
  EXPECT_EQ(Handle("_H", 2), "_H");
}

TEST_F(SimHandleTest, UnknownHandleErrorsStayWithTheirConnection) {
  EXPECT_EQ(Reply(":_NOPE:CGR1:PER?", 2).status, 1);
  EXPECT_EQ(Text(":_OTHER:SYST:ERR?", kConn), "0,\"No error\"");
  EXPECT_EQ(Text(":_H:SYST:ERR?", kConn), "0,\"No error\"");
  EXPECT_EQ(Text(":_OTHER:SYST:ERR?", 2), "-113,\"Undefined header\"");
}

TEST_F(SimHandleTest, BatchStatusCountsItsErrorsWhichReadOldestFirst) {
  SimReply r = Reply(":_H:FOO;:_H:CGR1:PER abc;:_H:TRIG:MODE?;:_H:TRIG:MODE FAST;:_h:cgr1:per 1");
  EXPECT_EQ(r.status, 4);
  EXPECT_EQ(r.text, "SEQ");
  const char* expected[] = {"-113,\"Undefined header\"", "-104,\"Data type error\"",
                            "-224,\"Illegal parameter value\"", "-222,\"Data out of range\"",
                            "0,\"No error\""};
  for (const char* e : expected) EXPECT_EQ(Text(":_H:SYST:ERR?"), e);
}

TEST_F(SimHandleTest, FullQueueTurnsItsNewestEntryIntoOverflow) {
  std::string batch = ":_H:CGR1:PER 1";
  for (int i = 1; i < 40; ++i) batch += ";:_H:FOO" + std::to_string(i);
  EXPECT_EQ(Reply(batch).status, 40);
  EXPECT_EQ(Text(":_H:SYST:ERR?"), "-222,\"Data out of range\"");
  for (int i = 1; i < 31; ++i) EXPECT_EQ(Text(":_H:SYST:ERR?"), "-113,\"Undefined header\"") << i;
  EXPECT_EQ(Text(":_H:SYST:ERR?"), "-350,\"Queue overflow\"");
  EXPECT_EQ(Text(":_H:SYST:ERR?"), "0,\"No error\"");
}

TEST_F(SimHandleTest, JoinedRepliesKeepQuotesAndBlocksWhole) {
  struct Case {
    const char* batch;
    int status;
    const char* reply;
  };
  const Case cases[] = {
      {":_H:TRIG:MODE?;:_H:CGR1:MOD1:TYPE?;:_H:CGR2:MOD2:TYPE?", 0, "SEQ;\"K2268A\";\"K2270A\""},
      {":_H:TRIG:MODE #13;;;;:_H:TRIG:MODE?", 1, "SEQ"},
      {":TEST:ERR _H,-7,\"a;b\";:_H:SYST:ERR?", 0, "-7,\"a;b\""},
      {":_H:CGR1:PER?;;:_H:TRIG:MODE?", 0, "1.000000000000E-09;SEQ"},
      {":_H:TRIG:MODE \"SEQ;:_H:TRIG:MODE?", 1, ""},
  };
  for (const Case& c : cases) {
    SimReply r = Reply(c.batch);
    EXPECT_EQ(r.status, c.status) << c.batch;
    EXPECT_EQ(r.text, c.reply) << c.batch;
    Reply(":_H:SYST:ERR?");
  }
}

}  // namespace
