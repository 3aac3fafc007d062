// The category localization lookup: the one-entry strings-table cache (watched through a loader
// that counts loads), where answers come from, the choice of localization, and the system bundles.
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
#include "categories/system_bundles.h"
#include "support/scoped_env.h"
#include "support/temp_dir.h"

namespace lumeris {
namespace {

namespace fs = std::filesystem;
using testing::BundleWriter;
using testing::ScopedEnv;
using testing::ScopedTempDir;
using Maybe = std::optional<std::string_view>;
constexpr Maybe kEmoji = "Emoji_Category";
constexpr Maybe kDefault = std::nullopt;

// Bundles "app" and "same" (one identifier, one folder), "other" (another identifier) and "anon"
// (none). app holds Emoji_Category in de, fr and en and Localizable in de; other and anon hold
// de/Emoji_Category. Each table maps "Smileys" to the name of its file ("app:de/Emoji_Category");
// app's French one also holds "OnlyInFrench". The user's language is French. The loader counts
// loads per file, by the same name.
class LocalizationLookupTest : public ::testing::Test {
 protected:
  LocalizationLookupTest() {
    testing::SetUserLanguages(env_, "fr");
    for (const std::string name : {"app", "other", "anon"}) {
      const BundleWriter app = BundleWriter::Application(
          dir_.path() / name, name == "anon" ? std::nullopt : std::optional("com.example." + name), "en");
      const auto write = [&](const char* loc, const char* table) {
        std::map<std::string, std::string> strings{{"Smileys", File(name, loc, table)}};
        if (std::string_view(loc) == "fr") strings.emplace("OnlyInFrench", "French");
        app.WriteStringsTable(loc, table, strings);
      };
      write("de", "Emoji_Category");
      if (name != "app") continue;
      write("fr", "Emoji_Category");
      write("en", "Emoji_Category");
      write("de", "Localizable");
    }
    for (const char* name : {"app", "other", "anon"}) bundles_.emplace(name, *Bundle::Open(dir_.path() / name));
    bundles_.emplace("same", *Bundle::Open(dir_.path() / "app"));
  }

  static std::string File(std::string_view bundle, std::string_view loc, std::string_view table) {
    return std::string(bundle) + ":" + std::string(loc) + "/" + std::string(table);
  }
  std::map<std::string, int> Loads() {
    std::lock_guard lock(mutex_);
    return loads_;
  }
  std::optional<std::string> Lookup(std::string_view key, Maybe loc, Maybe table, Maybe fallback = "default",
                                    const char* bundle = "app") {
    return cache_.Lookup(key, &bundles_.at(bundle), loc, table, fallback);
  }
  StringsTableCache::Table Load(const fs::path& path) {
    std::lock_guard lock(mutex_);
    ++loads_[path.parent_path().parent_path().parent_path().parent_path().filename().string() + ":" +
             path.parent_path().stem().string() + "/" + path.stem().string()];
    auto table = ReadStringsTable(path);
    return table ? std::make_shared<const plist::Dictionary>(std::move(*table)) : nullptr;
  }

