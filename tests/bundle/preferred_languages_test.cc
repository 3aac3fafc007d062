#include "platform/preferred_languages.h"

#include <gtest/gtest.h>

#include <optional>
#include <ostream>
#include <string>
#include <vector>

#include "support/scoped_env.h"

namespace lumeris {
namespace {

using testing::ScopedEnv;
using Maybe = std::optional<std::string>;

struct TagCase {
  const char* posix;
  Maybe tag;
  friend void PrintTo(const TagCase& c, std::ostream* os) { *os << '"' << c.posix << '"'; }
};

class LanguageTagFromPosixLocaleTest : public ::testing::TestWithParam<TagCase> {};

TEST_P(LanguageTagFromPosixLocaleTest, ConvertsToLanguageTag) {
  EXPECT_EQ(LanguageTagFromPosixLocale(GetParam().posix), GetParam().tag) << GetParam().posix;
}

INSTANTIATE_TEST_SUITE_P(
    PosixNames, LanguageTagFromPosixLocaleTest,
    ::testing::Values(TagCase{"de_DE.UTF-8", "de-DE"}, TagCase{"en_US.ISO-8859-1", "en-US"},
                      TagCase{"pt_BR", "pt-BR"}, TagCase{"fr", "fr"}, TagCase{"de_de.utf8", "de-DE"},
                      TagCase{"sr_RS@latin", "sr-Latn-RS"}, TagCase{"sr_RS.UTF-8@cyrillic", "sr-Cyrl-RS"},
                      TagCase{"ca_ES@valencia", "ca-ES-valencia"}, TagCase{"de_DE@euro", "de-DE"},
                      TagCase{"es_419", "es-419"}, TagCase{"zh-Hant-TW", "zh-Hant-TW"}));

INSTANTIATE_TEST_SUITE_P(
    NoLanguage, LanguageTagFromPosixLocaleTest,
    ::testing::Values(TagCase{"C", std::nullopt}, TagCase{"POSIX", std::nullopt},
                      TagCase{"C.UTF-8", std::nullopt}, TagCase{"", std::nullopt},
                      TagCase{".UTF-8", std::nullopt}, TagCase{"x", std::nullopt},
                      TagCase{"12_34", std::nullopt}, TagCase{"en_US_bad!", std::nullopt}));

// The four variables, in the order LANGUAGE, LC_ALL, LC_MESSAGES, LANG.
struct Environment {
  Maybe language, lc_all, lc_messages, lang;
};

void Apply(ScopedEnv& env, const Environment& e) {
  env.Set("LANGUAGE", e.language);
  env.Set("LC_ALL", e.lc_all);
  env.Set("LC_MESSAGES", e.lc_messages);
  env.Set("LANG", e.lang);
}

struct LanguagesCase {
  const char* what;
  Environment environment;
  std::vector<std::string> languages;
  friend void PrintTo(const LanguagesCase& c, std::ostream* os) { *os << c.what; }
};

class PreferredLanguagesTest : public ::testing::TestWithParam<LanguagesCase> {};

TEST_P(PreferredLanguagesTest, ReadsTheEnvironment) {
  ScopedEnv env;
  Apply(env, GetParam().environment);
  EXPECT_EQ(PreferredLanguages(), GetParam().languages) << GetParam().what;
}

INSTANTIATE_TEST_SUITE_P(
    Sources, PreferredLanguagesTest,
    ::testing::Values(
        LanguagesCase{"LANGUAGE list wins, duplicates dropped",
                      {"de_CH:fr:de_CH", std::nullopt, std::nullopt, "en_US.UTF-8"}, {"de-CH", "fr"}},
        LanguagesCase{"unusable LANGUAGE entries are skipped", {"C::sv_SE", std::nullopt, std::nullopt, "en_US"}, {"sv-SE"}},
        LanguagesCase{"LANGUAGE with nothing usable falls back", {"C", std::nullopt, std::nullopt, "fr_FR"}, {"fr-FR"}},
        LanguagesCase{"empty LANGUAGE falls back", {"", std::nullopt, std::nullopt, "fr_FR"}, {"fr-FR"}},
        LanguagesCase{"LC_ALL before LC_MESSAGES and LANG", {std::nullopt, "ja_JP.UTF-8", "ko_KR", "en_US"}, {"ja-JP"}},
        LanguagesCase{"LC_MESSAGES before LANG", {std::nullopt, std::nullopt, "ko_KR", "en_US"}, {"ko-KR"}},
        LanguagesCase{"empty LC_ALL does not count", {std::nullopt, "", std::nullopt, "it_IT"}, {"it-IT"}},
        LanguagesCase{"LC_ALL=C means none", {std::nullopt, "C", std::nullopt, "de_DE"}, {}},
        LanguagesCase{"nothing set", {std::nullopt, std::nullopt, std::nullopt, std::nullopt}, {}}));

struct CountryCase {
  const char* what;
  Environment environment;
  Maybe country;
  friend void PrintTo(const CountryCase& c, std::ostream* os) { *os << c.what; }
};

class CurrentLocaleCountryCodeTest : public ::testing::TestWithParam<CountryCase> {};

TEST_P(CurrentLocaleCountryCodeTest, ReadsTheLocale) {
  ScopedEnv env;
  Apply(env, GetParam().environment);
  EXPECT_EQ(CurrentLocaleCountryCode(), GetParam().country) << GetParam().what;
}

INSTANTIATE_TEST_SUITE_P(
    Sources, CurrentLocaleCountryCodeTest,
    ::testing::Values(
        CountryCase{"LANG", {std::nullopt, std::nullopt, std::nullopt, "de_CH.UTF-8"}, "CH"},
        CountryCase{"LC_ALL first", {std::nullopt, "es_419", std::nullopt, "en_US"}, "419"},
        CountryCase{"LC_MESSAGES before LANG", {std::nullopt, std::nullopt, "pt_BR", "en_US"}, "BR"},
        CountryCase{"script modifier keeps the region", {std::nullopt, std::nullopt, std::nullopt, "sr_RS@latin"}, "RS"},
        CountryCase{"language without region", {std::nullopt, std::nullopt, std::nullopt, "de"}, std::nullopt},
        CountryCase{"LANGUAGE is not a locale", {"fr_FR", std::nullopt, std::nullopt, std::nullopt}, std::nullopt},
        CountryCase{"C locale", {std::nullopt, "C", std::nullopt, "de_DE"}, std::nullopt}));

}  // namespace
}  // namespace lumeris
