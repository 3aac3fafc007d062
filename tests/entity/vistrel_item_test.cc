// Vistrel items to and from entity IDs, and which two entity IDs count as the same recent.
#include "entity/vistrel_item.h"

#include <gtest/gtest.h>

#include "entity/entity_id.h"
#include "entity/recent_equality.h"
#include "text/unicode_strings.h"

namespace lumeris {
namespace {

using testing::Scalars;
using Text = std::optional<icu::UnicodeString>;

const icu::UnicodeString kEmojiFont(u"VantorelColorEmoji");

icu::UnicodeString Current(const char16_t* json) { return icu::UnicodeString(u"com.vantorel.lmk:") + json; }

// An item; {} stands for an absent value.
VistrelItem Item(Text entity_id, Text string, Text font, std::optional<uint32_t> glyph) {
  return VistrelItem{std::move(entity_id), std::move(string), std::move(font), glyph};
}

// The IDs the panel records for these scalar values picked in the emoji font, or in no font.
icu::UnicodeString Emoji(std::initializer_list<uint32_t> scalars, std::optional<uint32_t> glyph = {}) {
  return EntityIDFromCharacterInfo(CharacterInfo{Scalars(scalars), kEmojiFont, glyph, {}});
}
icu::UnicodeString NoFont(std::initializer_list<uint32_t> scalars) {
  return EntityIDFromCharacterInfo(CharacterInfo{Scalars(scalars), {}, {}, {}});
}

TEST(EntityIDFromVistrelItem, PrefersTheEntityIDAndOtherwiseBuildsTheCurrentForm) {
  const struct { VistrelItem item; icu::UnicodeString id; } cases[] = {
      {Item(u"opaque token", u"A", {}, {}), u"opaque token"},
      {Item({}, u"A", u"Helvetica", {}), Current(u"{\"char\":\"A\"}")},
      {Item({}, u"A", kEmojiFont, {}),
       Current(u"{\"char\":\"A\",\"font\":\"VantorelColorEmoji\"}")},
      {Item({}, u"A", u"F", 9), Current(u"{\"char\":\"A\",\"font\":\"F\",\"glyph\":9}")},
      {Item({}, {}, {}, {}), Current(u"{}")}};
  for (const auto& c : cases) EXPECT_EQ(EntityIDFromVistrelItem(c.item), c.id);
}

// Glyphs come back as 16-bit numbers; strings that are not entity IDs are kept whole.
TEST(VistrelItemFromEntityID, SplitsEntityIDsAndWrapsOpaqueStrings) {
  const struct { icu::UnicodeString id; VistrelItem item; } cases[] = {
      {u"opaque token", Item(u"opaque token", {}, {}, {})}, {u"", Item(u"", {}, {}, {})},
      {Current(u"{\"char\":\"A\",\"glyph\":0}"), Item({}, u"A", {}, {})},
      {Current(u"{\"char\":\"A\",\"font\":\"F\",\"glyph\":65541}"), Item({}, u"A", u"F", 5)},
      {Current(u"{\"glyph\":65536}"), Item({}, {}, {}, 0)}, {Current(u"{"), Item({}, {}, {}, {})},
      {u"com.vantorel.Lumeris:<font>F<glyph>7<string>A", Item({}, u"A", u"F", 7)}};
  ::testing::internal::CaptureStderr();
  for (const auto& c : cases)
    EXPECT_EQ(VistrelItemFromEntityID(c.id), c.item) << ::testing::PrintToString(c.id);
  ::testing::internal::GetCapturedStderr();
  for (const VistrelItem& item :
       {Item({}, u"A", u"F", 7), Item({}, u"y", u"F", 0xFFFF), Item({}, u"x", kEmojiFont, {})})
    EXPECT_EQ(VistrelItemFromEntityID(EntityIDFromVistrelItem(item)), item) << "round trip";
}

// IDs whose characters hold the same skin-tone base are one recent when both or neither are in the
// emoji font, whatever their tones, selectors, glyphs or form; else they compare as text.
TEST(IsEqualRecentEntityID, SkinTonesOfOneEmojiAreOneRecent) {
  const icu::UnicodeString prefix(u"com.vantorel.lmk:");
  const struct { icu::UnicodeString a, b; bool expected; } cases[] = {
      {Emoji({0x1F44D, 0x1F3FD}), Emoji({0x1F44D}), true}, {Emoji({0x1F44D, 0x1F3FB}), Emoji({0x1F44D, 0x1F3FF}), true},
      {Emoji({0x1F44D, 0x1F3FD}), NoFont({0x1F44D}), false}, {Emoji({0x1F44D}), NoFont({0x1F44D}), false},
      {NoFont({0x1F44D, 0x1F3FD}), NoFont({0x1F44D}), true}, {Emoji({0x261D, 0xFE0F}), Emoji({0x261D, 0x1F3FE}), true},
      {Emoji({0x1F44D}), Emoji({0x1F44E}), false}, {Emoji({0x1F600}), Emoji({0x1F600}), true},
      {Emoji({0x1F600}), Emoji({0x1F601}), false}, {Emoji({0x1F44D}, 3), Emoji({0x1F44D, 0x1F3FD}), true},
      {EntityIDFromOldCharacterInfo(Scalars({0x1F44D, 0x1F3FD}), kEmojiFont, 5), Emoji({0x1F44D}), true},
      {u"opaque", u"opaque", true}, {u"opaque", u"Opaque", false}, {Emoji({0x1F44D}), u"opaque", false},
      // Without a skin-tone base the IDs must match as text, so key order counts.
      {prefix + u"{\"char\":\"A\",\"glyph\":1}", prefix + u"{\"glyph\":1,\"char\":\"A\"}", false},
      {prefix + u"{\"char\":\"A\",\"glyph\":1}", prefix + u"{\"char\":\"A\",\"glyph\":1}", true},
      {prefix + u"{", prefix + u"{", true}, {prefix + u"{", prefix + u"[", false}};
  ::testing::internal::CaptureStderr();
  for (const auto& c : cases) {
    EXPECT_EQ(IsEqualRecentEntityID(c.a, c.b), c.expected)
        << ::testing::PrintToString(c.a) << " vs " << ::testing::PrintToString(c.b);
    EXPECT_EQ(IsEqualRecentEntityID(c.b, c.a), c.expected) << "symmetry";
  }
  ::testing::internal::GetCapturedStderr();
}

}  // namespace
}  // namespace lumeris
