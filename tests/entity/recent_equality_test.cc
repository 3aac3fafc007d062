#include "entity/recent_equality.h"

#include <gtest/gtest.h>

#include "entity/character_info.h"
#include "entity/entity_id.h"
#include "text/unicode_strings.h"

namespace lumeris {
namespace {

using testing::Scalars;

const icu::UnicodeString kEmojiFont(u"VantorelColorEmoji");

// The ID the panel records for `character` picked in `font` (no glyph).
icu::UnicodeString Picked(const icu::UnicodeString& character,
                          std::optional<icu::UnicodeString> font = std::nullopt) {
  CharacterInfo info;
  info.character = character;
  info.font = std::move(font);
  return EntityIDFromCharacterInfo(info);
}

icu::UnicodeString PickedWithGlyph(const icu::UnicodeString& character,
                                   const icu::UnicodeString& font, uint32_t glyph) {
  CharacterInfo info;
  info.character = character;
  info.font = font;
  info.glyph = glyph;
  return EntityIDFromCharacterInfo(info);
}

TEST(IsEqualRecentEntityID, SkinTonesOfOneEmojiAreOneRecent) {
  const icu::UnicodeString thumbs = Scalars({0x1F44D});
  const struct {
    icu::UnicodeString a;
    icu::UnicodeString b;
    bool expected;
  } cases[] = {
      {Picked(Scalars({0x1F44D, 0x1F3FD}), kEmojiFont), Picked(thumbs, kEmojiFont), true},
      {Picked(Scalars({0x1F44D, 0x1F3FB}), kEmojiFont), Picked(Scalars({0x1F44D, 0x1F3FF}), kEmojiFont), true},
      {Picked(Scalars({0x1F44D, 0x1F3FD}), kEmojiFont), Picked(thumbs), false},
      {Picked(thumbs, kEmojiFont), Picked(thumbs), false},
      {Picked(Scalars({0x1F44D, 0x1F3FD})), Picked(thumbs), true},
      {Picked(Scalars({0x261D, 0xFE0F}), kEmojiFont), Picked(Scalars({0x261D, 0x1F3FE}), kEmojiFont), true},
      {Picked(Scalars({0x1F44D}), kEmojiFont), Picked(Scalars({0x1F44E}), kEmojiFont), false},
      {Picked(Scalars({0x1F600}), kEmojiFont), Picked(Scalars({0x1F600}), kEmojiFont), true},
      {Picked(Scalars({0x1F600}), kEmojiFont), Picked(Scalars({0x1F601}), kEmojiFont), false},
      {PickedWithGlyph(thumbs, kEmojiFont, 3), Picked(Scalars({0x1F44D, 0x1F3FD}), kEmojiFont), true},
      {u"opaque", u"opaque", true},
      {u"opaque", u"Opaque", false},
      {Picked(thumbs, kEmojiFont), u"opaque", false},
      // Old and current forms of the same emoji, both in the emoji font.
      {EntityIDFromOldCharacterInfo(Scalars({0x1F44D, 0x1F3FD}), kEmojiFont, 5),
       Picked(thumbs, kEmojiFont), true},
  };
  for (const auto& c : cases) {
    EXPECT_EQ(IsEqualRecentEntityID(c.a, c.b), c.expected)
        << ::testing::PrintToString(c.a) << " vs " << ::testing::PrintToString(c.b);
    EXPECT_EQ(IsEqualRecentEntityID(c.b, c.a), c.expected) << "symmetry";
  }
}

// Without a skin-tone base the IDs must match as text, so key order counts.
TEST(IsEqualRecentEntityID, OtherwiseComparesTheIDText) {
  const icu::UnicodeString prefix(kEntityIDPrefix);
  EXPECT_FALSE(IsEqualRecentEntityID(prefix + u"{\"char\":\"A\",\"glyph\":1}",
                                     prefix + u"{\"glyph\":1,\"char\":\"A\"}"));
  EXPECT_TRUE(IsEqualRecentEntityID(prefix + u"{\"char\":\"A\",\"glyph\":1}",
                                    prefix + u"{\"char\":\"A\",\"glyph\":1}"));
  ::testing::internal::CaptureStderr();
  EXPECT_TRUE(IsEqualRecentEntityID(prefix + u"{", prefix + u"{"));
  EXPECT_FALSE(IsEqualRecentEntityID(prefix + u"{", prefix + u"["));
  ::testing::internal::GetCapturedStderr();
}

}  // namespace
}  // namespace lumeris
