// The preference store: scopes and paths, the process view, synchronise and its failure paths.
#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <fstream>
#include <iterator>
#include <memory>
#include <string>
#include <vector>

#include "platform/preference_store.h"
#include "platform/preferences.h"
#include "platform/preferences_paths.h"
#include "platform/property_list_io.h"
#include "support/scoped_env.h"

namespace lumeris {
namespace {

namespace fs = std::filesystem;
using plist::Value;

constexpr std::string_view kDomain = "com.vantorel.Lumeris";
constexpr std::int64_t kFixedTime = 1700000000;

// The real file system with a fixed clock, counters and switches that make single steps fail.
class ScriptedFileSystem : public PreferencesFileSystem {
 public:
  FileContents Read(const fs::path& path) override {
    ++reads;
    if (fail_reads) return FileContents{ReadStatus::kError, {}, {}};
    return PreferencesFileSystem::Read(path);
  }
  std::optional<FileLock> LockExclusive(const fs::path& path) override {
    if (fail_lock) return std::nullopt;
    return PreferencesFileSystem::LockExclusive(path);
  }
  bool ReplaceAtomically(const fs::path& path, std::span<const std::uint8_t> bytes) override {
    if (fail_writes) return false;
    ++writes;
    return PreferencesFileSystem::ReplaceAtomically(path, bytes);
  }
  std::int64_t UnixTime() override { return kFixedTime; }

  std::atomic<int> reads{0};
  std::atomic<int> writes{0};
  bool fail_reads = false;
  bool fail_lock = false;
  bool fail_writes = false;
};

class PreferenceStoreTest : public ::testing::Test {
 protected:
  PreferenceStoreTest() : file_system_(std::make_shared<ScriptedFileSystem>()), store_(file_system_) {}

