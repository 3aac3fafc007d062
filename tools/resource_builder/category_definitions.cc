#include "resource_builder/category_definitions.h"

#include <algorithm>
#include <functional>
#include <initializer_list>
#include <string_view>

#include "resource_builder/utf8.h"

namespace lumeris::resources {
namespace {

// What a rule sees of a code point.
struct CharacterView {
  const CodePointRecord& record;
  std::string_view block;
  std::string_view script;
};

using Rule = std::function<bool(const CharacterView&)>;

struct CategoryRule {
  std::string_view name;
  std::string_view group;
  TitleSource title;
  std::string_view icon_text;
  Rule selects;
};

constexpr std::string_view kSymbols = "CategoryGroup-Symbols";
constexpr std::string_view kLetters = "CategoryGroup-Letters";

bool HasWord(std::string_view name, std::string_view word) {
  size_t pos = name.find(word);
  while (pos != std::string_view::npos) {
    bool starts = pos == 0 || name[pos - 1] == ' ' || name[pos - 1] == '-';
    size_t end = pos + word.size();
    bool ends = end == name.size() || name[end] == ' ' || name[end] == '-' || name[end] == 'S';
    if (starts && ends) return true;
    pos = name.find(word, pos + 1);
  }
  return false;
}

bool InBlocks(const CharacterView& c, std::initializer_list<std::string_view> blocks) {
  return std::find(blocks.begin(), blocks.end(), c.block) != blocks.end();
}

bool CategoryIs(const CharacterView& c, std::initializer_list<std::string_view> categories) {
  return std::find(categories.begin(), categories.end(), c.record.general_category) != categories.end();
}

bool IsSymbol(const CharacterView& c) { return c.record.general_category[0] == 'S'; }
bool IsLetterOrMark(const CharacterView& c) {
  return c.record.general_category[0] == 'L' || c.record.general_category[0] == 'M';
}

TitleSource Label(std::string key) { return {TitleSource::Kind::kCharacterLabel, std::move(key), {}}; }
TitleSource Script(std::string code) { return {TitleSource::Kind::kScriptName, std::move(code), {}}; }

Rule ScriptLetters(std::string_view script) {
  return [script](const CharacterView& c) { return c.script == script && IsLetterOrMark(c); };
}

std::vector<CategoryRule> CategoryRules() {
  std::vector<CategoryRule> rules = {
      {"Arrows", kSymbols, Label("arrows"), "→",
       [](const CharacterView& c) { return IsSymbol(c) && c.record.name.find("ARROW") != std::string::npos; }},
      {"BulletsStars", kSymbols, Label("bullets_stars"), "★",
       [](const CharacterView& c) {
         const std::string& n = c.record.name;
         return (IsSymbol(c) || CategoryIs(c, {"Po"})) &&
                (HasWord(n, "BULLET") || HasWord(n, "STAR") || HasWord(n, "ASTERISK") ||
                 HasWord(n, "FLORETTE") || HasWord(n, "SPARKLE"));
       }},
      {"CurrencySymbols", kSymbols, Label("currency_symbols"), "€",
       [](const CharacterView& c) { return CategoryIs(c, {"Sc"}); }},
      {"LetterlikeSymbols", kSymbols, Label("letterlike_symbols"), "℃",
       [](const CharacterView& c) { return InBlocks(c, {"Letterlike Symbols", "Mathematical Alphanumeric Symbols"}); }},
      {"MathematicalSymbols", kSymbols, Label("math_symbols"), "∑",
       [](const CharacterView& c) { return CategoryIs(c, {"Sm"}) && c.record.name.find("ARROW") == std::string::npos; }},
      {"Parentheses", kSymbols, Label("paired"), "()",
       [](const CharacterView& c) { return CategoryIs(c, {"Ps", "Pe", "Pi", "Pf"}); }},
      {"Punctuation", kSymbols, Label("punctuation"), "‽",
       [](const CharacterView& c) { return CategoryIs(c, {"Pc", "Pd", "Po"}); }},
      {"Pictographs", kSymbols, Label("pictographs"), "☂",
       [](const CharacterView& c) {
         return IsSymbol(c) && InBlocks(c, {"Dingbats", "Miscellaneous Symbols and Pictographs", "Emoticons",
                                            "Transport and Map Symbols", "Supplemental Symbols and Pictographs",
                                            "Symbols and Pictographs Extended-A"});
       }},
      {"SignStandardSymbols", kSymbols, Label("sign_standard_symbols"), "⚠",
       [](const CharacterView& c) { return IsSymbol(c) && InBlocks(c, {"Miscellaneous Symbols"}); }},
      {"TechnicalSymbols", kSymbols, Label("technical_symbols"), "⌘",
       [](const CharacterView& c) {
         return InBlocks(c, {"Miscellaneous Technical", "Control Pictures", "Optical Character Recognition"});
       }},
      {"EnclosedCharacters", kSymbols, {TitleSource::Kind::kLabelPattern, "symbols", "enclosed"}, "①",
       [](const CharacterView& c) {
         return InBlocks(c, {"Enclosed Alphanumerics", "Enclosed CJK Letters and Months",
                             "Enclosed Alphanumeric Supplement", "Enclosed Ideographic Supplement"});
       }},
      {"GeometricShapes", kSymbols, Label("geometric_shapes"), "▲",
       [](const CharacterView& c) { return InBlocks(c, {"Geometric Shapes", "Geometric Shapes Extended"}); }},
      {"BoxDrawing", kSymbols, Label("box_drawing"), "╬",
       [](const CharacterView& c) { return InBlocks(c, {"Box Drawing", "Block Elements"}); }},
      {"MusicalSymbols", kSymbols, Label("musical_symbols"), "♫",
       [](const CharacterView& c) {
         return InBlocks(c, {"Musical Symbols", "Byzantine Musical Symbols", "Ancient Greek Musical Notation"}) ||
                (IsSymbol(c) && HasWord(c.record.name, "NOTE") && InBlocks(c, {"Miscellaneous Symbols"}));
       }},
      {"Braille", kSymbols, Label("braille"), "⠿",
       [](const CharacterView& c) { return InBlocks(c, {"Braille Patterns"}); }},
      {"Digits", kSymbols, Label("digits"), "7",
       [](const CharacterView& c) { return CategoryIs(c, {"Nd"}); }},
      {"FullWidthForms", kSymbols, Label("full_width_form_variant"), "Ａ",
       [](const CharacterView& c) { return c.record.name.starts_with("FULLWIDTH "); }},
      {"HanRadicals", kSymbols, Label("han_radicals"), "⼈",
       [](const CharacterView& c) { return InBlocks(c, {"Kangxi Radicals", "CJK Radicals Supplement"}); }},
      {"PhoneticAlphabet", kSymbols, Label("phonetic_alphabet"), "ə",
       [](const CharacterView& c) {
         return InBlocks(c, {"IPA Extensions", "Phonetic Extensions", "Phonetic Extensions Supplement",
                             "Spacing Modifier Letters"});
       }},
  };
  struct LetterScript {
    std::string_view name, script, code, icon;
  };
  static constexpr LetterScript kScripts[] = {
      {"Latin", "Latin", "Latn", "A"},         {"Greek", "Greek", "Grek", "Ω"},
      {"Cyrillic", "Cyrillic", "Cyrl", "Ж"},   {"Armenian", "Armenian", "Armn", "Ա"},
      {"Hebrew", "Hebrew", "Hebr", "א"},       {"Arabic", "Arabic", "Arab", "ع"},
      {"Devanagari", "Devanagari", "Deva", "अ"}, {"Bengali", "Bengali", "Beng", "অ"},
      {"Tamil", "Tamil", "Taml", "த"},         {"Thai", "Thai", "Thai", "ก"},
      {"Georgian", "Georgian", "Geor", "ა"},   {"Ethiopic", "Ethiopic", "Ethi", "አ"},
      {"Cherokee", "Cherokee", "Cher", "Ꭰ"},   {"Hangul", "Hangul", "Hang", "한"},
      {"Hiragana", "Hiragana", "Hira", "あ"},  {"Katakana", "Katakana", "Kana", "ア"},
      {"Bopomofo", "Bopomofo", "Bopo", "ㄅ"},  {"Tibetan", "Tibetan", "Tibt", "ཀ"},
      {"Khmer", "Khmer", "Khmr", "ក"},         {"Runic", "Runic", "Runr", "ᚠ"},
  };
  for (const LetterScript& s : kScripts) {
    rules.push_back({s.name, kLetters, Script(std::string(s.code)), s.icon, ScriptLetters(s.script)});
  }
  return rules;
}

// The value of the range holding `cp` in ranges sorted by start, or "".
class RangeIndex {
 public:
  explicit RangeIndex(const std::vector<CodePointRange>& ranges) : ranges_(ranges) {
    std::sort(ranges_.begin(), ranges_.end(),
              [](const CodePointRange& a, const CodePointRange& b) { return a.first < b.first; });
  }
  std::string_view ValueOf(char32_t cp) const {
    auto it = std::upper_bound(ranges_.begin(), ranges_.end(), cp,
                               [](char32_t v, const CodePointRange& r) { return v < r.first; });
    if (it == ranges_.begin()) return {};
    --it;
    return cp <= it->last ? std::string_view(it->value) : std::string_view();
  }

