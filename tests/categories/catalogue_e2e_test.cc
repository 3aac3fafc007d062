// "read_categorydata" through the real service over the bundles the build wrote, in English and
// in German: every category the "Categories" plist offers comes back with characters in the Data
// notation and an icon, and "Emoji" with its eight sub-categories.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "categories/category_catalogue.h"
#include "categories/data_notation.h"
#include "categories/system_bundles.h"
#include "platform/bundle.h"
#include "platform/property_list_io.h"
#include "support/service_fixture.h"

namespace lumeris::testing {
namespace {

struct Locale {
  const char* lang;          // LANG of the service
  const char* localization;  // the .lproj folder it must choose
  friend void PrintTo(const Locale& locale, std::ostream* os) { *os << locale.lang; }
};

class CatalogueEndToEndTest : public ServiceTest, public ::testing::WithParamInterface<Locale> {
 protected:
  // Set before SetUp() starts the service, which inherits it.
  CatalogueEndToEndTest() {
    for (const char* name : {"LANGUAGE", "LC_ALL", "LC_MESSAGES"}) env_.Set(name, std::nullopt);
    env_.Set("LANG", GetParam().lang);
  }
  ScopedEnv env_;
};

bool IsPdf(const MessageValue::Bytes* bytes) {
  return bytes != nullptr && bytes->size() > 4 && std::string(bytes->begin(), bytes->begin() + 4) == "%PDF";
}

// The Data string denotes at least one character.
bool HasCharacters(const std::string* data, std::string_view prefix = {}) {
  if (data == nullptr || data->substr(0, prefix.size()) != prefix) return false;
  const auto characters = ParseDataString(std::string_view(*data).substr(prefix.size()));
  return characters && !characters->empty();
}

TEST_P(CatalogueEndToEndTest, EveryOfferedCategoryAnswersWithDataAndIcon) {
  const std::optional<Bundle> app = OpenApplicationBundle();
  ASSERT_TRUE(app);
  const auto table = [&](const char* name) {
    auto path = app->PathForResource(name, "strings", {}, GetParam().localization);
    return path ? ReadStringsTable(*path).value_or(plist::Dictionary{}) : plist::Dictionary{};
  };
  const plist::Dictionary titles = table("Localizable");
  const plist::Dictionary emoji_titles = table("Emoji_Category");
  ASSERT_FALSE(titles.empty()) << GetParam().localization;
  ASSERT_FALSE(emoji_titles.empty()) << GetParam().localization;
  // The "VTDataTitle" keys of the emoji sub-categories, in order.
  std::vector<std::string> emoji_keys;
  const auto emoji_plist = plist::ReadPropertyListFile(*app->PathForResource("Category-Emoji", "plist"));
  ASSERT_TRUE(emoji_plist);
  for (const plist::Value& sub : *emoji_plist->Find("EmojiDataArray")->AsArray()) {
    emoji_keys.push_back(*sub.Find("VTDataTitle")->AsString());
  }
  ASSERT_EQ(emoji_keys.size(), 8u);
  const auto translated = [](const plist::Dictionary& table, const std::string& key, const std::string& fallback) {
    const auto found = table.find(key);
    return found != table.end() && found->second.AsString() ? *found->second.AsString() : fallback;
  };

  std::vector<std::string> names;
  for (const CategoryGroup& group : ReadAvailableCategories(*app, GetParam().localization)) {
    names.insert(names.end(), group.categories.begin(), group.categories.end());
  }
  ASSERT_GE(names.size(), 30u);
  ASSERT_NE(std::find(names.begin(), names.end(), "Emoji"), names.end());

  MessageValue array = MessageValue::MakeArray();
  for (const std::string& name : names) array.Append(MessageValue::String(name));
  const std::optional<MessageValue> reply =
      sendRequest(Command("read_categorydata", {{"categories", array}}), std::chrono::seconds(10));
  ASSERT_TRUE(reply);
  const MessageValue* result = reply->Find("result");
  ASSERT_TRUE(result && result->is_array());
  ASSERT_EQ(result->AsArray()->size(), names.size());

  int titles_translated = 0;
  for (std::size_t i = 0; i < names.size(); ++i) {
    SCOPED_TRACE(names[i]);
    const MessageValue& entry = result->AsArray()->at(i);
    // The title is the localization's own, or the name where the table has none.
    const std::string title = translated(titles, "CategoryName-" + names[i], names[i]);
    EXPECT_EQ(*entry.GetString("TitleText"), title);
    titles_translated += titles.count("CategoryName-" + names[i]) > 0;
    EXPECT_TRUE(IsPdf(entry.GetData("TitleImage")));
    if (names[i] != "Emoji") {
      EXPECT_TRUE(HasCharacters(entry.GetString("Data")));
      continue;
    }
    const MessageValue::Array* subcategories = entry.Find("Data")->AsArray();
    ASSERT_TRUE(subcategories);
    ASSERT_EQ(subcategories->size(), 8u);
    for (std::size_t k = 0; k < subcategories->size(); ++k) {
      const MessageValue& sub = subcategories->at(k);
      SCOPED_TRACE(emoji_keys[k]);
      EXPECT_EQ(*sub.GetString("TitleText"), translated(emoji_titles, emoji_keys[k], emoji_keys[k]));
      EXPECT_TRUE(IsPdf(sub.GetData("TitleImage")));
      EXPECT_TRUE(HasCharacters(sub.GetString("Data"), "<emoji>"));
    }
  }
  // Most titles come from the table (CLDR lacks a few labels in some languages).
  EXPECT_GT(titles_translated, static_cast<int>(names.size()) / 2);
}

INSTANTIATE_TEST_SUITE_P(Locales, CatalogueEndToEndTest,
                         ::testing::Values(Locale{"en_US.UTF-8", "en"}, Locale{"de_DE.UTF-8", "de"}),
                         [](const auto& info) { return std::string(info.param.localization); });

}  // namespace
}  // namespace lumeris::testing
