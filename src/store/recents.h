// The recents list of a storage identifier: entity ID strings, most recent first, kept under
// "Recents:" + identifier in the store domain, with no upper bound on its length.
//
//   AddRecentID(item, "com.vantorel.Lumeris.DefaultDataStorage");
//   std::optional<plist::Value> recents = CopyRecentsIDArray(identifier);
//
// Every read synchronises the domain first and every store synchronises after; nothing is
// cached. Every store of the list posts the change notification exactly once, and passes the
// list's first entry to the skin-tone history (so storing an empty list removes the history).
//
// Thread-safety: every function may be called from any thread. The read-modify-write of
// AddRecentID is serialised inside the process (one lock for the store domain), so concurrent
// adds of one process all survive; against a writer in another process it is not atomic: the
// last store wins, while other keys of the domain are never lost. Ownership: returned values are copies owned by the caller.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/property_list.h"

namespace lumeris {

// The stored list, or std::nullopt. Runs the version check first. A stored list holding a
// horse-racing entry with a modifier comes back repaired (not written back); any other stored
// value comes back as it is, whatever its type. With nothing stored, the default identifier
// converts the older recents list once (setting "VTRecentsConverted" first), stores the result
// with SetRecentsIDArray and returns it; every other identifier returns std::nullopt.
std::optional<plist::Value> CopyRecentsIDArray(std::string_view identifier);

// Stores `list` (std::nullopt removes the key; an empty list is stored empty) after the version
// check, synchronises, records the first entry in the skin-tone history (SetLastSkinToneSelection
// with the first entry, or with nothing when the list is empty or absent) and posts the change
// notification once: the history step posts it when it wrote, otherwise this function does.
// Returns the history step's result. A first entry that is not a string counts as an entry the
// history cannot use: the history is left alone.
bool SetRecentsIDArray(std::optional<plist::Array> list, std::string_view identifier);

// Puts `item` at the front of the list and stores it. When an entry equal to `item` under
// IsEqualRecentEntityID exists, the first such entry is taken and every entry whose text is
// identical to its text is removed first (entries equal only under the rule but with other text
// stay). The list is never trimmed.
void AddRecentID(const std::string& item, std::string_view identifier);

// Stores an empty list (and so removes the skin-tone history of `identifier`).
void ClearRecents(std::string_view identifier);

}  // namespace lumeris
