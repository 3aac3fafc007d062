#include "resource_builder/zhuyin.h"

#include <array>
#include <span>
#include <utility>

namespace lumeris::resources {
namespace {

// Tone-marked vowels (UTF-8) with their plain letter ("v" stands for "ü") and tone.
struct MarkedVowel {
  std::string_view text;
  char letter;
  int tone;
};
constexpr MarkedVowel kMarkedVowels[] = {
    {"ā", 'a', 1}, {"á", 'a', 2}, {"ǎ", 'a', 3}, {"à", 'a', 4}, {"ē", 'e', 1}, {"é", 'e', 2},
    {"ě", 'e', 3}, {"è", 'e', 4}, {"ī", 'i', 1}, {"í", 'i', 2}, {"ǐ", 'i', 3}, {"ì", 'i', 4},
    {"ō", 'o', 1}, {"ó", 'o', 2}, {"ǒ", 'o', 3}, {"ò", 'o', 4}, {"ū", 'u', 1}, {"ú", 'u', 2},
    {"ǔ", 'u', 3}, {"ù", 'u', 4}, {"ǖ", 'v', 1}, {"ǘ", 'v', 2}, {"ǚ", 'v', 3}, {"ǜ", 'v', 4},
    {"ü", 'v', 0}, {"ń", 'n', 2}, {"ň", 'n', 3}, {"ǹ", 'n', 4}, {"ḿ", 'm', 2}, {"ê", 'E', 0},
};

constexpr std::pair<std::string_view, std::string_view> kInitials[] = {
    {"zh", "ㄓ"}, {"ch", "ㄔ"}, {"sh", "ㄕ"}, {"b", "ㄅ"}, {"p", "ㄆ"}, {"m", "ㄇ"}, {"f", "ㄈ"},
    {"d", "ㄉ"},  {"t", "ㄊ"},  {"n", "ㄋ"},  {"l", "ㄌ"}, {"g", "ㄍ"}, {"k", "ㄎ"}, {"h", "ㄏ"},
    {"j", "ㄐ"},  {"q", "ㄑ"},  {"x", "ㄒ"},  {"r", "ㄖ"}, {"z", "ㄗ"}, {"c", "ㄘ"}, {"s", "ㄙ"},
};

// Finals in their full spelling ("iou", "uei", "uen"; "v" for "ü", "E" for "ê").
constexpr std::pair<std::string_view, std::string_view> kFinals[] = {
    {"a", "ㄚ"},     {"o", "ㄛ"},     {"e", "ㄜ"},     {"E", "ㄝ"},     {"ai", "ㄞ"},    {"ei", "ㄟ"},
    {"ao", "ㄠ"},    {"ou", "ㄡ"},    {"an", "ㄢ"},    {"en", "ㄣ"},    {"ang", "ㄤ"},   {"eng", "ㄥ"},
    {"er", "ㄦ"},    {"ong", "ㄨㄥ"}, {"i", "ㄧ"},     {"ia", "ㄧㄚ"},  {"io", "ㄧㄛ"},  {"ie", "ㄧㄝ"},
    {"iai", "ㄧㄞ"}, {"iao", "ㄧㄠ"}, {"iou", "ㄧㄡ"}, {"ian", "ㄧㄢ"}, {"in", "ㄧㄣ"},  {"iang", "ㄧㄤ"},
    {"ing", "ㄧㄥ"}, {"iong", "ㄩㄥ"}, {"u", "ㄨ"},    {"ua", "ㄨㄚ"},  {"uo", "ㄨㄛ"},  {"uai", "ㄨㄞ"},
    {"uei", "ㄨㄟ"}, {"uan", "ㄨㄢ"}, {"uen", "ㄨㄣ"}, {"uang", "ㄨㄤ"}, {"ueng", "ㄨㄥ"}, {"v", "ㄩ"},
    {"ve", "ㄩㄝ"},  {"van", "ㄩㄢ"}, {"vn", "ㄩㄣ"},  {"m", "ㄇ"},     {"n", "ㄋ"},     {"ng", "ㄫ"},
};

constexpr std::array<std::string_view, 5> kToneMarks = {"˙", "", "ˊ", "ˇ", "ˋ"};

std::optional<std::string_view> Lookup(std::string_view key,
                                       std::span<const std::pair<std::string_view, std::string_view>> table) {
  for (const auto& [spelling, zhuyin] : table) {
    if (spelling == key) return zhuyin;
  }
  return std::nullopt;
}

// The toneless letters of the syllable and its tone (0 for neutral).
std::optional<std::pair<std::string, int>> StripTone(std::string_view pinyin) {
  std::string letters;
  int tone = 0;
  size_t i = 0;
  while (i < pinyin.size()) {
    char c = pinyin[i];
    if (c >= 'a' && c <= 'z') {
      letters.push_back(c);
      ++i;
      continue;
    }
    if (c >= 'A' && c <= 'Z') {
      letters.push_back(static_cast<char>(c - 'A' + 'a'));
      ++i;
      continue;
    }
    bool matched = false;
    for (const MarkedVowel& vowel : kMarkedVowels) {
      if (pinyin.substr(i).starts_with(vowel.text)) {
        letters.push_back(vowel.letter);
        if (vowel.tone != 0) tone = vowel.tone;
        i += vowel.text.size();
        matched = true;
        break;
      }
    }
    if (!matched) return std::nullopt;
  }
  if (letters.empty()) return std::nullopt;
  return std::pair{letters, tone};
}

}  // namespace

std::optional<std::string> PinyinToZhuyin(std::string_view pinyin) {
  std::optional<std::pair<std::string, int>> stripped = StripTone(pinyin);
  if (!stripped) return std::nullopt;
  std::string syllable = stripped->first;

  // Spelling rules of y and w, which stand for a medial i, u or ü.
  if (syllable[0] == 'y') {
    std::string rest = syllable.substr(1);
    if (rest.starts_with("u")) syllable = "v" + rest.substr(1);
    else if (rest.starts_with("i")) syllable = rest;
    else syllable = "i" + rest;
  } else if (syllable[0] == 'w') {
    std::string rest = syllable.substr(1);
    syllable = rest.starts_with("u") ? rest : "u" + rest;
  }

  std::string_view initial_zhuyin;
  std::string initial;
  for (const auto& [spelling, zhuyin] : kInitials) {
    // A syllable that is only "m", "n" or "ng" has no initial.
    if (syllable.starts_with(spelling) && syllable != spelling && syllable != "ng") {
      initial = std::string(spelling);
      initial_zhuyin = zhuyin;
      break;
    }
  }
  std::string final_part = syllable.substr(initial.size());
  if ((initial == "j" || initial == "q" || initial == "x") && final_part.starts_with("u")) {
    final_part[0] = 'v';
  }
  if (final_part == "iu") final_part = "iou";
  else if (final_part == "ui") final_part = "uei";
  else if (final_part == "un") final_part = "uen";

  std::string out;
  if (stripped->second == 0) out += kToneMarks[0];
  out += initial_zhuyin;
  bool bare_initial = final_part == "i" && (initial == "zh" || initial == "ch" || initial == "sh" ||
                                            initial == "r" || initial == "z" || initial == "c" || initial == "s");
  if (!bare_initial) {
    std::optional<std::string_view> final_zhuyin = Lookup(final_part, kFinals);
    if (!final_zhuyin) return std::nullopt;
    out += *final_zhuyin;
  }
  if (stripped->second != 0) out += kToneMarks[static_cast<size_t>(stripped->second)];
  return out;
}

}  // namespace lumeris::resources
