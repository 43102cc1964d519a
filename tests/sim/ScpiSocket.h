#pragma once

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "common/Loopback.h"
#include "common/SimProcess.h"

// A qensim of this build with its SCPI socket on a free port.
class ScpiSim {
 public:
  explicit ScpiSim(std::vector<std::string> args = {})
      : mScpiPort(FreeLoopbackPort()), mProcess(WithScpi(std::move(args), mScpiPort)) {}

  unsigned short ScpiPort() const { return mProcess.Port() == 0 ? 0 : mScpiPort; }
  unsigned short Port() const { return mProcess.Port(); }

 private:
  static std::vector<std::string> WithScpi(std::vector<std::string> args, unsigned short port) {
    args.insert(args.end(), {"--scpi-port", std::to_string(port)});
    return args;
  }

  unsigned short mScpiPort;
  SimProcess mProcess;
};

// One client of the SCPI socket. Every wait ends after a few seconds: a reply that does not come
// reads as "<time-out>".
class ScpiSocket {
 public:
  explicit ScpiSocket(unsigned short port) : mFd(ConnectLoopback(port, false)) {}
  ~ScpiSocket() {
    if (mFd >= 0) close(mFd);
  }
  ScpiSocket(const ScpiSocket&) = delete;
  ScpiSocket& operator=(const ScpiSocket&) = delete;

  bool Ok() const { return mFd >= 0; }

  bool Send(const std::string& bytes) {
    for (std::size_t at = 0; at < bytes.size();) {
      ssize_t n = send(mFd, bytes.data() + at, bytes.size() - at, MSG_NOSIGNAL);
      if (n <= 0) return false;
      at += static_cast<std::size_t>(n);
    }
    return true;
  }

  // The next line without its terminator, or "<time-out>" when none comes within `ms`.
  std::string Line(int ms = 10000) {
    std::size_t end;
    while ((end = mIn.find('\n')) == std::string::npos) {
      if (!Fill(ms)) return "<time-out>";
    }
    std::string line = mIn.substr(0, end);
    mIn.erase(0, end + 1);
    return line;
  }

  // A response that is one definite-length block, header included, without its terminator;
  // "<time-out>" when it does not come whole.
  std::string BlockResponse(int ms = 10000) {
    while (mIn.size() < 2 && Fill(ms)) {
    }
    const std::size_t digits = mIn.size() >= 2 && mIn[0] == '#' ? static_cast<std::size_t>(mIn[1] - '0') : 0;
    while (mIn.size() < 2 + digits && Fill(ms)) {
    }
    if (digits == 0 || digits > 9 || mIn.size() < 2 + digits) return "<time-out>";
    const std::size_t total = 2 + digits + std::strtoul(mIn.substr(2, digits).c_str(), nullptr, 10);
    while (mIn.size() <= total && Fill(ms)) {
    }
    if (mIn.size() <= total || mIn[total] != '\n') return "<time-out>";
    std::string block = mIn.substr(0, total);
    mIn.erase(0, total + 1);
    return block;
  }

  // Sends one message and reads its response line.
  std::string Query(const std::string& message, int ms = 10000) {
    return Send(message + "\n") ? Line(ms) : "<send failed>";
  }

  // True when nothing at all arrives within `ms`.
  bool Silent(int ms) { return mIn.empty() && !Fill(ms); }

 private:
  bool Fill(int ms) {
    pollfd p{mFd, POLLIN, 0};
    if (poll(&p, 1, ms) != 1) return false;
    char buf[1 << 16];
    ssize_t n = recv(mFd, buf, sizeof buf, 0);
    if (n <= 0) return false;
    mIn.append(buf, static_cast<std::size_t>(n));
    return true;
  }

  int mFd = -1;
  std::string mIn;
};
