// The category catalogue: the answer to "read_categorydata". For each category name the panel asks
// for, one entry with the category's localized title, its icon file and its characters, all read
// from the input-method application bundle (and, for the emoji sub-category icons, the framework
// bundle).
//
//   MessageValue result = CreateXPCCategoryDataArray(std::vector<std::string>{"Emoji", "Arrows"});
//   // [{"Data": [{"TitleText", "TitleImage", "Data": "<emoji>1F600,..."}, ...],
//   //   "TitleText": "Emoji", "TitleImage": <pdf bytes>},
//   //  {"Data": "2190-21FF,...", "CheckGlyph": true, "TitleText": "Arrows", "TitleImage": <bytes>}]
//
// The rules:
// - One entry per requested name, in request order; duplicates give equal entries, nothing is
//   filtered or reordered. An absent or empty list gives an empty array, never null.
// - The preferred localization of the application bundle is chosen once per request and used for
//   every property-list lookup and every title of that request.
// - The "Categories" plist is read and walked to its "CategoryGroup-Symbols" group, but that list is
//   deliberately not applied to the request.
// - "Emoji": "Data" is an array, one entry per "EmojiDataArray" element of "Category-Emoji"
//   (empty when that plist is missing): "TitleText" from the "Emoji_Category" strings table
//   (the "VTDataTitle" key when there is no translation, "" when there is no key), "TitleImage"
//   the bytes of the icon named by "VTCategoryImage" (framework tiff, application tiff, framework
//   pdf, application pdf: the first found), "Data" "<emoji>" followed by the sub-category's
//   "VTCategoryData"/"Data" ("(null)" in its place when that is missing).
// - Any other name N: the "Data" strings of the segments of "Category-N" ("VTCategoryData", its
//   "DataArray" or, without one, the dictionary itself) joined by ","; a segment without "Data"
//   adds nothing. "Data" is set only when the join is non-empty, and then "CheckGlyph" = true when
//   any segment carries "VTSkipNullGlyphs" at all (a stored false counts).
// - Every entry: "TitleText" is "CategoryName-N" in the "Localizable" table, N when untranslated;
//   "TitleImage" the bytes of "CategoryImage-N" (tiff, else pdf), zero bytes when there is none.
// - Property-list values of the wrong type read as absent. "Data" strings are passed through
//   byte for byte (their notation is categories/data_notation.h). Regional hiding is not applied.
// Keys are set in the order Data, CheckGlyph, TitleText, TitleImage (sub-entries: TitleText,
// TitleImage, Data); the message layer's dictionaries keep their keys sorted, so that order is not
// visible on the wire.
//
// Nothing is cached between requests: every call reopens both bundles and rereads every property
// list and icon. The only shared state is LocalizedStringForLanguage()'s strings-table cache.
//
// Thread-safety: every function may be called from any thread at the same time (the strings-table
// cache is guarded by its own lock). Results are new values owned by the caller.
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "platform/bundle.h"
#include "service/message_value.h"
#include "service/string_array.h"

namespace lumeris {

// The category whose data is an array of emoji sub-categories.
inline constexpr std::string_view kEmojiCategoryName = "Emoji";
// What the "Data" of an emoji sub-category starts with.
inline constexpr std::string_view kEmojiDataPrefix = "<emoji>";

// One group of the "Categories" property list.
struct CategoryGroup {
  std::string group;                    // "Group", such as "CategoryGroup-Symbols"
  std::vector<std::string> categories;  // "Categories", in order
};

// The groups of the "Categories" plist of `application` for `localization`, in order; groups
// that are not dictionaries and names that are not strings are left out. Empty when the plist
// is missing or unreadable.
std::vector<CategoryGroup> ReadAvailableCategories(const Bundle& application,
                                                   std::string_view localization);

// The service's operation: the catalogue over the application and framework bundles under the
// system root, both opened afresh (the framework only when "Emoji" is asked for).
MessageValue CreateXPCCategoryDataArray(const StringList& names);

}  // namespace lumeris