  void Set(std::string_view key, std::optional<Value> value, PreferenceStore* store = nullptr) {
    (store ? store : &store_)->SetValue(key, std::move(value), kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
  }
  bool Synchronize(PreferenceStore* store = nullptr) {
    return (store ? store : &store_)->Synchronize(kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
  }
  std::optional<Value> Copy(std::string_view key, PreferenceStore* store = nullptr) {
    return (store ? store : &store_)->CopyValue(key, kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
  }
  fs::path DomainFile() const { return env_.config_home() / "vantorel/Preferences/com.vantorel.Lumeris.plist"; }
  std::optional<Value> StoredFile() const { return plist::ReadPropertyListFile(DomainFile()); }
  void WriteDomainFileBytes(std::string_view bytes) {
    fs::create_directories(DomainFile().parent_path());
    std::ofstream(DomainFile(), std::ios::binary) << bytes;
  }
  void WriteDomainFile(const Value& content) {
    std::vector<std::uint8_t> bytes = plist::SerializeBinaryPropertyList(content);
    WriteDomainFileBytes(std::string(bytes.begin(), bytes.end()));
  }
  static std::string ReadBytes(const fs::path& path) {
    std::ifstream in(path, std::ios::binary);
    return std::string(std::istreambuf_iterator<char>(in), {});
  }
  std::vector<fs::path> CorruptCopies() const {
    std::vector<fs::path> found;
    for (const auto& entry : fs::directory_iterator(DomainFile().parent_path())) {
      if (entry.path().filename().string().find(".corrupt-") != std::string::npos) found.push_back(entry.path());
    }
    std::sort(found.begin(), found.end());
    return found;
  }

  testing::IsolatedUserEnvironment env_;
  std::shared_ptr<ScriptedFileSystem> file_system_;
  PreferenceStore store_;
};

TEST_F(PreferenceStoreTest, SetAndRemoveChangeTheViewAtOnceAndTheFileOnSynchronize) {
  WriteDomainFile(plist::Dictionary{{"keep", 1}, {"drop", 2}});
  Set("Recents:x", Value(plist::Array{"a", "b"}));
  Set("drop", std::nullopt);
  ASSERT_TRUE(Copy("Recents:x").has_value());
  EXPECT_TRUE(*Copy("Recents:x") == Value(plist::Array{"a", "b"}));
  EXPECT_FALSE(Copy("drop").has_value());
  EXPECT_TRUE(*StoredFile() == Value(plist::Dictionary{{"keep", 1}, {"drop", 2}}));

  ASSERT_TRUE(Synchronize());
  EXPECT_EQ(ReadBytes(DomainFile()).substr(0, 8), "bplist00");
  EXPECT_TRUE(*StoredFile() == Value(plist::Dictionary{{"keep", 1}, {"Recents:x", plist::Array{"a", "b"}}}));
}

TEST_F(PreferenceStoreTest, TwoWritersMergeKeyByKey) {
  PreferenceStore other(file_system_);
  Set("mine", 1);
  Set("other-removed-this", "x");
  ASSERT_TRUE(Synchronize());
  Set("theirs", 2, &other);
  Set("other-removed-this", std::nullopt, &other);
  Set("mine-later", 3);  // pending in the first store while the second one writes
  ASSERT_TRUE(Synchronize(&other));
  ASSERT_TRUE(Synchronize());

  Value expected = plist::Dictionary{{"mine", 1}, {"theirs", 2}, {"mine-later", 3}};
  EXPECT_TRUE(*StoredFile() == expected);
  EXPECT_TRUE(Value(store_.CopyDomain(kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost)) == expected);
  EXPECT_EQ(store_.CopyKeyList(kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost),
            (std::vector<std::string>{"mine", "mine-later", "theirs"}));
}

// Every read compares the file's stamp, so a file replaced by one of the same size in the same
// second, or removed, is seen at the next read.
TEST_F(PreferenceStoreTest, ReadsSeeAReplacedOrRemovedFileAtOnce) {
  WriteDomainFile(plist::Dictionary{{"k", "old"}});
  EXPECT_EQ(*Copy("k")->AsString(), "old");
  WriteDomainFile(plist::Dictionary{{"k", "new"}});
  EXPECT_EQ(*Copy("k")->AsString(), "new");
  fs::remove(DomainFile());
  EXPECT_FALSE(Copy("k").has_value());
  EXPECT_TRUE(store_.CopyKeyList(kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost).empty());
}

TEST_F(PreferenceStoreTest, UnchangedDomainIsNotReadAgain) {
  WriteDomainFile(plist::Dictionary{{"k", 1}});
  ASSERT_TRUE(Synchronize());
  const int reads_after_load = file_system_->reads;
  for (int i = 0; i < 5; ++i) ASSERT_TRUE(Synchronize() && Copy("k"));
  EXPECT_EQ(file_system_->reads, reads_after_load);

  Set("k", 2);
  ASSERT_TRUE(Synchronize());
  ASSERT_TRUE(Synchronize());
  EXPECT_EQ(file_system_->reads, reads_after_load) << "our own write must not force a re-read";
  EXPECT_EQ(file_system_->writes, 1);
}

TEST_F(PreferenceStoreTest, XmlFileIsReadAndRewrittenAsBinary) {
  std::string xml = plist::SerializeXmlPropertyList(plist::Dictionary{{"a", true}});
  WriteDomainFileBytes(xml);
  EXPECT_TRUE(*Copy("a") == Value(true));
  Set("b", 2.5);
  ASSERT_TRUE(Synchronize());
  EXPECT_EQ(ReadBytes(DomainFile()).substr(0, 8), "bplist00");
  EXPECT_TRUE(*StoredFile() == Value(plist::Dictionary{{"a", true}, {"b", 2.5}}));
}

TEST_F(PreferenceStoreTest, CorruptFileReadsEmptyAndIsKeptAsideBeforeNextWrite) {
  WriteDomainFileBytes("this is not a property list");
  EXPECT_FALSE(Copy("anything").has_value());
  ASSERT_TRUE(Synchronize());
  EXPECT_TRUE(CorruptCopies().empty()) << "a read alone must not move the file";

  Set("k", "v");
  ::testing::internal::CaptureStderr();
  ASSERT_TRUE(Synchronize());
  EXPECT_NE(::testing::internal::GetCapturedStderr().find(
                "com.vantorel.Lumeris.plist could not be parsed; moved it aside to " + DomainFile().string() +
                ".corrupt-" + std::to_string(kFixedTime) + "\n"),
            std::string::npos);
  ASSERT_EQ(CorruptCopies().size(), 1u);
  EXPECT_EQ(CorruptCopies()[0].filename().string(), "com.vantorel.Lumeris.plist.corrupt-" + std::to_string(kFixedTime));
  EXPECT_EQ(ReadBytes(CorruptCopies()[0]), "this is not a property list");
  EXPECT_TRUE(*StoredFile() == Value(plist::Dictionary{{"k", "v"}}));

  // A second corrupt file in the same second does not overwrite the first copy; a file whose
  // root is not a dictionary is corrupt too.
  WriteDomainFileBytes("bplist00 also broken");
  ASSERT_TRUE(Synchronize());
  Set("k", "w");
  ASSERT_TRUE(Synchronize());
  ASSERT_EQ(CorruptCopies().size(), 2u);
  EXPECT_EQ(ReadBytes(CorruptCopies()[0]), "this is not a property list");
  EXPECT_EQ(ReadBytes(CorruptCopies()[1]), "bplist00 also broken");
  WriteDomainFile(plist::Array{1, 2});
  ASSERT_TRUE(Synchronize());
  Set("k", 1);
  ASSERT_TRUE(Synchronize());
  EXPECT_EQ(CorruptCopies().size(), 3u);
  EXPECT_TRUE(*StoredFile() == Value(plist::Dictionary{{"k", 1}}));
}

// Failure paths: the file stays as it was, one log line names it and the reason, and the
// changes are dropped, so the view never shows what the file does not hold.
TEST_F(PreferenceStoreTest, FailedSynchronizeLeavesTheFileLogsAndDropsTheChanges) {
  for (bool ScriptedFileSystem::*failure :
       {&ScriptedFileSystem::fail_writes, &ScriptedFileSystem::fail_lock, &ScriptedFileSystem::fail_reads}) {
    WriteDomainFile(plist::Dictionary{{"k", "file"}});
    PreferenceStore store(file_system_);
    ASSERT_TRUE(Synchronize(&store));
    WriteDomainFile(plist::Dictionary{{"k", "file"}, {"other", 1}});  // forces a re-read under the lock
    Set("k", "pending", &store);
    (*file_system_).*failure = true;
    ::testing::internal::CaptureStderr();
    EXPECT_FALSE(Synchronize(&store));
    const std::string log = ::testing::internal::GetCapturedStderr();
    (*file_system_).*failure = false;
    EXPECT_EQ(std::count(log.begin(), log.end(), '\n'), 1) << log;
    EXPECT_NE(log.find("cannot save preferences file " + DomainFile().string() + ": cannot "), std::string::npos) << log;
    EXPECT_TRUE(*StoredFile() == Value(plist::Dictionary{{"k", "file"}, {"other", 1}}));
    EXPECT_EQ(*Copy("k", &store)->AsString(), "file");
    ASSERT_TRUE(Synchronize(&store));
    EXPECT_TRUE(*StoredFile() == Value(plist::Dictionary{{"k", "file"}, {"other", 1}}));
  }
}

// A string the property-list format cannot keep whole is never written shortened: the
// synchronise fails and the file keeps what it had.
TEST_F(PreferenceStoreTest, StringsThatAreNotValidUtf8OrHoldNulAreNeverWritten) {
  for (const std::string& text : {std::string("cut\xFFhere"), std::string("cut\0here", 8), std::string("\xC0\x80")}) {
    WriteDomainFile(plist::Dictionary{{"k", "file"}});
    for (bool as_key : {false, true}) {
      Set(as_key ? text : "k", Value(text));
      ::testing::internal::CaptureStderr();
      EXPECT_FALSE(Synchronize());
      EXPECT_NE(::testing::internal::GetCapturedStderr().find("not valid UTF-8"), std::string::npos);
      EXPECT_TRUE(*StoredFile() == Value(plist::Dictionary{{"k", "file"}}));
    }
  }
}

// Temporary files of writers killed before their rename go at the next write once a minute old.
TEST_F(PreferenceStoreTest, StaleTemporaryFilesAreRemovedByTheNextWrite) {
  WriteDomainFile(plist::Dictionary{{"k", 1}});
  const fs::path stale = DomainFile().string() + ".tmp-AbC123", fresh = DomainFile().string() + ".tmp-XyZ789";
  const fs::path other = DomainFile().parent_path() / "other.plist.tmp-AbC123";
  for (const fs::path& path : {stale, fresh, other}) std::ofstream(path) << "partial";
  // Ages count from the store's clock, fixed at kFixedTime.
  const auto at = [](std::int64_t seconds) {
    return std::chrono::file_clock::from_sys(std::chrono::sys_seconds(std::chrono::seconds(seconds)));
  };
  fs::last_write_time(stale, at(kFixedTime - 61));
  fs::last_write_time(fresh, at(kFixedTime - 30));
  fs::last_write_time(other, at(kFixedTime - 3600));
  Set("k", 2);
  ASSERT_TRUE(Synchronize());
  EXPECT_FALSE(fs::exists(stale));
  EXPECT_TRUE(fs::exists(fresh));
  EXPECT_TRUE(fs::exists(other)) << "only this domain's files";
}

TEST_F(PreferenceStoreTest, AnyUserScopeIsReadOnly) {
  store_.SetValue("k", Value(1), kDomain, kCFPreferencesAnyUser, kCFPreferencesAnyHost);
  EXPECT_FALSE(store_.CopyValue("k", kDomain, kCFPreferencesAnyUser, kCFPreferencesAnyHost).has_value());
  EXPECT_TRUE(store_.Synchronize(kDomain, kCFPreferencesAnyUser, kCFPreferencesAnyHost));
  EXPECT_FALSE(fs::exists(env_.config_dirs() / "vantorel"));
}

// Paths: each scope maps to its file, following the environment at call time.
TEST(PreferencesPathTest, ScopesMapToXdgFiles) {
  testing::IsolatedUserEnvironment env;
  const std::string host = PreferencesHostId();
  ASSERT_FALSE(host.empty());
  const struct {
    PreferencesUser user;
    PreferencesHost host;
    fs::path expected;
  } cases[] = {
      {kCFPreferencesCurrentUser, kCFPreferencesAnyHost, env.config_home() / "vantorel/Preferences/d.plist"},
      {kCFPreferencesCurrentUser, kCFPreferencesCurrentHost,
       env.config_home() / ("vantorel/Preferences/ByHost/d." + host + ".plist")},
      {kCFPreferencesAnyUser, kCFPreferencesAnyHost, env.config_dirs() / "vantorel/Preferences/d.plist"},
      {kCFPreferencesAnyUser, kCFPreferencesCurrentHost,
       env.config_dirs() / ("vantorel/Preferences/ByHost/d." + host + ".plist")},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.expected);
    EXPECT_EQ(PreferencesFilePath("d", c.user, c.host), c.expected);
  }
}

TEST(PreferencesPathTest, DefaultsAndIgnoredEnvironmentValues) {
  testing::IsolatedUserEnvironment env;
  env.env().Set("XDG_CONFIG_HOME", std::nullopt);
  EXPECT_EQ(PreferencesFilePath("d", kCFPreferencesCurrentUser, kCFPreferencesAnyHost),
            env.home() / ".config/vantorel/Preferences/d.plist");
  env.env().Set("XDG_CONFIG_HOME", "relative/dir");
  EXPECT_EQ(PreferencesFilePath("d", kCFPreferencesCurrentUser, kCFPreferencesAnyHost),
            env.home() / ".config/vantorel/Preferences/d.plist");
  env.env().Set("XDG_CONFIG_DIRS", "/first:/second");
  EXPECT_EQ(PreferencesFilePath("d", kCFPreferencesAnyUser, kCFPreferencesAnyHost),
            fs::path("/first/vantorel/Preferences/d.plist"));
  env.env().Set("XDG_CONFIG_DIRS", std::nullopt);
  EXPECT_EQ(PreferencesFilePath("d", kCFPreferencesAnyUser, kCFPreferencesAnyHost),
            fs::path("/etc/xdg/vantorel/Preferences/d.plist"));
  env.env().Set("HOME", std::nullopt);
  EXPECT_FALSE(PreferencesFilePath("d", kCFPreferencesCurrentUser, kCFPreferencesAnyHost).has_value());
}

TEST(PreferencesPathTest, DomainsThatCannotNameAFileHaveNoPath) {
  testing::IsolatedUserEnvironment env;
  for (std::string_view domain : {std::string_view(""), std::string_view("."), std::string_view(".."),
                                  std::string_view("a/b"), std::string_view("../x"), std::string_view("a\0b", 3)}) {
    EXPECT_FALSE(PreferencesFilePath(domain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost).has_value());
    EXPECT_FALSE(CFPreferencesAppSynchronize(domain));
  }
}

// The CFPreferences functions on the shared store.
TEST(CFPreferencesTest, IntegerAndBooleanReadersFollowTheValueType) {
  testing::IsolatedUserEnvironment env;
  const struct {
    const char* name;
    std::optional<Value> value;
    std::int64_t integer;
    bool integer_valid, boolean, boolean_valid;
  } cases[] = {
      {"absent", std::nullopt, 0, false, false, false},
      {"integer", Value(42), 42, true, false, false},
      {"negative", Value(-7), -7, true, false, false},
      {"true", Value(true), 0, false, true, true},
      {"false", Value(false), 0, false, false, true},
      {"string", Value("1"), 0, false, false, false},
      {"real", Value(1.0), 0, false, false, false},
      {"array", Value(plist::Array{1}), 0, false, false, false},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.name);
    CFPreferencesSetAppValue("key", c.value, "test.readers");
    ASSERT_TRUE(CFPreferencesAppSynchronize("test.readers"));
    bool valid = !c.integer_valid;
    EXPECT_EQ(CFPreferencesGetAppIntegerValue("key", "test.readers", &valid), c.integer);
    EXPECT_EQ(valid, c.integer_valid);
    valid = !c.boolean_valid;
    EXPECT_EQ(CFPreferencesGetAppBooleanValue("key", "test.readers", &valid), c.boolean);
    EXPECT_EQ(valid, c.boolean_valid);
  }
}

TEST(CFPreferencesTest, AppFunctionsUseCurrentUserAnyHostAndCopyValueReachesOtherScopes) {
  testing::IsolatedUserEnvironment env;
  CFPreferencesSetAppValue("VTStartAsLargeWindowTemporarily", Value("/tmp/x"), "com.vantorel.SorvendiIM");
  ASSERT_TRUE(CFPreferencesAppSynchronize("com.vantorel.SorvendiIM"));
  EXPECT_TRUE(fs::exists(env.config_home() / "vantorel/Preferences/com.vantorel.SorvendiIM.plist"));
  EXPECT_EQ(CFPreferencesCopyKeyList("com.vantorel.SorvendiIM", kCFPreferencesCurrentUser, kCFPreferencesAnyHost),
            std::vector<std::string>{"VTStartAsLargeWindowTemporarily"});

  const fs::path global = env.config_dirs() / ("vantorel/Preferences/ByHost/.GlobalPreferences." +
                                               PreferencesHostId() + ".plist");
  fs::create_directories(global.parent_path());
  std::vector<std::uint8_t> bytes = plist::SerializeBinaryPropertyList(plist::Dictionary{{"Country", "CN"}});
  std::ofstream(global, std::ios::binary).write(reinterpret_cast<const char*>(bytes.data()),
                                                static_cast<std::streamsize>(bytes.size()));
  std::optional<Value> country = CFPreferencesCopyValue("Country", kCFPreferencesAnyApplication,
                                                        kCFPreferencesAnyUser, kCFPreferencesCurrentHost);
  ASSERT_TRUE(country.has_value());
  EXPECT_EQ(*country->AsString(), "CN");
  EXPECT_FALSE(CFPreferencesCopyAppValue("Country", kCFPreferencesAnyApplication).has_value());
}

}  // namespace
}  // namespace lumeris
