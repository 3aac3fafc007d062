// ScopedEnv sets environment variables for its lifetime and restores the old values after.
// IsolatedUserEnvironment points HOME and the XDG directories at a fresh temporary directory,
// so a test can write preferences and sockets without touching anybody's real files.
//
// Not thread-safe: the environment is process-wide. Use from the test's main thread, before
// the code under test starts threads.
#pragma once

#include <stdlib.h>
#include <sys/stat.h>

#include <filesystem>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "support/temp_dir.h"

namespace lumeris::testing {

class ScopedEnv {
 public:
  ScopedEnv() = default;
  ScopedEnv(const ScopedEnv&) = delete;
  ScopedEnv& operator=(const ScopedEnv&) = delete;
  ~ScopedEnv() {
    for (auto it = saved_.rbegin(); it != saved_.rend(); ++it) Apply(it->first, it->second);
  }

  // Sets `name` to `value`; std::nullopt unsets it.
  void Set(const std::string& name, const std::optional<std::string>& value) {
    const char* old = getenv(name.c_str());
    saved_.emplace_back(name, old ? std::optional<std::string>(old) : std::nullopt);
    Apply(name, value);
  }

 private:
  static void Apply(const std::string& name, const std::optional<std::string>& value) {
    value ? setenv(name.c_str(), value->c_str(), 1) : unsetenv(name.c_str());
  }

  std::vector<std::pair<std::string, std::optional<std::string>>> saved_;
};

class IsolatedUserEnvironment {
 public:
  IsolatedUserEnvironment() {
    for (const auto& [variable, sub] : {std::pair{"HOME", "home"}, {"XDG_CONFIG_HOME", "config"},
                                        {"XDG_CONFIG_DIRS", "config-dirs"}, {"XDG_RUNTIME_DIR", "runtime"}}) {
      std::filesystem::create_directories(dir_.path() / sub);
      env_.Set(variable, (dir_.path() / sub).string());
    }
    chmod(runtime_dir().c_str(), 0700);
    env_.Set("XDG_STATE_HOME", state_home().string());
  }

  const std::filesystem::path& root() const { return dir_.path(); }
  std::filesystem::path home() const { return dir_.path() / "home"; }
  std::filesystem::path config_home() const { return dir_.path() / "config"; }
  std::filesystem::path config_dirs() const { return dir_.path() / "config-dirs"; }
  std::filesystem::path runtime_dir() const { return dir_.path() / "runtime"; }
  std::filesystem::path state_home() const { return dir_.path() / "state"; }
  // Further variables for this test only (restored with the rest).
  ScopedEnv& env() { return env_; }

 private:
  ScopedTempDir dir_;
  ScopedEnv env_;
};

}  // namespace lumeris::testing
