#include "platform/preferences_file_system.h"

#include <fcntl.h>
#include <stdio.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <ctime>
#include <string>
#include <system_error>

namespace lumeris {
namespace {

FileStamp StampOf(const struct stat& st) {
  return FileStamp{static_cast<std::uint64_t>(st.st_dev), static_cast<std::uint64_t>(st.st_ino),
                   static_cast<std::int64_t>(st.st_size),
                   static_cast<std::int64_t>(st.st_mtim.tv_sec) * 1'000'000'000 + st.st_mtim.tv_nsec,
                   static_cast<std::int64_t>(st.st_ctim.tv_sec) * 1'000'000'000 + st.st_ctim.tv_nsec};
}

bool WriteAll(int fd, std::span<const std::uint8_t> bytes) {
  while (!bytes.empty()) {
    const ssize_t n = ::write(fd, bytes.data(), bytes.size());
    if (n < 0 && errno == EINTR) continue;
    if (n <= 0) return false;
    bytes = bytes.subspan(static_cast<std::size_t>(n));
  }
  return true;
}

}  // namespace

FileLock& FileLock::operator=(FileLock&& other) noexcept {
  if (this != &other) {
    if (fd_ >= 0) ::close(fd_);
    fd_ = other.fd_;
    other.fd_ = -1;
  }
  return *this;
}

FileLock::~FileLock() {
  // Closing the only descriptor of the open file description releases the flock.
  if (fd_ >= 0) ::close(fd_);
}

std::optional<FileStamp> PreferencesFileSystem::Stat(const std::filesystem::path& path) {
  struct stat st {};
  if (::stat(path.c_str(), &st) != 0) return std::nullopt;
  return StampOf(st);
}

FileContents PreferencesFileSystem::Read(const std::filesystem::path& path) {
  FileContents contents;
  const int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd < 0) {
    contents.status = errno == ENOENT || errno == ENOTDIR ? ReadStatus::kMissing : ReadStatus::kError;
    return contents;
  }
  struct stat st {};
  contents.status = ::fstat(fd, &st) == 0 && S_ISREG(st.st_mode) ? ReadStatus::kOk : ReadStatus::kError;
  if (contents.status == ReadStatus::kOk) {
    contents.stamp = StampOf(st);
    contents.bytes.resize(static_cast<std::size_t>(st.st_size));
    std::size_t filled = 0;
    while (true) {
      if (filled == contents.bytes.size()) contents.bytes.resize(filled + 4096);
      const ssize_t n = ::read(fd, contents.bytes.data() + filled, contents.bytes.size() - filled);
      if (n < 0 && errno == EINTR) continue;
      if (n < 0) contents.status = ReadStatus::kError;
      if (n <= 0) break;
      filled += static_cast<std::size_t>(n);
    }
    contents.bytes.resize(filled);
  }
  ::close(fd);
  return contents;
}

bool PreferencesFileSystem::CreateDirectories(const std::filesystem::path& dir) {
  std::error_code error;
  std::filesystem::create_directories(dir, error);
  if (!error && std::filesystem::is_directory(dir, error)) return true;
  errno = error ? error.value() : ENOTDIR;
  return false;
}

std::optional<FileLock> PreferencesFileSystem::LockExclusive(const std::filesystem::path& lock_path) {
  const int fd = ::open(lock_path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
  if (fd < 0) return std::nullopt;
  FileLock lock(fd);
  while (::flock(fd, LOCK_EX) != 0) {
    if (errno != EINTR) return std::nullopt;
  }
  return lock;
}

bool PreferencesFileSystem::ReplaceAtomically(const std::filesystem::path& path,
                                              std::span<const std::uint8_t> bytes) {
  std::string temp = path.string() + ".tmp-XXXXXX";
  const int fd = ::mkostemp(temp.data(), O_CLOEXEC);
  if (fd < 0) return false;
  bool ok = ::fchmod(fd, 0600) == 0 && WriteAll(fd, bytes) && ::fsync(fd) == 0;
  ok = ::close(fd) == 0 && ok;
  if (ok) ok = ::rename(temp.c_str(), path.c_str()) == 0;
  if (!ok) {
    const int cause = errno;
    ::unlink(temp.c_str());
    errno = cause;
    return false;
  }
  // The directory is not fsynced: the new content is on disk before the rename, so after a
  // crash the file holds the old or the new content, whole, and a synchronise costs one
  // journal commit instead of two.
  return true;
}

bool PreferencesFileSystem::RenameNoReplace(const std::filesystem::path& from, const std::filesystem::path& to) {
  return ::renameat2(AT_FDCWD, from.c_str(), AT_FDCWD, to.c_str(), RENAME_NOREPLACE) == 0;
}

void PreferencesFileSystem::RemoveStaleTemporaryFiles(const std::filesystem::path& path,
                                                      std::int64_t min_age_seconds) {
  const std::string prefix = path.filename().string() + ".tmp-";
  const std::int64_t now = UnixTime();
  std::error_code error;
  for (std::filesystem::directory_iterator it(path.parent_path(), error), end; !error && it != end;
       it.increment(error)) {
    const std::string name = it->path().filename().string();
    struct stat st {};
    if (name.compare(0, prefix.size(), prefix) != 0 || ::lstat(it->path().c_str(), &st) != 0) continue;
    if (S_ISREG(st.st_mode) && now - static_cast<std::int64_t>(st.st_mtim.tv_sec) > min_age_seconds) {
      ::unlink(it->path().c_str());
    }
  }
}

std::int64_t PreferencesFileSystem::UnixTime() { return static_cast<std::int64_t>(std::time(nullptr)); }

}  // namespace lumeris
