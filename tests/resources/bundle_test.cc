// The bundles the build wrote under the build tree's system root, read through the service's own
// database code: rows against ICU and the emoji test file, texts from each input file, the emoji
// order, related groups, the language list, the emoji sub-categories, strings tables and identity.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sqlite3.h>
#include <unicode/uchar.h>

#include <filesystem>
#include <fstream>
#include <set>
#include <string>

#include "categories/data_notation.h"
#include "database/character_database.h"
#include "platform/property_list_io.h"
#include "resource_builder/emoji_test.h"
#include "resource_builder/input_files.h"
#include "text/replacement_dictionary.h"
#include "text/utf8.h"

namespace lumeris {
namespace {

namespace fs = std::filesystem;
using ::testing::HasSubstr;
using ::testing::IsSupersetOf;

const fs::path kRoot = LUMERIS_TEST_BUILD_SYSTEM_ROOT;
const fs::path kApp = kRoot / "System/Library/Input Methods/Sorvendi.app";
const fs::path kResources = kApp / "Contents/Resources";
const fs::path kFramework = kRoot / "System/Library/PrivateFrameworks/Lumeris.framework";

std::string Text(const plist::Value* value) { return value && value->AsString() ? *value->AsString() : "<none>"; }
plist::Value Plist(const fs::path& path) { return plist::ReadPropertyListFile(path).value_or(plist::Value()); }

// The first column of the first row `sql` yields, with `argument` bound to its parameter if any.
std::string Query(const char* sql, const std::string& argument = {}) {
  sqlite3* db = nullptr;
  sqlite3_open_v2((kResources / "CharacterDB.sqlite3").c_str(), &db, SQLITE_OPEN_READONLY, nullptr);
  sqlite3_stmt* statement = nullptr;
  std::string result = "<no row>";
  if (sqlite3_prepare_v2(db, sql, -1, &statement, nullptr) == SQLITE_OK) {
    if (sqlite3_bind_parameter_count(statement) > 0) sqlite3_bind_text(statement, 1, argument.c_str(), -1, SQLITE_TRANSIENT);
    if (sqlite3_step(statement) == SQLITE_ROW) result = reinterpret_cast<const char*>(sqlite3_column_text(statement, 0));
  }
  sqlite3_finalize(statement);
  sqlite3_close(db);
  return result;
}

class BuiltBundleTest : public ::testing::Test {
 protected:
  void SetUp() override { ASSERT_TRUE(fs::exists(kApp / "Contents/Info.plist")) << "no built bundle under " << kRoot; }

  std::string Field(const std::string& character, const char* tag) {
    const auto record = db_.searchCharacterInfo(*DecodeUtf8(character));
    return record ? record->at(tag) : "<no record>";
  }
  std::vector<std::string> Related(const std::string& character) {
    const MessageValue found = db_.createXPCArrayForRelatedCharacters(*DecodeUtf8(character), 100);
    std::vector<std::string> related;
    for (const MessageValue& v : *found.AsArray()) related.push_back(*v.AsString());
    return related;
  }

