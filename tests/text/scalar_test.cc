#include "text/scalar.h"

#include <gtest/gtest.h>
#include <unicode/utf16.h>

#include <random>
#include <vector>

#include "text/unicode_strings.h"

namespace lumeris {
namespace {

using testing::Scalars;
using testing::Units;

// --- ScalerValueToUnicode ---------------------------------------------------------------------

struct ToUnicodeCase {
  uint32_t value;
  int count;
  char16_t first;
  char16_t second;
};

TEST(ScalerValueToUnicode, WritesUnitsAndCountsAsListed) {
  const ToUnicodeCase cases[] = {
      {0x41, 1, 0x0041, 0},           {0x1F44D, 2, 0xD83D, 0xDC4D},
      {0x10FFFF, 2, 0xDBFF, 0xDFFF},  {0x110000, 0, 0xDC00, 0xDC00},
      {0xD800, 1, 0xD800, 0},         {0xFFFF, 1, 0xFFFF, 0},
      {0x10000, 2, 0xD800, 0xDC00},   {0x4010000, 2, 0xD800, 0xDC00},
      {0x410FFFF, 2, 0xDBFF, 0xDFFF}, {0xFFFFFFFF, 0, 0xD7BF, 0xDFFF},
  };
  for (const ToUnicodeCase& c : cases) {
    char16_t out[2] = {0, 0};
    EXPECT_EQ(ScalerValueToUnicode(c.value, out), c.count) << std::hex << c.value;
    EXPECT_EQ(out[0], c.first) << std::hex << c.value;
    if (c.count != 1) {
      EXPECT_EQ(out[1], c.second) << std::hex << c.value;
    }
  }
}

TEST(ScalerValueToUnicode, ZeroWritesNothing) {
  char16_t out[2] = {0x1234, 0x5678};
  EXPECT_EQ(ScalerValueToUnicode(0, out), 0);
  EXPECT_EQ(out[0], 0x1234);
  EXPECT_EQ(out[1], 0x5678);
}

// Above U+10FFFF the count follows the 32-bit high half: 2 exactly when the excess over 0x10000,
// taken modulo 0x4000000, is below 0x100000.
TEST(ScalerValueToUnicode, WrapsAboveTheUnicodeRangeOnlyWhereTheMaskTestPasses) {
  for (uint64_t value = 0x110000; value <= 0xFFFFFFFF; value += 0x3FF1) {
    const auto v = static_cast<uint32_t>(value);
    const bool wraps = ((v - 0x10000) % 0x4000000) < 0x100000;
    char16_t out[2];
    EXPECT_EQ(ScalerValueToUnicode(v, out), wraps ? 2 : 0) << std::hex << v;
  }
  for (uint32_t block = 1; block < 64; ++block) {
    const uint32_t first_wrapped = 0x10000 + block * 0x4000000;
    char16_t out[2];
    EXPECT_EQ(ScalerValueToUnicode(first_wrapped, out), 2) << std::hex << first_wrapped;
    EXPECT_EQ(ScalerValueToUnicode(first_wrapped + 0xFFFFF, out), 2) << std::hex << first_wrapped;
    EXPECT_EQ(ScalerValueToUnicode(first_wrapped + 0x100000, out), 0) << std::hex << first_wrapped;
  }
}

// Every scalar value 1..0x10FFFF goes to UTF-16 as ICU encodes it and comes back unchanged.
TEST(ScalerValueToUnicode, EveryScalarRoundTripsThroughUnicodeToScalerValue) {
  for (uint32_t value = 1; value <= 0x10FFFF; ++value) {
    char16_t out[2] = {0, 0};
    const int count = ScalerValueToUnicode(value, out);
    ASSERT_EQ(count, U16_LENGTH(value)) << std::hex << value;
    if (count == 2) {
      ASSERT_EQ(out[0], U16_LEAD(value)) << std::hex << value;
      ASSERT_EQ(out[1], U16_TRAIL(value)) << std::hex << value;
    }
    ASSERT_EQ(UnicodeToScalerValue(count, out), value) << std::hex << value;
  }
}

// --- UnicodeToScalerValue ---------------------------------------------------------------------

struct ToScalarCase {
  int64_t count;
  char16_t units[3];
  uint32_t expected;
};

TEST(UnicodeToScalerValue, DecodesPairsAndPassesSingleUnitsThrough) {
  const ToScalarCase cases[] = {
      {2, {0xD83D, 0xDC4D}, 0x1F44D},  {2, {0xD800, 0xDC00}, 0x10000},
      {2, {0xDBFF, 0xDFFF}, 0x10FFFF}, {2, {0xD83D, 0x0041}, 0},
      {2, {0xDC4D, 0xD83D}, 0},        {2, {0x0041, 0x0042}, 0},
      {1, {0xDC4D}, 0xDC4D},           {1, {0xD83D, 0xDC4D}, 0xD83D},
      {1, {0x0041}, 0x41},             {3, {0xD83D, 0xDC4D, 0x41}, 0},
      {0, {0x41}, 0},                  {-1, {0x41}, 0},
  };
  for (const ToScalarCase& c : cases) {
    EXPECT_EQ(UnicodeToScalerValue(c.count, c.units), c.expected)
        << "count " << c.count << " first unit " << std::hex << static_cast<unsigned>(c.units[0]);
  }
}

// --- IsSurrogatePair --------------------------------------------------------------------------

TEST(IsSurrogatePair, NeedsHighThenLow) {
  const char16_t pair[] = {0xD83D, 0xDC4D};
  const char16_t reversed[] = {0xDC4D, 0xD83D};
  const char16_t two_high[] = {0xD83D, 0xDBFF};
  const char16_t letters[] = {0x41, 0xDC00};
  EXPECT_TRUE(IsSurrogatePair(pair));
  EXPECT_FALSE(IsSurrogatePair(reversed));
  EXPECT_FALSE(IsSurrogatePair(two_high));
  EXPECT_FALSE(IsSurrogatePair(letters));
}

// --- StringToScalerValues ---------------------------------------------------------------------

struct ToScalarsCase {
  icu::UnicodeString text;
  std::vector<uint32_t> expected;
};

TEST(StringToScalerValues, SplitsPairsAndKeepsLoneSurrogates) {
  const ToScalarsCase cases[] = {
      {Scalars({0x61, 0x1F44D, 0x62}), {0x61, 0x1F44D, 0x62}},
      {Units({0x61, 0xD83D}), {0x61, 0xD83D}},
      {Units({0xDC4D, 0xD83D}), {0xDC4D, 0xD83D}},
      {Units({0xD83D, 0xD83D, 0xDC4D}), {0xD83D, 0x1F44D}},
      {Units({0xDC4D}), {0xDC4D}},
      {Scalars({0x1F44D, 0x1F3FD}), {0x1F44D, 0x1F3FD}},
      {icu::UnicodeString(), {}},
  };
  for (const ToScalarsCase& c : cases) {
    std::vector<uint32_t> out(static_cast<size_t>(c.text.length()) + 1, 0xAAAAAAAA);
    const int64_t count = StringToScalerValues(c.text, out.data());
    out.resize(static_cast<size_t>(count));
    EXPECT_EQ(out, c.expected);
  }
}

// Random strings over letters, surrogates and selectors decode exactly as ICU's U16_NEXT, which
// also passes unpaired surrogates through as their own value.
TEST(StringToScalerValues, AgreesWithIcuIterationOnRandomSurrogateMixes) {
  const char16_t alphabet[] = {0x41, 0xD83D, 0xDC4D, 0xDBFF, 0xDC00, 0xFE0F, 0xD800, 0xDFFF};
  std::mt19937 random(20240521);
  for (int round = 0; round < 5000; ++round) {
    icu::UnicodeString text;
    const int length = static_cast<int>(random() % 9);
    for (int i = 0; i < length; ++i) text.append(alphabet[random() % std::size(alphabet)]);
    std::vector<uint32_t> expected;
    for (int32_t i = 0; i < text.length();) {
      UChar32 c;
      U16_NEXT(text.getBuffer(), i, text.length(), c);
      expected.push_back(static_cast<uint32_t>(c));
    }
    std::vector<uint32_t> out(static_cast<size_t>(text.length()));
    out.resize(static_cast<size_t>(StringToScalerValues(text, out.data())));
    ASSERT_EQ(out, expected) << ::testing::PrintToString(text);
  }
}

// --- StringContainsCharacter and StringContainsVariationSelector -------------------------------

TEST(StringContainsCharacter, ComparesCodeUnitsNotScalars) {
  const icu::UnicodeString thumbs = Scalars({0x41, 0x1F44D});
  EXPECT_TRUE(StringContainsCharacter(thumbs, u'A'));
  EXPECT_TRUE(StringContainsCharacter(thumbs, 0xD83D));
  EXPECT_TRUE(StringContainsCharacter(thumbs, 0xDC4D));
  EXPECT_FALSE(StringContainsCharacter(thumbs, u'B'));
  EXPECT_FALSE(StringContainsCharacter(thumbs, 0xF44D));
  EXPECT_FALSE(StringContainsCharacter(icu::UnicodeString(), 0));
}

TEST(StringContainsVariationSelector, CountsOnlyTheTwoPresentationSelectors) {
  const struct {
    icu::UnicodeString text;
    bool expected;
  } cases[] = {
      {Scalars({0x2764, 0xFE0F}), true}, {Scalars({0x263A, 0xFE0E}), true},
      {Scalars({0xFE0F}), true},         {Scalars({0x263A, 0xFE00}), false},
      {Scalars({0xFE0D}), false},        {Scalars({0x845B, 0xE0100}), false},
      {Scalars({0xFE1F}), false},        {icu::UnicodeString(), false},
  };
  for (const auto& c : cases) {
    EXPECT_EQ(StringContainsVariationSelector(c.text), c.expected)
        << ::testing::PrintToString(c.text);
  }
}

}  // namespace
}  // namespace lumeris
