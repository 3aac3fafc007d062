// Regional hiding: the "Country" preference (any application, any user, current host) and the
// locale's country decide whether the flag U+1F1F9 U+1F1FC is hidden.
#include "categories/regional_restriction.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <optional>
#include <string>

#include "platform/preferences_paths.h"
#include "platform/property_list.h"
#include "platform/property_list_io.h"
#include "support/scoped_env.h"
#include "text/utf8.h"

namespace lumeris {
namespace {

class RegionalRestrictionTest : public ::testing::Test {
 protected:
  // Writes (or, for std::nullopt, removes) the "Country" preference the way another process
  // would: a new file renamed over the old one.
  void SetCountryPreference(const std::optional<std::string>& country) {
    const std::filesystem::path path = *PreferencesFilePath(
        ".GlobalPreferences", kCFPreferencesAnyUser, kCFPreferencesCurrentHost);
    std::filesystem::create_directories(path.parent_path());
    if (!country) {
      std::filesystem::remove(path);
      return;
    }
    const std::string xml =
        plist::SerializeXmlPropertyList(plist::Dictionary{{"Country", *country}});
    std::ofstream(path.string() + ".new") << xml;
    std::filesystem::rename(path.string() + ".new", path);
  }
  void SetLocale(const std::string& locale) { environment_.env().Set("LC_ALL", locale); }

  testing::IsolatedUserEnvironment environment_;
};

bool Hidden(const std::string& utf8) { return ShouldHideThisCharacter(*DecodeUtf8(utf8)); }

TEST_F(RegionalRestrictionTest, PreferenceCanOnlySwitchTheRestrictionOn) {
  const struct {
    std::optional<std::string> preference;
    std::string locale;
    bool hidden;
  } kCases[] = {
      {std::nullopt, "zh_CN.UTF-8", true},
      {"CN", "en_US.UTF-8", true},
      {"US", "zh_CN.UTF-8", true},
      {"US", "en_US.UTF-8", false},
      {"cn", "en_US.UTF-8", false},
      {std::nullopt, "C", false},
      {"CN", "C", true},
  };
  for (const auto& c : kCases) {
    SetCountryPreference(c.preference);
    SetLocale(c.locale);
    UpdateCountryInfoAndCheckSignificantChange();
    EXPECT_EQ(Hidden("🇹🇼"), c.hidden) << c.preference.value_or("(none)") << " " << c.locale;
    EXPECT_FALSE(Hidden("🇹")) << "one regional indicator alone";
    EXPECT_FALSE(Hidden("🇨🇳")) << "another flag";
    EXPECT_FALSE(Hidden("🇹🇼\uFE0F")) << "the flag with a selector added";
  }
}

TEST_F(RegionalRestrictionTest, OnlyAChangeOfTheFlagIsSignificant) {
  SetLocale("en_US.UTF-8");
  SetCountryPreference("US");
  UpdateCountryInfoAndCheckSignificantChange();
  const struct {
    const char* country;
    bool changed;
  } kSteps[] = {{"FR", false}, {"CN", true}, {"CN", false}, {"US", true}};
  for (const auto& step : kSteps) {
    SetCountryPreference(step.country);
    EXPECT_EQ(UpdateCountryInfoAndCheckSignificantChange(), step.changed) << step.country;
  }
  EXPECT_FALSE(UpdateRegionalRestriction(1, true, nullptr)) << "kind 1 does not exist";
  SetCountryPreference("CN");
  EXPECT_FALSE(UpdateRegionalRestriction(0, false, nullptr)) << "no refresh: the stored flag";
  EXPECT_TRUE(UpdateRegionalRestriction(0, true, nullptr));
}

}  // namespace
}  // namespace lumeris
