#include "platform/preferences.h"

#include <utility>

#include "platform/preference_store.h"

namespace lumeris {

std::optional<plist::Value> CFPreferencesCopyAppValue(std::string_view key, std::string_view application_id) {
  return PreferenceStore::Shared().CopyValue(key, application_id, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
}

void CFPreferencesSetAppValue(std::string_view key, std::optional<plist::Value> value,
                              std::string_view application_id) {
  PreferenceStore::Shared().SetValue(key, std::move(value), application_id, kCFPreferencesCurrentUser,
                                     kCFPreferencesAnyHost);
}

bool CFPreferencesAppSynchronize(std::string_view application_id) {
  return PreferenceStore::Shared().Synchronize(application_id, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
}

std::int64_t CFPreferencesGetAppIntegerValue(std::string_view key, std::string_view application_id, bool* valid) {
  std::optional<plist::Value> value = CFPreferencesCopyAppValue(key, application_id);
  const std::int64_t* integer = value ? value->AsInteger() : nullptr;
  if (valid != nullptr) *valid = integer != nullptr;
  return integer ? *integer : 0;
}

bool CFPreferencesGetAppBooleanValue(std::string_view key, std::string_view application_id, bool* valid) {
  std::optional<plist::Value> value = CFPreferencesCopyAppValue(key, application_id);
  const bool* flag = value ? value->AsBool() : nullptr;
  if (valid != nullptr) *valid = flag != nullptr;
  return flag ? *flag : false;
}

std::vector<std::string> CFPreferencesCopyKeyList(std::string_view application_id, PreferencesUser user,
                                                  PreferencesHost host) {
  return PreferenceStore::Shared().CopyKeyList(application_id, user, host);
}

std::optional<plist::Value> CFPreferencesCopyValue(std::string_view key, std::string_view application_id,
                                                   PreferencesUser user, PreferencesHost host) {
  return PreferenceStore::Shared().CopyValue(key, application_id, user, host);
}

}  // namespace lumeris
