#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "SimFixture.h"
#include "SimScpiReader.h"
#include "SimScpiSession.h"

namespace {

// The messages a stream yields, fed in pieces of `piece` bytes; "!" stands for an overrun and
// "?" for a short block.
std::vector<std::string> Messages(const std::string& stream, std::size_t piece) {
  SimScpiReader reader;
  std::vector<std::string> out;
  for (std::size_t at = 0; at < stream.size(); at += piece) {
    reader.Feed(stream.data() + at, std::min(piece, stream.size() - at));
    std::string message;
    for (SimScpiReader::Result r; (r = reader.Next(message)) != SimScpiReader::Result::None;) {
      out.push_back(r == SimScpiReader::Result::Overrun ? "!" : r == SimScpiReader::Result::ShortBlock ? "?" : message);
    }
  }
  return out;
}

struct StreamCase {
  std::string stream;
  std::vector<std::string> messages;
};

class ScpiReader : public testing::TestWithParam<StreamCase> {};

TEST_P(ScpiReader, CutsMessagesWhateverThePieces) {
  for (std::size_t piece : {1u, 2u, 3u, 7u, 4096u}) {
    EXPECT_EQ(Messages(GetParam().stream, piece), GetParam().messages) << "pieces of " << piece;
  }
}

INSTANTIATE_TEST_SUITE_P(
    Streams, ScpiReader,
    testing::Values(StreamCase{"*IDN?\n", {"*IDN?"}}, StreamCase{"A\r\nB\n\n", {"A", "B", ""}},
                    StreamCase{"no end yet", {}},
                    StreamCase{std::string("DATA 0,0,0,7,#16\n\r\0;\n#\n*OPC?\n", 29),
                               {std::string("DATA 0,0,0,7,#16\n\r\0;\n#", 22), "*OPC?"}},
                    StreamCase{"X #0ab\nY a#15\n", {"X #0ab", "Y a#15"}},
                    StreamCase{"X,#2a\nY\n", {"X,#2a", "Y"}},
                    // A block not followed by the end of its argument was short: the message ends
                    // at its first line feed, and the lines after it are read.
                    StreamCase{"D #15ab\nX\nY\n", {"?", "X", "Y"}}, StreamCase{"D #13abcX\nY\n", {"?", "Y"}},
                    StreamCase{"D #10;E #12\n\n,F\n", {"D #10;E #12\n\n,F"}},
                    StreamCase{"D #0ab;\"c\nE\n", {"D #0ab;\"c", "E"}}));

TEST(ScpiReaderLimits, ABlockCutOffEndsAtItsFirstLineFeed) {
  SimScpiReader reader;
  std::string message;
  reader.Feed("D #210ab\n*IDN?\n", 15);
  EXPECT_EQ(reader.Next(message), SimScpiReader::Result::None);
  EXPECT_TRUE(reader.InBlock());
  reader.CutBlock();
  EXPECT_FALSE(reader.InBlock());
  EXPECT_EQ(reader.Next(message), SimScpiReader::Result::ShortBlock);
  EXPECT_EQ(reader.Next(message), SimScpiReader::Result::Message);
  EXPECT_EQ(message, "*IDN?");
}

TEST(ScpiReaderLimits, FindsTheIndefiniteBlockOutsideStringsAndDefiniteBlocks) {
  EXPECT_EQ(SimScpiReader::FindIndefiniteBlock("D 1,#0ab"), 4u);
  EXPECT_EQ(SimScpiReader::FindIndefiniteBlock("D \"#0\",#12#0,#0"), 13u);
  EXPECT_EQ(SimScpiReader::FindIndefiniteBlock("D a#0,#1"), std::string_view::npos);
}

TEST(ScpiReaderLimits, DropsAnOverlongMessageAndReadsOn) {
  SimScpiReader reader;
  const std::string chunk(1 << 20, 'x');
  std::string message;
  for (std::size_t fed = 0; fed <= SimScpiReader::kMaxMessage; fed += chunk.size()) {
    reader.Feed(chunk.data(), chunk.size());
    EXPECT_EQ(reader.Next(message), SimScpiReader::Result::None);
  }
  reader.Feed("tail\n*IDN?\n", 11);
  EXPECT_EQ(reader.Next(message), SimScpiReader::Result::Overrun);
  EXPECT_EQ(reader.Next(message), SimScpiReader::Result::Message);
  EXPECT_EQ(message, "*IDN?");
  // A block that claims more than the limit is dropped too, line feeds and all.
  const std::string header = "D #9999999999";
  reader.Feed(header.data(), header.size());
  for (int i = 0; i < 20; ++i) {
    reader.Feed("\n\n\n\n", 4);
    reader.Feed(chunk.data(), chunk.size());
    EXPECT_EQ(reader.Next(message), SimScpiReader::Result::None);
  }
}

class SimScpiTest : public SimFixture {
 protected:
  static constexpr int kScpi = 7;

