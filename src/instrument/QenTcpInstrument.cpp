#include "instrument/QenTcpInstrument.h"

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <fcntl.h>
#include <netdb.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include "instrument/QenStatus.h"
#include "support/LgsDebug.h"

namespace {

long long NowMs() {
  using namespace std::chrono;
  return duration_cast<milliseconds>(steady_clock::now().time_since_epoch()).count();
}

int ConnectOne(const addrinfo* ai, long long deadline) {
  int fd = socket(ai->ai_family, ai->ai_socktype | SOCK_NONBLOCK | SOCK_CLOEXEC, ai->ai_protocol);
  if (fd < 0) return -1;
  if (connect(fd, ai->ai_addr, ai->ai_addrlen) == 0) return fd;
  if (errno == EINPROGRESS) {
    pollfd p{fd, POLLOUT, 0};
    long long left = deadline - NowMs();
    if (left > 0 && poll(&p, 1, static_cast<int>(left)) == 1) {
      int err = 0;
      socklen_t len = sizeof err;
      if (getsockopt(fd, SOL_SOCKET, SO_ERROR, &err, &len) == 0 && err == 0) return fd;
    }
  }
  close(fd);
  return -1;
}

}  // namespace

QenTcpInstrument::QenTcpInstrument() : mReplyTimeoutMs(GetDefaultReplyTimeoutMs()) {
  // A peer that vanishes must give EPIPE, not end the process.
  std::signal(SIGPIPE, SIG_IGN);
}

QenTcpInstrument::~QenTcpInstrument() { Disconnect(); }

int QenTcpInstrument::Connect(const Dstring& host, unsigned short port) {
  Disconnect();
  addrinfo hints{};
  hints.ai_family = AF_UNSPEC;
  hints.ai_socktype = SOCK_STREAM;
  addrinfo* found = nullptr;
  mConnectFailure = ConnectFailure::None;
  if (getaddrinfo(host.c_str(), std::to_string(port).c_str(), &hints, &found) != 0) {
    mConnectFailure = ConnectFailure::UnknownHost;
    return QenStatus::kConnectFailed;
  }
  const long long deadline = NowMs() + mConnectTimeoutMs;
  for (addrinfo* ai = found; ai && mFd < 0; ai = ai->ai_next) mFd = ConnectOne(ai, deadline);
  freeaddrinfo(found);
  if (mFd < 0) {
    mConnectFailure = ConnectFailure::NoAnswer;
    return QenStatus::kConnectFailed;
  }
  int on = 1;
  setsockopt(mFd, IPPROTO_TCP, TCP_NODELAY, &on, sizeof on);
  setsockopt(mFd, SOL_SOCKET, SO_KEEPALIVE, &on, sizeof on);
  mReceived = FrameDecoder{};
  return QenStatus::kOk;
}

int QenTcpInstrument::Disconnect() {
  if (mFd >= 0) close(mFd);
  mFd = -1;
  mLost = false;
  mReceived = FrameDecoder{};
  return QenStatus::kOk;
}

int QenTcpInstrument::Drop(int status) {
  Disconnect();
  mLost = true;
  return status;
}

int QenTcpInstrument::WaitFor(short events, long long deadline) {
  for (;;) {
    // Past the deadline the bytes may still be there (a modal dialog kept the waiter busy): one
    // look without waiting before it counts as a time-out.
    const long long left = std::max(0LL, deadline - NowMs());
    pollfd p{mFd, events, 0};
    int n = poll(&p, 1, static_cast<int>(left));
    if (n > 0) return QenStatus::kOk;
    if (n < 0 && errno != EINTR) return Drop(QenStatus::kServerTerminated);
    if (n == 0 && left == 0) return QenStatus::kTimeOut;
  }
}

int QenTcpInstrument::SendAll(const std::string& bytes, long long deadline) {
  std::size_t sent = 0;
  while (sent < bytes.size()) {
    ssize_t n = send(mFd, bytes.data() + sent, bytes.size() - sent, MSG_NOSIGNAL);
    if (n > 0) {
      sent += static_cast<std::size_t>(n);
    } else if (n < 0 && (errno == EAGAIN || errno == EWOULDBLOCK)) {
      // A half-sent frame cannot be taken back: the stream is out of step from here on.
      if (int status = WaitFor(POLLOUT, deadline); status != QenStatus::kOk) {
        return sent ? Drop(QenStatus::kServerTerminated) : status;
      }
    } else if (n < 0 && errno == EINTR) {
      continue;
    } else {
      return Drop(QenStatus::kServerTerminated);
    }
  }
  return QenStatus::kOk;
}

