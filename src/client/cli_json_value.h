// JSON <-> MessageValue: how `lumeris raw` reads a request dictionary from the command line and
// how replies are printed as JSON.
//
// Plain JSON maps to the obvious kinds: object -> dictionary, array -> array, string -> string,
// true/false -> bool, null -> null, a non-negative integer -> uint64, a negative integer -> int64,
// a number with a fraction or exponent (5.0, 1e3) -> double. Where JSON cannot say which kind
// is meant, a one-member object names it (a typed escape):
//
//   {"$uint64": "18446744073709551615"}   uint64 (decimal text, or a JSON integer)
//   {"$int64": "-1"}                      int64 (decimal text, or a JSON integer)
//   {"$double": 5}                        double (a JSON number, or "nan", "inf", "-inf")
//   {"$data": "aGk="}                     data, as padded base64 ("" for zero bytes)
//   {"$dictionary": {"$data": "x"}}       a dictionary taken literally: its own keys are never
//                                         read as escapes (for a real key that begins with "$")
//
// Any other one-member object whose key begins with "$" is refused (a misspelt escape would
// otherwise travel as a dictionary). Printing uses the same forms, so printed JSON reads back
// as the same value; the only exception is a string that is not valid UTF-8, printed with
// U+FFFD in place of its bad bytes.
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
// of the offending member, e.g. "/array/2") in `*error`.
std::optional<MessageValue> MessageValueFromJson(const nlohmann::json& json, std::string* error);

// Parses `text` as JSON and converts it as above; the reason for a failure of either step goes
// to `*error`.
std::optional<MessageValue> MessageValueFromJsonText(std::string_view text, std::string* error);

// The JSON form of `value`, escapes included where plain JSON would lose the kind.
nlohmann::json JsonFromMessageValue(const MessageValue& value);

// `json` as text: one line when `pretty` is false, else indented by two spaces. Invalid UTF-8
// inside strings is replaced by U+FFFD instead of failing.
std::string JsonText(const nlohmann::json& json, bool pretty);

}  // namespace lumeris::cli
