#include "database/font_queries.h"

#include "platform/font_coverage.h"

namespace lumeris {

FontQueries FontQueries::Installed() {
  return FontQueries{
      .emoji_font_draws =
          [](const icu::UnicodeString& text) {
            return ColorFontDrawsString(kColorEmojiFontName, text);
          },
      .default_like_font_draws =
          [](const icu::UnicodeString& text) { return DefaultLikeFontDrawsString(text); },
  };
}

}  // namespace lumeris
