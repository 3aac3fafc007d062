#include "entity/entity_id.h"

#include <unicode/regex.h>
#include <unicode/uchar.h>

#include <cmath>
#include <limits>
#include <memory>
#include <nlohmann/json.hpp>
#include <string>
#include <string_view>

#include "platform/log.h"
#include "text/emoji.h"
#include "text/scalar.h"
#include "text/utf8.h"

namespace lumeris {
namespace {

using Json = nlohmann::json;

constexpr char kCharKey[] = "char";
constexpr char kFontKey[] = "font";
constexpr char kGlyphKey[] = "glyph";

constexpr char16_t kFontTag[] = u"<font>";
constexpr char16_t kGlyphTag[] = u"<glyph>";
constexpr char16_t kStringTag[] = u"<string>";
constexpr char16_t kNullCharacter[] = u"<null>";

// Deeper JSON is treated as damaged: nothing the writer produces nests at all, and the limit keeps
// the recursive parts of the JSON library (copying, dumping) on a small stack.
constexpr int kMaxJsonDepth = 64;

bool StartsWith(const icu::UnicodeString& text, std::u16string_view prefix) {
  return UnitsOf(text).starts_with(prefix);
}

// A copy of `text` after `prefix` (a copy, not an alias: the results outlive the ID they came from).
icu::UnicodeString Rest(const icu::UnicodeString& text, std::u16string_view prefix) {
  return icu::UnicodeString(text, static_cast<int32_t>(prefix.size()));
}

// A JSON number (or boolean) as an unsigned 32-bit glyph: integers keep their low 32 bits,
// fractions are cut toward zero, values beyond 64 bits and NaN read as 0.
std::optional<uint32_t> GlyphFromJson(const Json& value) {
  switch (value.type()) {
    case Json::value_t::number_unsigned:
      return static_cast<uint32_t>(value.get<uint64_t>());
    case Json::value_t::number_integer:
      return static_cast<uint32_t>(value.get<int64_t>());
    case Json::value_t::number_float: {
      const double number = std::trunc(value.get<double>());
      if (!(number >= -9.2e18 && number <= 9.2e18)) return 0u;
      return static_cast<uint32_t>(static_cast<int64_t>(number));
    }
    case Json::value_t::boolean:
      return value.get<bool>() ? 1u : 0u;
    default:
      return std::nullopt;
  }
}

// The JSON text the writer emits: compact, non-ASCII left as raw UTF-8, "/" escaped as "\/".
std::string CompactJson(const Json& object) {
  const std::string text = object.dump(-1, ' ', false, Json::error_handler_t::replace);
  std::string escaped;
  escaped.reserve(text.size() + 8);
  for (char c : text) {
    // A solidus can only stand inside a string value (keys never hold one), so escaping each one is
    // always valid JSON.
    if (c == '/') escaped.push_back('\\');
    escaped.push_back(c);
  }
  return escaped;
}

struct ParsedEntity {
  std::optional<CharacterInfo> info;
  std::optional<icu::UnicodeString> character;
  std::optional<icu::UnicodeString> font;
  uint32_t glyph = 0;
  bool write_info = true;
};

CharacterInfo CharacterInfoFromJsonObject(const Json& object) {
  CharacterInfo info;
  for (const auto& [key, value] : object.items()) {
    if (key == kCharKey && value.is_string()) {
      info.character = DecodeUtf8Lenient(value.get_ref<const std::string&>());
    } else if (key == kFontKey && value.is_string()) {
      info.font = DecodeUtf8Lenient(value.get_ref<const std::string&>());
    } else if (std::optional<uint32_t> glyph = key == kGlyphKey ? GlyphFromJson(value) : std::nullopt) {
      info.glyph = glyph;
    } else {
      info.extra_json.emplace(key, CompactJson(value));
    }
  }
  return info;
}

ParsedEntity ReadCurrentForm(const icu::UnicodeString& json_text) {
  ParsedEntity parsed;
  const std::optional<std::string> utf8 = EncodeUtf8(json_text);
  if (!utf8) {
    parsed.write_info = false;
    return parsed;
  }
  bool too_deep = false;
  const Json::parser_callback_t limit_depth = [&too_deep](int depth, Json::parse_event_t,
                                                          Json&) {
    if (depth > kMaxJsonDepth) too_deep = true;
    return !too_deep;
  };
  std::string failure;
  Json object;
  try {
    object = Json::parse(*utf8, limit_depth);
    if (too_deep) {
      failure = "JSON nested deeper than " + std::to_string(kMaxJsonDepth) + " levels";
    } else if (!object.is_object()) {
      failure = "JSON text that is not an object";
    }
  } catch (const Json::exception& error) {
    failure = error.what();
  }
  if (!failure.empty()) {
    Log("CharacterInfoFromEntityID failed due to " + failure);
    return parsed;
  }
  CharacterInfo info = CharacterInfoFromJsonObject(object);
  parsed.character = info.character;
  parsed.font = info.font;
  parsed.glyph = info.glyph.value_or(0);
  parsed.info = std::move(info);
  return parsed;
}

// The leading integer of `text` (white space skipped, optional sign, decimal digits, saturating
// at 64 bits; 0 when there are no digits), cut to 32 bits.
uint32_t LeadingInteger(std::u16string_view text) {
  size_t i = 0;
  while (i < text.size() && u_isUWhiteSpace(text[i])) ++i;
  bool negative = false;
  if (i < text.size() && (text[i] == u'+' || text[i] == u'-')) negative = text[i++] == u'-';
  uint64_t magnitude = 0;
  constexpr uint64_t kLimit = static_cast<uint64_t>(std::numeric_limits<int64_t>::max());
  for (; i < text.size() && text[i] >= u'0' && text[i] <= u'9'; ++i) {
    magnitude = magnitude > kLimit ? magnitude : magnitude * 10 + (text[i] - u'0');
  }
  int64_t value;
  if (negative) {
    value = magnitude > kLimit ? std::numeric_limits<int64_t>::min()
                               : -static_cast<int64_t>(magnitude);
  } else {
    value = magnitude > kLimit ? std::numeric_limits<int64_t>::max()
                               : static_cast<int64_t>(magnitude);
  }
  return static_cast<uint32_t>(value);
}

// The compiled old-form field pattern, built once; null if ICU could not compile it.
const icu::RegexPattern* OldFormFieldPattern() {
  static const std::unique_ptr<icu::RegexPattern> pattern = [] {
    UErrorCode status = U_ZERO_ERROR;
    UParseError parse_error;
    std::unique_ptr<icu::RegexPattern> compiled(
        icu::RegexPattern::compile(icu::UnicodeString(u"<[^>]+>[^<]+"), parse_error, status));
    if (U_FAILURE(status)) compiled.reset();
    return compiled;
  }();
  return pattern.get();
}

ParsedEntity ReadOldForm(const icu::UnicodeString& rest) {
  std::optional<icu::UnicodeString> font;
  std::optional<icu::UnicodeString> glyph_text;
  std::optional<icu::UnicodeString> tagged_character;
  if (const icu::RegexPattern* pattern = OldFormFieldPattern()) {
    UErrorCode status = U_ZERO_ERROR;
    std::unique_ptr<icu::RegexMatcher> matcher(pattern->matcher(rest, status));
    while (U_SUCCESS(status) && matcher && matcher->find(status) && U_SUCCESS(status)) {
      const icu::UnicodeString field = matcher->group(status);
      if (StartsWith(field, kFontTag)) {
        font = Rest(field, kFontTag);
      } else if (StartsWith(field, kGlyphTag)) {
        glyph_text = Rest(field, kGlyphTag);
      } else if (StartsWith(field, kStringTag)) {
        tagged_character = Rest(field, kStringTag);
      }
    }
  }
  ParsedEntity parsed;
  parsed.glyph = glyph_text ? LeadingInteger(UnitsOf(*glyph_text)) : 0;
  if (font || tagged_character || parsed.glyph != 0) {
    parsed.character = tagged_character;
  } else {
    parsed.character = rest;
  }
  if (parsed.character &&
      (parsed.character->isEmpty() || UnitsOf(*parsed.character) == kNullCharacter)) {
    parsed.character.reset();
  }
  parsed.font = font;
  CharacterInfo info;
  info.character = parsed.character;
  info.font = parsed.font;
  if (glyph_text) info.glyph = parsed.glyph;
  parsed.info = std::move(info);
  return parsed;
}

}  // namespace

icu::UnicodeString EntityIDFromCharacterInfo(const CharacterInfo& info) {
  Json object = Json::object();
  if (info.character) object[kCharKey] = EncodeUtf8Lenient(*info.character);
  if (info.glyph) {
    object[kGlyphKey] = *info.glyph;
    if (info.font) object[kFontKey] = EncodeUtf8Lenient(*info.font);
  } else if (info.font && IsEmojiFontName(*info.font)) {
    object[kFontKey] = EncodeUtf8Lenient(*info.font);
  }
  icu::UnicodeString id(kEntityIDPrefix);
  id.append(DecodeUtf8Lenient(CompactJson(object)));
  return id;
}

icu::UnicodeString EntityIDFromOldCharacterInfo(const icu::UnicodeString& character,
                                                const std::optional<icu::UnicodeString>& font,
                                                uint32_t glyph) {
  icu::UnicodeString id(kOldEntityIDPrefix);
  const bool has_fields = font.has_value() || glyph != 0;
  if (font) id.append(kFontTag).append(*font);
  if (glyph != 0) {
    id.append(kGlyphTag).append(
        icu::UnicodeString::fromUTF8(std::to_string(static_cast<int32_t>(glyph))));
  }
  if (has_fields) id.append(kStringTag);
  if (character.isEmpty()) {
    id.append(kNullCharacter);
  } else {
    id.append(character);
  }
  return id;
}

bool CharacterInfoFromEntityID(const icu::UnicodeString& entity_id,
                               std::optional<CharacterInfo>* info,
                               std::optional<icu::UnicodeString>* character,
                               std::optional<icu::UnicodeString>* font, uint32_t* glyph) {
  ParsedEntity parsed;
  if (StartsWith(entity_id, kEntityIDPrefix)) {
    parsed = ReadCurrentForm(Rest(entity_id, kEntityIDPrefix));
  } else if (StartsWith(entity_id, kOldEntityIDPrefix)) {
    parsed = ReadOldForm(Rest(entity_id, kOldEntityIDPrefix));
  } else {
    return false;
  }
  if (info != nullptr && parsed.write_info) *info = std::move(parsed.info);
  if (character != nullptr) *character = std::move(parsed.character);
  if (font != nullptr) *font = std::move(parsed.font);
  if (glyph != nullptr) *glyph = parsed.glyph;
  return true;
}

}  // namespace lumeris
