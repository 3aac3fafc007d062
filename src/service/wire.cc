#include "service/wire.h"

#include <msgpack.hpp>

#include <cstring>
#include <limits>
#include <utility>
#include <vector>

namespace lumeris {

std::string_view FrameErrorName(FrameError error) {
  switch (error) {
    case FrameError::kBadMessagePack:
      return "bad MessagePack";
    case FrameError::kBadEnvelope:
      return "wrong envelope";
    case FrameError::kNonStringKey:
      return "non-string map key";
    case FrameError::kExtValue:
      return "ext value";
    case FrameError::kTooBig:
      return "frame too big";
    case FrameError::kTooDeep:
      return "frame nested too deep";
    case FrameError::kTruncated:
      return "truncated frame";
  }
  return "malformed frame";
}

namespace {

// msgpack::packer writes into anything with write(const char*, size_t).
struct StringSink {
  std::string& out;
  void write(const char* data, std::size_t size) { out.append(data, size); }
};

// Always float 64: msgpack-c's pack_double() writes integral doubles as integers, which would
// turn a double into a uint64 or int64 on the other side.
void PackFloat64(StringSink& sink, double value) {
  std::uint64_t bits;
  std::memcpy(&bits, &value, sizeof bits);
  char bytes[9];
  bytes[0] = static_cast<char>(0xcb);
  for (int i = 0; i < 8; ++i) bytes[1 + i] = static_cast<char>(bits >> (56 - 8 * i));
  sink.write(bytes, sizeof bytes);
}

// `packer` writes straight into `sink`, so both may be used in turn.
void PackValue(msgpack::packer<StringSink>& packer, StringSink& sink, const MessageValue& value) {
  switch (value.kind()) {
    case MessageValue::Kind::kNull:
      packer.pack_nil();
      return;
    case MessageValue::Kind::kBool:
      if (*value.AsBool()) {
        packer.pack_true();
      } else {
        packer.pack_false();
      }
      return;
    case MessageValue::Kind::kUint64:
      packer.pack_uint64(*value.AsUint64());
      return;
    case MessageValue::Kind::kInt64:
      packer.pack_int64(*value.AsInt64());
      return;
    case MessageValue::Kind::kDouble:
      PackFloat64(sink, *value.AsDouble());
      return;
    case MessageValue::Kind::kString: {
      const std::string& text = *value.AsString();
      packer.pack_str(static_cast<std::uint32_t>(text.size()));
      packer.pack_str_body(text.data(), static_cast<std::uint32_t>(text.size()));
      return;
    }
    case MessageValue::Kind::kData: {
      const MessageValue::Bytes& bytes = *value.AsData();
      packer.pack_bin(static_cast<std::uint32_t>(bytes.size()));
      packer.pack_bin_body(reinterpret_cast<const char*>(bytes.data()),
                           static_cast<std::uint32_t>(bytes.size()));
      return;
    }
    case MessageValue::Kind::kArray: {
      const MessageValue::Array& elements = *value.AsArray();
      packer.pack_array(static_cast<std::uint32_t>(elements.size()));
      for (const MessageValue& element : elements) PackValue(packer, sink, element);
      return;
    }
    case MessageValue::Kind::kDictionary: {
      const MessageValue::Dictionary& entries = *value.AsDictionary();
      packer.pack_map(static_cast<std::uint32_t>(entries.size()));
      for (const auto& [key, element] : entries) {
        packer.pack_str(static_cast<std::uint32_t>(key.size()));
        packer.pack_str_body(key.data(), static_cast<std::uint32_t>(key.size()));
        PackValue(packer, sink, element);
      }
      return;
    }
  }
}

}  // namespace

void AppendEncodedFrame(const Frame& frame, std::string& out) {
  StringSink sink{out};
  msgpack::packer<StringSink> packer(sink);
  packer.pack_array(3);
  packer.pack_uint64(static_cast<std::uint64_t>(frame.kind));
  packer.pack_uint64(frame.id);
  PackValue(packer, sink, frame.body);
}

std::string EncodeFrame(const Frame& frame) {
  std::string out;
  AppendEncodedFrame(frame, out);
  return out;
}

std::string EncodeMessageValue(const MessageValue& value) {
  std::string out;
  StringSink sink{out};
  msgpack::packer<StringSink> packer(sink);
  PackValue(packer, sink, value);
  return out;
}

namespace {

// Builds MessageValues from msgpack-c's parse events, rejecting what the wire forbids as soon
// as it is seen (ext values, non-str keys, nesting beyond the limit). Every byte it keeps is
// copied, so the parser's buffer is never referenced after an event.
class ValueBuilder {
 public:
  // Events of msgpack-c's visitor interface. Returning false stops the parse.
  bool visit_nil() { return Put(MessageValue::Null()); }
  bool visit_boolean(bool v) { return Put(MessageValue::Bool(v)); }
  bool visit_positive_integer(std::uint64_t v) { return Put(MessageValue::Uint64(v)); }
  bool visit_negative_integer(std::int64_t v) {
    // A non-negative value in a signed format is still a uint64.
    if (v >= 0) return Put(MessageValue::Uint64(static_cast<std::uint64_t>(v)));
    return Put(MessageValue::Int64(v));
  }
  bool visit_float32(float v) { return Put(MessageValue::Double(v)); }
  bool visit_float64(double v) { return Put(MessageValue::Double(v)); }
  bool visit_str(const char* v, std::uint32_t size) {
    if (in_key_) {
      levels_.back().key.assign(v, size);
      key_seen_ = true;
      return true;
    }
    return Put(MessageValue::String(std::string(v, size)));
  }
  bool visit_bin(const char* v, std::uint32_t size) {
    const auto* bytes = reinterpret_cast<const std::uint8_t*>(v);
    return Put(MessageValue::Data(MessageValue::Bytes(bytes, bytes + size)));
  }
  bool visit_ext(const char*, std::uint32_t) { return Fail(FrameError::kExtValue); }
  bool start_array(std::uint32_t) { return Open(MessageValue::MakeArray()); }
  bool start_array_item() { return true; }
  bool end_array_item() { return true; }
  bool end_array() { return Close(); }
  bool start_map(std::uint32_t) { return Open(MessageValue::MakeDictionary()); }
  bool start_map_key() {
    in_key_ = true;
    key_seen_ = false;
    return true;
  }
  bool end_map_key() {
    in_key_ = false;
    return key_seen_ || Fail(FrameError::kNonStringKey);
  }
  bool start_map_value() { return true; }
  bool end_map_value() { return true; }
  bool end_map() { return Close(); }
  void parse_error(std::size_t, std::size_t) { error_ = FrameError::kBadMessagePack; }
  void insufficient_bytes(std::size_t, std::size_t) {}
  bool referenced() const { return false; }
  void set_referenced(bool) {}

