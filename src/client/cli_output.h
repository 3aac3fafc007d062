// Human-readable and JSON forms of the service's replies, one function per kind of reply. Each
// human form is whole lines ("...\n"), one result per line; an empty string means there was
// nothing to print (the caller says so in its own words).
//
//   FormatCharacters(["😀", "a"])  ->  "😀\tU+1F600\na\tU+0061\n"
//   FormatItems([entity IDs])       ->  "👍🏽\tU+1F44D U+1F3FD\tVantorelColorEmoji\n"
//
// Thread-safety: pure functions. Results are owned by the caller.
#pragma once

#include <nlohmann/json.hpp>

#include <array>
#include <map>
#include <string>
#include <string_view>
#include <vector>

#include "service/message_value.h"

namespace lumeris::cli {

// The sixteen tags of a character information record in their field order.
inline constexpr std::array<std::string_view, 16> kCharacterInfoTags = {
    "unam", "jyom", "krpi", "spin", "swbx", "swbh", "sbix", "cbai",
    "tcan", "tday", "tpin", "tzhu", "rsu1", "rsu2", "rsu3", "rsu4"};

// What each of the sixteen fields holds, parallel to kCharacterInfoTags.
inline constexpr std::array<std::string_view, 16> kCharacterInfoMeanings = {
    "names and keywords", "Japanese readings", "Korean reading",     "pinyin (mainland)",
    "Wubi code",          "Wubi strokes",      "strokes (mainland)", "Cantonese (Jyutping)",
    "Cangjie code",       "Dayi code",         "pinyin (Taiwan)",    "Zhuyin",
    "radical-stroke 1",   "radical-stroke 2",  "radical-stroke 3",   "radical-stroke 4"};

// The first words of a character's names (field "unam"): the text before the first "; ", cut
// after six words.
std::string ShortCharacterName(std::string_view names);

// One line per string element of a search result: the character, a tab, its code points, and,
// when `names` has one for the character, a tab and its name. Elements that are not strings are
// skipped; a value that is not an array prints nothing.
std::string FormatCharacters(const MessageValue* result,
                             const std::map<std::string, std::string>* names = nullptr);

// A character information record: a first line with the character and its code points, then
// "<tag>\t<meaning>\t<value>" for the sixteen tags in field order (a missing one shows as empty),
// then "<key>\t\t<value>" for any other keys the record holds. An empty or missing record prints
// nothing.
std::string FormatCharacterInfo(std::string_view character, const MessageValue* record);

// One line per entity ID of a recents or favourites list (an array or null): the character, a
// tab, its code points, and the font and glyph when the ID records them; a string that is not
// an entity ID prints as it is, marked "(opaque)".
std::string FormatItems(const MessageValue* list);

// A "read_recents_favorites" reply: recents and favourites as FormatItems() under headings,
// then the skin-tone history and the state as compact JSON.
std::string FormatReadAll(const MessageValue& reply);

// The reply as JSON for --json: JsonFromMessageValue(), except that the JSON payloads
// "skintones" and "state" (data holding JSON text) are embedded as the JSON they hold.
nlohmann::json ReplyJson(const MessageValue& reply);

}  // namespace lumeris::cli
