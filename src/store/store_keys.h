// The names the user data store keeps in the preferences: its domain, the per-identifier and
// per-application key prefixes, the flags, and the older domains it converts from once.
//
//   std::string key = StoreKey(kRecentsKeyPrefix, identifier);   // "Recents:" + identifier
//
// Thread-safety: constants and a pure function. Ownership: StoreKey returns a new string.
#pragma once

#include <string>
#include <string_view>

namespace lumeris {

// The store's own domain (current user, any host).
inline constexpr std::string_view kStoreDomain = "com.vantorel.Lumeris";
// The storage identifier the panel uses by default; only it converts the older lists.
inline constexpr std::string_view kDefaultDataStorageIdentifier = "com.vantorel.Lumeris.DefaultDataStorage";

// Per-identifier (recents, favourites, skin tones) and per-application (state) key prefixes.
inline constexpr std::string_view kRecentsKeyPrefix = "Recents:";
inline constexpr std::string_view kFavoritesKeyPrefix = "Favorites:";
inline constexpr std::string_view kSkinTonesKeyPrefix = "SkinTones:";
inline constexpr std::string_view kStateKeyPrefix = "State:";

// The format version of the domain (absent or 0: unversioned) and the version the store writes.
inline constexpr std::string_view kStorageVersionKey = "version";
inline constexpr long kCurrentStorageVersion = 1;

// One-way flags: the older list has been converted (or the attempt made).
inline constexpr std::string_view kRecentsConvertedKey = "VTRecentsConverted";
inline constexpr std::string_view kFavoritesConvertedKey = "VTFavoritesConverted";

// The one member of a saved state that is kept once for every application.
inline constexpr std::string_view kGlobalEmojiDiversityKey = "VTGlobalEmojiDiversityDescribed";

// Older sources, read (never written) by the one-time conversions.
inline constexpr std::string_view kInputMethodDomain = "com.vantorel.SorvendiIM";
inline constexpr std::string_view kOldRecentsKey = "VTRecentItems";
inline constexpr std::string_view kOldFavoritesKey = "VTFavorites";
inline constexpr std::string_view kOlderServerDomain = "com.vantorel.SorvexServer";
inline constexpr std::string_view kOlderServerFavoritesKey = "SorvexFavorites";

// `prefix` followed by `name`, unchanged.
inline std::string StoreKey(std::string_view prefix, std::string_view name) {
  std::string key;
  key.reserve(prefix.size() + name.size());
  key.append(prefix);
  key.append(name);
  return key;
}

}  // namespace lumeris
