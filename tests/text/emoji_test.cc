#include "text/emoji.h"

#include <gtest/gtest.h>
#include <unicode/uchar.h>

#include <algorithm>
#include <set>

#include "text/emoji_tables.h"
#include "text/unicode_strings.h"

namespace lumeris {
namespace {

using testing::Scalars;
using testing::Units;

// --- The tables -------------------------------------------------------------------------------

TEST(EmojiTables, SkinToneBasesAreDistinctModifierBases) {
  const std::set<uint32_t> distinct(kSkinToneBaseTable.begin(), kSkinToneBaseTable.end());
  EXPECT_EQ(distinct.size(), kSkinToneBaseTable.size());
  for (uint32_t base : kSkinToneBaseTable) {
    EXPECT_TRUE(u_hasBinaryProperty(static_cast<UChar32>(base), UCHAR_EMOJI_MODIFIER_BASE))
        << std::hex << base;
  }
}

TEST(EmojiTables, VariantTableIsAscendingAndEveryEntryIsAnEmoji) {
  EXPECT_TRUE(std::is_sorted(kVariantEmojiTable.begin(), kVariantEmojiTable.end()));
  EXPECT_EQ(std::adjacent_find(kVariantEmojiTable.begin(), kVariantEmojiTable.end()),
            kVariantEmojiTable.end());
  for (uint32_t value : kVariantEmojiTable) {
    EXPECT_TRUE(u_hasBinaryProperty(static_cast<UChar32>(value), UCHAR_EMOJI)) << std::hex << value;
  }
}

// --- IsEmojiFontName --------------------------------------------------------------------------

TEST(IsEmojiFontName, MatchesTheExactNameOnly) {
  EXPECT_TRUE(IsEmojiFontName(icu::UnicodeString(u"VantorelColorEmoji")));
  EXPECT_FALSE(IsEmojiFontName(icu::UnicodeString(u"vantorelcoloremoji")));
  EXPECT_FALSE(IsEmojiFontName(icu::UnicodeString(u"VantorelColorEmoji ")));
  EXPECT_FALSE(IsEmojiFontName(icu::UnicodeString(u"VantorelColorEmo")));
  EXPECT_FALSE(IsEmojiFontName(icu::UnicodeString()));
}

// --- ContainedDiversityUnicode ----------------------------------------------------------------

TEST(ContainedDiversityUnicode, FindsTheBaseOfALoneEmojiWithAtMostOneModifierOrSelector) {
  const struct {
    icu::UnicodeString text;
    uint32_t expected;
  } cases[] = {
      {Scalars({0x1F44D, 0x1F3FD}), 0x1F44D},
      {Scalars({0x1F44D}), 0x1F44D},
      {Scalars({0x261D, 0xFE0F}), 0x261D},
      {Scalars({0x1F44D, 0x1F3FD, 0xFE0F}), 0},
      {Scalars({0x261D, 0xFE0E}), 0},
      {Scalars({0x1F466, 0x1F467}), 0x1F466},
      {Scalars({0x1F600}), 0},
      {Scalars({0x41, 0x1F44D}), 0x1F44D},
      {Scalars({0xFE0E, 0x1F44D}), 0x1F44D},
      {Units({0xD83D}), 0},
      {icu::UnicodeString(), 0},
  };
  for (const auto& c : cases) {
    EXPECT_EQ(ContainedDiversityUnicode(c.text), c.expected) << ::testing::PrintToString(c.text);
  }
}

TEST(ContainedDiversityUnicode, EveryBaseIsFoundAloneAndWithEachModifier) {
  for (uint32_t base : kSkinToneBaseTable) {
    EXPECT_EQ(ContainedDiversityUnicode(Scalars({base})), base) << std::hex << base;
    EXPECT_EQ(ContainedDiversityUnicode(Scalars({base, 0xFE0F})), base) << std::hex << base;
    EXPECT_EQ(ContainedDiversityUnicode(Scalars({base, 0xFE0E})), 0u) << std::hex << base;
    for (uint32_t tone = kFirstSkinToneModifier; tone <= kLastSkinToneModifier; ++tone) {
      EXPECT_EQ(ContainedDiversityUnicode(Scalars({base, tone})), base) << std::hex << base;
    }
  }
}

// When a string holds two bases, the one earlier in the table wins, whatever their order in the
// string.
TEST(ContainedDiversityUnicode, ReportsTheBaseListedFirstInTheTable) {
  for (size_t i = 0; i < kSkinToneBaseTable.size(); ++i) {
    for (size_t j = i + 1; j < kSkinToneBaseTable.size(); ++j) {
      const uint32_t earlier = kSkinToneBaseTable[i];
      const uint32_t later = kSkinToneBaseTable[j];
      ASSERT_EQ(ContainedDiversityUnicode(Scalars({later, earlier})), earlier)
          << std::hex << later << " " << earlier;
      ASSERT_EQ(ContainedDiversityUnicode(Scalars({earlier, later})), earlier)
          << std::hex << earlier << " " << later;
    }
  }
}

// --- IsValidEmojiScalarForVariant -------------------------------------------------------------

TEST(IsValidEmojiScalarForVariant, AcceptsExactlyTheTableEntries) {
  EXPECT_TRUE(IsValidEmojiScalarForVariant(0x23));
  EXPECT_TRUE(IsValidEmojiScalarForVariant(0x1F237));
  EXPECT_TRUE(IsValidEmojiScalarForVariant(0x2764));
  EXPECT_FALSE(IsValidEmojiScalarForVariant(0x24));
  EXPECT_FALSE(IsValidEmojiScalarForVariant(0x1F600));
  EXPECT_FALSE(IsValidEmojiScalarForVariant(0));
  int accepted = 0;
  for (uint32_t value = 0; value <= 0x10FFFF; ++value) accepted += IsValidEmojiScalarForVariant(value);
  EXPECT_EQ(accepted, 134);
}

// --- CompareEmojiStrings ----------------------------------------------------------------------

TEST(CompareEmojiStrings, IgnoresOnlyWhatTheFlagsAllow) {
  const struct {
    icu::UnicodeString a;
    icu::UnicodeString b;
    bool selectors_significant;
    bool skin_tones_significant;
    bool expected;
  } cases[] = {
      {Scalars({0x1F44D, 0x1F3FB}), Scalars({0x1F44D}), true, false, true},
      {Scalars({0x1F44D, 0x1F3FB}), Scalars({0x1F44D}), true, true, false},
      {Scalars({0x1F44D, 0x1F3FB}), Scalars({0x1F44D}), false, true, false},
      {Scalars({0x1F44D, 0x1F3FB}), Scalars({0x1F44D, 0x1F3FF}), true, false, true},
      {Scalars({0x2764, 0xFE0F}), Scalars({0x2764}), false, true, true},
      {Scalars({0x2764, 0xFE0F}), Scalars({0x2764}), true, false, false},
      {Scalars({0x2764, 0xFE0E}), Scalars({0x2764, 0xFE0F}), false, false, true},
      {Scalars({0x2764, 0xFE00}), Scalars({0x2764}), false, false, false},
      {Scalars({0x1F468, 0x200D, 0x1F466}), Scalars({0x1F468, 0x1F466}), false, false, false},
      {Scalars({0x1F44D, 0x1F3FB, 0xFE0F}), Scalars({0x1F44D}), false, false, true},
      {Scalars({0x1F3FB}), icu::UnicodeString(), true, false, true},
      {icu::UnicodeString(), icu::UnicodeString(), false, false, true},
      {icu::UnicodeString(), icu::UnicodeString(), true, true, true},
      {Scalars({0x41}), Scalars({0x42}), false, false, false},
      {Units({0xD83D}), Units({0xD83D}), false, false, true},
      {Units({0xD83D}), Units({0xD83C}), false, false, false},
  };
  for (const auto& c : cases) {
    EXPECT_EQ(CompareEmojiStrings(c.a, c.b, c.selectors_significant, c.skin_tones_significant),
              c.expected)
        << ::testing::PrintToString(c.a) << " vs " << ::testing::PrintToString(c.b)
        << " selectors " << c.selectors_significant << " skin tones " << c.skin_tones_significant;
    EXPECT_EQ(CompareEmojiStrings(c.b, c.a, c.selectors_significant, c.skin_tones_significant),
              c.expected)
        << "symmetry";
  }
}

TEST(CompareEmojiStrings, HandlesStringsLongerThanTheStackScratch) {
  icu::UnicodeString a;
  icu::UnicodeString b;
  for (int i = 0; i < 200; ++i) {
    a.append(static_cast<UChar32>(0x1F44D)).append(static_cast<UChar32>(0x1F3FD));
    b.append(static_cast<UChar32>(0x1F44D));
  }
  EXPECT_TRUE(CompareEmojiStrings(a, b, true, false));
  b.append(u'x');
  EXPECT_FALSE(CompareEmojiStrings(a, b, true, false));
}

}  // namespace
}  // namespace lumeris
