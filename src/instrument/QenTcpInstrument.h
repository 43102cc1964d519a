#pragma once

#include <cstdint>
#include <string>

#include "instrument/Frame.h"
#include "instrument/QenInstrument.h"

// The instrument client over TCP (docs/protocol.md). Blocking calls, each bounded by a
// time-out: a reply that does not arrive in time gives QenStatus::kTimeOut and the
// connection stays up; the late reply is recognised by its id and dropped on the next call.
// With a follower set, a request asks for progress frames and may be cancelled; with a waiter
// set, the wait runs in short slices and the waiter lets the host's events run between them.
class QenTcpInstrument : public QenInstrument {
 public:
  static constexpr unsigned short kDefaultPort = 7130;

  QenTcpInstrument();
  ~QenTcpInstrument() override;
  QenTcpInstrument(const QenTcpInstrument&) = delete;
  QenTcpInstrument& operator=(const QenTcpInstrument&) = delete;

  int Connect(const Dstring& host, unsigned short port) override;
  int Disconnect() override;
  bool IsConnected() const override { return mFd >= 0; }
  int Call(const Dstring& cmd, Dstring& reply) override;
  void SetCallProgress(CallProgress* progress) override { mProgress = progress; }
  void SetCallWaiter(CallWaiter* waiter) override { mWaiter = waiter; }

  // Why the last Connect failed.
  enum class ConnectFailure { None, UnknownHost, NoAnswer };
  ConnectFailure GetConnectFailure() const { return mConnectFailure; }

  void SetConnectTimeoutMs(int ms) { mConnectTimeoutMs = ms; }
  void SetReplyTimeoutMs(int ms) { mReplyTimeoutMs = ms; }
  int GetReplyTimeoutMs() const { return mReplyTimeoutMs; }

 private:
  int SendAll(const std::string& bytes, long long deadline);
  int ReadReply(std::uint32_t id, Dstring& reply, long long deadline);
  // Tells the follower how far the server is; sends the cancel once it asks for it.
  int Ask(std::uint32_t id, long long deadline);
  int WaitFor(short events, long long deadline);
  // Waits for reply bytes; with a follower, in slices so it is told of the wait and can
  // cancel the request.
  int WaitForReply(std::uint32_t id, long long& deadline);
  // A progress frame of the running request: the server is alive, so the wait starts anew.
  int TakeProgress(std::uint32_t id, const std::string& payload, long long& deadline);
  // Lets the waiter run until bytes come, the deadline passes or the waiter gives up.
  int WaitWithWaiter(long long deadline);

  struct InCall {
    explicit InCall(bool& flag) : mFlag(flag) { mFlag = true; }
    ~InCall() { mFlag = false; }
    InCall(const InCall&) = delete;
    InCall& operator=(const InCall&) = delete;
    bool& mFlag;
  };
  static constexpr int kTickMs = 100;
  // Short enough that a window waiting for a slow reply still repaints smoothly.
  static constexpr int kWaitSliceMs = 10;
  int Drop(int status);

  int mFd = -1;
  // Set when the connection broke under us: every later call reports the server as gone.
  bool mLost = false;
  // Bytes received but not yet taken as a frame; a time-out in mid-frame keeps them, so the
  // stream stays in step and the late reply is recognised and dropped on the next call.
  FrameDecoder mReceived;
  std::uint32_t mNextId = 1;
  int mConnectTimeoutMs = 2500;
  int mReplyTimeoutMs;
  ConnectFailure mConnectFailure = ConnectFailure::None;
  CallProgress* mProgress = nullptr;
  CallWaiter* mWaiter = nullptr;
  const Dstring* mCommand = nullptr;
  long long mCallStart = 0;
  bool mCancelSent = false;
  bool mInCall = false;
  long long mDone = -1;
  long long mTotal = -1;
};
