// The simulated capture: what the analysers record of the sequence their generators play,
// the errors injected into it, and a capture that is refused or cancelled.
#include <gtest/gtest.h>

#include <sstream>
#include <vector>

#include "SimFixture.h"

namespace {

constexpr const char* kPort = ":CGR1:MOD3:CONN1";   // receives :CGR1:MOD1:CONN1
constexpr const char* kOther = ":CGR1:MOD3:CONN2";  // receives :CGR1:MOD1:CONN2

class SimCaptureTest : public SimFixture {
 protected:
  SimCaptureTest() {
    // "S": 4 traces of 16 vectors, trace t high on vectors v with bit t of v set.
    const std::string n = Text(":_H:EDIT:SEGM:OPEN? \"S\"");
    const std::string segm = ":_H:EDIT:SEGM" + n + ":PATT:";
    Text(segm + "MOD:INS 0,TRAC,BEF,4;" + segm + "MOD:INS 0,VECT,BEF,16");
    std::string rows;
    for (int t = 0; t < 4; ++t) {
      unsigned bits = 0;
      for (int v = 0; v < 16; ++v) bits |= ((v >> t) & 1u) << (15 - v);
      rows += static_cast<char>(bits >> 8);
      rows += static_cast<char>(bits & 0xFF);
    }
    Text(segm + "DATA 0,0,3,15,#500008" + rows);
    std::string block = "(BLOCK,0,32,0,\"\",SYNC,\"S\",0,0,PAUSE1,0,0";
    for (int port = 2; port < 10; ++port) block += ",PAUSE,0,0";
    Text(":_H:SGEN:GLOB:SEQ (3.0,\"\"," + block + "))");
    Text(":_H:CAPT:PACE 0");
    Text(std::string(":_H") + kPort + ":BER:INJ 1E-12");
  }

