#include "resource_builder/unicode_data.h"

#include <algorithm>
#include <cctype>
#include <cstdio>

#include "resource_builder/ucd_format.h"

namespace lumeris::resources {
namespace {

std::string HexName(std::string_view prefix, char32_t cp) {
  char buffer[16];
  std::snprintf(buffer, sizeof buffer, "%04X", static_cast<unsigned>(cp));
  return std::string(prefix) + buffer;
}

// The name of a code point inside a First/Last range labelled `label` ("CJK Ideograph Extension A").
std::string RangeMemberName(std::string_view label, char32_t cp) {
  if (std::optional<std::string> hangul = HangulSyllableName(cp)) return *hangul;
  if (label.starts_with("CJK Ideograph")) return HexName("CJK UNIFIED IDEOGRAPH-", cp);
  if (label.starts_with("Tangut Ideograph")) return HexName("TANGUT IDEOGRAPH-", cp);
  std::string upper(label);
  std::transform(upper.begin(), upper.end(), upper.begin(),
                 [](unsigned char c) { return static_cast<char>(std::toupper(c)); });
  return HexName(upper + "-", cp);
}

char32_t OptionalCodePoint(std::string_view field) {
  std::optional<char32_t> cp = ParseCodePoint(field);
  return cp ? *cp : 0;
}

}  // namespace

UnicodeCharacterTable::UnicodeCharacterTable(std::vector<CodePointRecord> records)
    : records_(std::move(records)) {
  std::sort(records_.begin(), records_.end(),
            [](const CodePointRecord& a, const CodePointRecord& b) { return a.code_point < b.code_point; });
}

const CodePointRecord* UnicodeCharacterTable::Find(char32_t cp) const {
  auto it = std::lower_bound(records_.begin(), records_.end(), cp,
                             [](const CodePointRecord& r, char32_t v) { return r.code_point < v; });
  return it != records_.end() && it->code_point == cp ? &*it : nullptr;
}

std::optional<std::string> HangulSyllableName(char32_t cp) {
  static constexpr const char* kLeads[] = {"G", "GG", "N", "D", "DD", "R", "M", "B", "BB", "S",
                                           "SS", "", "J", "JJ", "C", "K", "T", "P", "H"};
  static constexpr const char* kVowels[] = {"A",  "AE", "YA", "YAE", "EO", "E",  "YEO",
                                            "YE", "O",  "WA", "WAE", "OE", "YO", "U",
                                            "WEO", "WE", "WI", "YU", "EU", "YI", "I"};
  static constexpr const char* kTrails[] = {"",   "G",  "GG", "GS", "N",  "NJ", "NH", "D",  "L", "LG",
                                            "LM", "LB", "LS", "LT", "LP", "LH", "M",  "B",  "BS", "S",
                                            "SS", "NG", "J",  "C",  "K",  "T",  "P",  "H"};
  if (cp < 0xAC00 || cp > 0xD7A3) return std::nullopt;
  unsigned index = cp - 0xAC00;
  std::string name = "HANGUL SYLLABLE ";
  name += kLeads[index / (21 * 28)];
  name += kVowels[(index % (21 * 28)) / 28];
  name += kTrails[index % 28];
  return name;
}

bool IsListedCharacter(const CodePointRecord& record) {
  return record.general_category != "Cs" && record.general_category != "Co" &&
         record.general_category != "Cn";
}

UnicodeCharacterTable ParseUnicodeData(std::string_view text) {
  std::vector<CodePointRecord> records;
  std::optional<CodePointRecord> range_start;
  ForEachUcdRecord(text, [&](std::span<const std::string_view> f) {
    if (f.size() < 15) return;
    std::optional<char32_t> cp = ParseCodePoint(f[0]);
    if (!cp || f[2].size() != 2) return;
    CodePointRecord record;
    record.code_point = *cp;
    record.general_category = std::string(f[2]);
    record.decomposition = std::string(f[5]);
    record.simple_uppercase = OptionalCodePoint(f[12]);
    record.simple_lowercase = OptionalCodePoint(f[13]);
    std::string_view name = f[1];
    if (name.starts_with("<") && name.ends_with(", First>")) {
      record.name = std::string(name.substr(1, name.size() - 9));  // the range label
      range_start = record;
      return;
    }
    if (name.starts_with("<") && name.ends_with(", Last>")) {
      if (!range_start || range_start->code_point > *cp) return;
      for (char32_t member = range_start->code_point; member <= *cp; ++member) {
        CodePointRecord expanded = *range_start;
        expanded.code_point = member;
        expanded.name = RangeMemberName(range_start->name, member);
        records.push_back(std::move(expanded));
      }
      range_start.reset();
      return;
    }
    if (!name.starts_with("<")) record.name = std::string(name);
    records.push_back(std::move(record));
  });
  return UnicodeCharacterTable(std::move(records));
}

std::map<char32_t, std::vector<NameAlias>> ParseNameAliases(std::string_view text) {
  std::map<char32_t, std::vector<NameAlias>> aliases;
  ForEachUcdRecord(text, [&](std::span<const std::string_view> f) {
    if (f.size() < 3 || f[1].empty()) return;
    if (std::optional<char32_t> cp = ParseCodePoint(f[0])) {
      aliases[*cp].push_back({std::string(f[1]), std::string(f[2])});
    }
  });
  return aliases;
}

}  // namespace lumeris::resources
