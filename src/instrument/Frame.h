#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

// One message of the wire protocol: a 16-byte big-endian header and a payload.
//   magic "QN" | type u8 | flags u8 | request id u32 | status i32 | payload length u32
struct FrameHeader {
  static constexpr std::size_t kSize = 16;
  static constexpr std::uint32_t kMaxPayload = 16u * 1024u * 1024u;
  static constexpr std::uint8_t kRequest = 1;
  static constexpr std::uint8_t kReply = 2;
  // While a long command runs, the server says how far it is ("DONE,TOTAL"), under the
  // request's id, to a client that asked for it with kFlagProgress.
  static constexpr std::uint8_t kProgress = 3;
  // The client asks the server to stop the running request of that id.
  static constexpr std::uint8_t kCancel = 4;
  static constexpr std::uint8_t kFlagProgress = 0x01;

  std::uint8_t type = kRequest;
  std::uint8_t flags = 0;
  std::uint32_t id = 0;
  std::int32_t status = 0;
  std::uint32_t length = 0;
};

enum class FrameError { None, BadMagic, BadType, BadFlags, TooLarge };

const char* FrameErrorText(FrameError error);

// Writes the header into out[0..15].
void EncodeFrameHeader(const FrameHeader& header, unsigned char* out);
// Reads a header; anything but None means the stream cannot be trusted any more.
FrameError DecodeFrameHeader(const unsigned char* in, FrameHeader& header);
// Header and payload in one buffer, ready to send.
std::string EncodeFrame(const FrameHeader& header, std::string_view payload);

// Cuts frames out of a byte stream that arrives in arbitrary pieces.
class FrameDecoder {
 public:
  // Adds received bytes.
  void Feed(const char* data, std::size_t size) { mBuffer.append(data, size); }
  // Takes the next complete frame. Returns false when more bytes are needed or the
  // stream is broken; GetError() tells which.
  bool Next(FrameHeader& header, std::string& payload);
  FrameError GetError() const { return mError; }
  std::size_t Buffered() const { return mBuffer.size() - mStart; }
  // Whether a complete frame of this type and id is among the bytes not yet taken.
  bool Holds(std::uint8_t type, std::uint32_t id) const;

 private:
  std::string mBuffer;
  std::size_t mStart = 0;
  FrameError mError = FrameError::None;
};
