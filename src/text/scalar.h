// Moving between UTF-16 text and Unicode scalar values.
//
// These functions are deliberately small and permissive: they never fail and validate nothing
// beyond the surrogate mask tests below, so a lone surrogate passes through as its own code unit
// value. Every emoji comparison, skin-tone test and code-string conversion goes through them.
//
// A high surrogate is a unit u with (u & 0xFC00) == 0xD800, a low surrogate one with
// (u & 0xFC00) == 0xDC00; these mask tests are the only surrogate tests of the text utilities.
//
// Thread-safety: pure functions; they may be called from any thread at once.
// Ownership: output arrays belong to the caller; nothing here allocates.
#pragma once

#include <unicode/unistr.h>

#include <cstdint>
#include <string_view>

namespace lumeris {

// True when (unit & 0xFC00) == 0xD800. Only bits 10-15 are looked at, so wider values whose
// low 16 bits are a high surrogate pass too.
constexpr bool IsHighSurrogate(uint32_t unit) { return (unit & 0xFC00) == 0xD800; }
// True when (unit & 0xFC00) == 0xDC00 (the same caveat as IsHighSurrogate).
constexpr bool IsLowSurrogate(uint32_t unit) { return (unit & 0xFC00) == 0xDC00; }

// True when units[0] is a high and units[1] a low surrogate.
// REQUIRES: two units are readable at `units`.
bool IsSurrogatePair(const char16_t* units);

// Writes `value` as UTF-16 into out[0..1] and returns the number of units written:
//   0 for the value 0 (nothing written);
//   1 for any other value below 0x10000, surrogate values included;
//   2 or 0 above that: out[0] and out[1] always receive the 16-bit cuts of
//     h = ((value - 0x10000) >> 10) + 0xD800 and l = ((value - 0x10000) & 0x3FF) | 0xDC00, and the
//     result is 2 when (h & 0xFC00) == 0xD800 on the uncut 32-bit h, else 0. So every value up to
//     0x10FFFF gives 2, most larger ones 0, and a few wrap back to 2 (0x4010000, for instance).
// REQUIRES: two units are writable at `out`.
int ScalerValueToUnicode(uint32_t value, char16_t* out);

// Decodes `count` units: a count of 2 gives the pair's scalar value when units[0] is a high and
// units[1] a low surrogate, else 0; a count of 1 gives units[0] unchanged (lone surrogates
// included); any other count gives 0.
uint32_t UnicodeToScalerValue(int64_t count, const char16_t* units);

// Converts the string into scalar values, one per surrogate pair and one per other unit (a lone
// surrogate becomes its own value), and returns how many were written: 0 only for an empty
// string, never more than the string's length in units.
// REQUIRES: `out` has room for text.length() entries.
int64_t StringToScalerValues(const icu::UnicodeString& text, uint32_t* out);
int64_t StringToScalerValues(std::u16string_view text, uint32_t* out);

// True when any UTF-16 unit of `text` equals `unit`. Works on units, not scalars: a
// supplementary character cannot be searched for, and a surrogate value finds that half of a pair.
bool StringContainsCharacter(const icu::UnicodeString& text, char16_t unit);

// True when any unit of `text` is U+FE0E (text presentation) or U+FE0F (emoji presentation). No
// other variation selector counts.
bool StringContainsVariationSelector(const icu::UnicodeString& text);

// The string's UTF-16 units as a view over its own buffer (valid while `text` is unchanged).
std::u16string_view UnitsOf(const icu::UnicodeString& text);

}  // namespace lumeris
