// The preference store under real concurrency: forked writer processes, threads inside them,
// and writers killed with SIGKILL in the middle of their work.
#include <gtest/gtest.h>
#include <poll.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <filesystem>
#include <fstream>
#include <functional>
#include <map>
#include <random>
#include <string>
#include <thread>
#include <vector>

#include "platform/preference_store.h"
#include "platform/property_list_io.h"
#include "support/scoped_env.h"

namespace lumeris {
namespace {

namespace fs = std::filesystem;
using plist::Value;

constexpr std::string_view kDomain = "test.reliability";

class PreferenceReliabilityTest : public ::testing::Test {
 protected:
  fs::path DomainFile() const { return env_.config_home() / "vantorel/Preferences/test.reliability.plist"; }

  // Runs `body` in a child process with a store of its own; the child's exit status is 0 when
  // `body` returned true.
  static pid_t StartWriter(const std::function<bool(PreferenceStore&)>& body) {
    const pid_t pid = fork();
    if (pid == 0) {
      PreferenceStore store;
      _exit(body(store) ? 0 : 1);
    }
    return pid;
  }
  static bool Succeeded(pid_t pid) {
    int status = 0;
    return pid > 0 && waitpid(pid, &status, 0) == pid && WIFEXITED(status) && WEXITSTATUS(status) == 0;
  }
  static void Set(PreferenceStore& store, const std::string& key, std::optional<Value> value) {
    store.SetValue(key, std::move(value), kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
  }
  static bool Synchronize(PreferenceStore& store) {
    return store.Synchronize(kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
  }
  static std::int64_t IntegerOf(PreferenceStore& store, const std::string& key) {
    std::optional<Value> value = store.CopyValue(key, kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
    return value && value->AsInteger() ? *value->AsInteger() : 0;
  }
  std::vector<fs::path> CorruptCopies() const {
    std::vector<fs::path> found;
    if (!fs::exists(DomainFile().parent_path())) return found;
    for (const auto& entry : fs::directory_iterator(DomainFile().parent_path())) {
      if (entry.path().filename().string().find(".corrupt-") != std::string::npos) found.push_back(entry.path());
    }
    return found;
  }

  testing::IsolatedUserEnvironment env_;
};

TEST_F(PreferenceReliabilityTest, ConcurrentProcessesAndThreadsKeepEveryKeysLastValue) {
  constexpr int kProcesses = 4;
  constexpr int kThreads = 4;
  constexpr int kKeys = 500;
  constexpr int kSetsPerSynchronize = 250;
  auto key_of = [](int p, int t, int k) {
    return "p" + std::to_string(p) + "t" + std::to_string(t) + "k" + std::to_string(k);
  };
  std::vector<pid_t> writers;
  for (int p = 0; p < kProcesses; ++p) {
    writers.push_back(StartWriter([&, p](PreferenceStore& store) {
      std::vector<std::thread> threads;
      std::atomic<bool> ok = true;
      for (int t = 0; t < kThreads; ++t) {
        threads.emplace_back([&, t] {
          // Two passes: the second overwrites every key, so a lost update shows as a stale 1.
          for (int pass = 1; pass <= 2; ++pass) {
            for (int k = 0; k < kKeys; ++k) {
              Set(store, key_of(p, t, k), Value(pass));
              if ((k + 1) % kSetsPerSynchronize == 0 && !Synchronize(store)) ok = false;
            }
          }
          if (!Synchronize(store)) ok = false;
        });
      }
      for (std::thread& thread : threads) thread.join();
      return ok.load();
    }));
  }
  for (pid_t writer : writers) EXPECT_TRUE(Succeeded(writer));

  std::optional<Value> file = plist::ReadPropertyListFile(DomainFile());
  ASSERT_TRUE(file && file->AsDictionary());
  EXPECT_EQ(file->AsDictionary()->size(), std::size_t{kProcesses * kThreads * kKeys});
  int wrong = 0;
  for (int p = 0; p < kProcesses; ++p) {
    for (int t = 0; t < kThreads; ++t) {
      for (int k = 0; k < kKeys; ++k) {
        const Value* value = file->Find(key_of(p, t, k));
        if (value == nullptr || !(*value == Value(2))) ++wrong;
      }
    }
  }
  EXPECT_EQ(wrong, 0);
}

TEST_F(PreferenceReliabilityTest, WriterKilledAtRandomMomentsNeverTearsTheFile) {
  constexpr int kKills = 200;
  constexpr int kKeysPerWriter = 10;
  // Each writer stores one generation in all of its keys per synchronise, starting from the
  // generation already in the file: a torn or lost write shows as keys that disagree or a
  // generation that goes back.
  // `progress`, when not -1, gets one byte after the writer's first completed synchronise.
  // `pause` leaves the lock free for a moment between writes.
  auto writer = [](const std::string& prefix, int progress = -1, std::chrono::microseconds pause = {}) {
    return [prefix, progress, pause](PreferenceStore& store) mutable {
      Synchronize(store);
      std::int64_t generation = IntegerOf(store, prefix + "0");
      while (true) {
        ++generation;
        for (int i = 0; i < kKeysPerWriter; ++i) Set(store, prefix + std::to_string(i), Value(generation));
        if (!Synchronize(store)) return false;
        if (progress >= 0) {
          [[maybe_unused]] ssize_t ignored = write(progress, "w", 1);
          progress = -1;
        }
        std::this_thread::sleep_for(pause);
      }
    };
  };
  const pid_t steady = StartWriter(writer("steady", -1, std::chrono::microseconds(500)));
  ASSERT_GT(steady, 0);

  std::mt19937 random(12345);
  std::uniform_int_distribution<int> delay_us(0, 3000);
  std::map<std::string, std::int64_t> last_seen = {{"steady", 0}, {"killed", 0}};
  int torn = 0;
  int unparsable = 0;
  int went_back = 0;
  for (int kill_count = 0; kill_count < kKills; ++kill_count) {
    // Every fourth victim is killed only after it completed one write, so kills also land in
    // the middle of later writes however slow the machine is.
    int progress[2];
    ASSERT_EQ(pipe(progress), 0);
    const bool after_first_write = kill_count % 4 == 3;
    const pid_t victim = StartWriter(writer("killed", after_first_write ? progress[1] : -1));
    ASSERT_GT(victim, 0);
    close(progress[1]);
    if (after_first_write) {
      pollfd ready = {progress[0], POLLIN, 0};
      poll(&ready, 1, 10000);
    }
    close(progress[0]);
    std::this_thread::sleep_for(std::chrono::microseconds(delay_us(random)));
    kill(victim, SIGKILL);
    int status = 0;
    waitpid(victim, &status, 0);

    // One read decides everything: a file that appears between a read and a separate
    // existence check must not count as unparsable.
    const FileContents contents = PreferencesFileSystem().Read(DomainFile());
    if (contents.status == ReadStatus::kMissing) continue;  // nothing written yet
    std::optional<Value> file =
        contents.status == ReadStatus::kOk ? plist::ParsePropertyList(contents.bytes) : std::nullopt;
    if (!file || !file->AsDictionary()) {
      ++unparsable;
      continue;
    }
    for (auto& [prefix, last] : last_seen) {
      const Value* first = file->Find(prefix + "0");
      if (first == nullptr) continue;
      for (int i = 1; i < kKeysPerWriter; ++i) {
        const Value* other = file->Find(prefix + std::to_string(i));
        if (other == nullptr || !(*other == *first)) ++torn;
      }
      if (*first->AsInteger() < last) ++went_back;
      last = *first->AsInteger();
    }
  }
  kill(steady, SIGKILL);
  waitpid(steady, nullptr, 0);

  EXPECT_EQ(unparsable, 0);
  EXPECT_EQ(torn, 0);
  EXPECT_EQ(went_back, 0);
  EXPECT_GT(last_seen["steady"], 0) << "the steady writer never wrote";
  EXPECT_GT(last_seen["killed"], 0) << "no killed writer ever completed a write";
  EXPECT_TRUE(CorruptCopies().empty());
}

}  // namespace
}  // namespace lumeris
