#include "platform/preference_store.h"

#include <cerrno>
#include <cstring>
#include <utility>

#include "platform/log.h"
#include "platform/property_list_io.h"

namespace lumeris {

struct PreferenceStore::Domain {
  explicit Domain(std::filesystem::path file_path, bool is_writable)
      : path(std::move(file_path)), writable(is_writable) {}

  const std::filesystem::path path;
  const bool writable;

  std::mutex mutex;
  // Everything below is guarded by `mutex`.
  bool loaded = false;
  std::optional<FileStamp> stamp;  // of the file `base` came from; nullopt when there was none
  bool corrupt = false;            // the file exists but did not parse
  plist::Dictionary base;          // the file's content as last read or written
  std::map<std::string, std::optional<plist::Value>, std::less<>> pending;  // nullopt: removal

  const plist::Value* Lookup(std::string_view key) const {
    if (auto it = pending.find(key); it != pending.end()) return it->second ? &*it->second : nullptr;
    auto it = base.find(key);
    return it == base.end() ? nullptr : &it->second;
  }

  plist::Dictionary View() const {
    plist::Dictionary view = base;
    for (const auto& [key, value] : pending) {
      if (value) {
        view.insert_or_assign(key, *value);
      } else if (auto it = view.find(key); it != view.end()) {
        view.erase(it);
      }
    }
    return view;
  }
};

PreferenceStore::PreferenceStore(std::shared_ptr<PreferencesFileSystem> file_system)
    : file_system_(std::move(file_system)) {}

PreferenceStore::~PreferenceStore() = default;

PreferenceStore& PreferenceStore::Shared() {
  static PreferenceStore* const shared = new PreferenceStore();
  return *shared;
}

PreferenceStore::Domain* PreferenceStore::Find(std::string_view domain, PreferencesUser user,
                                               PreferencesHost host) {
  std::optional<std::filesystem::path> path = PreferencesFilePath(domain, user, host);
  if (!path) return nullptr;
  std::lock_guard lock(domains_mutex_);
  auto& slot = domains_[*path];
  if (!slot) slot = std::make_unique<Domain>(*path, user == PreferencesUser::kCurrentUser);
  return slot.get();
}

bool PreferenceStore::Refresh(Domain& domain) {
  if (domain.loaded && file_system_->Stat(domain.path) == domain.stamp) return true;
  FileContents contents = file_system_->Read(domain.path);
  switch (contents.status) {
    case ReadStatus::kError:
      return false;
    case ReadStatus::kMissing:
      domain.base.clear();
      domain.stamp.reset();
      domain.corrupt = false;
      break;
    case ReadStatus::kOk: {
      std::optional<plist::Value> parsed = plist::ParsePropertyList(contents.bytes);
      plist::Dictionary* dictionary = parsed ? parsed->AsDictionary() : nullptr;
      domain.corrupt = dictionary == nullptr;
      domain.base = dictionary ? std::move(*dictionary) : plist::Dictionary();
      domain.stamp = contents.stamp;
      break;
    }
  }
  domain.loaded = true;
  return true;
}

std::optional<std::filesystem::path> PreferenceStore::MoveCorruptFileAside(const Domain& domain) {
  const std::string stem = domain.path.string() + ".corrupt-" + std::to_string(file_system_->UnixTime());
  for (int n = 0; n < 100; ++n) {
    std::filesystem::path aside = n == 0 ? stem : stem + "-" + std::to_string(n);
    if (file_system_->RenameNoReplace(domain.path, aside)) return aside;
  }
  return std::nullopt;
}

std::string PreferenceStore::WritePending(Domain& domain) {
  auto failed = [](std::string_view step) { return std::string(step) + ": " + std::strerror(errno); };
  if (!file_system_->CreateDirectories(domain.path.parent_path())) return failed("cannot create its directory");
  std::filesystem::path lock_path = domain.path;
  lock_path += ".lock";
  std::optional<FileLock> lock = file_system_->LockExclusive(lock_path);
  if (!lock) return failed("cannot lock " + lock_path.string());
  // Under the lock nobody else replaces the file, so the stamp check is exact.
  if (!Refresh(domain)) return failed("cannot read it");
  file_system_->RemoveStaleTemporaryFiles(domain.path, kStaleTemporaryFileSeconds);
  plist::Dictionary merged = domain.View();
  std::vector<std::uint8_t> bytes = plist::SerializeBinaryPropertyList(merged);
  if (bytes.empty()) return "a string is not valid UTF-8 or holds a NUL character";
  if (domain.corrupt) {
    std::optional<std::filesystem::path> aside = MoveCorruptFileAside(domain);
    if (!aside) return failed("cannot move the unparsable file aside");
    Log("preferences file " + domain.path.string() + " could not be parsed; moved it aside to " +
        aside->string());
    domain.corrupt = false;
    domain.stamp.reset();
  }
  if (!file_system_->ReplaceAtomically(domain.path, bytes)) return failed("cannot write it");
  domain.base = std::move(merged);
  domain.pending.clear();
  domain.stamp = file_system_->Stat(domain.path);
  return {};
}

std::optional<plist::Value> PreferenceStore::CopyValue(std::string_view key, std::string_view domain,
                                                       PreferencesUser user, PreferencesHost host) {
  Domain* d = Find(domain, user, host);
  if (d == nullptr) return std::nullopt;
  std::lock_guard lock(d->mutex);
  Refresh(*d);
  const plist::Value* value = d->Lookup(key);
  return value ? std::optional<plist::Value>(*value) : std::nullopt;
}

void PreferenceStore::SetValue(std::string_view key, std::optional<plist::Value> value, std::string_view domain,
                               PreferencesUser user, PreferencesHost host) {
  Domain* d = Find(domain, user, host);
  if (d == nullptr || !d->writable) return;
  std::lock_guard lock(d->mutex);
  if (!d->loaded) Refresh(*d);
  d->pending.insert_or_assign(std::string(key), std::move(value));
}

bool PreferenceStore::Synchronize(std::string_view domain, PreferencesUser user, PreferencesHost host) {
  Domain* d = Find(domain, user, host);
  if (d == nullptr) return false;
  std::lock_guard lock(d->mutex);
  if (d->pending.empty()) return Refresh(*d);
  const std::string failure = WritePending(*d);
  if (failure.empty()) return true;
  // What could not be written is dropped, so that this process never presents as stored what
  // is not in the file; the caller learns of the loss from the result.
  Log("cannot save preferences file " + d->path.string() + ": " + failure + "; " +
      std::to_string(d->pending.size()) + " unsaved change(s) dropped");
  d->pending.clear();
  return false;
}

std::vector<std::string> PreferenceStore::CopyKeyList(std::string_view domain, PreferencesUser user,
                                                      PreferencesHost host) {
  std::vector<std::string> keys;
  for (auto& [key, value] : CopyDomain(domain, user, host)) keys.push_back(key);
  return keys;
}

plist::Dictionary PreferenceStore::CopyDomain(std::string_view domain, PreferencesUser user, PreferencesHost host) {
  Domain* d = Find(domain, user, host);
  if (d == nullptr) return {};
  std::lock_guard lock(d->mutex);
  Refresh(*d);
  return d->View();
}

}  // namespace lumeris
