// Writes small resource bundles into a temporary directory for the bundle and category tests.
//
//   BundleWriter app = BundleWriter::Application(dir.path() / "Test.app", "com.example.Test", "en");
//   app.WriteStringsTable("de", "Localizable", {{"Hello", "Hallo"}});
//
// Not thread-safe; use from the test's main thread. Files are owned by the caller's temp dir.
#pragma once

#include <filesystem>
#include <fstream>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "platform/property_list.h"
#include "platform/property_list_io.h"
#include "support/scoped_env.h"

namespace lumeris::testing {

class BundleWriter {
 public:
  using Path = std::filesystem::path;
  using Maybe = std::optional<std::string>;

  // An application bundle: Contents/Info.plist, resources in Contents/Resources.
  static BundleWriter Application(const Path& path, Maybe identifier, Maybe development_localization) {
    return BundleWriter(path, path / "Contents/Resources", path / "Contents/Info.plist", identifier,
                        development_localization);
  }
  // A framework bundle: Resources/Info.plist, resources in Resources.
  static BundleWriter Framework(const Path& path, Maybe identifier, Maybe development_localization) {
    return BundleWriter(path, path / "Resources", path / "Resources/Info.plist", identifier,
                        development_localization);
  }

  const Path& path() const { return path_; }
  const Path& info_file() const { return info_file_; }

  // The folder of `localization` ("" for the non-localized folder), created on demand.
  Path Folder(std::string_view localization) const {
    Path folder = localization.empty() ? resources_ : resources_ / (std::string(localization) + ".lproj");
    std::filesystem::create_directories(folder);
    return folder;
  }
  // Writes `relative` (e.g. "Icons/Star.pdf") into the folder of `localization`.
  Path WriteResource(std::string_view localization, const Path& relative, std::string_view contents) const {
    WriteFile(Folder(localization) / relative, contents);
    return Folder(localization) / relative;
  }
  // Writes "<table>.strings" as a binary property-list dictionary from key to string.
  Path WriteStringsTable(std::string_view localization, std::string_view table,
                         const std::map<std::string, std::string>& strings) const {
    plist::Dictionary dictionary(strings.begin(), strings.end());
    return WritePlist(Folder(localization) / (std::string(table) + ".strings"), dictionary);
  }

  static Path WritePlist(const Path& file, const plist::Value& value) {
    const std::vector<std::uint8_t> bytes = plist::SerializeBinaryPropertyList(value);
    WriteFile(file, std::string_view(reinterpret_cast<const char*>(bytes.data()), bytes.size()));
    return file;
  }
  static void WriteFile(const Path& file, std::string_view contents) {
    std::filesystem::create_directories(file.parent_path());
    std::ofstream(file, std::ios::binary | std::ios::trunc) << contents;
  }

 private:
  BundleWriter(Path path, Path resources, Path info_file, const Maybe& identifier, const Maybe& development)
      : path_(std::move(path)), resources_(std::move(resources)), info_file_(std::move(info_file)) {
    std::filesystem::create_directories(resources_);
    plist::Dictionary info{{"CFBundleName", path_.stem().string()}};
    if (identifier) info.emplace("CFBundleIdentifier", *identifier);
    if (development) info.emplace("CFBundleDevelopmentRegion", *development);
    WritePlist(info_file_, info);
  }

  Path path_, resources_, info_file_;
};

// Sets the user's languages for one test: LANGUAGE as given, LANG as given, LC_ALL and
// LC_MESSAGES cleared (all restored when `env` ends).
inline void SetUserLanguages(ScopedEnv& env, std::optional<std::string> language_list,
                             std::optional<std::string> lang = std::nullopt) {
  env.Set("LANGUAGE", language_list);
  env.Set("LC_ALL", std::nullopt);
  env.Set("LC_MESSAGES", std::nullopt);
  env.Set("LANG", lang);
}

}  // namespace lumeris::testing
