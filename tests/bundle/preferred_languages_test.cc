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

// The four variables, in the order LANGUAGE, LC_ALL, LC_MESSAGES, LANG.
struct Environment {
  Maybe language, lc_all, lc_messages, lang;
  void ApplyTo(ScopedEnv& env) const {
    env.Set("LANGUAGE", language);
    env.Set("LC_ALL", lc_all);
    env.Set("LC_MESSAGES", lc_messages);
    env.Set("LANG", lang);
  }
};
constexpr std::nullopt_t none = std::nullopt;

TEST(PreferredLanguagesTest, ReadsTheEnvironment) {
  const struct {
    const char* what;
    Environment environment;
    std::vector<std::string> languages;
  } cases[] = {
      {"LANGUAGE list wins, duplicates dropped", {"de_CH:fr:de_CH", none, none, "en_US.UTF-8"}, {"de-CH", "fr"}},
      {"unusable LANGUAGE entries are skipped", {"C::sv_SE", none, none, "en_US"}, {"sv-SE"}},
      {"LANGUAGE with nothing usable falls back", {"C", none, none, "fr_FR"}, {"fr-FR"}},
      {"empty LANGUAGE falls back", {"", none, none, "fr_FR"}, {"fr-FR"}},
      {"LC_ALL before LC_MESSAGES and LANG", {none, "ja_JP.UTF-8", "ko_KR", "en_US"}, {"ja-JP"}},
      {"LC_MESSAGES before LANG", {none, none, "ko_KR", "en_US"}, {"ko-KR"}},
      {"empty LC_ALL does not count", {none, "", none, "it_IT"}, {"it-IT"}},
      {"LC_ALL=C means none", {none, "C", none, "de_DE"}, {}},
      {"nothing set", {none, none, none, none}, {}},
  };
  for (const auto& c : cases) {
    ScopedEnv env;
    c.environment.ApplyTo(env);
    EXPECT_EQ(PreferredLanguages(), c.languages) << c.what;
  }
}

TEST(CurrentLocaleCountryCodeTest, ReadsTheLocale) {
  const struct {
    const char* what;
    Environment environment;
    Maybe country;
  } cases[] = {
      {"LANG", {none, none, none, "de_CH.UTF-8"}, "CH"},
      {"LC_ALL first", {none, "es_419", none, "en_US"}, "419"},
      {"LC_MESSAGES before LANG", {none, none, "pt_BR", "en_US"}, "BR"},
      {"script modifier keeps the region", {none, none, none, "sr_RS@latin"}, "RS"},
      {"language without region", {none, none, none, "de"}, none},
      {"LANGUAGE is not a locale", {"fr_FR", none, none, none}, none},
      {"C locale", {none, "C", none, "de_DE"}, none},
  };
  for (const auto& c : cases) {
    ScopedEnv env;
    c.environment.ApplyTo(env);
    EXPECT_EQ(CurrentLocaleCountryCode(), c.country) << c.what;
  }
}

}  // namespace
}  // namespace lumeris
