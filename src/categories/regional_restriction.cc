#include "categories/regional_restriction.h"

#include <atomic>
#include <mutex>
#include <optional>
#include <string>

#include "platform/preference_store.h"
#include "platform/preferences.h"
#include "platform/preferred_languages.h"

namespace lumeris {
namespace {

std::atomic<bool> region_restricted{false};
std::once_flag init_once;

// U+1F1F9 U+1F1FC, regional indicator symbols T and W.
const char16_t kHiddenCharacter[] = {0xD83C, 0xDDF9, 0xD83C, 0xDDFC};

// The "Country" preference as the file holds it now: a synchronise with nothing pending re-reads
// the file when it changed since the last read.
std::optional<std::string> CountryPreference() {
  PreferenceStore::Shared().Synchronize(kCFPreferencesAnyApplication, kCFPreferencesAnyUser,
                                        kCFPreferencesCurrentHost);
  std::optional<plist::Value> value = CFPreferencesCopyValue(
      "Country", kCFPreferencesAnyApplication, kCFPreferencesAnyUser, kCFPreferencesCurrentHost);
  const std::string* country = value ? value->AsString() : nullptr;
  return country ? std::optional<std::string>(*country) : std::nullopt;
}

bool CountryIsRestricted() {
  if (CountryPreference() == "CN") return true;
  return CurrentLocaleCountryCode() == "CN";
}

}  // namespace

bool UpdateRegionalRestriction(int kind, bool refresh, bool* changed) {
  if (kind != 0) return false;
  if (!refresh) return region_restricted.load();
  const bool restricted = CountryIsRestricted();
  const bool previous = region_restricted.exchange(restricted);
  if (changed != nullptr) *changed = previous != restricted;
  return restricted;
}

void InitRegionalRestrictionOnce() {
  std::call_once(init_once, [] { UpdateRegionalRestriction(0, true, nullptr); });
}

bool ShouldHideThisCharacter(const icu::UnicodeString& text) {
  InitRegionalRestrictionOnce();
  if (!region_restricted.load()) return false;
  return text == icu::UnicodeString(kHiddenCharacter, 4);
}

bool UpdateCountryInfoAndCheckSignificantChange() {
  bool changed = false;
  UpdateRegionalRestriction(0, true, &changed);
  return changed;
}

}  // namespace lumeris
