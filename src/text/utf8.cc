#include "text/utf8.h"

#include <unicode/ustring.h>
#include <unicode/utypes.h>

#include <limits>

namespace lumeris {
namespace {

constexpr UChar32 kReplacementCharacter = 0xFFFD;
// ICU's "no substitution" marker: report ill-formed input as U_INVALID_CHAR_FOUND.
constexpr UChar32 kNoSubstitution = -1;

std::optional<icu::UnicodeString> Decode(std::string_view utf8, UChar32 substitution) {
  if (utf8.size() > static_cast<size_t>(std::numeric_limits<int32_t>::max())) return std::nullopt;
  const auto length = static_cast<int32_t>(utf8.size());
  icu::UnicodeString text;
  // UTF-16 never needs more units than UTF-8 has bytes.
  char16_t* buffer = text.getBuffer(length == 0 ? 1 : length);
  if (buffer == nullptr) return std::nullopt;
  int32_t written = 0;
  UErrorCode status = U_ZERO_ERROR;
  u_strFromUTF8WithSub(buffer, text.getCapacity(), &written, utf8.data(), length, substitution,
                       nullptr, &status);
  text.releaseBuffer(U_SUCCESS(status) ? written : 0);
  if (U_FAILURE(status)) return std::nullopt;
  return text;
}

std::optional<std::string> Encode(const icu::UnicodeString& text, UChar32 substitution) {
  std::string utf8;
  UErrorCode status = U_ZERO_ERROR;
  int32_t needed = 0;
  u_strToUTF8WithSub(nullptr, 0, &needed, text.getBuffer(), text.length(), substitution, nullptr,
                     &status);
  if (status != U_BUFFER_OVERFLOW_ERROR && U_FAILURE(status)) return std::nullopt;
  utf8.resize(static_cast<size_t>(needed));
  status = U_ZERO_ERROR;
  u_strToUTF8WithSub(utf8.data(), needed, &needed, text.getBuffer(), text.length(), substitution,
                     nullptr, &status);
  // A string filled exactly to its length reports U_STRING_NOT_TERMINATED_WARNING, a success.
  if (U_FAILURE(status)) return std::nullopt;
  return utf8;
}

}  // namespace

std::optional<icu::UnicodeString> DecodeUtf8(std::string_view utf8) {
  return Decode(utf8, kNoSubstitution);
}

icu::UnicodeString DecodeUtf8Lenient(std::string_view utf8) {
  return Decode(utf8, kReplacementCharacter).value_or(icu::UnicodeString());
}

std::optional<std::string> EncodeUtf8(const icu::UnicodeString& text) {
  if (text.isBogus()) return std::nullopt;
  return Encode(text, kNoSubstitution);
}

std::string EncodeUtf8Lenient(const icu::UnicodeString& text) {
  if (text.isBogus()) return {};
  return Encode(text, kReplacementCharacter).value_or(std::string());
}

}  // namespace lumeris
