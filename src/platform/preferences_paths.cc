#include "platform/preferences_paths.h"

#include <unistd.h>

#include <cstdlib>
#include <fstream>

namespace lumeris {
namespace {

std::string_view Env(const char* name) {
  const char* value = std::getenv(name);
  return value ? std::string_view(value) : std::string_view();
}

// XDG base directories must be absolute; the XDG Base Directory rules say a relative value is
// ignored.
bool IsAbsolute(std::string_view path) { return !path.empty() && path.front() == '/'; }

std::optional<std::filesystem::path> ConfigRoot(PreferencesUser user) {
  if (user == PreferencesUser::kAnyUser) {
    std::string_view dirs = Env("XDG_CONFIG_DIRS");
    std::string_view first = dirs.substr(0, dirs.find(':'));
    return std::filesystem::path(IsAbsolute(first) ? first : std::string_view("/etc/xdg"));
  }
  std::string_view config_home = Env("XDG_CONFIG_HOME");
  if (IsAbsolute(config_home)) return std::filesystem::path(config_home);
  std::string_view home = Env("HOME");
  if (home.empty()) return std::nullopt;
  return std::filesystem::path(home) / ".config";
}

bool IsValidDomain(std::string_view domain) {
  return !domain.empty() && domain != "." && domain != ".." &&
         domain.find_first_of(std::string_view("/\0", 2)) == std::string_view::npos;
}

std::string ReadHostId() {
  std::ifstream in("/etc/machine-id");
  std::string line;
  if (in && std::getline(in, line) && !line.empty()) return line;
  char name[256] = {};
  if (gethostname(name, sizeof name - 1) == 0 && name[0] != '\0') return name;
  return "localhost";
}

}  // namespace

std::optional<std::filesystem::path> PreferencesFilePath(std::string_view domain, PreferencesUser user,
                                                         PreferencesHost host) {
  if (!IsValidDomain(domain)) return std::nullopt;
  std::optional<std::filesystem::path> root = ConfigRoot(user);
  if (!root) return std::nullopt;
  std::filesystem::path dir = *root / "vantorel" / "Preferences";
  if (host == PreferencesHost::kAnyHost) return dir / (std::string(domain) + ".plist");
  return dir / "ByHost" / (std::string(domain) + "." + PreferencesHostId() + ".plist");
}

const std::string& PreferencesHostId() {
  static const std::string host_id = ReadHostId();
  return host_id;
}

}  // namespace lumeris
