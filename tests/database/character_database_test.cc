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

void Execute(sqlite3* db, const std::string& sql) {
  char* error = nullptr;
  ASSERT_EQ(sqlite3_exec(db, sql.c_str(), nullptr, nullptr, &error), SQLITE_OK) << error;
}

void WriteTable(const std::filesystem::path& path, const std::string& create,
                const std::string& insert, const Rows& rows) {
  sqlite3* db = nullptr;
  ASSERT_EQ(sqlite3_open(path.c_str(), &db), SQLITE_OK);
  Execute(db, create);
  for (const auto& [first, second] : rows) {
    sqlite3_stmt* statement = nullptr;
    ASSERT_EQ(sqlite3_prepare_v2(db, insert.c_str(), -1, &statement, nullptr), SQLITE_OK);
    sqlite3_bind_text(statement, 1, first.data(), static_cast<int>(first.size()), SQLITE_TRANSIENT);
    sqlite3_bind_text(statement, 2, second.data(), static_cast<int>(second.size()),
                      SQLITE_TRANSIENT);
    EXPECT_EQ(sqlite3_step(statement), SQLITE_DONE);
    sqlite3_finalize(statement);
  }
  sqlite3_close(db);
}

// Every rule is checked with the reference statements and with the indexes.
class CharacterDatabaseTest : public ::testing::TestWithParam<LMCharacterDatabase::Rules> {
 protected:
  // Writes CharacterDB with (uchr, info) rows; `info_column` names the second column.
  void WriteCharacters(const Rows& rows, const std::string& info_column = "info") {
    WriteTable(dir_.path() / "CharacterDB.sqlite3",
               "create table unihan_dict (uchr text, " + info_column + " text)",
               "insert into unihan_dict values (?, ?)", rows);
  }
  void WriteRelated(const Strings& groups) {
    Rows rows;
    for (const std::string& group : groups) rows.emplace_back(group, "");
    WriteTable(dir_.path() / "RelatedCharDB.sqlite3",
               "create table related_dict (relatedChars text, unused text)",
               "insert into related_dict values (?, ?)", rows);
  }

  LMCharacterDatabase& Database() {
    if (!database_) {
      FontQueries fonts{
          .emoji_font_draws =
              [this](const icu::UnicodeString& s) {
                return emoji_.count(EncodeUtf8Lenient(s)) > 0;
              },
          .default_like_font_draws =
              [this](const icu::UnicodeString& s) {
                return !undrawable_.count(EncodeUtf8Lenient(s));
              },
      };
      database_ = std::make_unique<LMCharacterDatabase>(
          [this](std::string_view name,
                 std::string_view type) -> std::optional<std::filesystem::path> {
            looked_up_.emplace_back(name);
            std::filesystem::path path =
                dir_.path() / (std::string(name) + "." + std::string(type));
            if (!std::filesystem::exists(path)) return std::nullopt;
            return path;
          },
          fonts, GetParam());
    }
    return *database_;
  }

  // The strings of an array result; "null" for a null result.
  Strings Search(const std::string& text, std::uint64_t limit) {
    return Flatten(Database().createXPCArrayForSearchString(*DecodeUtf8(text),
                                                            static_cast<std::int64_t>(limit)));
  }
  Strings Related(const std::string& text, std::uint64_t limit) {
    return Flatten(Database().createXPCArrayForRelatedCharacters(*DecodeUtf8(text),
                                                                 static_cast<std::int64_t>(limit)));
  }
  static Strings Flatten(const MessageValue& value) {
    if (value.is_null()) return {"null"};
    Strings strings;
    for (const MessageValue& element : *value.AsArray()) strings.push_back(*element.AsString());
    return strings;
  }

  testing::ScopedTempDir dir_;
  std::set<std::string> emoji_;       // what the emoji font draws
  std::set<std::string> undrawable_;  // what no font like the default font draws
  std::vector<std::string> looked_up_;
  std::unique_ptr<LMCharacterDatabase> database_;
};

