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
#include "platform/system_root.h"
#include "support/scoped_env.h"
#include "support/temp_dir.h"

namespace lumeris {
namespace {

namespace fs = std::filesystem;
using testing::BundleWriter;
using testing::ScopedEnv;
using testing::ScopedTempDir;
using Maybe = std::optional<std::string_view>;

// A fixture table's translation names its bundle, localization and table, so every answer shows
// which file was read.
std::string Translation(std::string_view bundle, std::string_view loc, std::string_view table,
                        std::string_view key) {
  return std::string(bundle) + ":" + std::string(loc) + "/" + std::string(table) + "/" +
         std::string(key);
}

// Bundles "app" and "same" (one identifier), "other" and "anon" (no identifier), each with
// "Localizable" and "Emoji_Category" in en, de and fr holding "Smileys" and "Animals" (and
// "OnlyInLocalizable" in "Localizable"). The user's language is French. The loader counts loads
// per file, named like a translation: "app:de/Emoji_Category".
class LocalizationLookupTest : public ::testing::Test {
 protected:
  LocalizationLookupTest()
      : cache_([this](const fs::path& path) -> StringsTableCache::Table {
          const std::string bundle = path.parent_path().parent_path().parent_path().parent_path().filename();
          std::lock_guard lock(mutex_);
          ++loads_[bundle + ":" + path.parent_path().stem().string() + "/" + path.stem().string()];
          auto table = ReadStringsTable(path);
          return table ? std::make_shared<const plist::Dictionary>(std::move(*table)) : nullptr;
        }) {
    testing::SetUserLanguages(env_, "fr");
    for (const std::string name : {"app", "other", "anon"}) {
      BundleWriter app = BundleWriter::Application(dir_.path() / name, "com.example." + name, "en");
      for (const char* loc : {"en", "de", "fr"}) {
        for (const std::string table : {"Localizable", "Emoji_Category"}) {
          std::map<std::string, std::string> strings;
          for (const char* key : {"Smileys", "Animals", "OnlyInLocalizable"}) {
            if (table == "Localizable" || key[0] != 'O') strings[key] = Translation(name, loc, table, key);
          }
          app.WriteStringsTable(loc, table, strings);
        }
      }
      if (name == "anon") BundleWriter::WritePlist(app.info_file(), plist::Dictionary{});
      bundles_.emplace(name, *Bundle::Open(app.path()));
    }
    bundles_.emplace("same", *Bundle::Open(dir_.path() / "app"));
  }

  fs::path TableFile(std::string_view loc, std::string_view table) const {
    return dir_.path() / "app/Contents/Resources" / (std::string(loc) + ".lproj") /
           (std::string(table) + ".strings");
  }
  std::map<std::string, int> Loads() {
    std::lock_guard lock(mutex_);
    return loads_;
  }
  std::optional<std::string> Lookup(std::string_view key, Maybe loc, Maybe table,
                                    Maybe fallback = "default", const char* bundle = "app") {
    return cache_.Lookup(key, &bundles_.at(bundle), loc, table, fallback);
  }