  void Capture(long depth) {
    Text(":_H:MEAS:CAPT:DEPT " + std::to_string(depth));
    Text(":_H:SGEN:GLOB:INIT:CONT ON");
    Text(":_H:CAPT:STAR");
    EXPECT_EQ(Text(":_H:CAPT:STAT?").substr(0, 4), "DONE");
  }
  // A block reply without its header "#5nnnnn".
  std::string Bits(const std::string& port, const char* what, long start, long count) {
    const std::string reply =
        Text(":_H" + port + ":CAPT:" + what + "? " + std::to_string(start) + "," + std::to_string(count));
    return reply.substr(7);
  }
  static bool BitAt(const std::string& block, std::size_t rowBytes, long trace, long vector) {
    return (static_cast<unsigned char>(block[trace * rowBytes + vector / 8]) >> (7 - vector % 8)) & 1;
  }
};

TEST_F(SimCaptureTest, RecordsWhatTheGeneratorPlaysUnderTheSequence) {
  EXPECT_EQ(Text(std::string(":_H") + kPort + ":CAPT:SIZE?"), "0,0");
  Capture(96);
  EXPECT_EQ(Text(std::string(":_H") + kPort + ":CAPT:SIZE?"), "96,4");
  const std::string data = Bits(kPort, "DATA", 3, 90);
  ASSERT_EQ(data.size(), 4u * 12);
  for (long t = 0; t < 4; ++t) {
    for (long v = 0; v < 90; ++v) ASSERT_EQ(BitAt(data, 12, t, v), (((v + 3) % 16) >> t) & 1) << t << "," << v;
  }
  EXPECT_EQ(Bits(kPort, "ERR", 0, 96), std::string(48, '\0'));
  // The other analyser hears PAUSE1: one trace, all high, the row's padding low.
  EXPECT_EQ(Text(std::string(":_H") + kOther + ":CAPT:SIZE?"), "96,1");
  EXPECT_EQ(Bits(kOther, "DATA", 0, 12), "\xFF\xF0");
}

TEST_F(SimCaptureTest, EachAnalyserReceivesWhatTheConnectionTableSaysAndAnUndrivenOneALowLine) {
  Text(":_H:CONF:CONN:DEL \":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN1\"");
  Text(":_H:CONF:CONN:DEL \":CGR1:MOD1:CONN2\",\":CGR1:MOD3:CONN2\"");
  Text(":_H:CONF:CONN:ADD \":CGR1:MOD1:CONN1\",\":CGR1:MOD3:CONN2\"");
  Text(std::string(":_H") + kOther + ":BER:INJ 1E-12");
  Capture(64);
  EXPECT_EQ(Text(std::string(":_H") + kPort + ":CAPT:SIZE?"), "64,1");
  EXPECT_EQ(Bits(kPort, "DATA", 0, 64), std::string(8, '\0'));
  EXPECT_EQ(Text(std::string(":_H") + kOther + ":CAPT:SIZE?"), "64,4");
  const std::string data = Bits(kOther, "DATA", 0, 32);
  for (long t = 0; t < 4; ++t) {
    for (long v = 0; v < 32; ++v) ASSERT_EQ(BitAt(data, 4, t, v), ((v % 16) >> t) & 1) << t << "," << v;
  }
}

TEST_F(SimCaptureTest, ErrorsAreTheBitsThatDifferFromWhatWasSentAtTheInjectedRatio) {
  Text(std::string(":_H") + kPort + ":BER:INJ 1E-2");
  Capture(16384);
  const std::string data = Bits(kPort, "DATA", 0, 16384);
  const std::string errors = Bits(kPort, "ERR", 0, 16384);
  long count = 0;
  for (long t = 0; t < 4; ++t) {
    for (long v = 0; v < 16384; ++v) {
      const bool error = BitAt(errors, 2048, t, v);
      count += error;
      ASSERT_EQ(BitAt(data, 2048, t, v) != error, ((v % 16) >> t) & 1) << t << "," << v;
    }
  }
  EXPECT_GT(count, 500);  // 655 expected
  EXPECT_LT(count, 820);
}

TEST_F(SimCaptureTest, ARefusedOrCancelledCaptureLeavesTheLastOne) {
  Reply(":_H:CAPT:STAR");
  EXPECT_EQ(Text(":_H:SYST:ERR?").substr(0, 4), "-221");
  Capture(64);
  Text(":_H:MEAS:CAPT:DEPT 128");
  Text(":_H:CAPT:PACE 1000");
  Text(":_H:CAPT:STAR");
  mClock.Advance(1500);
  EXPECT_EQ(Text(":_H:CAPT:STAT?"), "RUNN,1,4");
  Text(":_H:CAPT:ABOR");
  EXPECT_EQ(Text(std::string(":_H") + kPort + ":CAPT:SIZE?"), "64,4");
  mClock.Advance(5000);
  EXPECT_EQ(Text(std::string(":_H") + kPort + ":CAPT:SIZE?"), "64,4");
}

TEST_F(SimCaptureTest, ReadsOutsideTheCaptureAreRefused) {
  Capture(64);
  const std::pair<const char*, const char*> kCases[] = {
      {"DATA? 60,5", "-222"}, {"DATA? 0,0", "-222"}, {"ERR? -1,4", "-222"}, {"DATA? 0", "-104"}, {"DATA? \"x\",1", "-104"},
      {"SIZE 1", "-113"}};
  for (const auto& [command, error] : kCases) {
    Reply(std::string(":_H") + kPort + ":CAPT:" + command);
    EXPECT_EQ(Text(":_H:SYST:ERR?").substr(0, 4), error) << command;
  }
}

// The error state by channel: one count per trace the port receives, adding up to the port's
// error count at every moment, and starting afresh with the port's counts.
TEST_F(SimCaptureTest, ChannelErrorsShareOutThePortsErrors) {
  const std::string port = std::string(":_H") + kPort;
  auto channels = [&] {
    std::vector<double> counts;
    std::istringstream reply(Text(port + ":BER:CHAN?"));
    for (std::string count; std::getline(reply, count, ',');) counts.push_back(std::stod(count));
    return counts;
  };
  auto errors = [&] {
    const std::string reply = Text(port + ":BER?");
    return std::stod(reply.substr(reply.find(',') + 1));
  };
  Text(":_H:SGEN:GLOB:INIT:CONT ON");
  Text(port + ":BER:INJ 1E-4");
  for (int step = 0; step < 3; ++step) {
    mClock.Advance(700);
    const std::vector<double> counts = channels();
    ASSERT_EQ(counts.size(), 4u);
    double sum = 0;
    for (double c : counts) {
      EXPECT_GT(c, 0);
      sum += c;
    }
    EXPECT_EQ(sum, errors());
  }
  Text(port + ":BER:RES");
  EXPECT_EQ(channels(), std::vector<double>(4, 0.0));
  // A port of the other group receives nothing but pauses: one channel.
  EXPECT_EQ(Text(":_H:CGR2:MOD2:CONN1:BER:CHAN?").find(','), std::string::npos);
  Reply(port + ":BER:CHAN 1");
  EXPECT_EQ(Text(":_H:SYST:ERR?").substr(0, 4), "-200");
}

}  // namespace

