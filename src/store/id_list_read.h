// The read path that the recents and favourites lists share: synchronise the store domain, copy
// the list, repair a horse-racing entry, and — for the default storage identifier only, once —
// convert the older list that earlier releases kept.
//
//   return CopyIDArrayConvertingOnce({kRecentsKeyPrefix, kRecentsConvertedKey, kOldRecentsKey},
//                                    identifier, store_recents);
//
// Thread-safety: may be called from any thread (it goes through the preference store).
// Ownership: the returned value is a copy owned by the caller.
#pragma once

#include <functional>
#include <optional>
#include <string_view>

#include "platform/property_list.h"

namespace lumeris {

// Where one ID list lives: its key prefix, its one-way "converted" flag, and the key of the older
// list in the input method's domain.
struct IDListKeys {
  std::string_view key_prefix;
  std::string_view converted_flag;
  std::string_view old_key;
};

// The stored list of `identifier`, repaired when it holds a horse-racing entry with a modifier
// (the repair is not written back), or as stored whatever its type. With nothing stored, the
// default identifier converts the older list once: the flag is set first (so a conversion that
// finds nothing is not tried again), the result is stored with `store` and returned. Every other
// identifier gets std::nullopt.
std::optional<plist::Value> CopyIDArrayConvertingOnce(
    const IDListKeys& keys, std::string_view identifier,
    const std::function<void(std::optional<plist::Array>)>& store);

}  // namespace lumeris
