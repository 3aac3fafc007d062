// Regional hiding: the one character search must not offer when the user's country is "CN", the
// flag sequence U+1F1F9 U+1F1FC, and the process-wide flag that says whether that is the case.
//
//   UpdateCountryInfoAndCheckSignificantChange();        // before every text search
//   if (ShouldHideThisCharacter(candidate)) continue;    // for every search candidate
//
// The flag is refreshed from two sources, in this order: the preference "Country" for any
// application, any user and the current host (read afresh from its file at every refresh), then
// the current locale's country (platform/preferred_languages.h). A preference of "CN" switches
// the restriction on; any other value, or none, leaves the decision to the locale, so a
// preference can never lift the restriction of a "CN" locale. Comparisons are exact and
// case-sensitive.
//
// Thread-safety: all functions may be called from any thread at the same time. The flag is an
// atomic boolean: a concurrent reader sees the value before or after a refresh. The first
// initialisation runs once per process (std::call_once).
#pragma once

#include <unicode/unistr.h>

namespace lumeris {

// The name of the notification that tells the panel's code the country information changed.
// The service neither posts nor observes it.
inline constexpr char LMKLocaleCountryInfoChanged[] = "LMKLocaleCountryInfoChanged";

// True when the flag is set and `text` is exactly U+1F1F9 U+1F1FC (the same UTF-16 units; a copy
// with a variation selector or anything else added does not match). Runs
// InitRegionalRestrictionOnce() first.
bool ShouldHideThisCharacter(const icu::UnicodeString& text);

// Refreshes the flag; true when its value changed at this refresh (a move between two
// unrestricted countries is no change).
bool UpdateCountryInfoAndCheckSignificantChange();

// Internal. `kind` 0 is the only restriction kind: any other returns false and touches nothing.
// Without `refresh` the current flag is returned. Otherwise the flag is recomputed from the
// sources above, `*changed` (when given) receives whether it differs from the old value, and the
// new value is stored and returned.
bool UpdateRegionalRestriction(int kind, bool refresh, bool* changed);

// Internal. UpdateRegionalRestriction(0, true, nullptr), once per process.
void InitRegionalRestrictionOnce();

}  // namespace lumeris
