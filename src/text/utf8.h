// Conversions between UTF-8 std::string (text on the wire, in files and in databases) and the
// UTF-16 icu::UnicodeString used inside.
//
// Thread-safety: pure; safe on any thread.
// Ownership: results are new values.
#pragma once

#include <unicode/unistr.h>

#include <optional>
#include <string>
#include <string_view>

namespace lumeris {

// Decodes `utf8`, or std::nullopt when it is not well-formed UTF-8 (overlong forms, encoded
// surrogates, truncated sequences and bytes above 0xF4 are all rejected). An embedded 0 byte is
// decoded as U+0000.
std::optional<icu::UnicodeString> DecodeUtf8(std::string_view utf8);

// Decodes `utf8`, replacing each ill-formed sequence with U+FFFD. For text that must never be lost
// entirely (for instance strings from a damaged preference file).
icu::UnicodeString DecodeUtf8Lenient(std::string_view utf8);

// Encodes `text`, or std::nullopt when it holds an unpaired surrogate (which has no UTF-8 form).
std::optional<std::string> EncodeUtf8(const icu::UnicodeString& text);

// Encodes `text`, writing U+FFFD for each unpaired surrogate.
std::string EncodeUtf8Lenient(const icu::UnicodeString& text);

}  // namespace lumeris
