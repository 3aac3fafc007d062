#include "resource_builder/related_chars.h"

#include <algorithm>
#include <map>
#include <optional>
#include <unordered_map>

#include "resource_builder/ucd_format.h"
#include "resource_builder/utf8.h"

namespace lumeris::resources {
namespace {

// Union-find over code points.
class CodePointSets {
 public:
  void Join(char32_t a, char32_t b) {
    char32_t ra = Root(a), rb = Root(b);
    if (ra != rb) parent_[std::max(ra, rb)] = std::min(ra, rb);
  }

  std::vector<std::u32string> Groups() {
    std::map<char32_t, std::u32string> by_root;
    std::vector<char32_t> members;
    for (const auto& entry : parent_) members.push_back(entry.first);
    for (char32_t cp : members) by_root[Root(cp)].push_back(cp);
    std::vector<std::u32string> groups;
    for (auto& [root, group] : by_root) {
      if (group.size() < 2) continue;
      std::sort(group.begin(), group.end());
      groups.push_back(std::move(group));
    }
    return groups;
  }

 private:
  char32_t Root(char32_t cp) {
    auto it = parent_.try_emplace(cp, cp).first;
    if (it->second == cp) return cp;
    char32_t root = Root(it->second);
    parent_[cp] = root;
    return root;
  }
  std::unordered_map<char32_t, char32_t> parent_;
};

bool IsLetterOrDigit(const CodePointRecord* record) {
  return record != nullptr && (record->general_category[0] == 'L' || record->general_category[0] == 'N');
}

bool IsCombiningMark(const CodePointRecord* record) {
  return record != nullptr && record->general_category[0] == 'M';
}

// The full decomposition of `cp` (canonical only, or canonical and compatibility), recursively.
std::u32string Decompose(const UnicodeCharacterTable& unicode, char32_t cp, bool compatibility, int depth = 0) {
  const CodePointRecord* record = unicode.Find(cp);
  if (record == nullptr || record->decomposition.empty() || depth > 8) return std::u32string(1, cp);
  std::string_view field = record->decomposition;
  bool is_compat = field.starts_with("<");
  if (is_compat && !compatibility) return std::u32string(1, cp);
  if (is_compat) field = TrimAscii(field.substr(field.find('>') + 1));
  std::optional<std::u32string> parts = ParseCodePointSequence(field);
  if (!parts) return std::u32string(1, cp);
  std::u32string out;
  for (char32_t part : *parts) out += Decompose(unicode, part, compatibility, depth + 1);
  return out;
}

// The letter or digit that `record` is a form of: its decomposition's first character when all
// the rest are combining marks; nullopt for anything else (ligatures, squared words ...).
std::optional<char32_t> BaseLetter(const UnicodeCharacterTable& unicode, const CodePointRecord& record) {
  if (record.decomposition.empty()) return std::nullopt;
  std::u32string parts = Decompose(unicode, record.code_point, /*compatibility=*/true);
  if (parts.empty() || parts[0] == record.code_point || !IsLetterOrDigit(unicode.Find(parts[0]))) {
    return std::nullopt;
  }
  for (size_t i = 1; i < parts.size(); ++i) {
    if (!IsCombiningMark(unicode.Find(parts[i]))) return std::nullopt;
  }
  return parts[0];
}

// "man: red hair" -> ": red hair", "woman running" -> " running", "person" -> ""; nullopt when the
// name does not start with a gendered or neutral person word.
std::optional<std::string> GenderNeutralKey(std::string_view name) {
  for (std::string_view word : {"person", "woman", "man"}) {
    if (!name.starts_with(word)) continue;
    std::string_view rest = name.substr(word.size());
    if (rest.empty() || rest[0] == ' ' || rest[0] == ':') return std::string(rest);
  }
  return std::nullopt;
}

// The name of the plain form of a skin-toned emoji: "woman: medium skin tone, red hair" ->
// "woman: red hair", "thumbs up: dark skin tone" -> "thumbs up".
std::string NameWithoutSkinTones(std::string_view name) {
  size_t colon = name.find(": ");
  if (colon == std::string_view::npos) return std::string(name);
  std::string kept;
  std::string_view details = name.substr(colon + 2);
  size_t pos = 0;
  while (pos <= details.size()) {
    size_t comma = details.find(", ", pos);
    if (comma == std::string_view::npos) comma = details.size();
    std::string_view item = details.substr(pos, comma - pos);
    if (!item.ends_with("skin tone")) {
      if (!kept.empty()) kept += ", ";
      kept += item;
    }
    pos = comma + 2;
  }
  std::string base(name.substr(0, colon));
  return kept.empty() ? base : base + ": " + kept;
}

}  // namespace

std::vector<std::u32string> LetterGroups(const UnicodeCharacterTable& unicode) {
  CodePointSets sets;
  for (const CodePointRecord& record : unicode.records()) {
    // Any character that is a form of a letter or digit (Ⓐ is a symbol) joins it.
    if (std::optional<char32_t> base = BaseLetter(unicode, record)) sets.Join(record.code_point, *base);
    if (!IsLetterOrDigit(&record)) continue;
    for (char32_t other : {record.simple_uppercase, record.simple_lowercase}) {
      if (other != 0 && IsLetterOrDigit(unicode.Find(other))) sets.Join(record.code_point, other);
    }
  }
  return sets.Groups();
}

std::vector<std::u32string> HanVariantGroups(const UnihanTable& unihan) {
  static constexpr std::string_view kVariantFields[] = {
      "kSimplifiedVariant", "kTraditionalVariant", "kSemanticVariant", "kSpecializedSemanticVariant", "kZVariant"};
  CodePointSets sets;
  for (const auto& [cp, fields] : unihan.entries()) {
    for (const auto& [field, value] : fields) {
      if (std::find(std::begin(kVariantFields), std::end(kVariantFields), field) == std::end(kVariantFields)) {
        continue;
      }
      for (char32_t variant : ParseUnihanCodePoints(value)) {
        if (variant != cp) sets.Join(cp, variant);
      }
    }
  }
  return sets.Groups();
}

std::vector<std::vector<std::u32string>> EmojiGroups(const std::vector<EmojiTestEntry>& emoji) {
  std::vector<std::vector<std::u32string>> groups;
  std::map<std::string, size_t> tone_family_of_name;
  std::map<std::string, size_t> gender_family_of_key;
  std::vector<std::vector<std::u32string>> gender_families;
  for (const EmojiTestEntry& entry : emoji) {
    if (entry.status != EmojiStatus::kFullyQualified || entry.group == "Component") continue;
    if (!HasSkinTone(entry.sequence)) {
      tone_family_of_name[entry.name] = groups.size();
      groups.push_back({entry.sequence});
      if (std::optional<std::string> key = GenderNeutralKey(entry.name)) {
        auto [it, inserted] = gender_family_of_key.try_emplace(*key, gender_families.size());
        if (inserted) gender_families.emplace_back();
        gender_families[it->second].push_back(entry.sequence);
      }
      continue;
    }
    if (auto it = tone_family_of_name.find(NameWithoutSkinTones(entry.name)); it != tone_family_of_name.end()) {
      groups[it->second].push_back(entry.sequence);
    }
  }
  std::erase_if(groups, [](const std::vector<std::u32string>& group) { return group.size() < 2; });
  for (std::vector<std::u32string>& family : gender_families) {
    if (family.size() >= 2) groups.push_back(std::move(family));
  }
  return groups;
}

std::vector<std::string> BuildRelatedRows(const UnicodeCharacterTable& unicode, const UnihanTable& unihan,
                                          const std::vector<EmojiTestEntry>& emoji) {
  std::vector<std::string> rows;
  for (const std::u32string& group : LetterGroups(unicode)) rows.push_back(ToUtf8(group));
  for (const std::u32string& group : HanVariantGroups(unihan)) rows.push_back(ToUtf8(group));
  for (const std::vector<std::u32string>& group : EmojiGroups(emoji)) {
    std::string row;
    for (const std::u32string& sequence : group) row += ToUtf8(sequence);
    rows.push_back(std::move(row));
  }
  return rows;
}

}  // namespace lumeris::resources
