#include "SimConnection.h"

#include <netinet/in.h>
#include <netinet/tcp.h>
#include <sys/socket.h>
#include <sys/uio.h>
#include <unistd.h>
#include <algorithm>
#include <cerrno>

namespace {

constexpr std::size_t kChunk = 65536;
// Read at most this much per turn, so one busy client cannot starve the others.
constexpr std::size_t kMaxPerTurn = 1024 * 1024;
// Pieces below this are gathered into one; larger ones go out from where they were made.
constexpr std::size_t kWholePiece = 65536;
// Pieces handed to the socket in one call.
constexpr std::size_t kMaxPieces = 16;

// A client that writes and then asks, with Nagle on, holds its query back until the write is
// acknowledged; a delayed acknowledgement would cost it some 40 ms a pair. Linux drops the
// quick mode again on its own, so it is asked for after every read.
void AcknowledgeAtOnce(int fd) {
#ifdef TCP_QUICKACK
  int on = 1;
  setsockopt(fd, IPPROTO_TCP, TCP_QUICKACK, &on, sizeof on);
#else
  (void)fd;
#endif
}

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
    // Program messages are received where the reader keeps them: a block is not copied there.
    char* into = mScpi && !mRpc ? mScpiReader.Room(kChunk) : buf;
    ssize_t n = recv(mFd, into, kChunk, 0);
    if (into != buf) mScpiReader.Keep(kChunk, n > 0 ? static_cast<std::size_t>(n) : 0);
    if (n == 0) return false;
    if (n < 0) return WouldBlock();
    AcknowledgeAtOnce(mFd);
    if (mRpc) {
      mRpc->Feed(buf, static_cast<std::size_t>(n));
    } else if (!mScpi) {
      mDecoder.Feed(buf, static_cast<std::size_t>(n));
    }
    total += static_cast<std::size_t>(n);
  }
  return true;
}

void SimConnection::Queue(std::string bytes) {
  if (bytes.empty()) return;
  mPending += bytes.size();
  if (bytes.size() < kWholePiece && !mOut.empty() && mOut.back().size() < kWholePiece) {
    mOut.back().append(bytes);
  } else {
    mOut.push_back(std::move(bytes));
  }
}

bool SimConnection::Flush() {
  while (!mOut.empty()) {
    iovec pieces[kMaxPieces];
    const std::size_t count = std::min(kMaxPieces, mOut.size());
    for (std::size_t i = 0; i < count; ++i) {
      const std::size_t skip = i == 0 ? mSent : 0;
      pieces[i] = iovec{mOut[i].data() + skip, mOut[i].size() - skip};
    }
    msghdr message{};
    message.msg_iov = pieces;
    message.msg_iovlen = count;
    ssize_t n = sendmsg(mFd, &message, MSG_NOSIGNAL);
    if (n < 0) return WouldBlock();
    auto sent = static_cast<std::size_t>(n);
    mPending -= sent;
    while (sent > 0 && sent >= mOut.front().size() - mSent) {
      sent -= mOut.front().size() - mSent;
      mOut.pop_front();
      mSent = 0;
    }
    mSent += sent;
  }
  return true;
}

void SimConnection::Hold(SimScpiReader::Result result, std::string message) {
  mHeldBytes += message.size();
  mHeld.emplace_back(result, std::move(message));
}

bool SimConnection::TakeHeld(Held& held) {
  if (mHeld.empty()) return false;
  held = std::move(mHeld.front());
  mHeld.pop_front();
  mHeldBytes -= held.second.size();
  return true;
}

void SimConnection::DropHeld() {
  mHeld.clear();
  mHeldBytes = 0;
}
