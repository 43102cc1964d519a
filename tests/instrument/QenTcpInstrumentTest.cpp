#include <gtest/gtest.h>

#include <arpa/inet.h>
#include <functional>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <thread>
#include <unistd.h>

#include "common/Loopback.h"
#include "common/SimProcess.h"
#include <algorithm>

#include "instrument/AppHandle.h"
#include "instrument/QenGuiInst.h"
#include "instrument/QenStatus.h"
#include "instrument/QenTcpInstrument.h"

namespace {

// A one-connection server on a loopback port whose behaviour each test scripts, for the
// misbehaviour a real server never shows.
class ScriptedServer {
 public:
  using Script = std::function<void(int fd)>;

  explicit ScriptedServer(Script script) {
    mListen = BindLoopback(mPort);
    listen(mListen, 1);
    mThread = std::thread([this, script] {
      pollfd p{mListen, POLLIN, 0};
      if (poll(&p, 1, 5000) != 1) return;
      int fd = accept(mListen, nullptr, nullptr);
      script(fd);
      close(fd);
    });
  }
  ~ScriptedServer() {
    mThread.join();
    close(mListen);
  }
  unsigned short Port() const { return mPort; }

  // Reads one request frame; returns its id.
  static std::uint32_t ReadRequest(int fd) {
    FrameDecoder decoder;
    FrameHeader h;
    std::string body;
    char buf[4096];
    while (!decoder.Next(h, body)) {
      pollfd p{fd, POLLIN, 0};
      if (poll(&p, 1, 5000) != 1) return 0;
      ssize_t n = recv(fd, buf, sizeof buf, 0);
      if (n <= 0) return 0;
      decoder.Feed(buf, static_cast<std::size_t>(n));
    }
    return h.id;
  }
  static void Send(int fd, const std::string& bytes) { send(fd, bytes.data(), bytes.size(), MSG_NOSIGNAL); }
  static std::string Reply(std::uint32_t id, const std::string& text, int status = 0) {
    FrameHeader h;
    h.type = FrameHeader::kReply;
    h.id = id;
    h.status = status;
    return EncodeFrame(h, text);
  }

 private:
  int mListen = -1;
  unsigned short mPort = 0;
  std::thread mThread;
};

int CallOnce(ScriptedServer& server, Dstring& reply, QenTcpInstrument& client) {
  client.SetReplyTimeoutMs(2000);
  EXPECT_EQ(client.Connect("127.0.0.1", server.Port()), 0);
  return client.Call(":_H:X?", reply);
}

}  // namespace

TEST(QenTcpInstrumentScripted, StaleRepliesAreDroppedAndPiecesJoined) {
  ScriptedServer server([](int fd) {
    auto id = ScriptedServer::ReadRequest(fd);
    std::string frames = ScriptedServer::Reply(id + 100, "stale") + ScriptedServer::Reply(id, "fresh", 2);
    for (char c : frames) ScriptedServer::Send(fd, std::string(1, c));
  });
  QenTcpInstrument client;
  Dstring reply;
  EXPECT_EQ(CallOnce(server, reply, client), 2);
  EXPECT_EQ(reply, "fresh");
}

TEST(QenTcpInstrumentScripted, GarbageBreaksTheConnection) {
  ScriptedServer server([](int fd) {
    ScriptedServer::ReadRequest(fd);
    ScriptedServer::Send(fd, std::string(16, 'G'));
  });
  QenTcpInstrument client;
  Dstring reply;
  EXPECT_EQ(CallOnce(server, reply, client), QenStatus::kProtocolError);
  EXPECT_FALSE(client.IsConnected());
  EXPECT_EQ(client.Call(":_H:X?", reply), QenStatus::kServerTerminated);
}

TEST(QenTcpInstrumentScripted, OversizedReplyIsRefusedBeforeItsBody) {
  ScriptedServer server([](int fd) {
    auto id = ScriptedServer::ReadRequest(fd);
    std::string header = ScriptedServer::Reply(id, "");
    header[12] = 0x01;
    header[15] = 0x01;  // 16 MiB + 1
    ScriptedServer::Send(fd, header);
  });
  QenTcpInstrument client;
  Dstring reply;
  EXPECT_EQ(CallOnce(server, reply, client), QenStatus::kFrameTooLarge);
  EXPECT_FALSE(client.IsConnected());
}

TEST(QenTcpInstrumentScripted, SilentServerTimesOut) {
  ScriptedServer server([](int fd) {
    ScriptedServer::ReadRequest(fd);
    ScriptedServer::ReadRequest(fd);  // holds the connection until the client goes
  });
  QenTcpInstrument client;
  client.SetReplyTimeoutMs(200);
  ASSERT_EQ(client.Connect("127.0.0.1", server.Port()), 0);
  Dstring reply;
  EXPECT_EQ(client.Call(":_H:X?", reply), QenStatus::kTimeOut);
  EXPECT_TRUE(client.IsConnected());
  client.Disconnect();
}

TEST(QenTcpInstrumentScripted, ClosedConnectionIsServerTerminated) {
  ScriptedServer server([](int fd) { ScriptedServer::ReadRequest(fd); });
  QenTcpInstrument client;
  Dstring reply;
  EXPECT_EQ(CallOnce(server, reply, client), QenStatus::kServerTerminated);
}

