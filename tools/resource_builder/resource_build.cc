#include "resource_builder/resource_build.h"

#include <fstream>
#include <future>
#include <map>
#include <optional>
#include <set>
#include <system_error>

#include "lumeris/config.h"
#include "platform/property_list_io.h"
#include "resource_builder/category_definitions.h"
#include "resource_builder/category_plists.h"
#include "resource_builder/character_db.h"
#include "resource_builder/character_info.h"
#include "resource_builder/cldr_annotations.h"
#include "resource_builder/cldr_labels.h"
#include "resource_builder/emoji_test.h"
#include "resource_builder/han_language_info.h"
#include "resource_builder/icons.h"
#include "resource_builder/input_files.h"
#include "resource_builder/related_chars.h"
#include "resource_builder/related_db.h"
#include "resource_builder/strings_tables.h"
#include "resource_builder/unicode_data.h"
#include "resource_builder/unihan.h"

namespace lumeris::resources {
namespace {

namespace fs = std::filesystem;

constexpr const char* kUnihanFiles[] = {"Unihan_Readings.txt.bz2", "Unihan_DictionaryLikeData.txt.bz2",
                                        "Unihan_IRGSources.txt.bz2", "Unihan_Variants.txt.bz2"};
constexpr const char kLicenseName[] = "UnicodeLicense.txt";

// A failure with its reason; builds stop at the first one.
struct BuildError {
  std::string message;
};

std::string Require(const fs::path& path) {
  std::optional<std::string> text = ReadTextFile(path);
  if (!text) throw BuildError{"cannot read " + path.string()};
  return std::move(*text);
}

void WriteBytes(const fs::path& path, const std::vector<std::uint8_t>& bytes) {
  std::ofstream out(path, std::ios::binary | std::ios::trunc);
  out.write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
  if (!out) throw BuildError{"cannot write " + path.string()};
}

void WritePlist(const fs::path& path, const plist::Value& value) {
  WriteBytes(path, plist::SerializeBinaryPropertyList(value));
}

void MakeDirectories(const fs::path& path) {
  std::error_code error;
  fs::create_directories(path, error);
  if (error) throw BuildError{"cannot create " + path.string() + ": " + error.message()};
}

UnihanTable ReadUnihan(const fs::path& unicode_dir) {
  std::vector<std::future<std::optional<std::string>>> texts;
  for (const char* name : kUnihanFiles) {
    texts.push_back(std::async(std::launch::async, [path = unicode_dir / name] { return ReadBzip2File(path); }));
  }
  UnihanTable unihan;
  for (size_t i = 0; i < texts.size(); ++i) {
    std::optional<std::string> text = texts[i].get();
    if (!text) throw BuildError{"cannot read " + (unicode_dir / kUnihanFiles[i]).string()};
    AddUnihanRecords(*text, kUnihanFieldsUsed, unihan);
  }
  return unihan;
}

// Every locale whose own file has character labels, with its texts resolved through its parents.
std::map<std::string, CldrLocaleTexts> ReadLocaleTexts(const fs::path& cldr_dir) {
  auto parents = ParseCldrParentLocales(Require(cldr_dir / "supplemental" / "supplementalData.xml"));
  std::map<std::string, std::optional<CldrLocaleTexts>> own;  // texts of each file itself
  auto own_texts = [&](const std::string& locale) -> const std::optional<CldrLocaleTexts>& {
    auto it = own.find(locale);
    if (it != own.end()) return it->second;
    std::optional<std::string> text = ReadTextFile(cldr_dir / "main" / (locale + ".xml"));
    return own[locale] = text ? ParseCldrLocaleTexts(*text) : std::nullopt;
  };
  std::map<std::string, CldrLocaleTexts> resolved;
  for (const fs::directory_entry& entry : fs::directory_iterator(cldr_dir / "main")) {
    std::string locale = entry.path().stem().string();
    if (entry.path().extension() != ".xml" || locale == "root") continue;
    const std::optional<CldrLocaleTexts>& texts = own_texts(locale);
    if (!texts || texts->character_labels.empty()) continue;
    CldrLocaleTexts result = *texts;
    for (std::optional<std::string> parent = CldrParentLocale(locale, parents); parent && *parent != "root";
         parent = CldrParentLocale(*parent, parents)) {
      if (const std::optional<CldrLocaleTexts>& inherited = own_texts(*parent)) {
        InheritCldrLocaleTexts(result, *inherited);
      }
    }
    resolved.emplace(locale, std::move(result));
  }
  return resolved;
}

plist::Value InfoPlist(const char* identifier, const char* name, const char* package_type) {
  return plist::Dictionary{
      {"CFBundleIdentifier", identifier},
      {"CFBundleDevelopmentRegion", "en"},
      {"CFBundleName", name},
      {"CFBundlePackageType", package_type},
      {"CFBundleInfoDictionaryVersion", "6.0"},
      {"CFBundleShortVersionString", config::kVersion},
      {"CFBundleVersion", config::kVersion},
  };
}

void CopyLicense(const fs::path& license, const fs::path& resources) {
  std::error_code error;
  fs::copy_file(license, resources / kLicenseName, fs::copy_options::overwrite_existing, error);
  if (error) throw BuildError{"cannot copy " + license.string() + ": " + error.message()};
}

// Moves the bundle at `staged` to `target`, replacing what was there.
void Install(const fs::path& staged, const fs::path& target) {
  std::error_code error;
  MakeDirectories(target.parent_path());
  fs::remove_all(target, error);
  fs::rename(staged, target, error);
  if (error) throw BuildError{"cannot move " + staged.string() + " to " + target.string() + ": " + error.message()};
}

std::string Build(const ResourceBuildOptions& options) {
  const fs::path& ucd = options.unicode_dir;
  auto unihan_future = std::async(std::launch::async, [&] { return ReadUnihan(ucd); });

  UnicodeCharacterTable unicode = ParseUnicodeData(Require(ucd / "UnicodeData.txt"));
  auto aliases = ParseNameAliases(Require(ucd / "NameAliases.txt"));
  std::vector<CodePointRange> blocks = ParseCodePointRanges(Require(ucd / "Blocks.txt"));
  std::vector<CodePointRange> scripts = ParseCodePointRanges(Require(ucd / "Scripts.txt"));
  std::vector<EmojiTestEntry> emoji = ParseEmojiTest(Require(ucd / "emoji" / "emoji-test.txt"));
  std::optional<CldrAnnotations> english = ReadEnglishCldrAnnotations(options.cldr_dir);
  if (!english) throw BuildError{"cannot read the English annotations under " + options.cldr_dir.string()};
  std::map<std::string, CldrLocaleTexts> locales = ReadLocaleTexts(options.cldr_dir);
  std::vector<CategoryDefinition> categories = BuildCategories(unicode, blocks, scripts);
  std::vector<EmojiSubcategory> emoji_subcategories = BuildEmojiSubcategories(emoji);
  UnihanTable unihan = unihan_future.get();

  fs::path staging = options.output_root / ".resource-build";
  std::error_code ignored;
  fs::remove_all(staging, ignored);
  fs::path app = staging / "app";
  fs::path app_resources = app / "Contents" / "Resources";
  fs::path framework = staging / "framework";
  fs::path framework_resources = framework / "Resources";
  MakeDirectories(app_resources);
  MakeDirectories(framework_resources);

  // The two databases are independent; write the related one alongside the large one.
  auto related_future = std::async(std::launch::async, [&] {
    std::vector<std::string> related = BuildRelatedRows(unicode, unihan, emoji);
    if (!WriteRelatedDatabase(app_resources / "RelatedCharDB.sqlite3", related)) {
      throw BuildError{"cannot write RelatedCharDB.sqlite3"};
    }
    return related.size();
  });
  std::vector<CharacterRow> rows = BuildCharacterRows({unicode, aliases, unihan, *english, emoji});
  if (!WriteCharacterDatabase(app_resources / "CharacterDB.sqlite3", rows)) {
    throw BuildError{"cannot write CharacterDB.sqlite3"};
  }
  size_t related_count = related_future.get();

  WritePlist(app / "Contents" / "Info.plist", InfoPlist("com.vantorel.SorvendiIM", "Sorvendi", "APPL"));
  WritePlist(framework_resources / "Info.plist", InfoPlist("com.vantorel.Lumeris", "Lumeris", "FMWK"));
  WritePlist(app_resources / "HanLanguageInfo.plist", HanLanguageInfo());
  WritePlist(app_resources / "Categories.plist", CategoriesPlist(categories));
  WritePlist(app_resources / "Category-Emoji.plist", EmojiCategoryPlist(emoji_subcategories));
  for (const CategoryDefinition& category : categories) {
    WritePlist(app_resources / ("Category-" + category.name + ".plist"), CategoryPlist(category));
    std::string fallback = category.title.kind == TitleSource::Kind::kScriptName ? category.title.key : category.name;
    if (!WriteIconPdf(app_resources / ("CategoryImage-" + category.name + ".pdf"), category.icon_text, fallback)) {
      throw BuildError{"cannot draw the icon of " + category.name};
    }
  }
  if (!WriteIconPdf(app_resources / ("CategoryImage-" + std::string(kEmojiCategoryName) + ".pdf"), "☺", "Emoji")) {
    throw BuildError{"cannot draw the emoji icon"};
  }
  for (const EmojiSubcategory& sub : emoji_subcategories) {
    if (!WriteIconPdf(framework_resources / (sub.image_name + ".pdf"), sub.icon_text, sub.title_key)) {
      throw BuildError{"cannot draw the icon of " + sub.title_key};
    }
  }
  std::vector<LocalizedTables> tables = BuildStringsTables(categories, emoji_subcategories, locales);
  if (!WriteStringsTables(app_resources, tables)) throw BuildError{"cannot write the strings tables"};
  CopyLicense(options.license_file, app_resources);
  CopyLicense(options.license_file, framework_resources);

  Install(app, options.output_root / kApplicationBundlePath);
  Install(framework, options.output_root / kFrameworkBundlePath);
  fs::remove_all(staging, ignored);

  return std::to_string(rows.size()) + " characters, " + std::to_string(related_count) + " related groups, " +
         std::to_string(categories.size() + 1) + " categories, " + std::to_string(tables.size()) + " localizations";
}

}  // namespace

ResourceBuildResult BuildResources(const ResourceBuildOptions& options) {
  try {
    return {true, {}, Build(options)};
  } catch (const BuildError& error) {
    return {false, error.message, {}};
  } catch (const std::exception& error) {
    return {false, error.what(), {}};
  }
}

}  // namespace lumeris::resources
