#include "categories/localization_lookup.h"

#include <utility>

#include "platform/bundle_localization.h"
#include "platform/preferred_languages.h"

namespace lumeris {
namespace {

StringsTableCache::Table LoadStringsTable(const std::filesystem::path& path) {
  std::optional<plist::Dictionary> table = ReadStringsTable(path);
  if (!table) return nullptr;
  return std::make_shared<const plist::Dictionary>(std::move(*table));
}

// Absent never equals anything, not even absent.
bool SameName(const std::optional<std::string>& cached, std::optional<std::string_view> current) {
  return cached && current && *cached == *current;
}

std::optional<std::string> Copy(std::optional<std::string_view> value) {
  return value ? std::optional<std::string>(*value) : std::nullopt;
}

}  // namespace

std::string PreferredLocalizationOfBundle(const Bundle* bundle) {
  return PreferredLocalizationOfBundle(bundle, PreferredLanguages());
}

std::string PreferredLocalizationOfBundle(const Bundle* bundle, const std::vector<std::string>& languages) {
  if (bundle != nullptr) {
    std::vector<std::string> matches = PreferredLocalizationsFromArray(bundle->localizations(), languages);
    if (!matches.empty()) return std::move(matches.front());
  }
  return std::string(kFallbackLocalization);
}

StringsTableCache::StringsTableCache() : StringsTableCache(LoadStringsTable) {}

StringsTableCache::StringsTableCache(Loader loader) : loader_(std::move(loader)) {}

std::optional<std::string> StringsTableCache::Lookup(std::string_view key, const Bundle* bundle,
                                                     std::optional<std::string_view> localization,
                                                     std::optional<std::string_view> table,
                                                     std::optional<std::string_view> default_value) {
  std::lock_guard lock(mutex_);
  const std::optional<std::string_view> identifier =
      bundle != nullptr && bundle->identifier() ? std::optional<std::string_view>(*bundle->identifier()) : std::nullopt;
  const bool hit = SameName(table_name_, table) && SameName(localization_, localization) &&
                   SameName(bundle_identifier_, identifier);
  if (!hit) Replace(bundle, localization, table);

  if (strings_) {
    const auto it = strings_->find(key);
    if (it != strings_->end()) {
      if (const std::string* translation = it->second.AsString()) return *translation;
    }
    return Copy(default_value);
  }
  if (bundle != nullptr) return bundle->LocalizedString(key, default_value, table);
  return Copy(default_value);
}

void StringsTableCache::Replace(const Bundle* bundle, std::optional<std::string_view> localization,
                                std::optional<std::string_view> table) {
  table_name_ = Copy(table);
  localization_ = Copy(localization);
  bundle_identifier_ = bundle != nullptr ? bundle->identifier() : std::nullopt;
  strings_ = nullptr;
  if (bundle == nullptr) return;
  const std::string_view name = table && !table->empty() ? *table : kDefaultStringsTable;
  if (const auto path = bundle->PathForResource(name, "strings", {}, localization)) {
    strings_ = loader_(*path);
  }
}

std::optional<std::string> LocalizedStringForLanguage(std::string_view key, const Bundle* bundle,
                                                      std::optional<std::string_view> localization,
                                                      std::optional<std::string_view> table,
                                                      std::optional<std::string_view> default_value) {
  // Lives for the whole process and is never destroyed, so lookups during exit stay safe.
  static StringsTableCache* const cache = new StringsTableCache();
  return cache->Lookup(key, bundle, localization, table, default_value);
}

}  // namespace lumeris
