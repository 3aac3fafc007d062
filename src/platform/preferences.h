// The preference functions the system calls, on the process-wide PreferenceStore.
//
//   CFPreferencesSetAppValue("VTStartAsLargeWindowTemporarily", plist::Value(path), "com.vantorel.SorvendiIM");
//   bool ok = CFPreferencesAppSynchronize("com.vantorel.SorvendiIM");
//
// "App" functions work on (current user, any host). Setting changes this process's view at
// once (std::nullopt removes the key); the file is written by the next synchronise. A value of
// the wrong type reads as absent: the integer and boolean readers give 0 / false and set
// `*valid` (when given) to whether the key held an integer / a boolean. See preference_store.h
// for synchronisation, locking and the corrupt-file rule.
//
// Thread-safety: every function may be called from any thread. Returned values are copies
// owned by the caller.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/preferences_paths.h"
#include "platform/property_list.h"

namespace lumeris {

std::optional<plist::Value> CFPreferencesCopyAppValue(std::string_view key, std::string_view application_id);
void CFPreferencesSetAppValue(std::string_view key, std::optional<plist::Value> value,
                              std::string_view application_id);
bool CFPreferencesAppSynchronize(std::string_view application_id);
std::int64_t CFPreferencesGetAppIntegerValue(std::string_view key, std::string_view application_id,
                                             bool* valid = nullptr);
bool CFPreferencesGetAppBooleanValue(std::string_view key, std::string_view application_id, bool* valid = nullptr);
std::vector<std::string> CFPreferencesCopyKeyList(std::string_view application_id, PreferencesUser user,
                                                  PreferencesHost host);
std::optional<plist::Value> CFPreferencesCopyValue(std::string_view key, std::string_view application_id,
                                                   PreferencesUser user, PreferencesHost host);

}  // namespace lumeris
