#include "SimServer.h"

#include <arpa/inet.h>
#include <netdb.h>
#include <netinet/in.h>
#include <netinet/tcp.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>
#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <iterator>
#include <utility>

#include "SimFrameFollower.h"

namespace {

constexpr std::size_t kMaxConnections = 256;
// Stop reading from a client that does not read its replies.
constexpr std::size_t kMaxPendingOut = 4 * 1024 * 1024;
// How often a SCPI client waiting for the instrument's operations looks again.
constexpr int kScpiTickMs = 10;
// A block whose bytes stop coming for this long was shorter than its header said.
constexpr long long kBlockStallMs = 1000;

volatile std::sig_atomic_t gStop = 0;
sigset_t gWaitMask;

void OnStopSignal(int) {
  gStop = 1;
}

void SetOption(int fd, int level, int name) {
  int on = 1;
  setsockopt(fd, level, name, &on, sizeof on);
}

unsigned short PortOf(int fd) {
  sockaddr_storage addr{};
  socklen_t len = sizeof addr;
  getsockname(fd, reinterpret_cast<sockaddr*>(&addr), &len);
  if (addr.ss_family == AF_INET6) return ntohs(reinterpret_cast<sockaddr_in6*>(&addr)->sin6_port);
  return ntohs(reinterpret_cast<sockaddr_in*>(&addr)->sin_port);
}

Dstring EndpointOf(int fd) {
  sockaddr_storage addr{};
  socklen_t len = sizeof addr;
  char host[INET6_ADDRSTRLEN] = "?";
  unsigned short port = 0;
  getsockname(fd, reinterpret_cast<sockaddr*>(&addr), &len);
  if (addr.ss_family == AF_INET6) {
    auto* a = reinterpret_cast<sockaddr_in6*>(&addr);
    inet_ntop(AF_INET6, &a->sin6_addr, host, sizeof host);
    port = ntohs(a->sin6_port);
    return Dstring::Format("[%s]:%u", host, port);
  }
  auto* a = reinterpret_cast<sockaddr_in*>(&addr);
  inet_ntop(AF_INET, &a->sin_addr, host, sizeof host);
  port = ntohs(a->sin_port);
  return Dstring::Format("%s:%u", host, port);
}

// A non-blocking listening socket on the address and port; -1 with a condition otherwise.
int OpenSocket(const Dstring& address, unsigned short port, ConditionList& list) {
  addrinfo hints{};
  hints.ai_family = AF_UNSPEC;
  hints.ai_socktype = SOCK_STREAM;
  hints.ai_flags = AI_PASSIVE | AI_NUMERICSERV;
  addrinfo* found = nullptr;
  if (int rc = getaddrinfo(address.c_str(), std::to_string(port).c_str(), &hints, &found); rc != 0) {
    list.Add(1, Dstring::Format("cannot resolve %s: %s", address.c_str(), gai_strerror(rc)));
    return -1;
  }
  int fd = socket(found->ai_family, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0);
  if (fd >= 0) SetOption(fd, SOL_SOCKET, SO_REUSEADDR);
  bool ok = fd >= 0 && bind(fd, found->ai_addr, found->ai_addrlen) == 0 && listen(fd, 64) == 0;
  int err = errno;
  freeaddrinfo(found);
  if (!ok) {
    if (fd >= 0) close(fd);
    list.Add(1, Dstring::Format("cannot listen on %s:%u: %s", address.c_str(), port, std::strerror(err)));
    return -1;
  }
  return fd;
}

// Opens `fd` and names its `endpoint`; 0, or 1 with a condition.
int OpenListener(const Dstring& address, unsigned short port, ConditionList& list, int& fd, Dstring& endpoint) {
  fd = OpenSocket(address, port, list);
  if (fd < 0) return 1;
  endpoint = EndpointOf(fd);
  return 0;
}

}  // namespace

SimServer::SimServer(SimCommandProcessor& processor, const SimClock& clock, bool quiet)
    : mProcessor(processor), mClock(clock), mQuiet(quiet) {}

