// The replacement dictionary: for each skin-tone-capable emoji, the variant the user last chose.
//
// Its key is the emoji in normalized form (the base emoji without its skin-tone modifier, with
// U+FE0F added when the base is variant-capable); its value is the string that replaces the base
// when the panel shows it. An entry whose value equals its key records that the user chose the
// base form with no skin tone. The user data store keeps this dictionary as the skin-tone history
// and converts it to and from a preferences dictionary.
//
// Example: choosing thumbs-up with a medium skin tone (U+1F44D U+1F3FD) stores that string under
// the key U+1F44D; choosing the raised index finger U+261D stores U+261D U+FE0F under itself.
//
// Thread-safety: pure functions apart from the caller's dictionary, whose access the caller
// serialises.
// Ownership: the dictionary belongs to the caller; returned strings are new values.
#pragma once

#include <unicode/unistr.h>

#include <map>
#include <optional>

namespace lumeris {

// Normalized key string -> chosen variant, ordered by UTF-16 code units.
using ReplacementDictionary = std::map<icu::UnicodeString, icu::UnicodeString>;

// The normalized key of `text`, or std::nullopt when `text` is not a lone skin-tone-capable emoji
// (see ContainedDiversityUnicode). The key is `text` with a trailing skin-tone modifier (the units
// 0xD83C 0xDFFB..0xDFFF, when the string has at least three units) removed, and with U+FE0F
// appended when the base emoji is variant-capable and the string does not already end in U+FE0F.
// `had_skin_tone`, when not null, receives whether a modifier was removed; it is left untouched
// when there is no key. Allocates nothing.
std::optional<icu::UnicodeString> ReplacementDictionaryNormalizedKeyString(
    const icu::UnicodeString& text, bool* had_skin_tone = nullptr);

// Records the choice `text` in `dictionary`: an empty `text` clears the whole dictionary and
// returns true; a string without a key returns false and leaves the dictionary unchanged;
// otherwise dictionary[key] becomes `text` when it carried a skin tone, else the key itself, and
// the result is true.
bool UpdateReplacementDictionary(const icu::UnicodeString& text,
                                 ReplacementDictionary& dictionary);

}  // namespace lumeris
