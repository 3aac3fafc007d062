// Tests of the built resource bundles under $LUMERIS_SYSTEM_ROOT: database contents against ICU and
// the emoji test file, known facts, category property lists, icons and strings tables.
#include <gtest/gtest.h>
#include <sqlite3.h>
#include <unicode/uchar.h>
#include <unicode/unistr.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "platform/property_list_io.h"
#include "categories/data_notation.h"
#include "text/replacement_dictionary.h"

namespace lumeris::resources {
namespace {

namespace fs = std::filesystem;

// $LUMERIS_SYSTEM_ROOT, else the build tree's root that the build wrote the bundles under.
fs::path SystemRootForTests() {
  const char* root = std::getenv("LUMERIS_SYSTEM_ROOT");
  return root && *root ? fs::path(root) : fs::path(LUMERIS_TEST_BUILD_SYSTEM_ROOT);
}

// Read-only access to one of the bundle's databases, as the service opens them.
class Database {
 public:
  explicit Database(const fs::path& path) { sqlite3_open_v2(path.c_str(), &db_, SQLITE_OPEN_READONLY, nullptr); }
  ~Database() { sqlite3_close(db_); }
  Database(const Database&) = delete;
  Database& operator=(const Database&) = delete;

  // The text columns of every row `sql` yields, with `argument` bound to its one parameter, if any.
  std::vector<std::vector<std::string>> Rows(const char* sql, const std::string& argument = {}) const {
    std::vector<std::vector<std::string>> rows;
    sqlite3_stmt* statement = nullptr;
    if (sqlite3_prepare_v2(db_, sql, -1, &statement, nullptr) != SQLITE_OK) return rows;
    if (sqlite3_bind_parameter_count(statement) > 0) {
      sqlite3_bind_text(statement, 1, argument.data(), static_cast<int>(argument.size()), SQLITE_TRANSIENT);
    }
    while (sqlite3_step(statement) == SQLITE_ROW) {
      std::vector<std::string> row;
      for (int i = 0; i < sqlite3_column_count(statement); ++i) {
        const unsigned char* text = sqlite3_column_text(statement, i);
        row.emplace_back(text ? reinterpret_cast<const char*>(text) : "");
      }
      rows.push_back(std::move(row));
    }
    sqlite3_finalize(statement);
    return rows;
  }

 private:
  sqlite3* db_ = nullptr;
};

std::vector<std::string> SplitInfo(const std::string& info) {
  std::vector<std::string> fields;
  std::stringstream stream(info);
  std::string field;
  while (std::getline(stream, field, '|')) fields.push_back(field);
  if (!info.empty() && info.back() == '|') fields.emplace_back();
  return fields;
}

constexpr const char* kFieldTags[] = {"unam", "jyom", "krpi", "spin", "swbx", "swbh", "sbix", "cbai",
                                      "tcan", "tday", "tpin", "tzhu", "rsu1", "rsu2", "rsu3", "rsu4"};

class BuiltBundleTest : public ::testing::Test {
 protected:
  void SetUp() override {
    ASSERT_TRUE(fs::exists(app_ / "Contents" / "Info.plist")) << "no built bundle under " << SystemRootForTests();
  }

  fs::path Resource(const std::string& name) const { return resources_ / name; }

  // Info fields of `character` by tag; empty when it has no row.
  std::map<std::string, std::string> InfoOf(const std::string& character) const {
    std::map<std::string, std::string> record;
    auto rows = characters_.Rows("select * from unihan_dict where uchr = ?", character);
    if (rows.empty()) return record;
    std::vector<std::string> fields = SplitInfo(rows[0][1]);
    for (size_t i = 0; i < fields.size() && i < 16; ++i) record[kFieldTags[i]] = fields[i];
    return record;
  }

  // Characters whose name field contains `text` (the search's LIKE query, ASCII case folded).
  std::set<std::string> CharactersNamed(const std::string& text) const {
    std::set<std::string> found;
    for (const auto& row : characters_.Rows("select uchr, info from unihan_dict where info like ?", "%" + text + "%")) {
      std::string name = row[1].substr(0, row[1].find('|'));
      std::string lower_name = name, lower_text = text;
      for (char& c : lower_name) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
      for (char& c : lower_text) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
      if (lower_name.find(lower_text) != std::string::npos) found.insert(row[0]);
    }
    return found;
  }

