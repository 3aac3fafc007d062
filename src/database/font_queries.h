// The two font questions the character database asks about a candidate string, as one value so
// that tests can answer them without installed fonts.
//
//   FontQueries fonts = FontQueries::Installed();
//   if (fonts.emoji_font_draws(text)) ...        // the colour emoji font draws every unit
//   if (fonts.default_like_font_draws(text)) ... // a font like the default font draws the string
//
// Thread-safety: the installed queries may be called from any thread at the same time (see
// platform/font_coverage.h); a test's queries must be as safe as the test needs.
#pragma once

#include <unicode/unistr.h>

#include <functional>

namespace lumeris {

// The colour emoji font's name: the one font that counts as the emoji font.
inline constexpr char kColorEmojiFontName[] = "VantorelColorEmoji";

struct FontQueries {
  std::function<bool(const icu::UnicodeString&)> emoji_font_draws;
  std::function<bool(const icu::UnicodeString&)> default_like_font_draws;

  // The answers of the installed fonts: ColorFontDrawsString(kColorEmojiFontName, ...) and
  // DefaultLikeFontDrawsString(...).
  static FontQueries Installed();
};

}  // namespace lumeris