  // Called by the parser when a new value starts.
  void init() {
    levels_.clear();
    root_.reset();
    in_key_ = false;
    key_seen_ = false;
  }

  std::optional<FrameError> error() const { return error_; }
  // The finished top-level value; valid after the parser reports success.
  MessageValue TakeRoot() { return std::move(root_).value_or(MessageValue()); }
  bool HasOpenContainers() const { return !levels_.empty(); }

 private:
  struct Level {
    MessageValue container;
    std::string key;  // the pending key while a map's value is parsed
  };

  bool Fail(FrameError error) {
    error_ = error;
    return false;
  }

  // A scalar or a finished container goes into its parent (or becomes the root).
  bool Put(MessageValue value) {
    if (in_key_) return Fail(FrameError::kNonStringKey);
    if (levels_.empty()) {
      root_ = std::move(value);
      return true;
    }
    Level& parent = levels_.back();
    if (parent.container.is_array()) {
      parent.container.Append(std::move(value));
    } else {
      parent.container.Set(std::move(parent.key), std::move(value));
      parent.key.clear();
    }
    return true;
  }

  bool Open(MessageValue container) {
    if (in_key_) return Fail(FrameError::kNonStringKey);
    if (levels_.size() >= kMaxFrameDepth) return Fail(FrameError::kTooDeep);
    levels_.push_back(Level{std::move(container), {}});
    return true;
  }

