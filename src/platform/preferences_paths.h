// Where preference files live: one property-list file per (domain, user scope, host scope).
//
//   current user, any host:      $XDG_CONFIG_HOME/vantorel/Preferences/<domain>.plist
//   current user, current host:  $XDG_CONFIG_HOME/vantorel/Preferences/ByHost/<domain>.<host-id>.plist
//   any user:                    the same layouts under the first entry of $XDG_CONFIG_DIRS
//
// XDG_CONFIG_HOME (default $HOME/.config) and XDG_CONFIG_DIRS (default /etc/xdg) are read at
// every call, so a test or a program that changes them is followed at once. The host id is the
// first line of /etc/machine-id, or the host name when that file is missing; it is read once.
//
// Thread-safety: all functions may be called from any thread (they only read the environment).
#pragma once

#include <filesystem>
#include <optional>
#include <string>
#include <string_view>

namespace lumeris {

enum class PreferencesUser { kCurrentUser, kAnyUser };
enum class PreferencesHost { kAnyHost, kCurrentHost };

inline constexpr PreferencesUser kCFPreferencesCurrentUser = PreferencesUser::kCurrentUser;
inline constexpr PreferencesUser kCFPreferencesAnyUser = PreferencesUser::kAnyUser;
inline constexpr PreferencesHost kCFPreferencesAnyHost = PreferencesHost::kAnyHost;
inline constexpr PreferencesHost kCFPreferencesCurrentHost = PreferencesHost::kCurrentHost;
// The domain that holds the values shared by every application.
inline constexpr std::string_view kCFPreferencesAnyApplication = ".GlobalPreferences";

// The file that holds `domain` in the given scope; std::nullopt when the domain name cannot
// name a file (empty, ".", "..", or containing '/' or a NUL character) or no configuration
// directory can be found (neither XDG_CONFIG_HOME nor HOME set).
std::optional<std::filesystem::path> PreferencesFilePath(std::string_view domain, PreferencesUser user,
                                                         PreferencesHost host);

// The first line of /etc/machine-id, else the host name.
const std::string& PreferencesHostId();

}  // namespace lumeris
