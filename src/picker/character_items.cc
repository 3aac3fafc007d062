#include "picker/character_items.h"

#include <nlohmann/json.hpp>
#include <unicode/uchar.h>

#include "client/cli_items.h"
#include "platform/font_coverage.h"
#include "text/emoji.h"
#include "text/emoji_tables.h"
#include "text/utf8.h"

namespace lumeris::picker {
namespace {

constexpr std::string_view kEmojiFamily = "VantorelColorEmoji";

bool AsksForEmojiPresentation(const icu::UnicodeString& text) {
  for (int32_t i = 0; i < text.length(); i = text.moveIndex32(i, 1)) {
    const UChar32 c = text.char32At(i);
    if (i == 0 && u_hasBinaryProperty(c, UCHAR_EMOJI_PRESENTATION)) return true;
    if (c == static_cast<UChar32>(kEmojiPresentationSelector) || IsSkinToneModifier(static_cast<uint32_t>(c)) ||
        c == 0x20E3 || c == 0x200D || (c >= 0x1F1E6 && c <= 0x1F1FF)) {
      return true;
    }
  }
  return false;
}

}  // namespace

bool IsEmojiCharacter(std::string_view character) {
  const icu::UnicodeString text = DecodeUtf8Lenient(character);
  return !text.isEmpty() && AsksForEmojiPresentation(text) && ColorFontDrawsString(kEmojiFamily, text);
}

std::string EntityIDForCharacter(std::string_view character) {
  return cli::EntityIDForItem(character, {.emoji_font = IsEmojiCharacter(character)});
}

std::optional<std::string> CharacterOfEntityID(std::string_view entity_id) {
  cli::ItemDescription description = cli::DescribeEntityID(entity_id);
  if (!description.character || description.character->empty()) return std::nullopt;
  return std::move(description.character);
}

std::vector<std::string> CharactersOfIDArray(const MessageValue* list) {
  std::vector<std::string> characters;
  const MessageValue::Array* array = list ? list->AsArray() : nullptr;
  for (std::size_t i = 0; array && i < array->size(); ++i) {
    const std::string* id = (*array)[i].AsString();
    if (std::optional<std::string> character = id ? CharacterOfEntityID(*id) : std::nullopt) {
      characters.push_back(std::move(*character));
    }
  }
  return characters;
}

std::vector<std::string> SkinToneVariants(std::string_view character) {
  const icu::UnicodeString text = DecodeUtf8Lenient(character);
  const uint32_t base = ContainedDiversityUnicode(text);
  const std::optional<icu::UnicodeString> key = ReplacementDictionaryNormalizedKeyString(text);
  if (base == 0 || !key || key->char32At(0) != static_cast<UChar32>(base)) return {};
  std::vector<std::string> variants = {EncodeUtf8Lenient(*key)};
  for (uint32_t tone = kFirstSkinToneModifier; tone <= kLastSkinToneModifier; ++tone) {
    icu::UnicodeString variant;
    variant.append(static_cast<UChar32>(base)).append(static_cast<UChar32>(tone));
    variants.push_back(EncodeUtf8Lenient(variant));
  }
  return variants;
}

ReplacementDictionary ParseSkinToneHistory(const MessageValue::Bytes* json) {
  ReplacementDictionary history;
  if (json == nullptr) return history;
  const nlohmann::json parsed = nlohmann::json::parse(json->begin(), json->end(), nullptr, false);
  if (!parsed.is_object()) return history;
  for (const auto& [key, value] : parsed.items()) {
    if (value.is_string()) history[DecodeUtf8Lenient(key)] = DecodeUtf8Lenient(value.get<std::string>());
  }
  return history;
}

std::string WithRememberedSkinTone(std::string_view character, const ReplacementDictionary& history) {
  bool had_skin_tone = false;
  const std::optional<icu::UnicodeString> key =
      ReplacementDictionaryNormalizedKeyString(DecodeUtf8Lenient(character), &had_skin_tone);
  if (!key || had_skin_tone) return std::string(character);
  const auto found = history.find(*key);
  return found == history.end() ? std::string(character) : EncodeUtf8Lenient(found->second);
}

}  // namespace lumeris::picker