  LMCharacterDatabase db_{[](std::string_view name, std::string_view type) {
                            return std::optional(kResources / (std::string(name) + "." + std::string(type)));
                          },
                          {.emoji_font_draws = [](const auto&) { return false; },
                           .default_like_font_draws = [](const auto&) { return true; }}};
  const std::vector<resources::EmojiTestEntry> emoji_ =
      resources::ParseEmojiTest(resources::ReadTextFile("/usr/share/unicode/emoji/emoji-test.txt").value_or(""));
};

TEST_F(BuiltBundleTest, OneRowOfSixteenFieldsPerAssignedCodePointAndPlainEmojiSequence) {
  UVersionInfo version;
  u_getUnicodeVersion(version);
  ASSERT_EQ(version[0] * 100 + version[1], 1500) << "ICU's Unicode version differs from the data files' (15.0)";
  size_t expected = 0;
  for (UChar32 cp = 0; cp <= 0x10FFFF; ++cp) {
    const int8_t type = u_charType(cp);
    expected += type != U_UNASSIGNED && type != U_SURROGATE && type != U_PRIVATE_USE_CHAR;
  }
  // Skin-toned forms have no row of their own: the panel applies the remembered tone.
  for (const resources::EmojiTestEntry& entry : emoji_) {
    expected += entry.status == resources::EmojiStatus::kFullyQualified && entry.sequence.size() > 1 &&
                !resources::HasSkinTone(entry.sequence);
  }
  ASSERT_GT(emoji_.size(), 4000u);
  EXPECT_EQ(Query("select count(*) from unihan_dict"), std::to_string(expected));
  EXPECT_EQ(Query("select count(distinct uchr) from unihan_dict"), std::to_string(expected));
  EXPECT_EQ(Query("select count(*) from unihan_dict where info like '|%' or "
                  "length(info) - length(replace(info, '|', '')) != 15"),
            "0")
      << "rows without a name or without sixteen fields";
  EXPECT_EQ(Query("select name from pragma_index_info((select name from sqlite_master where type = 'index'))"),
            "uchr");
}

// The records hold the texts of the input files the database end-to-end record of 中 and 👍🏽 does
// not show (NameAliases, the derived English CLDR file, the emoji test file). Search walks the
// rows in stored order, so the emoji a word names comes before those that only mention it; every
// lone emoji with a tone finds the record of its toneless key.
TEST_F(BuiltBundleTest, RecordsHoldEveryInputFileNamedEmojiComeFirstAndTonedFormsHaveRecords) {
  const std::pair<const char*, const char*> kNames[] = {{"\u00A0", "NBSP"}, {"🇩🇪", "flag: Germany"},
                                                        {"👩‍❤️‍👨", "couple with heart: woman, man; couple; couple with heart; love"}};
  for (const auto& [character, text] : kNames) EXPECT_THAT(Field(character, "unam"), HasSubstr(text)) << character;
  const auto row = [](const char* character) { return std::stol(Query("select rowid from unihan_dict where uchr = ?", character)); };
  const std::pair<const char*, const char*> kBefore[] = {
      {"🔥", "❤️‍🔥"}, {"🔥", "🧑‍🚒"}, {"❤️", "🥰"}, {"⭐", "🤩"}, {"🚀", "🧑‍🚀"}, {"☀️", "😎"},
      {"🧑‍🚒", "👨‍🚒"}, {"🐱", "😺"}, {"😀", "A"}};
  for (const auto& [first, later] : kBefore) EXPECT_LT(row(first), row(later)) << first << " before " << later;
  size_t keyed = 0;
  for (const resources::EmojiTestEntry& entry : emoji_) {
    if (!resources::HasSkinTone(entry.sequence)) continue;
    icu::UnicodeString toned;
    for (char32_t cp : entry.sequence) toned.append(static_cast<UChar32>(cp));
    if (!ReplacementDictionaryNormalizedKeyString(toned)) continue;  // ZWJ sequences have no key
    ++keyed;
    EXPECT_TRUE(db_.searchCharacterInfo(toned)) << entry.name;
  }
  EXPECT_GT(keyed, 300u);
}

TEST_F(BuiltBundleTest, RelatedGroupsAndLanguageList) {
  EXPECT_THAT(Related("发"), IsSupersetOf({"發", "髮"}));
  EXPECT_THAT(Related("é"), IsSupersetOf({"e", "E", "É", "ê", "ｅ"}));
  EXPECT_THAT(Related("👍🏿"), IsSupersetOf({"👍", "🏻"}));
  EXPECT_EQ(db_.languageForFieldTag("jyom"), plist::Value("ja"));
  EXPECT_EQ(db_.tagsForLanguage("zh"), plist::Value(plist::Array{"rsu1", "rsu2", "rsu3", "rsu4"}));
}

TEST_F(BuiltBundleTest, EmojiSubcategoriesHoldEachPlainEmojiOnceWithAFrameworkIcon) {
  const plist::Value emoji = Plist(kResources / "Category-Emoji.plist");
  ASSERT_TRUE(emoji.Find("EmojiDataArray") && emoji.Find("EmojiDataArray")->AsArray());
  size_t total = 0;
  std::set<std::u32string> seen;
  for (const plist::Value& entry : *emoji.Find("EmojiDataArray")->AsArray()) {
    const std::string image = Text(entry.Find("VTCategoryImage"));
    EXPECT_TRUE(fs::exists(kFramework / "Resources" / (image + ".pdf"))) << image;
    const plist::Value* data = entry.Find("VTCategoryData");
    const auto characters = ParseDataString(Text(data ? data->Find("Data") : nullptr));
    ASSERT_TRUE(characters) << Text(entry.Find("VTDataTitle"));
    total += characters->size();
    seen.insert(characters->begin(), characters->end());
  }
  EXPECT_EQ(seen.size(), total) << "an emoji is in two sub-categories";
  EXPECT_TRUE(seen.contains(U"\U0001F600") && seen.contains(U"\u2764\uFE0F"));
  EXPECT_FALSE(seen.contains(U"\U0001F44D\U0001F3FD")) << "skin-tone forms are chosen in the panel";
}

TEST_F(BuiltBundleTest, StringsTablesIdentifiersAndLicense) {
  size_t localizations = 0;
  for (const fs::directory_entry& entry : fs::directory_iterator(kResources)) {
    const plist::Value table = Plist(entry.path() / "Localizable.strings");
    const plist::Value emoji = Plist(entry.path() / "Emoji_Category.strings");
    localizations += table.AsDictionary() && !table.AsDictionary()->empty() && emoji.AsDictionary() &&
                     !emoji.AsDictionary()->empty();
  }
  EXPECT_GE(localizations, 50u);
  EXPECT_EQ(Text(Plist(kResources / "en.lproj/Localizable.strings").Find("CategoryName-Arrows")), "Arrow");
  EXPECT_EQ(Text(Plist(kResources / "de.lproj/Localizable.strings").Find("CategoryName-Latin")), "Lateinisch");
  const plist::Value app = Plist(kApp / "Contents/Info.plist");
  EXPECT_EQ(Text(app.Find("CFBundleIdentifier")), "com.vantorel.SorvendiIM");
  EXPECT_EQ(Text(app.Find("CFBundleDevelopmentRegion")), "en");
  EXPECT_EQ(Text(Plist(kFramework / "Resources/Info.plist").Find("CFBundleIdentifier")), "com.vantorel.Lumeris");
  for (const fs::path& license : {kResources / "UnicodeLicense.txt", kFramework / "Resources/UnicodeLicense.txt"}) {
    EXPECT_THAT(resources::ReadTextFile(license).value_or(""), HasSubstr("Unicode, Inc.")) << license;
  }
}

}  // namespace
}  // namespace lumeris
