#include "instrument/Frame.h"

namespace {

void PutU32(unsigned char* out, std::uint32_t v) {
  out[0] = static_cast<unsigned char>(v >> 24);
  out[1] = static_cast<unsigned char>(v >> 16);
  out[2] = static_cast<unsigned char>(v >> 8);
  out[3] = static_cast<unsigned char>(v);
}

std::uint32_t GetU32(const unsigned char* in) {
  return (std::uint32_t{in[0]} << 24) | (std::uint32_t{in[1]} << 16) | (std::uint32_t{in[2]} << 8) |
         std::uint32_t{in[3]};
}

}  // namespace

const char* FrameErrorText(FrameError error) {
  switch (error) {
    case FrameError::None: return "no error";
    case FrameError::BadMagic: return "frame does not start with \"QN\"";
    case FrameError::BadType: return "unknown frame type";
    case FrameError::BadFlags: return "unknown frame flags";
    case FrameError::TooLarge: return "frame payload over 16 MiB";
  }
  return "unknown frame error";
}

void EncodeFrameHeader(const FrameHeader& header, unsigned char* out) {
  out[0] = 'Q';
  out[1] = 'N';
  out[2] = header.type;
  out[3] = header.flags;
  PutU32(out + 4, header.id);
  PutU32(out + 8, static_cast<std::uint32_t>(header.status));
  PutU32(out + 12, header.length);
}

FrameError DecodeFrameHeader(const unsigned char* in, FrameHeader& header) {
  if (in[0] != 'Q' || in[1] != 'N') return FrameError::BadMagic;
  header.type = in[2];
  header.flags = in[3];
  header.id = GetU32(in + 4);
  header.status = static_cast<std::int32_t>(GetU32(in + 8));
  header.length = GetU32(in + 12);
  if (header.type < FrameHeader::kRequest || header.type > FrameHeader::kCancel) return FrameError::BadType;
  if ((header.flags & ~FrameHeader::kFlagProgress) != 0) return FrameError::BadFlags;
  if (header.length > FrameHeader::kMaxPayload) return FrameError::TooLarge;
  return FrameError::None;
}

std::string EncodeFrame(const FrameHeader& header, std::string_view payload) {
  FrameHeader h = header;
  h.length = static_cast<std::uint32_t>(payload.size());
  std::string out(FrameHeader::kSize, '\0');
  EncodeFrameHeader(h, reinterpret_cast<unsigned char*>(out.data()));
  out.append(payload);
  return out;
}

bool FrameDecoder::Next(FrameHeader& header, std::string& payload) {
  if (mError != FrameError::None || Buffered() < FrameHeader::kSize) return false;
  const auto* base = reinterpret_cast<const unsigned char*>(mBuffer.data()) + mStart;
  mError = DecodeFrameHeader(base, header);
  if (mError != FrameError::None) return false;
  if (Buffered() < FrameHeader::kSize + header.length) return false;
  payload.assign(mBuffer, mStart + FrameHeader::kSize, header.length);
  mStart += FrameHeader::kSize + header.length;
  // Compact once the consumed prefix dominates, so a long-lived stream stays small.
  if (mStart > 65536 && mStart * 2 > mBuffer.size()) {
    mBuffer.erase(0, mStart);
    mStart = 0;
  }
  return true;
}

bool FrameDecoder::Holds(std::uint8_t type, std::uint32_t id) const {
  if (mError != FrameError::None) return false;
  FrameHeader header;
  for (std::size_t at = mStart; mBuffer.size() - at >= FrameHeader::kSize;) {
    const auto* base = reinterpret_cast<const unsigned char*>(mBuffer.data()) + at;
    if (DecodeFrameHeader(base, header) != FrameError::None) return false;
    if (mBuffer.size() - at < FrameHeader::kSize + header.length) return false;
    if (header.type == type && header.id == id) return true;
    at += FrameHeader::kSize + header.length;
  }
  return false;
}
