#include "store/storage_version.h"

#include <cstdint>
#include <string>

#include "platform/preferences.h"
#include "store/store_keys.h"

namespace lumeris {

void CheckDataStorageVersion() {
  if (CFPreferencesGetAppIntegerValue(kStorageVersionKey, kStoreDomain) != 0) return;
  for (const std::string& key :
       CFPreferencesCopyKeyList(kStoreDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost)) {
    CFPreferencesSetAppValue(key, std::nullopt, kStoreDomain);
  }
  CFPreferencesSetAppValue(kStorageVersionKey, plist::Value(std::int64_t{kCurrentStorageVersion}),
                           kStoreDomain);
}

}  // namespace lumeris
