// The Unihan database: the per-ideograph fields of the Unihan_*.txt files ("U+5FC3<TAB>kMandarin<TAB>xīn").
//
//   UnihanTable unihan;
//   AddUnihanRecords(text, kUnihanFieldsUsed, unihan);
//   unihan.Field(U'心', "kDefinition")   // "heart; mind, intelligence; soul"
//
// Thread-safety: a filled table is an immutable value; concurrent reads are safe, filling is not.
#pragma once

#include <span>
#include <string>
#include <string_view>
#include <unordered_map>
#include <utility>
#include <vector>

namespace lumeris::resources {

// The Unihan fields the builder reads; the others are skipped while parsing.
inline constexpr std::string_view kUnihanFieldsUsed[] = {
    "kDefinition",     "kJapaneseOn",    "kJapaneseKun",       "kHangul",
    "kKorean",         "kMandarin",      "kCantonese",         "kCangjie",
    "kTotalStrokes",   "kRSUnicode",     "kSimplifiedVariant", "kTraditionalVariant",
    "kSemanticVariant", "kZVariant",     "kSpecializedSemanticVariant",
};

class UnihanTable {
 public:
  // The value of `field` for `cp`; empty when Unihan has none.
  std::string_view Field(char32_t cp, std::string_view field) const;
  // Every (code point, fields) entry, in no particular order.
  const std::unordered_map<char32_t, std::vector<std::pair<std::string, std::string>>>& entries() const {
    return entries_;
  }
  void Add(char32_t cp, std::string_view field, std::string_view value);

 private:
  std::unordered_map<char32_t, std::vector<std::pair<std::string, std::string>>> entries_;
};

// Adds the records of one Unihan file whose field is in `fields`; malformed lines are skipped.
void AddUnihanRecords(std::string_view text, std::span<const std::string_view> fields, UnihanTable& table);

// The code points named in a variant field ("U+53D1<kMatthews U+5F42"): each "U+XXXX" token, with
// any "<source" annotation dropped.
std::vector<char32_t> ParseUnihanCodePoints(std::string_view value);

}  // namespace lumeris::resources
