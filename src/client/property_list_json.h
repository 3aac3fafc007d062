// Property-list values as JSON, for people who read and seed preferences from a shell.
//
// Strings, integers, reals, booleans, arrays and dictionaries map to their JSON kinds (a real
// always prints with a fraction or exponent, so 1.0 stays a real). The other kinds use the tags
// of client/json_notation.h, as every `lumeris` command does:
//   data  {"$base64": "AP8Q"} (printed), {"$hex": "00ff10"}, or the older {"$data": ...}
//   date  {"$date": "<ISO 8601 UTC>"}, e.g. "2024-05-01T12:00:00Z", fractional seconds allowed
//   a real JSON has no number for: {"$double": "nan"}; {"$int64": "-1"} and {"$uint64": "5"}
//   read as integers; a dictionary whose only key begins with "$": {"$dictionary": {...}}
// JSON null, and integers outside the signed 64-bit range, have no property-list form.
//
// Thread-safety: pure functions. Results are owned by the caller.
#pragma once

#include <nlohmann/json.hpp>

#include <optional>
#include <string>
#include <string_view>

#include "platform/property_list.h"

namespace lumeris::cli {

nlohmann::json PropertyListToJson(const plist::Value& value);

// The property-list value `json` describes; std::nullopt with the reason (naming the JSON pointer
// of the offending member) in `*error`. `*note` as for MessageValueFromJson().
std::optional<plist::Value> PropertyListFromJson(const nlohmann::json& json, std::string* error,
                                                 std::string* note = nullptr);
std::optional<plist::Value> PropertyListFromJson(const nlohmann::json& json);

// Hexadecimal digits (either case, even count) to bytes.
std::optional<plist::Data> ParseHex(std::string_view hex);

// ISO 8601 UTC text ("2024-05-01T12:00:00Z", optional fraction) and back.
std::optional<plist::Date> ParseIsoDate(std::string_view text);
std::string FormatIsoDate(plist::Date date);

}  // namespace lumeris::cli
