// JSON <-> MessageValue: how `lumeris raw` reads a request dictionary from the command line and
// how replies are printed as JSON.
//
// Plain JSON maps to the obvious kinds: object -> dictionary, array -> array, string -> string,
// true/false -> bool, null -> null, a non-negative integer -> uint64, a negative integer -> int64,
// a number with a fraction or exponent (5.0, 1e3) -> double. The tags of client/json_notation.h
// name the other kinds: {"$uint64": "5"}, {"$int64": "-1"}, {"$double": "nan"}, bytes as
// {"$base64": "AP8="} or {"$hex": "00ff"} (data), {"$dictionary": {...}}; a date has no message
// form. Printing uses the same forms ({"$base64": ...} for data), so printed JSON reads back as
// the same value; the only exception is a string that is not valid UTF-8, printed with U+FFFD in
// place of its bad bytes.
//
// Thread-safety: pure functions. Results are owned by the caller.
#pragma once

#include <nlohmann/json.hpp>

#include <optional>
#include <string>
#include <string_view>

#include "service/message_value.h"

namespace lumeris::cli {

// The message value `json` describes, or std::nullopt with the reason (naming the JSON pointer
// of the offending member, e.g. "/array/2") in `*error`. `*note`, when given, receives a
// sentence about input that was read one of two possible ways (an older "$data" tag).
std::optional<MessageValue> MessageValueFromJson(const nlohmann::json& json, std::string* error,
                                                 std::string* note = nullptr);

// Parses `text` as JSON and converts it as above; the reason for a failure of either step goes
// to `*error`.
std::optional<MessageValue> MessageValueFromJsonText(std::string_view text, std::string* error,
                                                     std::string* note = nullptr);

// The JSON form of `value`, escapes included where plain JSON would lose the kind.
nlohmann::json JsonFromMessageValue(const MessageValue& value);

// `json` as text: one line when `pretty` is false, else indented by two spaces. Invalid UTF-8
// inside strings is replaced by U+FFFD instead of failing.
std::string JsonText(const nlohmann::json& json, bool pretty);

}  // namespace lumeris::cli
