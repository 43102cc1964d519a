// A byte stream of valid frames, frames with chosen header fields and raw bytes, fed to the
// decoder in pieces of random size. Every frame taken out must be the next one of the stream,
// whole, with a valid header, and once the decoder calls the stream broken it stays broken.
#include <fuzzer/FuzzedDataProvider.h>

#include <cstddef>
#include <cstdint>
#include <string>

#include "instrument/Frame.h"

namespace {

void Check(bool ok) {
  if (!ok) __builtin_trap();
}

std::string MakeStream(FuzzedDataProvider& in) {
  std::string stream;
  int count = in.ConsumeIntegralInRange(0, 16);
  for (int i = 0; i < count; ++i) {
    FrameHeader header;
    switch (in.ConsumeIntegralInRange(0, 2)) {
      case 0:
        header.type = in.ConsumeIntegralInRange<std::uint8_t>(FrameHeader::kRequest, FrameHeader::kCancel);
        header.flags = in.ConsumeBool() ? FrameHeader::kFlagProgress : 0;
        header.id = in.ConsumeIntegral<std::uint32_t>();
        header.status = in.ConsumeIntegral<std::int32_t>();
        stream += EncodeFrame(header, in.ConsumeBytesAsString(in.ConsumeIntegralInRange(0, 300)));
        break;
      case 1: {
        header.type = in.ConsumeIntegral<std::uint8_t>();
        header.flags = in.ConsumeIntegral<std::uint8_t>();
        header.length = in.ConsumeIntegral<std::uint32_t>();
        unsigned char raw[FrameHeader::kSize];
        EncodeFrameHeader(header, raw);
        stream.append(reinterpret_cast<const char*>(raw), sizeof raw);
        break;
      }
      default:
        stream += in.ConsumeBytesAsString(in.ConsumeIntegralInRange(0, 40));
        break;
    }
  }
  return stream;
}

// What the decoder must do at `offset`: the frame there, or an error, or wait for more bytes.
FrameError Expected(const std::string& stream, std::size_t offset, std::size_t fed, FrameHeader& header,
                    bool& complete) {
  complete = false;
  if (fed - offset < FrameHeader::kSize) return FrameError::None;
  FrameError error =
      DecodeFrameHeader(reinterpret_cast<const unsigned char*>(stream.data()) + offset, header);
  complete = error == FrameError::None && fed - offset - FrameHeader::kSize >= header.length;
  return error;
}

void CheckFrame(const std::string& stream, std::size_t& offset, const FrameHeader& header,
                const std::string& payload) {
  FrameHeader expected;
  Check(DecodeFrameHeader(reinterpret_cast<const unsigned char*>(stream.data()) + offset, expected) ==
        FrameError::None);
  Check(header.type == expected.type && header.flags == expected.flags &&
        (header.flags & ~FrameHeader::kFlagProgress) == 0 && header.id == expected.id &&
        header.status == expected.status && header.length == expected.length);
  Check(header.length <= FrameHeader::kMaxPayload && payload.size() == header.length);
  Check(payload == stream.substr(offset + FrameHeader::kSize, header.length));
  offset += FrameHeader::kSize + header.length;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  FuzzedDataProvider in(data, size);
  std::string stream = MakeStream(in);
  FrameDecoder decoder;
  std::size_t fed = 0;
  std::size_t offset = 0;
  FrameError broken = FrameError::None;
  while (fed < stream.size()) {
    std::size_t piece = in.ConsumeIntegralInRange<std::size_t>(1, stream.size() - fed);
    decoder.Feed(stream.data() + fed, piece);
    fed += piece;
    FrameHeader header;
    std::string payload;
    // A complete frame is seen where it waits before it is taken.
    bool whole = false;
    if (broken == FrameError::None && Expected(stream, offset, fed, header, whole) == FrameError::None && whole) {
      Check(decoder.Holds(header.type, header.id));
    }
    while (decoder.Next(header, payload)) {
      Check(broken == FrameError::None);
      CheckFrame(stream, offset, header, payload);
    }
    if (broken != FrameError::None) {
      Check(decoder.GetError() == broken);
      continue;
    }
    FrameHeader next;
    bool complete = false;
    broken = Expected(stream, offset, fed, next, complete);
    Check(decoder.GetError() == broken && !complete);
    Check(decoder.Buffered() == fed - offset);
  }
  return 0;
}
