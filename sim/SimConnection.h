#pragma once

#include <cstddef>
#include <string>

#include "instrument/Frame.h"

// One client socket of the server: the frames coming in and the bytes still to go out.
class SimConnection {
 public:
  SimConnection(int fd, int id) : mFd(fd), mId(id) {}
  ~SimConnection();
  SimConnection(const SimConnection&) = delete;
  SimConnection& operator=(const SimConnection&) = delete;

  int GetFd() const { return mFd; }
  int GetId() const { return mId; }
  FrameDecoder& Decoder() { return mDecoder; }

  // Reads what the socket has now into the decoder; false once the peer is gone.
  bool Receive();
  void Queue(const std::string& bytes) { mOut.append(bytes); }
  std::size_t Pending() const { return mOut.size() - mSent; }
  // Writes what the socket takes now; false once the peer is gone.
  bool Flush();

  bool IsClosed() const { return mClosed; }
  void Close() { mClosed = true; }

 private:
  int mFd;
  int mId;
  bool mClosed = false;
  FrameDecoder mDecoder;
  std::string mOut;
  std::size_t mSent = 0;
};
