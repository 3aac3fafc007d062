// The category property lists of the application bundle, in the structure the catalogue reads:
//  - "Categories":     {"VTAvailableCategories": [{"Group": "CategoryGroup-Symbols", "Categories": [names]}, ...]}
//  - "Category-<name>": {"VTCategoryData": {"DataArray": [{"Data": "...", "VTSkipNullGlyphs": true?}, ...]}}
//  - "Category-Emoji":  {"EmojiDataArray": [{"VTDataTitle", "VTCategoryImage", "VTCategoryData": {"Data"}}, ...]}
// Data strings use the notation of categories/data_notation.h.
//
// Thread-safety: pure functions. Values belong to the caller.
#pragma once

#include <vector>

#include "platform/property_list.h"
#include "resource_builder/category_definitions.h"

namespace lumeris::resources {

// "Categories": the groups in first-appearance order; the emoji category opens the symbols group.
plist::Value CategoriesPlist(const std::vector<CategoryDefinition>& categories);

// "Category-<name>" of one category.
plist::Value CategoryPlist(const CategoryDefinition& category);

// "Category-Emoji".
plist::Value EmojiCategoryPlist(const std::vector<EmojiSubcategory>& subcategories);

}  // namespace lumeris::resources