TEST(QenTcpInstrumentScripted, NothingListeningIsConnectFailed) {
  unsigned short port;
  { ScriptedServer gone([](int) {}); port = gone.Port(); QenTcpInstrument c; c.Connect("127.0.0.1", port); }
  QenTcpInstrument client;
  client.SetConnectTimeoutMs(500);
  EXPECT_EQ(client.Connect("127.0.0.1", port), QenStatus::kConnectFailed);
  Dstring reply;
  EXPECT_EQ(client.Call(":_H:X?", reply), QenStatus::kNotConnected);
}

class QenTcpInstrumentSim : public testing::Test {
 protected:
  void SetUp() override {
    ASSERT_NE(mSim.Port(), 0) << "qensim did not start";
    ASSERT_EQ(mClient.Connect("127.0.0.1", mSim.Port()), 0);
    mHandle = "_T";
    ConditionList list;
    ASSERT_EQ(mClient.Call(":QEN:INST:HAND:CRE? _T,\"PSX\",\"T\"", mHandle), 0);
  }
  Dstring Query(const char* header, int* status = nullptr) {
    Dstring reply;
    int s = mClient.Call(Dstring::Format(":%s%s", mHandle.c_str(), header), reply);
    if (status) *status = s;
    return reply;
  }
  SimProcess mSim;
  QenTcpInstrument mClient;
  Dstring mHandle;
};

TEST_F(QenTcpInstrumentSim, LateReplyAfterATimeOutIsNotTakenForTheNext) {
  Dstring reply;
  ASSERT_EQ(mClient.Call(":TEST:DELAY 400", reply), 0);
  mClient.SetReplyTimeoutMs(100);
  int status = 0;
  Query(":TRIG:MODE?", &status);
  EXPECT_EQ(status, QenStatus::kTimeOut);
  mClient.SetReplyTimeoutMs(5000);
  EXPECT_EQ(Query(":SGEN:GLOB:INIT:CONT?", &status), "OFF");
  EXPECT_EQ(status, 0);
}

TEST_F(QenTcpInstrumentSim, DroppedConnectionIsServerTerminated) {
  Dstring reply;
  EXPECT_EQ(mClient.Call(":TEST:DROP", reply), QenStatus::kServerTerminated);
  EXPECT_EQ(mClient.Call(":TEST:DROP", reply), QenStatus::kServerTerminated);
}

TEST_F(QenTcpInstrumentSim, OversizedFramesAreRefusedBothWays) {
  Dstring reply;
  EXPECT_EQ(mClient.Call(Dstring(FrameHeader::kMaxPayload + 1, 'x'), reply), QenStatus::kFrameTooLarge);
  EXPECT_EQ(Query(":TRIG:MODE?"), "SEQ") << "a refused command must leave the connection usable";
  EXPECT_EQ(mClient.Call(Dstring::Format(":TEST:BIG %u", FrameHeader::kMaxPayload + 1), reply),
            QenStatus::kFrameTooLarge);
  EXPECT_FALSE(mClient.IsConnected());
}

TEST_F(QenTcpInstrumentSim, HeldLockGivesMinus19UntilReleased) {
  QenTcpInstrument other;
  ASSERT_EQ(other.Connect("127.0.0.1", mSim.Port()), 0);
  Dstring reply;
  ASSERT_EQ(other.Call(":TEST:LOCK ON", reply), 0);
  int status = 0;
  EXPECT_EQ(Query(":TRIG:MODE?", &status), "");
  EXPECT_EQ(status, QenStatus::kLocked);
  ASSERT_EQ(other.Call(":TEST:LOCK OFF", reply), 0);
  EXPECT_EQ(Query(":TRIG:MODE?", &status), "SEQ");
  EXPECT_EQ(status, 0);
}

TEST_F(QenTcpInstrumentSim, BlockOfAnyBytesTravelsUnchanged) {
  std::string bytes;
  for (int i = 0; i < 99999; ++i) bytes += static_cast<char>(i * 7 % 256);
  Dstring reply;
  int status = mClient.Call(Dstring(":TEST:ECHO #599999" + bytes), reply);
  ASSERT_EQ(status, 0);
  EXPECT_EQ(reply, "#599999" + bytes);
}

TEST(ServerDiscovery, FindsTheServersThatAnswerInTheOrderAsked) {
  SimProcess sim;
  ASSERT_NE(sim.Port(), 0);
  DstringList found;
  // 127.0.0.2 is loopback too, and nothing listens there.
  QenGuiInst::ListServerHostsAtPort(found, sim.Port(), 300, {"127.0.0.2", "127.0.0.1", "localhost"});
  EXPECT_EQ(found, DstringList({"127.0.0.1", "localhost"}));
  const DstringList candidates = QenGuiInst::CandidateHosts({"lab-pg", "127.0.0.1", " "});
  EXPECT_EQ(candidates.front(), "127.0.0.1");
  EXPECT_TRUE(candidates.Contains("lab-pg"));
  EXPECT_EQ(std::count(candidates.begin(), candidates.end(), "127.0.0.1"), 1);
}
