#include "platform/bundle_localization.h"

#include <gtest/gtest.h>

#include <ostream>
#include <string>
#include <vector>

namespace lumeris {
namespace {

using Strings = std::vector<std::string>;

TEST(OldStyleLocalizationTest, NamesAndCodesMapBothWays) {
  for (const auto& [name, code] : std::vector<std::pair<std::string, std::string>>{
           {"English", "en"}, {"French", "fr"}, {"German", "de"}, {"Japanese", "ja"},
           {"Spanish", "es"}, {"Italian", "it"}, {"Dutch", "nl"}}) {
    EXPECT_EQ(LanguageCodeForOldStyleLocalization(name), code);
    EXPECT_EQ(OldStyleLocalizationForLanguageCode(code), name);
  }
}

TEST(OldStyleLocalizationTest, OtherNamesAreNotOldStyle) {
  for (const char* name : {"en", "english", "Base", "", "zh-Hans", "Klingon"}) {
    EXPECT_FALSE(LanguageCodeForOldStyleLocalization(name)) << name;
  }
  EXPECT_FALSE(OldStyleLocalizationForLanguageCode("en-US"));
}

struct MatchCase {
  const char* what;
  Strings localizations;
  Strings preferences;
  Strings expected;
  friend void PrintTo(const MatchCase& c, std::ostream* os) { *os << c.what; }
};

class PreferredLocalizationsTest : public ::testing::TestWithParam<MatchCase> {};

TEST_P(PreferredLocalizationsTest, MatchesWithIcu) {
  const MatchCase& c = GetParam();
  EXPECT_EQ(PreferredLocalizationsFromArray(c.localizations, c.preferences), c.expected) << c.what;
}

INSTANTIATE_TEST_SUITE_P(
    Matching, PreferredLocalizationsTest,
    ::testing::Values(
        MatchCase{"script variants and old-style names", {"English", "de", "zh-Hant"}, {"zh-TW", "en-GB"}, {"zh-Hant", "English"}},
        MatchCase{"simplified Chinese is not traditional", {"zh-Hans", "zh-Hant"}, {"zh-CN"}, {"zh-Hans"}},
        MatchCase{"one entry per localization, preference order", {"en", "de", "fr"}, {"de-CH", "fr-CA", "de-AT"}, {"de", "fr"}},
        MatchCase{"exact region wins", {"pt", "pt-PT"}, {"pt-PT"}, {"pt-PT"}},
        MatchCase{"other region takes the bare language", {"pt", "pt-PT"}, {"pt-BR"}, {"pt"}},
        MatchCase{"script subtag", {"sr", "sr-Latn"}, {"sr-Latn-RS"}, {"sr-Latn"}},
        MatchCase{"old-style name matches its code", {"German", "fr"}, {"de"}, {"German"}},
        MatchCase{"names that are not languages never match", {"Base", "not a tag", "en"}, {"en-US"}, {"en"}},
        MatchCase{"unparsable preferences are skipped", {"en", "fr"}, {"!!", "fr"}, {"fr"}}));

INSTANTIATE_TEST_SUITE_P(
    NoMatch, PreferredLocalizationsTest,
    ::testing::Values(MatchCase{"unrelated language", {"en", "de"}, {"ja"}, {}},
                      MatchCase{"no preferences", {"en", "de"}, {}, {}},
                      MatchCase{"no localizations", {}, {"en"}, {}},
                      MatchCase{"only unusable localizations", {"Base"}, {"en"}, {}}));

}  // namespace
}  // namespace lumeris
