#pragma once

// Status codes of the instrument client. 0 is success; n >= 1 means the server accepted
// the command and queued n errors on the handle's error queue.
namespace QenStatus {
inline constexpr int kOk = 0;
inline constexpr int kNotConnected = -1;
inline constexpr int kConnectFailed = -2;
inline constexpr int kTimeOut = -3;
inline constexpr int kFrameTooLarge = -4;
inline constexpr int kProtocolError = -5;
inline constexpr int kBadCommand = -6;
inline constexpr int kCommError = -7;
// A call was made while another one on the same connection still waits for its reply.
inline constexpr int kCallBusy = -8;
// The user stopped waiting for a reply; the connection has been closed.
inline constexpr int kAbandoned = -9;
inline constexpr int kServerTerminated = -18;
inline constexpr int kLocked = -19;
// The error the server queues for a long command the client cancelled.
inline constexpr int kCancelledError = 301;
}  // namespace QenStatus