  plist::Value Plist(const fs::path& path) const {
    std::optional<plist::Value> value = plist::ReadPropertyListFile(path);
    EXPECT_TRUE(value) << path;
    return value.value_or(plist::Value());
  }

  const fs::path app_ = SystemRootForTests() / "System/Library/Input Methods/Sorvendi.app";
  const fs::path framework_ = SystemRootForTests() / "System/Library/PrivateFrameworks/Lumeris.framework";
  const fs::path resources_ = app_ / "Contents" / "Resources";
  const Database characters_{resources_ / "CharacterDB.sqlite3"};
  const Database related_{resources_ / "RelatedCharDB.sqlite3"};
};

// The fully-qualified emoji sequences of several code points in the emoji test file, as written
// there ("1F44D 1F3FD"), split by whether they carry a skin-tone modifier.
struct EmojiSequences {
  std::vector<std::string> plain, toned;
};
EmojiSequences FullyQualifiedSequencesInEmojiTest() {
  std::ifstream in("/usr/share/unicode/emoji/emoji-test.txt");
  EmojiSequences sequences;
  for (std::string line; std::getline(in, line);) {
    size_t semi = line.find(';');
    if (line.empty() || line[0] == '#' || semi == std::string::npos) continue;
    if (line.find("fully-qualified", semi) == std::string::npos) continue;
    std::string points = line.substr(0, semi);
    points.erase(points.find_last_not_of(' ') + 1);
    if (points.find(' ') == std::string::npos) continue;
    bool toned = false;
    for (const char* tone : {"1F3FB", "1F3FC", "1F3FD", "1F3FE", "1F3FF"}) toned |= points.find(tone) != std::string::npos;
    (toned ? sequences.toned : sequences.plain).push_back(points);
  }
  return sequences;
}

std::string Utf8OfCodePoints(const std::string& hex_points) {
  std::string out;
  std::stringstream stream(hex_points);
  for (std::string hex; stream >> hex;) icu::UnicodeString(static_cast<UChar32>(std::stoul(hex, nullptr, 16))).toUTF8String(out);
  return out;
}

TEST_F(BuiltBundleTest, OneRowPerAssignedCodePointAndEmojiSequence) {
  size_t assigned = 0;
  for (UChar32 cp = 0; cp <= 0x10FFFF; ++cp) {
    int8_t type = u_charType(cp);
    if (type != U_UNASSIGNED && type != U_SURROGATE && type != U_PRIVATE_USE_CHAR) ++assigned;
  }
  UVersionInfo version;
  u_getUnicodeVersion(version);
  // The data files are Unicode 15.0; ICU must be of the same version for the counts to agree.
  ASSERT_EQ(version[0], 15) << "ICU's Unicode version differs from the data files'";
  ASSERT_EQ(version[1], 0);
  // Skin-toned forms have no row of their own: the panel applies the remembered tone.
  size_t sequences = FullyQualifiedSequencesInEmojiTest().plain.size();
  ASSERT_GT(sequences, 500u);
  auto rows = characters_.Rows("select count(*), count(distinct uchr) from unihan_dict");
  ASSERT_EQ(rows.size(), 1u);
  EXPECT_EQ(std::stoul(rows[0][0]), assigned + sequences);
  EXPECT_EQ(rows[0][0], rows[0][1]) << "a character has two rows";
}

TEST_F(BuiltBundleTest, EveryInfoHasSixteenFields) {
  size_t checked = 0;
  for (const auto& row : characters_.Rows("select uchr, info from unihan_dict")) {
    ASSERT_EQ(SplitInfo(row[1]).size(), 16u) << row[0];
    ASSERT_FALSE(SplitInfo(row[1])[0].empty()) << "no name for " << row[0];
    ++checked;
  }
  EXPECT_GT(checked, 140000u);
}

TEST_F(BuiltBundleTest, ColumnsAreInTheOrderReadersExpect) {
  auto columns = characters_.Rows("select name from pragma_table_info('unihan_dict') order by cid");
  ASSERT_EQ(columns.size(), 2u);
  EXPECT_EQ(columns[0][0], "uchr");
  EXPECT_EQ(columns[1][0], "info");
  auto plan = characters_.Rows("explain query plan select * from unihan_dict where uchr = 'x'");
  ASSERT_FALSE(plan.empty());
  EXPECT_NE(plan[0].back().find("INDEX"), std::string::npos) << plan[0].back();
  auto related_columns = related_.Rows("select name from pragma_table_info('related_dict')");
  ASSERT_EQ(related_columns.size(), 1u);
  EXPECT_EQ(related_columns[0][0], "relatedChars");
}

TEST_F(BuiltBundleTest, HanReadingsOfHeart) {
  auto info = InfoOf("心");
  EXPECT_NE(info["unam"].find("heart"), std::string::npos);
  EXPECT_NE(info["jyom"].find("SHIN"), std::string::npos);
  EXPECT_NE(info["jyom"].find("KOKORO"), std::string::npos);
  EXPECT_NE(info["krpi"].find("심"), std::string::npos);
  EXPECT_EQ(info["spin"], "xīn");
  EXPECT_EQ(info["tzhu"], "ㄒㄧㄣ");
  EXPECT_EQ(info["rsu1"], "61.0");
}

TEST_F(BuiltBundleTest, EmojiNamesAndKeywords) {
  std::string grinning = InfoOf("😀")["unam"];
  for (const char* word : {"GRINNING FACE", "grin", "face"}) EXPECT_NE(grinning.find(word), std::string::npos) << word;
  EXPECT_NE(InfoOf("👍")["unam"].find("thumbs up"), std::string::npos);
  EXPECT_NE(InfoOf("🇩🇪")["unam"].find("Germany"), std::string::npos);
}

TEST_F(BuiltBundleTest, SearchesFindWhatAPersonExpects) {
  EXPECT_TRUE(CharactersNamed("euro").contains("€"));
  EXPECT_TRUE(CharactersNamed("heart").contains("❤️"));
  EXPECT_TRUE(CharactersNamed("smile").contains("😄"));
  EXPECT_TRUE(CharactersNamed("water").contains("水"));
  EXPECT_TRUE(CharactersNamed("NBSP").contains("\u00A0"));
}

// Search shows emoji rows in stored order, so the emoji a word names comes before those that only
// mention it, and skin-toned copies never fill a result list.
TEST_F(BuiltBundleTest, EmojiRowsPutTheNamedEmojiFirstWithoutSkinToneCopies) {
  std::map<std::string, size_t> position;
  size_t row = 0;
  for (const auto& r : characters_.Rows("select uchr from unihan_dict order by rowid")) position[r[0]] = row++;
  const std::pair<const char*, const char*> before[] = {
      {"🔥", "❤️‍🔥"}, {"🔥", "🧑‍🚒"}, {"❤️", "🥰"}, {"⭐", "🤩"}, {"🚀", "🧑‍🚀"}, {"☀️", "😎"},
      {"🧑‍🚒", "👨‍🚒"}, {"🐱", "😺"}, {"😀", "A"}};
  for (const auto& [first, later] : before) {
    ASSERT_TRUE(position.contains(first) && position.contains(later)) << first << " " << later;
    EXPECT_LT(position[first], position[later]) << first << " should come before " << later;
  }
  EmojiSequences sequences = FullyQualifiedSequencesInEmojiTest();
  ASSERT_GT(sequences.toned.size(), 1000u);
  for (const std::string& toned : sequences.toned) {
    EXPECT_FALSE(position.contains(Utf8OfCodePoints(toned))) << toned;
  }
  // A lone emoji with a tone is looked up under its normalized key, which must have a row. (A ZWJ
  // sequence has no such key, so its toned forms have no record either.)
  size_t keyed = 0;
  for (const std::string& toned : sequences.toned) {
    std::optional<icu::UnicodeString> key =
        ReplacementDictionaryNormalizedKeyString(icu::UnicodeString::fromUTF8(Utf8OfCodePoints(toned)));
    if (!key) continue;
    ++keyed;
    std::string utf8;
    EXPECT_TRUE(position.contains(key->toUTF8String(utf8))) << toned;
  }
  EXPECT_GT(keyed, 300u);
}

TEST_F(BuiltBundleTest, RelatedGroupsHoldVariantsAndForms) {
  auto row_with = [&](const std::string& character) {
    auto rows = related_.Rows("select relatedChars from related_dict where relatedChars like ?", "%" + character + "%");
    std::string all;
    for (const auto& row : rows) all += row[0];
    return all;
  };
  std::string fa = row_with("发");
  EXPECT_NE(fa.find("發"), std::string::npos);
  EXPECT_NE(fa.find("髮"), std::string::npos);
  std::string e = row_with("é");
  for (const char* form : {"e", "E", "É", "ê", "ｅ"}) EXPECT_NE(e.find(form), std::string::npos) << form;
  EXPECT_NE(row_with("👍🏿").find("👍🏻"), std::string::npos);
}

TEST_F(BuiltBundleTest, HanLanguageInfoMapsEveryHanField) {
  plist::Value info = Plist(Resource("HanLanguageInfo.plist"));
  const plist::Value* tags = info.Find("tags");
  const plist::Value* languages = info.Find("languages");
  ASSERT_TRUE(tags && tags->AsDictionary() && languages && languages->AsDictionary());
  for (size_t i = 1; i < 16; ++i) {
    const plist::Value* language = tags->Find(kFieldTags[i]);
    ASSERT_TRUE(language && language->AsString()) << kFieldTags[i];
    const plist::Value* back = languages->Find(*language->AsString());
    ASSERT_TRUE(back && back->AsArray()) << *language->AsString();
    EXPECT_NE(std::find(back->AsArray()->begin(), back->AsArray()->end(), plist::Value(kFieldTags[i])),
              back->AsArray()->end());
  }
  EXPECT_EQ(tags->Find("unam"), nullptr);
}

TEST_F(BuiltBundleTest, EveryCategoryParsesAndHasAnIcon) {
  plist::Value categories = Plist(Resource("Categories.plist"));
  const plist::Value* groups = categories.Find("VTAvailableCategories");
  ASSERT_TRUE(groups && groups->AsArray());
  bool has_symbols = false;
  size_t checked = 0;
  for (const plist::Value& group : *groups->AsArray()) {
    const plist::Value* name = group.Find("Group");
    const plist::Value* members = group.Find("Categories");
    ASSERT_TRUE(name && name->AsString() && members && members->AsArray());
    has_symbols = has_symbols || *name->AsString() == "CategoryGroup-Symbols";
    for (const plist::Value& member : *members->AsArray()) {
      ASSERT_TRUE(member.AsString());
      const std::string& category = *member.AsString();
      std::ifstream icon(Resource("CategoryImage-" + category + ".pdf"), std::ios::binary);
      std::string magic(4, '\0');
      icon.read(magic.data(), 4);
      EXPECT_EQ(magic, "%PDF") << category;
      ++checked;
      if (category == "Emoji") continue;
      plist::Value plist = Plist(Resource("Category-" + category + ".plist"));
      const plist::Value* data = plist.Find("VTCategoryData");
      ASSERT_TRUE(data && data->AsDictionary()) << category;
      const plist::Value* segments = data->Find("DataArray");
      ASSERT_TRUE(segments && segments->AsArray() && !segments->AsArray()->empty()) << category;
      for (const plist::Value& segment : *segments->AsArray()) {
        const plist::Value* text = segment.Find("Data");
        ASSERT_TRUE(text && text->AsString()) << category;
        std::optional<std::vector<std::u32string>> characters = ParseDataString(*text->AsString());
        ASSERT_TRUE(characters) << category;
        EXPECT_FALSE(characters->empty()) << category;
      }
    }
  }
  EXPECT_TRUE(has_symbols);
  EXPECT_GE(checked, 20u);
}

TEST_F(BuiltBundleTest, EmojiCategoryCoversEveryPlainEmoji) {
  plist::Value emoji = Plist(Resource("Category-Emoji.plist"));
  const plist::Value* entries = emoji.Find("EmojiDataArray");
  ASSERT_TRUE(entries && entries->AsArray() && !entries->AsArray()->empty());
  size_t total = 0;
  std::set<std::u32string> seen;
  for (const plist::Value& entry : *entries->AsArray()) {
    const plist::Value* title = entry.Find("VTDataTitle");
    const plist::Value* image = entry.Find("VTCategoryImage");
    const plist::Value* data = entry.Find("VTCategoryData");
    ASSERT_TRUE(title && title->AsString() && image && image->AsString() && data && data->Find("Data"));
    EXPECT_TRUE(fs::exists(framework_ / "Resources" / (*image->AsString() + ".pdf"))) << *image->AsString();
    auto characters = ParseDataString(*data->Find("Data")->AsString());
    ASSERT_TRUE(characters) << *title->AsString();
    total += characters->size();
    seen.insert(characters->begin(), characters->end());
  }
  EXPECT_EQ(seen.size(), total) << "an emoji is in two sub-categories";
  EXPECT_TRUE(seen.contains(U"\U0001F600"));
  EXPECT_TRUE(seen.contains(U"\u2764\uFE0F"));
  EXPECT_FALSE(seen.contains(U"\U0001F44D\U0001F3FD")) << "skin-tone forms are chosen in the panel";
}

TEST_F(BuiltBundleTest, StringsTablesInAtLeastFiftyLocalizations) {
  size_t localizations = 0;
  for (const fs::directory_entry& entry : fs::directory_iterator(resources_)) {
    if (entry.path().extension() != ".lproj") continue;
    plist::Value localizable = Plist(entry.path() / "Localizable.strings");
    plist::Value emoji = Plist(entry.path() / "Emoji_Category.strings");
    if (localizable.AsDictionary() && !localizable.AsDictionary()->empty() && emoji.AsDictionary() &&
        !emoji.AsDictionary()->empty()) {
      ++localizations;
    }
  }
  EXPECT_GE(localizations, 50u);
  plist::Value english = Plist(resources_ / "en.lproj" / "Localizable.strings");
  const plist::Value* arrows = english.Find("CategoryName-Arrows");
  ASSERT_TRUE(arrows && arrows->AsString());
  EXPECT_EQ(*arrows->AsString(), "Arrow");
  plist::Value german = Plist(resources_ / "de.lproj" / "Localizable.strings");
  ASSERT_TRUE(german.Find("CategoryName-Latin") && german.Find("CategoryName-Latin")->AsString());
  EXPECT_EQ(*german.Find("CategoryName-Latin")->AsString(), "Lateinisch");
}

TEST_F(BuiltBundleTest, BundlesIdentifyThemselvesAndCarryTheLicense) {
  plist::Value app_info = Plist(app_ / "Contents" / "Info.plist");
  plist::Value framework_info = Plist(framework_ / "Resources" / "Info.plist");
  ASSERT_TRUE(app_info.Find("CFBundleIdentifier") && framework_info.Find("CFBundleIdentifier"));
  EXPECT_EQ(*app_info.Find("CFBundleIdentifier")->AsString(), "com.vantorel.SorvendiIM");
  EXPECT_EQ(*framework_info.Find("CFBundleIdentifier")->AsString(), "com.vantorel.Lumeris");
  EXPECT_EQ(*app_info.Find("CFBundleDevelopmentRegion")->AsString(), "en");
  for (const fs::path& license : {resources_ / "UnicodeLicense.txt", framework_ / "Resources" / "UnicodeLicense.txt"}) {
    std::ifstream in(license);
    std::string text((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
    EXPECT_NE(text.find("Unicode, Inc."), std::string::npos) << license;
  }
}

}  // namespace
}  // namespace lumeris::resources
