// "read_categorydata" through the real service over the bundles the build wrote, in German: every
// category the "Categories" plist offers comes back with characters in the Data notation, its title
// from the German table (the name where the table has none) and an icon; "Emoji" with its eight
// sub-categories, titled from the German "Emoji_Category" table.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "bundle/bundle_fixture.h"
#include "categories/category_catalogue.h"
#include "categories/data_notation.h"
#include "categories/system_bundles.h"
#include "support/service_fixture.h"

namespace lumeris::testing {
namespace {

class CatalogueEndToEndTest : public ServiceTest {
 protected:
  // Set before SetUp() starts the service, which inherits it.
  CatalogueEndToEndTest() { SetUserLanguages(env_, std::nullopt, "de_DE.UTF-8"); }
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

TEST_F(CatalogueEndToEndTest, EveryOfferedCategoryAnswersWithDataTitleAndIcon) {
  const std::optional<Bundle> app = OpenApplicationBundle();
  ASSERT_TRUE(app);
  const auto table = [&](const char* name) {
    return ReadStringsTable(app->PathForResource(name, "strings", {}, "de").value_or("")).value_or(plist::Dictionary{});
  };
  const plist::Dictionary titles = table("Localizable"), emoji_titles = table("Emoji_Category");
  MessageValue names = MessageValue::MakeArray();
  for (const CategoryGroup& group : ReadAvailableCategories(*app, "de")) {
    for (const std::string& name : group.categories) names.Append(MessageValue::String(name));
  }
  ASSERT_GE(names.AsArray()->size(), 30u);
  const std::optional<MessageValue> reply = sendRequest(Command("read_categorydata", {{"categories", names}}), 10s);
  ASSERT_TRUE(reply && reply->Find("result") && reply->Find("result")->is_array());
  const MessageValue::Array& entries = *reply->Find("result")->AsArray();
  ASSERT_EQ(entries.size(), names.AsArray()->size());

  int titles_from_table = 0, emoji_entries = 0;
  for (std::size_t i = 0; i < entries.size(); ++i) {
    const std::string& name = *names.AsArray()->at(i).AsString();
    SCOPED_TRACE(name);
    const auto title = titles.find("CategoryName-" + name);
    titles_from_table += title != titles.end();
    EXPECT_EQ(*entries[i].GetString("TitleText"), title != titles.end() ? *title->second.AsString() : name);
    EXPECT_TRUE(IsPdf(entries[i].GetData("TitleImage")));
    if (name != "Emoji") {
      EXPECT_TRUE(HasCharacters(entries[i].GetString("Data")));
      continue;
    }
    ++emoji_entries;
    const MessageValue::Array* subcategories = entries[i].Find("Data")->AsArray();
    ASSERT_TRUE(subcategories && subcategories->size() == 8u);
    for (const MessageValue& sub : *subcategories) {
      const std::string& sub_title = *sub.GetString("TitleText");
      EXPECT_TRUE(std::any_of(emoji_titles.begin(), emoji_titles.end(),
                              [&](const auto& pair) { return *pair.second.AsString() == sub_title; }))
          << sub_title;
      EXPECT_TRUE(IsPdf(sub.GetData("TitleImage"))) << sub_title;
      EXPECT_TRUE(HasCharacters(sub.GetString("Data"), "<emoji>")) << sub_title;
    }
  }
  EXPECT_EQ(emoji_entries, 1);
  EXPECT_GT(titles_from_table, static_cast<int>(entries.size()) / 2);
}

}  // namespace
}  // namespace lumeris::testing
