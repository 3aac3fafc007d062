#include "platform/bundle.h"

#include <dirent.h>

#include <algorithm>
#include <system_error>
#include <utility>

#include "platform/bundle_localization.h"
#include "platform/preferred_languages.h"
#include "platform/property_list_io.h"

namespace lumeris {
namespace {

namespace fs = std::filesystem;

constexpr std::string_view kLocalizationSuffix = ".lproj";
constexpr std::string_view kDefaultStringsTable = "Localizable";

// One path component that stays where it is put: not empty, no "/", not "." or "..".
bool IsPlainComponent(std::string_view component) {
  return !component.empty() && component != "." && component != ".." &&
         component.find('/') == std::string_view::npos && component.find('\0') == std::string_view::npos;
}

// A relative path whose components are all plain (an empty path is fine: no sub-directory).
bool IsPlainRelativePath(std::string_view path) {
  if (path.find('\0') != std::string_view::npos) return false;
  const fs::path relative(path);
  if (relative.is_absolute()) return false;
  return std::none_of(relative.begin(), relative.end(), [](const fs::path& part) { return part == ".."; });
}

bool IsDirectory(const fs::path& path) {
  std::error_code error;
  return fs::is_directory(path, error);
}

bool Exists(const fs::path& path) {
  std::error_code error;
  return fs::exists(path, error);
}

std::optional<std::string> StringMember(const plist::Dictionary& dictionary, std::string_view key) {
  const auto it = dictionary.find(key);
  if (it == dictionary.end()) return std::nullopt;
  const std::string* value = it->second.AsString();
  return value ? std::optional<std::string>(*value) : std::nullopt;
}

std::vector<std::string> ListLocalizations(const fs::path& resources) {
  std::vector<std::string> names;
  std::error_code error;
  fs::directory_iterator it(resources, error);
  for (; !error && it != fs::directory_iterator(); it.increment(error)) {
    const std::string file = it->path().filename().string();
    if (file.size() <= kLocalizationSuffix.size() || !file.ends_with(kLocalizationSuffix)) continue;
    std::error_code type_error;
    if (!it->is_directory(type_error)) continue;
    names.push_back(file.substr(0, file.size() - kLocalizationSuffix.size()));
  }
  std::sort(names.begin(), names.end());
  return names;
}

void AppendUnique(std::vector<std::string>& list, const std::string& value) {
  if (std::find(list.begin(), list.end(), value) == list.end()) list.push_back(value);
}

}  // namespace

std::optional<Bundle> Bundle::Open(const std::filesystem::path& path) {
  if (!IsDirectory(path)) return std::nullopt;
  Bundle bundle;
  bundle.path_ = path;
  const fs::path contents = path / "Contents";
  const fs::path info_file = IsDirectory(contents) ? contents / "Info.plist" : path / "Resources" / "Info.plist";
  bundle.resources_ = IsDirectory(contents) ? contents / "Resources" : path / "Resources";
  if (std::optional<plist::Value> info = plist::ReadPropertyListFile(info_file)) {
    if (plist::Dictionary* dictionary = info->AsDictionary()) bundle.info_ = std::move(*dictionary);
  }
  bundle.identifier_ = StringMember(bundle.info_, "CFBundleIdentifier");
  bundle.development_localization_ = StringMember(bundle.info_, "CFBundleDevelopmentRegion");
  bundle.localizations_ = ListLocalizations(bundle.resources_);
  return bundle;
}

std::vector<std::string> Bundle::PreferredLocalizations() const {
  std::vector<std::string> preferred = PreferredLocalizationsFromArray(localizations_, PreferredLanguages());
  if (preferred.empty() && development_localization_) preferred.push_back(*development_localization_);
  return preferred;
}

std::optional<std::filesystem::path> Bundle::LocalizationDirectory(std::string_view localization) const {
  if (!IsPlainComponent(localization)) return std::nullopt;
  const auto directory_of = [&](std::string_view name) -> std::optional<fs::path> {
    fs::path directory = resources_ / (std::string(name) + std::string(kLocalizationSuffix));
    if (IsDirectory(directory)) return directory;
    return std::nullopt;
  };
  // The aliases are worked out only when the name itself has no folder (they ask ICU).
  if (auto directory = directory_of(localization)) return directory;
  if (const auto code = LanguageCodeForOldStyleLocalization(localization)) {
    if (auto directory = directory_of(*code)) return directory;
  }
  if (const auto old_style = OldStyleLocalizationForLanguageCode(localization)) return directory_of(*old_style);
  return std::nullopt;
}

Bundle::PlainResourceLookup Bundle::ListPlainResources(const std::vector<std::string>& matches) const {
  PlainResourceLookup lookup;
  const auto add_folder = [&](fs::path path) {
    PlainResourceLookup::Folder& folder = lookup.folders_.emplace_back();
    // readdir() itself: directory_iterator makes a path object per entry, which costs more
    // here than the listing.
    if (DIR* directory = opendir(path.c_str())) {
      while (const dirent* entry = readdir(directory)) folder.files.emplace(entry->d_name);
      closedir(directory);
    }
    folder.path = std::move(path);
  };
  add_folder(resources_);
  // The order PathForResource() tries without a localization (PreferredLocalizations(), which
  // falls back to the development localization, then that one).
  std::vector<std::string> order = matches;
  if (development_localization_) AppendUnique(order, *development_localization_);
  for (const std::string& each : order) {
    if (auto directory = LocalizationDirectory(each)) add_folder(std::move(*directory));
  }
  return lookup;
}

std::optional<std::filesystem::path> Bundle::PlainResourceLookup::PathForResource(std::string_view name,
                                                                                 std::string_view type) const {
  if (!IsPlainComponent(name) || (!type.empty() && !IsPlainComponent(type))) return std::nullopt;
  std::string file(name);
  if (!type.empty()) file.append(".").append(type);
  for (const Folder& folder : folders_) {
    // A listed name can still be a dangling link: the same existence test as PathForResource().
    if (folder.files.contains(file)) {
      fs::path candidate = folder.path / file;
      if (Exists(candidate)) return candidate;
    }
  }
  return std::nullopt;
}

std::optional<std::filesystem::path> Bundle::PathForResource(
    std::string_view name, std::string_view type, std::string_view subdirectory,
    std::optional<std::string_view> localization) const {
  if (!IsPlainComponent(name) || (!type.empty() && !IsPlainComponent(type)) || !IsPlainRelativePath(subdirectory)) {
    return std::nullopt;
  }
  std::string file(name);
  if (!type.empty()) file.append(".").append(type);
  const auto find_in = [&](const fs::path& folder) -> std::optional<fs::path> {
    fs::path candidate = folder / subdirectory / file;
    if (Exists(candidate)) return candidate;
    return std::nullopt;
  };

  if (auto found = find_in(resources_)) return found;
  std::vector<std::string> order;
  if (localization) {
    order.emplace_back(*localization);
  } else {
    order = PreferredLocalizations();
    if (development_localization_) AppendUnique(order, *development_localization_);
  }
  for (const std::string& each : order) {
    if (const auto directory = LocalizationDirectory(each)) {
      if (auto found = find_in(*directory)) return found;
    }
  }
  return std::nullopt;
}

std::string Bundle::LocalizedString(std::string_view key, std::optional<std::string_view> value,
                                    std::optional<std::string_view> table) const {
  const std::string_view table_name = table && !table->empty() ? *table : kDefaultStringsTable;
  if (const auto path = PathForResource(table_name, "strings")) {
    if (const auto strings = ReadStringsTable(*path)) {
      const auto it = strings->find(key);
      if (it != strings->end()) {
        if (const std::string* translation = it->second.AsString()) return *translation;
      }
    }
  }
  if (value && !value->empty()) return std::string(*value);
  return std::string(key);
}

std::optional<plist::Dictionary> ReadStringsTable(const std::filesystem::path& path) {
  std::optional<plist::Value> table = plist::ReadPropertyListFile(path);
  if (!table) return std::nullopt;
  plist::Dictionary* dictionary = table->AsDictionary();
  if (dictionary == nullptr) return std::nullopt;
  return std::move(*dictionary);
}

}  // namespace lumeris
