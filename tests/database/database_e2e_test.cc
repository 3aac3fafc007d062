// The three character requests through the socket, on the bundle the build wrote: one table of
// requests and replies, then a country change that takes effect at the next search.
#include <gtest/gtest.h>

#include <fstream>
#include <string>
#include <vector>

#include "platform/preferences_paths.h"
#include "platform/property_list_io.h"
#include "support/service_fixture.h"

namespace lumeris::testing {
namespace {

using Strings = std::vector<std::string>;

class DatabaseE2ETest : public ServiceTest {
 protected:
  // The locale decides the country unless the preference says "CN"; start outside China.
  DatabaseE2ETest() { environment_.env().Set("LC_ALL", "en_US.UTF-8"); }

  // The reply's result: an array as its strings, a record as "tag=value" items.
  Strings Ask(const char* command, const std::string& text, std::uint64_t limit) {
    const std::optional<MessageValue> reply =
        sendRequest(Command(command, {{"string", MessageValue::String(text)}, {"limit", MessageValue::Uint64(limit)},
                                      {"transactionID", MessageValue::Uint64(77)}}),
                    10s);
    if (!reply || !reply->Find("result")) return {"no reply"};
    EXPECT_EQ(reply->GetUint64("transactionID"), 77u);
    const MessageValue& result = *reply->Find("result");
    Strings items;
    if (result.is_array()) {
      for (const MessageValue& element : *result.AsArray()) items.push_back(*element.AsString());
    } else if (result.is_dictionary()) {
      for (const auto& [tag, value] : *result.AsDictionary()) items.push_back(tag + "=" + *value.AsString());
    }
    return items;
  }
  void SetCountryPreference(const std::string& country) {
    const std::filesystem::path path =
        *PreferencesFilePath(".GlobalPreferences", kCFPreferencesAnyUser, kCFPreferencesCurrentHost);
    std::filesystem::create_directories(path.parent_path());
    std::ofstream(path.string() + ".new") << plist::SerializeXmlPropertyList(plist::Dictionary{{"Country", country}});
    std::filesystem::rename(path.string() + ".new", path);
  }
};

TEST_F(DatabaseE2ETest, EachRequestIsAnsweredFromTheBundlesDatabases) {
  const struct { const char *command, *text; std::uint64_t limit; Strings expected; } kCases[] = {
      // Emoji-font characters first, the named emoji before those that mention the word.
      {"search_matched_chars", "heart", 4, {"❤️", "💕", "🩷", "💙"}},
      {"search_matched_chars", "HEAVY BLACK HEART", 5, {"❤️", "❤", "❥"}},
      {"search_matched_chars", "flag: Taiwan", 10, {"🇹🇼"}},
      {"search_related_chars", "a", 3, {"A", "ª", "À"}},
      {"search_character_info", "中", 0,
       {"cbai=zung1", "jyom=CHUU; NAKA UCHI ATARU", "krpi=중; CWUNG", "rsu1=2.3", "rsu2=", "rsu3=", "rsu4=",
        "sbix=4", "spin=zhōng", "swbh=", "swbx=", "tcan=L", "tday=", "tpin=zhōng", "tzhu=ㄓㄨㄥ",
        "unam=CJK UNIFIED IDEOGRAPH-4E2D; central; center, middle; in the midst of; hit (target); attain"}},
      {"search_character_info", "no such character", 0, {}},
  };
  for (const auto& c : kCases) EXPECT_EQ(Ask(c.command, c.text, c.limit), c.expected) << c.command << " " << c.text;
  const Strings thumbs = Ask("search_character_info", "👍🏽", 0);  // the record of its toneless key
  EXPECT_TRUE(thumbs.size() == 16u && thumbs.back() == "unam=THUMBS UP SIGN; thumbs up; +1; hand; thumb; up");

  SetCountryPreference("CN");
  EXPECT_EQ(Ask("search_matched_chars", "flag: Taiwan", 10), Strings{});
  SetCountryPreference("US");
  EXPECT_EQ(Ask("search_matched_chars", "flag: Taiwan", 10), Strings{"🇹🇼"});
}

}  // namespace
}  // namespace lumeris::testing
