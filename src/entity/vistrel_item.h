// The Vistrel item: the dictionary shape in which older versions of the panel kept recents and
// favourites, and its conversions to and from entity IDs.
//
// Thread-safety: pure functions (apart from the reader's log line for damaged JSON); safe on any
// thread.
// Ownership: results are new values owned by the caller.
#pragma once

#include <unicode/unistr.h>

#include <cstdint>
#include <optional>

namespace lumeris {

struct VistrelItem {
  // "EntityID": when present it is authoritative and the other members are ignored.
  std::optional<icu::UnicodeString> entity_id;
  // "String": the character.
  std::optional<icu::UnicodeString> string;
  // "Font": the font name.
  std::optional<icu::UnicodeString> font;
  // "Glyph": the glyph index. VistrelItemFromEntityID writes only its low 16 bits, as the
  // older panel kept it as an unsigned 16-bit number.
  std::optional<uint32_t> glyph;

  bool operator==(const VistrelItem&) const = default;
};

// `item.entity_id` when present; otherwise the current-form ID of the character-info dictionary
// made of "String", "Font" and "Glyph" (so a font without a glyph survives only when it is the
// emoji font).
icu::UnicodeString EntityIDFromVistrelItem(const VistrelItem& item);

// The item for `entity_id`: a string that is not an entity ID goes whole under "EntityID";
// otherwise "Font" and "String" when known and, when the glyph is not 0, its low 16 bits under
// "Glyph".
VistrelItem VistrelItemFromEntityID(const icu::UnicodeString& entity_id);

}  // namespace lumeris
