// Choosing among a bundle's localizations for the user's languages, with ICU's locale matching.
//
//   PreferredLocalizationsFromArray({"English", "de", "zh-Hant"}, {"zh-TW", "en-GB"})
//       == {"zh-Hant", "English"}
//
// A localization is a bundle's .lproj folder name: a BCP 47 language tag ("en", "pt-PT",
// "zh-Hans") or an old-style language name ("English", "French", "German", ...), which counts as
// its language code. Matching is ICU's icu::LocaleMatcher with its default distances: a regional
// or script variant matches its language ("en-US" finds "en", "zh-TW" finds "zh-Hant"), and a
// preference with nothing close enough matches nothing.
//
// Thread-safety: every function may be called from any thread at the same time. Results are
// plain values owned by the caller.
#pragma once

#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace lumeris {

// The language code an old-style localization name stands for ("English" -> "en"),
// std::nullopt for any other name (language tags included).
std::optional<std::string_view> LanguageCodeForOldStyleLocalization(std::string_view localization);

// The old-style name of a language code ("en" -> "English"), std::nullopt when it has none.
std::optional<std::string_view> OldStyleLocalizationForLanguageCode(std::string_view code);

// For each preference in order, the localization that matches it best, without duplicates.
// Localizations that are neither language tags nor old-style names never match.
std::vector<std::string> PreferredLocalizationsFromArray(std::span<const std::string> localizations,
                                                         std::span<const std::string> preferences);

}  // namespace lumeris