 private:
  std::vector<CodePointRange> ranges_;
};

struct EmojiGroupRule {
  std::string_view title_key;
  std::string_view label_type;
  std::string_view image_name;
  std::string_view icon_text;
  std::vector<std::string_view> groups;
};

}  // namespace

std::vector<CategoryDefinition> BuildCategories(const UnicodeCharacterTable& unicode,
                                                const std::vector<CodePointRange>& blocks,
                                                const std::vector<CodePointRange>& scripts) {
  RangeIndex block_index(blocks), script_index(scripts);
  std::vector<CategoryRule> rules = CategoryRules();
  std::vector<CategoryDefinition> categories;
  for (const CategoryRule& rule : rules) {
    CategoryDefinition category{std::string(rule.name), std::string(rule.group), rule.title,
                                std::string(rule.icon_text), {{{}, false}, {{}, true}}};
    categories.push_back(std::move(category));
  }
  for (const CodePointRecord& record : unicode.records()) {
    if (!IsListedCharacter(record) || record.general_category == "Cc") continue;
    CharacterView view{record, block_index.ValueOf(record.code_point), script_index.ValueOf(record.code_point)};
    for (size_t i = 0; i < rules.size(); ++i) {
      if (!rules[i].selects(view)) continue;
      categories[i].segments[record.code_point > 0xFFFF ? 1 : 0].characters.emplace_back(1, record.code_point);
    }
  }
  for (CategoryDefinition& category : categories) {
    std::erase_if(category.segments, [](const CategorySegment& s) { return s.characters.empty(); });
  }
  return categories;
}

std::vector<EmojiSubcategory> BuildEmojiSubcategories(const std::vector<EmojiTestEntry>& emoji) {
  const EmojiGroupRule kRules[] = {
      {"Smileys & People", "smileys_people", "EmojiCategory-SmileysPeople", "☺", {"Smileys & Emotion", "People & Body"}},
      {"Animals & Nature", "animals_nature", "EmojiCategory-AnimalsNature", "✿", {"Animals & Nature"}},
      {"Food & Drink", "food_drink", "EmojiCategory-FoodDrink", "☕", {"Food & Drink"}},
      {"Activities", "activities", "EmojiCategory-Activities", "♠", {"Activities"}},
      {"Travel & Places", "travel_places", "EmojiCategory-TravelPlaces", "✈", {"Travel & Places"}},
      {"Objects", "objects", "EmojiCategory-Objects", "☎", {"Objects"}},
      {"Symbols", "symbols", "EmojiCategory-Symbols", "♥", {"Symbols"}},
      {"Flags", "flags", "EmojiCategory-Flags", "⚑", {"Flags"}},
  };
  std::vector<EmojiSubcategory> out;
  for (const EmojiGroupRule& rule : kRules) {
    EmojiSubcategory sub{std::string(rule.title_key), std::string(rule.label_type), std::string(rule.image_name),
                         std::string(rule.icon_text), {}};
    for (const EmojiTestEntry& entry : emoji) {
      if (entry.status != EmojiStatus::kFullyQualified || HasSkinTone(entry.sequence)) continue;
      if (std::find(rule.groups.begin(), rule.groups.end(), entry.group) == rule.groups.end()) continue;
      sub.characters.push_back(entry.sequence);
    }
    out.push_back(std::move(sub));
  }
  return out;
}

}  // namespace lumeris::resources