  bool Close() {
    MessageValue finished = std::move(levels_.back().container);
    levels_.pop_back();
    return Put(std::move(finished));
  }

  std::vector<Level> levels_;
  std::optional<MessageValue> root_;
  bool in_key_ = false;
  bool key_seen_ = false;
  std::optional<FrameError> error_;
};

// The envelope [kind, id, body] of a finished top-level value.
std::optional<Frame> FrameFromEnvelope(MessageValue root) {
  MessageValue::Array* parts = root.AsArray();
  if (parts == nullptr || parts->size() != 3) return std::nullopt;
  const std::uint64_t* kind = (*parts)[0].AsUint64();
  const std::uint64_t* id = (*parts)[1].AsUint64();
  if (kind == nullptr || *kind > 2 || id == nullptr || !(*parts)[2].is_dictionary()) {
    return std::nullopt;
  }
  return Frame{static_cast<FrameKind>(*kind), *id, std::move((*parts)[2])};
}

// The parser's buffer holds no references to outside memory, so the hook has nothing to do.
struct NoReferencedBuffers {
  void operator()(char*) const {}
};

}  // namespace

// msgpack-c's streaming parser with the builder as its visitor: it keeps its own buffer and
// resumes a partly received value where it stopped, so each byte is parsed once.
class FrameDecoder::Parser : public msgpack::parser<FrameDecoder::Parser, NoReferencedBuffers>,
                             public ValueBuilder {
 public:
  Parser() : msgpack::parser<Parser, NoReferencedBuffers>(hook_) {}
  ValueBuilder& visitor() { return *this; }
  using ValueBuilder::referenced;
  using ValueBuilder::set_referenced;

 private:
  // Must outlive the base class, which keeps a reference; a static object has no state.
  static NoReferencedBuffers hook_;
};

NoReferencedBuffers FrameDecoder::Parser::hook_;

FrameDecoder::FrameDecoder() : parser_(std::make_unique<Parser>()) {}
FrameDecoder::~FrameDecoder() = default;

void FrameDecoder::Feed(std::string_view bytes) {
  if (error_ || bytes.empty()) return;
  parser_->reserve_buffer(bytes.size());
  std::copy(bytes.begin(), bytes.end(), parser_->buffer());
  parser_->buffer_consumed(bytes.size());
}

std::optional<Frame> FrameDecoder::Next() {
  if (error_) return std::nullopt;
  bool complete = false;
  try {
    complete = parser_->next();
  } catch (const std::exception&) {
    // msgpack-c throws for sizes it cannot represent; that is malformed input too.
    error_ = FrameError::kBadMessagePack;
    return std::nullopt;
  }
  if (parser_->error()) {
    error_ = parser_->error();
    return std::nullopt;
  }
  if (!complete) {
    // Everything buffered belongs to the one unfinished frame.
    if (parser_->parsed_size() + parser_->nonparsed_size() > kMaxFrameBytes) {
      error_ = FrameError::kTooBig;
    }
    return std::nullopt;
  }
  const std::size_t frame_size = parser_->parsed_size();
  MessageValue root = parser_->TakeRoot();
  parser_->reset();
  if (frame_size > kMaxFrameBytes) {
    error_ = FrameError::kTooBig;
    return std::nullopt;
  }
  std::optional<Frame> frame = FrameFromEnvelope(std::move(root));
  if (!frame) error_ = FrameError::kBadEnvelope;
  return frame;
}

bool FrameDecoder::HasPartialFrame() const {
  return parser_->nonparsed_size() > 0 || parser_->parsed_size() > 0;
}

std::optional<FrameError> FrameDecoder::Finish() {
  if (!error_ && HasPartialFrame()) error_ = FrameError::kTruncated;
  return error_;
}

}  // namespace lumeris
