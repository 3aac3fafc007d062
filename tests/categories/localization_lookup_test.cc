#include "categories/localization_lookup.h"

#include <gtest/gtest.h>

#include <atomic>
#include <filesystem>
#include <map>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "bundle/bundle_fixture.h"
#include "support/scoped_env.h"
#include "support/temp_dir.h"

namespace lumeris {
namespace {

namespace fs = std::filesystem;
using testing::BundleWriter;
using testing::ScopedEnv;
using testing::ScopedTempDir;

// The translation a fixture table holds for `key`: it names where it came from, so every
// answer shows which table of which localization was read.
std::string Translation(std::string_view localization, std::string_view table, std::string_view key) {
  return std::string(localization) + "/" + std::string(table) + "/" + std::string(key);
}

// Wraps the real loader and counts how often each table file is loaded.
class CountingLoader {
 public:
  StringsTableCache::Loader loader() {
    return [this](const fs::path& path) -> StringsTableCache::Table {
      {
        std::lock_guard lock(mutex_);
        ++loads_[path];
      }
      auto table = ReadStringsTable(path);
      return table ? std::make_shared<const plist::Dictionary>(std::move(*table)) : nullptr;
    };
  }
  int loads(const fs::path& path) {
    std::lock_guard lock(mutex_);
    return loads_[path];
  }
  int total() {
    std::lock_guard lock(mutex_);
    int sum = 0;
    for (const auto& [path, count] : loads_) sum += count;
    return sum;
  }

 private:
  std::mutex mutex_;
  std::map<fs::path, int> loads_;
};

// An application bundle with "Localizable" and "Emoji_Category" tables in en, de and fr, each
// holding the keys "Smileys" and "Animals", plus a key "OnlyInLocalizable" in every
// "Localizable" table. The user's language is French unless a test says otherwise.
class LocalizationLookupTest : public ::testing::Test {
 protected:
  static constexpr const char* kIdentifier = "com.example.Picker";

  LocalizationLookupTest() : app_(WriteApp("Picker.app", kIdentifier)), cache_(counter_.loader()) {
    testing::SetUserLanguages(env_, "fr");
  }

  BundleWriter WriteApp(std::string_view name, std::string_view identifier) {
    BundleWriter app = BundleWriter::Application(dir_.path() / name, std::string(identifier), "en");
    for (const char* loc : {"en", "de", "fr"}) {
      for (const char* table : {"Localizable", "Emoji_Category"}) {
        std::map<std::string, std::string> strings;
        for (const char* key : {"Smileys", "Animals"}) strings[key] = Translation(loc, table, key);
        if (std::string_view(table) == "Localizable") strings["OnlyInLocalizable"] = Translation(loc, table, "OnlyInLocalizable");
        app.WriteStringsTable(loc, table, strings);
      }
    }
    return app;
  }

  Bundle Open(const BundleWriter& writer) const { return *Bundle::Open(writer.path()); }

  fs::path TableFile(std::string_view loc, std::string_view table) const {
    return app_.Folder(loc) / (std::string(table) + ".strings");
  }

  // One lookup through the test's own cache.
  std::optional<std::string> Lookup(std::string_view key, const Bundle& bundle, std::optional<std::string_view> loc,
                                    std::optional<std::string_view> table, std::optional<std::string_view> fallback = "default") {
    return cache_.Lookup(key, &bundle, loc, table, fallback);
  }

