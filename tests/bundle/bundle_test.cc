#include "platform/bundle.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <optional>
#include <ostream>
#include <string>

#include "bundle/bundle_fixture.h"
#include "lumeris/config.h"
#include "platform/system_root.h"
#include "support/scoped_env.h"
#include "support/temp_dir.h"

namespace lumeris {
namespace {

namespace fs = std::filesystem;
using testing::BundleWriter;
using testing::ScopedEnv;
using testing::ScopedTempDir;

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

  // The folder ("" for the non-localized one, else the localization) a found path lies in.
  std::optional<std::string> FolderOf(const std::optional<fs::path>& found,
                                      const fs::path& relative) const {
    if (!found) return std::nullopt;
    for (const char* folder : {"", "en", "de", "fr", "English"}) {
      if (*found == app_.Folder(folder) / relative) return std::string(folder);
    }
    return "elsewhere: " + found->string();
  }

  ScopedTempDir dir_;
  ScopedEnv env_;
  BundleWriter app_;
};

TEST_F(BundleTest, ApplicationLayoutReadsInfoAndLocalizations) {
  for (const char* loc : {"fr", "en", "de", "zh-Hant"}) app_.Folder(loc);
  app_.WriteResource("", "notes.lproj", "a file, not a folder");
  fs::create_directories(app_.resources() / ".lproj");

  const Bundle bundle = OpenApp();
  EXPECT_EQ(bundle.identifier(), "com.example.Test");
  EXPECT_EQ(bundle.development_localization(), "en");
  EXPECT_EQ(bundle.resources_directory(), app_.path() / "Contents" / "Resources");
  EXPECT_EQ(bundle.localizations(), (std::vector<std::string>{"de", "en", "fr", "zh-Hant"}));
  ASSERT_NE(bundle.info_dictionary().find("CFBundleName"), bundle.info_dictionary().end());
}

TEST_F(BundleTest, FrameworkLayoutKeepsEverythingInResources) {
  const BundleWriter framework = BundleWriter::Framework(dir_.path() / "Kit.framework", "com.example.Kit", "en");
  framework.WriteStringsTable("en", "Localizable", {{"Done", "Done"}});
  const fs::path icon = framework.WriteResource("", "Star.pdf", "%PDF");

  const std::optional<Bundle> bundle = Bundle::Open(framework.path());
  ASSERT_TRUE(bundle);
  EXPECT_EQ(bundle->identifier(), "com.example.Kit");
  EXPECT_EQ(bundle->localizations(), (std::vector<std::string>{"en"}));
  EXPECT_EQ(bundle->PathForResource("Star", "pdf"), icon);
}

struct LookupCase {
  const char* what;
  const char* name;
  const char* type;
  const char* subdirectory;
  std::optional<std::string> localization;
  std::optional<std::string> found_in;  // folder the result must lie in; nullopt: not found
  friend void PrintTo(const LookupCase& c, std::ostream* os) { *os << c.what; }
};

class ResourceLookupTest : public BundleTest, public ::testing::WithParamInterface<LookupCase> {};

// Every resource "<folder>-only" exists in that folder alone; "Everywhere" exists in all.
TEST_P(ResourceLookupTest, SearchesFoldersInOrder) {
  const LookupCase& c = GetParam();
  const std::string type = c.type;
  const auto file = [&](const std::string& name) { return fs::path(c.subdirectory) / (type.empty() ? name : name + "." + type); };
  for (const char* folder : {"", "en", "de", "fr"}) {
    app_.WriteResource(folder, file(std::string(*folder ? folder : "base") + "-only"), folder);
    app_.WriteResource(folder, file("Everywhere"), folder);
  }
  const Bundle bundle = OpenApp();
  const auto found = bundle.PathForResource(c.name, c.type, c.subdirectory, c.localization);
  EXPECT_EQ(FolderOf(found, file(c.name)), c.found_in) << c.what;
}

INSTANTIATE_TEST_SUITE_P(
    Order, ResourceLookupTest,
    ::testing::Values(
        LookupCase{"non-localized folder first", "Everywhere", "plist", "", std::nullopt, ""},
        LookupCase{"non-localized first even with a localization", "Everywhere", "plist", "", "fr", ""},
        LookupCase{"first preferred localization", "de-only", "plist", "", std::nullopt, "de"},
        LookupCase{"second preferred localization", "fr-only", "plist", "", std::nullopt, "fr"},
        LookupCase{"development localization last", "en-only", "plist", "", std::nullopt, "en"},
        LookupCase{"the localization asked for", "fr-only", "plist", "", "fr", "fr"},
        LookupCase{"only the localization asked for", "de-only", "plist", "", "fr", std::nullopt},
        LookupCase{"no development fallback for an explicit localization", "en-only", "plist", "", "fr", std::nullopt},
        LookupCase{"old-style name finds its code's folder", "en-only", "plist", "", "English", "en"},
        LookupCase{"sub-directory", "fr-only", "pdf", "Icons/Small", std::nullopt, "fr"},
        LookupCase{"empty type is the bare name", "de-only", "", "", std::nullopt, "de"},
        LookupCase{"unknown localization", "de-only", "plist", "", "ja", std::nullopt},
        LookupCase{"missing resource", "nowhere", "plist", "", std::nullopt, std::nullopt}));

TEST_F(BundleTest, CodeFindsOldStyleFolder) {
  const fs::path file = app_.WriteResource("English", "Note.txt", "x");
  EXPECT_EQ(OpenApp().PathForResource("Note", "txt", {}, "en"), file);
}

TEST_F(BundleTest, LanguagesWithoutMatchUseDevelopmentLocalization) {
  testing::SetUserLanguages(env_, "ja");
  const fs::path en = app_.WriteResource("en", "Note.txt", "x");
  app_.WriteResource("de", "Note.txt", "x");
  const Bundle bundle = OpenApp();
  EXPECT_EQ(bundle.PreferredLocalizations(), (std::vector<std::string>{"en"}));
  EXPECT_EQ(bundle.PathForResource("Note", "txt"), en);
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

// Error paths: nothing found, nothing thrown, nothing outside the bundle.

TEST(BundleErrorTest, OpenNeedsADirectory) {
  ScopedTempDir dir;
  BundleWriter::WriteFile(dir.path() / "file.app", "not a bundle");
  EXPECT_FALSE(Bundle::Open(dir.path() / "file.app"));
  EXPECT_FALSE(Bundle::Open(dir.path() / "missing.app"));
}

TEST(BundleErrorTest, BadInfoPlistLeavesInfoEmpty) {
  ScopedTempDir dir;
  const BundleWriter app = BundleWriter::Application(dir.path() / "A.app", std::nullopt, std::nullopt);
  const auto open_with_info = [&](std::string_view contents) {
    BundleWriter::WriteFile(app.info_file(), contents);
    return Bundle::Open(app.path());
  };
  for (const char* contents : {"", "bplist00 truncated", "<plist><dict><key>a</key></plist>"}) {
    const auto bundle = open_with_info(contents);
    ASSERT_TRUE(bundle);
    EXPECT_TRUE(bundle->info_dictionary().empty());
    EXPECT_FALSE(bundle->identifier());
  }
  BundleWriter::WritePlist(app.info_file(), plist::Dictionary{{"CFBundleIdentifier", 7}, {"CFBundleDevelopmentRegion", true}});
  const auto wrong_types = Bundle::Open(app.path());
  ASSERT_TRUE(wrong_types);
  EXPECT_FALSE(wrong_types->identifier());
  EXPECT_FALSE(wrong_types->development_localization());
  BundleWriter::WritePlist(app.info_file(), plist::Array{"not", "a", "dictionary"});
  EXPECT_TRUE(Bundle::Open(app.path())->info_dictionary().empty());
}

TEST_F(BundleTest, LookupsNeverLeaveTheBundle) {
  BundleWriter::WriteFile(dir_.path() / "secret.txt", "outside");
  BundleWriter::WriteFile(app_.path() / "Contents" / "secret.txt", "outside");
  app_.WriteResource("de", "ok.txt", "inside");
  const Bundle bundle = OpenApp();
  ASSERT_TRUE(bundle.PathForResource("ok", "txt", {}, "de"));

  EXPECT_FALSE(bundle.PathForResource("../secret", "txt"));
  EXPECT_FALSE(bundle.PathForResource("..", ""));
  EXPECT_FALSE(bundle.PathForResource("", "txt"));
  EXPECT_FALSE(bundle.PathForResource("secret", "txt", ".."));
  EXPECT_FALSE(bundle.PathForResource("secret", "txt", "../../.."));
  EXPECT_FALSE(bundle.PathForResource("secret", "txt", dir_.path().string()));
  EXPECT_FALSE(bundle.PathForResource("secret", "txt/../../secret"));
  EXPECT_FALSE(bundle.PathForResource("ok", "txt", {}, "../Resources/de"));
  EXPECT_FALSE(bundle.PathForResource("ok", "txt", {}, ""));
}

TEST(ReadStringsTableTest, AcceptsOnlyDictionaries) {
  ScopedTempDir dir;
  const fs::path xml = dir.path() / "xml.strings";
  BundleWriter::WriteFile(xml, plist::SerializeXmlPropertyList(plist::Dictionary{{"Key", "Wert"}}));
  const auto table = ReadStringsTable(xml);
  ASSERT_TRUE(table);
  EXPECT_EQ(table->at("Key"), plist::Value("Wert"));

  const fs::path array = BundleWriter::WritePlist(dir.path() / "array.strings", plist::Array{"Key"});
  const fs::path garbage = dir.path() / "garbage.strings";
  BundleWriter::WriteFile(garbage, "\"Key\" = \"Wert\";");
  EXPECT_FALSE(ReadStringsTable(array));
  EXPECT_FALSE(ReadStringsTable(garbage));
  EXPECT_FALSE(ReadStringsTable(dir.path() / "missing.strings"));
}

struct RootCase {
  std::optional<std::string> variable;
  const char* system_path;
  bool uses_default;
  friend void PrintTo(const RootCase& c, std::ostream* os) { *os << c.variable.value_or("(unset)") << " " << c.system_path; }
};

class SystemRootTest : public ::testing::TestWithParam<RootCase> {};

TEST_P(SystemRootTest, ResolvesUnderTheRoot) {
  ScopedEnv env;
  env.Set("LUMERIS_SYSTEM_ROOT", GetParam().variable);
  const fs::path root = GetParam().uses_default ? fs::path(config::kSystemRootDefault) : fs::path(*GetParam().variable);
  EXPECT_EQ(SystemRoot(), root);
  EXPECT_EQ(SystemPath(GetParam().system_path), root / "System" / "Library" / "Input Methods" / "Sorvendi.app");
}

INSTANTIATE_TEST_SUITE_P(
    Roots, SystemRootTest,
    ::testing::Values(RootCase{"/tmp/root", "/System/Library/Input Methods/Sorvendi.app", false},
                      RootCase{"/tmp/root", "System/Library/Input Methods/Sorvendi.app", false},
                      RootCase{std::nullopt, "/System/Library/Input Methods/Sorvendi.app", true},
                      RootCase{"", "//System/Library/Input Methods/Sorvendi.app", true}));

}  // namespace
}  // namespace lumeris
