// Feeds arbitrary bytes to the service's frame decoder, as a client's socket would deliver them,
// and every frame it yields to the request dispatch, with operations that record what they are
// given and answer with values of the shapes the real ones give.
//
// The first byte chooses the sizes of the pieces the rest arrives in (a byte at a time up to all
// at once), so that frames split anywhere are reached. Beyond "no crash, no sanitizer report",
// it checks what must hold for any input: the same bytes in other pieces give the same frames and
// the same error; a reply is a dictionary, and it encodes to a frame that decodes to itself;
// every string an operation gets is one the request carried (or empty).
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <string_view>
#include <vector>

#include "service/dispatch.h"
#include "service/service_operations.h"
#include "service/wire.h"

namespace {

using lumeris::Frame;
using lumeris::FrameDecoder;
using lumeris::MessageValue;
using lumeris::OptionalString;
using lumeris::StringList;

void Require(bool condition) {
  if (!condition) std::abort();
}

// The decoded frames and the error, for the bytes fed in pieces of at most `piece` bytes.
struct Decoded {
  std::vector<Frame> frames;
  bool failed = false;
};

Decoded Decode(std::string_view bytes, std::size_t piece) {
  Decoded decoded;
  FrameDecoder decoder;
  for (std::size_t at = 0; at < bytes.size(); at += piece) {
    decoder.Feed(bytes.substr(at, piece));
    while (std::optional<Frame> frame = decoder.Next()) decoded.frames.push_back(std::move(*frame));
  }
  decoder.Finish();
  while (std::optional<Frame> frame = decoder.Next()) decoded.frames.push_back(std::move(*frame));
  decoded.failed = decoder.error().has_value();
  return decoded;
}

// Whether `text` occurs among the strings of `value`, at any depth.
bool Carries(const MessageValue& value, const std::string& text) {
  if (const std::string* string = value.AsString()) return *string == text;
  if (const MessageValue::Array* array = value.AsArray()) {
    for (const MessageValue& element : *array) {
      if (Carries(element, text)) return true;
    }
  }
  if (const MessageValue::Dictionary* dictionary = value.AsDictionary()) {
    for (const auto& [key, element] : *dictionary) {
      if (Carries(element, text)) return true;
    }
  }
  return false;
}

// Equality by encoding, under which a NaN equals itself.
bool Same(const MessageValue& a, const MessageValue& b) {
  return lumeris::EncodeMessageValue(a) == lumeris::EncodeMessageValue(b);
}

lumeris::ServiceOperations RecordingOperations(const MessageValue& request) {
  // An absent or unusable required string reaches an operation as the empty string.
  const auto check = [&request](const OptionalString& text) {
    Require(!text || text->empty() || Carries(request, *text));
  };
  const auto list = [] {
    return StringList(std::vector<std::string>{"U+1F600", "U+2764"});
  };
  lumeris::ServiceOperations operations;
  operations.CopyRecentsIDArray = [=](const OptionalString& id) { check(id); return list(); };
  operations.SetRecentsIDArray = [=](const StringList&, const OptionalString& id) { check(id); };
  operations.AddRecentID = [=](const std::string& item, const OptionalString& id) { check(item); check(id); };
  operations.CopyFavoritesIDArray = [=](const OptionalString& id) { check(id); return list(); };
  operations.SetFavoritesIDArray = [=](const StringList&, const OptionalString& id) { check(id); };
  operations.CopySkinToneHistory = [=](const OptionalString& id) { check(id); return OptionalString("{}"); };
  operations.SetLastSkinToneSelection = [=](const std::string& item, const OptionalString& id) { check(item); check(id); };
  operations.CopyLastState = [=](const OptionalString& application) { check(application); return OptionalString("{\"a\":1}"); };
  operations.SetLastState = [=](const OptionalString&, const OptionalString& application) { check(application); };
  operations.CreateXPCCategoryDataArray = [](const StringList&) { return MessageValue::MakeArray(); };
  operations.UpdateCountryInfoAndCheckSignificantChange = [] { return false; };
  operations.createXPCArrayForSearchString = [=](const std::string& text, std::uint64_t) {
    check(text);
    return MessageValue::MakeArray();
  };
  operations.createXPCArrayForRelatedCharacters = [=](const std::string& text, std::uint64_t) {
    check(text);
    return MessageValue::MakeArray();
  };
  operations.createXPCDictionaryForCharacterInfo = [=](const std::string& text) {
    check(text);
    return MessageValue::MakeDictionary();
  };
  operations.PrepareOpeningLargeVistrel = [=](const OptionalString& path) { check(path); return true; };
  return operations;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  if (size == 0) return 0;
  const std::size_t piece = std::size_t{1} << (data[0] % 25);
  const std::string_view bytes(reinterpret_cast<const char*>(data + 1), size - 1);

  const Decoded whole = Decode(bytes, bytes.size() + 1);
  const Decoded pieces = Decode(bytes, piece);
  Require(whole.failed == pieces.failed && whole.frames.size() == pieces.frames.size());
  for (std::size_t i = 0; i < whole.frames.size(); ++i) {
    const Frame& frame = whole.frames[i];
    Require(frame.kind == pieces.frames[i].kind && frame.id == pieces.frames[i].id &&
            Same(frame.body, pieces.frames[i].body));
    std::optional<MessageValue> reply = lumeris::DispatchServiceRequest(frame.body, RecordingOperations(frame.body));
    if (!reply) continue;
    Require(reply->AsDictionary() != nullptr);
    const Frame answer{lumeris::FrameKind::kReply, frame.id, std::move(*reply)};
    const Decoded again = Decode(lumeris::EncodeFrame(answer), std::size_t{1} << 30);
    Require(!again.failed && again.frames.size() == 1 && Same(again.frames[0].body, answer.body));
  }
  return 0;
}
