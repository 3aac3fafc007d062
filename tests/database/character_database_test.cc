// The rules of the three character requests, each pinned by rows written for it into small
// databases, with font answers chosen by the test.
#include "database/character_database.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sqlite3.h>

#include <cstdint>
#include <fstream>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include "platform/property_list.h"
#include "platform/property_list_io.h"
#include "support/temp_dir.h"
#include "text/utf8.h"

namespace lumeris {
namespace {

using ::testing::ElementsAre;
using ::testing::ElementsAreArray;
using Rows = std::vector<std::pair<std::string, std::string>>;
using Strings = std::vector<std::string>;

// `unam` followed by fifteen empty fields; `later` fills field 1 onwards.
std::string Info(const std::string& unam, const std::string& later = "") {
  return unam + "|" + later + std::string(14, '|');
}

// Writes `table` with the columns `columns` and rows of two texts each.
void WriteTable(const std::filesystem::path& path, const std::string& table, const std::string& columns, const Rows& rows) {
  std::string sql = "create table " + table + " (" + columns + ");";
  for (const auto& [first, second] : rows) {
    char* insert = sqlite3_mprintf("insert into %s values (%Q, %Q);", table.c_str(), first.c_str(), second.c_str());
    sql += insert;
    sqlite3_free(insert);
  }
  sqlite3* db = nullptr;
  ASSERT_EQ(sqlite3_open(path.c_str(), &db), SQLITE_OK);
  EXPECT_EQ(sqlite3_exec(db, sql.c_str(), nullptr, nullptr, nullptr), SQLITE_OK);
  sqlite3_close(db);
}

// Every rule is checked with the reference statements and with the indexes.
class CharacterDatabaseTest : public ::testing::TestWithParam<LMCharacterDatabase::Rules> {
 protected:
  // Writes CharacterDB with (uchr, info) rows; `info_column` names the second column.
  void WriteCharacters(const Rows& rows, const std::string& info_column = "info") {
    WriteTable(dir_.path() / "CharacterDB.sqlite3", "unihan_dict", "uchr text, " + info_column + " text", rows);
  }
  void WriteRelated(const Strings& groups) {
    Rows rows;
    for (const std::string& group : groups) rows.emplace_back(group, "");
    WriteTable(dir_.path() / "RelatedCharDB.sqlite3", "related_dict", "relatedChars text, unused text", rows);
  }

  LMCharacterDatabase& Database() {
    if (!database_) {
      const auto in = [](const std::set<std::string>& set) {
        return [&set](const icu::UnicodeString& s) { return set.contains(EncodeUtf8Lenient(s)); };
      };
      const auto lookup = [this](std::string_view name, std::string_view type) -> std::optional<std::filesystem::path> {
        looked_up_.emplace_back(name);
        const std::filesystem::path path = dir_.path() / (std::string(name) + "." + std::string(type));
        return std::filesystem::exists(path) ? std::optional(path) : std::nullopt;
      };
      database_ = std::make_unique<LMCharacterDatabase>(
          lookup, FontQueries{.emoji_font_draws = in(emoji_), .default_like_font_draws = std::not_fn(in(undrawable_))},
          GetParam());
    }
    return *database_;
  }

  // The strings of an array result; "null" for a null result.
  Strings Search(const std::string& text, std::uint64_t limit) {
    return Flatten(Database().createXPCArrayForSearchString(*DecodeUtf8(text), static_cast<std::int64_t>(limit)));
  }
  Strings Related(const std::string& text, std::uint64_t limit) {
    return Flatten(Database().createXPCArrayForRelatedCharacters(*DecodeUtf8(text), static_cast<std::int64_t>(limit)));
  }
  static Strings Flatten(const MessageValue& value) {
    if (value.is_null()) return {"null"};
    Strings strings;
    for (const MessageValue& element : *value.AsArray()) strings.push_back(*element.AsString());
    return strings;
  }
  MessageValue Record(const char* character) { return Database().createXPCDictionaryForCharacterInfo(*DecodeUtf8(character)); }

