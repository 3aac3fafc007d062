// Entity IDs: writing the current (JSON) and old (tagged) forms, reading both back, and failures.
// In the tables, {} stands for an absent value.
#include "entity/entity_id.h"

#include <gtest/gtest.h>

#include <string>

#include "text/unicode_strings.h"
#include "text/utf8.h"

namespace lumeris {
namespace {

using testing::Scalars;
using testing::Units;
using Text = std::optional<icu::UnicodeString>;

const icu::UnicodeString kEmojiFont(u"VantorelColorEmoji");

CharacterInfo Info(Text character, Text font, std::optional<uint32_t> glyph,
                   std::map<std::string, std::string> extra = {}) {
  return CharacterInfo{std::move(character), std::move(font), glyph, std::move(extra)};
}
icu::UnicodeString Current(const std::string& json) { return u"com.vantorel.lmk:" + DecodeUtf8Lenient(json); }
icu::UnicodeString Old(const char16_t* rest) { return icu::UnicodeString(u"com.vantorel.Lumeris:") + rest; }

// A reading of an ID with every out-argument; the glyph starts as a value no reading gives.
struct Reading {
  bool ok = false;
  std::optional<CharacterInfo> info;
  Text character, font;
  uint32_t glyph = 0xDEADBEEF;
  bool operator==(const Reading&) const = default;
};

// Reads `id` into the values of `r`, which show what the reading leaves alone.
Reading Read(const icu::UnicodeString& id, Reading r = {}) {
  r.ok = CharacterInfoFromEntityID(id, &r.info, &r.character, &r.font, &r.glyph);
  return r;
}

// Reads `id` and checks the three out-values; returns the reading for its dictionary.
Reading ExpectRead(const icu::UnicodeString& id, const Text& character, const Text& font, uint32_t glyph) {
  SCOPED_TRACE(::testing::PrintToString(id));
  Reading reading = Read(id);
  EXPECT_TRUE(reading.ok);
  EXPECT_EQ(reading.character, character);
  EXPECT_EQ(reading.font, font);
  EXPECT_EQ(reading.glyph, glyph);
  EXPECT_TRUE(CharacterInfoFromEntityID(id)) << "without out-arguments";
  return reading;
}

// Compact JSON, keys in the order char, font, glyph; a font without a glyph is written only when
// it is the emoji font; extra keys are never written.
TEST(EntityIDFromCharacterInfo, WritesCompactJsonInAFixedKeyOrder) {
  const struct { CharacterInfo info; const char* json; } cases[] = {
      {Info(u"A", u"Helvetica", {}), R"({"char":"A"})"},
      {Info(u"A", kEmojiFont, {}), R"({"char":"A","font":"VantorelColorEmoji"})"},
      {Info(u"A", u"F", 12), R"({"char":"A","font":"F","glyph":12})"},
      {Info(u"A", {}, 0xFFFFFFFF), R"({"char":"A","glyph":4294967295})"},
      {Info({}, u"F", 0), R"({"font":"F","glyph":0})"}, {Info({}, {}, {}), "{}"},
      {Info(u"A", {}, {}, {{"note", "\"x\""}}), R"({"char":"A"})"},
      {Info(u"/", {}, {}), R"({"char":"\/"})"}, {Info(u"\"\\", {}, {}), R"({"char":"\"\\"})"},
      {Info(u"\n", {}, {}), R"({"char":"\n"})"},
      {Info(Scalars({0x1F44D, 0x1F3FD}), kEmojiFont, {}),
       "{\"char\":\"\xF0\x9F\x91\x8D\xF0\x9F\x8F\xBD\",\"font\":\"VantorelColorEmoji\"}"}};
  for (const auto& c : cases)
    EXPECT_EQ(EntityIDFromCharacterInfo(c.info), Current(c.json)) << c.json;
}

// The same dictionary gives the same text, whatever key order or spacing the ID it was read from had.
TEST(EntityIDFromCharacterInfo, SameDictionaryAlwaysGivesTheSameText) {
  for (auto json : {R"({"glyph":7,"font":"F","char":"x"})", R"({"font":"F","char":"x","glyph":7})",
                    R"( { "char" : "x" , "glyph" : 7 , "font" : "F" } )"}) {
    EXPECT_EQ(EntityIDFromCharacterInfo(Read(Current(json)).info.value_or(Info({}, {}, {}))),
              Current(R"({"char":"x","font":"F","glyph":7})")) << json;
  }
}

TEST(EntityIDFromCharacterInfo, ReadsBackWhatItWrote) {
  for (const CharacterInfo& info : {Info(u"A", {}, {}), Info(Scalars({0x1F44D, 0x1F3FD}), kEmojiFont, {}),
                                    Info(u"a/b\"c\\d\te", u"Font/Name", 65535), Info(Scalars({0x10FFFF, 0}), {}, 0),
                                    Info({}, kEmojiFont, {})}) {
    EXPECT_EQ(ExpectRead(EntityIDFromCharacterInfo(info), info.character, info.font, info.glyph.value_or(0)).info, info);
  }
}

// Tags before the text; an empty text is "<null>"; the glyph is written as a signed 32-bit
// number. Rows with a non-empty text and font (or none) read back to the same three values.
TEST(EntityIDFromOldCharacterInfo, WritesTaggedFieldsThatReadBack) {
  const struct { icu::UnicodeString character; Text font; uint32_t glyph; const char16_t* rest; } cases[] = {
      {u"A", {}, 0, u"A"}, {u"", {}, 0, u"<null>"}, {u"A", u"F", 7, u"<font>F<glyph>7<string>A"},
      {u"A", u"", 0, u"<font><string>A"}, {u"A", {}, 7, u"<glyph>7<string>A"},
      {u"", u"F", 0, u"<font>F<string><null>"}, {u"A", {}, 0xFFFFFFFF, u"<glyph>-1<string>A"},
      {u"B", {}, 0x80000000, u"<glyph>-2147483648<string>B"},
      {u"xyz", u"Some Font", 0, u"<font>Some Font<string>xyz"},
      {Scalars({0x1F44D}), kEmojiFont, 1234,
       u"<font>VantorelColorEmoji<glyph>1234<string>\U0001F44D"}};
  for (const auto& c : cases) {
    const icu::UnicodeString id = EntityIDFromOldCharacterInfo(c.character, c.font, c.glyph);
    EXPECT_EQ(id, Old(c.rest));
    if (!c.character.isEmpty() && c.font != u"") ExpectRead(id, c.character, c.font, c.glyph);
  }
}

// Fields are the matches of "<[^>]+>[^<]+"; without any known tag the whole rest is the text.
// The dictionary holds a glyph only when a glyph tag was read.
TEST(CharacterInfoFromEntityIDOldForm, ReadsTaggedAndUntaggedFields) {
  const struct { const char16_t* rest; Text text, font; uint32_t glyph; std::optional<uint32_t> in_info; } cases[] = {
      {u"A", u"A", {}, 0, {}}, {u"<null>", {}, {}, 0, {}},
      {u"", {}, {}, 0, {}}, {u"<", u"<", {}, 0, {}},
      {u"<font>F<string><", {}, u"F", 0, {}}, {u"<glyph>0", u"<glyph>0", {}, 0, 0},
      {u"<font>F<glyph>7<string>A", u"A", u"F", 7, 7},
      {u"<string>A<glyph>7<font>F", u"A", u"F", 7, 7}, {u"<glyph>7", {}, {}, 7, 7},
      {u"<font>F", {}, u"F", 0, {}}, {u"<font>F<string><null>", {}, u"F", 0, {}},
      {u"<string>A", u"A", {}, 0, {}}, {u"<other>x<string>A", u"A", {}, 0, {}},
      {u"<other>x", u"<other>x", {}, 0, {}}, {u"<string>A<string>B", u"B", {}, 0, {}},
      {u"<glyph>-1<string>A", u"A", {}, 0xFFFFFFFF, 0xFFFFFFFF},
      {u"<glyph> 12abc<string>A", u"A", {}, 12, 12},
      {u"<glyph>4294967298<string>A", u"A", {}, 2, 2}, {u"<glyph>x<string>A", u"A", {}, 0, 0},
      {u"<font>F>G<string>A>B", u"A>B", u"F>G", 0, {}},
      {u"junk<font>F<string>A", u"A", u"F", 0, {}}};
  for (const auto& c : cases) {
    EXPECT_EQ(ExpectRead(Old(c.rest), c.text, c.font, c.glyph).info, Info(c.text, c.font, c.in_info))
        << ::testing::PrintToString(icu::UnicodeString(c.rest));
  }
}

TEST(CharacterInfoFromEntityIDCurrentForm, KeepsExtraKeysAndWrongTypedValuesAside) {
  const char* json = R"({"char":"A","zeta":[1,{"b":null}],"font":5,"alpha":"x\/y"})";
  const Reading reading = ExpectRead(Current(json), u"A", {}, 0);
  EXPECT_EQ(reading.info, Info(u"A", {}, {}, {{"alpha", R"("x\/y")"}, {"font", "5"},
                                              {"zeta", R"([1,{"b":null}])"}}));
  ExpectRead(Current(R"({"char":"\ud83d\udc4d\u00e9\/"})"), Scalars({0x1F44D, 0xE9, u'/'}), {}, 0);
}

// Integers keep their low 32 bits (also at the 64-bit boundaries); fractions are cut toward zero;
// numbers beyond the 64-bit range read as 0.
TEST(CharacterInfoFromEntityIDCurrentForm, ConvertsGlyphNumbersTo32Bits) {
  const struct { const char* json; std::optional<uint32_t> glyph; } cases[] = {
      {R"({"glyph":12})", 12}, {R"({"glyph":4294967297})", 1}, {R"({"glyph":-1})", 0xFFFFFFFF},
      {R"({"glyph":9223372036854775807})", 0xFFFFFFFF}, {R"({"glyph":9223372036854775813})", 5},
      {R"({"glyph":18446744073709551615})", 0xFFFFFFFF}, {R"({"glyph":18446744073709551616})", 0},
      {R"({"glyph":-9223372036854775807})", 1}, {R"({"glyph":-9223372036854775809})", 0},
      {R"({"glyph":12.9})", 12}, {R"({"glyph":-12.9})", 0xFFFFFFF4}, {R"({"glyph":true})", 1},
      {R"({"glyph":1e300})", 0}, {R"({"glyph":"12"})", {}}, {R"({"glyph":null})", {}}};
  for (const auto& c : cases) {
    const Reading reading = ExpectRead(Current(c.json), {}, {}, c.glyph.value_or(0));
    ASSERT_TRUE(reading.info.has_value()) << c.json;
    EXPECT_EQ(reading.info->glyph, c.glyph) << c.json;
  }
}

TEST(CharacterInfoFromEntityIDErrors, RefusesStringsWithoutAPrefixAndWritesNothing) {
  const Reading kept{false, Info(u"keep", {}, {}), u"keep", u"keep", 99};
  for (const char16_t* id : {u"", u"A", u"com.vantorel.lmk", u"COM.VANTOREL.LMK:{}", u"com.vantorel.lumeris:A",
                             u" com.vantorel.lmk:{}"}) {
    EXPECT_TRUE(Read(id, kept) == kept) << ::testing::PrintToString(icu::UnicodeString(id));
    EXPECT_FALSE(CharacterInfoFromEntityID(id));
  }
}

// Damaged JSON is logged and reads as an ID with nothing in it.
TEST(CharacterInfoFromEntityIDErrors, DamagedJsonIsLoggedAndReadsAsEmpty) {
  for (const std::string json : {"{", "", "{\"char\":}", "[\"char\"]", "\"A\"", "{\"char\":\"A\"} x"}) {
    ::testing::internal::CaptureStderr();
    EXPECT_EQ(ExpectRead(Current(json), {}, {}, 0).info, std::nullopt);
    const std::string log = ::testing::internal::GetCapturedStderr();
    EXPECT_NE(log.find(": CharacterInfoFromEntityID failed due to "), std::string::npos) << log;
    EXPECT_TRUE(log.ends_with('\n')) << log;
  }
}

// The nesting limit is exact: an ID nested to the limit reads, one level more is damaged.
TEST(CharacterInfoFromEntityIDErrors, NestingIsLimitedToSixtyFourLevels) {
  auto nested = [](int arrays) {
    return Current("{\"char\":\"A\",\"x\":" + std::string(arrays, '[') + std::string(arrays, ']') + "}");
  };
  EXPECT_EQ(Read(nested(64)).character, u"A");
  ::testing::internal::CaptureStderr();
  EXPECT_EQ(Read(nested(65)).character, std::nullopt);
  EXPECT_NE(::testing::internal::GetCapturedStderr().find("nested deeper than 64 levels"), std::string::npos);
}

TEST(CharacterInfoFromEntityIDErrors, UnencodableTextLeavesTheInfoUntouched) {
  const Reading before{false, Info(u"keep", {}, {}), u"old", u"old", 99};
  EXPECT_TRUE(Read(Current("{\"char\":\"") + Units({0xD83D}) + u"\"}", before) ==
              (Reading{true, before.info, std::nullopt, std::nullopt, 0}));
}

}  // namespace
}  // namespace lumeris
