// The indexed rules against the reference rules on the real bundle: generated search texts and
// every related character, with the limits that matter, outside and inside China. Both databases
// must reply element for element the same.
//
// Information records have one implementation; the third test compares the service's records,
// through dispatch and the wire, with the reference read in this process, for a sample of
// characters with and without skin tones and for misses (the suite asks for 300, a full run 5,000).
//
// The suite runs a seeded subset: 60 search requests whose text has three bytes or more and no
// wildcard (each text with one of the limits, half of them in each country), and 120 related
// characters. LUMERIS_DIFFERENTIAL_REQUESTS=N runs N search
// requests and every character of RelatedCharDB with every limit in both countries;
// LUMERIS_DIFFERENTIAL_SHARD=K/M then runs only the requests whose index is K modulo M, so that a
// long run can use every core (the M runs together cover the same requests as one).
#include <gtest/gtest.h>
#include <sqlite3.h>
#include <unicode/uchar.h>
#include <stdio.h>
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
#include "support/service_fixture.h"
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
    const char* requests = getenv("LUMERIS_DIFFERENTIAL_REQUESTS");
    full_ = requests != nullptr && atoi(requests) > 0;
    requests_ = full_ ? static_cast<std::size_t>(atoi(requests)) : 60;
    if (const char* shard = getenv("LUMERIS_DIFFERENTIAL_SHARD")) {
      if (sscanf(shard, "%zu/%zu", &shard_, &shards_) != 2 || shards_ == 0 || shard_ >= shards_)
        shard_ = 0, shards_ = 1;
    }
  }

  bool InShard(std::size_t index) const { return index % shards_ == shard_; }

  // Sets the country through the locale, as a user does.
  void SetCountry(const char* locale) {
    environment_.env().Set("LC_ALL", locale);
    UpdateCountryInfoAndCheckSignificantChange();
  }

  testing::IsolatedUserEnvironment environment_;
  LMCharacterDatabase indexed_;
  LMCharacterDatabase reference_;
  bool full_ = false;
  std::size_t requests_ = 0;
  std::size_t shard_ = 0;
  std::size_t shards_ = 1;
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
  std::vector<std::string> texts = SearchTexts(random_, full_ ? requests_ : 8 * requests_);
  // The suite leaves out the texts that the reference takes longest over: those of one or two
  // bytes, and wildcards, which match most rows (the reference folds the whole record of each).
  if (!full_) {
    std::erase_if(texts, [](const std::string& text) {
      return text.size() < 3 || text.find_first_of("%_") != std::string::npos;
    });
    texts.resize(std::min(texts.size(), requests_));
  }
  ASSERT_EQ(texts.size(), requests_);
  std::size_t differences = 0;
  std::size_t compared = 0;
  const char* country = nullptr;
  for (std::size_t i = 0; i < texts.size(); ++i) {
    if (!InShard(i)) continue;
    const char* wanted = i < texts.size() / 2 ? "en_US.UTF-8" : "zh_CN.UTF-8";
    if (wanted != country) SetCountry(country = wanted);
    ++compared;
    const std::uint64_t limit = kLimits[i % std::size(kLimits)];
    const icu::UnicodeString request = DecodeUtf8Lenient(texts[i]);
    const auto max_count = static_cast<std::int64_t>(limit);
    const MessageValue expected = reference_.createXPCArrayForSearchString(request, max_count);
    const MessageValue actual = indexed_.createXPCArrayForSearchString(request, max_count);
    if (actual != expected && ++differences <= 5) {
      ADD_FAILURE() << "\"" << texts[i] << "\" limit " << limit << (i < texts.size() / 2 ? " US" : " CN")
                    << "\n indexed:   " << Describe(actual) << "\n reference: " << Describe(expected);
    }
  }
  EXPECT_EQ(differences, 0u) << "of " << compared << " searches";
  printf("%zu searches compared, %zu differences\n", compared, differences);
}

