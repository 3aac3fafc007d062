#include "text/replacement_dictionary.h"

#include <gtest/gtest.h>

#include "text/emoji.h"
#include "text/emoji_tables.h"
#include "text/unicode_strings.h"

namespace lumeris {
namespace {

using testing::Scalars;

// --- ReplacementDictionaryNormalizedKeyString -------------------------------------------------

TEST(ReplacementDictionaryNormalizedKeyString, NormalizesLoneSkinToneCapableEmoji) {
  const struct {
    icu::UnicodeString text;
    icu::UnicodeString key;
    bool had_skin_tone;
  } cases[] = {
      {Scalars({0x1F44D, 0x1F3FD}), Scalars({0x1F44D}), true},
      {Scalars({0x261D, 0x1F3FD}), Scalars({0x261D, 0xFE0F}), true},
      {Scalars({0x261D}), Scalars({0x261D, 0xFE0F}), false},
      {Scalars({0x261D, 0xFE0F}), Scalars({0x261D, 0xFE0F}), false},
      {Scalars({0x1F44D}), Scalars({0x1F44D}), false},
      {Scalars({0x1F44D, 0xFE0F}), Scalars({0x1F44D, 0xFE0F}), false},
      {Scalars({0x270C, 0x1F3FF}), Scalars({0x270C, 0xFE0F}), true},
      // Only a modifier at the end is removed; here the base comes last.
      {Scalars({0x1F3FD, 0x1F44D}), Scalars({0x1F3FD, 0x1F44D}), false},
  };
  for (const auto& c : cases) {
    bool had_skin_tone = !c.had_skin_tone;
    const std::optional<icu::UnicodeString> key =
        ReplacementDictionaryNormalizedKeyString(c.text, &had_skin_tone);
    ASSERT_TRUE(key.has_value()) << ::testing::PrintToString(c.text);
    EXPECT_EQ(*key, c.key) << ::testing::PrintToString(c.text);
    EXPECT_EQ(had_skin_tone, c.had_skin_tone) << ::testing::PrintToString(c.text);
    EXPECT_EQ(ReplacementDictionaryNormalizedKeyString(c.text), key) << "without the out-flag";
  }
}

TEST(ReplacementDictionaryNormalizedKeyString, EveryBaseWithEveryToneKeysToItsBase) {
  for (uint32_t base : kSkinToneBaseTable) {
    const icu::UnicodeString expected = IsValidEmojiScalarForVariant(base)
                                            ? Scalars({base, kEmojiPresentationSelector})
                                            : Scalars({base});
    for (uint32_t tone = kFirstSkinToneModifier; tone <= kLastSkinToneModifier; ++tone) {
      bool had_skin_tone = false;
      EXPECT_EQ(ReplacementDictionaryNormalizedKeyString(Scalars({base, tone}), &had_skin_tone),
                expected)
          << std::hex << base << " " << tone;
      EXPECT_TRUE(had_skin_tone);
    }
  }
}

TEST(ReplacementDictionaryNormalizedKeyStringErrors, GivesNoKeyAndLeavesTheFlagAlone) {
  const icu::UnicodeString unkeyable[] = {
      Scalars({0x261D, 0xFE0E}), Scalars({0x1F600}),        Scalars({0x41}),
      icu::UnicodeString(),      Scalars({0x1F44D, 0x1F3FD, 0xFE0F}),
  };
  for (const icu::UnicodeString& text : unkeyable) {
    bool flag = true;
    EXPECT_FALSE(ReplacementDictionaryNormalizedKeyString(text, &flag).has_value())
        << ::testing::PrintToString(text);
    EXPECT_TRUE(flag) << "flag written for " << ::testing::PrintToString(text);
  }
}

// --- UpdateReplacementDictionary --------------------------------------------------------------

class UpdateReplacementDictionaryTest : public ::testing::Test {
 protected:
  bool Choose(const icu::UnicodeString& text) { return UpdateReplacementDictionary(text, history_); }

  ReplacementDictionary history_;
};

TEST_F(UpdateReplacementDictionaryTest, RemembersTheLastChoicePerBase) {
  const icu::UnicodeString thumbs = Scalars({0x1F44D});
  const icu::UnicodeString thumbs_medium = Scalars({0x1F44D, 0x1F3FD});
  const icu::UnicodeString finger_dark = Scalars({0x261D, 0x1F3FF});

  EXPECT_TRUE(Choose(thumbs_medium));
  EXPECT_EQ(history_, (ReplacementDictionary{{thumbs, thumbs_medium}}));

  EXPECT_TRUE(Choose(thumbs));
  EXPECT_EQ(history_, (ReplacementDictionary{{thumbs, thumbs}}));

  EXPECT_TRUE(Choose(finger_dark));
  EXPECT_EQ(history_, (ReplacementDictionary{{thumbs, thumbs},
                                             {Scalars({0x261D, 0xFE0F}), finger_dark}}));
}

TEST_F(UpdateReplacementDictionaryTest, EmptySelectionClearsTheHistory) {
  ASSERT_TRUE(Choose(Scalars({0x1F44D, 0x1F3FD})));
  ASSERT_TRUE(Choose(Scalars({0x270C})));
  EXPECT_TRUE(Choose(icu::UnicodeString()));
  EXPECT_TRUE(history_.empty());
}

TEST_F(UpdateReplacementDictionaryTest, UnkeyableChoiceFailsAndChangesNothing) {
  ASSERT_TRUE(Choose(Scalars({0x1F44D, 0x1F3FD})));
  const ReplacementDictionary before = history_;
  EXPECT_FALSE(Choose(Scalars({0x41})));
  EXPECT_FALSE(Choose(Scalars({0x261D, 0xFE0E})));
  EXPECT_EQ(history_, before);
}

}  // namespace
}  // namespace lumeris
