// The indexed rules against the reference rules on the real bundle: generated search texts and
// every related character, with the limits that matter, outside and inside China. Both databases
// must reply element for element the same.
//
// The suite runs a seeded subset (6 texts, each with the five limits in both countries, and 120
// related characters); LUMERIS_DIFFERENTIAL_SCALE=N runs 40 * N search texts and every character
// of RelatedCharDB with every limit.
#include <gtest/gtest.h>
#include <sqlite3.h>
#include <stdlib.h>

#include <algorithm>
#include <cstdint>
#include <random>
#include <string>
#include <vector>

#include "categories/regional_restriction.h"
#include "categories/system_bundles.h"
#include "database/character_database.h"
#include "support/scoped_env.h"
#include "text/utf8.h"

namespace lumeris {
namespace {

constexpr std::uint64_t kLimits[] = {0, 1, 5, 100, std::uint64_t{1} << 63};

std::optional<std::filesystem::path> BundleResource(std::string_view name, std::string_view type) {
  std::optional<Bundle> bundle = OpenApplicationBundle();
  return bundle ? bundle->PathForResource(name, type) : std::nullopt;
}

std::vector<std::string> Column(const char* resource, const char* sql) {
  std::vector<std::string> values;
  sqlite3* db = nullptr;
  const std::optional<std::filesystem::path> path = BundleResource(resource, "sqlite3");
  if (!path || sqlite3_open_v2(path->c_str(), &db, SQLITE_OPEN_READONLY, nullptr) != SQLITE_OK) {
    sqlite3_close(db);
    return values;
  }
  sqlite3_stmt* statement = nullptr;
  sqlite3_prepare_v2(db, sql, -1, &statement, nullptr);
  while (sqlite3_step(statement) == SQLITE_ROW)
    values.emplace_back(reinterpret_cast<const char*>(sqlite3_column_text(statement, 0)));
  sqlite3_finalize(statement);
  sqlite3_close(db);
  return values;
}

std::string Describe(const MessageValue& value) { return value.Describe(); }

class DifferentialTest : public ::testing::Test {
 protected:
  DifferentialTest()
      : indexed_(&BundleResource, FontQueries::Installed(), LMCharacterDatabase::Rules::kIndexed),
        reference_(&BundleResource, FontQueries::Installed(),
                   LMCharacterDatabase::Rules::kReference) {
    const char* scale = getenv("LUMERIS_DIFFERENTIAL_SCALE");
    scale_ = scale != nullptr ? std::max(1, atoi(scale)) : 0;
  }

  // Runs `check` outside China, then inside (the locale decides the country).
  template <typename Check>
  void InBothCountries(Check&& check) {
    for (const char* locale : {"en_US.UTF-8", "zh_CN.UTF-8"}) {
      environment_.env().Set("LC_ALL", locale);
      UpdateCountryInfoAndCheckSignificantChange();
      SCOPED_TRACE(locale);
      check();
    }
  }

