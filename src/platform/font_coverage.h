// Font coverage: which installed fonts can draw a string, the two questions character search and
// related characters ask about every candidate.
//
//   LoadLumerisFontConfiguration();   // once, at the service's start
//   ColorFontDrawsString("VantorelColorEmoji", text)   // "❤️": true with Noto Color Emoji
//   DefaultLikeFontDrawsString(text)                   // "é": true with DejaVu Sans
//
// ColorFontDrawsString asks fontconfig for the best match of the family name; the answer is
// false for every string when that match is not a colour font (so a missing emoji font draws
// nothing). Otherwise each code point of the string must have a glyph in the matched file's
// character map (read with FreeType). DefaultLikeFontDrawsString walks fontconfig's sorted
// fallback list for the default sans family ("sans-serif") and is true when one font of it covers
// every code point. In both, a code point with the Default_Ignorable_Code_Point property (variation
// selectors, the zero-width joiner, tag characters) counts as drawn when the font lacks it, since
// text shaping hides such code points; an unpaired surrogate is never drawn. An empty string
// counts as drawn.
//
// The fontconfig configuration is the system's default one plus the project's file, found at
// $LUMERIS_FONTCONFIG_FILE, else at the installed path (config::kFontConfigFileDefault); it makes
// "VantorelColorEmoji" resolve to the installed colour emoji font. It is loaded once per process,
// by LoadLumerisFontConfiguration() or by the first query; a missing file is logged and the
// default configuration is used.
//
// Thread-safety: every function may be called from any thread at the same time. The default-like
// answers are cached per process (per string), under a mutex; fonts installed after the first
// query are not seen.
#pragma once

#include <unicode/unistr.h>

#include <string_view>

namespace lumeris {

// Loads the configuration described above, once; later calls do nothing. True when the project's
// file was loaded.
bool LoadLumerisFontConfiguration();

// True when the font that `family` resolves to is a colour font and draws every code point of
// `text`.
bool ColorFontDrawsString(std::string_view family, const icu::UnicodeString& text);

// True when some font of the default sans family's fallback list draws every code point of `text`.
bool DefaultLikeFontDrawsString(const icu::UnicodeString& text);

}  // namespace lumeris
