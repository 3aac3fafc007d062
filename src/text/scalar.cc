#include "text/scalar.h"

namespace lumeris {

bool IsSurrogatePair(const char16_t* units) {
  return IsHighSurrogate(units[0]) && IsLowSurrogate(units[1]);
}

int ScalerValueToUnicode(uint32_t value, char16_t* out) {
  if (value < 0x10000) {
    if (value == 0) return 0;
    out[0] = static_cast<char16_t>(value);
    return 1;
  }
  // Unsigned arithmetic on purpose: values far above U+10FFFF wrap exactly like the 32-bit
  // computation the callers rely on.
  const uint32_t high = ((value - 0x10000) >> 10) + 0xD800;
  const uint32_t low = ((value - 0x10000) & 0x3FF) | 0xDC00;
  out[0] = static_cast<char16_t>(high);
  out[1] = static_cast<char16_t>(low);
  return IsHighSurrogate(high) ? 2 : 0;
}

uint32_t UnicodeToScalerValue(int64_t count, const char16_t* units) {
  if (count == 1) return units[0];
  if (count == 2 && IsSurrogatePair(units)) {
    return (static_cast<uint32_t>(units[0]) << 10) + units[1] - 0x35FDC00;
  }
  return 0;
}

int64_t StringToScalerValues(std::u16string_view text, uint32_t* out) {
  const size_t n = text.size();
  int64_t written = 0;
  size_t i = 0;
  while (i < n) {
    const size_t step = (n - i >= 2 && IsSurrogatePair(text.data() + i)) ? 2 : 1;
    out[written++] = UnicodeToScalerValue(static_cast<int64_t>(step), text.data() + i);
    i += step;
  }
  return written;
}

int64_t StringToScalerValues(const icu::UnicodeString& text, uint32_t* out) {
  return StringToScalerValues(UnitsOf(text), out);
}

bool StringContainsCharacter(const icu::UnicodeString& text, char16_t unit) {
  return UnitsOf(text).find(unit) != std::u16string_view::npos;
}

bool StringContainsVariationSelector(const icu::UnicodeString& text) {
  for (char16_t unit : UnitsOf(text)) {
    if ((unit & 0xFFFE) == 0xFE0E) return true;
  }
  return false;
}

std::u16string_view UnitsOf(const icu::UnicodeString& text) {
  // getBuffer() is null for a bogus string; treat that as empty.
  const char16_t* buffer = text.getBuffer();
  if (buffer == nullptr) return {};
  return {buffer, static_cast<size_t>(text.length())};
}

}  // namespace lumeris
