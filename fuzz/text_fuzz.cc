// Feeds arbitrary text to StringFromUnicodeCodeString and CharacterInfoFromEntityID.
//
// The first byte chooses how the rest becomes a string (UTF-8, read leniently, or raw UTF-16
// units, so lone surrogates are reached) and which function reads it; the entity ID modes put
// one of the two prefixes in front so the fuzzer spends its time inside the readers. Beyond "no
// crash, no sanitizer report", it checks that whatever the current-form reader accepts, the
// writer writes back to an ID that reads the same character, font and glyph.
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <optional>
#include <string_view>

#include "entity/character_info.h"
#include "entity/entity_id.h"
#include "entity/recent_equality.h"
#include "platform/log.h"
#include "text/code_string.h"
#include "text/emoji.h"
#include "text/utf8.h"

namespace {

icu::UnicodeString Utf16From(const uint8_t* data, size_t size) {
  icu::UnicodeString text;
  for (size_t i = 0; i + 1 < size; i += 2) {
    text.append(static_cast<char16_t>(data[i] | (data[i + 1] << 8)));
  }
  return text;
}

void Require(bool condition) {
  if (!condition) std::abort();
}

void CheckWriterReadsBack(const lumeris::CharacterInfo& info) {
  const icu::UnicodeString id = lumeris::EntityIDFromCharacterInfo(info);
  std::optional<lumeris::CharacterInfo> again;
  Require(lumeris::CharacterInfoFromEntityID(id, &again));
  Require(again.has_value());
  Require(again->character == info.character);
  Require(again->glyph == info.glyph);
  const bool font_kept = info.glyph.has_value() ||
                         (info.font && lumeris::IsEmojiFontName(*info.font));
  Require(again->font == (font_kept ? info.font : std::nullopt));
  Require(lumeris::IsEqualRecentEntityID(id, id));
}

void ReadEntityID(const icu::UnicodeString& id) {
  std::optional<lumeris::CharacterInfo> info;
  std::optional<icu::UnicodeString> character;
  std::optional<icu::UnicodeString> font;
  uint32_t glyph = 0;
  if (!lumeris::CharacterInfoFromEntityID(id, &info, &character, &font, &glyph)) return;
  if (info && id.startsWith(icu::UnicodeString(lumeris::kEntityIDPrefix))) {
    Require(info->character == character && info->font == font);
    CheckWriterReadsBack(*info);
  }
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
  lumeris::SetLogProgramName("lumeris_text_fuzz");
  return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  if (size == 0) return 0;
  const uint8_t mode = data[0] % 6;
  const uint8_t* rest = data + 1;
  const size_t rest_size = size - 1;
  const icu::UnicodeString text =
      (mode % 2 == 0) ? lumeris::DecodeUtf8Lenient(
                            std::string_view(reinterpret_cast<const char*>(rest), rest_size))
                      : Utf16From(rest, rest_size);
  switch (mode / 2) {
    case 0:
      if (std::optional<icu::UnicodeString> decoded = lumeris::StringFromUnicodeCodeString(text)) {
        Require(!decoded->isBogus());
      }
      break;
    case 1:
      ReadEntityID(icu::UnicodeString(lumeris::kEntityIDPrefix) + text);
      break;
    default:
      ReadEntityID(icu::UnicodeString(lumeris::kOldEntityIDPrefix) + text);
      break;
  }
  return 0;
}