  SimScpiTest() : mScpi(mSim, kScpi) {}

  // The response of one message, "<none>" when it asked nothing, "<waiting>" when it is parked.
  std::string Send(SimScpiSession& session, const std::string& message) {
    Dstring reply;
    return Shown(session.Execute(message, reply), reply);
  }
  static std::string Shown(SimScpiSession::Outcome outcome, const Dstring& reply) {
    if (outcome == SimScpiSession::Outcome::Waiting) return "<waiting>";
    return outcome == SimScpiSession::Outcome::Answered ? std::string(reply) : std::string("<none>");
  }
  std::string Send(const std::string& message) { return Send(mScpi, message); }

  SimScpiSession mScpi;
};

struct Exchange {
  std::string message;
  std::string response;
};

class ScpiExchange : public SimScpiTest, public testing::WithParamInterface<std::vector<Exchange>> {};

// Each script starts on a fresh instrument and session; responses are checked to the byte.
TEST_P(ScpiExchange, AnswersAsIeee4882Says) {
  for (const Exchange& e : GetParam()) EXPECT_EQ(Send(e.message), e.response) << e.message;
}

INSTANTIATE_TEST_SUITE_P(
    Scripts, ScpiExchange,
    testing::Values(
        // Power-on: PON is set, the queue is empty.
        std::vector<Exchange>{{"*IDN?", "Corvane,71300 qensim,0," QENSIM_TEST_VERSION},
                              {"*ESR?", "128"}, {"*ESR?", "0"}, {"*STB?", "0"}, {"SYST:ERR?", "0,\"No error\""},
                              {"*TST?;*OPC?", "0;1"}},
        // Parameters without the handle; errors by class into the event register.
        std::vector<Exchange>{{"CGR1:PER 2E-9", "<none>"}, {":cgr1:per?", "2.000000000000E-09"},
                              {"CGR1:FREQ?", "5.000000000000E+08"}, {"CGR1:PER 5", "<none>"},
                              {"FOO?", ""}, {"*RST BAD", "<none>"}, {"*ESR?", "176"},
                              {"SYSTem:ERRor?", "-222,\"Data out of range\""},
                              {"SYST:ERR:NEXT?", "-113,\"Undefined header\""},
                              {"syst:err?", "-108,\"Parameter not allowed\""}, {"SYST:ERR?", "0,\"No error\""}},
        // Enable registers, the summary bits, *CLS and *OPC.
        std::vector<Exchange>{{"*ESR?;*ESE 36;*SRE 255;*ESE?;*SRE?", "128;36;191"},
                              {"*STB?", "0"}, {"FOO", "<none>"}, {"*STB?", "100"},
                              {"*ESE 256;*ESE;*ESE X", "<none>"},
                              {"SYST:ERR?;SYST:ERR?;SYST:ERR?", "-113,\"Undefined header\";-222,\"Data out of range\";"
                                                                 "-109,\"Missing parameter\""},
                              {"*CLS;*STB?;*ESR?", "0;0"}, {"*OPC;*ESR?;*WAI", "1"}, {"*XYZ", "<none>"},
                              {"*STB?", "100"}},
        // A failed query still answers; a command error ends the message, other errors do not.
        std::vector<Exchange>{{"CGR1:PER 5;CGR1:PER?", "1.000000000000E-09"},
                              {"FOO;CGR1:PER 2E-9;CGR1:PER?", ""}, {"CGR1:PER? \"x", ""},
                              {"CGR1:PER?;SYST:ERR?;SYST:ERR?;SYST:ERR?",
                               "1.000000000000E-09;-222,\"Data out of range\";-113,\"Undefined header\";"
                               "-100,\"Command error\""}},
        // Long and short forms in any case, numeric suffixes, the optional node.
        std::vector<Exchange>{{"TRIGger:MODE?;trig:mode?;:Trigger:Mode?", "SEQ;SEQ;SEQ"},
                              {"CGRoup1:PERiod?;cgroup1:frequency?", "1.000000000000E-09;1.000000000000E+09"},
                              {"CGRoup1:MODule1:CONNect1:VOLTage:AMPLitude?", "1.000000000000E+00"},
                              {"CGRo1:PER?", ""}, {"CGR1:PERIO?", ""},
                              {"SYSTem:ERRor:NEXT?;SYST:ERR:NEXT?", "-113,\"Undefined header\";-113,\"Undefined header\""}},
        // MIN and MAX are the current limits, DEF the configured value; as values and as queries.
        std::vector<Exchange>{{"CGR1:PER? MAX;CGR1:PER? MINimum;CGR1:PER? def", "1.000000000000E-06;1.000000000000E-10;"
                                                                                "1.000000000000E-09"},
                              {"CGR1:MOD1:CONN1:PULS:DEL? MAXimum", "1.000000000000E-09"},
                              {"CGR1:PER MAX;CGR1:PER?;CGR1:FREQ?", "1.000000000000E-06;1.000000000000E+06"},
                              {"CGR1:MOD1:CONN1:PULS:DEL MAX;CGR1:MOD1:CONN1:PULS:DEL?", "1.000000000000E-06"},
                              {"CGR1:PER MIN;CGR1:PER?", "1.000000000000E-10"},
                              {"CGR1:PER DEFault;CGR1:PER?", "1.000000000000E-09"},
                              {"TRIG:MODE CLOC;TRIG:MODE? DEF;TRIG:MODE DEF;TRIG:MODE?", "SEQ;SEQ"},
                              {"SYST:ERR?", "0,\"No error\""}},
        // Unit suffixes with SI prefixes, up to the limits exactly; M is milli but MHZ is mega.
        std::vector<Exchange>{{"CGR1:PER 100 ps;CGR1:PER?", "1.000000000000E-10"},
                              {"CGR1:PER 1us;CGR1:PER?", "1.000000000000E-06"},
                              {"CGR1:PER 2.5 NS;CGR1:PER?", "2.500000000000E-09"},
                              {"CGR1:PER 1E3 ps;CGR1:PER?", "1.000000000000E-09"},
                              {"CGR1:FREQ 1 MHz;CGR1:FREQ?", "1.000000000000E+06"},
                              {"CGR1:FREQ 10 GHZ;CGR1:FREQ?", "1.000000000000E+10"},
                              {"CGR1:FREQ 2 mahz;CGR1:FREQ?", "2.000000000000E+06"},
                              {"CGR1:MOD1:CONN1:VOLT:AMPL 500 mV;CGR1:MOD1:CONN1:VOLT:AMPL?", "5.000000000000E-01"},
                              {"CGR1:PER 99 ps;CGR1:PER 1 nV;CGR1:PER 1 ns", "<none>"}, {"TRIG:MODE 1 s", "<none>"},
                              {"SYST:ERR?;SYST:ERR?;SYST:ERR?;SYST:ERR?;CGR1:PER?", "-222,\"Data out of range\";"
                               "-131,\"Invalid suffix\";-138,\"Suffix not allowed\";0,\"No error\";5.000000000000E-07"},
                              {"CGR1:PER 1 ns;CGR1:FREQ 1.5 kHz;CGR1:PER?", "1.000000000000E-09"},
                              {"SYST:ERR?;CGR1:FREQ 1.5 mHz;CGR1:FREQ?", "-222,\"Data out of range\";1.500000000000E+06"}},
        // The language's own prefixed and handle-free commands work on the socket too.
        std::vector<Exchange>{{"L:CGR1:MOD1:CONN1:VOLT?", "\":SCPI:CGR1:MOD1:CONN1:VOLT:AMPL\",\":SCPI:CGR1:MOD1:CONN1:VOLT:OFFS\","
                                                          "\":SCPI:CGR1:MOD1:CONN1:VOLT:HIGH\",\":SCPI:CGR1:MOD1:CONN1:VOLT:LOW\""},
                              {"SR:CGR@:MOD1:CONN1:PULS:DEL", "1"},
                              {"VC:CGR1:PER 2E-9", "\":SCPI:CGR1:FREQ\",\":SCPI:CGR1:PER\""},
                              {"RC:CGR1:PER 2E-9", "\":SCPI:CGR1:MOD1:CONN1:PULS:DEL\",\":SCPI:CGR1:MOD1:CONN2:PULS:DEL\","
                                                   "\":SCPI:CGR1:MOD2:CONN1:PULS:DEL\",\":SCPI:CGR1:MOD2:CONN2:PULS:DEL\","
                                                   "\":SCPI:CGR1:MOD3:CONN1:PULS:DEL\",\":SCPI:CGR1:MOD3:CONN2:PULS:DEL\""}, {"TEST:ERR SCPI,-330,\"Self-test failed\";SYST:ERR?;SYST:ERR?",
                               "-330,\"Self-test failed\";0,\"No error\""}},
        // *RST takes the setting back to its configured values.
        std::vector<Exchange>{{"CGR1:PER 2E-9;*RST;CGR1:PER?", "1.000000000000E-09"}}));

TEST_F(SimScpiTest, TheErrorQueueOverflowsAtItsBound) {
  for (std::size_t i = 0; i < SimErrorQueue::kCapacity + 5; ++i) Send("FOO");
  for (std::size_t i = 0; i + 1 < SimErrorQueue::kCapacity; ++i) ASSERT_EQ(Send("SYST:ERR?"), "-113,\"Undefined header\"");
  EXPECT_EQ(Send("SYST:ERR?"), "-350,\"Queue overflow\"");
  EXPECT_EQ(Send("SYST:ERR?"), "0,\"No error\"");
}

TEST_F(SimScpiTest, EachConnectionHasItsOwnHandleAndChangeSet) {
  SimScpiSession other(mSim, kScpi + 1);
  EXPECT_EQ(mScpi.GetHandle(), "SCPI");
  EXPECT_EQ(other.GetHandle(), "SCPIA");
  Send("CGR1:PER 2E-9");
  EXPECT_EQ(Send("DFL?"), "\":SCPI:SGEN:GLOB:PLL:STAT\"");
  EXPECT_EQ(Send(other, "DFL?"), "\":SCPIA:CGR1:FREQ\",\":SCPIA:CGR1:PER\",\":SCPIA:SGEN:GLOB:PLL:STAT\"");
  EXPECT_EQ(Text(":_H:CGR1:PER?"), "2.000000000000E-09");
}

TEST_F(SimScpiTest, ALockRefusesWritesWithAnErrorAndLetsQueriesThrough) {
  EXPECT_EQ(Text(":_H:SYST:LOCK ON"), "");
  EXPECT_EQ(Send("CGR1:PER 2E-9;CGR1:PER?"), "1.000000000000E-09");
  EXPECT_EQ(Send("*RST;*ESR?"), "144");
  EXPECT_EQ(Send("SYST:ERR?;SYST:ERR?;SYST:ERR?"),
            "-203,\"Command protected\";-203,\"Command protected\";0,\"No error\"");
  // Queries that make or open something are writes as far as the lock goes.
  EXPECT_EQ(Send("EDIT:SEGM:CRE? \"scpi/locked\",MEM"), "");
  EXPECT_EQ(Send("EDIT:SEGM:OPEN? \"scpi/locked\""), "");
  EXPECT_EQ(Send("edit:segm:exis? \"scpi/locked\""), "FALSE");
  EXPECT_EQ(Send("SYST:ERR?;SYST:ERR?;SYST:ERR?"),
            "-203,\"Command protected\";-203,\"Command protected\";0,\"No error\"");
  EXPECT_EQ(Reply(":_H:SYST:LOCK OFF").status, 0);
  EXPECT_EQ(Send("CGR1:PER 2E-9;CGR1:PER?"), "2.000000000000E-09");
}

TEST_F(SimScpiTest, SegmentDataTravelsAsABlock) {
  EXPECT_EQ(Send("EDIT:SEGM:OPEN? \"scpi/a\";EDIT:SEGM1:PATT:MOD:INS 0,TRAC,BEF,8;"
                 "EDIT:SEGM1:PATT:MOD:INS 0,VECT,BEF,8;EDIT:SEGM1:PATT:WIDT?;LENG?"),
            "1;8");
  EXPECT_EQ(Send("SYST:ERR?"), "-113,\"Undefined header\"");
  const std::string rows("\n;\"#", 4);
  EXPECT_EQ(Send("EDIT:SEGM1:PATT:DATA 0,0,3,7,#14" + rows + ";EDIT:SEGM1:PATT:DATA? 0,0,3,7,BIN"),
            "#500004" + rows);
}

}  // namespace