TEST_F(DifferentialTest, RelatedCharactersEqualTheReference) {
  std::vector<std::string> characters = {"",   "%",    "_",        "!",     "a%",
                                         "zz", "中国", "👍🏽", "❤️"};
  for (const std::string& row : Column("RelatedCharDB", "select relatedChars from related_dict")) {
    const icu::UnicodeString text = DecodeUtf8Lenient(row);
    for (int32_t i = 0; i < text.length(); i = text.moveIndex32(i, 1))
      characters.push_back(EncodeUtf8Lenient(text.tempSubString(i, text.moveIndex32(i, 1) - i)));
  }
  if (!full_) {
    std::shuffle(characters.begin() + 9, characters.end(), random_);
    characters.resize(std::min<std::size_t>(characters.size(), 120));
  }
  std::size_t differences = 0;
  std::size_t requests = 0;
  for (const char* locale : {"en_US.UTF-8", "zh_CN.UTF-8"}) {
    SetCountry(locale);
    for (std::size_t i = 0; i < characters.size(); ++i) {
      if (!InShard(i)) continue;
      const icu::UnicodeString request = DecodeUtf8Lenient(characters[i]);
      for (std::uint64_t limit : kLimits) {
        if (!full_ && limit != kLimits[i % std::size(kLimits)]) continue;
        const auto max_count = static_cast<std::int64_t>(limit);
        const MessageValue expected = reference_.createXPCArrayForRelatedCharacters(request, max_count);
        const MessageValue actual = indexed_.createXPCArrayForRelatedCharacters(request, max_count);
        ++requests;
        if (actual != expected && ++differences <= 5) {
          ADD_FAILURE() << "\"" << characters[i] << "\" limit " << limit << " " << locale
                        << "\n indexed:   " << Describe(actual) << "\n reference: " << Describe(expected);
        }
      }
    }
  }
  EXPECT_EQ(differences, 0u) << "of " << requests << " requests";
  printf("%zu related-character requests compared, %zu differences\n", requests, differences);
}

using namespace std::chrono_literals;

class InformationDifferentialTest : public testing::ServiceTest {};

TEST_F(InformationDifferentialTest, ServiceRecordsEqualTheReference) {
  const char* requests = getenv("LUMERIS_DIFFERENTIAL_REQUESTS");
  const std::size_t count = requests != nullptr && atoi(requests) > 0 ? 5000 : 300;
  std::mt19937_64 random{20261123};
  std::vector<std::string> characters = Column("CharacterDB", "select uchr from unihan_dict");
  ASSERT_GT(characters.size(), count);
  std::shuffle(characters.begin(), characters.end(), random);
  characters.resize(count);
  // Every emoji that takes a skin tone, in the sample or not, with one of the five tones; and misses.
  for (const std::string& row : Column("CharacterDB", "select uchr from unihan_dict")) {
    const icu::UnicodeString text = DecodeUtf8Lenient(row);
    if (text.countChar32() <= 2 && u_hasBinaryProperty(text.char32At(0), UCHAR_EMOJI_MODIFIER_BASE)) {
      const icu::UnicodeString toned =
          icu::UnicodeString(text.char32At(0)).append(static_cast<UChar32>(0x1F3FB + characters.size() % 5));
      characters.push_back(EncodeUtf8Lenient(toned));
    }
  }
  for (const char* miss : {"", "ab", "\xF0\x9F\x91\x8D\xF0\x9F\x8F\xBB\xF0\x9F\x8F\xBB", "%", "'"})
    characters.emplace_back(miss);

  LMCharacterDatabase reference(&BundleResource, FontQueries::Installed(),
                                LMCharacterDatabase::Rules::kReference);
  testing::RawConnection connection = Connect();
  std::size_t differences = 0, records = 0;
  for (const std::string& character : characters) {
    const MessageValue expected = reference.createXPCDictionaryForCharacterInfo(DecodeUtf8Lenient(character));
    const std::optional<MessageValue> reply = connection.ReadReply(
        connection.SendMessage(testing::Command(
            "search_character_info",
            {{"string", MessageValue::String(character)}, {"transactionID", MessageValue::Uint64(1)}})),
        10s);
    const MessageValue* actual = reply ? reply->Find("result") : nullptr;
    records += !expected.AsDictionary()->empty();
    if ((actual == nullptr || *actual != expected) && ++differences <= 5) {
      ADD_FAILURE() << "\"" << character << "\"\n service:   " << (actual ? Describe(*actual) : "no reply")
                    << "\n reference: " << Describe(expected);
    }
  }
  EXPECT_GT(records, count / 2);
  EXPECT_EQ(differences, 0u) << "of " << characters.size() << " characters";
  printf("%zu information requests compared (%zu records), %zu differences\n", characters.size(), records,
         differences);
}

}  // namespace
}  // namespace lumeris
