#include "categories/data_notation.h"

#include <cstdio>

namespace lumeris {
namespace {

void AppendHex(char32_t cp, std::string& out) {
  char buffer[12];
  std::snprintf(buffer, sizeof buffer, "%04X", static_cast<unsigned>(cp));
  out += buffer;
}

// Strict upper-case hexadecimal of 4 to 6 digits naming a scalar value.
std::optional<char32_t> ParseHexCodePoint(std::string_view text) {
  if (text.size() < 4 || text.size() > 6) return std::nullopt;
  char32_t value = 0;
  for (char c : text) {
    if (c >= '0' && c <= '9') value = value * 16 + static_cast<char32_t>(c - '0');
    else if (c >= 'A' && c <= 'F') value = value * 16 + static_cast<char32_t>(c - 'A' + 10);
    else return std::nullopt;
  }
  if (value > 0x10FFFF || (value >= 0xD800 && value <= 0xDFFF)) return std::nullopt;
  return value;
}

}  // namespace

std::string FormatDataString(const std::vector<std::u32string>& characters) {
  std::string out;
  size_t i = 0;
  while (i < characters.size()) {
    if (!out.empty()) out += ',';
    const std::u32string& item = characters[i];
    size_t run_end = i + 1;
    if (item.size() == 1) {
      while (run_end < characters.size() && characters[run_end].size() == 1 &&
             characters[run_end][0] == item[0] + (run_end - i)) {
        ++run_end;
      }
    }
    if (run_end - i >= 3) {
      AppendHex(item[0], out);
      out += '-';
      AppendHex(characters[run_end - 1][0], out);
      i = run_end;
      continue;
    }
    for (size_t k = 0; k < item.size(); ++k) {
      if (k > 0) out += '+';
      AppendHex(item[k], out);
    }
    ++i;
  }
  return out;
}

std::optional<std::vector<std::u32string>> ParseDataString(std::string_view data) {
  std::vector<std::u32string> characters;
  if (data.empty()) return characters;
  size_t pos = 0;
  while (pos <= data.size()) {
    size_t comma = data.find(',', pos);
    if (comma == std::string_view::npos) comma = data.size();
    std::string_view item = data.substr(pos, comma - pos);
    pos = comma + 1;
    if (size_t dash = item.find('-'); dash != std::string_view::npos) {
      std::optional<char32_t> first = ParseHexCodePoint(item.substr(0, dash));
      std::optional<char32_t> last = ParseHexCodePoint(item.substr(dash + 1));
      if (!first || !last || *last < *first) return std::nullopt;
      for (char32_t cp = *first; cp <= *last; ++cp) {
        if (cp >= 0xD800 && cp <= 0xDFFF) continue;
        characters.emplace_back(1, cp);
      }
      continue;
    }
    std::u32string character;
    size_t start = 0;
    while (true) {
      size_t plus = item.find('+', start);
      std::optional<char32_t> cp =
          ParseHexCodePoint(item.substr(start, plus == std::string_view::npos ? plus : plus - start));
      if (!cp) return std::nullopt;
      character.push_back(*cp);
      if (plus == std::string_view::npos) break;
      start = plus + 1;
    }
    characters.push_back(std::move(character));
  }
  return characters;
}

}  // namespace lumeris
