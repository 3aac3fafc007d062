// The file-system and clock seam of the preference store.
//
// PreferencesFileSystem is the small set of operations the store needs: stat, read, an
// exclusive inter-process lock, an atomic replace, a no-clobber rename, the removal of stale
// temporary files and the time, each
// implemented with POSIX calls. Every operation is virtual: tests derive from the class to
// make single operations fail (a full disk, a lost lock) and check the store's failure paths.
//
// Failures are values: nothing here throws. A failed operation leaves errno set to its cause. Thread-safety: PreferencesFileSystem holds no
// state and may be used from any number of threads.
#pragma once

#include <cstdint>
#include <filesystem>
#include <optional>
#include <span>
#include <vector>

namespace lumeris {

// Identifies one version of a file: an atomic replace always changes the inode, and an
// in-place edit changes the size or the modification or change time (nanoseconds; the change
// time cannot be set back by another program).
struct FileStamp {
  std::uint64_t device = 0;
  std::uint64_t inode = 0;
  std::int64_t size = 0;
  std::int64_t mtime_ns = 0;
  std::int64_t ctime_ns = 0;
  friend bool operator==(const FileStamp&, const FileStamp&) = default;
};

enum class ReadStatus { kOk, kMissing, kError };

struct FileContents {
  ReadStatus status = ReadStatus::kMissing;
  std::vector<std::uint8_t> bytes;
  FileStamp stamp;  // of the very file the bytes came from (fstat of the open descriptor)
};

// Owns a descriptor that holds an exclusive flock(2); unlocks and closes when destroyed.
class FileLock {
 public:
  FileLock() = default;
  explicit FileLock(int fd) : fd_(fd) {}
  FileLock(FileLock&& other) noexcept : fd_(other.fd_) { other.fd_ = -1; }
  FileLock& operator=(FileLock&& other) noexcept;
  FileLock(const FileLock&) = delete;
  FileLock& operator=(const FileLock&) = delete;
  ~FileLock();

 private:
  int fd_ = -1;
};

class PreferencesFileSystem {
 public:
  virtual ~PreferencesFileSystem() = default;

  // std::nullopt when the file does not exist or cannot be examined.
  virtual std::optional<FileStamp> Stat(const std::filesystem::path& path);
  virtual FileContents Read(const std::filesystem::path& path);
  virtual bool CreateDirectories(const std::filesystem::path& dir);
  // Blocks until this process holds an exclusive flock on `lock_path` (created if needed).
  virtual std::optional<FileLock> LockExclusive(const std::filesystem::path& lock_path);
  // Writes a temporary file beside `path`, fsyncs it and renames it over `path`. On failure
  // `path` is untouched and the temporary file removed.
  virtual bool ReplaceAtomically(const std::filesystem::path& path, std::span<const std::uint8_t> bytes);
  // Renames without replacing an existing `to`; false when `to` exists or the rename fails.
  virtual bool RenameNoReplace(const std::filesystem::path& from, const std::filesystem::path& to);
  // Removes the temporary files "<path>.tmp-*" of writers that died before renaming them,
  // once their modification time is more than `min_age_seconds` before UnixTime().
  virtual void RemoveStaleTemporaryFiles(const std::filesystem::path& path, std::int64_t min_age_seconds);
  // Seconds since the Unix epoch.
  virtual std::int64_t UnixTime();
};

}  // namespace lumeris
