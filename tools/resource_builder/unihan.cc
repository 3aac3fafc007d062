#include "resource_builder/unihan.h"

#include <algorithm>

#include "resource_builder/ucd_format.h"

namespace lumeris::resources {

std::string_view UnihanTable::Field(char32_t cp, std::string_view field) const {
  auto it = entries_.find(cp);
  if (it == entries_.end()) return {};
  for (const auto& [name, value] : it->second) {
    if (name == field) return value;
  }
  return {};
}

void UnihanTable::Add(char32_t cp, std::string_view field, std::string_view value) {
  entries_[cp].emplace_back(std::string(field), std::string(value));
}

void AddUnihanRecords(std::string_view text, std::span<const std::string_view> fields, UnihanTable& table) {
  ForEachLine(text, [&](std::string_view line) {
    if (!line.starts_with("U+")) return;
    size_t tab1 = line.find('\t');
    size_t tab2 = tab1 == std::string_view::npos ? tab1 : line.find('\t', tab1 + 1);
    if (tab2 == std::string_view::npos) return;
    std::string_view field = line.substr(tab1 + 1, tab2 - tab1 - 1);
    if (std::find(fields.begin(), fields.end(), field) == fields.end()) return;
    std::optional<char32_t> cp = ParseCodePoint(line.substr(2, tab1 - 2));
    std::string_view value = TrimAscii(line.substr(tab2 + 1));
    if (cp && !value.empty()) table.Add(*cp, field, value);
  });
}

std::vector<char32_t> ParseUnihanCodePoints(std::string_view value) {
  std::vector<char32_t> out;
  size_t pos = 0;
  while (pos < value.size()) {
    size_t space = value.find(' ', pos);
    if (space == std::string_view::npos) space = value.size();
    std::string_view token = value.substr(pos, space - pos);
    pos = space + 1;
    token = token.substr(0, token.find('<'));
    if (!token.starts_with("U+")) continue;
    if (std::optional<char32_t> cp = ParseCodePoint(token.substr(2))) out.push_back(*cp);
  }
  return out;
}

}  // namespace lumeris::resources
