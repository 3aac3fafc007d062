// PreferenceStore: the process's view of preference domains, kept in property-list files
// (see preferences_paths.h for where) and shared safely with other threads and processes.
//
//   PreferenceStore& store = PreferenceStore::Shared();
//   store.SetValue("Recents:x", plist::Array{"a"}, "com.vantorel.Lumeris", kCFPreferencesCurrentUser,
//                  kCFPreferencesAnyHost);
//   bool written = store.Synchronize("com.vantorel.Lumeris", kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
//
// Semantics:
// - Every read (CopyValue, CopyKeyList, CopyDomain) and every Synchronize first compares the
//   file's stamp (device, inode, size, modification and change time in nanoseconds) with the
//   one it was loaded from and re-reads the file when it changed or vanished: the view is the
//   file as it is now plus this process's pending changes. An unchanged domain costs one stat.
// - SetValue changes the view at once (std::nullopt removes the key) and records the change
//   as pending; nothing reaches the file before Synchronize.
// - Synchronize with changes pending: take an exclusive flock on "<file>.lock", re-read the
//   file if it changed, remove temporary files of killed writers older than a minute, apply
//   this process's pending sets and removals key by key, write a temporary file in the same
//   directory, fsync it, rename it over the file (the directory is not fsynced; see
//   PreferencesFileSystem::ReplaceAtomically), unlock. The view is then the file's content.
// - On failure Synchronize returns false, leaves the file untouched, logs one line naming the
//   file and the reason, and drops the pending changes: the view is again the file's content,
//   so nothing unsaved is presented as stored. A value holding a string that is not valid
//   UTF-8 or holds NUL is never written (property_list_io.h) and fails the same way.
// - Synchronize with nothing pending only reads.
// - A file that exists but does not parse (or whose root is not a dictionary) reads as empty;
//   before the domain is next written it is renamed aside to "<file>.corrupt-<unix time>"
//   (with "-<n>" appended if that name is taken), so nothing is destroyed; the move is logged
//   with the new name.
// - The any-user scope is read only: SetValue there is ignored.
//
// Thread-safety: every member may be called from any thread at the same time. Each domain has
// its own mutex, held across a whole synchronise so that the threads of one process write one
// at a time; other processes are kept out by the flock. Values returned are copies owned by the
// caller.
#pragma once

#include <filesystem>
#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/preferences_file_system.h"
#include "platform/preferences_paths.h"
#include "platform/property_list.h"

namespace lumeris {

class PreferenceStore {
 public:
  explicit PreferenceStore(std::shared_ptr<PreferencesFileSystem> file_system =
                               std::make_shared<PreferencesFileSystem>());
  PreferenceStore(const PreferenceStore&) = delete;
  PreferenceStore& operator=(const PreferenceStore&) = delete;
  ~PreferenceStore();

  // The process-wide store behind the CFPreferences functions (never destroyed).
  static PreferenceStore& Shared();

  std::optional<plist::Value> CopyValue(std::string_view key, std::string_view domain, PreferencesUser user,
                                        PreferencesHost host);
  void SetValue(std::string_view key, std::optional<plist::Value> value, std::string_view domain,
                PreferencesUser user, PreferencesHost host);
  bool Synchronize(std::string_view domain, PreferencesUser user, PreferencesHost host);
  // The keys of the domain's current view, in byte order.
  std::vector<std::string> CopyKeyList(std::string_view domain, PreferencesUser user, PreferencesHost host);
  // The whole current view of the domain.
  plist::Dictionary CopyDomain(std::string_view domain, PreferencesUser user, PreferencesHost host);

 private:
  struct Domain;

  // The domain object for a scope's file (created on first use, kept for the store's life);
  // nullptr when the domain has no file path.
  Domain* Find(std::string_view domain, PreferencesUser user, PreferencesHost host);
  // REQUIRES: domain.mutex held. Loads the file if never loaded or its stamp changed.
  // False when the file exists but could not be read.
  bool Refresh(Domain& domain);
  // REQUIRES: domain.mutex held, pending changes present. Empty on success, else the reason.
  std::string WritePending(Domain& domain);
  // The new name, or std::nullopt when the file could not be moved.
  std::optional<std::filesystem::path> MoveCorruptFileAside(const Domain& domain);

  static constexpr std::int64_t kStaleTemporaryFileSeconds = 60;

  const std::shared_ptr<PreferencesFileSystem> file_system_;
  std::mutex domains_mutex_;
  // Guarded by domains_mutex_; entries are never erased, so Domain pointers stay valid.
  std::map<std::filesystem::path, std::unique_ptr<Domain>> domains_;
};

}  // namespace lumeris
