#include "entity/vistrel_item.h"

#include <gtest/gtest.h>

#include "entity/entity_id.h"
#include "text/unicode_strings.h"

namespace lumeris {
namespace {

icu::UnicodeString Current(const char16_t* json) {
  return icu::UnicodeString(kEntityIDPrefix) + icu::UnicodeString(json);
}

VistrelItem Item(std::optional<icu::UnicodeString> entity_id,
                 std::optional<icu::UnicodeString> string, std::optional<icu::UnicodeString> font,
                 std::optional<uint32_t> glyph) {
  return VistrelItem{std::move(entity_id), std::move(string), std::move(font), glyph};
}

TEST(EntityIDFromVistrelItem, PrefersTheEntityIDAndOtherwiseBuildsTheCurrentForm) {
  const struct {
    VistrelItem item;
    icu::UnicodeString id;
  } cases[] = {
      {Item(u"opaque token", u"A", std::nullopt, std::nullopt), u"opaque token"},
      {Item(std::nullopt, u"A", u"Helvetica", std::nullopt), Current(u"{\"char\":\"A\"}")},
      {Item(std::nullopt, u"A", u"VantorelColorEmoji", std::nullopt),
       Current(u"{\"char\":\"A\",\"font\":\"VantorelColorEmoji\"}")},
      {Item(std::nullopt, u"A", u"F", 9), Current(u"{\"char\":\"A\",\"font\":\"F\",\"glyph\":9}")},
      {Item(std::nullopt, std::nullopt, std::nullopt, std::nullopt), Current(u"{}")},
  };
  for (const auto& c : cases) EXPECT_EQ(EntityIDFromVistrelItem(c.item), c.id);
}

TEST(VistrelItemFromEntityID, SplitsEntityIDsAndWrapsOpaqueStrings) {
  const struct {
    icu::UnicodeString id;
    VistrelItem item;
  } cases[] = {
      {u"opaque token", Item(u"opaque token", std::nullopt, std::nullopt, std::nullopt)},
      {u"", Item(u"", std::nullopt, std::nullopt, std::nullopt)},
      {Current(u"{\"char\":\"A\",\"glyph\":0}"), Item(std::nullopt, u"A", std::nullopt, std::nullopt)},
      {Current(u"{\"char\":\"A\",\"font\":\"F\",\"glyph\":65541}"), Item(std::nullopt, u"A", u"F", 5)},
      {Current(u"{\"glyph\":65536}"), Item(std::nullopt, std::nullopt, std::nullopt, 0)},
      {Current(u"{"), Item(std::nullopt, std::nullopt, std::nullopt, std::nullopt)},
      {icu::UnicodeString(kOldEntityIDPrefix) + u"<font>F<glyph>7<string>A",
       Item(std::nullopt, u"A", u"F", 7)},
  };
  ::testing::internal::CaptureStderr();
  for (const auto& c : cases) {
    EXPECT_EQ(VistrelItemFromEntityID(c.id), c.item) << ::testing::PrintToString(c.id);
  }
  ::testing::internal::GetCapturedStderr();
}

TEST(VistrelItemFromEntityID, ItemsWithSixteenBitGlyphsRoundTrip) {
  for (const VistrelItem& item : {Item(std::nullopt, u"A", u"F", 7),
                                  Item(std::nullopt, u"x", u"VantorelColorEmoji", std::nullopt),
                                  Item(std::nullopt, u"y", u"F", 0xFFFF)}) {
    EXPECT_EQ(VistrelItemFromEntityID(EntityIDFromVistrelItem(item)), item);
  }
}

}  // namespace
}  // namespace lumeris
