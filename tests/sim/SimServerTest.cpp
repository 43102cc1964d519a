#include <gtest/gtest.h>

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>
#include <csignal>

#include "ScpiSocket.h"
#include "common/SimProcess.h"
#include "instrument/Frame.h"
#include "instrument/QenStatus.h"
#include "instrument/QenTcpInstrument.h"

namespace {

class SimServerTest : public ::testing::Test {
 protected:
  static std::vector<std::string> Args() {
    return {"--test-control", "--data-dir", ::testing::TempDir() + "qensim-data"};
  }

  SimServerTest() : mSim(Args()) {}

  void SetUp() override {
    ASSERT_NE(mSim.Port(), 0);
    for (QenTcpInstrument* c : {&mA, &mB}) ASSERT_EQ(c->Connect("127.0.0.1", mSim.Port()), QenStatus::kOk);
  }

  // The status of a call, with its reply in mReply.
  int Call(QenTcpInstrument& c, const char* cmd) { return c.Call(cmd, mReply); }

  // Sends raw bytes on a fresh socket and reports whether the server then closes it.
  bool ServerCloses(const std::string& bytes) {
    int fd = socket(AF_INET, SOCK_STREAM, 0);
    sockaddr_in addr{};
    addr.sin_family = AF_INET;
    addr.sin_port = htons(mSim.Port());
    addr.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    bool closed = connect(fd, reinterpret_cast<sockaddr*>(&addr), sizeof addr) == 0 &&
                  send(fd, bytes.data(), bytes.size(), MSG_NOSIGNAL) == static_cast<ssize_t>(bytes.size());
    pollfd p{fd, POLLIN, 0};
    char c = 0;
    // A close with unread input may arrive as a reset rather than an end of stream.
    closed = closed && poll(&p, 1, 10000) == 1 && recv(fd, &c, 1, 0) <= 0;
    close(fd);
    return closed;
  }

  SimProcess mSim;
  QenTcpInstrument mA;
  QenTcpInstrument mB;
  Dstring mReply;
};

TEST_F(SimServerTest, TwoClientsShareTheInstrumentUntilItIsLocked) {
  ASSERT_EQ(Call(mA, ":QEN:INST:HAND:CRE? _H,\"PSX\",\"SIM\""), 0);
  EXPECT_EQ(mReply, "_H");
  ASSERT_EQ(Call(mB, ":QEN:INST:HAND:CRE? _H,\"PSX\",\"SIM\""), 0);
  EXPECT_EQ(mReply, "_HA");
  EXPECT_EQ(Call(mA, ":_H:CGR1:PER 2E-9"), 0);
  EXPECT_EQ(Call(mB, ":_HA:DFL?"), 0);
  EXPECT_EQ(mReply, "\":_HA:CGR1:FREQ\",\":_HA:CGR1:PER\",\":_HA:SGEN:GLOB:PLL:STAT\"");

  EXPECT_EQ(Call(mA, ":TEST:LOCK ON"), 0);
  for (QenTcpInstrument* c : {&mA, &mB}) {
    EXPECT_EQ(Call(*c, ":_H:CGR1:PER?"), QenStatus::kLocked);
    EXPECT_EQ(mReply, "");
  }
  EXPECT_EQ(Call(mB, ":TEST:LOCK OFF"), 0);
  EXPECT_EQ(Call(mB, ":_HA:CGR1:PER?;:_HA:FOO"), 1);
  EXPECT_EQ(mReply, "2.000000000000E-09");
}

TEST_F(SimServerTest, ADelayedReplyHoldsUpNobodyElse) {
  EXPECT_EQ(Call(mA, ":TEST:DELAY 3000"), 0);
  mA.SetReplyTimeoutMs(300);
  EXPECT_EQ(Call(mA, ":QEN:INST:HAND:CRE? _A,\"PSX\",\"SIM\""), QenStatus::kTimeOut);
  EXPECT_EQ(Call(mB, ":QEN:INST:HAND:CRE? _B,\"PSX\",\"SIM\""), 0);
  EXPECT_EQ(mReply, "_B");
  mA.SetReplyTimeoutMs(10000);
  EXPECT_EQ(Call(mA, ":_A:TRIG:MODE?"), 0);
  EXPECT_EQ(mReply, "SEQ");
}

TEST_F(SimServerTest, BrokenStreamsCloseOnlyTheirOwnConnection) {
  struct Case {
    const char* what;
    FrameHeader header;
    std::string payload;
    const char* magic;
  };
  const Case cases[] = {
      {"oversized header", {FrameHeader::kRequest, 0, 1, 0, FrameHeader::kMaxPayload + 1}, "", "QN"},
      {"bad magic", {FrameHeader::kRequest, 0, 1, 0, 4}, "abcd", "XY"},
      {"reply type", {FrameHeader::kReply, 0, 1, 0, 0}, "", "QN"},
      {"unknown flags", {FrameHeader::kRequest, 2, 1, 0, 0}, "", "QN"},
      {"progress from a client", {FrameHeader::kProgress, 0, 1, 0, 0}, "", "QN"},
  };
  for (const Case& c : cases) {
    std::string bytes(FrameHeader::kSize, '\0');
    EncodeFrameHeader(c.header, reinterpret_cast<unsigned char*>(bytes.data()));
    bytes.replace(0, 2, c.magic);
    EXPECT_TRUE(ServerCloses(bytes + c.payload)) << c.what;
    EXPECT_EQ(Call(mA, ":QEN:INST:HAND:CRE? _H,\"PSX\",\"SIM\""), 0) << c.what;
  }
  EXPECT_TRUE(ServerCloses("GET / HTTP/1.0\r\n\r\n"));
  EXPECT_EQ(Call(mB, ":_H:TRIG:MODE?"), 0);
}

TEST_F(SimServerTest, DropAndOversizedRepliesEndTheClientsConnection) {
  EXPECT_EQ(Call(mA, ":TEST:DROP"), QenStatus::kServerTerminated);
  EXPECT_EQ(Call(mB, ":TEST:BIG 17000000"), QenStatus::kFrameTooLarge);
  ASSERT_EQ(mA.Connect("127.0.0.1", mSim.Port()), QenStatus::kOk);
  EXPECT_EQ(Call(mA, ":TEST:BIG 16"), 0);
  EXPECT_EQ(mReply, "0123456789012345");
}

TEST_F(SimServerTest, DieAndTerminateBothExitWithZero) {
  EXPECT_EQ(Call(mA, ":TEST:DIE"), QenStatus::kServerTerminated);
  EXPECT_EQ(mSim.WaitForExit(10000), 0);

  SimProcess other(Args());
  ASSERT_NE(other.Port(), 0);
  ASSERT_EQ(kill(other.Pid(), SIGTERM), 0);
  EXPECT_EQ(other.WaitForExit(10000), 0);
}

}  // namespace

