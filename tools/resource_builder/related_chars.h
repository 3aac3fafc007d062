// The groups of characters that belong together, for the related-characters database:
//  - letters and digits with their case forms, their accented forms (canonical decompositions to
//    the letter plus combining marks) and their compatibility forms that decompose to the bare
//    letter or digit (fullwidth, mathematical, enclosed, superscript ...);
//  - Han characters with their simplified, traditional, semantic, specialized semantic and Z
//    variants (Unihan);
//  - each emoji with its skin-tone forms, and the person / man / woman forms of one emoji.
// A character joins every group of the first two kinds through a union of these relations, so the
// groups of one kind never overlap.
//
// Thread-safety: pure functions. Results belong to the caller.
#pragma once

#include <string>
#include <vector>

#include "resource_builder/emoji_test.h"
#include "resource_builder/unicode_data.h"
#include "resource_builder/unihan.h"

namespace lumeris::resources {

// Letter and digit groups, each sorted by code point; groups of one are left out.
std::vector<std::u32string> LetterGroups(const UnicodeCharacterTable& unicode);

// Han variant groups, each sorted by code point; groups of one are left out.
std::vector<std::u32string> HanVariantGroups(const UnihanTable& unihan);

// Emoji groups (each a list of fully-qualified sequences, the plain form first): skin-tone
// families and gender families, in emoji-test order.
std::vector<std::vector<std::u32string>> EmojiGroups(const std::vector<EmojiTestEntry>& emoji);

// All groups as database rows (UTF-8 runs of characters).
std::vector<std::string> BuildRelatedRows(const UnicodeCharacterTable& unicode, const UnihanTable& unihan,
                                          const std::vector<EmojiTestEntry>& emoji);

}  // namespace lumeris::resources