SimServer::~SimServer() {
  if (mListenFd >= 0) close(mListenFd);
  if (mScpiFd >= 0) close(mScpiFd);
  if (mVxi11Fd >= 0) close(mVxi11Fd);
  if (mPortMapperFd >= 0) close(mPortMapperFd);
}

int SimServer::Listen(const Dstring& address, unsigned short port, ConditionList& list) {
  return OpenListener(address, port, list, mListenFd, mEndpoint);
}

int SimServer::ListenScpi(const Dstring& address, unsigned short port, ConditionList& list) {
  return OpenListener(address, port, list, mScpiFd, mScpiEndpoint);
}

int SimServer::ListenVxi11(const Dstring& address, unsigned short port, ConditionList& list) {
  if (OpenListener(address, port, list, mVxi11Fd, mVxi11Endpoint) != 0) return 1;
  mVxi11Port = PortOf(mVxi11Fd);
  return 0;
}

int SimServer::ListenPortMapper(const Dstring& address, unsigned short port, ConditionList& list) {
  return OpenListener(address, port, list, mPortMapperFd, mPortMapperEndpoint);
}

void SimServer::InstallSignalHandlers() {
  std::signal(SIGPIPE, SIG_IGN);
  struct sigaction action {};
  action.sa_handler = OnStopSignal;
  sigemptyset(&action.sa_mask);
  sigaction(SIGINT, &action, nullptr);
  sigaction(SIGTERM, &action, nullptr);
  // Held back while the loop works and let through only inside ppoll, so a stop request
  // can never slip in between the check and the wait.
  sigset_t stops;
  sigemptyset(&stops);
  sigaddset(&stops, SIGINT);
  sigaddset(&stops, SIGTERM);
  sigprocmask(SIG_BLOCK, &stops, &gWaitMask);
  sigdelset(&gWaitMask, SIGINT);
  sigdelset(&gWaitMask, SIGTERM);
}

int SimServer::Run() {
  std::vector<pollfd> fds;
  std::vector<SimConnection*> polled;
  while (!gStop && !mDie) {
    // A listener that is not open is a negative descriptor that poll passes over.
    const std::pair<int, Kind> listeners[] = {
        {mListenFd, Kind::Frames}, {mScpiFd, Kind::Scpi}, {mVxi11Fd, Kind::Vxi11}, {mPortMapperFd, Kind::PortMapper}};
    fds.clear();
    for (const auto& listener : listeners) fds.push_back(pollfd{listener.first, POLLIN, 0});
    polled.clear();
    for (auto& [id, c] : mConnections) {
      // A SCPI client whose message waits for the instrument is read on only so far.
      const bool waiting = c->Scpi() != nullptr && c->Scpi()->IsWaiting();
      const bool full = c->Pending() >= kMaxPendingOut || (waiting && c->HeldBytes() >= kMaxPendingOut);
      short events = !full && !c->IsInputEnded() ? POLLIN : 0;
      if (c->Pending() > 0) events |= POLLOUT;
      fds.push_back(pollfd{c->GetFd(), events, 0});
      polled.push_back(c.get());
    }
    int timeoutMs = PollTimeoutMs();
    timespec ts{timeoutMs / 1000, (timeoutMs % 1000) * 1000000L};
    int n = ppoll(fds.data(), fds.size(), timeoutMs < 0 ? nullptr : &ts, &gWaitMask);
    if (n < 0 && errno != EINTR) {
      Log(std::strerror(errno), 0);
      return 1;
    }
    constexpr std::size_t kListeners = std::size(listeners);
    for (std::size_t i = 0; n > 0 && i < polled.size() && !mDie; ++i) Serve(*polled[i], fds[i + kListeners].revents);
    for (std::size_t i = 0; n > 0 && i < kListeners; ++i) {
      if (fds[i].revents & POLLIN) Accept(listeners[i].first, listeners[i].second);
    }
    FireTimers();
    TickScpi();
    Reap();
  }
  return 0;
}

