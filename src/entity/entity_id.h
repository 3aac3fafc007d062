// Entity IDs: the one string that names a remembered character (recents, favourites, skin-tone
// history) together with, optionally, the font and glyph it was picked in.
//
// Two forms exist:
//   current: "com.vantorel.lmk:" + compact JSON of a character-info dictionary, for example
//            com.vantorel.lmk:{"char":"A"}
//   old:     "com.vantorel.Lumeris:" + tagged fields "<font>F", "<glyph>7", "<string>A" (or the
//            bare character when neither font nor glyph is present; "<null>" for no character).
// Any other string is an opaque token: the reader refuses it and callers keep it as it is.
// docs/text.md gives the JSON key order and escaping the writer uses.
//
// Thread-safety: pure functions apart from the log line the reader writes for damaged JSON; safe
// on any thread.
// Ownership: results and out-arguments are new values owned by the caller.
#pragma once

#include <unicode/unistr.h>

#include <cstdint>
#include <optional>

#include "entity/character_info.h"

namespace lumeris {

inline constexpr char16_t kEntityIDPrefix[] = u"com.vantorel.lmk:";
inline constexpr char16_t kOldEntityIDPrefix[] = u"com.vantorel.Lumeris:";

// The current-form ID of `info`. "char" is copied when present; "glyph" and "font" are copied
// when a glyph is present; without a glyph, "font" is kept only when it is the emoji font (so a
// plain character chosen in a text font is recorded without its font). `extra_json` is not
// written. Keys are emitted in the order "char", "font", "glyph", so the same dictionary always
// gives the same text.
icu::UnicodeString EntityIDFromCharacterInfo(const CharacterInfo& info);

// The old-form ID: "<font>" + font when a font is given (even an empty one), "<glyph>" + the glyph
// as a signed decimal when it is not 0, then "<string>" + the character, or the bare character when
// neither field was written; an empty character is written as "<null>".
icu::UnicodeString EntityIDFromOldCharacterInfo(const icu::UnicodeString& character,
                                                const std::optional<icu::UnicodeString>& font,
                                                uint32_t glyph);

// Reads an entity ID of either form. Returns false, writing nothing, when `entity_id` begins with
// neither prefix; otherwise writes the out-arguments that are not null and returns true:
//   - current form with valid JSON: the members found (`glyph` 0 when absent); `info` receives the
//     whole parsed object, extra keys included.
//   - current form with damaged JSON (or JSON that is not an object): logs
//     "CharacterInfoFromEntityID failed due to <description>"; no character, no font, glyph 0, and
//     `info` receives std::nullopt.
//   - current form holding an unpaired surrogate (no UTF-8 form): no character, no font, glyph 0;
//     `info` is left untouched.
//   - old form: the tagged fields as docs/text.md describes; a character that is empty or
//     "<null>" reads as none; `info` holds "glyph" whenever a glyph field was present.
bool CharacterInfoFromEntityID(const icu::UnicodeString& entity_id,
                               std::optional<CharacterInfo>* info = nullptr,
                               std::optional<icu::UnicodeString>* character = nullptr,
                               std::optional<icu::UnicodeString>* font = nullptr,
                               uint32_t* glyph = nullptr);

}  // namespace lumeris
