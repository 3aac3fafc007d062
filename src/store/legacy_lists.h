// The one-time conversion of the lists older releases kept: an array of Vistrel items (the older
// item dictionaries) in the input-method domain, turned into entity ID strings.
//
//   std::optional<plist::Array> ids = EntityIDArrayFromOldPreferences(kOldRecentsKey);
//
// The older domains are only read, never written or cleaned up.
//
// Thread-safety: may be called from any thread. Ownership: the result is a new array (of
// strings) owned by the caller.
#pragma once

#include <optional>
#include <string_view>

#include "entity/vistrel_item.h"
#include "platform/property_list.h"

namespace lumeris {

// Synchronises "com.vantorel.SorvendiIM" and reads `old_key` there; for "VTFavorites" only, when
// that key is absent, reads "SorvexFavorites" of "com.vantorel.SorvexServer" instead (without
// synchronising that domain). Each element of the array found is converted in order with
// EntityIDFromVistrelItem. Returns std::nullopt when no array is found or it yields no entry.
std::optional<plist::Array> EntityIDArrayFromOldPreferences(std::string_view old_key);

// The Vistrel item a stored element describes: "EntityID", "String" and "Font" when they are
// strings, "Glyph" when it is a number (cut to 32 bits). A member of another type, or an element
// that is not a dictionary at all, reads as absent.
VistrelItem VistrelItemFromPropertyList(const plist::Value& element);

}  // namespace lumeris
