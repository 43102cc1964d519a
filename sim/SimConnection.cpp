#include "SimConnection.h"

#include <sys/socket.h>
#include <unistd.h>
#include <cerrno>

namespace {

constexpr std::size_t kChunk = 65536;
// Read at most this much per turn, so one busy client cannot starve the others.
constexpr std::size_t kMaxPerTurn = 1024 * 1024;

bool WouldBlock() {
  return errno == EAGAIN || errno == EWOULDBLOCK || errno == EINTR;
}

}  // namespace

SimConnection::~SimConnection() {
  close(mFd);
}

bool SimConnection::Receive() {
  char buf[kChunk];
  for (std::size_t total = 0; total < kMaxPerTurn;) {
    ssize_t n = recv(mFd, buf, sizeof buf, 0);
    if (n == 0) return false;
    if (n < 0) return WouldBlock();
    if (mRpc) {
      mRpc->Feed(buf, static_cast<std::size_t>(n));
    } else if (mScpi) {
      mScpiReader.Feed(buf, static_cast<std::size_t>(n));
    } else {
      mDecoder.Feed(buf, static_cast<std::size_t>(n));
    }
    total += static_cast<std::size_t>(n);
  }
  return true;
}

bool SimConnection::Flush() {
  while (mSent < mOut.size()) {
    ssize_t n = send(mFd, mOut.data() + mSent, mOut.size() - mSent, MSG_NOSIGNAL);
    if (n < 0) return WouldBlock();
    mSent += static_cast<std::size_t>(n);
  }
  mOut.clear();
  mSent = 0;
  return true;
}
