// The service's wire format: a stream of MessagePack values, each an array of three,
// [kind, id, body]. kind 0 is a message that wants no reply, kind 1 one that wants a reply,
// kind 2 a reply; id is the sender's unsigned number for the message (a reply carries the id of
// the message it answers); body is a map with str keys, the message dictionary.
//
// Value mapping: dictionary <-> map (str keys only), array <-> array, string <-> str (bytes kept
// as sent), uint64 <-> any non-negative integer, int64 <-> negative integer, double <-> float 32
// or float 64 (float 64 written), bool <-> bool, data <-> bin, null <-> nil. An ext value, a
// non-str key, a frame over kMaxFrameBytes or one nested deeper than kMaxFrameDepth containers
// (the envelope array counts as the first) is malformed.
//
//   FrameDecoder decoder;
//   decoder.Feed(bytes_just_read);
//   while (std::optional<Frame> frame = decoder.Next()) Handle(*frame);
//   if (decoder.error()) CloseConnection();
//
// This layer knows nothing of commands or sockets.
//
// Thread-safety: EncodeFrame() is reentrant. A FrameDecoder belongs to one connection and is
// used by one thread at a time.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "service/message_value.h"

namespace lumeris {

inline constexpr std::size_t kMaxFrameBytes = 16 * 1024 * 1024;
inline constexpr std::size_t kMaxFrameDepth = 64;

enum class FrameKind : std::uint8_t { kNoReply = 0, kWantsReply = 1, kReply = 2 };

struct Frame {
  FrameKind kind = FrameKind::kNoReply;
  std::uint64_t id = 0;
  MessageValue body = MessageValue::MakeDictionary();
};

// Why a byte stream is not a valid sequence of frames.
enum class FrameError {
  kBadMessagePack,  // bytes that are not MessagePack at all
  kBadEnvelope,     // a value that is not [kind 0..2, unsigned id, map]
  kNonStringKey,    // a map key that is not a str
  kExtValue,        // an ext value anywhere
  kTooBig,          // a frame over kMaxFrameBytes
  kTooDeep,         // containers nested deeper than kMaxFrameDepth
  kTruncated,       // the stream ended inside a frame
};

// A stable lower-case name for logs ("bad MessagePack", "too deep", ...).
std::string_view FrameErrorName(FrameError error);

// Appends the encoding of `frame` to `out`.
void AppendEncodedFrame(const Frame& frame, std::string& out);
// The encoding of `frame`.
std::string EncodeFrame(const Frame& frame);
// The MessagePack encoding of one value on its own (no envelope).
std::string EncodeMessageValue(const MessageValue& value);

// Turns received bytes into frames. Bytes may arrive in pieces of any size; every complete
// frame is returned once, in order. After the first malformed byte the decoder stays failed.
class FrameDecoder {
 public:
  FrameDecoder();
  ~FrameDecoder();
  FrameDecoder(const FrameDecoder&) = delete;
  FrameDecoder& operator=(const FrameDecoder&) = delete;

  // Adds received bytes. Does nothing once the decoder has failed.
  void Feed(std::string_view bytes);
  // The next complete frame, or std::nullopt when more bytes are needed or the stream is
  // malformed (then error() says why).
  std::optional<Frame> Next();
  // Call when the peer closed the stream: a partly received frame becomes kTruncated.
  // Returns error() afterwards.
  std::optional<FrameError> Finish();
  // The reason the stream is malformed, once it is.
  std::optional<FrameError> error() const { return error_; }
  // True when some bytes of an unfinished frame are buffered.
  bool HasPartialFrame() const;

 private:
  class Parser;
  std::unique_ptr<Parser> parser_;
  std::optional<FrameError> error_;
};

}  // namespace lumeris