  testing::IsolatedUserEnvironment environment_;
  LMCharacterDatabase indexed_;
  LMCharacterDatabase reference_;
  int scale_ = 0;  // 0: the suite's subset
  std::mt19937_64 random_{20261123};
};

// Search texts of every kind a picker sends: parts of real names and keywords in random case,
// one and two letters, LIKE wildcards, quotes, other scripts, emoji, nothing, and misses.
std::vector<std::string> SearchTexts(std::mt19937_64& random, std::size_t count) {
  const std::vector<std::string> names =
      Column("CharacterDB", "select substr(info, 1, instr(info, '|') - 1) from unihan_dict");
  const std::vector<std::string> emoji =
      Column("CharacterDB", "select uchr from unihan_dict limit 4000");
  const std::vector<std::string> fixed = {
      "",   "%",  "_",  "%%", "a%b", "c_t", "'", "\"", "it's", "a'b", "é",     "É",
      "ß",  "SS", "ſ",  "K",  "İ",   "中",  "ё", "Ω",  "ω",    "ǅ",   "zqxjv", "qqqqqqq",
      "🇹🇼", "|",  "a|", " ",  "-",   "1",   "ä", "Ä",  "ﬀ",    "st"};
  std::vector<std::string> texts;
  auto pick = [&](std::size_t n) {
    return std::uniform_int_distribution<std::size_t>(0, n - 1)(random);
  };
  while (texts.size() < count) {
    const icu::UnicodeString name = DecodeUtf8Lenient(names[pick(names.size())]);
    icu::UnicodeString text;
    switch (pick(7)) {
      case 0: {  // a part of a name, in random case
        const int32_t start =
            static_cast<int32_t>(pick(static_cast<std::size_t>(name.length()) + 1));
        text = name.tempSubString(start, static_cast<int32_t>(1 + pick(12)));
        for (int32_t i = 0; i < text.length(); ++i) {
          icu::UnicodeString unit = text.tempSubString(i, 1);
          text.replace(i, 1, pick(2) ? unit.toUpper() : unit.toLower());
        }
        break;
      }
      case 1: {  // a whole keyword
        const std::string utf8 = EncodeUtf8Lenient(name);
        const std::size_t from = utf8.find("; ");
        text = DecodeUtf8Lenient(from == std::string::npos ? utf8 : utf8.substr(from + 2));
        text = text.tempSubString(0, text.indexOf(u';'));
        break;
      }
      case 2:  // one letter
        text = name.tempSubString(
            static_cast<int32_t>(pick(static_cast<std::size_t>(name.length()) + 1)), 1);
        break;
      case 3:  // two letters
        text = name.tempSubString(
            static_cast<int32_t>(pick(static_cast<std::size_t>(name.length()) + 1)), 2);
        break;
      case 4:
        texts.push_back(emoji[pick(emoji.size())]);
        continue;
      default:
        texts.push_back(fixed[pick(fixed.size())]);
        continue;
    }
    texts.push_back(EncodeUtf8Lenient(text));
  }
  return texts;
}

TEST_F(DifferentialTest, SearchRepliesEqualTheReference) {
  const std::vector<std::string> texts =
      SearchTexts(random_, scale_ > 0 ? 40 * static_cast<std::size_t>(scale_) : 6);
  ASSERT_FALSE(texts.empty());
  InBothCountries([&] {
    std::size_t differences = 0;
    for (const std::string& text : texts) {
      const icu::UnicodeString request = DecodeUtf8Lenient(text);
      for (std::uint64_t limit : kLimits) {
        // The subset leaves out the reference's slowest case: a text of one or two bytes, whose
        // every emoji row it must test, without limit.
        if (scale_ == 0 && text.size() < 3 && limit >= kLimits[4]) continue;
        const auto max_count = static_cast<std::int64_t>(limit);
        const MessageValue expected = reference_.createXPCArrayForSearchString(request, max_count);
        const MessageValue actual = indexed_.createXPCArrayForSearchString(request, max_count);
        if (actual != expected && ++differences <= 5) {
          ADD_FAILURE() << "\"" << text << "\" limit " << limit
                        << "\n indexed:   " << Describe(actual)
                        << "\n reference: " << Describe(expected);
        }
      }
    }
    EXPECT_EQ(differences, 0u) << "of " << texts.size() * std::size(kLimits) << " searches";
  });
}

TEST_F(DifferentialTest, RelatedCharactersEqualTheReference) {
  std::vector<std::string> characters = {"",   "%",    "_",        "!",     "a%",
                                         "zz", "中国", "👍🏽", "❤️"};
  for (const std::string& row : Column("RelatedCharDB", "select relatedChars from related_dict")) {
    const icu::UnicodeString text = DecodeUtf8Lenient(row);
    for (int32_t i = 0; i < text.length(); i = text.moveIndex32(i, 1))
      characters.push_back(EncodeUtf8Lenient(text.tempSubString(i, text.moveIndex32(i, 1) - i)));
  }
  if (scale_ == 0) {
    std::shuffle(characters.begin() + 9, characters.end(), random_);
    characters.resize(std::min<std::size_t>(characters.size(), 120));
  }
  std::size_t differences = 0;
  for (std::size_t i = 0; i < characters.size(); ++i) {
    const icu::UnicodeString request = DecodeUtf8Lenient(characters[i]);
    for (std::uint64_t limit : kLimits) {
      if (scale_ == 0 && limit != kLimits[i % std::size(kLimits)]) continue;
      const auto max_count = static_cast<std::int64_t>(limit);
      const MessageValue expected =
          reference_.createXPCArrayForRelatedCharacters(request, max_count);
      const MessageValue actual = indexed_.createXPCArrayForRelatedCharacters(request, max_count);
      if (actual != expected && ++differences <= 5) {
        ADD_FAILURE() << "\"" << characters[i] << "\" limit " << limit
                      << "\n indexed:   " << Describe(actual)
                      << "\n reference: " << Describe(expected);
      }
    }
  }
  EXPECT_EQ(differences, 0u) << "of " << characters.size() << " characters";
}

}  // namespace
}  // namespace lumeris
