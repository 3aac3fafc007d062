// The favourites list of a storage identifier: entity ID strings in the order the client gives,
// kept under "Favorites:" + identifier in the store domain, with no upper bound.
//
// The recents list's companion, different on purpose in three ways: reading never runs the
// version check, storing posts no change notification, and storing never touches the skin-tone
// history.
//
// Thread-safety: every function may be called from any thread. Ownership: returned values are
// copies owned by the caller.
#pragma once

#include <optional>
#include <string_view>

#include "platform/property_list.h"

namespace lumeris {

// The stored list, or std::nullopt; synchronises first, never wipes. The horse-racing repair
// applies as for recents (not written back). With nothing stored, the default identifier
// converts the older favourites once ("VTFavorites" of the input-method domain, else
// "SorvexFavorites" of the older server domain; "VTFavoritesConverted" is set first), stores
// the result with SetFavoritesIDArray and returns it; every other identifier gets std::nullopt.
std::optional<plist::Value> CopyFavoritesIDArray(std::string_view identifier);

// Stores `list` (std::nullopt removes the key; an empty list is stored empty) after the version
// check and returns the result of the synchronise.
bool SetFavoritesIDArray(const std::optional<plist::Array>& list, std::string_view identifier);

}  // namespace lumeris
