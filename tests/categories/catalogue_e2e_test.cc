// "read_categorydata" through the real service over the bundles the build wrote, in English and
// in German: every category the "Categories" plist offers comes back with characters in the Data
// notation, its title from the chosen localization's table and an icon; "Emoji" with its eight
// sub-categories.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "categories/category_catalogue.h"
#include "categories/data_notation.h"
#include "categories/system_bundles.h"
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
  return bytes != nullptr && std::string(bytes->begin(), bytes->end()).starts_with("%PDF");
}

// The Data string, after `prefix`, denotes at least one character.
bool HasCharacters(const std::string* data, std::string_view prefix = {}) {
  const auto characters = data && data->starts_with(prefix) ? ParseDataString(data->substr(prefix.size())) : std::nullopt;
  return characters && !characters->empty();
}

TEST_P(CatalogueEndToEndTest, EveryOfferedCategoryAnswersWithDataTitleAndIcon) {
  const std::optional<Bundle> app = OpenApplicationBundle();
  ASSERT_TRUE(app);
  const auto table = [&](const char* name) {
    auto path = app->PathForResource(name, "strings", {}, GetParam().localization);
    return path ? ReadStringsTable(*path).value_or(plist::Dictionary{}) : plist::Dictionary{};
  };
  const plist::Dictionary titles = table("Localizable");
  const plist::Dictionary emoji_titles = table("Emoji_Category");
  std::vector<std::string> names;
  for (const CategoryGroup& group : ReadAvailableCategories(*app, GetParam().localization)) {
    names.insert(names.end(), group.categories.begin(), group.categories.end());
  }
  ASSERT_GE(names.size(), 30u);

  MessageValue array = MessageValue::MakeArray();
  for (const std::string& name : names) array.Append(MessageValue::String(name));
  const std::optional<MessageValue> reply = sendRequest(Command("read_categorydata", {{"categories", array}}), 10s);
  ASSERT_TRUE(reply && reply->Find("result") && reply->Find("result")->is_array());
  const MessageValue::Array& entries = *reply->Find("result")->AsArray();
  ASSERT_EQ(entries.size(), names.size());

  int titles_from_table = 0, emoji_entries = 0;
  for (std::size_t i = 0; i < names.size(); ++i) {
    SCOPED_TRACE(names[i]);
    const MessageValue& entry = entries[i];
    const auto title = titles.find("CategoryName-" + names[i]);
    titles_from_table += title != titles.end();
    EXPECT_EQ(*entry.GetString("TitleText"), title != titles.end() ? *title->second.AsString() : names[i]);
    EXPECT_TRUE(IsPdf(entry.GetData("TitleImage")));
    if (names[i] != "Emoji") {
      EXPECT_TRUE(HasCharacters(entry.GetString("Data")));
      continue;
    }
    ++emoji_entries;
    const MessageValue::Array* subcategories = entry.Find("Data")->AsArray();
    ASSERT_TRUE(subcategories && subcategories->size() == 8u);
    for (const MessageValue& sub : *subcategories) {
      const std::string& sub_title = *sub.GetString("TitleText");
      // Each title is a translation from the localization's "Emoji_Category" table.
      EXPECT_TRUE(std::any_of(emoji_titles.begin(), emoji_titles.end(),
                              [&](const auto& pair) { return *pair.second.AsString() == sub_title; }))
          << sub_title;
      EXPECT_TRUE(IsPdf(sub.GetData("TitleImage"))) << sub_title;
      EXPECT_TRUE(HasCharacters(sub.GetString("Data"), "<emoji>")) << sub_title;
    }
  }
  EXPECT_EQ(emoji_entries, 1);
  EXPECT_GT(titles_from_table, static_cast<int>(names.size()) / 2);
}

INSTANTIATE_TEST_SUITE_P(Locales, CatalogueEndToEndTest,
                         ::testing::Values(Locale{"en_US.UTF-8", "en"}, Locale{"de_DE.UTF-8", "de"}),
                         [](const auto& info) { return std::string(info.param.localization); });

}  // namespace
}  // namespace lumeris::testing