int QenTcpInstrument::ReadReply(std::uint32_t id, Dstring& reply, long long deadline) {
  char chunk[65536];
  FrameHeader header;
  std::string payload;
  for (;;) {
    while (mReceived.Next(header, payload)) {
      if (header.type == FrameHeader::kProgress) {
        // Progress of a call that timed out is old news.
        if (header.id != id || !mProgress) continue;
        if (int status = TakeProgress(id, payload, deadline); status != QenStatus::kOk) return status;
        continue;
      }
      if (header.type != FrameHeader::kReply) return Drop(QenStatus::kProtocolError);
      if (header.id != id) continue;  // the late answer to a call that timed out
      reply.assign(std::move(payload));
      return header.status;
    }
    if (mReceived.GetError() == FrameError::TooLarge) return Drop(QenStatus::kFrameTooLarge);
    if (mReceived.GetError() != FrameError::None) return Drop(QenStatus::kProtocolError);
    if (int status = WaitForReply(id, deadline); status != QenStatus::kOk) return status;
    ssize_t n = recv(mFd, chunk, sizeof chunk, 0);
    if (n > 0) {
      mReceived.Feed(chunk, static_cast<std::size_t>(n));
    } else if (n == 0 || (errno != EAGAIN && errno != EWOULDBLOCK && errno != EINTR)) {
      return Drop(QenStatus::kServerTerminated);
    }
  }
}

int QenTcpInstrument::WaitWithWaiter(long long deadline) {
  for (;;) {
    const int status = WaitFor(POLLIN, std::min(deadline, NowMs() + kWaitSliceMs));
    if (status != QenStatus::kTimeOut || NowMs() >= deadline) return status;
    if (mWaiter->Wait(*mCommand, NowMs() - mCallStart)) {
      Disconnect();
      return QenStatus::kAbandoned;
    }
    // The waiter may have let a disconnect through; the stream is gone then.
    if (mFd < 0) return QenStatus::kNotConnected;
  }
}

int QenTcpInstrument::WaitForReply(std::uint32_t id, long long& deadline) {
  if (!mProgress) return mWaiter ? WaitWithWaiter(deadline) : WaitFor(POLLIN, deadline);
  for (;;) {
    const int status = WaitFor(POLLIN, std::min(deadline, NowMs() + kTickMs));
    if (status != QenStatus::kTimeOut || NowMs() >= deadline) return status;
    if (int asked = Ask(id, deadline); asked != QenStatus::kOk) return asked;
  }
}

int QenTcpInstrument::TakeProgress(std::uint32_t id, const std::string& payload, long long& deadline) {
  long long done = -1, total = -1;
  char comma = 0;
  // A progress text of another shape says only that the server is alive.
  if (std::sscanf(payload.c_str(), "%lld%c%lld", &done, &comma, &total) != 3 || comma != ',' || done < 0 ||
      total < done) {
    done = total = -1;
  }
  mDone = done;
  mTotal = total;
  // Once cancelled, the reply must come within the ordinary time.
  if (!mCancelSent) deadline = NowMs() + mReplyTimeoutMs;
  return Ask(id, deadline);
}

int QenTcpInstrument::Ask(std::uint32_t id, long long deadline) {
  if (!mProgress->Tick(mDone, mTotal) || mCancelSent) return QenStatus::kOk;
  mCancelSent = true;
  return SendAll(EncodeFrame(FrameHeader{FrameHeader::kCancel, 0, id, 0, 0}, {}), deadline);
}

int QenTcpInstrument::Call(const Dstring& cmd, Dstring& reply) {
  LgsDebug trace("QenTcpInstrument::Call ", "qenguiinst,wire");
  reply.clear();
  if (mFd < 0) return mLost ? QenStatus::kServerTerminated : QenStatus::kNotConnected;
  // A follower that lets events run could start another call on the same stream.
  if (mInCall) return QenStatus::kCallBusy;
  if (cmd.size() > FrameHeader::kMaxPayload) return QenStatus::kFrameTooLarge;
  const InCall scope(mInCall);
  FrameHeader header;
  header.type = FrameHeader::kRequest;
  header.flags = mProgress ? FrameHeader::kFlagProgress : 0;
  header.id = mNextId++;
  mCancelSent = false;
  mDone = mTotal = -1;
  mCommand = &cmd;
  mCallStart = NowMs();
  NoteTimeOut(Dstring(), 0);
  const long long deadline = mCallStart + mReplyTimeoutMs;
  int status = SendAll(EncodeFrame(header, cmd), deadline);
  if (status == QenStatus::kOk) status = ReadReply(header.id, reply, deadline);
  if (status == QenStatus::kTimeOut) NoteTimeOut(cmd, mReplyTimeoutMs);
  trace.Printf("id=%u status=%d bytes=%zu\n", header.id, status, reply.size());
  return status;
}
