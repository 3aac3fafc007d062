// The preference store: the process view, synchronise and its failure paths, files left by others
// (corrupt, temporary, written concurrently, by writers killed mid-write), scope paths and the
// CFPreferences functions.
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <fstream>
#include <functional>
#include <iterator>
#include <map>
#include <random>
#include <thread>

#include "platform/preference_store.h"
#include "platform/preferences.h"
#include "platform/property_list_io.h"
#include "support/scoped_env.h"

namespace lumeris {
namespace {

namespace fs = std::filesystem;
using plist::Dictionary;
using plist::Value;

constexpr std::string_view kDomain = "com.vantorel.Lumeris";
constexpr std::int64_t kFixedTime = 1700000000;

// The real file system with a fixed clock and switches that make single steps fail.
class ScriptedFileSystem : public PreferencesFileSystem {
 public:
  FileContents Read(const fs::path& path) override {
    return fail_reads ? FileContents{ReadStatus::kError, {}, {}} : PreferencesFileSystem::Read(path);
  }
  std::optional<FileLock> LockExclusive(const fs::path& path) override {
    return fail_lock ? std::nullopt : PreferencesFileSystem::LockExclusive(path);
  }
  bool ReplaceAtomically(const fs::path& path, std::span<const std::uint8_t> bytes) override {
    return !fail_writes && PreferencesFileSystem::ReplaceAtomically(path, bytes);
  }
  std::int64_t UnixTime() override { return kFixedTime; }

