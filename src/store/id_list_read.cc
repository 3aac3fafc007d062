#include "store/id_list_read.h"

#include <string>
#include <utility>

#include "platform/preferences.h"
#include "store/horse_racing.h"
#include "store/legacy_lists.h"
#include "store/store_keys.h"

namespace lumeris {

std::optional<plist::Value> CopyIDArrayConvertingOnce(
    const IDListKeys& keys, std::string_view identifier,
    const std::function<void(std::optional<plist::Array>)>& store) {
  const std::string key = StoreKey(keys.key_prefix, identifier);
  CFPreferencesAppSynchronize(kStoreDomain);
  std::optional<plist::Value> stored = CFPreferencesCopyAppValue(key, kStoreDomain);

  if (std::optional<plist::Array> repaired = CreateArrayWithPlainHorseRacing(stored)) {
    return plist::Value(std::move(*repaired));
  }
  if (stored) return stored;

  if (identifier != kDefaultDataStorageIdentifier) return std::nullopt;
  if (CFPreferencesGetAppBooleanValue(keys.converted_flag, kStoreDomain)) return std::nullopt;

  // The flag goes first, so the conversion is tried once only, even when it yields nothing.
  CFPreferencesSetAppValue(keys.converted_flag, plist::Value(true), kStoreDomain);
  std::optional<plist::Array> converted = EntityIDArrayFromOldPreferences(keys.old_key);
  store(converted);
  if (!converted) return std::nullopt;
  return plist::Value(std::move(*converted));
}

}  // namespace lumeris
