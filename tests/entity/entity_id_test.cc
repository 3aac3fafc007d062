#include "entity/entity_id.h"

#include <gtest/gtest.h>

#include <string>

#include "text/unicode_strings.h"
#include "text/utf8.h"

namespace lumeris {
namespace {

using testing::Scalars;
using testing::Units;

const icu::UnicodeString kEmojiFont(u"VantorelColorEmoji");

CharacterInfo Info(std::optional<icu::UnicodeString> character,
                   std::optional<icu::UnicodeString> font, std::optional<uint32_t> glyph) {
  CharacterInfo info;
  info.character = std::move(character);
  info.font = std::move(font);
  info.glyph = glyph;
  return info;
}

icu::UnicodeString Current(const char* json) {
  return icu::UnicodeString(kEntityIDPrefix) + DecodeUtf8Lenient(json);
}

icu::UnicodeString Old(const char16_t* rest) {
  return icu::UnicodeString(kOldEntityIDPrefix) + icu::UnicodeString(rest);
}

// Reads `id` asking for every out-argument.
struct Reading {
  bool ok = false;
  std::optional<CharacterInfo> info;
  std::optional<icu::UnicodeString> character;
  std::optional<icu::UnicodeString> font;
  uint32_t glyph = 0xDEADBEEF;
};

Reading Read(const icu::UnicodeString& id) {
  Reading reading;
  reading.ok = CharacterInfoFromEntityID(id, &reading.info, &reading.character, &reading.font,
                                         &reading.glyph);
  return reading;
}

// --- EntityIDFromCharacterInfo ----------------------------------------------------------------

TEST(EntityIDFromCharacterInfo, WritesCompactJsonInAFixedKeyOrder) {
  const struct {
    CharacterInfo info;
    const char* json;
  } cases[] = {
      {Info(u"A", u"Helvetica", std::nullopt), R"({"char":"A"})"},
      {Info(u"A", kEmojiFont, std::nullopt), R"({"char":"A","font":"VantorelColorEmoji"})"},
      {Info(u"A", u"F", 12), R"({"char":"A","font":"F","glyph":12})"},
      {Info(u"A", std::nullopt, 0xFFFFFFFF), R"({"char":"A","glyph":4294967295})"},
      {Info(std::nullopt, u"F", 0), R"({"font":"F","glyph":0})"},
      {Info(std::nullopt, std::nullopt, std::nullopt), "{}"},
      {Info(u"/", std::nullopt, std::nullopt), R"({"char":"\/"})"},
      {Info(u"\"\\", std::nullopt, std::nullopt), R"({"char":"\"\\"})"},
      {Info(u"\n", std::nullopt, std::nullopt), R"({"char":"\n"})"},
      {Info(Scalars({0x1F44D, 0x1F3FD}), kEmojiFont, std::nullopt),
       "{\"char\":\"\xF0\x9F\x91\x8D\xF0\x9F\x8F\xBD\",\"font\":\"VantorelColorEmoji\"}"},
  };
  for (const auto& c : cases) {
    EXPECT_EQ(EntityIDFromCharacterInfo(c.info), Current(c.json)) << c.json;
  }
}

TEST(EntityIDFromCharacterInfo, DoesNotWriteExtraKeys) {
  CharacterInfo info = Info(u"A", std::nullopt, std::nullopt);
  info.extra_json.emplace("note", "\"x\"");
  EXPECT_EQ(EntityIDFromCharacterInfo(info), Current(R"({"char":"A"})"));
}

// The same dictionary gives the same text, however it was built or whatever key order an ID it
// was read from had.
TEST(EntityIDFromCharacterInfo, SameDictionaryAlwaysGivesTheSameText) {
  CharacterInfo built_forwards;
  built_forwards.character = icu::UnicodeString(u"x");
  built_forwards.font = icu::UnicodeString(u"F");
  built_forwards.glyph = 7;
  CharacterInfo built_backwards;
  built_backwards.glyph = 7;
  built_backwards.font = icu::UnicodeString(u"F");
  built_backwards.character = icu::UnicodeString(u"x");
  const icu::UnicodeString expected = EntityIDFromCharacterInfo(built_forwards);
  EXPECT_EQ(EntityIDFromCharacterInfo(built_backwards), expected);

  for (const char* json : {R"({"glyph":7,"font":"F","char":"x"})",
                           R"({"font":"F","char":"x","glyph":7})",
                           R"( { "char" : "x" , "glyph" : 7 , "font" : "F" } )"}) {
    std::optional<CharacterInfo> info;
    ASSERT_TRUE(CharacterInfoFromEntityID(Current(json), &info)) << json;
    ASSERT_TRUE(info.has_value()) << json;
    EXPECT_EQ(EntityIDFromCharacterInfo(*info), expected) << json;
  }
}

TEST(EntityIDFromCharacterInfo, ReadsBackWhatItWrote) {
  const CharacterInfo infos[] = {
      Info(u"A", std::nullopt, std::nullopt),
      Info(Scalars({0x1F44D, 0x1F3FD}), kEmojiFont, std::nullopt),
      Info(u"a/b\"c\\d\te", u"Font/Name", 65535),
      Info(Scalars({0x10FFFF, 0}), std::nullopt, 0),
      Info(std::nullopt, kEmojiFont, std::nullopt),
  };
  for (const CharacterInfo& info : infos) {
    const Reading reading = Read(EntityIDFromCharacterInfo(info));
    ASSERT_TRUE(reading.ok);
    ASSERT_TRUE(reading.info.has_value());
    EXPECT_EQ(*reading.info, info);
    EXPECT_EQ(reading.character, info.character);
    EXPECT_EQ(reading.font, info.font);
    EXPECT_EQ(reading.glyph, info.glyph.value_or(0));
  }
}

// --- EntityIDFromOldCharacterInfo -------------------------------------------------------------

TEST(EntityIDFromOldCharacterInfo, WritesTaggedFields) {
  const struct {
    icu::UnicodeString character;
    std::optional<icu::UnicodeString> font;
    uint32_t glyph;
    const char16_t* rest;
  } cases[] = {
      {u"A", std::nullopt, 0, u"A"},
      {u"", std::nullopt, 0, u"<null>"},
      {u"A", icu::UnicodeString(u"F"), 7, u"<font>F<glyph>7<string>A"},
      {u"A", icu::UnicodeString(u""), 0, u"<font><string>A"},
      {u"A", std::nullopt, 7, u"<glyph>7<string>A"},
      {u"", icu::UnicodeString(u"F"), 0, u"<font>F<string><null>"},
      {u"A", std::nullopt, 0xFFFFFFFF, u"<glyph>-1<string>A"},
  };
  for (const auto& c : cases) {
    EXPECT_EQ(EntityIDFromOldCharacterInfo(c.character, c.font, c.glyph), Old(c.rest));
  }
}

TEST(EntityIDFromOldCharacterInfo, ReadsBackWhatItWrote) {
  const struct {
    icu::UnicodeString character;
    std::optional<icu::UnicodeString> font;
    uint32_t glyph;
  } cases[] = {
      {u"A", std::nullopt, 0},
      {Scalars({0x1F44D}), icu::UnicodeString(u"VantorelColorEmoji"), 1234},
      {u"B", std::nullopt, 0x80000000},
      {u"xyz", icu::UnicodeString(u"Some Font"), 0},
  };
  for (const auto& c : cases) {
    const Reading reading = Read(EntityIDFromOldCharacterInfo(c.character, c.font, c.glyph));
    ASSERT_TRUE(reading.ok);
    EXPECT_EQ(reading.character, c.character);
    EXPECT_EQ(reading.font, c.font);
    EXPECT_EQ(reading.glyph, c.glyph);
  }
}

// --- CharacterInfoFromEntityID: the old form --------------------------------------------------

TEST(CharacterInfoFromEntityIDOldForm, ReadsTaggedAndUntaggedFields) {
  const struct {
    const char16_t* rest;
    std::optional<icu::UnicodeString> character;
    std::optional<icu::UnicodeString> font;
    uint32_t glyph;
    std::optional<uint32_t> info_glyph;
  } cases[] = {
      {u"A", u"A", std::nullopt, 0, std::nullopt},
      {u"<null>", std::nullopt, std::nullopt, 0, std::nullopt},
      {u"", std::nullopt, std::nullopt, 0, std::nullopt},
      {u"<", u"<", std::nullopt, 0, std::nullopt},
      {u"<font>F<string><", std::nullopt, u"F", 0, std::nullopt},
      {u"<glyph>0", u"<glyph>0", std::nullopt, 0, 0},
      {u"<font>F<glyph>7<string>A", u"A", u"F", 7, 7},
      {u"<string>A<glyph>7<font>F", u"A", u"F", 7, 7},
      {u"<glyph>7", std::nullopt, std::nullopt, 7, 7},
      {u"<font>F", std::nullopt, u"F", 0, std::nullopt},
      {u"<font>F<string><null>", std::nullopt, u"F", 0, std::nullopt},
      {u"<string>A", u"A", std::nullopt, 0, std::nullopt},
      {u"<other>x<string>A", u"A", std::nullopt, 0, std::nullopt},
      {u"<other>x", u"<other>x", std::nullopt, 0, std::nullopt},
      {u"<string>A<string>B", u"B", std::nullopt, 0, std::nullopt},
      {u"<glyph>-1<string>A", u"A", std::nullopt, 0xFFFFFFFF, 0xFFFFFFFF},
      {u"<glyph> 12abc<string>A", u"A", std::nullopt, 12, 12},
      {u"<glyph>4294967298<string>A", u"A", std::nullopt, 2, 2},
      {u"<glyph>x<string>A", u"A", std::nullopt, 0, 0},
      {u"<font>F>G<string>A>B", u"A>B", u"F>G", 0, std::nullopt},
      {u"junk<font>F<string>A", u"A", u"F", 0, std::nullopt},
  };
  for (const auto& c : cases) {
    const Reading reading = Read(Old(c.rest));
    const std::string label = ::testing::PrintToString(icu::UnicodeString(c.rest));
    ASSERT_TRUE(reading.ok) << label;
    EXPECT_EQ(reading.character, c.character) << label;
    EXPECT_EQ(reading.font, c.font) << label;
    EXPECT_EQ(reading.glyph, c.glyph) << label;
    ASSERT_TRUE(reading.info.has_value()) << label;
    EXPECT_EQ(*reading.info, Info(c.character, c.font, c.info_glyph)) << label;
  }
}

// --- CharacterInfoFromEntityID: the current form ----------------------------------------------

TEST(CharacterInfoFromEntityIDCurrentForm, KeepsExtraKeysAndWrongTypedValues) {
  const Reading reading =
      Read(Current(R"({"char":"A","zeta":[1,{"b":null}],"font":5,"alpha":"x\/y"})"));
  ASSERT_TRUE(reading.ok);
  ASSERT_TRUE(reading.info.has_value());
  EXPECT_EQ(reading.character, icu::UnicodeString(u"A"));
  EXPECT_EQ(reading.font, std::nullopt);
  EXPECT_EQ(reading.glyph, 0u);
  EXPECT_EQ(reading.info->glyph, std::nullopt);
  const std::map<std::string, std::string> extra = {
      {"alpha", R"("x\/y")"}, {"font", "5"}, {"zeta", R"([1,{"b":null}])"}};
  EXPECT_EQ(reading.info->extra_json, extra);
}

TEST(CharacterInfoFromEntityIDCurrentForm, ConvertsGlyphNumbersTo32Bits) {
  const struct {
    const char* json;
    std::optional<uint32_t> glyph;
  } cases[] = {
      {R"({"glyph":12})", 12},         {R"({"glyph":4294967297})", 1},
      {R"({"glyph":-1})", 0xFFFFFFFF}, {R"({"glyph":12.9})", 12},
      {R"({"glyph":true})", 1},        {R"({"glyph":1e300})", 0},
      {R"({"glyph":"12"})", std::nullopt},
      {R"({"glyph":null})", std::nullopt},
  };
  for (const auto& c : cases) {
    const Reading reading = Read(Current(c.json));
    ASSERT_TRUE(reading.ok && reading.info.has_value()) << c.json;
    EXPECT_EQ(reading.info->glyph, c.glyph) << c.json;
    EXPECT_EQ(reading.glyph, c.glyph.value_or(0)) << c.json;
  }
}

TEST(CharacterInfoFromEntityIDCurrentForm, DecodesEscapesAndUnicode) {
  const Reading reading = Read(Current(R"({"char":"\ud83d\udc4d\u00e9\/"})"));
  ASSERT_TRUE(reading.ok);
  EXPECT_EQ(reading.character, Scalars({0x1F44D, 0xE9, u'/'}));
}

// --- CharacterInfoFromEntityID: failures ------------------------------------------------------

TEST(CharacterInfoFromEntityIDErrors, RefusesStringsWithoutAPrefixAndWritesNothing) {
  for (const char16_t* id : {u"", u"A", u"com.vantorel.lmk", u"COM.VANTOREL.LMK:{}",
                             u"com.vantorel.lumeris:A", u" com.vantorel.lmk:{}"}) {
    std::optional<CharacterInfo> info = Info(u"keep", std::nullopt, std::nullopt);
    std::optional<icu::UnicodeString> character = icu::UnicodeString(u"keep");
    std::optional<icu::UnicodeString> font = icu::UnicodeString(u"keep");
    uint32_t glyph = 99;
    EXPECT_FALSE(CharacterInfoFromEntityID(icu::UnicodeString(id), &info, &character, &font,
                                           &glyph));
    EXPECT_EQ(info, Info(u"keep", std::nullopt, std::nullopt));
    EXPECT_EQ(character, icu::UnicodeString(u"keep"));
    EXPECT_EQ(font, icu::UnicodeString(u"keep"));
    EXPECT_EQ(glyph, 99u);
  }
}

TEST(CharacterInfoFromEntityIDErrors, DamagedJsonIsLoggedAndReadsAsEmpty) {
  for (const char* json : {"{", "", "{\"char\":}", "[\"char\"]", "\"A\"", "{\"char\":\"A\"} x"}) {
    ::testing::internal::CaptureStderr();
    const Reading reading = Read(Current(json));
    const std::string log = ::testing::internal::GetCapturedStderr();
    EXPECT_TRUE(reading.ok) << json;
    EXPECT_EQ(reading.info, std::nullopt) << json;
    EXPECT_EQ(reading.character, std::nullopt) << json;
    EXPECT_EQ(reading.font, std::nullopt) << json;
    EXPECT_EQ(reading.glyph, 0u) << json;
    EXPECT_NE(log.find(": CharacterInfoFromEntityID failed due to "), std::string::npos)
        << json << " logged: " << log;
    EXPECT_EQ(log.back(), '\n');
  }
}

TEST(CharacterInfoFromEntityIDErrors, DeepNestingIsDamagedJson) {
  std::string deep = R"({"char":"A","x":)";
  for (int i = 0; i < 100000; ++i) deep += '[';
  ::testing::internal::CaptureStderr();
  const Reading reading = Read(Current(deep.c_str()));
  const std::string log = ::testing::internal::GetCapturedStderr();
  EXPECT_TRUE(reading.ok);
  EXPECT_EQ(reading.info, std::nullopt);
  EXPECT_EQ(reading.character, std::nullopt);
  EXPECT_NE(log.find("CharacterInfoFromEntityID failed due to "), std::string::npos);
}

TEST(CharacterInfoFromEntityIDErrors, UnencodableTextLeavesTheInfoUntouched) {
  std::optional<CharacterInfo> info = Info(u"keep", std::nullopt, std::nullopt);
  std::optional<icu::UnicodeString> character = icu::UnicodeString(u"old");
  uint32_t glyph = 99;
  const icu::UnicodeString id =
      icu::UnicodeString(kEntityIDPrefix) + u"{\"char\":\"" + Units({0xD83D}) + u"\"}";
  EXPECT_TRUE(CharacterInfoFromEntityID(id, &info, &character, nullptr, &glyph));
  EXPECT_EQ(info, Info(u"keep", std::nullopt, std::nullopt));
  EXPECT_EQ(character, std::nullopt);
  EXPECT_EQ(glyph, 0u);
}

TEST(CharacterInfoFromEntityIDErrors, AcceptsNullOutArguments) {
  EXPECT_TRUE(CharacterInfoFromEntityID(Current(R"({"char":"A"})")));
  EXPECT_TRUE(CharacterInfoFromEntityID(Old(u"<font>F<string>A")));
  EXPECT_FALSE(CharacterInfoFromEntityID(icu::UnicodeString(u"opaque")));
}

}  // namespace
}  // namespace lumeris