void SimServer::Accept(int listenFd, Kind kind) {
  while (true) {
    int fd = accept4(listenFd, nullptr, nullptr, SOCK_NONBLOCK | SOCK_CLOEXEC);
    if (fd < 0) {
      if (errno != EAGAIN && errno != EWOULDBLOCK && errno != EINTR) Log(std::strerror(errno), 0);
      return;
    }
    if (mConnections.size() >= kMaxConnections) {
      Log("too many clients, connection refused", 0);
      close(fd);
      continue;
    }
    SetOption(fd, IPPROTO_TCP, TCP_NODELAY);
    SetOption(fd, SOL_SOCKET, SO_KEEPALIVE);
    int id = mNextId++;
    auto connection = std::make_unique<SimConnection>(fd, id);
    if (kind == Kind::Scpi) connection->SetScpi(std::make_unique<SimScpiSession>(mProcessor, id));
    if (kind == Kind::Vxi11 || kind == Kind::PortMapper) {
      const auto program = kind == Kind::Vxi11 ? SimVxi11Channel::Program::DeviceCore : SimVxi11Channel::Program::PortMapper;
      connection->SetRpc(std::make_unique<SimVxi11Channel>(program, mProcessor, id, mVxi11Port));
    }
    mConnections.emplace(id, std::move(connection));
  }
}

void SimServer::Serve(SimConnection& connection, short events) {
  if (events & (POLLIN | POLLHUP | POLLERR)) {
    bool open = connection.Receive();
    connection.NoteInput(mClock.NowMs());
    if (connection.Rpc()) {
      HandleRpc(connection);
    } else if (connection.Scpi()) {
      HandleScpi(connection);
    } else {
      HandleFrames(connection);
    }
    if (!open) connection.EndInput();
    // Hung up both ways or reset: nothing more can reach the client.
    if (events & (POLLHUP | POLLERR)) connection.Close();
  }
  if (!connection.IsClosed() && connection.Pending() > 0 && !connection.Flush()) connection.Close();
}

void SimServer::HandleFrames(SimConnection& connection) {
  FrameHeader header;
  std::string payload;
  while (!connection.IsClosed() && !mDie && connection.Decoder().Next(header, payload)) {
    // A cancel that comes after its command ended has nothing left to stop.
    if (header.type == FrameHeader::kCancel) continue;
    if (header.type != FrameHeader::kRequest) {
      Log("frame is not a request, connection closed", connection.GetId());
      connection.Close();
      return;
    }
    SimFrameFollower follower(connection, header.id);
    const bool followed = (header.flags & FrameHeader::kFlagProgress) != 0;
    SimReply reply = mProcessor.ExecuteTaking(connection.GetId(), payload, followed ? &follower : nullptr);
    if (reply.action == SimReplyAction::Die) mDie = true;
    if (reply.action != SimReplyAction::Send) {
      connection.Close();
      return;
    }
    FrameHeader out{FrameHeader::kReply, 0, header.id, reply.status, 0};
    std::string bytes = EncodeFrame(out, reply.text);
    if (reply.delayMs > 0) {
      mTimers.push_back(Timer{mClock.NowMs() + reply.delayMs, connection.GetId(), std::move(bytes)});
    } else {
      connection.Queue(std::move(bytes));
    }
  }
  if (connection.Decoder().GetError() != FrameError::None) {
    Log(FrameErrorText(connection.Decoder().GetError()), connection.GetId());
    connection.Close();
  }
}

void SimServer::HandleScpi(SimConnection& connection) {
  std::string message;
  for (SimScpiReader::Result r; (r = connection.ScpiReader().Next(message)) != SimScpiReader::Result::None;) {
    // A device clear is seen even while the session waits, and drops what came before it.
    if (r == SimScpiReader::Result::Message && SimScpiSession::IsDeviceClear(message)) {
      connection.DropHeld();
      connection.Scpi()->DeviceClear();
      continue;
    }
    connection.Hold(r, std::move(message));
    message.clear();
  }
  RunHeld(connection);
}

void SimServer::RunHeld(SimConnection& connection) {
  SimScpiSession& session = *connection.Scpi();
  SimConnection::Held held;
  while (!session.IsWaiting() && connection.TakeHeld(held)) {
    Dstring reply;
    if (held.first == SimScpiReader::Result::Overrun) {
      session.Overrun();
    } else if (held.first == SimScpiReader::Result::ShortBlock) {
      session.ShortBlock();
    } else if (session.Execute(std::move(held.second), reply) == SimScpiSession::Outcome::Answered) {
      connection.Queue(std::move(reply));
      connection.Queue("\n");
    }
    connection.ScpiReader().Recycle(session.ReleaseMessage());
  }
}