  testing::ScopedTempDir dir_;
  std::set<std::string> emoji_;       // what the emoji font draws
  std::set<std::string> undrawable_;  // what no font like the default font draws
  std::vector<std::string> looked_up_;
  std::unique_ptr<LMCharacterDatabase> database_;
};

TEST_P(CharacterDatabaseTest, SearchRules) {
  WriteCharacters({
      {"♡", Info("white heart suit")}, {"❤\uFE0F", Info("red heart; heart; HEART")}, {"💙", Info("blue heart")},
      {"ℵ", Info("alef", "heart")},   // only a later field holds the text
      {"ﬀ", Info("ﬀﬀﬀﬀﬀﬀﬀﬀﬀﬀ oak")},  // folding doubles field 0's length before the match
      {"É", Info("ÉCLAIR")},
      {"Ω", Info("ÉTÉ", "été")},  // LIKE passes on field 1, the second search on field 0
      {"ß", Info("Straße")}, {"1", Info("100% sure")}, {"2", Info("100 percent")}, {"3", Info("a_b")},
      {"4", Info("axb")}, {"5", Info("it's")}, {" ", Info("space mark")}, {"\u200B", Info("zero width mark")},
      {"\x01", Info("control mark")}, {"", Info("empty mark")}, {"\xff", Info("broken mark")},
      {"☐", Info("undrawable mark")}, {"✓", Info("drawable mark")},
  });
  emoji_ = {"❤\uFE0F", "💙"};
  undrawable_ = {"☐"};
  const struct { const char* text; Strings expected; } kCases[] = {
      {"heart", {"❤\uFE0F", "💙", "♡"}},  // emoji first, one result per row and field
      {"HeArT", {"❤\uFE0F", "💙", "♡"}}, {"alef", {"ℵ"}}, {"oak", {"ﬀ"}}, {"OAK", {"ﬀ"}},
      {"éclair", {}},  // LIKE folds ASCII only
      {"ÉCLAIR", {"É"}}, {"été", {"Ω"}}, {"STRASSE", {}},
      {"STRAßE", {"ß"}},  // LIKE passes "STRA"; the second search folds ß
      {"100%", {"1"}},    // "%" is a wildcard for LIKE only
      {"a_b", {"3"}}, {"it's", {"5"}},
      {"mark", {"✓"}},  // white space, ignorable, control, empty, broken and undrawable left out
      {"", {}}, {"nothing", {}},
  };
  for (const auto& c : kCases) EXPECT_EQ(Search(c.text, 10), c.expected) << c.text;
  EXPECT_THAT(looked_up_, ElementsAre("CharacterDB"));
}

TEST_P(CharacterDatabaseTest, SearchLimitsAreUnsignedForEmojiAndSignedForTheRest) {
  WriteCharacters({{"n1", Info("x")}, {"e1", Info("x")}, {"n2", Info("x")}, {"e2", Info("x")}, {"e3", Info("x")}});
  emoji_ = {"e1", "e2", "e3"};
  const std::pair<std::uint64_t, Strings> kCases[] = {
      {0, {"e1"}}, {1, {"e1"}}, {2, {"e1", "e2"}}, {4, {"e1", "e2", "e3", "n1"}}, {5, {"e1", "e2", "e3", "n1", "n2"}},
      {std::uint64_t{1} << 63, {"e1", "e2", "e3"}}, {UINT64_MAX, {"e1", "e2", "e3"}},
  };
  for (const auto& [limit, expected] : kCases) EXPECT_EQ(Search("x", limit), expected) << limit;
}

TEST_P(CharacterDatabaseTest, RelatedCharacters) {
  WriteRelated({"aAáÀ", "a", "xyz", "👍👍🏽", "👍🏽👍🏿", "%q", "b_"});
  undrawable_ = {"À"};
  const struct { const char* text; std::uint64_t limit; Strings expected; } kCases[] = {
      {"a", 10, {"A", "á"}},  // LIKE finds "A" rows too; the character itself and undrawable ones left out
      {"A", 10, {"a", "á", "a"}}, {"a", 1, {"A"}}, {"a", 0, {}}, {"a", std::uint64_t{1} << 63, {}},
      {"👍🏽", 10, {"👍", "👍", "🏽", "👍", "🏽", "👍", "🏿"}},  // split by code point, pairs kept
      {"👍🏽", 4, {"👍", "👍", "🏽", "👍"}},
      {"%", 10, {"q"}},  // escaped: only the row holding a real "%"
      {"_", 10, {"b"}}, {"z", 10, {"x", "y"}},
  };
  for (const auto& c : kCases) EXPECT_EQ(Related(c.text, c.limit), c.expected) << c.text << " " << c.limit;
  EXPECT_THAT(looked_up_, ElementsAre("RelatedCharDB"));
}

// A record holds the sixteen fields under their tags; rows of another field count, and rows of a
// table whose second column has a long name, hold none.
TEST_P(CharacterDatabaseTest, InformationRecords) {
  const std::string sixteen = "f0|f1|f2|f3|f4|f5|f6|f7|f8|f9|f10|f11|f12|f13|f14|f15";
  WriteCharacters({
      {"中", sixteen}, {"十五", std::string(14, '|')}, {"十七", std::string(16, '|')},
      {"同", std::string(14, '|')},  // a row of fifteen fields, then a usable row for the same key
      {"同", "same" + std::string(15, '|')},
      {"👍", "thumbs up" + std::string(15, '|')}, {"☝\uFE0F", "index pointing up" + std::string(15, '|')},
  });
  const MessageValue middle = Record("中");
  const std::pair<const char*, const char*> kTags[] = {
      {"unam", "f0"},  {"jyom", "f1"},  {"krpi", "f2"},  {"spin", "f3"},  {"swbx", "f4"},  {"swbh", "f5"},
      {"sbix", "f6"},  {"cbai", "f7"},  {"tcan", "f8"},  {"tday", "f9"},  {"tpin", "f10"}, {"tzhu", "f11"},
      {"rsu1", "f12"}, {"rsu2", "f13"}, {"rsu3", "f14"}, {"rsu4", "f15"}};
  ASSERT_TRUE(middle.is_dictionary());
  EXPECT_EQ(middle.AsDictionary()->size(), 16u);
  for (const auto& [tag, value] : kTags) EXPECT_EQ(middle.GetString(tag) ? *middle.GetString(tag) : "-", value) << tag;
  const std::pair<const char*, const char*> kNames[] = {
      {"十五", nullptr}, {"十七", nullptr}, {"同", "same"}, {"无", nullptr}, {"👍🏽", "thumbs up"},
      {"👍", "thumbs up"}, {"☝🏽", "index pointing up"}, {"☝", "index pointing up"}};
  for (const auto& [character, unam] : kNames) {
    const MessageValue record = Record(character);
    ASSERT_TRUE(record.is_dictionary()) << character;
    EXPECT_EQ(record.GetString("unam") ? *record.GetString("unam") : "none", unam ? unam : "none") << character;
    EXPECT_EQ(record.AsDictionary()->size(), unam ? 16u : 0u) << character;
  }
  database_.reset();
  std::filesystem::remove(dir_.path() / "CharacterDB.sqlite3");
  WriteCharacters({{"中", sixteen}}, "information");
  EXPECT_TRUE(Record("中").AsDictionary()->empty());
}

TEST_P(CharacterDatabaseTest, MissingDatabasesGiveEachRequestsFailureResultAndAreNotReopened) {
  EXPECT_THAT(Search("heart", 10), ElementsAre("null"));
  EXPECT_THAT(Related("a", 10), ElementsAre());
  EXPECT_TRUE(Record("中").AsDictionary()->empty());
  // The stored handles are kept: files that appear later are not seen by this object.
  WriteCharacters({{"♥", Info("heart")}});
  EXPECT_THAT(Search("heart", 10), ElementsAre("null"));
  EXPECT_THAT(looked_up_, ElementsAre("CharacterDB", "RelatedCharDB"));
}

TEST_P(CharacterDatabaseTest, LanguageListIsLoadedOnceFoundAndLookedForUntilThen) {
  EXPECT_FALSE(Database().languageForFieldTag("jyom"));
  const std::vector<std::uint8_t> bytes = plist::SerializeBinaryPropertyList(plist::Dictionary{
      {"tags", plist::Dictionary{{"jyom", "ja"}}}, {"languages", plist::Dictionary{{"ja", plist::Array{"jyom"}}}}});
  std::ofstream(dir_.path() / "HanLanguageInfo.plist", std::ios::binary).write(reinterpret_cast<const char*>(bytes.data()), std::ssize(bytes));
  EXPECT_EQ(Database().languageForFieldTag("jyom"), plist::Value("ja"));
  EXPECT_EQ(Database().tagsForLanguage("ja"), plist::Value(plist::Array{"jyom"}));
  EXPECT_FALSE(Database().languageForFieldTag("unam"));
  EXPECT_FALSE(Database().tagsForLanguage("ko"));
}

INSTANTIATE_TEST_SUITE_P(Rules, CharacterDatabaseTest,
                         ::testing::Values(LMCharacterDatabase::Rules::kReference,
                                           LMCharacterDatabase::Rules::kIndexed));

}  // namespace
}  // namespace lumeris
