// The frame codec: value mapping both ways, streaming, and every kind of malformed input.
#include "service/wire.h"

#include <gtest/gtest.h>

#include <string>

namespace lumeris {
namespace {

MessageValue SampleBody() {
  return MessageValue::MakeDictionary({
      {"null", MessageValue::Null()}, {"true", MessageValue::Bool(true)}, {"false", MessageValue::Bool(false)},
      {"zero", MessageValue::Uint64(0)}, {"u8", MessageValue::Uint64(200)}, {"u64", MessageValue::Uint64(UINT64_MAX)},
      {"negative", MessageValue::Int64(-1)}, {"int64 min", MessageValue::Int64(INT64_MIN)},
      {"double", MessageValue::Double(-2.5)}, {"integral double", MessageValue::Double(5.0)},
      {"negative integral double", MessageValue::Double(-3.0)}, {"string", MessageValue::String("text")},
      {"invalid utf-8", MessageValue::String("\xff\xc3(")},
      {"embedded nul", MessageValue::String(std::string("a\0b", 3))},
      {"data", MessageValue::DataFromBytes(std::string("\0\x01\xff", 3))}, {"empty data", MessageValue::Data({})},
      {"array", MessageValue::MakeArray({MessageValue::Uint64(1), MessageValue::MakeArray(),
                                         MessageValue::MakeDictionary()})},
      {"", MessageValue::String("empty key")},
  });
}

TEST(Wire, FramesRoundTripWhateverTheChunking) {
  const Frame sent[] = {{FrameKind::kNoReply, 0, SampleBody()},
                        {FrameKind::kWantsReply, UINT64_MAX, MessageValue::MakeDictionary()},
                        {FrameKind::kReply, 7, SampleBody()}};
  std::string stream;
  for (const Frame& frame : sent) AppendEncodedFrame(frame, stream);
  for (std::size_t chunk : {std::size_t{1}, std::size_t{3}, std::size_t{64}, stream.size()}) {
    FrameDecoder decoder;
    std::vector<Frame> received;
    for (std::size_t offset = 0; offset < stream.size(); offset += chunk) {
      decoder.Feed(std::string_view(stream).substr(offset, chunk));
      while (std::optional<Frame> frame = decoder.Next()) received.push_back(std::move(*frame));
    }
    ASSERT_FALSE(decoder.error()) << chunk;
    EXPECT_FALSE(decoder.Finish()) << chunk;
    ASSERT_EQ(received.size(), 3u) << chunk;
    for (std::size_t i = 0; i < 3; ++i) {
      EXPECT_TRUE(received[i].kind == sent[i].kind && received[i].id == sent[i].id) << chunk;
      EXPECT_EQ(received[i].body, sent[i].body) << chunk;
    }
  }
}

// Decodes one frame [1, 1, {"v": <value bytes>}] and returns "v".
std::optional<MessageValue> DecodeValue(const std::string& value_bytes) {
  FrameDecoder decoder;
  decoder.Feed(std::string("\x93\x01\x01\x81\xa1v", 6) + value_bytes);
  std::optional<Frame> frame = decoder.Next();
  return frame ? std::optional(*frame->body.Find("v")) : std::nullopt;
}

TEST(Wire, IntegerAndFloatFormatsMapToTheirKinds) {
  struct Case { const char* name; std::string bytes; MessageValue expected; };
  const Case cases[] = {
      {"positive fixint", "\x05", MessageValue::Uint64(5)},
      {"uint16", std::string("\xcd\x01\x00", 3), MessageValue::Uint64(256)},
      {"int8 positive", std::string("\xd0\x05", 2), MessageValue::Uint64(5)},
      {"int64 positive", std::string("\xd3\0\0\0\0\0\0\0\x07", 9), MessageValue::Uint64(7)},
      {"int64 largest", "\xd3\x7f" + std::string(7, '\xff'), MessageValue::Uint64(INT64_MAX)},
      {"uint64 largest", "\xcf" + std::string(8, '\xff'), MessageValue::Uint64(UINT64_MAX)},
      {"int64 smallest", "\xd3\x80" + std::string(7, '\0'), MessageValue::Int64(INT64_MIN)},
      {"negative fixint", "\xff", MessageValue::Int64(-1)},
      {"int16 negative", std::string("\xd1\xff\x00", 3), MessageValue::Int64(-256)},
      {"float32", std::string("\xca\x3f\xc0\x00\x00", 5), MessageValue::Double(1.5)},
      {"str8", std::string("\xd9\x02hi", 4), MessageValue::String("hi")},
      {"bin8", std::string("\xc4\x01\x00", 3), MessageValue::DataFromBytes(std::string("\0", 1))},
  };
  for (const Case& c : cases) EXPECT_EQ(DecodeValue(c.bytes), c.expected) << c.name;
}

std::string Nested(std::size_t depth) { return std::string(depth, '\x91') + '\xc0'; }

TEST(WireErrors, MalformedInputIsReportedWithItsReason) {
  struct Case { const char* name; std::string bytes; FrameError error; };
  const std::string envelope("\x93\x01\x01", 3);
  const Case cases[] = {
      {"never-used byte", std::string("\xc1", 1), FrameError::kBadMessagePack},
      {"bare map", std::string("\x80", 1), FrameError::kBadEnvelope},
      {"two elements", std::string("\x92\x01\x80", 3), FrameError::kBadEnvelope},
      {"four elements", std::string("\x94\x01\x01\x80\xc0", 5), FrameError::kBadEnvelope},
      {"kind 3", std::string("\x93\x03\x01\x80", 4), FrameError::kBadEnvelope},
      {"kind as string", std::string("\x93\xa1" "1" "\x01\x80", 5), FrameError::kBadEnvelope},
      {"negative id", std::string("\x93\x01\xff\x80", 4), FrameError::kBadEnvelope},
      {"array body", std::string("\x93\x01\x01\x90", 4), FrameError::kBadEnvelope},
      {"integer key", envelope + std::string("\x81\x01\xc0", 3), FrameError::kNonStringKey},
      {"nil key", envelope + std::string("\x81\xc0\xc0", 3), FrameError::kNonStringKey},
      {"bin key", envelope + std::string("\x81\xc4\x01k\xc0", 5), FrameError::kNonStringKey},
      {"map key", envelope + std::string("\x81\x80\xc0", 3), FrameError::kNonStringKey},
      {"nested integer key", envelope + std::string("\x81\xa1v\x81\x02\xc0", 6), FrameError::kNonStringKey},
      {"fixext", envelope + std::string("\x81\xa1v\xd4\x01\x00", 6), FrameError::kExtValue},
      {"ext8 in array", envelope + std::string("\x81\xa1v\x91\xc7\x01\x05\x00", 8), FrameError::kExtValue},
      {"65 containers", envelope + std::string("\x81\xa1v", 3) + Nested(63), FrameError::kTooDeep},
  };
  for (const Case& c : cases) {
    FrameDecoder decoder;
    decoder.Feed(c.bytes);
    EXPECT_FALSE(decoder.Next()) << c.name;
    EXPECT_EQ(decoder.error(), c.error) << c.name;
    // Once failed, the decoder stays failed.
    decoder.Feed(EncodeFrame(Frame{}));
    EXPECT_FALSE(decoder.Next()) << c.name;
  }
  EXPECT_TRUE(DecodeValue(Nested(62))) << "64 containers: the envelope, the body and 62 more";
}

// [1, 1, {"v": bin32 of `payload` bytes}]: 11 bytes of header and the payload.
std::string BinFrame(std::size_t payload) {
  std::string frame("\x93\x01\x01\x81\xa1v\xc6", 7);
  for (int shift = 24; shift >= 0; shift -= 8) frame += static_cast<char>((payload >> shift) & 0xff);
  return frame + std::string(payload, 'y');
}

TEST(WireErrors, FrameOverSixteenMebibytesIsTooBigBeforeItsLastByteArrives) {
  FrameDecoder decoder;
  constexpr std::size_t k16MiB = 16 << 20;
  decoder.Feed(BinFrame(k16MiB).substr(0, k16MiB + 1));
  EXPECT_FALSE(decoder.Next());
  EXPECT_EQ(decoder.error(), FrameError::kTooBig);

  const std::string fits = BinFrame(k16MiB - 11);
  ASSERT_EQ(fits.size(), k16MiB);
  FrameDecoder fitting;
  fitting.Feed(fits);
  EXPECT_TRUE(fitting.Next());
  EXPECT_FALSE(fitting.error());
}

TEST(WireErrors, StreamEndingInsideAFrameIsTruncated) {
  const std::string frame = EncodeFrame(Frame{FrameKind::kWantsReply, 1, MessageValue::MakeDictionary(
                                                  {{"k", MessageValue::String("value")}})});
  for (std::size_t cut : {std::size_t{1}, frame.size() / 2, frame.size() - 1}) {
    FrameDecoder decoder;
    decoder.Feed(std::string_view(frame).substr(0, cut));
    EXPECT_FALSE(decoder.Next());
    EXPECT_FALSE(decoder.error());
    EXPECT_EQ(decoder.Finish(), FrameError::kTruncated) << cut;
  }
}

}  // namespace
}  // namespace lumeris