namespace {

// Sends `bytes` on a fresh socket to `port`, closes the sending side and reads until the server
// closes: what a client such as `nc -q1` gets.
std::string SendAndHalfClose(unsigned short port, const std::string& bytes) {
  int fd = socket(AF_INET, SOCK_STREAM, 0);
  sockaddr_in addr{};
  addr.sin_family = AF_INET;
  addr.sin_port = htons(port);
  addr.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  std::string got;
  if (connect(fd, reinterpret_cast<sockaddr*>(&addr), sizeof addr) == 0 &&
      send(fd, bytes.data(), bytes.size(), MSG_NOSIGNAL) == static_cast<ssize_t>(bytes.size()) &&
      shutdown(fd, SHUT_WR) == 0) {
    char buf[4096];
    pollfd p{fd, POLLIN, 0};
    for (ssize_t n = 1; n > 0 && poll(&p, 1, 10000) == 1;) {
      n = recv(fd, buf, sizeof buf, 0);
      if (n > 0) got.append(buf, static_cast<std::size_t>(n));
    }
  }
  close(fd);
  return got;
}

}  // namespace

TEST_F(SimServerTest, EveryReplyQueuedBeforeTheClientsHalfCloseIsSentBeforeTheClose) {
  FrameHeader delay{FrameHeader::kRequest, 0, 1, 0, 0};
  FrameHeader query{FrameHeader::kRequest, 0, 2, 0, 0};
  const std::string got = SendAndHalfClose(
      mSim.Port(), EncodeFrame(delay, ":TEST:DELAY 300,1") + EncodeFrame(query, ":QEN:INST:HAND:CRE? _Q,\"PSX\",\"Q\""));
  FrameDecoder decoder;
  decoder.Feed(got.data(), got.size());
  FrameHeader header;
  std::string payload;
  ASSERT_TRUE(decoder.Next(header, payload));
  EXPECT_EQ(header.id, 1u);
  ASSERT_TRUE(decoder.Next(header, payload)) << "the delayed reply came before the close";
  EXPECT_EQ(header.id, 2u);
  EXPECT_EQ(payload, "_Q");
}

TEST(SimScpiHalfClose, TheReplyToTheLastQueryArrivesWhenTheClientClosesItsSendingSide) {
  ScpiSim sim;
  ASSERT_NE(sim.ScpiPort(), 0);
  for (int run = 0; run < 20; ++run) {
    EXPECT_EQ(SendAndHalfClose(sim.ScpiPort(), "*IDN?\n").substr(0, 8), "Corvane,") << "run " << run;
  }
}