TEST_P(CharacterDatabaseTest, SearchRules) {
  WriteCharacters({
      {"♡", Info("white heart suit")},
      {"❤\uFE0F", Info("red heart; heart; HEART")},
      {"💙", Info("blue heart")},
      {"ℵ", Info("alef", "heart")},   // only a later field holds the text
      {"ﬀ", Info("ﬀﬀﬀﬀﬀﬀﬀﬀﬀﬀ oak")},  // folding doubles field 0's length before the match
      {"É", Info("ÉCLAIR")},
      {"Ω", Info("ÉTÉ", "été")},  // LIKE passes on field 1, the second search on field 0
      {"ß", Info("Straße")},
      {"1", Info("100% sure")},
      {"2", Info("100 percent")},
      {"3", Info("a_b")},
      {"4", Info("axb")},
      {"5", Info("it's")},
      {" ", Info("space mark")},
      {"\u200B", Info("zero width mark")},
      {"\x01", Info("control mark")},
      {"", Info("empty mark")},
      {"\xff", Info("broken mark")},
      {"☐", Info("undrawable mark")},
      {"✓", Info("drawable mark")},
  });
  emoji_ = {"❤\uFE0F", "💙"};
  undrawable_ = {"☐"};
  const struct {
    const char* text;
    Strings expected;
  } kCases[] = {
      {"heart", {"❤\uFE0F", "💙", "♡"}},  // emoji first, one result per row and field
      {"HeArT", {"❤\uFE0F", "💙", "♡"}},
      {"alef", {"ℵ"}},
      {"oak", {"ﬀ"}},
      {"OAK", {"ﬀ"}},
      {"éclair", {}},  // LIKE folds ASCII only
      {"ÉCLAIR", {"É"}},
      {"été", {"Ω"}},
      {"STRASSE", {}},
      {"STRAßE", {"ß"}},  // LIKE passes "STRA"; the second search folds ß
      {"100%", {"1"}},    // "%" is a wildcard for LIKE only
      {"a_b", {"3"}},
      {"it's", {"5"}},
      {"mark", {"✓"}},  // white space, ignorable, control, empty, broken and undrawable left out
      {"", {}},
      {"nothing", {}},
  };
  for (const auto& c : kCases) EXPECT_EQ(Search(c.text, 10), c.expected) << c.text;
  EXPECT_THAT(looked_up_, ElementsAre("CharacterDB"));
}

TEST_P(CharacterDatabaseTest, SearchLimitsAreUnsignedForEmojiAndSignedForTheRest) {
  WriteCharacters({{"n1", Info("x")},
                   {"e1", Info("x")},
                   {"n2", Info("x")},
                   {"e2", Info("x")},
                   {"e3", Info("x")}});
  emoji_ = {"e1", "e2", "e3"};
  const struct {
    std::uint64_t limit;
    Strings expected;
  } kCases[] = {
      {0, {"e1"}},
      {1, {"e1"}},
      {2, {"e1", "e2"}},
      {4, {"e1", "e2", "e3", "n1"}},
      {5, {"e1", "e2", "e3", "n1", "n2"}},
      {std::uint64_t{1} << 63, {"e1", "e2", "e3"}},
      {UINT64_MAX, {"e1", "e2", "e3"}},
  };
  for (const auto& c : kCases) EXPECT_EQ(Search("x", c.limit), c.expected) << c.limit;
}

TEST_P(CharacterDatabaseTest, RelatedCharacters) {
  WriteRelated({"aAáÀ", "a", "xyz", "👍👍🏽", "👍🏽👍🏿", "%q", "b_"});
  undrawable_ = {"À"};
  const struct {
    const char* text;
    std::uint64_t limit;
    Strings expected;
  } kCases[] = {
      {"a",
       10,
       {"A", "á"}},  // LIKE finds "A" rows too; the character itself and undrawable ones left out
      {"A", 10, {"a", "á", "a"}},
      {"a", 1, {"A"}},
      {"a", 0, {}},
      {"a", std::uint64_t{1} << 63, {}},
      {"👍🏽",
       10,
       {"👍", "👍", "🏽", "👍", "🏽", "👍", "🏿"}},  // split by code point, pairs kept
      {"👍🏽", 4, {"👍", "👍", "🏽", "👍"}},
      {"%", 10, {"q"}},  // escaped: only the row holding a real "%"
      {"_", 10, {"b"}},
      {"z", 10, {"x", "y"}},
  };
  for (const auto& c : kCases)
    EXPECT_EQ(Related(c.text, c.limit), c.expected) << c.text << " " << c.limit;
  EXPECT_THAT(looked_up_, ElementsAre("RelatedCharDB"));
}

