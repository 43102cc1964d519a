#include "SimPortMapperClient.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>
#include <cerrno>
#include <cstring>

#include "SimRpcRecordReader.h"
#include "SimVxi11Channel.h"
#include "SimXdrReader.h"
#include "SimXdrWriter.h"

namespace {

constexpr std::uint32_t kSet = 1;
constexpr std::uint32_t kUnset = 2;
constexpr std::uint32_t kTcp = 6;
constexpr std::uint32_t kXid = 0x716E7331;

// A descriptor closed at the end of the scope.
class Socket {
 public:
  Socket() : mFd(socket(AF_INET, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0)) {}
  ~Socket() {
    if (mFd >= 0) close(mFd);
  }
  Socket(const Socket&) = delete;
  Socket& operator=(const Socket&) = delete;
  int Fd() const { return mFd; }

 private:
  int mFd;
};

bool Wait(int fd, short events) {
  pollfd p{fd, events, 0};
  return poll(&p, 1, SimPortMapperClient::kTimeoutMs) == 1 && (p.revents & events) != 0;
}

bool Fail(Dstring& why, const char* what) {
  why = what;
  return false;
}

}  // namespace

bool SimPortMapperClient::Register(bool set, unsigned short vxi11Port, Dstring& why) {
  Socket s;
  sockaddr_in addr{};
  addr.sin_family = AF_INET;
  addr.sin_port = htons(kPort);
  addr.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  if (s.Fd() < 0) return Fail(why, std::strerror(errno));
  if (connect(s.Fd(), reinterpret_cast<sockaddr*>(&addr), sizeof addr) != 0 && errno != EINPROGRESS) {
    return Fail(why, std::strerror(errno));
  }
  int error = 0;
  socklen_t length = sizeof error;
  if (!Wait(s.Fd(), POLLOUT)) return Fail(why, "no answer");
  getsockopt(s.Fd(), SOL_SOCKET, SO_ERROR, &error, &length);
  if (error != 0) return Fail(why, std::strerror(error));

  SimXdrWriter call;
  call.Uint(kXid).Uint(0).Uint(2).Uint(SimVxi11Channel::kPortMapperProgram).Uint(SimVxi11Channel::kPortMapperVersion);
  call.Uint(set ? kSet : kUnset).Uint(0).Opaque({}).Uint(0).Opaque({});
  call.Uint(SimVxi11Channel::kDeviceCoreProgram).Uint(SimVxi11Channel::kDeviceCoreVersion).Uint(kTcp).Uint(vxi11Port);
  const std::string bytes = SimRpcRecordReader::Mark(call.Bytes());
  if (send(s.Fd(), bytes.data(), bytes.size(), MSG_NOSIGNAL) != static_cast<ssize_t>(bytes.size())) {
    return Fail(why, "the call could not be sent");
  }
  SimRpcRecordReader records;
  std::string reply;
  for (SimRpcRecordReader::Result r; (r = records.Next(reply)) != SimRpcRecordReader::Result::Record;) {
    if (r == SimRpcRecordReader::Result::TooLarge) return Fail(why, "a reply that is not one");
    char buf[512];
    const ssize_t n = Wait(s.Fd(), POLLIN) ? recv(s.Fd(), buf, sizeof buf, 0) : -1;
    if (n <= 0) return Fail(why, "no reply");
    records.Feed(buf, static_cast<std::size_t>(n));
  }
  SimXdrReader in(reply);
  const bool matches = in.Uint() == kXid && in.Uint() == 1;
  const bool accepted = in.Uint() == 0;
  in.Uint();
  in.Opaque(400);
  const bool success = in.Uint() == 0;
  const bool taken = in.Uint() != 0;
  if (in.Failed() || !matches) return Fail(why, "a reply that is not one");
  if (!accepted || !success) return Fail(why, "the call was refused");
  if (!taken) return Fail(why, set ? "the port mapper did not take it" : "it was not registered");
  return true;
}