  ScopedTempDir dir_;
  ScopedEnv env_;
  std::map<std::string, Bundle> bundles_;
  std::mutex mutex_;
  std::map<std::string, int> loads_;
  StringsTableCache cache_{[this](const fs::path& path) { return Load(path); }};
};

// Hit and miss rules of the one-entry cache: runs of lookups of "Smileys", each run on a cache of
// its own, each lookup answered from the right file, and every load the run made.
TEST_F(LocalizationLookupTest, CacheLoadsOnlyOnAMiss) {
  struct Step { const char* bundle; Maybe loc, table; };
  const struct { const char* what; std::vector<Step> steps; std::map<std::string, int> loads; } kRuns[] = {
      {"two lookups in one named table load it once",
       {{"app", "de", kEmoji}, {"app", "de", kEmoji}}, {{"app:de/Emoji_Category", 1}}},
      {"the default table reloads every time",
       {{"app", "de", kDefault}, {"app", "de", kDefault}}, {{"app:de/Localizable", 2}}},
      {"a new localization replaces the entry",
       {{"app", "de", kEmoji}, {"app", "fr", kEmoji}, {"app", "de", kEmoji}},
       {{"app:de/Emoji_Category", 2}, {"app:fr/Emoji_Category", 1}}},
      {"a new table name replaces the entry",
       {{"app", "de", kEmoji}, {"app", "de", "Localizable"}, {"app", "de", kEmoji}},
       {{"app:de/Emoji_Category", 2}, {"app:de/Localizable", 1}}},
      {"bundles are told apart by identifier",
       {{"app", "de", kEmoji}, {"same", "de", kEmoji}, {"other", "de", kEmoji}},
       {{"app:de/Emoji_Category", 1}, {"other:de/Emoji_Category", 1}}},
      {"an absent localization never hits",
       {{"app", std::nullopt, kEmoji}, {"app", std::nullopt, kEmoji}}, {{"app:fr/Emoji_Category", 2}}},
      {"a bundle without identifier never hits",
       {{"anon", "de", kEmoji}, {"anon", "de", kEmoji}}, {{"anon:de/Emoji_Category", 2}}},
      {"\"English\" reads the en tables", {{"app", "English", kEmoji}}, {{"app:en/Emoji_Category", 1}}},
  };
  for (const auto& run : kRuns) {
    StringsTableCache cache([this](const fs::path& path) { return Load(path); });
    loads_.clear();
    for (const Step& s : run.steps) {
      const char* bundle = std::string_view(s.bundle) == "same" ? "app" : s.bundle;
      const std::string_view loc = !s.loc ? "fr" : *s.loc == "English" ? "en" : *s.loc;
      EXPECT_EQ(cache.Lookup("Smileys", &bundles_.at(s.bundle), s.loc, s.table, "default"),
                File(bundle, loc, s.table.value_or("Localizable"))) << run.what;
    }
    EXPECT_EQ(Loads(), run.loads) << run.what;
  }
}

// Where the answer comes from when the loaded table cannot give it: a loaded table answers alone;
// a missing or unreadable one (loaded once all the same) leaves it to the bundle, in the user's
// language.
TEST_F(LocalizationLookupTest, AnswersFromTheLoadedTableElseFromTheBundle) {
  EXPECT_EQ(Lookup("OnlyInFrench", "de", kEmoji, "fallback"), "fallback");
  EXPECT_EQ(Lookup("OnlyInFrench", "de", kEmoji, std::nullopt), std::nullopt);
  EXPECT_EQ(Lookup("OnlyInFrench", "ja", kEmoji), "French");
  EXPECT_EQ(Lookup("Smileys", "ja", "NoSuchTable", "fallback"), "fallback");
  BundleWriter::WriteFile(dir_.path() / "app/Contents/Resources/en.lproj/Emoji_Category.strings", "not a plist");
  EXPECT_EQ(Lookup("Smileys", "en", kEmoji), "app:fr/Emoji_Category");
  EXPECT_EQ(Lookup("OnlyInFrench", "en", kEmoji), "French");
  EXPECT_EQ(Loads()["app:en/Emoji_Category"], 1);
  BundleWriter::WritePlist(dir_.path() / "app/Contents/Resources/fr.lproj/Emoji_Category.strings",
                           plist::Dictionary{{"Smileys", 42}});
  EXPECT_EQ(Lookup("Smileys", "fr", kEmoji, "fallback"), "fallback") << "a wrong-typed value";
  EXPECT_EQ(cache_.Lookup("Smileys", nullptr, "de", kEmoji, "fallback"), "fallback");
  EXPECT_EQ(cache_.Lookup("Smileys", nullptr, "de", kEmoji, std::nullopt), std::nullopt);

  const Bundle& app = bundles_.at("app");
  EXPECT_EQ(LocalizedStringForLanguage("Smileys", &app, "de", kEmoji, "default"), "app:de/Emoji_Category");
  // The user's languages choose among the bundle's localizations; no match is "English", not the
  // development localization.
  EXPECT_EQ(PreferredLocalizationOfBundle(&app), "fr");
  testing::SetUserLanguages(env_, "ja");
  EXPECT_EQ(PreferredLocalizationOfBundle(&app), "English");
  EXPECT_EQ(PreferredLocalizationOfBundle(nullptr), "English");
}

TEST_F(LocalizationLookupTest, ConcurrentLookupsAlwaysReadTheirOwnTable) {
  std::atomic<int> wrong{0};
  std::vector<std::thread> threads;
  for (const auto& [loc, table] : std::vector<std::pair<const char*, Maybe>>{
           {"de", kEmoji}, {"fr", kEmoji}, {"de", kDefault}, {"en", kEmoji}}) {
    threads.emplace_back([&, loc, table] {
      const std::string expected = File("app", loc, table.value_or("Localizable"));
      for (int i = 0; i < 300; ++i) wrong += Lookup("Smileys", loc, table) != expected;
    });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(wrong.load(), 0);
}

// The system bundles under LUMERIS_SYSTEM_ROOT (the application bundle found there is the
// catalogue's and the end-to-end tests'). The framework bundle is process-wide, so its whole life
// is one test: absent, found, kept when the root later changes.
TEST(SystemBundlesTest, OpenUnderTheSystemRootAndTheFrameworkIsKept) {
  ScopedTempDir root;
  ScopedEnv env;
  env.Set("LUMERIS_SYSTEM_ROOT", root.path().string());
  testing::SetUserLanguages(env, "de");

  EXPECT_FALSE(OpenApplicationBundle());
  EXPECT_EQ(MyFrameworkBundle(), nullptr);
  EXPECT_EQ(MyFrameworkLocalizedString("Close"), "Close");
  BundleWriter framework = BundleWriter::Framework(
      root.path() / "System/Library/PrivateFrameworks/Lumeris.framework", "com.example.Framework", "en");
  framework.WriteStringsTable("en", "Localizable", {{"Close", "Close (en)"}, {"Done", "Done (en)"}});
  framework.WriteStringsTable("de", "Localizable", {{"Close", "Schließen"}});
  const Bundle* found = MyFrameworkBundle();
  ASSERT_NE(found, nullptr);
  EXPECT_EQ(found->identifier(), "com.example.Framework");
  EXPECT_EQ(MyFrameworkLocalizedString("Close"), "Schließen");
  EXPECT_EQ(MyFrameworkLocalizedString("Done"), "Done") << "the German table is the only one read";

  ScopedTempDir elsewhere;
  env.Set("LUMERIS_SYSTEM_ROOT", elsewhere.path().string());
  EXPECT_EQ(MyFrameworkBundle(), found);
}

}  // namespace
}  // namespace lumeris
