#include "SimFixture.h"

namespace {

std::string Quoted(std::initializer_list<const char*> headers) {
  std::string out;
  for (const char* h : headers) out += std::string(out.empty() ? "" : ",") + "\":_H" + h + "\"";
  return out;
}

using SimCouplingTest = SimFixture;

struct CoupledCase {
  const char* batch;
  std::string values;
  std::string limits;
};

TEST_F(SimCouplingTest, AfterABatchVcAndRcNameWhatItChanged) {
  const CoupledCase cases[] = {
      {":_H:CGR1:PER 2E-9", Quoted({":CGR1:FREQ", ":CGR1:PER"}),
       Quoted({":CGR1:MOD1:CONN1:PULS:DEL", ":CGR1:MOD1:CONN2:PULS:DEL", ":CGR1:MOD2:CONN1:PULS:DEL",
               ":CGR1:MOD2:CONN2:PULS:DEL", ":CGR1:MOD3:CONN1:PULS:DEL", ":CGR1:MOD3:CONN2:PULS:DEL"})},
      {":_H:CGR1:MOD1:CONN1:VOLT:AMPL 2",
       Quoted({":CGR1:MOD1:CONN1:VOLT:AMPL", ":CGR1:MOD1:CONN1:VOLT:HIGH", ":CGR1:MOD1:CONN1:VOLT:LOW"}),
       Quoted({":CGR1:MOD1:CONN1:VOLT:OFFS", ":CGR1:MOD1:CONN1:VOLT:HIGH", ":CGR1:MOD1:CONN1:VOLT:LOW"})},
      {":_H:CGR1:MOD1:CONN2:VOLT:HIGH 2",
       Quoted({":CGR1:MOD1:CONN2:VOLT:AMPL", ":CGR1:MOD1:CONN2:VOLT:OFFS", ":CGR1:MOD1:CONN2:VOLT:HIGH"}),
       Quoted({":CGR1:MOD1:CONN2:VOLT:AMPL", ":CGR1:MOD1:CONN2:VOLT:OFFS", ":CGR1:MOD1:CONN2:VOLT:LOW"})},
      {":_H:CGR1:PER 2E-9", Quoted({":CGR1:PER"}), ""},
      {":_H:CGR1:PER 1;:_H:TRIG:MODE CLOC;:_H:TRIG:MODE?", Quoted({":TRIG:MODE"}), ""},
      {":_H:TRIG:MODE?", "", ""},
  };
  for (const CoupledCase& c : cases) {
    Reply(c.batch);
    EXPECT_EQ(Text(std::string(":VC") + c.batch), c.values) << c.batch;
    EXPECT_EQ(Text(std::string(":RC") + c.batch), c.limits) << c.batch;
  }
  Reply(":_H:SYST:ERR?");
  EXPECT_EQ(Text(":_H:CGR1:MOD1:CONN1:VOLT:HIGH?;:_H:CGR1:MOD1:CONN1:VOLT:LOW?"),
            "1.500000000000E+00;-5.000000000000E-01");
  EXPECT_EQ(Text(":_H:CGR1:MOD1:CONN1:VOLT:OFFS? LLIM;:_H:CGR1:MOD1:CONN1:VOLT:OFFS? HLIM"),
            "-1.000000000000E+00;2.000000000000E+00");
}

TEST_F(SimCouplingTest, AnUnrunBatchIsTriedOnACopyOnly) {
  EXPECT_EQ(
      Text(":VC:_H:CGR1:MOD1:CONN1:VOLT:AMPL 2"),
      Quoted({":CGR1:MOD1:CONN1:VOLT:AMPL", ":CGR1:MOD1:CONN1:VOLT:HIGH", ":CGR1:MOD1:CONN1:VOLT:LOW"}));
  EXPECT_EQ(Text(":RC:_h:CGR2:PER 4E-9"), Quoted({":CGR2:MOD1:CONN1:PULS:DEL", ":CGR2:MOD1:CONN2:PULS:DEL",
                                                  ":CGR2:MOD2:CONN1:PULS:DEL", ":CGR2:MOD2:CONN2:PULS:DEL"}));
  EXPECT_EQ(Text(":VC:_H:CGR1:PER 1"), "");
  EXPECT_EQ(Text(":_H:SYST:ERR?"), "0,\"No error\"");
  EXPECT_EQ(Text(":_H:CGR1:MOD1:CONN1:VOLT:AMPL?;:_H:CGR2:PER?"), "1.000000000000E+00;1.000000000000E-09");
  // The same write again changes only what it names; the recorded set is the first run's.
  Reply(":_H:CGR1:PER 2E-9");
  EXPECT_EQ(Text(":VC:_H:CGR1:PER 2.0E-9"), Quoted({":CGR1:PER"}));
  EXPECT_EQ(Text(":VC:_H:CGR1:PER 2E-9"), Quoted({":CGR1:FREQ", ":CGR1:PER"}));
}

TEST_F(SimCouplingTest, ALimitThatMovesPastItsValueLeavesAClash) {
  const char* del = ":_H:CGR1:MOD1:CONN1:PULS:DEL";
  Reply(":_H:CGR1:PER 2E-9");
  EXPECT_EQ(Text(std::string(del) + " 1.5E-9"), "");
  EXPECT_EQ(Text(std::string(del) + "? CLAS"), "0");
  Reply(":_H:CGR1:FREQ 1E9");
  EXPECT_EQ(Text(std::string(del) + "? CLAS;" + del + "? HLIM;" + del + "?"),
            "1;1.000000000000E-09;1.500000000000E-09");
  EXPECT_EQ(Reply(std::string(del) + " 1.2E-9").status, 1);
}

TEST_F(SimCouplingTest, SearchingQueryFindsTheSmallestNumber) {
  struct Case {
    const char* query;
    const char* reply;  // null: -113
  };
  const Case cases[] = {
      {":SR:_H:CGR@:MOD1:CONN1:PULS:DEL", "1"},
      {":SR:_h:cgr1:mod@:conn1:puls:del", "1"},
      {":SR:_H:CGR1:MOD1:CONN@:DIV", "3"},
      {":SR:_H:CGR2:MOD@:CONN1:VOLT:THR", "2"},
      {":SR:_H:CGR@:MOD3:TYPE?", "1"},
      {":SR:_H:CGR@:MOD9:TYPE", nullptr},
      {":SR:_H:CGR1:PER", nullptr},
      {":SR:_H:CGR@:MOD@:TYPE", nullptr},
      {":SR:_H:CGR@", nullptr},
  };
  for (const Case& c : cases) {
    SimReply r = Reply(c.query);
    EXPECT_EQ(r.text, c.reply ? c.reply : "") << c.query;
    EXPECT_EQ(Text(":_H:SYST:ERR?"), c.reply ? "0,\"No error\"" : "-113,\"Undefined header\"") << c.query;
  }
}

TEST_F(SimCouplingTest, ListingNamesParametersByPrefix) {
  EXPECT_EQ(Text(":L:_H:CGR1:MOD1:CONN1:VOLT?"),
            Quoted({":CGR1:MOD1:CONN1:VOLT:AMPL", ":CGR1:MOD1:CONN1:VOLT:OFFS", ":CGR1:MOD1:CONN1:VOLT:HIGH",
                    ":CGR1:MOD1:CONN1:VOLT:LOW"}));
  EXPECT_EQ(Text(":L:_H:cgr2:mod2:conn2?"),
            Quoted({":CGR2:MOD2:CONN2:VOLT:THR", ":CGR2:MOD2:CONN2:PULS:DEL", ":CGR2:MOD2:CONN2:BER"}));
  EXPECT_EQ(Text(":L:_H:NOPE?"), "");
  EXPECT_EQ(Reply(":L:_X:CGR1?").status, 1);
  EXPECT_EQ(Text(":_X:SYST:ERR?"), "-113,\"Undefined header\"");
}

}  // namespace
