// The character-info dictionary: what an entity ID says about one remembered character.
//
// Every member is optional; absent means unknown. A current-form entity ID holds this dictionary
// as JSON under the keys "char", "font" and "glyph"; when such an ID is read, every other key it
// carries (and a known key whose value has the wrong JSON type) travels along in `extra_json`, so
// nothing the writer put there is lost.
//
// Thread-safety: a plain value type.
// Ownership: owns all its members.
#pragma once

#include <unicode/unistr.h>

#include <cstdint>
#include <map>
#include <optional>
#include <string>

namespace lumeris {

struct CharacterInfo {
  // "char": the character itself, one or more scalar values.
  std::optional<icu::UnicodeString> character;
  // "font": the name of the font in which the character was chosen.
  std::optional<icu::UnicodeString> font;
  // "glyph": the glyph index within that font.
  std::optional<uint32_t> glyph;
  // The other keys of a parsed current-form ID: key (UTF-8) -> compact JSON text of its value.
  // Only the reader fills this; the writer emits the three keys above and nothing else.
  std::map<std::string, std::string> extra_json;

  bool operator==(const CharacterInfo&) const = default;
};

}  // namespace lumeris
