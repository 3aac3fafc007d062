// The three character requests through the socket, on the bundle the build wrote.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <fstream>
#include <string>
#include <vector>

#include "platform/preferences_paths.h"
#include "platform/property_list_io.h"
#include "support/service_fixture.h"

namespace lumeris::testing {
namespace {

using ::testing::Contains;
using ::testing::Not;

class DatabaseE2ETest : public ServiceTest {
 protected:
  // The locale decides the country unless the preference says "CN"; start outside China.
  DatabaseE2ETest() { environment_.env().Set("LC_ALL", "en_US.UTF-8"); }

  MessageValue Ask(const char* command, const std::string& text, std::uint64_t limit = 0) {
    MessageValue request = Command(command, {{"string", MessageValue::String(text)},
                                             {"limit", MessageValue::Uint64(limit)},
                                             {"transactionID", MessageValue::Uint64(77)}});
    // A search of a short word walks most of the database: allow a loaded machine its time.
    std::optional<MessageValue> reply = sendRequest(request, 20s);
    EXPECT_TRUE(reply) << command << " " << text;
    if (!reply) return MessageValue();
    EXPECT_EQ(reply->GetUint64("transactionID"), 77u);
    const MessageValue* result = reply->Find("result");
    return result ? *result : MessageValue();
  }
  std::vector<std::string> Characters(const char* command, const std::string& text,
                                      std::uint64_t limit) {
    std::vector<std::string> characters;
    MessageValue result = Ask(command, text, limit);
    EXPECT_TRUE(result.is_array()) << result;
    if (!result.is_array()) return characters;
    for (const MessageValue& element : *result.AsArray()) characters.push_back(*element.AsString());
    return characters;
  }
  void SetCountryPreference(const std::string& country) {
    const std::filesystem::path path = *PreferencesFilePath(
        ".GlobalPreferences", kCFPreferencesAnyUser, kCFPreferencesCurrentHost);
    std::filesystem::create_directories(path.parent_path());
    std::ofstream(path.string() + ".new")
        << plist::SerializeXmlPropertyList(plist::Dictionary{{"Country", country}});
    std::filesystem::rename(path.string() + ".new", path);
  }
};

std::ptrdiff_t IndexOf(const std::vector<std::string>& list, const std::string& item) {
  return std::find(list.begin(), list.end(), item) - list.begin();
}

TEST_F(DatabaseE2ETest, HeartFindsTheRedHeartFirstAndEmojiBeforeOtherCharacters) {
  const std::vector<std::string> found = Characters("search_matched_chars", "heart", 1000);
  // The emoji come in the database's order, where red heart follows the faces and other hearts.
  EXPECT_LT(IndexOf(found, "❤\uFE0F"), 20);
  // U+2665 comes after U+2661 in the database, but the emoji font draws only U+2665.
  ASSERT_THAT(found, Contains("♥"));
  ASSERT_THAT(found, Contains("♡"));
  EXPECT_LT(IndexOf(found, "♥"), IndexOf(found, "♡"));
  EXPECT_EQ(Characters("search_matched_chars", "heart", 3).size(), 3u);
}

TEST_F(DatabaseE2ETest, InformationAndRelatedCharacters) {
  MessageValue record = Ask("search_character_info", "中");
  ASSERT_TRUE(record.is_dictionary()) << record;
  EXPECT_EQ(record.AsDictionary()->size(), 16u);
  EXPECT_EQ(*record.GetString("spin"), "zhōng");
  EXPECT_EQ(*record.GetString("cbai"), "zung1");
  EXPECT_EQ(*record.GetString("jyom"), "CHUU; NAKA UCHI ATARU");
  EXPECT_EQ(*record.GetString("tzhu"), "ㄓㄨㄥ");
  EXPECT_TRUE(Ask("search_character_info", "no such character").AsDictionary()->empty());

  const std::vector<std::string> related = Characters("search_related_chars", "a", 100);
  EXPECT_THAT(related, Contains("A"));
  EXPECT_THAT(related, Contains("á"));
  EXPECT_THAT(related, Not(Contains("a")));
}

TEST_F(DatabaseE2ETest, ACountryChangeTakesEffectAtTheNextSearch) {
  const std::string taiwan = "🇹🇼";
  EXPECT_THAT(Characters("search_matched_chars", "flag: Taiwan", 10), Contains(taiwan));
  SetCountryPreference("CN");
  EXPECT_THAT(Characters("search_matched_chars", "flag: Taiwan", 10), Not(Contains(taiwan)));
  SetCountryPreference("US");
  EXPECT_THAT(Characters("search_matched_chars", "flag: Taiwan", 10), Contains(taiwan));
}

}  // namespace
}  // namespace lumeris::testing
