// The category titles in every localization for which CLDR has character labels: the
// "Localizable" table ("CategoryName-<name>" -> title) and the "Emoji_Category" table (each emoji
// sub-category's "VTDataTitle" -> title), written as binary property-list dictionaries in
// "<Resources>/<localization>.lproj/<table>.strings".
//
// Titles are CLDR's texts with the first letter made upper case for the locale. A title CLDR does
// not give for a locale (or its parents) is left out of that locale's table, so a lookup falls back
// to its default.
//
// Thread-safety: pure functions apart from the file writes. Results belong to the caller.
#pragma once

#include <filesystem>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "platform/property_list.h"
#include "resource_builder/category_definitions.h"
#include "resource_builder/cldr_labels.h"

namespace lumeris::resources {

struct LocalizedTables {
  std::string localization;  // folder name without ".lproj", e.g. "pt-PT"
  plist::Dictionary localizable;
  plist::Dictionary emoji_category;
};

// The title of `source` in `texts`, first letter upper-cased for `locale` (a CLDR locale id);
// nullopt when CLDR has no text for it.
std::optional<std::string> ResolveTitle(const TitleSource& source, const CldrLocaleTexts& texts,
                                        const std::string& locale);

// The tables of each locale (CLDR locale id -> its texts with inheritance applied).
std::vector<LocalizedTables> BuildStringsTables(const std::vector<CategoryDefinition>& categories,
                                                const std::vector<EmojiSubcategory>& emoji,
                                                const std::map<std::string, CldrLocaleTexts>& locales);

// Writes "Localizable.strings" and "Emoji_Category.strings" of every localization under `resources`.
bool WriteStringsTables(const std::filesystem::path& resources, const std::vector<LocalizedTables>& tables);

}  // namespace lumeris::resources
