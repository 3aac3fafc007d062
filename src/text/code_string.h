// Typed code strings: the text a user types to name a character by its code, such as "U+1F44D",
// a surrogate pair "D83D DC4D", or UTF-8 byte values "E2 9C 88".
//
// A code string is free text holding hexadecimal numbers, optionally introduced by "u+" in any
// letter case, separated by "+", " " or ",". Up to 40 numbers are read. See docs/text.md for the
// full reading rules and a table of examples.
//
// Thread-safety: pure; safe on any thread.
// Ownership: the result is a new value.
#pragma once

#include <unicode/unistr.h>

#include <optional>

namespace lumeris {

// The text `code` denotes, or std::nullopt:
//   - a single number up to 0x10FFFF (with optional "u+" or "0x", followed only by white space)
//     gives that character; 0 and most values above 0x10FFFF give nothing;
//   - exactly two numbers forming a high and a low surrogate (mask tests on their low 16 bits)
//     give that pair;
//   - two or more numbers all at most 0xFF are UTF-8 bytes, decoded up to the first 0 byte;
//     invalid UTF-8 gives nothing;
//   - any other list gives nothing; a part that is not a number cuts the list short there.
// Allocates no scratch memory on the heap.
std::optional<icu::UnicodeString> StringFromUnicodeCodeString(const icu::UnicodeString& code);

}  // namespace lumeris
