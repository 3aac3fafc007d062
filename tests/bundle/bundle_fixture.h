// Writes small resource bundles into a temporary directory for the bundle and category tests.
//
//   BundleWriter app = BundleWriter::Application(dir.path() / "Test.app", "com.example.Test", "en");
//   app.WriteStringsTable("de", "Localizable", {{"Hello", "Hallo"}});
//   std::optional<Bundle> bundle = Bundle::Open(app.path());
//
// Not thread-safe; use from the test's main thread. Files are owned by the caller's temp dir.
#pragma once

#include <filesystem>
#include <fstream>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/property_list.h"
#include "platform/property_list_io.h"
#include "support/scoped_env.h"

namespace lumeris::testing {

class BundleWriter {
 public:
  // An application bundle: Contents/Info.plist, resources in Contents/Resources.
  static BundleWriter Application(const std::filesystem::path& path, std::optional<std::string> identifier,
                                  std::optional<std::string> development_localization) {
    BundleWriter writer(path, path / "Contents" / "Resources", path / "Contents" / "Info.plist");
    writer.WriteInfo(identifier, development_localization);
    return writer;
  }

  // A framework bundle: Resources/Info.plist, resources in Resources.
  static BundleWriter Framework(const std::filesystem::path& path, std::optional<std::string> identifier,
                                std::optional<std::string> development_localization) {
    BundleWriter writer(path, path / "Resources", path / "Resources" / "Info.plist");
    writer.WriteInfo(identifier, development_localization);
    return writer;
  }

  const std::filesystem::path& path() const { return path_; }
  const std::filesystem::path& resources() const { return resources_; }
  const std::filesystem::path& info_file() const { return info_file_; }

  // The folder of `localization` ("" for the non-localized folder), created on demand.
  std::filesystem::path Folder(std::string_view localization) const {
    std::filesystem::path folder =
        localization.empty() ? resources_ : resources_ / (std::string(localization) + ".lproj");
    std::filesystem::create_directories(folder);
    return folder;
  }

  // Writes `relative` (e.g. "Icons/Star.pdf") into the folder of `localization`.
  std::filesystem::path WriteResource(std::string_view localization, const std::filesystem::path& relative,
                                      std::string_view contents) const {
    const std::filesystem::path file = Folder(localization) / relative;
    WriteFile(file, contents);
    return file;
  }

  // Writes "<table>.strings" as a binary property-list dictionary from key to string.
  std::filesystem::path WriteStringsTable(std::string_view localization, std::string_view table,
                                          const std::map<std::string, std::string>& strings) const {
    plist::Dictionary dictionary;
    for (const auto& [key, value] : strings) dictionary.emplace(key, value);
    return WritePlist(Folder(localization) / (std::string(table) + ".strings"), dictionary);
  }

  static std::filesystem::path WritePlist(const std::filesystem::path& file, const plist::Value& value) {
    const std::vector<std::uint8_t> bytes = plist::SerializeBinaryPropertyList(value);
    WriteFile(file, std::string_view(reinterpret_cast<const char*>(bytes.data()), bytes.size()));
    return file;
  }

  static void WriteFile(const std::filesystem::path& file, std::string_view contents) {
    std::filesystem::create_directories(file.parent_path());
    std::ofstream out(file, std::ios::binary | std::ios::trunc);
    out.write(contents.data(), static_cast<std::streamsize>(contents.size()));
  }

 private:
  BundleWriter(std::filesystem::path path, std::filesystem::path resources, std::filesystem::path info_file)
      : path_(std::move(path)), resources_(std::move(resources)), info_file_(std::move(info_file)) {
    std::filesystem::create_directories(resources_);
  }

  void WriteInfo(const std::optional<std::string>& identifier, const std::optional<std::string>& development) const {
    plist::Dictionary info{{"CFBundleName", path_.stem().string()}};
    if (identifier) info.emplace("CFBundleIdentifier", *identifier);
    if (development) info.emplace("CFBundleDevelopmentRegion", *development);
    WritePlist(info_file_, info);
  }

  std::filesystem::path path_;
  std::filesystem::path resources_;
  std::filesystem::path info_file_;
};

// Sets the user's languages for one test: LANGUAGE as given, the locale variables cleared
// except LANG (restored afterwards).
inline void SetUserLanguages(ScopedEnv& env, std::optional<std::string> language_list,
                             std::optional<std::string> lang = std::nullopt) {
  env.Set("LANGUAGE", language_list);
  env.Set("LC_ALL", std::nullopt);
  env.Set("LC_MESSAGES", std::nullopt);
  env.Set("LANG", lang);
}

}  // namespace lumeris::testing