  ScopedTempDir dir_;
  ScopedEnv env_;
  BundleWriter app_;
  CountingLoader counter_;
  StringsTableCache cache_;
};

// Hit and miss rules of the one-entry cache.

TEST_F(LocalizationLookupTest, NamedTableLoadsOnceForConsecutiveLookups) {
  const Bundle app = Open(app_);
  EXPECT_EQ(Lookup("Smileys", app, "de", "Emoji_Category"), Translation("de", "Emoji_Category", "Smileys"));
  EXPECT_EQ(Lookup("Animals", app, "de", "Emoji_Category"), Translation("de", "Emoji_Category", "Animals"));
  EXPECT_EQ(counter_.loads(TableFile("de", "Emoji_Category")), 1);
  EXPECT_EQ(counter_.total(), 1);
}

TEST_F(LocalizationLookupTest, DefaultTableReloadsEveryTime) {
  const Bundle app = Open(app_);
  EXPECT_EQ(Lookup("Smileys", app, "de", std::nullopt), Translation("de", "Localizable", "Smileys"));
  EXPECT_EQ(Lookup("Animals", app, "de", std::nullopt), Translation("de", "Localizable", "Animals"));
  EXPECT_EQ(counter_.loads(TableFile("de", "Localizable")), 2);
}

TEST_F(LocalizationLookupTest, NewLocalizationReplacesTheEntry) {
  const Bundle app = Open(app_);
  Lookup("Smileys", app, "de", "Emoji_Category");
  Lookup("Smileys", app, "de", "Emoji_Category");
  EXPECT_EQ(Lookup("Smileys", app, "fr", "Emoji_Category"), Translation("fr", "Emoji_Category", "Smileys"));
  // The German entry is gone: going back loads it again.
  EXPECT_EQ(Lookup("Smileys", app, "de", "Emoji_Category"), Translation("de", "Emoji_Category", "Smileys"));
  EXPECT_EQ(counter_.loads(TableFile("de", "Emoji_Category")), 2);
  EXPECT_EQ(counter_.loads(TableFile("fr", "Emoji_Category")), 1);
}

TEST_F(LocalizationLookupTest, NewTableNameReplacesTheEntry) {
  const Bundle app = Open(app_);
  Lookup("Smileys", app, "de", "Emoji_Category");
  EXPECT_EQ(Lookup("Smileys", app, "de", "Localizable"), Translation("de", "Localizable", "Smileys"));
  Lookup("Smileys", app, "de", "Emoji_Category");
  EXPECT_EQ(counter_.loads(TableFile("de", "Emoji_Category")), 2);
}

TEST_F(LocalizationLookupTest, BundlesAreToldApartByIdentifier) {
  const Bundle app = Open(app_);
  const Bundle same_identifier = Open(app_);
  const BundleWriter other_writer = WriteApp("Other.app", "com.example.Other");
  const Bundle other = Open(other_writer);

  Lookup("Smileys", app, "de", "Emoji_Category");
  Lookup("Smileys", same_identifier, "de", "Emoji_Category");
  EXPECT_EQ(counter_.total(), 1);
  EXPECT_EQ(Lookup("Smileys", other, "de", "Emoji_Category"), Translation("de", "Emoji_Category", "Smileys"));
  EXPECT_EQ(counter_.loads(other_writer.Folder("de") / "Emoji_Category.strings"), 1);
}

TEST_F(LocalizationLookupTest, AbsentLocalizationOrIdentifierNeverHits) {
  const Bundle app = Open(app_);
  Lookup("Smileys", app, std::nullopt, "Emoji_Category");
  EXPECT_EQ(Lookup("Smileys", app, std::nullopt, "Emoji_Category"), Translation("fr", "Emoji_Category", "Smileys"));
  EXPECT_EQ(counter_.loads(TableFile("fr", "Emoji_Category")), 2);

  const BundleWriter anonymous_writer = WriteApp("Anonymous.app", "unused");
  BundleWriter::WritePlist(anonymous_writer.info_file(), plist::Dictionary{{"CFBundleDevelopmentRegion", "en"}});
  const Bundle anonymous = Open(anonymous_writer);
  Lookup("Smileys", anonymous, "de", "Emoji_Category");
  Lookup("Smileys", anonymous, "de", "Emoji_Category");
  EXPECT_EQ(counter_.loads(anonymous_writer.Folder("de") / "Emoji_Category.strings"), 2);
}

// Where the answer comes from.

TEST_F(LocalizationLookupTest, EnglishResolvesToEnTables) {
  const Bundle app = Open(app_);
  EXPECT_EQ(Lookup("Smileys", app, "English", "Emoji_Category"), Translation("en", "Emoji_Category", "Smileys"));
  EXPECT_EQ(Lookup("Smileys", app, "English", std::nullopt), Translation("en", "Localizable", "Smileys"));
}

TEST_F(LocalizationLookupTest, KeyMissingFromLoadedTableGivesTheDefault) {
  const Bundle app = Open(app_);
  // "OnlyInLocalizable" is in every Localizable table, and the user's own language (fr) has it too.
  EXPECT_EQ(Lookup("OnlyInLocalizable", app, "de", "Emoji_Category", "fallback"), "fallback");
  EXPECT_EQ(Lookup("OnlyInLocalizable", app, "de", "Emoji_Category", std::nullopt), std::nullopt);
}

TEST_F(LocalizationLookupTest, WrongTypedValueGivesTheDefault) {
  app_.WriteStringsTable("de", "Emoji_Category", {});
  BundleWriter::WritePlist(TableFile("de", "Emoji_Category"), plist::Dictionary{{"Smileys", 42}});
  const Bundle app = Open(app_);
  EXPECT_EQ(Lookup("Smileys", app, "de", "Emoji_Category", "fallback"), "fallback");
}

TEST_F(LocalizationLookupTest, MissingTableAsksTheBundleInTheUsersLanguage) {
  fs::remove(TableFile("de", "Emoji_Category"));
  const Bundle app = Open(app_);
  // The bundle's own lookup follows the user's language (fr), not the localization asked for.
  EXPECT_EQ(Lookup("Smileys", app, "de", "Emoji_Category"), Translation("fr", "Emoji_Category", "Smileys"));
  EXPECT_EQ(Lookup("Unknown", app, "de", "Emoji_Category", "fallback"), "fallback");
  EXPECT_EQ(counter_.total(), 0);
}

TEST_F(LocalizationLookupTest, UnreadableTableIsCachedAsMissing) {
  BundleWriter::WriteFile(TableFile("de", "Emoji_Category"), "not a property list");
  const Bundle app = Open(app_);
  EXPECT_EQ(Lookup("Smileys", app, "de", "Emoji_Category"), Translation("fr", "Emoji_Category", "Smileys"));
  EXPECT_EQ(Lookup("Animals", app, "de", "Emoji_Category"), Translation("fr", "Emoji_Category", "Animals"));
  EXPECT_EQ(counter_.loads(TableFile("de", "Emoji_Category")), 1);
}

TEST_F(LocalizationLookupTest, NoTableAnywhereGivesTheDefault) {
  const Bundle app = Open(app_);
  EXPECT_EQ(Lookup("Smileys", app, "de", "NoSuchTable", "fallback"), "fallback");
  EXPECT_EQ(cache_.Lookup("Smileys", nullptr, "de", "Emoji_Category", "fallback"), "fallback");
  EXPECT_EQ(cache_.Lookup("Smileys", nullptr, "de", "Emoji_Category", std::nullopt), std::nullopt);
}

TEST_F(LocalizationLookupTest, ConcurrentLookupsAlwaysReadTheirOwnTable) {
  const Bundle app = Open(app_);
  std::atomic<int> wrong{0};
  std::vector<std::thread> threads;
  const std::vector<std::pair<const char*, std::optional<const char*>>> requests = {
      {"de", "Emoji_Category"}, {"fr", "Emoji_Category"}, {"en", std::nullopt}, {"de", "Localizable"}};
  for (const auto& [loc, table] : requests) {
    threads.emplace_back([&, loc, table] {
      const std::optional<std::string_view> table_name = table ? std::optional<std::string_view>(*table) : std::nullopt;
      const std::string expected = Translation(loc, table.value_or("Localizable"), "Animals");
      for (int i = 0; i < 300; ++i) {
        if (cache_.Lookup("Animals", &app, loc, table_name, "default") != expected) ++wrong;
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(wrong.load(), 0);
}

// The process-wide lookup and the choice of localization.

TEST_F(LocalizationLookupTest, ProcessWideLookupReadsRealFiles) {
  const Bundle app = Open(app_);
  EXPECT_EQ(LocalizedStringForLanguage("Animals", &app, "de", "Emoji_Category", "default"),
            Translation("de", "Emoji_Category", "Animals"));
  EXPECT_EQ(LocalizedStringForLanguage("Nope", &app, "English", std::nullopt, "default"), "default");
}

struct PreferenceCase {
  const char* what;
  std::vector<std::string> localizations;
  std::optional<std::string> languages;  // LANGUAGE
  std::string expected;
  friend void PrintTo(const PreferenceCase& c, std::ostream* os) { *os << c.what; }
};

class PreferredLocalizationOfBundleTest : public ::testing::TestWithParam<PreferenceCase> {};

TEST_P(PreferredLocalizationOfBundleTest, ChoosesAmongTheBundlesLocalizations) {
  ScopedTempDir dir;
  ScopedEnv env;
  testing::SetUserLanguages(env, GetParam().languages);
  const BundleWriter app = BundleWriter::Application(dir.path() / "A.app", "com.example.A", "de");
  for (const std::string& loc : GetParam().localizations) app.Folder(loc);
  const Bundle bundle = *Bundle::Open(app.path());
  EXPECT_EQ(PreferredLocalizationOfBundle(&bundle), GetParam().expected);
}

INSTANTIATE_TEST_SUITE_P(
    Choice, PreferredLocalizationOfBundleTest,
    ::testing::Values(
        PreferenceCase{"first language that matches", {"en", "de", "fr"}, "it:fr_CA:de", "fr"},
        PreferenceCase{"regional variant", {"en", "pt", "pt-PT"}, "pt_PT.UTF-8", "pt-PT"},
        PreferenceCase{"old-style folder", {"German", "French"}, "de_DE", "German"},
        PreferenceCase{"no match is English, not the development localization", {"de", "fr"}, "ja", "English"},
        PreferenceCase{"no languages at all", {"de", "fr"}, std::nullopt, "English"},
        PreferenceCase{"no localizations", {}, "de", "English"}));

TEST(PreferredLocalizationOfBundleErrorTest, NoBundleIsEnglish) {
  EXPECT_EQ(PreferredLocalizationOfBundle(nullptr), "English");
}

}  // namespace
}  // namespace lumeris
