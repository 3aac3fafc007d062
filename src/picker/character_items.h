// The picker's characters and the service's items: which characters count as emoji, the entity
// ID the picker stores for a character, the skin-tone variants an emoji offers and the variant
// the user last chose for it.
//
//   EntityIDForCharacter("❤️")  -> com.vantorel.lmk:{"char":"❤️","font":"VantorelColorEmoji"}
//   SkinToneVariants("👍")      -> {"👍", "👍🏻", "👍🏼", "👍🏽", "👍🏾", "👍🏿"}
//   WithRememberedSkinTone("👍", history holding 👍 -> 👍🏽)  -> "👍🏽"
//
// Characters are UTF-8 strings, as the service sends them.
//
// Thread-safety: pure functions (the emoji test reads the process-wide font coverage cache,
// which is thread-safe). Results belong to the caller.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "service/message_value.h"
#include "text/replacement_dictionary.h"

namespace lumeris::picker {

// True when the character is shown in emoji presentation and the colour emoji font draws it:
// it holds U+FE0F, a skin-tone modifier, a keycap, a joiner or regional indicators, or its first
// code point defaults to emoji presentation. "❤️" and "😀" are emoji; "❤", "7" and "α" are not.
bool IsEmojiCharacter(std::string_view character);

// The entity ID the picker stores (recents, favourites, skin tones) for `character`: the current
// form, naming the colour emoji font for an emoji.
std::string EntityIDForCharacter(std::string_view character);

// The character an entity ID names, or std::nullopt when it names none.
std::optional<std::string> CharacterOfEntityID(std::string_view entity_id);

// The characters of an ID array (a "recents" or "favorites" value, null or absent: none).
std::vector<std::string> CharactersOfIDArray(const MessageValue* list);

// The forms of a skin-tone-capable emoji: the plain form first, then the five tones from light
// to dark. Empty for any other character (and for sequences such as families).
std::vector<std::string> SkinToneVariants(std::string_view character);

// The skin-tone history of a "read_recents_favorites" reply ("skintones": JSON text of an
// object); empty when there is none or it does not parse.
ReplacementDictionary ParseSkinToneHistory(const MessageValue::Bytes* json);

// `character` as the user last chose it: a skin-tone-capable emoji without a tone is replaced
// by the variant the history holds for it; everything else is returned unchanged.
std::string WithRememberedSkinTone(std::string_view character, const ReplacementDictionary& history);

}  // namespace lumeris::picker