// Sessions that wait for the instrument look again, and one that answers goes on with what it
// holds; a block whose bytes stopped coming is cut short, so the client's next lines are read.
void SimServer::TickScpi() {
  const long long now = mClock.NowMs();
  for (auto& [id, c] : mConnections) {
    if (c->IsClosed()) continue;
    if (c->Rpc() != nullptr && c->Rpc()->NeedsTicks()) {
      std::string out;
      c->Rpc()->Tick(now, out);
      c->Queue(out);
      if (c->Pending() > 0 && !c->Flush()) c->Close();
    }
    if (c->Scpi() == nullptr) continue;
    // A stall counts only while qensim reads on: a client that does not read its replies is
    // not read either. A client that has stopped sending will send no more of the block.
    const bool stalled = c->Pending() < kMaxPendingOut && now - c->LastInputMs() >= kBlockStallMs;
    if (c->ScpiReader().InBlock() && (stalled || c->IsInputEnded())) {
      c->ScpiReader().CutBlock();
      HandleScpi(*c);
    }
    Dstring reply;
    if (c->Scpi()->NeedsTicks() && c->Scpi()->Tick(reply) == SimScpiSession::Outcome::Answered) {
      c->Queue(reply + "\n");
      RunHeld(*c);
    }
    if (c->Pending() > 0 && !c->Flush()) c->Close();
  }
}

void SimServer::HandleRpc(SimConnection& connection) {
  std::string out;
  const bool inStep = connection.Rpc()->Serve(mClock.NowMs(), out);
  connection.Queue(out);
  if (!inStep) {
    Log("RPC record too large or not a call, connection closed", connection.GetId());
    connection.EndInput();
  }
}

void SimServer::FireTimers() {
  long long now = mClock.NowMs();
  for (auto it = mTimers.begin(); it != mTimers.end();) {
    if (it->dueMs > now) {
      ++it;
      continue;
    }
    auto c = mConnections.find(it->connection);
    if (c != mConnections.end() && !c->second->IsClosed()) {
      c->second->Queue(std::move(it->bytes));
      if (!c->second->Flush()) c->second->Close();
    }
    it = mTimers.erase(it);
  }
}

void SimServer::Reap() {
  for (auto& [id, c] : mConnections) {
    const bool waiting = c->Scpi() != nullptr && (c->Scpi()->IsWaiting() || c->HasHeld());
    if (c->IsInputEnded() && c->Pending() == 0 && !HasTimers(id) && !waiting) c->Close();
  }
  for (auto it = mConnections.begin(); it != mConnections.end();) {
    if (!it->second->IsClosed()) {
      ++it;
      continue;
    }
    mProcessor.Disconnect(it->first);
    it = mConnections.erase(it);
  }
}

bool SimServer::HasTimers(int connection) const {
  return std::any_of(mTimers.begin(), mTimers.end(), [&](const Timer& t) { return t.connection == connection; });
}

int SimServer::PollTimeoutMs() const {
  const bool ticking = std::any_of(mConnections.begin(), mConnections.end(), [](const auto& c) {
    if (c.second->Rpc()) return c.second->Rpc()->NeedsTicks();
    return c.second->Scpi() && (c.second->Scpi()->NeedsTicks() || c.second->ScpiReader().InBlock());
  });
  if (mTimers.empty()) return ticking ? kScpiTickMs : -1;
  long long now = mClock.NowMs();
  long long next = mTimers.front().dueMs;
  for (const Timer& t : mTimers) next = std::min(next, t.dueMs);
  const int due = static_cast<int>(std::max(0LL, next - now));
  return ticking ? std::min(due, kScpiTickMs) : due;
}

void SimServer::Log(const char* what, int connection) const {
  if (mQuiet) return;
  if (connection > 0) {
    std::fprintf(stderr, "qensim: client %d: %s\n", connection, what);
  } else {
    std::fprintf(stderr, "qensim: %s\n", what);
  }
}
