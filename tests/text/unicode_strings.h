// Test helpers: UTF-16 strings from scalar values or raw code units, and icu::UnicodeString shown
// in failure messages as its code units.
#pragma once

#include <unicode/unistr.h>

#include <initializer_list>
#include <ostream>

namespace lumeris::testing {

// The string of the given scalar values, encoded by ICU (independently of the code under test).
inline icu::UnicodeString Scalars(std::initializer_list<uint32_t> values) {
  icu::UnicodeString text;
  for (uint32_t value : values) text.append(static_cast<UChar32>(value));
  return text;
}

// The string of exactly these code units (lone surrogates included).
inline icu::UnicodeString Units(std::initializer_list<char16_t> units) {
  return icu::UnicodeString(units.begin(), static_cast<int32_t>(units.size()));
}

}  // namespace lumeris::testing

U_NAMESPACE_BEGIN
// Shows strings as their code units, e.g. [D83D DC4D], so surrogates and selectors are visible.
inline void PrintTo(const UnicodeString& text, std::ostream* out) {
  *out << '[' << std::hex << std::uppercase;
  for (int32_t i = 0; i < text.length(); ++i) *out << (i ? " " : "") << +text.charAt(i);
  *out << std::dec << ']';
}
U_NAMESPACE_END
