// Font coverage with the fonts the project installs (Noto Color Emoji, DejaVu): only characters
// whose coverage those packages settle are asked about.
#include "platform/font_coverage.h"

#include <gtest/gtest.h>

#include <string>

#include "text/utf8.h"

namespace lumeris {
namespace {

TEST(FontCoverageTest, EmojiFontAndDefaultLikeFont) {
  ASSERT_TRUE(LoadLumerisFontConfiguration());
  const struct { const char* text; bool emoji_font; bool default_like; } kCases[] = {
      {"😀", true, true}, {"❤", true, true}, {"👍🏽", true, true}, {"a", false, true}, {"é", false, true},
      {"a\uFE0F", false, true}, {"\U0001FFFE", false, false},
      {"❤\uFE0F", true, true},                              // U+FE0F has no glyph, yet the pair is drawn
      {"👨\u200D👩\u200D👧", true, true},                  // zero-width joiners
      {"🏴\U000E0067\U000E0062\U000E0073\U000E0063\U000E0074\U000E007F", true, true},  // tag characters
      {"🦄a", false, false},                                 // no one font draws both
  };
  for (const auto& c : kCases) {
    const icu::UnicodeString text = *DecodeUtf8(c.text);
    EXPECT_EQ(ColorFontDrawsString("VantorelColorEmoji", text), c.emoji_font) << c.text;
    EXPECT_EQ(DefaultLikeFontDrawsString(text), c.default_like) << c.text;
    // Cached answers are the same answers.
    EXPECT_EQ(DefaultLikeFontDrawsString(text), c.default_like) << c.text;
  }
  const icu::UnicodeString lone_surrogate(static_cast<char16_t>(0xD83D));
  EXPECT_FALSE(DefaultLikeFontDrawsString(lone_surrogate));
  EXPECT_FALSE(ColorFontDrawsString("DejaVu Sans", *DecodeUtf8("a"))) << "not a colour font";
  EXPECT_FALSE(ColorFontDrawsString("No Such Family", *DecodeUtf8("😀")));
}

}  // namespace
}  // namespace lumeris
