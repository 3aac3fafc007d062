#include "store/favorites.h"

#include <string>
#include <utility>

#include "platform/preferences.h"
#include "store/id_list_read.h"
#include "store/storage_version.h"
#include "store/store_keys.h"

namespace lumeris {

std::optional<plist::Value> CopyFavoritesIDArray(std::string_view identifier) {
  // Unlike recents, reading favourites runs no version check.
  return CopyIDArrayConvertingOnce(
      {kFavoritesKeyPrefix, kFavoritesConvertedKey, kOldFavoritesKey}, identifier,
      [identifier](std::optional<plist::Array> list) { SetFavoritesIDArray(list, identifier); });
}

bool SetFavoritesIDArray(const std::optional<plist::Array>& list, std::string_view identifier) {
  CheckDataStorageVersion();
  CFPreferencesSetAppValue(StoreKey(kFavoritesKeyPrefix, identifier),
                           list ? std::optional<plist::Value>(*list) : std::nullopt, kStoreDomain);
  return CFPreferencesAppSynchronize(kStoreDomain);
}

}  // namespace lumeris