  ScopedTempDir dir_;
  ScopedEnv env_;
  std::map<std::string, Bundle> bundles_;
  std::mutex mutex_;
  std::map<std::string, int> loads_;
  StringsTableCache cache_;
};

constexpr Maybe kEmoji = "Emoji_Category";
constexpr Maybe kDefault = std::nullopt;

// Hit and miss rules of the one-entry cache: a run of lookups of "Smileys", each answered from
// the right file, and every load the run made.
struct Step {
  const char* bundle;
  Maybe loc;
  Maybe table;
};
struct CacheCase {
  const char* what;
  std::vector<Step> steps;
  std::map<std::string, int> loads;
  friend void PrintTo(const CacheCase& c, std::ostream* os) { *os << c.what; }
};

class CacheRuleTest : public LocalizationLookupTest, public ::testing::WithParamInterface<CacheCase> {};

TEST_P(CacheRuleTest, LoadsOnlyOnAMiss) {
  for (const Step& s : GetParam().steps) {
    const char* bundle = std::string_view(s.bundle) == "same" ? "app" : s.bundle;
    const std::string_view loc = !s.loc ? "fr" : *s.loc == "English" ? "en" : *s.loc;
    EXPECT_EQ(Lookup("Smileys", s.loc, s.table, "default", s.bundle),
              Translation(bundle, loc, s.table.value_or("Localizable"), "Smileys"));
  }
  EXPECT_EQ(Loads(), GetParam().loads);
}

INSTANTIATE_TEST_SUITE_P(
    Rules, CacheRuleTest,
    ::testing::Values(
        CacheCase{"two lookups in one named table load it once",
                  {{"app", "de", kEmoji}, {"app", "de", kEmoji}}, {{"app:de/Emoji_Category", 1}}},
        CacheCase{"the default table reloads every time",
                  {{"app", "de", kDefault}, {"app", "de", kDefault}}, {{"app:de/Localizable", 2}}},
        CacheCase{"a new localization replaces the entry",
                  {{"app", "de", kEmoji}, {"app", "de", kEmoji}, {"app", "fr", kEmoji}, {"app", "de", kEmoji}},
                  {{"app:de/Emoji_Category", 2}, {"app:fr/Emoji_Category", 1}}},
        CacheCase{"a new table name replaces the entry",
                  {{"app", "de", kEmoji}, {"app", "de", "Localizable"}, {"app", "de", kEmoji}},
                  {{"app:de/Emoji_Category", 2}, {"app:de/Localizable", 1}}},
        CacheCase{"bundles are told apart by identifier",
                  {{"app", "de", kEmoji}, {"same", "de", kEmoji}, {"other", "de", kEmoji}},
                  {{"app:de/Emoji_Category", 1}, {"other:de/Emoji_Category", 1}}},
        CacheCase{"an absent localization never hits",
                  {{"app", std::nullopt, kEmoji}, {"app", std::nullopt, kEmoji}}, {{"app:fr/Emoji_Category", 2}}},
        CacheCase{"a bundle without identifier never hits",
                  {{"anon", "de", kEmoji}, {"anon", "de", kEmoji}}, {{"anon:de/Emoji_Category", 2}}},
        CacheCase{"\"English\" reads the en tables",
                  {{"app", "English", kEmoji}, {"app", "English", kDefault}},
                  {{"app:en/Emoji_Category", 1}, {"app:en/Localizable", 1}}}));

// Where the answer comes from when the loaded table cannot give it.

TEST_F(LocalizationLookupTest, KeyMissingFromLoadedTableGivesTheDefault) {
  // "OnlyInLocalizable" is in every Localizable table, and in the user's own language (fr) too.
  EXPECT_EQ(Lookup("OnlyInLocalizable", "de", kEmoji, "fallback"), "fallback");
  EXPECT_EQ(Lookup("OnlyInLocalizable", "de", kEmoji, std::nullopt), std::nullopt);
  BundleWriter::WritePlist(TableFile("fr", "Emoji_Category"), plist::Dictionary{{"Smileys", 42}});
  EXPECT_EQ(Lookup("Smileys", "fr", kEmoji, "fallback"), "fallback") << "a wrong-typed value";
}

TEST_F(LocalizationLookupTest, MissingOrUnreadableTableAsksTheBundleInTheUsersLanguage) {
  fs::remove(TableFile("de", "Emoji_Category"));
  EXPECT_EQ(Lookup("Smileys", "de", kEmoji), Translation("app", "fr", "Emoji_Category", "Smileys"));
  EXPECT_EQ(Lookup("Unknown", "de", kEmoji, "fallback"), "fallback");
  EXPECT_EQ(Lookup("Smileys", "de", "NoSuchTable", "fallback"), "fallback");

  // An unreadable table is cached as missing: loaded once for two lookups.
  BundleWriter::WriteFile(TableFile("en", "Emoji_Category"), "not a property list");
  EXPECT_EQ(Lookup("Smileys", "en", kEmoji), Translation("app", "fr", "Emoji_Category", "Smileys"));
  EXPECT_EQ(Lookup("Animals", "en", kEmoji), Translation("app", "fr", "Emoji_Category", "Animals"));
  EXPECT_EQ(Loads()["app:en/Emoji_Category"], 1);

  EXPECT_EQ(cache_.Lookup("Smileys", nullptr, "de", kEmoji, "fallback"), "fallback");
  EXPECT_EQ(cache_.Lookup("Smileys", nullptr, "de", kEmoji, std::nullopt), std::nullopt);
}

TEST_F(LocalizationLookupTest, ConcurrentLookupsAlwaysReadTheirOwnTable) {
  std::atomic<int> wrong{0};
  std::vector<std::thread> threads;
  for (const auto& [loc, table] : std::vector<std::pair<const char*, Maybe>>{
           {"de", kEmoji}, {"fr", kEmoji}, {"en", kDefault}, {"de", "Localizable"}}) {
    threads.emplace_back([&, loc, table] {
      const std::string expected = Translation("app", loc, table.value_or("Localizable"), "Animals");
      for (int i = 0; i < 300; ++i) wrong += Lookup("Animals", loc, table) != expected;
    });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(wrong.load(), 0);
}

TEST_F(LocalizationLookupTest, ProcessWideLookupReadsRealFiles) {
  const Bundle& app = bundles_.at("app");
  EXPECT_EQ(LocalizedStringForLanguage("Animals", &app, "de", kEmoji, "default"),
            Translation("app", "de", "Emoji_Category", "Animals"));
  EXPECT_EQ(LocalizedStringForLanguage("Nope", &app, "English", kDefault, "default"), "default");
}

TEST(PreferredLocalizationOfBundleTest, ChoosesAmongTheBundlesLocalizationsElseEnglish) {
  const struct {
    const char* what;
    std::vector<std::string> localizations;
    std::optional<std::string> languages;  // LANGUAGE
    const char* expected;
  } cases[] = {
      {"first language that matches", {"en", "de", "fr"}, "it:fr_CA:de", "fr"},
      {"regional variant", {"en", "pt", "pt-PT"}, "pt_PT.UTF-8", "pt-PT"},
      {"old-style folder", {"German", "French"}, "de_DE", "German"},
      {"no match is English, not the development localization", {"de", "fr"}, "ja", "English"},
      {"no languages at all", {"de", "fr"}, std::nullopt, "English"},
      {"no localizations", {}, "de", "English"},
  };
  for (const auto& c : cases) {
    ScopedTempDir dir;
    ScopedEnv env;
    testing::SetUserLanguages(env, c.languages);
    const BundleWriter app = BundleWriter::Application(dir.path() / "A.app", "com.example.A", "de");
    for (const std::string& loc : c.localizations) app.Folder(loc);
    const Bundle bundle = *Bundle::Open(app.path());
    EXPECT_EQ(PreferredLocalizationOfBundle(&bundle), c.expected) << c.what;
  }
  EXPECT_EQ(PreferredLocalizationOfBundle(nullptr), "English");
}

// The system bundles under LUMERIS_SYSTEM_ROOT. The framework bundle is process-wide, so its whole
// life is one test: absent, found, kept when the root later changes.
TEST(SystemBundlesTest, OpenUnderTheSystemRootAndTheFrameworkIsKept) {
  ScopedTempDir root;
  ScopedEnv env;
  env.Set("LUMERIS_SYSTEM_ROOT", root.path().string());
  testing::SetUserLanguages(env, "de");

  EXPECT_FALSE(OpenApplicationBundle());
  BundleWriter::Application(SystemPath(kApplicationBundlePath), "com.vantorel.SorvendiIM", "en");
  const auto app = OpenApplicationBundle();
  ASSERT_TRUE(app);
  EXPECT_EQ(app->identifier(), "com.vantorel.SorvendiIM");
  EXPECT_EQ(app->path(), root.path() / "System/Library/Input Methods/Sorvendi.app");

  EXPECT_EQ(MyFrameworkBundle(), nullptr);
  EXPECT_EQ(MyFrameworkLocalizedString("Close"), "Close");
  BundleWriter framework = BundleWriter::Framework(SystemPath(kFrameworkBundlePath), "com.vantorel.Lumeris", "en");
  framework.WriteStringsTable("en", "Localizable", {{"Close", "Close"}, {"Done", "Done"}});
  framework.WriteStringsTable("de", "Localizable", {{"Close", "Schließen"}});
  const Bundle* found = MyFrameworkBundle();
  ASSERT_NE(found, nullptr);
  EXPECT_EQ(found->identifier(), "com.vantorel.Lumeris");
  EXPECT_EQ(MyFrameworkLocalizedString("Close"), "Schließen");
  EXPECT_EQ(MyFrameworkLocalizedString("Done"), "Done");
  EXPECT_EQ(MyFrameworkLocalizedString("Missing"), "Missing");

  ScopedTempDir elsewhere;
  env.Set("LUMERIS_SYSTEM_ROOT", elsewhere.path().string());
  EXPECT_EQ(MyFrameworkBundle(), found);
}

}  // namespace
}  // namespace lumeris