TEST_P(CharacterDatabaseTest, InformationRecords) {
  const std::string full = "middle|chuu|jung|zhong|||4|zung1|L|||ㄓㄨㄥ|2.3|||";
  WriteCharacters({
      {"中", full},
      {"十五", std::string(14, '|')},
      {"十七", std::string(16, '|')},
      {"兩", "x" + std::string(15, '|') + "y"},
      {"同", std::string(14, '|')},  // a row of fifteen fields, then a usable row for the same key
      {"同", "same" + std::string(15, '|')},
      {"👍", "thumbs up" + std::string(15, '|')},
      {"☝\uFE0F", "index pointing up" + std::string(15, '|')},
  });
  const struct {
    const char* character;
    const char* unam;  // nullptr: no record
  } kCases[] = {
      {"中", "middle"},
      {"十五", nullptr},
      {"十七", nullptr},
      {"同", "same"},
      {"无", nullptr},
      {"👍🏽", "thumbs up"},
      {"👍", "thumbs up"},
      {"☝🏽", "index pointing up"},
      {"☝", "index pointing up"},
  };
  for (const auto& c : kCases) {
    MessageValue record = Database().createXPCDictionaryForCharacterInfo(*DecodeUtf8(c.character));
    ASSERT_TRUE(record.is_dictionary()) << c.character;
    if (c.unam == nullptr) {
      EXPECT_TRUE(record.AsDictionary()->empty()) << c.character;
    } else {
      EXPECT_EQ(record.AsDictionary()->size(), 16u) << c.character;
      EXPECT_EQ(*record.GetString("unam"), c.unam) << c.character;
    }
  }
  std::optional<CharacterInfoRecord> middle = Database().searchCharacterInfo(*DecodeUtf8("中"));
  ASSERT_TRUE(middle);
  EXPECT_EQ((*middle)["cbai"], "zung1");
  EXPECT_EQ((*middle)["tzhu"], "ㄓㄨㄥ");
  EXPECT_EQ((*middle)["rsu1"], "2.3");
  std::optional<CharacterInfoRecord> sparse = Database().searchCharacterInfo(*DecodeUtf8("兩"));
  ASSERT_TRUE(sparse);
  EXPECT_EQ((*sparse)["unam"], "x");
  EXPECT_EQ((*sparse)["rsu4"], "y");
  EXPECT_EQ((*sparse)["swbx"], "");
}

TEST_P(CharacterDatabaseTest, SecondColumnWithALongNameHoldsNoRecord) {
  WriteCharacters({{"中", "middle" + std::string(15, '|')}}, "information");
  EXPECT_TRUE(
      Database().createXPCDictionaryForCharacterInfo(*DecodeUtf8("中")).AsDictionary()->empty());
}

TEST_P(CharacterDatabaseTest, MissingDatabasesGiveEachRequestsFailureResultAndAreNotReopened) {
  EXPECT_THAT(Search("heart", 10), ElementsAre("null"));
  EXPECT_THAT(Related("a", 10), ElementsAre());
  EXPECT_TRUE(
      Database().createXPCDictionaryForCharacterInfo(*DecodeUtf8("中")).AsDictionary()->empty());
  // The stored handles are kept: files that appear later are not seen by this object.
  WriteCharacters({{"♥", Info("heart")}});
  EXPECT_THAT(Search("heart", 10), ElementsAre("null"));
  EXPECT_THAT(looked_up_, ElementsAre("CharacterDB", "RelatedCharDB"));
}

TEST_P(CharacterDatabaseTest, LanguageListIsLoadedOnceFoundAndLookedForUntilThen) {
  EXPECT_FALSE(Database().languageForFieldTag("jyom"));
  plist::Value list = plist::Dictionary{
      {"tags", plist::Dictionary{{"jyom", "ja"}}},
      {"languages", plist::Dictionary{{"ja", plist::Array{"jyom"}}}},
  };
  const std::vector<std::uint8_t> bytes = plist::SerializeBinaryPropertyList(list);
  std::ofstream(dir_.path() / "HanLanguageInfo.plist", std::ios::binary)
      .write(reinterpret_cast<const char*>(bytes.data()),
             static_cast<std::streamsize>(bytes.size()));
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
