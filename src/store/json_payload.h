// The JSON payloads of the store ("skintones" and "state" in replies, "data" in a saved state):
// the compact UTF-8 text of a JSON object, converted to and from property-list dictionaries.
//
//   JsonPayload payload = ParseJsonPayload(R"({"tab":2,"VTGlobalEmojiDiversityDescribed":true})");
//   if (payload.status == JsonPayload::Status::kObject) SetLastState(payload.object, application);
//   std::string text = JsonFromDictionary(CopyLastState(application));   // {"VTGlobal...":true,"tab":2}
//
// JSON to property list: strings, booleans, arrays and objects map directly; integers become
// integers (an unsigned value above the signed 64-bit range becomes a real); other numbers become
// reals. A JSON null has no property-list form, so a payload holding one anywhere is unstorable,
// and so is a payload whose top level is not an object: the caller writes nothing for them.
//
// Property list to JSON: a value that JSON cannot express (data, a date, a real that is not
// finite) is left out (a dictionary member or array element dropped) rather than failing the
// whole text. Strings that are not valid UTF-8 are written with U+FFFD in place of the bad bytes.
//
// Thread-safety: pure. Ownership: results are new values owned by the caller.
#pragma once

#include <string>
#include <string_view>

#include "platform/property_list.h"

namespace lumeris {

struct JsonPayload {
  enum class Status {
    kObject,      // `object` holds the payload
    kNotJson,     // the text does not parse as JSON
    kUnstorable,  // JSON, but its top level is not an object or it holds a null
  };
  Status status = Status::kNotJson;
  plist::Dictionary object;
};

JsonPayload ParseJsonPayload(std::string_view text);

// The compact JSON text (no white space, keys in byte order) of `dictionary`.
std::string JsonFromDictionary(const plist::Dictionary& dictionary);

}  // namespace lumeris
