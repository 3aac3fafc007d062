#include "store/favorites.h"

#include <string>
#include <utility>

#include "platform/preferences.h"
#include "store/horse_racing.h"
#include "store/legacy_lists.h"
#include "store/storage_version.h"
#include "store/store_keys.h"

namespace lumeris {

std::optional<plist::Value> CopyFavoritesIDArray(std::string_view identifier) {
  const std::string key = StoreKey(kFavoritesKeyPrefix, identifier);
  CFPreferencesAppSynchronize(kStoreDomain);
  std::optional<plist::Value> stored = CFPreferencesCopyAppValue(key, kStoreDomain);

  if (std::optional<plist::Array> repaired = CreateArrayWithPlainHorseRacing(stored)) {
    return plist::Value(std::move(*repaired));
  }
  if (stored) return stored;

  if (identifier != kDefaultDataStorageIdentifier) return std::nullopt;
  if (CFPreferencesGetAppBooleanValue(kFavoritesConvertedKey, kStoreDomain)) return std::nullopt;

  CFPreferencesSetAppValue(kFavoritesConvertedKey, plist::Value(true), kStoreDomain);
  std::optional<plist::Array> converted = EntityIDArrayFromOldPreferences(kOldFavoritesKey);
  SetFavoritesIDArray(converted, identifier);
  if (!converted) return std::nullopt;
  return plist::Value(std::move(*converted));
}

bool SetFavoritesIDArray(const std::optional<plist::Array>& list, std::string_view identifier) {
  CheckDataStorageVersion();
  CFPreferencesSetAppValue(StoreKey(kFavoritesKeyPrefix, identifier),
                           list ? std::optional<plist::Value>(*list) : std::nullopt, kStoreDomain);
  return CFPreferencesAppSynchronize(kStoreDomain);
}

}  // namespace lumeris
