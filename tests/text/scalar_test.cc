// Scalar values, surrogates and UTF-8: boundary rows with literal values.
#include "text/scalar.h"

#include <gtest/gtest.h>
#include <vector>

#include "text/unicode_strings.h"
#include "text/utf8.h"

namespace lumeris {
namespace {

using testing::Scalars;
using testing::Units;

constexpr char16_t kUntouched = 0xAAAA;

// Above U+10FFFF both units are still written; the count is 2 only where the 32-bit high half
// passes the surrogate mask test (0x4010000 wraps), else 0. Zero writes nothing.
TEST(ScalerValueToUnicode, WritesUnitsAndCountsIncludingTheWrapCases) {
  const struct { uint32_t value; int count; char16_t first, second; } cases[] = {
      {0, 0, kUntouched, kUntouched}, {0x41, 1, 0x41, 0},            {0xD800, 1, 0xD800, 0},
      {0xFFFF, 1, 0xFFFF, 0},         {0x10000, 2, 0xD800, 0xDC00},  {0x1F44D, 2, 0xD83D, 0xDC4D},
      {0x10FFFF, 2, 0xDBFF, 0xDFFF},  {0x110000, 0, 0xDC00, 0xDC00}, {0x4010000, 2, 0xD800, 0xDC00},
      {0x410FFFF, 2, 0xDBFF, 0xDFFF}, {0x4110000, 0, 0xDC00, 0xDC00}, {0xFC010000, 2, 0xD800, 0xDC00},
      {0xFC10FFFF, 2, 0xDBFF, 0xDFFF}, {0xFC110000, 0, 0xDC00, 0xDC00}, {0xFFFFFFFF, 0, 0xD7BF, 0xDFFF}};
  for (const auto& c : cases) {
    char16_t out[2] = {kUntouched, kUntouched};
    EXPECT_EQ(ScalerValueToUnicode(c.value, out), c.count) << std::hex << c.value;
    EXPECT_EQ(out[0], c.first) << std::hex << c.value;
    if (c.count != 1) {
      EXPECT_EQ(out[1], c.second) << std::hex << c.value;
    }
  }
}

// A pair is a high then a low surrogate (IsSurrogatePair).
TEST(UnicodeToScalerValue, DecodesPairsAndPassesSingleUnitsThrough) {
  const struct { int64_t count; char16_t units[3]; uint32_t expected; } cases[] = {
      {2, {0xD83D, 0xDC4D}, 0x1F44D}, {2, {0xD800, 0xDC00}, 0x10000}, {2, {0xD83D, 0x41}, 0},
      {2, {0xDBFF, 0xDFFF}, 0x10FFFF}, {2, {0xDC4D, 0xD83D}, 0}, {2, {0x41, 0x42}, 0}, {2, {0xDBFF, 0xDC00}, 0x10FC00},
      {2, {0xD83D, 0xDBFF}, 0}, {2, {0x41, 0xDC00}, 0},
      {1, {0xDC4D}, 0xDC4D}, {1, {0xD83D, 0xDC4D}, 0xD83D}, {1, {0x41}, 0x41},
      {3, {0xD83D, 0xDC4D, 0x41}, 0}, {0, {0x41}, 0}, {-1, {0x41}, 0}};
  for (const auto& c : cases) {
    EXPECT_EQ(UnicodeToScalerValue(c.count, c.units), c.expected)
        << "count " << c.count << " first unit " << std::hex << static_cast<unsigned>(c.units[0]);
  }
}

TEST(StringToScalerValues, SplitsPairsAndKeepsLoneSurrogates) {
  const struct { icu::UnicodeString text; std::vector<uint32_t> expected; } cases[] = {
      {Scalars({0x61, 0x1F44D, 0x62}), {0x61, 0x1F44D, 0x62}},
      {Units({0x61, 0xD83D}), {0x61, 0xD83D}}, {Units({0xDC4D, 0xD83D}), {0xDC4D, 0xD83D}},
      {Units({0xD83D, 0xD83D, 0xDC4D}), {0xD83D, 0x1F44D}}, {Units({0xD83D, 0x41, 0xDBFF, 0xDFFF}), {0xD83D, 0x41, 0x10FFFF}},
      {Scalars({0x1F44D, 0x1F3FD}), {0x1F44D, 0x1F3FD}}, {icu::UnicodeString(), {}}};
  for (const auto& c : cases) {
    std::vector<uint32_t> out(static_cast<size_t>(c.text.length()) + 1, 0xAAAAAAAA);
    out.resize(static_cast<size_t>(StringToScalerValues(c.text, out.data())));
    EXPECT_EQ(out, c.expected) << ::testing::PrintToString(c.text);
  }
}

TEST(StringContainsCharacter, ComparesCodeUnitsNotScalars) {
  const icu::UnicodeString thumbs = Scalars({0x41, 0x1F44D});
  for (char16_t unit : {0x41, 0xD83D, 0xDC4D}) EXPECT_TRUE(StringContainsCharacter(thumbs, unit));
  for (char16_t unit : {0x42, 0xF44D}) EXPECT_FALSE(StringContainsCharacter(thumbs, unit));
  EXPECT_FALSE(StringContainsCharacter(icu::UnicodeString(), 0));
}

TEST(StringContainsVariationSelector, CountsOnlyTheTwoPresentationSelectors) {
  for (const auto& text : {Scalars({0x2764, 0xFE0F}), Scalars({0x263A, 0xFE0E}), Scalars({0xFE0F})})
    EXPECT_TRUE(StringContainsVariationSelector(text)) << ::testing::PrintToString(text);
  for (const auto& text : {Scalars({0x263A, 0xFE00}), Scalars({0xFE0D}), Scalars({0x845B, 0xE0100}),
                           Scalars({0xFE1F}), icu::UnicodeString()}) {
    EXPECT_FALSE(StringContainsVariationSelector(text)) << ::testing::PrintToString(text);
  }
}

TEST(Utf8, DecodesAndEncodesWellFormedTextOnly) {
  EXPECT_EQ(DecodeUtf8(""), icu::UnicodeString());
  EXPECT_EQ(DecodeUtf8(std::string_view("a\0b", 3)), Scalars({0x61, 0, 0x62}));
  const icu::UnicodeString text = Scalars({0x41, 0xE9, 0x2708, 0x1F44D, 0x10FFFF});
  const std::string utf8 = "A\xC3\xA9\xE2\x9C\x88\xF0\x9F\x91\x8D\xF4\x8F\xBF\xBF";
  EXPECT_EQ(DecodeUtf8(utf8), text);
  EXPECT_EQ(EncodeUtf8(text), utf8);
  EXPECT_EQ(EncodeUtf8Lenient(text), utf8);
  // Ill-formed bytes and unpaired surrogates are refused, or replaced by U+FFFD when lenient.
  for (const char* bytes : {"\x80", "\xC3", "\xE2\x9C", "\xC0\x80", "\xE0\x80\x80", "\xED\xA0\x80",
                            "\xF4\x90\x80\x80", "\xF5\x80\x80\x80", "\xFF", "ok\xC3("}) {
    EXPECT_FALSE(DecodeUtf8(bytes).has_value()) << bytes;
    EXPECT_GE(DecodeUtf8Lenient(bytes).indexOf(static_cast<char16_t>(0xFFFD)), 0) << bytes;
  }
  for (const icu::UnicodeString& text :
       {Units({0xD83D}), Units({0x41, 0xDC4D}), Units({0xDC4D, 0xD83D})}) {
    EXPECT_FALSE(EncodeUtf8(text).has_value()) << ::testing::PrintToString(text);
    EXPECT_NE(EncodeUtf8Lenient(text).find("\xEF\xBF\xBD"), std::string::npos);
  }
}

}  // namespace
}  // namespace lumeris
