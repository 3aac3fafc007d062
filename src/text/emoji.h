// The emoji knowledge of the module: which font is the emoji font, which skin-tone-capable emoji a
// string holds, which characters take a presentation selector, and how two emoji strings compare
// when skin tones or presentation selectors are to be ignored.
//
// Thread-safety: pure functions over constant tables; safe on any thread.
// Ownership: results are values; nothing is retained.
#pragma once

#include <unicode/unistr.h>

#include <cstdint>

namespace lumeris {

// The colour emoji font name, the one font that counts as the emoji font everywhere.
inline constexpr char16_t kEmojiFontName[] = u"VantorelColorEmoji";

// True when `font_name` equals kEmojiFontName exactly (case-sensitive).
bool IsEmojiFontName(const icu::UnicodeString& font_name);

// The skin-tone base emoji that `text` holds, or 0. Only a lone emoji or an emoji followed by one
// modifier or selector qualifies: more than two scalar values give 0, and so does a second scalar
// U+FE0E (text presentation). When the string holds two base emoji, the one listed first in
// kSkinToneBaseTable is reported. Allocates nothing.
uint32_t ContainedDiversityUnicode(const icu::UnicodeString& text);

// True when `value` is one of the 134 characters of kVariantEmojiTable.
bool IsValidEmojiScalarForVariant(uint32_t value);

// True when `a` and `b` are equal once skin-tone modifiers (U+1F3FB..U+1F3FF, unless
// `skin_tones_significant`) and the selectors U+FE0E/U+FE0F (unless `selectors_significant`) are
// left out of both. Only those exact scalars are left out; other selectors, zero-width joiners and
// tag characters stay significant. With both flags set it is plain string equality. Allocates
// nothing for strings of up to 32 units.
bool CompareEmojiStrings(const icu::UnicodeString& a, const icu::UnicodeString& b,
                         bool selectors_significant, bool skin_tones_significant);

}  // namespace lumeris
