// The user's languages and country from the POSIX locale variables.
#include "platform/preferred_languages.h"

#include <gtest/gtest.h>

#include <optional>
#include <string>
#include <vector>

#include "support/scoped_env.h"

namespace lumeris {
namespace {

using testing::ScopedEnv;
using Maybe = std::optional<std::string>;

TEST(LanguageTagFromPosixLocaleTest, ConvertsToLanguageTagOrNothing) {
  const std::pair<const char*, Maybe> cases[] = {
      {"de_DE.UTF-8", "de-DE"}, {"en_US.ISO-8859-1", "en-US"}, {"pt_BR", "pt-BR"}, {"fr", "fr"},
      {"de_de.utf8", "de-DE"}, {"sr_RS@latin", "sr-Latn-RS"}, {"sr_RS.UTF-8@cyrillic", "sr-Cyrl-RS"},
      {"ca_ES@valencia", "ca-ES-valencia"}, {"de_DE@euro", "de-DE"}, {"es_419", "es-419"},
      {"zh-Hant-TW", "zh-Hant-TW"},
      {"C", std::nullopt}, {"POSIX", std::nullopt}, {"C.UTF-8", std::nullopt}, {"", std::nullopt},
      {".UTF-8", std::nullopt}, {"x", std::nullopt}, {"12_34", std::nullopt}, {"en_US_bad!", std::nullopt}};
  for (const auto& [posix, tag] : cases) EXPECT_EQ(LanguageTagFromPosixLocale(posix), tag) << '"' << posix << '"';
}

constexpr std::nullopt_t none = std::nullopt;

// The user's languages and the locale's country from the same four variables.
TEST(PreferredLanguagesTest, ReadTheEnvironment) {
  const struct {
    const char* what;
    Maybe language, lc_all, lc_messages, lang;
    std::vector<std::string> languages;
    Maybe country;
  } cases[] = {
      {"LANGUAGE list wins, duplicates dropped, not a locale", "de_CH:fr:de_CH", none, none, "en_US.UTF-8", {"de-CH", "fr"}, "US"},
      {"unusable LANGUAGE entries are skipped", "C::sv_SE", none, none, "en_US", {"sv-SE"}, "US"},
      {"LANGUAGE with nothing usable falls back", "C", none, none, "fr_FR", {"fr-FR"}, "FR"},
      {"empty LANGUAGE falls back", "", none, none, "fr_FR", {"fr-FR"}, "FR"},
      {"LC_ALL before LC_MESSAGES and LANG", none, "es_419", "ko_KR", "en_US", {"es-419"}, "419"},
      {"LC_MESSAGES before LANG", none, none, "ko_KR", "en_US", {"ko-KR"}, "KR"},
      {"empty LC_ALL does not count", none, "", none, "it_IT", {"it-IT"}, "IT"},
      {"a script modifier keeps the region", none, none, none, "sr_RS@latin", {"sr-Latn-RS"}, "RS"},
      {"language without region", none, none, none, "de", {"de"}, none},
      {"LC_ALL=C means none", none, "C", none, "de_DE", {}, none},
      {"nothing set", none, none, none, none, {}, none},
  };
  for (const auto& c : cases) {
    ScopedEnv env;
    env.Set("LANGUAGE", c.language);
    env.Set("LC_ALL", c.lc_all);
    env.Set("LC_MESSAGES", c.lc_messages);
    env.Set("LANG", c.lang);
    EXPECT_EQ(PreferredLanguages(), c.languages) << c.what;
    EXPECT_EQ(CurrentLocaleCountryCode(), c.country) << c.what;
  }
}

}  // namespace
}  // namespace lumeris
