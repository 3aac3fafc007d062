// The skin-tone history of a storage identifier: which skin-tone form the user last chose for
// each emoji that has such forms, kept under "SkinTones:" + identifier as a replacement
// dictionary (normalized base emoji -> chosen variant), updated only through
// UpdateReplacementDictionary.
//
// The key made of U+1F3C7 HORSE RACING alone is never reported: horse racing never shows a
// remembered skin tone, whatever was stored.
//
// Thread-safety: every function may be called from any thread. Ownership: returned values are
// copies owned by the caller.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/property_list.h"

namespace lumeris {

// The stored history without the horse-racing key (not written back), or std::nullopt when none
// is stored (a stored value that is not a dictionary reads as none). Synchronises first.
std::optional<plist::Dictionary> CopySkinToneHistory(std::string_view identifier);

// Records the choice `item` (an entity ID). Absent or empty: the history is removed. Otherwise
// the item must decode as an entity ID whose "font" is the emoji font and whose "char" holds a
// skin-tone-capable emoji (with or without a modifier); if not, nothing is done and the result is
// false. The history as read by CopySkinToneHistory is updated with the character, written (or
// removed), synchronised, and the change notification is posted: the result is then true.
// Runs no version check.
bool SetLastSkinToneSelection(const std::optional<std::string>& item, std::string_view identifier);

}  // namespace lumeris
