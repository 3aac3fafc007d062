// The bundle reader: layouts, resource lookup order, localized strings, old-style localization
// names and ICU matching of localizations, bad bundles, and the system root.
#include "platform/bundle.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <optional>
#include <ostream>
#include <string>
#include <vector>

#include "bundle/bundle_fixture.h"
#include "lumeris/config.h"
#include "platform/bundle_localization.h"
#include "platform/system_root.h"
#include "support/scoped_env.h"
#include "support/temp_dir.h"

namespace lumeris {
namespace {

namespace fs = std::filesystem;
using testing::BundleWriter;
using testing::ScopedEnv;
using testing::ScopedTempDir;
using Strings = std::vector<std::string>;

// An application bundle with a non-localized folder and en, de and fr folders, used with the
// user's languages set to "de:fr" unless a test says otherwise.
class BundleTest : public ::testing::Test {
 protected:
  BundleTest() : app_(BundleWriter::Application(dir_.path() / "Test.app", "com.example.Test", "en")) {
    testing::SetUserLanguages(env_, "de:fr");
  }

  Bundle OpenApp() const {
    std::optional<Bundle> bundle = Bundle::Open(app_.path());
    EXPECT_TRUE(bundle.has_value());
    return bundle.value_or(*Bundle::Open(dir_.path()));
  }

