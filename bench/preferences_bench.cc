// Costs of the preference store and of posting a distributed notification.
//
//   SynchronizeAndCopyUnchanged   synchronise + copy of a domain nobody changed (a stat)
//   SetAndSynchronizeArray        set a 100-entry string array + synchronise (one fsync'd write)
//   BareWriteFsyncRename          the same bytes written to a temporary file, fsync'd, renamed
//   PostNotification              one post on the session bus (skipped without a bus)
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <stdlib.h>
#include <unistd.h>

#include <cstdio>
#include <filesystem>
#include <string>

#include "platform/distributed_notifications.h"
#include "platform/preference_store.h"
#include "platform/property_list_io.h"

namespace lumeris {
namespace {

constexpr std::string_view kDomain = "bench.preferences";

// Points XDG_CONFIG_HOME at a fresh directory for one benchmark and removes it after.
class ScratchConfigHome {
 public:
  ScratchConfigHome() {
    std::string pattern = (std::filesystem::temp_directory_path() / "lumeris-bench-XXXXXX").string();
    dir_ = mkdtemp(pattern.data());
    setenv("XDG_CONFIG_HOME", dir_.c_str(), 1);
  }
  ~ScratchConfigHome() { std::filesystem::remove_all(dir_); }
  const std::filesystem::path& dir() const { return dir_; }

 private:
  std::filesystem::path dir_;
};

plist::Array StringArray(int generation) {
  plist::Array array;
  for (int i = 0; i < 100; ++i) {
    array.emplace_back("com.vantorel.lmk:{\"char\":\"\\ud83d\\ude00\",\"n\":" + std::to_string(i + generation) + "}");
  }
  return array;
}

void SynchronizeAndCopyUnchanged(benchmark::State& state) {
  ScratchConfigHome home;
  PreferenceStore store;
  for (int i = 0; i < 50; ++i) {
    store.SetValue("key" + std::to_string(i), plist::Value(StringArray(i)), kDomain, kCFPreferencesCurrentUser,
                   kCFPreferencesAnyHost);
  }
  store.Synchronize(kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
  for (auto _ : state) {
    store.Synchronize(kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
    benchmark::DoNotOptimize(store.CopyValue("key7", kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost));
  }
}
BENCHMARK(SynchronizeAndCopyUnchanged);

void SetAndSynchronizeArray(benchmark::State& state) {
  ScratchConfigHome home;
  PreferenceStore store;
  int generation = 0;
  for (auto _ : state) {
    store.SetValue("Recents:bench", plist::Value(StringArray(++generation)), kDomain, kCFPreferencesCurrentUser,
                   kCFPreferencesAnyHost);
    if (!store.Synchronize(kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost)) {
      state.SkipWithError("synchronise failed");
      break;
    }
  }
}
BENCHMARK(SetAndSynchronizeArray)->UseRealTime();

void BareWriteFsyncRename(benchmark::State& state) {
  ScratchConfigHome home;
  const std::vector<std::uint8_t> bytes =
      plist::SerializeBinaryPropertyList(plist::Dictionary{{"Recents:bench", StringArray(1)}});
  const std::string target = (home.dir() / "bare.plist").string();
  const std::string temp = target + ".tmp";
  for (auto _ : state) {
    const int fd = ::open(temp.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
    if (fd < 0 || ::write(fd, bytes.data(), bytes.size()) != static_cast<ssize_t>(bytes.size()) || ::fsync(fd) != 0) {
      state.SkipWithError("write failed");
      break;
    }
    ::close(fd);
    std::rename(temp.c_str(), target.c_str());
  }
}
BENCHMARK(BareWriteFsyncRename)->UseRealTime();

void PostNotification(benchmark::State& state) {
  if (getenv("DBUS_SESSION_BUS_ADDRESS") == nullptr) {
    state.SkipWithError("no session bus (source scripts/test-env.sh)");
    return;
  }
  for (auto _ : state) benchmark::DoNotOptimize(PostDistributedNotification("LumerisBenchNotification"));
}
BENCHMARK(PostNotification)->UseRealTime();

}  // namespace
}  // namespace lumeris

BENCHMARK_MAIN();
