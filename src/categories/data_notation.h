// The notation of the "Data" strings in the category property lists.
//
// A Data string is a list of items separated by ",". An item is either
//   - one character, written as its code points in upper-case hexadecimal (4 to 6 digits each)
//     joined by "+": "20AC" is €, "0065+0301" is e with a combining acute accent (one item),
//     "1F44D+1F3FD" is a thumbs-up with a skin tone, "1F1E9+1F1EA" is the flag of Germany; or
//   - a range of single-code-point characters, first and last joined by "-": "0041-005A" is A to Z.
// The notation is plain ASCII, so no character (not ",", not a combining mark, not a joiner)
// can be confused with the separators, and two Data strings joined with "," form a valid Data
// string again. docs/resources.md describes it for panel authors.
//
// The resource builder writes Data strings with FormatDataString(); the lumeris command (and the
// panel) read them back with ParseDataString(). The catalogue itself passes them through untouched.
//
// Thread-safety: pure functions; results belong to the caller.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace lumeris {

// The Data string of `characters` in the given order; runs of three or more consecutive single
// code points become ranges.
std::string FormatDataString(const std::vector<std::u32string>& characters);

// The characters a Data string denotes, ranges expanded; nullopt when it is not in the notation
// (an empty string denotes no characters).
std::optional<std::vector<std::u32string>> ParseDataString(std::string_view data);

}  // namespace lumeris
