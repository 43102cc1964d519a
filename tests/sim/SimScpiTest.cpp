#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "SimFixture.h"
#include "SimScpiReader.h"
#include "SimScpiSession.h"

namespace {

// The messages a stream yields, fed in pieces of `piece` bytes; "!" stands for an overrun.
std::vector<std::string> Messages(const std::string& stream, std::size_t piece) {
  SimScpiReader reader;
  std::vector<std::string> out;
  for (std::size_t at = 0; at < stream.size(); at += piece) {
    reader.Feed(stream.data() + at, std::min(piece, stream.size() - at));
    std::string message;
    for (SimScpiReader::Result r; (r = reader.Next(message)) != SimScpiReader::Result::None;) {
      out.push_back(r == SimScpiReader::Result::Overrun ? "!" : message);
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
                    StreamCase{"X,#2a\nY\n", {"X,#2a", "Y"}}));

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

  // The response of one message, or "<none>".
  std::string Send(SimScpiSession& session, const std::string& message) {
    Dstring reply;
    return session.Execute(message, reply) ? std::string(reply) : std::string("<none>");
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
                              {"FOO?", "<none>"}, {"*RST BAD", "<none>"}, {"*ESR?", "176"},
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
  EXPECT_EQ(Send("EDIT:SEGM:CRE? \"scpi/locked\",MEM"), "<none>");
  EXPECT_EQ(Send("EDIT:SEGM:OPEN? \"scpi/locked\""), "<none>");
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
