// The categories of the picker: which characters each symbol and letter category holds, where its
// title comes from and what its icon shows; and the emoji sub-categories built from the emoji
// groups of the emoji test file.
//
// A category's characters are the listed code points that its rule selects, in code-point order,
// split into two segments: the Basic Multilingual Plane, and the supplementary planes, which many
// fonts lack (that segment is marked to skip characters without a glyph).
//
// Thread-safety: pure functions over their inputs. Results belong to the caller.
#pragma once

#include <string>
#include <vector>

#include "resource_builder/emoji_test.h"
#include "resource_builder/ucd_format.h"
#include "resource_builder/unicode_data.h"

namespace lumeris::resources {

// Where a title comes from in CLDR: a character label, a script name, or a label pattern
// ("{0} — enclosed") applied to a character label.
struct TitleSource {
  enum class Kind { kCharacterLabel, kScriptName, kLabelPattern };
  Kind kind = Kind::kCharacterLabel;
  std::string key;      // label type or script code
  std::string pattern;  // pattern type, for kLabelPattern
};

struct CategorySegment {
  std::vector<std::u32string> characters;
  bool skip_null_glyphs = false;
};

struct CategoryDefinition {
  std::string name;   // "Arrows": "Category-Arrows", "CategoryName-Arrows", "CategoryImage-Arrows"
  std::string group;  // "CategoryGroup-Symbols" or "CategoryGroup-Letters"
  TitleSource title;
  std::string icon_text;  // UTF-8 text drawn on the icon
  std::vector<CategorySegment> segments;
};

struct EmojiSubcategory {
  std::string title_key;   // "VTDataTitle": key in the "Emoji_Category" table
  std::string label_type;  // CLDR character label that translates it
  std::string image_name;  // "VTCategoryImage"
  std::string icon_text;
  std::vector<std::u32string> characters;  // fully-qualified emoji without skin tones, in order
};

// The name of the emoji category, which the catalogue treats specially.
inline constexpr std::string_view kEmojiCategoryName = "Emoji";

// The symbol and letter categories (not the emoji category), in display order.
// `blocks` and `scripts` are the ranges of Blocks.txt and Scripts.txt.
std::vector<CategoryDefinition> BuildCategories(const UnicodeCharacterTable& unicode,
                                                const std::vector<CodePointRange>& blocks,
                                                const std::vector<CodePointRange>& scripts);

// The emoji sub-categories, in emoji-test group order.
std::vector<EmojiSubcategory> BuildEmojiSubcategories(const std::vector<EmojiTestEntry>& emoji);

}  // namespace lumeris::resources
