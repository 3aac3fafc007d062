#include "store/saved_state.h"

#include <string>

#include "platform/preferences.h"
#include "store/change_notification.h"
#include "store/storage_version.h"
#include "store/store_keys.h"

namespace lumeris {

plist::Dictionary CopyLastState(std::optional<std::string_view> application) {
  plist::Dictionary state;
  CFPreferencesAppSynchronize(kStoreDomain);
  if (std::optional<plist::Value> stored =
          application ? CFPreferencesCopyAppValue(StoreKey(kStateKeyPrefix, *application), kStoreDomain)
                      : std::nullopt) {
    if (const plist::Dictionary* members = stored->AsDictionary()) state = *members;
  }
  if (std::optional<plist::Value> global = CFPreferencesCopyAppValue(kGlobalEmojiDiversityKey, kStoreDomain)) {
    state.insert_or_assign(std::string(kGlobalEmojiDiversityKey), std::move(*global));
  }
  return state;
}

void SetLastState(const std::optional<plist::Dictionary>& state, std::string_view application) {
  CheckDataStorageVersion();
  bool notify = false;
  if (state) {
    plist::Dictionary rest = *state;
    if (auto global = rest.find(kGlobalEmojiDiversityKey); global != rest.end()) {
      CFPreferencesSetAppValue(kGlobalEmojiDiversityKey, std::move(global->second), kStoreDomain);
      rest.erase(global);
      notify = true;
    }
    if (!rest.empty()) {
      CFPreferencesSetAppValue(StoreKey(kStateKeyPrefix, application), plist::Value(std::move(rest)),
                               kStoreDomain);
    }
  }
  CFPreferencesAppSynchronize(kStoreDomain);
  if (notify) PostRecentsChangedNotification();
}

}  // namespace lumeris
