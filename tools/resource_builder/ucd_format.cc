#include "resource_builder/ucd_format.h"

namespace lumeris::resources {

std::string_view TrimAscii(std::string_view text) {
  constexpr std::string_view kSpace = " \t\r\n";
  size_t begin = text.find_first_not_of(kSpace);
  if (begin == std::string_view::npos) return {};
  size_t end = text.find_last_not_of(kSpace);
  return text.substr(begin, end - begin + 1);
}

std::optional<char32_t> ParseCodePoint(std::string_view hex) {
  if (hex.empty() || hex.size() > 6) return std::nullopt;
  char32_t value = 0;
  for (char c : hex) {
    int digit;
    if (c >= '0' && c <= '9') digit = c - '0';
    else if (c >= 'A' && c <= 'F') digit = c - 'A' + 10;
    else if (c >= 'a' && c <= 'f') digit = c - 'a' + 10;
    else return std::nullopt;
    value = value * 16 + static_cast<char32_t>(digit);
  }
  if (value > 0x10FFFF) return std::nullopt;
  return value;
}

std::optional<std::u32string> ParseCodePointSequence(std::string_view hex_list) {
  std::u32string out;
  size_t pos = 0;
  while (pos < hex_list.size()) {
    size_t space = hex_list.find(' ', pos);
    if (space == std::string_view::npos) space = hex_list.size();
    std::string_view item = hex_list.substr(pos, space - pos);
    if (!item.empty()) {
      std::optional<char32_t> cp = ParseCodePoint(item);
      if (!cp) return std::nullopt;
      out.push_back(*cp);
    }
    pos = space + 1;
  }
  if (out.empty()) return std::nullopt;
  return out;
}

void ForEachLine(std::string_view text, const std::function<void(std::string_view)>& line) {
  size_t pos = 0;
  while (pos < text.size()) {
    size_t end = text.find('\n', pos);
    if (end == std::string_view::npos) end = text.size();
    line(text.substr(pos, end - pos));
    pos = end + 1;
  }
}

void ForEachUcdRecord(std::string_view text,
                      const std::function<void(std::span<const std::string_view>)>& record) {
  std::vector<std::string_view> fields;
  ForEachLine(text, [&](std::string_view line) {
    if (size_t hash = line.find('#'); hash != std::string_view::npos) line = line.substr(0, hash);
    if (TrimAscii(line).empty()) return;
    fields.clear();
    size_t start = 0;
    while (true) {
      size_t semi = line.find(';', start);
      fields.push_back(TrimAscii(line.substr(start, semi == std::string_view::npos ? semi : semi - start)));
      if (semi == std::string_view::npos) break;
      start = semi + 1;
    }
    record(fields);
  });
}

std::vector<CodePointRange> ParseCodePointRanges(std::string_view text) {
  std::vector<CodePointRange> ranges;
  ForEachUcdRecord(text, [&](std::span<const std::string_view> fields) {
    if (fields.size() < 2 || fields[1].empty()) return;
    std::string_view span = fields[0];
    size_t dots = span.find("..");
    std::optional<char32_t> first = ParseCodePoint(span.substr(0, dots));
    std::optional<char32_t> last =
        dots == std::string_view::npos ? first : ParseCodePoint(span.substr(dots + 2));
    if (!first || !last || *last < *first) return;
    ranges.push_back({*first, *last, std::string(fields[1])});
  });
  return ranges;
}

}  // namespace lumeris::resources
