// The user's preferred languages and the current locale's country, from the process environment.
//
//   LANGUAGE=de_CH:fr LANG=en_US.UTF-8   ->  PreferredLanguages() == {"de-CH", "fr"}
//                                            CurrentLocaleCountryCode() == "US"
//
// Preferred languages come from LANGUAGE (a colon-separated list) when it names at least one
// usable language, else from the first of LC_ALL, LC_MESSAGES and LANG that is set and non-empty.
// The current locale is that first set variable of LC_ALL, LC_MESSAGES and LANG (LANGUAGE names
// languages, not a locale, so it never gives the country). POSIX locale names
// (language[_territory][.codeset][@modifier]) become BCP 47 language tags with ICU; "C" and
// "POSIX" (with or without a codeset) mean no language at all.
//
// Thread-safety: safe to call from any thread, provided nobody changes the environment meanwhile.
// Every function returns plain values owned by the caller.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace lumeris {

// "de_DE.UTF-8" -> "de-DE", "sr_RS@latin" -> "sr-Latn-RS", "ca_ES@valencia" -> "ca-ES-valencia",
// "pt-BR" -> "pt-BR". The codeset is dropped, as are modifiers other than a script ("latin",
// "cyrillic", "devanagari") or "valencia". std::nullopt for "C", "POSIX", an empty name and
// anything that is not a well-formed locale name.
std::optional<std::string> LanguageTagFromPosixLocale(std::string_view name);

// The user's languages, most preferred first, without duplicates; empty when none is set.
std::vector<std::string> PreferredLanguages();

// The current locale's region ("US", "DE", "419"); std::nullopt when the locale names none.
std::optional<std::string> CurrentLocaleCountryCode();

}  // namespace lumeris