  ScopedTempDir dir_;
  ScopedEnv env_;
  BundleWriter app_;
};

// Localizations are the ".lproj" folders, sorted; a framework keeps Info.plist in Resources.
TEST_F(BundleTest, LocalizationFoldersAndFrameworkLayout) {
  for (const char* loc : {"fr", "zh-Hant", "de"}) app_.Folder(loc);
  app_.WriteResource("", "notes.lproj", "a file, not a folder");
  fs::create_directories(app_.Folder("") / ".lproj");
  EXPECT_EQ(OpenApp().localizations(), (Strings{"de", "fr", "zh-Hant"}));
  const BundleWriter framework = BundleWriter::Framework(dir_.path() / "Kit.framework", "com.example.Kit", "en");
  const std::optional<Bundle> kit = Bundle::Open(framework.path());
  ASSERT_TRUE(kit);
  EXPECT_EQ(kit->identifier(), "com.example.Kit");
  EXPECT_EQ(kit->PathForResource("Star", "pdf"), framework.WriteResource("", "Star.pdf", "%PDF"));
}

// Every resource "<folder>-only" exists in that folder alone; "Everywhere" exists in all;
// "secret.txt" lies outside the bundle's resources, which no lookup ever leaves.
TEST_F(BundleTest, ResourceLookupSearchesFoldersInOrderAndNeverLeavesTheBundle) {
  const std::optional<std::string> none;
  BundleWriter::WriteFile(dir_.path() / "secret.txt", "outside");
  BundleWriter::WriteFile(app_.path() / "Contents" / "secret.txt", "outside");
  const std::string outside = dir_.path().string();
  const struct {
    const char *what, *name, *type, *subdirectory;
    std::optional<std::string_view> localization;
    std::optional<std::string> found_in;  // folder the result must lie in
  } cases[] = {
      {"non-localized folder first", "Everywhere", "plist", "", none, ""},
      {"non-localized first even with a localization", "Everywhere", "plist", "", "fr", ""},
      {"first preferred localization", "de-only", "plist", "", none, "de"},
      {"second preferred localization", "fr-only", "plist", "", none, "fr"},
      {"development localization last", "en-only", "plist", "", none, "en"},
      {"the localization asked for", "fr-only", "plist", "", "fr", "fr"},
      {"only the localization asked for", "de-only", "plist", "", "fr", none},
      {"no development fallback for an explicit localization", "en-only", "plist", "", "fr", none},
      {"old-style name finds its code's folder", "en-only", "plist", "", "English", "en"},
      {"sub-directory", "fr-only", "pdf", "Icons/Small", none, "fr"},
      {"empty type is the bare name", "de-only", "", "", none, "de"},
      {"unknown localization", "de-only", "plist", "", "ja", none},
      {"missing resource", "nowhere", "plist", "", none, none},
      {"a name going up", "../secret", "txt", "", none, none},
      {"the name \"..\"", "..", "", "", none, none},
      {"an empty name", "", "txt", "", none, none},
      {"a sub-directory going up", "secret", "txt", "..", none, none},
      {"a sub-directory going far up", "secret", "txt", "../../..", none, none},
      {"an absolute sub-directory", "secret", "txt", outside.c_str(), none, none},
      {"a type going up", "secret", "txt/../../secret", "", none, none},
      {"a localization going up", "de-only", "plist", "", "../Resources/de", none},
      {"an empty localization", "de-only", "plist", "", "", none},
  };
  const char* folders[] = {"", "en", "de", "fr"};
  const auto file = [](fs::path subdirectory, const std::string& name, const std::string& type) {
    return subdirectory / (type.empty() ? name : name + "." + type);
  };
  using Kind = std::pair<const char*, const char*>;
  for (const auto& [subdirectory, type] : {Kind{"", "plist"}, Kind{"Icons/Small", "pdf"}, Kind{"", ""}}) {
    for (const char* folder : folders) {
      app_.WriteResource(folder, file(subdirectory, std::string(*folder ? folder : "base") + "-only", type), folder);
      app_.WriteResource(folder, file(subdirectory, "Everywhere", type), folder);
    }
  }
  const Bundle bundle = OpenApp();
  for (const auto& c : cases) {
    const auto found = bundle.PathForResource(c.name, c.type, c.subdirectory, c.localization);
    std::optional<std::string> found_in = found ? std::optional<std::string>("elsewhere") : none;
    for (const char* folder : folders) {
      if (found == app_.Folder(folder) / file(c.subdirectory, c.name, c.type)) found_in = folder;
    }
    EXPECT_EQ(found_in, c.found_in) << c.what << ": " << (found ? found->string() : "not found");
  }
}

TEST_F(BundleTest, CodeFindsOldStyleFolderAndUnmatchedLanguagesUseDevelopment) {
  EXPECT_EQ(OpenApp().PathForResource("Note", "txt", {}, "en"), app_.WriteResource("English", "Note.txt", "x"));
  testing::SetUserLanguages(env_, "ja");
  app_.WriteResource("de", "Other.txt", "x");
  EXPECT_EQ(OpenApp().PreferredLocalizations(), (Strings{"en"}));
  EXPECT_EQ(OpenApp().PathForResource("Other", "txt"), app_.WriteResource("en", "Other.txt", "x"));
}

TEST_F(BundleTest, LocalizedStringFollowsUserLanguages) {
  app_.WriteStringsTable("en", "Localizable", {{"Hello", "Hello"}, {"Bye", "Bye"}});
  app_.WriteStringsTable("de", "Localizable", {{"Hello", "Hallo"}});
  app_.WriteStringsTable("de", "Emoji_Category", {{"Smileys", "Smileys & Emotionen"}});
  const Bundle bundle = OpenApp();

  EXPECT_EQ(bundle.LocalizedString("Hello", "fallback", std::nullopt), "Hallo");
  EXPECT_EQ(bundle.LocalizedString("Hello", std::nullopt, ""), "Hallo");
  EXPECT_EQ(bundle.LocalizedString("Smileys", std::nullopt, "Emoji_Category"), "Smileys & Emotionen");
  // The table found first is the only one read: "Bye" is only in English.
  EXPECT_EQ(bundle.LocalizedString("Bye", "fallback", std::nullopt), "fallback");

  testing::SetUserLanguages(env_, "ja");
  EXPECT_EQ(bundle.LocalizedString("Hello", "fallback", std::nullopt), "Hello");
}

TEST(OldStyleLocalizationTest, NamesAndCodesMapBothWaysAndNothingElseIsOldStyle) {
  for (const auto& [name, code] : {std::pair{"English", "en"}, {"French", "fr"}, {"German", "de"}, {"Japanese", "ja"},
                                   {"Spanish", "es"}, {"Italian", "it"}, {"Dutch", "nl"}}) {
    EXPECT_EQ(LanguageCodeForOldStyleLocalization(name), code);
    EXPECT_EQ(OldStyleLocalizationForLanguageCode(code), name);
  }
  for (const char* name : {"en", "english", "Base", "", "zh-Hans", "Klingon"}) EXPECT_FALSE(LanguageCodeForOldStyleLocalization(name)) << name;
  EXPECT_FALSE(OldStyleLocalizationForLanguageCode("en-US"));
}

TEST(PreferredLocalizationsFromArrayTest, MatchesWithIcu) {
  const struct { const char* what; Strings localizations, preferences, expected; } cases[] = {
      {"script variants and old-style names", {"English", "de", "zh-Hant"}, {"zh-TW", "en-GB"}, {"zh-Hant", "English"}},
      {"simplified Chinese is not traditional", {"zh-Hans", "zh-Hant"}, {"zh-CN"}, {"zh-Hans"}},
      {"one entry per localization, preference order", {"en", "de", "fr"}, {"de-CH", "fr-CA", "de-AT"}, {"de", "fr"}},
      {"exact region wins", {"pt", "pt-PT"}, {"pt-PT"}, {"pt-PT"}},
      {"other region takes the bare language", {"pt", "pt-PT"}, {"pt-BR"}, {"pt"}},
      {"script subtag", {"sr", "sr-Latn"}, {"sr-Latn-RS"}, {"sr-Latn"}},
      {"old-style name matches its code", {"German", "fr"}, {"de"}, {"German"}},
      {"names that are not languages never match", {"Base", "not a tag", "en"}, {"en-US"}, {"en"}},
      {"unparsable preferences are skipped", {"en", "fr"}, {"!!", "fr"}, {"fr"}},
      {"unrelated language", {"en", "de"}, {"ja"}, {}},
      {"no preferences", {"en", "de"}, {}, {}},
      {"no localizations", {}, {"en"}, {}},
      {"only unusable localizations", {"Base"}, {"en"}, {}},
  };
  for (const auto& c : cases) {
    EXPECT_EQ(PreferredLocalizationsFromArray(c.localizations, c.preferences), c.expected) << c.what;
  }
}

// Error paths: nothing found, nothing thrown.

TEST(BundleErrorTest, OpenNeedsADirectoryAndBadInfoLeavesInfoEmpty) {
  ScopedTempDir dir;
  BundleWriter::WriteFile(dir.path() / "file.app", "not a bundle");
  EXPECT_FALSE(Bundle::Open(dir.path() / "file.app"));
  EXPECT_FALSE(Bundle::Open(dir.path() / "missing.app"));
  const BundleWriter app = BundleWriter::Application(dir.path() / "A.app", std::nullopt, std::nullopt);
  const std::pair<std::string, size_t> kInfos[] = {  // Info.plist, entries of the info dictionary
      {"", 0}, {"bplist00 truncated", 0}, {"<plist><dict><key>a</key></plist>", 0},
      {plist::SerializeXmlPropertyList(plist::Array{"not", "a", "dictionary"}), 0},
      {plist::SerializeXmlPropertyList(plist::Dictionary{{"CFBundleIdentifier", 7}, {"CFBundleDevelopmentRegion", true}}), 2}};
  for (const auto& [contents, entries] : kInfos) {
    BundleWriter::WriteFile(app.info_file(), contents);
    const auto bundle = Bundle::Open(app.path());
    ASSERT_TRUE(bundle) << contents;
    EXPECT_EQ(bundle->info_dictionary().size(), entries) << contents;
    EXPECT_FALSE(bundle->identifier() || bundle->development_localization()) << contents;
  }
}

TEST(ReadStringsTableTest, AcceptsOnlyDictionaries) {
  ScopedTempDir dir;
  const std::pair<std::string, bool> kFiles[] = {
      {plist::SerializeXmlPropertyList(plist::Dictionary{{"Key", "Wert"}}), true},
      {plist::SerializeXmlPropertyList(plist::Array{"Key"}), false}, {"\"Key\" = \"Wert\";", false}};
  for (const auto& [contents, accepted] : kFiles) {
    BundleWriter::WriteFile(dir.path() / "table.strings", contents);
    const auto table = ReadStringsTable(dir.path() / "table.strings");
    EXPECT_EQ(table ? table->at("Key") : plist::Value("<none>"), plist::Value(accepted ? "Wert" : "<none>")) << contents;
  }
  EXPECT_FALSE(ReadStringsTable(dir.path() / "missing.strings"));
}

TEST(SystemRootTest, ResolvesUnderTheRoot) {
  const struct {
    std::optional<std::string> variable;
    const char* system_path;
    bool uses_default;
  } cases[] = {{"/tmp/root", "/System/Library/Input Methods/Sorvendi.app", false},
               {"/tmp/root", "System/Library/Input Methods/Sorvendi.app", false},
               {std::nullopt, "/System/Library/Input Methods/Sorvendi.app", true},
               {"", "//System/Library/Input Methods/Sorvendi.app", true}};
  for (const auto& c : cases) {
    ScopedEnv env;
    env.Set("LUMERIS_SYSTEM_ROOT", c.variable);
    const fs::path root = c.uses_default ? fs::path(config::kSystemRootDefault) : fs::path(*c.variable);
    EXPECT_EQ(SystemRoot(), root) << c.variable.value_or("(unset)");
    EXPECT_EQ(SystemPath(c.system_path), root / "System/Library/Input Methods/Sorvendi.app") << c.system_path;
  }
}

}  // namespace
}  // namespace lumeris
