// The horse-racing repair of stored lists: an entry for U+1F3C7 HORSE RACING that carries a
// modifier inside its quoted character text (in a current-form entity ID, the JSON string value
// of "char") is read back in the plain form. Horse racing is never shown with a skin tone.
//
// The repair is made on every read and never written back; only the first entry holding the
// sequence is examined, and only one span in it is repaired. Both limits are deliberate.
//
// Thread-safety: pure. Ownership: the result is a new array owned by the caller.
#pragma once

#include <optional>

#include "platform/property_list.h"

namespace lumeris {

// The repaired copy of `stored`, or std::nullopt when nothing was repaired: when `stored` is
// absent, not an array or empty; when no string entry holds a quotation mark directly followed
// by U+1F3C7; when that first such entry has no closing quotation mark after it; or when the
// quoted span is already the plain form. Otherwise the first such entry has the span from the
// opening to the closing quotation mark replaced by quotation mark, U+1F3C7, quotation mark.
std::optional<plist::Array> CreateArrayWithPlainHorseRacing(const std::optional<plist::Value>& stored);

}  // namespace lumeris
