// The plain-text format of the Unicode Character Database files: records of fields separated by
// ";", "#" comments, code points in hexadecimal, ranges written "XXXX..YYYY".
//
//   ForEachUcdRecord(text, [](std::span<const std::string_view> fields) { ... });
//   ParseCodePointSequence("1F44D 1F3FD") == U"\U0001F44D\U0001F3FD"
//
// Thread-safety: pure functions. The string_views handed to callbacks point into the caller's text.
#pragma once

#include <functional>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace lumeris::resources {

// One hexadecimal code point ("1F600"); nullopt when it is not 1-6 hex digits or above U+10FFFF.
std::optional<char32_t> ParseCodePoint(std::string_view hex);

// Space-separated hexadecimal code points; nullopt when any of them is malformed or none is given.
std::optional<std::u32string> ParseCodePointSequence(std::string_view hex_list);

// Calls `line` with every line of `text`, without its "\n"; a last line without one counts too.
void ForEachLine(std::string_view text, const std::function<void(std::string_view)>& line);

// Calls `record` with the trimmed ";"-separated fields of every line that is not empty once its
// "#" comment is removed.
void ForEachUcdRecord(std::string_view text,
                      const std::function<void(std::span<const std::string_view>)>& record);

// A range of code points with the value a property file gives it ("0041..005A ; Latin").
struct CodePointRange {
  char32_t first = 0;
  char32_t last = 0;
  std::string value;
};

// Every well-formed range line of a two-field property file (Blocks.txt, Scripts.txt), in file
// order; a single code point gives a range of one.
std::vector<CodePointRange> ParseCodePointRanges(std::string_view text);

// `text` without leading and trailing ASCII white space.
std::string_view TrimAscii(std::string_view text);

}  // namespace lumeris::resources
