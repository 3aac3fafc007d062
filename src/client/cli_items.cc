#include "client/cli_items.h"

#include <cstdio>

#include <nlohmann/json.hpp>

#include "entity/entity_id.h"
#include "text/emoji.h"
#include "text/utf8.h"

namespace lumeris::cli {

bool IsEntityID(std::string_view text) {
  const std::string current = EncodeUtf8Lenient(icu::UnicodeString(kEntityIDPrefix));
  const std::string old = EncodeUtf8Lenient(icu::UnicodeString(kOldEntityIDPrefix));
  return text.starts_with(current) || text.starts_with(old);
}

std::optional<std::string> ItemProblem(std::string_view item) {
  if (item.empty()) return "an item is a character or an entity ID, not empty text";
  const std::string current = EncodeUtf8Lenient(icu::UnicodeString(kEntityIDPrefix));
  if (!item.starts_with(current)) return std::nullopt;
  const nlohmann::json json = nlohmann::json::parse(item.substr(current.size()), nullptr, /*allow_exceptions=*/false);
  if (json.is_object()) return std::nullopt;
  return "\"" + std::string(item) + "\" is not a valid entity ID: after \"" + current +
         "\" comes a JSON object such as {\"char\":\"A\"}";
}

bool TakesSkinTone(std::string_view character) {
  return ContainedDiversityUnicode(DecodeUtf8Lenient(character)) != 0;
}

std::string EntityIDForItem(std::string_view item, const ItemOptions& options) {
  if (IsEntityID(item)) return std::string(item);
  CharacterInfo info;
  info.character = DecodeUtf8Lenient(item);
  if (options.font) {
    info.font = DecodeUtf8Lenient(*options.font);
  } else if (options.emoji_font) {
    info.font = icu::UnicodeString(kEmojiFontName);
  }
  info.glyph = options.glyph;
  return EncodeUtf8Lenient(EntityIDFromCharacterInfo(info));
}

ItemDescription DescribeEntityID(std::string_view entity_id) {
  ItemDescription description;
  std::optional<icu::UnicodeString> character;
  std::optional<icu::UnicodeString> font;
  std::optional<CharacterInfo> info;
  if (!CharacterInfoFromEntityID(DecodeUtf8Lenient(entity_id), &info, &character, &font)) {
    description.opaque = true;
    description.character = std::string(entity_id);
    return description;
  }
  if (character) description.character = EncodeUtf8Lenient(*character);
  if (font) description.font = EncodeUtf8Lenient(*font);
  // The glyph only when the ID really holds one (the reader reports 0 for "none").
  if (info && info->glyph) description.glyph = info->glyph;
  return description;
}

std::string CodePoints(std::string_view utf8) {
  const icu::UnicodeString text = DecodeUtf8Lenient(utf8);
  std::string result;
  for (int32_t i = 0; i < text.length(); i = text.moveIndex32(i, 1)) {
    char code[16];
    std::snprintf(code, sizeof code, "U+%04X", static_cast<unsigned>(text.char32At(i)));
    if (!result.empty()) result += ' ';
    result += code;
  }
  return result;
}

}  // namespace lumeris::cli
