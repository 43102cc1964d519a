// A client written from docs/protocol.md alone: frames built byte by byte, plain sockets,
// nothing of the project's own client. If the document and the server drift apart, this fails.
#include <gtest/gtest.h>

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdint>
#include <string>
#include <vector>

#include "common/SimProcess.h"

namespace {

class DocumentClient {
 public:
  explicit DocumentClient(unsigned short port) {
    mFd = socket(AF_INET, SOCK_STREAM, 0);
    sockaddr_in addr{};
    addr.sin_family = AF_INET;
    addr.sin_port = htons(port);
    addr.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    mConnected = connect(mFd, reinterpret_cast<sockaddr*>(&addr), sizeof addr) == 0;
  }
  ~DocumentClient() { close(mFd); }
  bool IsConnected() const { return mConnected; }

  // Sends one request; returns the reply's status and sets `payload`. -1000 for a broken reply.
  // With `progress`, the request asks for progress frames and their texts are kept there.
  int Request(const std::string& command, std::string& payload, std::vector<std::string>* progress = nullptr) {
    const std::uint32_t id = ++mId;
    if (!Send(1, progress ? 1 : 0, id, command)) return -1000;
    std::string header;
    for (;;) {
      if (!ReadBytes(16, header) || header.compare(0, 2, "QN") != 0 || header[3] != 0) return -1000;
      if (GetU32(header, 4) != id || !ReadBytes(GetU32(header, 12), payload)) return -1000;
      if (header[2] == 2) return static_cast<std::int32_t>(GetU32(header, 8));
      if (header[2] != 3 || !progress) return -1000;
      progress->push_back(payload);
    }
  }
  // Asks the server to stop the request `id`.
  bool Cancel(std::uint32_t id) { return Send(4, 0, id, ""); }
  std::uint32_t LastId() const { return mId; }

 private:
  bool Send(char type, char flags, std::uint32_t id, const std::string& payload) {
    std::string frame = {'Q', 'N', type, flags};
    PutU32(frame, id);
    PutU32(frame, 0);
    PutU32(frame, static_cast<std::uint32_t>(payload.size()));
    frame += payload;
    return send(mFd, frame.data(), frame.size(), MSG_NOSIGNAL) == static_cast<ssize_t>(frame.size());
  }
  static void PutU32(std::string& out, std::uint32_t v) {
    for (int shift = 24; shift >= 0; shift -= 8) out += static_cast<char>((v >> shift) & 0xFF);
  }
  static std::uint32_t GetU32(const std::string& in, std::size_t at) {
    std::uint32_t v = 0;
    for (std::size_t i = 0; i < 4; ++i) v = (v << 8) | static_cast<unsigned char>(in[at + i]);
    return v;
  }
  bool ReadBytes(std::size_t size, std::string& out) {
    out.clear();
    char buf[4096];
    while (out.size() < size) {
      pollfd p{mFd, POLLIN, 0};
      if (poll(&p, 1, 5000) != 1) return false;
      ssize_t n = recv(mFd, buf, std::min(sizeof buf, size - out.size()), 0);
      if (n <= 0) return false;
      out.append(buf, static_cast<std::size_t>(n));
    }
    return true;
  }

  int mFd = -1;
  bool mConnected = false;
  std::uint32_t mId = 0;
};

}  // namespace

TEST(ProtocolDocument, HandleParametersErrorQueueAndLock) {
  SimProcess sim;
  ASSERT_NE(sim.Port(), 0);
  DocumentClient client(sim.Port());
  ASSERT_TRUE(client.IsConnected());
  std::string reply;
  ASSERT_EQ(client.Request(":QEN:INST:HAND:CRE? _QEN1X,\"PSX\",\"QEN1\"", reply), 0);
  ASSERT_EQ(reply, "_QEN1X");
  EXPECT_EQ(client.Request(":_QEN1X:TRIG:MODE?", reply), 0);
  EXPECT_EQ(reply, "SEQ");
  EXPECT_EQ(client.Request(":_QEN1X:TRIG:MODE CLOC;:_QEN1X:TRIG:MODE?", reply), 0);
  EXPECT_EQ(reply, "CLOC");
  // The out-of-range write of the worked example: status 1, then the queue holds the error.
  EXPECT_EQ(client.Request(":_QEN1X:CGR1:PER 5", reply), 1);
  EXPECT_EQ(reply, "");
  EXPECT_EQ(client.Request(":_QEN1X:SYST:ERR?", reply), 0);
  EXPECT_EQ(reply, "-222,\"Data out of range\"");
  EXPECT_EQ(client.Request(":_QEN1X:SYST:ERR?", reply), 0);
  EXPECT_EQ(reply, "0,\"No error\"");

  DocumentClient other(sim.Port());
  ASSERT_EQ(other.Request(":TEST:LOCK ON", reply), 0);
  EXPECT_EQ(client.Request(":_QEN1X:TRIG:MODE?", reply), -19);
  EXPECT_EQ(reply, "");
  ASSERT_EQ(other.Request(":TEST:LOCK OFF", reply), 0);
  EXPECT_EQ(client.Request(":_QEN1X:TRIG:MODE?", reply), 0);
  EXPECT_EQ(client.Request(":QEN:INST:HAND:DEST _QEN1X", reply), 0);
}

TEST(ProtocolDocument, ProgressFramesComeBeforeTheReplyAndALateCancelIsIgnored) {
  SimProcess sim;
  ASSERT_NE(sim.Port(), 0);
  DocumentClient client(sim.Port());
  std::string reply;
  ASSERT_EQ(client.Request(":QEN:INST:HAND:CRE? _QEN1X,\"PSX\",\"QEN1\"", reply), 0);
  ASSERT_EQ(client.Request(":_QEN1X:EDIT:SEGM:CRE? \"Long\",MEM", reply), 0);
  const std::string segment = ":_QEN1X:EDIT:SEGM" + reply + ":PATT:MOD:INS 0,";
  ASSERT_EQ(client.Request(segment + "TRAC,BEF,1", reply), 0);
  std::vector<std::string> progress;
  EXPECT_EQ(client.Request(segment + "VECT,BEF,3145728", reply, &progress), 0);
  ASSERT_FALSE(progress.empty());
  EXPECT_EQ(progress.front(), "1048576,3145728");
  EXPECT_EQ(progress.back(), "3145728,3145728");
  ASSERT_TRUE(client.Cancel(client.LastId()));
  EXPECT_EQ(client.Request(":_QEN1X:EDIT:SEGM1:PATT:LENG?", reply), 0);
  EXPECT_EQ(reply, "3145728");
}
