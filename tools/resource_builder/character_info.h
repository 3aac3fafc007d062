// The rows of the character database: for every listed code point and every fully-qualified emoji
// sequence, the character (`uchr`) and its sixteen-field information text (`info`).
//
// Field order is the order of kCharacterInfoFieldTags; docs/resources.md gives each field's meaning
// and source. Field 0 ("unam") gathers every English text a person may search for: the Unicode
// name (or the derived name, or the name aliases), the CLDR name and keywords, the Unihan
// definition. Fields 1-15 hold the Unihan readings and codes of Han characters.
//
// Thread-safety: pure functions over the inputs they are given. Results belong to the caller.
#pragma once

#include <array>
#include <map>
#include <string>
#include <string_view>
#include <vector>

#include "resource_builder/cldr_annotations.h"
#include "resource_builder/emoji_test.h"
#include "resource_builder/unicode_data.h"
#include "resource_builder/unihan.h"

namespace lumeris::resources {

inline constexpr size_t kInfoFieldCount = 16;
inline constexpr std::array<std::string_view, kInfoFieldCount> kCharacterInfoFieldTags = {
    "unam", "jyom", "krpi", "spin", "swbx", "swbh", "sbix", "cbai",
    "tcan", "tday", "tpin", "tzhu", "rsu1", "rsu2", "rsu3", "rsu4"};

using InfoFields = std::array<std::string, kInfoFieldCount>;

struct CharacterRow {
  std::string uchr;  // the character, UTF-8 (one code point or an emoji sequence)
  std::string info;  // sixteen fields joined by "|"
};

// Everything the rows are made from. The references must outlive the call.
struct CharacterSources {
  const UnicodeCharacterTable& unicode;
  const std::map<char32_t, std::vector<NameAlias>>& aliases;
  const UnihanTable& unihan;
  const CldrAnnotations& english;  // annotations and derived annotations of "en"
  const std::vector<EmojiTestEntry>& emoji;
};

// The rows in database order: first the fully-qualified emoji without a skin-tone modifier in
// EmojiInSearchOrder, then every other listed code point in ascending order. Every `uchr` occurs
// once. Skin-toned forms have no row: the panel applies the user's remembered skin tone itself,
// and their information is looked up under the normalized (toneless) key.
std::vector<CharacterRow> BuildCharacterRows(const CharacterSources& sources);

// The fully-qualified emoji of `emoji` without skin-tone modifiers, in the order search shows
// them: shorter names first, then fewer code points (U+FE0F not counted), then file order.
// The pointers point into `emoji`.
std::vector<const EmojiTestEntry*> EmojiInSearchOrder(const std::vector<EmojiTestEntry>& emoji);

// The Han fields (1-15) of `cp` from Unihan; all empty when Unihan has nothing for it.
InfoFields HanInfoFields(char32_t cp, const UnihanTable& unihan);

// Joins distinct (ASCII case-insensitively) non-empty parts with "; ".
std::string JoinNameParts(const std::vector<std::string>& parts);

// The info text: the fields joined by "|", after every "|" inside a field became "/" and every
// line break a space, so the text always splits into exactly sixteen fields.
std::string JoinInfoFields(const InfoFields& fields);

}  // namespace lumeris::resources