namespace {

class SimScpiStatusTest : public SimScpiTest {
 protected:
  // Moves the clock on and lets the session look again.
  std::string After(long long ms) {
    mClock.Advance(ms);
    Dstring reply;
    return Shown(mScpi.Tick(reply), reply);
  }
};

// *OPC? parks until the run has synchronised (500 ms), not a millisecond sooner; the registers
// latch what the transition filters let through and sum up in the status byte.
TEST_F(SimScpiStatusTest, OpcQueryWaitsForTheSynchronisationAndTheRegistersFollowTheStates) {
  EXPECT_EQ(Send("STAT:OPER:ENAB 256;STAT:OPER:NTR 256;STAT:OPER:PTR 0;STATus:QUEStionable:ENABle 32;*SRE 136"), "<none>");
  EXPECT_EQ(Send("SGEN:GLOB:INIT:CONT ON;STAT:QUES:COND?;*OPC?;*IDN?"), "<waiting>");
  EXPECT_EQ(After(499), "<waiting>");
  EXPECT_EQ(After(1), "32;1;Corvane,71300 qensim,0," QENSIM_TEST_VERSION) << "the PLL relocks after the start";
  EXPECT_EQ(Send("*STB?;STAT:OPER:COND?;STAT:OPER?;STAT:OPER:EVEN?;STAT:QUES:COND?;*STB?"), "200;16;256;0;0;72");
  EXPECT_EQ(Send("STAT:QUES?;*STB?;*CLS;STAT:OPER?"), "32;0;0");
  EXPECT_EQ(Send("STAT:PRES;STAT:OPER:ENAB?;STAT:OPER:PTR?;STAT:OPER:NTR?;STAT:QUES:ENAB?"), "0;32767;0;0");
  EXPECT_EQ(Send("STAT:OPER:ENAB 32768;STAT:OPER:PTR -1;STAT:OPER:NTR 32767;STAT:OPER:NTR?"), "32767");
  EXPECT_EQ(Send("SYST:ERR:COUN?;SYST:ERR:ALL?;SYST:ERR:COUN?;SYST:ERR:ALL?"),
            "2;-222,\"Data out of range\",-222,\"Data out of range\";0;0,\"No error\"");
}

// *OPC sets its bit when the operations end; *WAI holds the rest of the message until then.
TEST_F(SimScpiStatusTest, OpcAndWaiWaitForASelfTest) {
  EXPECT_EQ(Send("*ESR?;SYST:TEST:STAR;*OPC;*ESR?"), "128;0");
  EXPECT_EQ(Send("*WAI;SYST:TEST:STAT?"), "<waiting>");
  EXPECT_EQ(After(2999), "<waiting>");
  EXPECT_EQ(After(1), "DONE,5,5");
  EXPECT_EQ(Send("*ESR?;*OPC;*ESR?;*OPC?"), "1;1;1");
}

TEST_F(SimScpiStatusTest, PowerOnIsSeenOnceAndResetStopsAndRestoresTheSetting) {
  SimScpiSession later(mSim, kScpi + 1);
  EXPECT_EQ(Send(later, "*ESR?"), "0");
  EXPECT_EQ(Send("SGEN:GLOB:INIT:CONT ON;CGR1:PER 2E-9;SYST:DESK:STAR;*RST;SGEN:GLOB:INIT:CONT?;CGR1:PER?;"
                 "SYST:DESK:STAT?"),
            "OFF;1.000000000000E-09;IDLE,0,0");
  EXPECT_EQ(Send("*OPT?"), "K2268A,K2269B,K2270A,K2268B,K2270A");
}

}  // namespace
