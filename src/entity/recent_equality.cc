#include "entity/recent_equality.h"

#include <optional>

#include "entity/character_info.h"
#include "entity/entity_id.h"
#include "text/emoji.h"

namespace lumeris {
namespace {

bool IsInEmojiFont(const std::optional<CharacterInfo>& info) {
  return info && info->font && IsEmojiFontName(*info->font);
}

uint32_t SkinToneBaseOf(const std::optional<CharacterInfo>& info) {
  if (!info || !info->character) return 0;
  return ContainedDiversityUnicode(*info->character);
}

}  // namespace

bool IsEqualRecentEntityID(const icu::UnicodeString& a, const icu::UnicodeString& b) {
  std::optional<CharacterInfo> a_info;
  std::optional<CharacterInfo> b_info;
  if (CharacterInfoFromEntityID(a, &a_info) && CharacterInfoFromEntityID(b, &b_info)) {
    if (IsInEmojiFont(a_info) != IsInEmojiFont(b_info)) return false;
    const uint32_t a_base = SkinToneBaseOf(a_info);
    if (a_base != 0 && a_base == SkinToneBaseOf(b_info)) return true;
  }
  return a == b;
}

}  // namespace lumeris
