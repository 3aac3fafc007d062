// Localization lookup for the category data: which of a bundle's localizations to use, and the
// strings-table lookup for an explicitly named localization with its one-entry cache.
//
//   std::string loc = PreferredLocalizationOfBundle(&*app);
//   std::optional<std::string> title =
//       LocalizedStringForLanguage("Smileys", &*app, loc, "Emoji_Category", "Smileys");
//
// Text is UTF-8 std::string throughout (keys, values, names); an absent value (no table name, no
// localization, no default, no result) is std::nullopt, which is distinct from an empty string.
//
// The cache holds exactly one strings table, keyed by table name, localization and bundle
// identifier. A lookup hits only when all three were given and equal the cached ones; an absent
// table name, localization or identifier never equals anything, so lookups in the default table
// reload the file every time. A miss replaces the entry, including when the table is missing or
// unreadable (the entry then holds no table). With a table loaded, a key missing from it gives the
// default and nothing else is consulted; with no table, the bundle's own lookup answers
// (Bundle::LocalizedString, which follows the user's languages rather than the localization asked
// for), and with no bundle the default.
//
// Thread-safety: a StringsTableCache guards its entry with one mutex held for the whole lookup
// (compare, load, read), so catalogue requests of different connections may call
// LocalizedStringForLanguage() at the same time. Results are copies owned by the caller.
#pragma once

#include <filesystem>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>

#include "platform/bundle.h"
#include "platform/property_list.h"

namespace lumeris {

// The localization used when none of a bundle's localizations matches the user's languages: the
// old-style name, which bundle lookups resolve to the "en" folder when there is no "English" one.
inline constexpr std::string_view kFallbackLocalization = "English";
// The table read when a lookup names none.
inline constexpr std::string_view kDefaultStringsTable = "Localizable";

// The bundle's localization that best matches the user's preferred languages, else "English"
// (also for a null bundle). Never empty.
std::string PreferredLocalizationOfBundle(const Bundle* bundle);
// The same for `languages` read by the caller (PreferredLanguages()).
std::string PreferredLocalizationOfBundle(const Bundle* bundle, const std::vector<std::string>& languages);

class StringsTableCache {
 public:
  using Table = std::shared_ptr<const plist::Dictionary>;
  // Loads the strings table at a path that exists; nullptr when it cannot be read as one.
  using Loader = std::function<Table(const std::filesystem::path&)>;

  // Loads tables with ReadStringsTable().
  StringsTableCache();
  explicit StringsTableCache(Loader loader);
  StringsTableCache(const StringsTableCache&) = delete;
  StringsTableCache& operator=(const StringsTableCache&) = delete;

  // `key` translated in strings table `table` (kDefaultStringsTable when absent or empty) of `bundle`
  // (may be null) for `localization`, following the rules in the file comment; else
  // `default_value`.
  std::optional<std::string> Lookup(std::string_view key, const Bundle* bundle,
                                    std::optional<std::string_view> localization,
                                    std::optional<std::string_view> table,
                                    std::optional<std::string_view> default_value);

 private:
  // The miss path: take over the new key and (re)load the table.
  void Replace(const Bundle* bundle, std::optional<std::string_view> localization,
               std::optional<std::string_view> table);

  const Loader loader_;
  std::mutex mutex_;
  // All guarded by mutex_.
  std::optional<std::string> table_name_;
  std::optional<std::string> localization_;
  std::optional<std::string> bundle_identifier_;
  Table strings_;
};

// StringsTableCache::Lookup() on the process-wide cache (created on first use, never destroyed).
std::optional<std::string> LocalizedStringForLanguage(std::string_view key, const Bundle* bundle,
                                                      std::optional<std::string_view> localization,
                                                      std::optional<std::string_view> table,
                                                      std::optional<std::string_view> default_value);

}  // namespace lumeris
