#include "text/code_string.h"

#include <unicode/uchar.h>

#include <array>
#include <cstring>
#include <string_view>

#include "text/scalar.h"
#include "text/utf8.h"

namespace lumeris {
namespace {

constexpr size_t kMaxNumbers = 40;
constexpr char16_t kSeparators[] = {u'+', u' ', u','};

bool IsWhiteSpace(char16_t unit) { return u_isUWhiteSpace(unit); }

int HexDigitValue(char16_t unit) {
  if (unit >= u'0' && unit <= u'9') return unit - u'0';
  if (unit >= u'a' && unit <= u'f') return unit - u'a' + 10;
  if (unit >= u'A' && unit <= u'F') return unit - u'A' + 10;
  return -1;
}

struct HexReading {
  uint32_t value;
  size_t end;  // index just past the last digit
};

// Reads a hexadecimal number at the start of `text`: leading white space and line breaks are
// skipped, an optional "0x" or "0X" prefix is accepted when a digit follows it, and the digits of
// either case are read into 32 bits, a value that overflows reading as 0xFFFFFFFF. Fails when no
// digit is found. What follows the digits is left to the caller.
std::optional<HexReading> ReadHexNumber(std::u16string_view text) {
  size_t i = 0;
  while (i < text.size() && IsWhiteSpace(text[i])) ++i;
  if (i + 2 < text.size() && text[i] == u'0' && (text[i + 1] == u'x' || text[i + 1] == u'X') &&
      HexDigitValue(text[i + 2]) >= 0) {
    i += 2;
  }
  const size_t digits_start = i;
  uint64_t value = 0;
  for (; i < text.size(); ++i) {
    const int digit = HexDigitValue(text[i]);
    if (digit < 0) break;
    value = value > 0xFFFFFFFFu ? value : (value << 4) | static_cast<uint64_t>(digit);
  }
  if (i == digits_start) return std::nullopt;
  const uint32_t clamped = value > 0xFFFFFFFFu ? 0xFFFFFFFFu : static_cast<uint32_t>(value);
  return HexReading{clamped, i};
}

bool IsAllWhiteSpace(std::u16string_view text) {
  for (char16_t unit : text) {
    if (!IsWhiteSpace(unit)) return false;
  }
  return true;
}

// `code` with every "u+" (any letter case) replaced by one space.
icu::UnicodeString WithoutUPlusMarkers(std::u16string_view code) {
  icu::UnicodeString result;
  for (size_t i = 0; i < code.size(); ++i) {
    if ((code[i] == u'u' || code[i] == u'U') && i + 1 < code.size() && code[i + 1] == u'+') {
      result.append(u' ');
      ++i;
    } else {
      result.append(code[i]);
    }
  }
  return result;
}

// Reads the numbers of the parts of `text` split at `separator`, skipping empty parts and stopping
// at the first unreadable part or after kMaxNumbers numbers. Returns how many were read, or
// std::nullopt when the split gives fewer than two parts.
std::optional<size_t> ReadSeparatedNumbers(std::u16string_view text, char16_t separator,
                                           std::array<uint32_t, kMaxNumbers>& numbers) {
  if (text.find(separator) == std::u16string_view::npos) return std::nullopt;
  size_t count = 0;
  size_t start = 0;
  while (count < kMaxNumbers) {
    const size_t end = text.find(separator, start);
    const std::u16string_view part =
        text.substr(start, end == std::u16string_view::npos ? std::u16string_view::npos : end - start);
    if (!part.empty()) {
      const std::optional<HexReading> reading = ReadHexNumber(part);
      if (!reading) break;
      numbers[count++] = reading->value;
    }
    if (end == std::u16string_view::npos) break;
    start = end + 1;
  }
  return count;
}

// The numbers as the bytes of a 0-terminated UTF-8 string, decoded; std::nullopt when a number is
// above 0xFF or the bytes are not valid UTF-8.
std::optional<icu::UnicodeString> DecodeNumbersAsUtf8(const uint32_t* numbers, size_t count) {
  char bytes[kMaxNumbers + 1];
  for (size_t i = 0; i < count; ++i) {
    if (numbers[i] > 0xFF) return std::nullopt;
    bytes[i] = static_cast<char>(numbers[i]);
  }
  bytes[count] = '\0';
  return DecodeUtf8(std::string_view(bytes, std::strlen(bytes)));
}

// Reads the whole of `text` as one number followed only by white space.
std::optional<icu::UnicodeString> DecodeSingleNumber(std::u16string_view text) {
  const std::optional<HexReading> reading = ReadHexNumber(text);
  if (!reading || !IsAllWhiteSpace(text.substr(reading->end))) return std::nullopt;
  const uint32_t value = reading->value;
  if (value == 0) return std::nullopt;
  char16_t units[2];
  const int count = ScalerValueToUnicode(value, units);
  if (count == 0) return std::nullopt;
  return icu::UnicodeString(units, count);
}

}  // namespace

std::optional<icu::UnicodeString> StringFromUnicodeCodeString(const icu::UnicodeString& code) {
  const icu::UnicodeString spaced = WithoutUPlusMarkers(UnitsOf(code));
  const std::u16string_view text = UnitsOf(spaced);
  std::optional<icu::UnicodeString> result;
  std::array<uint32_t, kMaxNumbers> numbers;
  for (char16_t separator : kSeparators) {
    const std::optional<size_t> count = ReadSeparatedNumbers(text, separator, numbers);
    if (!count || *count == 0) continue;
    // A surrogate pair may replace an earlier result; a list cut at kMaxNumbers is never a pair.
    if (*count == 2 && IsHighSurrogate(numbers[0]) && IsLowSurrogate(numbers[1])) {
      const char16_t pair[2] = {static_cast<char16_t>(numbers[0]),
                                static_cast<char16_t>(numbers[1])};
      result = icu::UnicodeString(pair, 2);
    }
    if (!result) result = DecodeNumbersAsUtf8(numbers.data(), *count);
  }
  if (!result) result = DecodeSingleNumber(text);
  return result;
}

}  // namespace lumeris
