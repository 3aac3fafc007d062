// A resource bundle on disk: an application ("X.app") or a framework ("X.framework"), its
// Info.plist, its localizations and the lookup of its resources and localized strings.
//
//   std::optional<Bundle> app = Bundle::Open(SystemPath("/System/Library/Input Methods/Sorvendi.app"));
//   std::optional<std::filesystem::path> db = app->PathForResource("CharacterDB", "sqlite3");
//   std::string title = app->LocalizedString("CategoryName-Arrows", "Arrows", std::nullopt);
//
// Layouts: an application keeps "Contents/Info.plist" and its resources in "Contents/Resources/";
// a framework (any directory without "Contents") keeps "Resources/Info.plist" and its resources in
// "Resources/". A resource named N of type T is the file "N.T" (just "N" when T is empty).
// Localized resources live in "<resources>/<localization>.lproj/"; the bundle's localizations are
// the names of those folders. An old-style folder name ("English") and its language code ("en")
// stand for each other: asking for "English" finds "en.lproj" when there is no "English.lproj".
//
// Failures are values: a missing or unparsable Info.plist leaves the info dictionary empty (no
// identifier, no development localization); a missing resource is std::nullopt. Names, types and
// sub-directories that would leave the bundle ("..", a "/" in a name or type, an absolute
// sub-directory) find nothing.
//
// Thread-safety: a Bundle is immutable after Open() (Info.plist and the localization list are read
// then, once); all const members may be called from any thread at the same time. Lookups that
// depend on the user's languages read the environment at each call. Strings tables are read
// afresh at each LocalizedString() call; nothing is cached. Bundle is a copyable value.
#pragma once

#include <filesystem>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_set>
#include <vector>

#include "platform/property_list.h"

namespace lumeris {

class Bundle {
 public:
  // Opens the bundle at `path`; std::nullopt when `path` is not a directory.
  static std::optional<Bundle> Open(const std::filesystem::path& path);

  const std::filesystem::path& path() const { return path_; }
  const std::filesystem::path& resources_directory() const { return resources_; }
  // The parsed Info.plist; empty when it is missing or is not a dictionary.
  const plist::Dictionary& info_dictionary() const { return info_; }
  // CFBundleIdentifier, when Info.plist has it as a string.
  const std::optional<std::string>& identifier() const { return identifier_; }
  // CFBundleDevelopmentRegion, when Info.plist has it as a string.
  const std::optional<std::string>& development_localization() const { return development_localization_; }
  // The names of the bundle's .lproj folders, sorted by byte value.
  const std::vector<std::string>& localizations() const { return localizations_; }

  // The bundle's localizations that match the user's preferred languages, best first; the
  // development localization alone when none matches; empty when there is none of either.
  std::vector<std::string> PreferredLocalizations() const;

  // The file of resource `name` of `type`, looked for in `subdirectory` (relative to the resources
  // folder and to each .lproj folder; empty for none): first in the non-localized folder, then for
  // `localization` when one is given, else for each preferred localization in order and then the
  // development localization.
  std::optional<std::filesystem::path> PathForResource(
      std::string_view name, std::string_view type, std::string_view subdirectory = {},
      std::optional<std::string_view> localization = std::nullopt) const;

  // The plain lookup (PathForResource() without a localization or sub-directory) for a run of
  // resources, with the folders listed once: each later lookup costs a set search instead of a
  // failed stat per folder tried. `matches` are the bundle's localizations that match the user's
  // languages, best first (PreferredLocalizationsFromArray of localizations()), worked out once
  // by the caller. Reflects the folders as they were listed; use it for one request only.
  class PlainResourceLookup {
   public:
    std::optional<std::filesystem::path> PathForResource(std::string_view name, std::string_view type) const;

   private:
    friend class Bundle;
    struct Folder {
      std::filesystem::path path;
      std::unordered_set<std::string> files;
    };
    std::vector<Folder> folders_;  // the non-localized folder, then one per localization
  };
  PlainResourceLookup ListPlainResources(const std::vector<std::string>& matches) const;

  // The bundle's own localized string: `key` in strings table `table` ("Localizable" when absent
  // or empty) found by PathForResource() without a localization, i.e. following the user's
  // languages. A key that is missing (or not a string) gives `value` when that is non-empty,
  // else the key itself.
  std::string LocalizedString(std::string_view key, std::optional<std::string_view> value,
                              std::optional<std::string_view> table) const;

 private:
  Bundle() = default;
  // The existing .lproj folder for `localization` (its own name first, then its alias).
  std::optional<std::filesystem::path> LocalizationDirectory(std::string_view localization) const;

  std::filesystem::path path_;
  std::filesystem::path resources_;
  plist::Dictionary info_;
  std::optional<std::string> identifier_;
  std::optional<std::string> development_localization_;
  std::vector<std::string> localizations_;
};

// Reads a strings table (a property-list dictionary from key to string). std::nullopt when the
// file is missing, does not parse, or does not hold a dictionary.
std::optional<plist::Dictionary> ReadStringsTable(const std::filesystem::path& path);

}  // namespace lumeris
