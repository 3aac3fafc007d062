// ScopedTempDir: a fresh directory under $TMPDIR (or /tmp), removed with its contents when
// the object goes out of scope. Move-only.
//
//   ScopedTempDir dir;
//   WriteFile(dir.path() / "a.plist", bytes);
#pragma once

#include <stdlib.h>

#include <filesystem>
#include <stdexcept>
#include <string>
#include <system_error>

namespace lumeris::testing {

class ScopedTempDir {
 public:
  ScopedTempDir() {
    const char* base = getenv("TMPDIR");
    std::string pattern = std::string(base && *base ? base : "/tmp") + "/lumeris-test-XXXXXX";
    if (mkdtemp(pattern.data()) == nullptr) throw std::runtime_error("mkdtemp failed");
    path_ = pattern;
  }
  ~ScopedTempDir() {
    std::error_code ignored;
    if (!path_.empty()) std::filesystem::remove_all(path_, ignored);
  }
  ScopedTempDir(ScopedTempDir&& other) noexcept : path_(std::move(other.path_)) { other.path_.clear(); }
  ScopedTempDir& operator=(ScopedTempDir&&) = delete;
  ScopedTempDir(const ScopedTempDir&) = delete;
  ScopedTempDir& operator=(const ScopedTempDir&) = delete;

  const std::filesystem::path& path() const { return path_; }

 private:
  std::filesystem::path path_;
};

}  // namespace lumeris::testing
