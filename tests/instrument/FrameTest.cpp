#include <gtest/gtest.h>

#include "instrument/Frame.h"

namespace {

std::string Bytes(std::initializer_list<int> list) {
  std::string s;
  for (int b : list) s += static_cast<char>(b);
  return s;
}

}  // namespace

// The worked example of docs/protocol.md, byte for byte.
TEST(Frame, WorkedExampleOfTheProtocolDocument) {
  FrameHeader request;
  request.type = FrameHeader::kRequest;
  request.id = 1;
  EXPECT_EQ(EncodeFrame(request, ":_QEN1X:TRIG:MODE?"),
            Bytes({0x51, 0x4E, 0x01, 0x00, 0x00, 0x00, 0x00, 0x01, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x12}) +
                ":_QEN1X:TRIG:MODE?");
  FrameHeader reply;
  reply.type = FrameHeader::kReply;
  reply.id = 1;
  reply.status = -19;
  EXPECT_EQ(EncodeFrame(reply, ""),
            Bytes({0x51, 0x4E, 0x02, 0x00, 0x00, 0x00, 0x00, 0x01, 0xFF, 0xFF, 0xFF, 0xED, 0x00, 0x00, 0x00, 0x00}));
}

TEST(Frame, DecoderAssemblesFramesFromSingleBytes) {
  FrameHeader h;
  h.type = FrameHeader::kReply;
  h.id = 0xA1B2C3D4;
  h.status = 3;
  std::string payload("#13;\"\n\0x", 8);
  std::string stream = EncodeFrame(h, payload) + EncodeFrame(h, "");
  FrameDecoder decoder;
  std::vector<std::string> got;
  FrameHeader out;
  std::string body;
  for (char c : stream) {
    decoder.Feed(&c, 1);
    while (decoder.Next(out, body)) {
      EXPECT_EQ(out.id, 0xA1B2C3D4u);
      EXPECT_EQ(out.status, 3);
      got.push_back(body);
    }
  }
  EXPECT_EQ(got, (std::vector<std::string>{payload, ""}));
  EXPECT_EQ(decoder.Buffered(), 0u);
  EXPECT_EQ(decoder.GetError(), FrameError::None);
}

struct BadHeaderCase {
  std::string header;
  FrameError error;
};

class FrameBadHeader : public testing::TestWithParam<BadHeaderCase> {};

TEST_P(FrameBadHeader, BreaksTheStreamForGood) {
  FrameDecoder decoder;
  std::string bytes = GetParam().header + std::string(32, 'x');
  decoder.Feed(bytes.data(), bytes.size());
  FrameHeader h;
  std::string body;
  EXPECT_FALSE(decoder.Next(h, body));
  EXPECT_EQ(decoder.GetError(), GetParam().error);
  FrameHeader good;
  std::string more = EncodeFrame(good, "ok");
  decoder.Feed(more.data(), more.size());
  EXPECT_FALSE(decoder.Next(h, body));
}

INSTANTIATE_TEST_SUITE_P(
    Table, FrameBadHeader,
    testing::Values(BadHeaderCase{Bytes({'Q', 'X', 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 0, 0, 0, 0}), FrameError::BadMagic},
                    BadHeaderCase{Bytes({'Q', 'N', 5, 0, 0, 0, 0, 1, 0, 0, 0, 0, 0, 0, 0, 0}), FrameError::BadType},
                    BadHeaderCase{Bytes({'Q', 'N', 0, 0, 0, 0, 0, 1, 0, 0, 0, 0, 0, 0, 0, 0}), FrameError::BadType},
                    BadHeaderCase{Bytes({'Q', 'N', 2, 2, 0, 0, 0, 1, 0, 0, 0, 0, 0, 0, 0, 0}), FrameError::BadFlags},
                    BadHeaderCase{Bytes({'Q', 'N', 2, 0, 0, 0, 0, 1, 0, 0, 0, 0, 0x01, 0x00, 0x00, 0x01}),
                                  FrameError::TooLarge}));

TEST(Frame, ProgressAndCancelTravelUnderTheRequestId) {
  FrameHeader request;
  request.flags = FrameHeader::kFlagProgress;
  request.id = 9;
  FrameHeader progress{FrameHeader::kProgress, 0, 9, 0, 0};
  FrameHeader cancel{FrameHeader::kCancel, 0, 7, 0, 0};
  EXPECT_EQ(EncodeFrame(request, "x").substr(0, 8), Bytes({'Q', 'N', 1, 1, 0, 0, 0, 9}));
  FrameDecoder decoder;
  const std::string bytes = EncodeFrame(progress, "1048576,16777216") + EncodeFrame(cancel, "");
  decoder.Feed(bytes.data(), bytes.size() - 1);
  EXPECT_TRUE(decoder.Holds(FrameHeader::kProgress, 9));
  EXPECT_FALSE(decoder.Holds(FrameHeader::kCancel, 7)) << "an incomplete frame is not there yet";
  decoder.Feed(bytes.data() + bytes.size() - 1, 1);
  EXPECT_TRUE(decoder.Holds(FrameHeader::kCancel, 7));
  EXPECT_FALSE(decoder.Holds(FrameHeader::kCancel, 9));
  FrameHeader h;
  std::string body;
  ASSERT_TRUE(decoder.Next(h, body));
  EXPECT_EQ(h.type, FrameHeader::kProgress);
  EXPECT_EQ(body, "1048576,16777216");
  EXPECT_TRUE(decoder.Holds(FrameHeader::kCancel, 7)) << "looking takes nothing";
}

TEST(Frame, SixteenMebibytesIsTheLargestAcceptedPayload) {
  unsigned char raw[16];
  FrameHeader h;
  h.length = FrameHeader::kMaxPayload;
  EncodeFrameHeader(h, raw);
  FrameHeader back;
  EXPECT_EQ(DecodeFrameHeader(raw, back), FrameError::None);
  EXPECT_EQ(back.length, 16u * 1024u * 1024u);
}