  bool fail_reads = false, fail_lock = false, fail_writes = false;
};

void Set(PreferenceStore& store, std::string_view key, std::optional<Value> value) {
  store.SetValue(key, std::move(value), kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
}
bool Synchronize(PreferenceStore& store) {
  return store.Synchronize(kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
}
std::optional<Value> Copy(PreferenceStore& store, std::string_view key) {
  return store.CopyValue(key, kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
}
std::string ReadBytes(const fs::path& path) {
  std::ifstream in(path, std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(in), {});
}

class PreferenceStoreTest : public ::testing::Test {
 protected:
  fs::path DomainFile() const { return env_.config_home() / "vantorel/Preferences/com.vantorel.Lumeris.plist"; }
  std::optional<Value> StoredFile() const { return plist::ReadPropertyListFile(DomainFile()); }
  void WriteDomainBytes(std::string_view bytes) {
    fs::create_directories(DomainFile().parent_path());
    std::ofstream(DomainFile(), std::ios::binary) << bytes;
  }
  void WriteDomainFile(const Value& content) { WriteDomainBytes(plist::SerializeXmlPropertyList(content)); }
  // Runs `body` in a child process with a store of its own; the child exits 0 when it returns true.
  static pid_t StartWriter(const std::function<bool(PreferenceStore&)>& body) {
    const pid_t pid = fork();
    if (pid == 0) {
      PreferenceStore store;
      _exit(body(store) ? 0 : 1);
    }
    return pid;
  }

  testing::IsolatedUserEnvironment env_;
  std::shared_ptr<ScriptedFileSystem> file_system_ = std::make_shared<ScriptedFileSystem>();
  PreferenceStore store_{file_system_};
};

TEST_F(PreferenceStoreTest, ChangesShowAtOnceAndReachTheFileAsBinaryOnSynchronize) {
  WriteDomainBytes(plist::SerializeXmlPropertyList(Dictionary{{"keep", 1}, {"drop", 2}}));
  Set(store_, "Recents:x", Value(plist::Array{"a", "b"}));
  Set(store_, "drop", std::nullopt);
  EXPECT_EQ(Copy(store_, "Recents:x"), Value(plist::Array{"a", "b"}));
  EXPECT_EQ(Copy(store_, "drop"), std::nullopt);
  EXPECT_EQ(Copy(store_, "keep"), Value(1)) << "an XML file is read";
  EXPECT_EQ(StoredFile(), Value(Dictionary{{"keep", 1}, {"drop", 2}}));

  ASSERT_TRUE(Synchronize(store_));
  EXPECT_EQ(ReadBytes(DomainFile()).substr(0, 8), "bplist00");
  EXPECT_EQ(StoredFile(), Value(Dictionary{{"keep", 1}, {"Recents:x", plist::Array{"a", "b"}}}));
}

TEST_F(PreferenceStoreTest, TwoWritersMergeKeyByKey) {
  PreferenceStore other(file_system_);
  Set(store_, "mine", 1);
  Set(store_, "other-removed-this", "x");
  ASSERT_TRUE(Synchronize(store_));
  Set(other, "theirs", 2);
  Set(other, "other-removed-this", std::nullopt);
  Set(store_, "mine-later", 3);  // pending in the first store while the second one writes
  ASSERT_TRUE(Synchronize(other));
  ASSERT_TRUE(Synchronize(store_));

  const Dictionary expected{{"mine", 1}, {"theirs", 2}, {"mine-later", 3}};
  EXPECT_EQ(StoredFile(), Value(expected));
  EXPECT_EQ(store_.CopyDomain(kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost), expected);
  EXPECT_EQ(store_.CopyKeyList(kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost),
            (std::vector<std::string>{"mine", "mine-later", "theirs"}));
}

// Every read compares the file's stamp, so a file replaced by one of the same size in the same
// second, or removed, is seen at the next read.
TEST_F(PreferenceStoreTest, ReadsSeeAReplacedOrRemovedFileAtOnce) {
  WriteDomainFile(Value(Dictionary{{"k", "old"}}));
  EXPECT_EQ(Copy(store_, "k"), Value("old"));
  WriteDomainFile(Value(Dictionary{{"k", "new"}}));
  EXPECT_EQ(Copy(store_, "k"), Value("new"));
  fs::remove(DomainFile());
  EXPECT_EQ(Copy(store_, "k"), std::nullopt);
  EXPECT_TRUE(store_.CopyKeyList(kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost).empty());
}

// A file that does not parse, or whose root is not a dictionary, reads as empty and is moved aside
// (never over an earlier copy) only when the domain is next written.
TEST_F(PreferenceStoreTest, CorruptFileReadsEmptyAndIsKeptAsideBeforeTheNextWrite) {
  const std::string aside = DomainFile().string() + ".corrupt-1700000000";
  const std::pair<std::string, std::string> files[] = {
      {"this is not a property list", aside},
      {"bplist00 also broken", aside + "-1"},
      {std::string(plist::SerializeXmlPropertyList(plist::Array{1, 2})), aside + "-2"}};
  for (const auto& [bytes, moved_to] : files) {
    WriteDomainBytes(bytes);
    EXPECT_EQ(Copy(store_, "k"), std::nullopt);
    ASSERT_TRUE(Synchronize(store_));
    EXPECT_FALSE(fs::exists(moved_to)) << "a read alone must not move the file";
    Set(store_, "k", "v");
    ::testing::internal::CaptureStderr();
    ASSERT_TRUE(Synchronize(store_));
    EXPECT_NE(::testing::internal::GetCapturedStderr().find(
                  "com.vantorel.Lumeris.plist could not be parsed; moved it aside to " + moved_to + "\n"),
              std::string::npos);
    EXPECT_EQ(ReadBytes(moved_to), bytes);
    EXPECT_EQ(StoredFile(), Value(Dictionary{{"k", "v"}}));
  }
}

// Failure paths: the file stays as it was, one log line names it and the reason, and the
// changes are dropped, so the view never shows what the file does not hold.
TEST_F(PreferenceStoreTest, FailedSynchronizeLeavesTheFileLogsAndDropsTheChanges) {
  for (bool ScriptedFileSystem::*failure :
       {&ScriptedFileSystem::fail_writes, &ScriptedFileSystem::fail_lock, &ScriptedFileSystem::fail_reads}) {
    WriteDomainFile(Value(Dictionary{{"k", "file"}}));
    PreferenceStore store(file_system_);
    ASSERT_TRUE(Synchronize(store));
    WriteDomainFile(Value(Dictionary{{"k", "file"}, {"other", 1}}));  // forces a re-read under the lock
    Set(store, "k", "pending");
    (*file_system_).*failure = true;
    ::testing::internal::CaptureStderr();
    EXPECT_FALSE(Synchronize(store));
    const std::string log = ::testing::internal::GetCapturedStderr();
    (*file_system_).*failure = false;
    EXPECT_EQ(std::count(log.begin(), log.end(), '\n'), 1) << log;
    EXPECT_NE(log.find("cannot save preferences file " + DomainFile().string() + ": cannot "), std::string::npos) << log;
    EXPECT_EQ(Copy(store, "k"), Value("file"));
    ASSERT_TRUE(Synchronize(store));
    EXPECT_EQ(StoredFile(), Value(Dictionary{{"k", "file"}, {"other", 1}}));
  }
}

// A string the property-list format cannot keep whole is never written shortened.
TEST_F(PreferenceStoreTest, StringsThatAreNotValidUtf8OrHoldNulAreNeverWritten) {
  for (const std::string& text : {std::string("cut\xFFhere"), std::string("cut\0here", 8), std::string("\xC0\x80")}) {
    WriteDomainFile(Value(Dictionary{{"k", "file"}}));
    for (bool as_key : {false, true}) {
      Set(store_, as_key ? text : "k", Value(text));
      ::testing::internal::CaptureStderr();
      EXPECT_FALSE(Synchronize(store_));
      EXPECT_NE(::testing::internal::GetCapturedStderr().find("not valid UTF-8"), std::string::npos);
      EXPECT_EQ(StoredFile(), Value(Dictionary{{"k", "file"}}));
    }
  }
}

// Temporary files of writers killed before their rename go at the next write once a minute old
// (by the store's clock, fixed at kFixedTime).
TEST_F(PreferenceStoreTest, StaleTemporaryFilesOfThisDomainAreRemovedByTheNextWrite) {
  WriteDomainFile(Value(Dictionary{{"k", 1}}));
  const std::pair<fs::path, std::int64_t> files[] = {{DomainFile().string() + ".tmp-AbC123", 61},
                                                     {DomainFile().string() + ".tmp-XyZ789", 30},
                                                     {DomainFile().parent_path() / "other.plist.tmp-AbC123", 3600}};
  for (const auto& [path, age] : files) {
    std::ofstream(path) << "partial";
    fs::last_write_time(path, std::chrono::file_clock::from_sys(std::chrono::sys_seconds(std::chrono::seconds(kFixedTime - age))));
  }
  Set(store_, "k", 2);
  ASSERT_TRUE(Synchronize(store_));
  EXPECT_FALSE(fs::exists(files[0].first));
  EXPECT_TRUE(fs::exists(files[1].first));
  EXPECT_TRUE(fs::exists(files[2].first)) << "only this domain's files";
}

TEST_F(PreferenceStoreTest, AnyUserScopeIsReadOnly) {
  store_.SetValue("k", Value(1), kDomain, kCFPreferencesAnyUser, kCFPreferencesAnyHost);
  EXPECT_FALSE(store_.CopyValue("k", kDomain, kCFPreferencesAnyUser, kCFPreferencesAnyHost).has_value());
  EXPECT_TRUE(store_.Synchronize(kDomain, kCFPreferencesAnyUser, kCFPreferencesAnyHost));
  EXPECT_FALSE(fs::exists(env_.config_dirs() / "vantorel"));
}

// Four processes of four threads each write their own keys twice over, synchronising often: a
// lost update shows as a key left at its first value.
TEST_F(PreferenceStoreTest, ConcurrentProcessesAndThreadsKeepEveryKeysLastValue) {
  constexpr int kProcesses = 4, kThreads = 4, kKeys = 100;
  std::vector<pid_t> writers;
  for (int p = 0; p < kProcesses; ++p) {
    writers.push_back(StartWriter([p](PreferenceStore& store) {
      std::atomic<bool> ok = true;
      std::vector<std::jthread> threads;
      for (int t = 0; t < kThreads; ++t) {
        threads.emplace_back([&, t] {
          for (int n = 0; n < 2 * kKeys; ++n) {  // every key twice, at values 1 then 2
            Set(store, std::to_string(p * kThreads + t) + "-" + std::to_string(n % kKeys), Value(n / kKeys + 1));
            if ((n + 1) % 50 == 0 && !Synchronize(store)) ok = false;
          }
        });
      }
      threads.clear();
      return ok.load();
    }));
  }
  for (pid_t writer : writers) {
    int status = 0;
    EXPECT_TRUE(waitpid(writer, &status, 0) == writer && WIFEXITED(status) && WEXITSTATUS(status) == 0);
  }
  const std::optional<Value> file = StoredFile();
  ASSERT_TRUE(file && file->AsDictionary());
  EXPECT_EQ(file->AsDictionary()->size(), std::size_t{kProcesses * kThreads * kKeys});
  EXPECT_EQ(std::ranges::count_if(*file->AsDictionary(), [](const auto& entry) { return entry.second != Value(2); }), 0);
}

// Writers that store one generation in all of their keys per synchronise are killed at random
// moments while another writes on: every look at the file finds it whole, with agreeing keys and
// generations that never go back, and nothing was ever moved aside as corrupt.
TEST_F(PreferenceStoreTest, WritersKilledAtRandomMomentsNeverTearTheFile) {
  constexpr int kKills = 100, kKeysPerWriter = 10;
  // `progress`, when not -1, gets one byte after the first completed synchronise; `pause` leaves
  // the lock free for a moment between writes.
  auto writer = [](const std::string& prefix, int progress, std::chrono::microseconds pause) {
    return [=](PreferenceStore& store) mutable {
      std::optional<Value> first = Copy(store, prefix + "0");
      std::int64_t generation = first && first->AsInteger() ? *first->AsInteger() : 0;
      while (true) {
        ++generation;
        for (int i = 0; i < kKeysPerWriter; ++i) Set(store, prefix + std::to_string(i), Value(generation));
        if (!Synchronize(store)) return false;
        if (progress >= 0 && write(progress, "w", 1) == 1) progress = -1;
        std::this_thread::sleep_for(pause);
      }
    };
  };
  const pid_t steady = StartWriter(writer("steady", -1, std::chrono::microseconds(500)));
  std::mt19937 random(12345);
  std::uniform_int_distribution<int> delay_us(0, 2000);
  std::map<std::string, std::int64_t> last_seen = {{"steady", 0}, {"killed", 0}};
  int unparsable = 0, torn = 0, went_back = 0;
  for (int kill_count = 0; kill_count < kKills; ++kill_count) {
    // Every fourth victim is killed only after a completed write, so kills also land in later
    // writes however slow the machine is.
    int progress[2];
    ASSERT_EQ(pipe(progress), 0);
    const pid_t victim = StartWriter(writer("killed", kill_count % 4 == 3 ? progress[1] : -1, {}));
    close(progress[1]);
    char wrote;  // a byte, or the end of the pipe when the victim has gone
    ASSERT_TRUE(kill_count % 4 != 3 || read(progress[0], &wrote, 1) >= 0);
    close(progress[0]);
    std::this_thread::sleep_for(std::chrono::microseconds(delay_us(random)));
    kill(victim, SIGKILL);
    waitpid(victim, nullptr, 0);

    // One read decides: a file that appears between two looks is not unparsable.
    const FileContents contents = PreferencesFileSystem().Read(DomainFile());
    if (contents.status == ReadStatus::kMissing) continue;
    const auto file = contents.status == ReadStatus::kOk ? plist::ParsePropertyList(contents.bytes) : std::nullopt;
    unparsable += !file || !file->AsDictionary();
    for (auto& [prefix, last] : last_seen) {
      const Value* first = file ? file->Find(prefix + "0") : nullptr;  // nullptr too when not a dictionary
      if (first == nullptr) continue;
      for (int i = 1; i < kKeysPerWriter; ++i) {
        const Value* other = file->Find(prefix + std::to_string(i));
        torn += other == nullptr || *other != *first;
      }
      went_back += *first->AsInteger() < last;
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
  for (const auto& entry : fs::directory_iterator(DomainFile().parent_path())) {
    EXPECT_EQ(entry.path().string().find(".corrupt-"), std::string::npos) << entry.path();
  }
}

// Each scope maps to its file, following the environment at call time.
TEST(PreferencesPathTest, ScopesMapToXdgFilesAndDomainsThatCannotNameAFileToNone) {
  testing::IsolatedUserEnvironment env;
  const std::string host = PreferencesHostId();
  ASSERT_FALSE(host.empty());
  const struct { PreferencesUser user; PreferencesHost host; fs::path expected; } cases[] = {
      {kCFPreferencesCurrentUser, kCFPreferencesAnyHost, env.config_home() / "vantorel/Preferences/d.plist"},
      {kCFPreferencesCurrentUser, kCFPreferencesCurrentHost, env.config_home() / ("vantorel/Preferences/ByHost/d." + host + ".plist")},
      {kCFPreferencesAnyUser, kCFPreferencesAnyHost, env.config_dirs() / "vantorel/Preferences/d.plist"},
      {kCFPreferencesAnyUser, kCFPreferencesCurrentHost, env.config_dirs() / ("vantorel/Preferences/ByHost/d." + host + ".plist")},
  };
  for (const auto& c : cases) EXPECT_EQ(PreferencesFilePath("d", c.user, c.host), c.expected);
  for (std::string_view domain : {std::string_view(""), std::string_view("."), std::string_view(".."),
                                  std::string_view("a/b"), std::string_view("../x"), std::string_view("a\0b", 3)}) {
    EXPECT_FALSE(PreferencesFilePath(domain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost).has_value());
    EXPECT_FALSE(CFPreferencesAppSynchronize(domain));
  }
}

TEST(PreferencesPathTest, DefaultsAndIgnoredEnvironmentValues) {
  testing::IsolatedUserEnvironment env;
  const std::tuple<const char*, std::optional<std::string>, PreferencesUser, std::optional<fs::path>> steps[] = {
      {"XDG_CONFIG_HOME", std::nullopt, kCFPreferencesCurrentUser, env.home() / ".config/vantorel/Preferences/d.plist"},
      {"XDG_CONFIG_HOME", "relative/dir", kCFPreferencesCurrentUser, env.home() / ".config/vantorel/Preferences/d.plist"},
      {"XDG_CONFIG_DIRS", "/first:/second", kCFPreferencesAnyUser, "/first/vantorel/Preferences/d.plist"},
      {"XDG_CONFIG_DIRS", std::nullopt, kCFPreferencesAnyUser, "/etc/xdg/vantorel/Preferences/d.plist"},
      {"HOME", std::nullopt, kCFPreferencesCurrentUser, std::nullopt}};
  for (const auto& [variable, value, user, expected] : steps) {
    env.env().Set(variable, value);
    EXPECT_EQ(PreferencesFilePath("d", user, kCFPreferencesAnyHost), expected) << variable;
  }
}

// The CFPreferences functions on the shared store.
TEST(CFPreferencesTest, IntegerAndBooleanReadersFollowTheValueType) {
  testing::IsolatedUserEnvironment env;
  const std::tuple<std::optional<Value>, std::int64_t, bool, bool, bool> cases[] = {  // integer, valid, boolean, valid
      {std::nullopt, 0, false, false, false}, {Value(42), 42, true, false, false}, {Value(-7), -7, true, false, false},
      {Value(true), 0, false, true, true},    {Value(false), 0, false, false, true}, {Value("1"), 0, false, false, false},
      {Value(1.0), 0, false, false, false},   {Value(plist::Array{1}), 0, false, false, false},
  };
  for (const auto& [value, integer, integer_valid, boolean, boolean_valid] : cases) {
    SCOPED_TRACE(value ? ::testing::PrintToString(value->type()) : "absent");
    CFPreferencesSetAppValue("key", value, "test.readers");
    ASSERT_TRUE(CFPreferencesAppSynchronize("test.readers"));
    bool valid = !integer_valid;
    EXPECT_EQ(CFPreferencesGetAppIntegerValue("key", "test.readers", &valid), integer);
    EXPECT_EQ(valid, integer_valid);
    valid = !boolean_valid;
    EXPECT_EQ(CFPreferencesGetAppBooleanValue("key", "test.readers", &valid), boolean);
    EXPECT_EQ(valid, boolean_valid);
  }
}

TEST(CFPreferencesTest, AppFunctionsUseCurrentUserAnyHostAndCopyValueReachesOtherScopes) {
  testing::IsolatedUserEnvironment env;
  CFPreferencesSetAppValue("VTStartAsLargeWindowTemporarily", Value("/tmp/x"), "com.vantorel.SorvendiIM");
  ASSERT_TRUE(CFPreferencesAppSynchronize("com.vantorel.SorvendiIM"));
  EXPECT_TRUE(fs::exists(env.config_home() / "vantorel/Preferences/com.vantorel.SorvendiIM.plist"));
  EXPECT_EQ(CFPreferencesCopyKeyList("com.vantorel.SorvendiIM", kCFPreferencesCurrentUser, kCFPreferencesAnyHost),
            std::vector<std::string>{"VTStartAsLargeWindowTemporarily"});

  const fs::path global = env.config_dirs() / ("vantorel/Preferences/ByHost/.GlobalPreferences." + PreferencesHostId() + ".plist");
  fs::create_directories(global.parent_path());
  std::ofstream(global) << plist::SerializeXmlPropertyList(Dictionary{{"Country", "CN"}});
  EXPECT_EQ(CFPreferencesCopyValue("Country", kCFPreferencesAnyApplication, kCFPreferencesAnyUser, kCFPreferencesCurrentHost),
            Value("CN"));
  EXPECT_FALSE(CFPreferencesCopyAppValue("Country", kCFPreferencesAnyApplication).has_value());
}

}  // namespace
}  // namespace lumeris
