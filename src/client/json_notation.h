// The tagged JSON notation every `lumeris` subcommand reads and prints: `raw` and `--json` for
// message values (client/cli_json_value.h), `defaults` for property-list values
// (client/property_list_json.h). Where plain JSON cannot say which kind is meant, a one-member
// object whose key begins with "$" (a tag) names it:
//
//   {"$base64": "AP8="}        bytes, as padded base64 (what every command prints)
//   {"$hex": "00ff"}           bytes, as hexadecimal digits (either case)
//   {"$data": "..."}           bytes in the older untagged form, read only: hexadecimal when the
//                              text is hex digits (what `defaults` printed), else base64 (what
//                              `raw` printed); text that is both gets a note saying so
//   {"$uint64": "18446744073709551615"}, {"$int64": "-1"}, {"$double": "nan"}
//   {"$date": "2024-05-01T12:00:00Z"}
//   {"$dictionary": {...}}     a dictionary whose keys are taken literally
//
// Any other one-member object whose key begins with "$" is refused, so that a misspelt tag is
// never stored or sent as a dictionary.
//
// Thread-safety: pure functions. Results are owned by the caller.
#pragma once

#include <nlohmann/json.hpp>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace lumeris::cli {

inline constexpr std::string_view kBase64Tag = "$base64";
inline constexpr std::string_view kHexTag = "$hex";
inline constexpr std::string_view kDataTag = "$data";
inline constexpr std::string_view kUint64Tag = "$uint64";
inline constexpr std::string_view kInt64Tag = "$int64";
inline constexpr std::string_view kDoubleTag = "$double";
inline constexpr std::string_view kDateTag = "$date";
inline constexpr std::string_view kDictionaryTag = "$dictionary";

// The tag of `json` when it is a one-member object whose key begins with "$", else empty.
std::string_view TagOf(const nlohmann::json& json);

// {"<tag>": value}.
nlohmann::json Tagged(std::string_view tag, nlohmann::json value);

// True for the three tags that hold bytes.
bool IsBytesTag(std::string_view tag);

// The bytes a bytes tag holds; std::nullopt with the reason in `*error` when the text is not of
// its form. `*note` receives a sentence when "$data" text could be read both ways.
std::optional<std::vector<std::uint8_t>> BytesFromTag(std::string_view tag, const nlohmann::json& text,
                                                      std::string* error, std::string* note);

// {"$base64": "<padded base64>"}.
nlohmann::json BytesJson(const std::vector<std::uint8_t>& bytes);

// The number a "$double" tag holds: a JSON number, or "nan", "inf", "-inf".
std::optional<double> DoubleFromTag(const nlohmann::json& value);
// A double as JSON: a number, or the "$double" tag for the values JSON has no number for.
nlohmann::json DoubleJson(double value);

// The integer a "$uint64" / "$int64" tag holds: decimal text or a JSON integer in range.
std::optional<std::uint64_t> Uint64FromTag(const nlohmann::json& value);
std::optional<std::int64_t> Int64FromTag(const nlohmann::json& value);

// The reason refusing an unknown tag gives, naming the known ones.
std::string UnknownTagReason();

// Appends "/<member>" to a JSON pointer; the whole value reads as "the value".
std::string DescribePointer(const std::string& pointer);

}  // namespace lumeris::cli
