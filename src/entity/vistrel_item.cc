#include "entity/vistrel_item.h"

#include "entity/character_info.h"
#include "entity/entity_id.h"

namespace lumeris {

icu::UnicodeString EntityIDFromVistrelItem(const VistrelItem& item) {
  if (item.entity_id) return *item.entity_id;
  CharacterInfo info;
  info.character = item.string;
  info.font = item.font;
  info.glyph = item.glyph;
  return EntityIDFromCharacterInfo(info);
}

VistrelItem VistrelItemFromEntityID(const icu::UnicodeString& entity_id) {
  VistrelItem item;
  std::optional<icu::UnicodeString> character;
  std::optional<icu::UnicodeString> font;
  uint32_t glyph = 0;
  if (!CharacterInfoFromEntityID(entity_id, nullptr, &character, &font, &glyph)) {
    item.entity_id = entity_id;
    return item;
  }
  item.font = std::move(font);
  item.string = std::move(character);
  if (glyph != 0) item.glyph = glyph & 0xFFFF;
  return item;
}

}  // namespace lumeris
