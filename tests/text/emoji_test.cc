// The emoji tables and functions, and the replacement dictionary keyed by them.
#include "text/emoji.h"

#include <gtest/gtest.h>
#include <unicode/uchar.h>

#include <algorithm>
#include <set>

#include "text/emoji_tables.h"
#include "text/replacement_dictionary.h"
#include "text/unicode_strings.h"

namespace lumeris {
namespace {

using testing::Scalars;
using testing::Units;

// Both tables are checked against ICU's emoji properties, independently of how they are written.
TEST(EmojiTables, HoldDistinctEmojiOfTheRightKind) {
  EXPECT_EQ(std::set(kSkinToneBaseTable.begin(), kSkinToneBaseTable.end()).size(), 64u);
  for (UChar32 base : kSkinToneBaseTable)
    EXPECT_TRUE(u_hasBinaryProperty(base, UCHAR_EMOJI_MODIFIER_BASE)) << std::hex << base;
  EXPECT_TRUE(std::is_sorted(kVariantEmojiTable.begin(), kVariantEmojiTable.end()));
  EXPECT_EQ(std::set(kVariantEmojiTable.begin(), kVariantEmojiTable.end()).size(), 134u);
  for (UChar32 value : kVariantEmojiTable)
    EXPECT_TRUE(u_hasBinaryProperty(value, UCHAR_EMOJI)) << std::hex << value;
}

TEST(IsEmojiFontName, MatchesTheExactNameOnly) {
  EXPECT_TRUE(IsEmojiFontName(icu::UnicodeString(u"VantorelColorEmoji")));
  for (auto name : {u"vantorelcoloremoji", u"VantorelColorEmoji ", u"VantorelColor", u""})
    EXPECT_FALSE(IsEmojiFontName(name));
}

TEST(ContainedDiversityUnicode, FindsTheBaseOfALoneEmojiWithAtMostOneModifierOrSelector) {
  const struct { icu::UnicodeString text; uint32_t expected; } cases[] = {
      {Scalars({0x1F44D, 0x1F3FD}), 0x1F44D}, {Scalars({0x1F44D}), 0x1F44D},
      {Scalars({0x261D, 0xFE0F}), 0x261D},    {Scalars({0x1F44D, 0x1F3FD, 0xFE0F}), 0},
      {Scalars({0x261D, 0xFE0E}), 0},         {Scalars({0x1F466, 0x1F467}), 0x1F466},
      {Scalars({0x1F600}), 0},                {Scalars({0x41, 0x1F44D}), 0x1F44D},
      {Scalars({0xFE0E, 0x1F44D}), 0x1F44D},  {Units({0xD83D}), 0}, {icu::UnicodeString(), 0},
      // The first and last table entries, with the first and last modifier.
      {Scalars({0x261D, 0x1F3FB}), 0x261D},   {Scalars({0x1F918, 0x1F3FF}), 0x1F918},
      {Scalars({0x1F918, 0xFE0F}), 0x1F918},  {Scalars({0x1F918, 0xFE0E}), 0},
      // Two bases: the one listed earlier in the table wins, whatever the order in the string
      // and whatever the scalar values (0x26F9 is listed after 0x1F6C0).
      {Scalars({0x1F918, 0x261D}), 0x261D},   {Scalars({0x1F44D, 0x1F44A}), 0x1F44A},
      {Scalars({0x1F6C0, 0x26F9}), 0x1F6C0},  {Scalars({0x26F9, 0x1F918}), 0x26F9}};
  for (const auto& c : cases)
    EXPECT_EQ(ContainedDiversityUnicode(c.text), c.expected) << ::testing::PrintToString(c.text);
}

TEST(IsValidEmojiScalarForVariant, AcceptsExactlyTheTableEntries) {
  for (uint32_t value : {0x23, 0x30, 0x39, 0xA9, 0x2763, 0x2764, 0x270C, 0x270D, 0x1F237})
    EXPECT_TRUE(IsValidEmojiScalarForVariant(value)) << std::hex << value;
  for (uint32_t value : {0x0, 0x22, 0x24, 0x2F, 0x3A, 0x2762, 0x2765, 0x270E, 0x1F236, 0x1F238,
                         0x1F600, 0x10FFFF})
    EXPECT_FALSE(IsValidEmojiScalarForVariant(value)) << std::hex << value;
}

// Long rows are longer than the comparison's stack scratch.
TEST(CompareEmojiStrings, IgnoresOnlyWhatTheFlagsAllow) {
  icu::UnicodeString none, long_toned, long_plain;
  for (int i = 0; i < 200; ++i) long_toned.append(Scalars({0x1F44D, 0x1F3FD}));
  for (int i = 0; i < 200; ++i) long_plain.append(Scalars({0x1F44D}));
  const struct { icu::UnicodeString a, b; bool selectors_significant, skin_tones_significant, expected; } cases[] = {
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
      {Scalars({0x1F3FB}), none, true, false, true}, {none, none, false, false, true},
      {none, none, true, true, true}, {Scalars({0x41}), Scalars({0x42}), false, false, false},
      {Units({0xD83D}), Units({0xD83D}), false, false, true},
      {Units({0xD83D}), Units({0xD83C}), false, false, false},
      {long_toned, long_plain, true, false, true}, {long_toned, long_plain + u'x', true, false, false}};
  for (const auto& c : cases) {
    const bool selectors = c.selectors_significant, tones = c.skin_tones_significant;
    SCOPED_TRACE(::testing::PrintToString(c.a) + " vs " + ::testing::PrintToString(c.b) +
                 (selectors ? " selectors" : "") + (tones ? " skin tones" : ""));
    EXPECT_EQ(CompareEmojiStrings(c.a, c.b, selectors, tones), c.expected);
    EXPECT_EQ(CompareEmojiStrings(c.b, c.a, selectors, tones), c.expected) << "swapped";
  }
}

// Without a key the out-flag is left alone.
TEST(ReplacementDictionaryNormalizedKeyString, NormalizesLoneSkinToneCapableEmoji) {
  const std::optional<icu::UnicodeString> none;
  const struct { icu::UnicodeString text; std::optional<icu::UnicodeString> key; bool had_skin_tone; } cases[] = {
      {Scalars({0x1F44D, 0x1F3FD}), Scalars({0x1F44D}), true}, {Scalars({0x1F44D}), Scalars({0x1F44D}), false},
      {Scalars({0x261D, 0x1F3FD}), Scalars({0x261D, 0xFE0F}), true}, {Scalars({0x261D}), Scalars({0x261D, 0xFE0F}), false},
      {Scalars({0x261D, 0xFE0F}), Scalars({0x261D, 0xFE0F}), false},
      {Scalars({0x1F44D, 0xFE0F}), Scalars({0x1F44D, 0xFE0F}), false},
      {Scalars({0x270C, 0x1F3FF}), Scalars({0x270C, 0xFE0F}), true}, {Scalars({0x1F918, 0x1F3FB}), Scalars({0x1F918}), true},
      {Scalars({0x270D, 0x1F3FB}), Scalars({0x270D, 0xFE0F}), true}, {Scalars({0x1F918, 0x1F3FF}), Scalars({0x1F918}), true},
      // Only a modifier at the end is removed; here the base comes last.
      {Scalars({0x1F3FD, 0x1F44D}), Scalars({0x1F3FD, 0x1F44D}), false},
      {Scalars({0x261D, 0xFE0E}), none, false}, {Scalars({0x1F600}), none, true}, {Scalars({0x41}), none, false},
      {icu::UnicodeString(), none, true}, {Scalars({0x1F44D, 0x1F3FD, 0xFE0F}), none, false}};
  for (const auto& c : cases) {
    bool had_skin_tone = !c.had_skin_tone;
    const auto key = ReplacementDictionaryNormalizedKeyString(c.text, &had_skin_tone);
    EXPECT_EQ(key, c.key) << ::testing::PrintToString(c.text);
    EXPECT_EQ(had_skin_tone, c.key ? c.had_skin_tone : !c.had_skin_tone) << ::testing::PrintToString(c.text);
    EXPECT_EQ(ReplacementDictionaryNormalizedKeyString(c.text), key) << "without the out-flag";
  }
}

// One history through a sequence of choices: the last choice per base is kept, an unkeyable
// choice fails and changes nothing, an empty choice clears everything.
TEST(UpdateReplacementDictionary, RemembersTheLastChoicePerBase) {
  const icu::UnicodeString thumbs = Scalars({0x1F44D});
  const icu::UnicodeString thumbs_medium = Scalars({0x1F44D, 0x1F3FD});
  const icu::UnicodeString finger_dark = Scalars({0x261D, 0x1F3FF});
  ReplacementDictionary history;
  EXPECT_TRUE(UpdateReplacementDictionary(thumbs_medium, history));
  EXPECT_EQ(history, (ReplacementDictionary{{thumbs, thumbs_medium}}));
  EXPECT_TRUE(UpdateReplacementDictionary(thumbs, history));
  EXPECT_EQ(history, (ReplacementDictionary{{thumbs, thumbs}}));
  EXPECT_TRUE(UpdateReplacementDictionary(finger_dark, history));
  const ReplacementDictionary both{{thumbs, thumbs}, {Scalars({0x261D, 0xFE0F}), finger_dark}};
  EXPECT_EQ(history, both);
  EXPECT_FALSE(UpdateReplacementDictionary(Scalars({0x41}), history));
  EXPECT_FALSE(UpdateReplacementDictionary(Scalars({0x261D, 0xFE0E}), history));
  EXPECT_EQ(history, both);
  EXPECT_TRUE(UpdateReplacementDictionary(icu::UnicodeString(), history));
  EXPECT_TRUE(history.empty());
}

}  // namespace
}  // namespace lumeris
