#include "resource_builder/category_plists.h"

#include <algorithm>

#include "categories/data_notation.h"

namespace lumeris::resources {

plist::Value CategoriesPlist(const std::vector<CategoryDefinition>& categories) {
  plist::Array groups;
  std::vector<std::string> group_names;
  for (const CategoryDefinition& category : categories) {
    auto it = std::find(group_names.begin(), group_names.end(), category.group);
    if (it == group_names.end()) {
      group_names.push_back(category.group);
      plist::Array names;
      if (category.group == "CategoryGroup-Symbols") names.push_back(std::string(kEmojiCategoryName));
      groups.push_back(plist::Dictionary{{"Group", category.group}, {"Categories", std::move(names)}});
      it = group_names.end() - 1;
    }
    plist::Dictionary* group = groups[static_cast<size_t>(it - group_names.begin())].AsDictionary();
    (*group)["Categories"].AsArray()->push_back(category.name);
  }
  return plist::Dictionary{{"VTAvailableCategories", std::move(groups)}};
}

plist::Value CategoryPlist(const CategoryDefinition& category) {
  plist::Array segments;
  for (const CategorySegment& segment : category.segments) {
    plist::Dictionary entry{{"Data", FormatDataString(segment.characters)}};
    if (segment.skip_null_glyphs) entry.emplace("VTSkipNullGlyphs", true);
    segments.push_back(std::move(entry));
  }
  return plist::Dictionary{{"VTCategoryData", plist::Dictionary{{"DataArray", std::move(segments)}}}};
}

plist::Value EmojiCategoryPlist(const std::vector<EmojiSubcategory>& subcategories) {
  plist::Array entries;
  for (const EmojiSubcategory& sub : subcategories) {
    entries.push_back(plist::Dictionary{
        {"VTDataTitle", sub.title_key},
        {"VTCategoryImage", sub.image_name},
        {"VTCategoryData", plist::Dictionary{{"Data", FormatDataString(sub.characters)}}},
    });
  }
  return plist::Dictionary{{"EmojiDataArray", std::move(entries)}};
}

}  // namespace lumeris::resources
