// The two conversions between the service's lists of strings (entity IDs, category names) and
// message arrays.
//
// An empty or absent list travels as null, never as an empty array; a receiver accepts both.
// Reading, elements that are not strings, and strings that do not convert (ConvertedString),
// are skipped, so an array of only non-strings becomes
// an empty list (which the data store keeps as an empty list) while a missing value, a value of
// another kind or an empty array becomes an absent list (which the data store treats as
// "remove").
//
// Thread-safety: pure functions. Ownership: results are new values owned by the caller.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "service/message_value.h"

namespace lumeris {

using StringList = std::optional<std::vector<std::string>>;

// A message string as the service uses it: the text when it is well-formed UTF-8 without a
// NUL character, else absent. Every string the service takes from a request passes through
// this, so what it stores is exactly what it can later answer and what a property list keeps.
std::optional<std::string> ConvertedString(const std::string* text);

// Null for an absent or empty list; otherwise an array of its strings, in order.
MessageValue CreateXPCArrayFromStringArray(const StringList& strings);

// Absent for nullptr, a non-array or an empty array; otherwise the array's string elements in
// order (others and strings that do not convert skipped), which may be an empty list.
StringList StringArrayFromXPCArray(const MessageValue* value);

}  // namespace lumeris
