// Reading and writing property lists (binary "bplist00" and XML) with libplist.
//
//   std::optional<plist::Value> info = plist::ReadPropertyListFile(dir / "Info.plist");
//   std::vector<std::uint8_t> bytes = plist::SerializeBinaryPropertyList(*info);
//
// Failures are values: a document that does not parse, or holds a type that Value cannot
// represent (a keyed-archive UID), reads as std::nullopt; nothing here throws or aborts on
// bad input. Returned values and buffers are owned by the caller.
//
// Limits of the encoding, by design:
// - Integers are signed 64-bit. An unsigned integer above INT64_MAX (which only the binary
//   format's 16-byte form can hold) is read as its two's-complement 64-bit value, i.e. it
//   wraps to a negative number; libplist does not say whether a stored integer was unsigned.
// - Dates must lie within +/-2^31 seconds of 2001-01-01 (clamped to that range when written).
//   The binary format keeps microseconds; XML keeps whole seconds (ISO 8601, UTC). A date less
//   than one second before 2001-01-01 reads back from binary without its sign.
// - Strings and dictionary keys must be well-formed UTF-8 without NUL (IsPropertyListText):
//   the serializers never shorten or alter one; a value holding any other string is not
//   written at all (the result is empty).
// - Inputs over 4 GiB, and containers nested deeper than kMaxPropertyListDepth, do not parse.
//
// Thread-safety: every function may be called from any thread at the same time.
#pragma once

#include <cstdint>
#include <filesystem>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "platform/property_list.h"

namespace lumeris::plist {

inline constexpr int kMaxPropertyListDepth = 256;

// Whether `text` is well-formed UTF-8 holding no NUL character: the strings a property list
// keeps exactly.
bool IsPropertyListText(std::string_view text);

// Parses a binary or XML property list (the format is told by the first bytes).
std::optional<Value> ParsePropertyList(std::span<const std::uint8_t> bytes);
// The same through libplist alone, without the direct reader of common binary documents
// (binary_property_list_reader.h) that ParsePropertyList tries first; for comparing the two.
std::optional<Value> ParsePropertyListWithLibplist(std::span<const std::uint8_t> bytes);

// Reads and parses a file; std::nullopt when it is missing, unreadable or does not parse.
std::optional<Value> ReadPropertyListFile(const std::filesystem::path& path);

// Both return an empty result when `value` holds a string that IsPropertyListText rejects.
std::vector<std::uint8_t> SerializeBinaryPropertyList(const Value& value);
std::string SerializeXmlPropertyList(const Value& value);

}  // namespace lumeris::plist
