// Regional hiding: the "Country" preference (any application, any user, current host) and the
// locale's country decide whether the flag U+1F1F9 U+1F1FC is hidden, and a refresh says whether
// that decision changed. The service's search through the socket is the database end-to-end test.
#include "categories/regional_restriction.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <optional>
#include <string>

#include "platform/preferences_paths.h"
#include "platform/property_list_io.h"
#include "support/scoped_env.h"
#include "text/utf8.h"

namespace lumeris {
namespace {

bool Hidden(const std::string& utf8) { return ShouldHideThisCharacter(*DecodeUtf8(utf8)); }

// Writes (or, for std::nullopt, removes) the "Country" preference the way another process would:
// a new file renamed over the old one.
void SetCountryPreference(const std::optional<std::string>& country) {
  const auto path = *PreferencesFilePath(".GlobalPreferences", kCFPreferencesAnyUser, kCFPreferencesCurrentHost);
  std::filesystem::create_directories(path.parent_path());
  if (!country) {
    std::filesystem::remove(path);
    return;
  }
  std::ofstream(path.string() + ".new") << plist::SerializeXmlPropertyList(plist::Dictionary{{"Country", *country}});
  std::filesystem::rename(path.string() + ".new", path);
}

// One run of refreshes from an unrestricted start: only "CN", exactly, restricts; a preference can
// switch the restriction on but never lift a "CN" locale's; only a change of the outcome counts.
TEST(RegionalRestrictionTest, PreferenceOrLocaleOfChinaHidesTheFlag) {
  testing::IsolatedUserEnvironment environment;
  const struct { std::optional<std::string> preference; const char* locale; bool changed, hidden; } kSteps[] = {
      {"US", "en_US.UTF-8", false, false}, {"FR", "en_US.UTF-8", false, false}, {"CN", "en_US.UTF-8", true, true},
      {"CN", "C", false, true},            {"US", "zh_CN.UTF-8", false, true},  {std::nullopt, "zh_CN.UTF-8", false, true},
      {"cn", "en_US.UTF-8", true, false},  {std::nullopt, "C", false, false},   {"US", "en_US.UTF-8", false, false},
  };
  ASSERT_FALSE(UpdateRegionalRestriction(0, false, nullptr));
  for (const auto& step : kSteps) {
    SetCountryPreference(step.preference);
    environment.env().Set("LC_ALL", step.locale);
    const std::string what = step.preference.value_or("(none)") + " " + step.locale;
    EXPECT_EQ(UpdateCountryInfoAndCheckSignificantChange(), step.changed) << what;
    EXPECT_EQ(Hidden("🇹🇼"), step.hidden) << what;
    EXPECT_FALSE(Hidden("🇹")) << "one regional indicator alone";
    EXPECT_FALSE(Hidden("🇨🇳")) << "another flag";
    EXPECT_FALSE(Hidden("🇹🇼\uFE0F")) << "the flag with a selector added";
  }
  EXPECT_FALSE(UpdateRegionalRestriction(1, true, nullptr)) << "kind 1 does not exist";
  SetCountryPreference("CN");
  EXPECT_FALSE(UpdateRegionalRestriction(0, false, nullptr)) << "no refresh: the stored flag";
  EXPECT_TRUE(UpdateRegionalRestriction(0, true, nullptr));
}

}  // namespace
}  // namespace lumeris
