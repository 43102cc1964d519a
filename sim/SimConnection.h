#pragma once

#include <cstddef>
#include <deque>
#include <memory>
#include <string>
#include <utility>

#include "SimScpiReader.h"
#include "SimScpiSession.h"
#include "SimVxi11Channel.h"
#include "instrument/Frame.h"

// One client socket of the server: the frames (or, on the SCPI port, the program messages)
// coming in and the bytes still to go out.
class SimConnection {
 public:
  SimConnection(int fd, int id) : mFd(fd), mId(id) {}
  ~SimConnection();
  SimConnection(const SimConnection&) = delete;
  SimConnection& operator=(const SimConnection&) = delete;

  int GetFd() const { return mFd; }
  int GetId() const { return mId; }
  FrameDecoder& Decoder() { return mDecoder; }
  // A raw SCPI connection reads messages with its session instead of frames.
  void SetScpi(std::unique_ptr<SimScpiSession> session) { mScpi = std::move(session); }
  SimScpiSession* Scpi() { return mScpi.get(); }
  SimScpiReader& ScpiReader() { return mScpiReader; }
  // A VXI-11 or port mapper connection hands its bytes to its RPC channel.
  void SetRpc(std::unique_ptr<SimVxi11Channel> channel) { mRpc = std::move(channel); }
  SimVxi11Channel* Rpc() { return mRpc.get(); }
  // Messages cut while the session waits, in order, with what the reader said of each.
  using Held = std::pair<SimScpiReader::Result, std::string>;
  void Hold(SimScpiReader::Result result, std::string message);
  bool TakeHeld(Held& held);
  // A device clear: what was held is dropped.
  void DropHeld();
  std::size_t HeldBytes() const { return mHeldBytes; }
  bool HasHeld() const { return !mHeld.empty(); }
  // When bytes last came in, by the server's clock.
  void NoteInput(long long ms) { mLastInputMs = ms; }
  long long LastInputMs() const { return mLastInputMs; }

  // Reads what the socket has now into the decoder; false once the peer is gone.
  bool Receive();
  // A large piece is taken over as it is, never copied; small ones are gathered.
  void Queue(std::string bytes);
  std::size_t Pending() const { return mPending; }
  // Writes what the socket takes now, the pieces together; false once the peer is gone.
  bool Flush();

  bool IsClosed() const { return mClosed; }
  void Close() { mClosed = true; }
  // The client closed its sending side: what it sent is still answered before the close.
  void EndInput() { mInputEnded = true; }
  bool IsInputEnded() const { return mInputEnded; }

 private:
  int mFd;
  int mId;
  bool mClosed = false;
  bool mInputEnded = false;
  FrameDecoder mDecoder;
  SimScpiReader mScpiReader;
  std::unique_ptr<SimScpiSession> mScpi;
  std::unique_ptr<SimVxi11Channel> mRpc;
  std::deque<Held> mHeld;
  std::size_t mHeldBytes = 0;
  long long mLastInputMs = 0;
  std::deque<std::string> mOut;
  std::size_t mSent = 0;  // of the first piece
  std::size_t mPending = 0;
};
