#include "service/socket_path.h"

#include <errno.h>
#include <stdlib.h>
#include <string.h>
#include <sys/stat.h>
#include <unistd.h>

namespace lumeris {

namespace {

void SetWhy(std::string* why, std::string text) {
  if (why) *why = std::move(text);
}

}  // namespace

std::filesystem::path FallbackRuntimeDirectory(unsigned uid) {
  return std::filesystem::path("/tmp") / ("lumeris-" + std::to_string(uid));
}

bool EnsurePrivateDirectory(const std::filesystem::path& directory, std::string* why) {
  if (mkdir(directory.c_str(), 0700) != 0 && errno != EEXIST) {
    SetWhy(why, "cannot create " + directory.string() + ": " + strerror(errno));
    return false;
  }
  struct stat info {};
  if (lstat(directory.c_str(), &info) != 0) {
    SetWhy(why, "cannot inspect " + directory.string() + ": " + strerror(errno));
    return false;
  }
  if (!S_ISDIR(info.st_mode)) {
    SetWhy(why, directory.string() + " is not a directory");
    return false;
  }
  if (info.st_uid != geteuid()) {
    SetWhy(why, directory.string() + " belongs to another user");
    return false;
  }
  if ((info.st_mode & 07777) != 0700) {
    SetWhy(why, directory.string() + " is not of mode 0700");
    return false;
  }
  return true;
}

std::optional<std::filesystem::path> ServiceSocketPath(std::string* why) {
  // The XDG rules make a relative XDG_RUNTIME_DIR invalid: it is ignored like an unset one.
  const char* runtime = getenv("XDG_RUNTIME_DIR");
  if (runtime != nullptr && runtime[0] == '/') {
    return std::filesystem::path(runtime) / kServiceName;
  }
  std::filesystem::path directory = FallbackRuntimeDirectory(geteuid());
  if (!EnsurePrivateDirectory(directory, why)) return std::nullopt;
  return directory / kServiceName;
}

}  // namespace lumeris
