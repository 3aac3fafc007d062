#include "platform/bundle_localization.h"

#include <unicode/localematcher.h>
#include <unicode/locid.h>

#include <algorithm>
#include <array>
#include <mutex>
#include <utility>

namespace lumeris {
namespace {

// Localization folder names that older bundles used before language codes.
constexpr std::array<std::pair<std::string_view, std::string_view>, 22> kOldStyleNames = {{
    {"Arabic", "ar"},     {"Chinese", "zh"},   {"Czech", "cs"},     {"Danish", "da"},
    {"Dutch", "nl"},      {"English", "en"},   {"Finnish", "fi"},   {"French", "fr"},
    {"German", "de"},     {"Greek", "el"},     {"Hebrew", "he"},    {"Hungarian", "hu"},
    {"Italian", "it"},    {"Japanese", "ja"},  {"Korean", "ko"},    {"Norwegian", "nb"},
    {"Polish", "pl"},     {"Portuguese", "pt"}, {"Russian", "ru"},  {"Spanish", "es"},
    {"Swedish", "sv"},    {"Turkish", "tr"},
}};

std::optional<icu::Locale> ParseLanguageTag(std::string_view tag) {
  UErrorCode status = U_ZERO_ERROR;
  icu::Locale locale = icu::Locale::forLanguageTag(tag, status);
  if (U_FAILURE(status) || locale.isBogus() || *locale.getLanguage() == '\0') return std::nullopt;
  return locale;
}

std::vector<std::string> Match(std::span<const std::string> localizations,
                               std::span<const std::string> preferences) {
  std::vector<icu::Locale> supported;
  std::vector<std::size_t> localization_of_supported;
  for (std::size_t i = 0; i < localizations.size(); ++i) {
    const auto old_style = LanguageCodeForOldStyleLocalization(localizations[i]);
    if (auto locale = ParseLanguageTag(old_style ? *old_style : std::string_view(localizations[i]))) {
      supported.push_back(std::move(*locale));
      localization_of_supported.push_back(i);
    }
  }
  std::vector<std::string> matches;
  if (supported.empty()) return matches;

  UErrorCode status = U_ZERO_ERROR;
  const icu::LocaleMatcher matcher = icu::LocaleMatcher::Builder()
                                         .setSupportedLocales(supported.begin(), supported.end())
                                         .setNoDefaultLocale()
                                         .build(status);
  if (U_FAILURE(status)) return matches;
  for (const std::string& preference : preferences) {
    const auto desired = ParseLanguageTag(preference);
    if (!desired) continue;
    const icu::LocaleMatcher::Result result = matcher.getBestMatchResult(*desired, status);
    if (U_FAILURE(status)) return matches;
    const int index = result.getSupportedIndex();
    if (index < 0) continue;
    const std::string& localization = localizations[localization_of_supported[index]];
    if (std::find(matches.begin(), matches.end(), localization) == matches.end()) {
      matches.push_back(localization);
    }
  }
  return matches;
}

// The last few answers of Match(). Matching is a pure function of the two lists (and ICU's data),
// and building the matcher parses every localization name: about 60 us for a bundle of 120
// localizations, asked several times per catalogue request with the same lists.
class RecentMatches {
 public:
  std::vector<std::string> Get(std::span<const std::string> localizations,
                               std::span<const std::string> preferences) {
    const auto same = [&](const Entry& entry) {
      return std::equal(entry.localizations.begin(), entry.localizations.end(), localizations.begin(),
                        localizations.end()) &&
             std::equal(entry.preferences.begin(), entry.preferences.end(), preferences.begin(),
                        preferences.end());
    };
    {
      std::lock_guard lock(mutex_);
      for (const Entry& entry : entries_) {
        if (same(entry)) return entry.matches;
      }
    }
    Entry entry{{localizations.begin(), localizations.end()},
                {preferences.begin(), preferences.end()},
                Match(localizations, preferences)};
    std::vector<std::string> matches = entry.matches;
    std::lock_guard lock(mutex_);
    if (entries_.size() == kEntries) entries_.erase(entries_.begin());
    entries_.push_back(std::move(entry));
    return matches;
  }

 private:
  static constexpr std::size_t kEntries = 4;
  struct Entry {
    std::vector<std::string> localizations;
    std::vector<std::string> preferences;
    std::vector<std::string> matches;
  };
  std::mutex mutex_;
  std::vector<Entry> entries_;
};

}  // namespace

std::vector<std::string> PreferredLocalizationsFromArray(std::span<const std::string> localizations,
                                                         std::span<const std::string> preferences) {
  // Never destroyed, so that lookups during exit stay safe.
  static RecentMatches* const recent = new RecentMatches();
  return recent->Get(localizations, preferences);
}

std::optional<std::string_view> LanguageCodeForOldStyleLocalization(std::string_view localization) {
  for (const auto& [name, code] : kOldStyleNames) {
    if (name == localization) return code;
  }
  return std::nullopt;
}

std::optional<std::string_view> OldStyleLocalizationForLanguageCode(std::string_view code) {
  for (const auto& [name, language] : kOldStyleNames) {
    if (language == code) return name;
  }
  return std::nullopt;
}

}  // namespace lumeris
