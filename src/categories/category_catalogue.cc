#include "categories/category_catalogue.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <algorithm>
#include <optional>
#include <utility>

#include "categories/localization_lookup.h"
#include "categories/system_bundles.h"
#include "platform/bundle_localization.h"
#include "platform/preferred_languages.h"
#include "platform/property_list_io.h"
#include "platform/system_root.h"

namespace lumeris {
namespace {

constexpr std::string_view kSymbolsGroup = "CategoryGroup-Symbols";
constexpr std::string_view kEmojiStringsTable = "Emoji_Category";
// What a "%@" format writes for a missing object.
constexpr std::string_view kMissingObjectText = "(null)";

// The property list `name`.plist of `bundle` as a dictionary: for `localization` when one is
// given, else by the plain lookup. std::nullopt when it is missing, unreadable or not a dictionary.
std::optional<plist::Dictionary> LoadDictionaryPlist(const Bundle* bundle, std::string_view name,
                                                     std::optional<std::string_view> localization) {
  if (bundle == nullptr) return std::nullopt;
  const auto path = bundle->PathForResource(name, "plist", {}, localization);
  if (!path) return std::nullopt;
  std::optional<plist::Value> value = plist::ReadPropertyListFile(*path);
  if (!value || value->AsDictionary() == nullptr) return std::nullopt;
  return std::move(*value->AsDictionary());
}

const std::string* FindString(const plist::Value& dictionary, std::string_view key) {
  const plist::Value* value = dictionary.Find(key);
  return value ? value->AsString() : nullptr;
}

// The whole file as bytes, read straight into the buffer the reply keeps; empty when it cannot
// be read.
MessageValue::Bytes ReadFileBytes(const std::filesystem::path& path) {
  const int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (fd < 0) return {};
  MessageValue::Bytes bytes;
  struct stat status {};
  if (fstat(fd, &status) == 0 && status.st_size > 0) {
    bytes.resize(static_cast<std::size_t>(status.st_size));
    std::size_t done = 0;
    while (done < bytes.size()) {
      const ssize_t n = ::read(fd, bytes.data() + done, bytes.size() - done);
      if (n < 0 && errno == EINTR) continue;
      if (n <= 0) break;
      done += static_cast<std::size_t>(n);
    }
    // A file that shrank meanwhile, or an error: nothing rather than a part.
    if (done != bytes.size()) bytes.clear();
  }
  ::close(fd);
  return bytes;
}

// A bundle's plain resource lookup for one request, or none for a missing bundle. The folders are
// listed once: most icons are not found in the first place tried, and each miss would otherwise
// cost a stat per folder.
class PlainLookup {
 public:
  // `languages`: the user's preferred languages.
  PlainLookup(const Bundle* bundle, const std::vector<std::string>& languages) {
    if (bundle != nullptr) {
      lookup_ = bundle->ListPlainResources(PreferredLocalizationsFromArray(bundle->localizations(), languages));
    }
  }

  std::optional<std::filesystem::path> PathForResource(std::string_view name, std::string_view type) const {
    return lookup_ ? lookup_->PathForResource(name, type) : std::nullopt;
  }

 private:
  std::optional<Bundle::PlainResourceLookup> lookup_;
};

// The first file found for `name` trying, for "tiff" and then "pdf", each bundle in order;
// its bytes, or zero bytes when there is none.
MessageValue IconData(std::string_view name, std::initializer_list<const PlainLookup*> bundles) {
  for (std::string_view type : {"tiff", "pdf"}) {
    for (const PlainLookup* bundle : bundles) {
      if (const auto path = bundle->PathForResource(name, type)) {
        return MessageValue::Data(ReadFileBytes(*path));
      }
    }
  }
  return MessageValue::Data({});
}

// The "Categories" of the first "CategoryGroup-Symbols" group of the "Categories" plist (walked
// in order, stopping there); std::nullopt when there is none.
std::optional<plist::Value> SymbolsGroupCategories(const Bundle* application, std::string_view localization) {
  const std::optional<plist::Dictionary> categories =
      LoadDictionaryPlist(application, "Categories", localization);
  if (!categories) return std::nullopt;
  const auto groups = categories->find("VTAvailableCategories");
  if (groups == categories->end() || groups->second.AsArray() == nullptr) return std::nullopt;
  for (const plist::Value& group : *groups->second.AsArray()) {
    const std::string* name = FindString(group, "Group");
    if (name != nullptr && *name == kSymbolsGroup) {
      const plist::Value* symbols = group.Find("Categories");
      return symbols ? std::optional<plist::Value>(*symbols) : std::nullopt;
    }
  }
  return std::nullopt;
}

// The "Data" array of the emoji category: one sub-entry per "EmojiDataArray" dictionary of
// "Category-Emoji" (a plain lookup, no localization).
MessageValue EmojiSubcategories(const Bundle* application, const PlainLookup& application_lookup,
                                const PlainLookup& framework_lookup, const std::string& localization) {
  MessageValue subcategories = MessageValue::MakeArray();
  const std::optional<plist::Dictionary> emoji =
      LoadDictionaryPlist(application, "Category-Emoji", std::nullopt);
  if (!emoji) return subcategories;
  const auto entries = emoji->find("EmojiDataArray");
  if (entries == emoji->end() || entries->second.AsArray() == nullptr) return subcategories;
  for (const plist::Value& subcategory : *entries->second.AsArray()) {
    if (subcategory.AsDictionary() == nullptr) continue;
    MessageValue entry = MessageValue::MakeDictionary();

    // Without a "VTDataTitle" there is nothing to look up; the title is then empty.
    std::string title;
    if (const std::string* key = FindString(subcategory, "VTDataTitle")) {
      title = LocalizedStringForLanguage(*key, application, localization, kEmojiStringsTable, *key)
                  .value_or(*key);
    }
    entry.Set("TitleText", MessageValue::String(std::move(title)));

    const std::string* image = FindString(subcategory, "VTCategoryImage");
    entry.Set("TitleImage",
              image ? IconData(*image, {&framework_lookup, &application_lookup}) : MessageValue::Data({}));

    const plist::Value* category_data = subcategory.Find("VTCategoryData");
    const std::string* data = category_data ? FindString(*category_data, "Data") : nullptr;
    entry.Set("Data", MessageValue::String(std::string(kEmojiDataPrefix) +
                                           std::string(data ? std::string_view(*data) : kMissingObjectText)));
    subcategories.Append(std::move(entry));
  }
  return subcategories;
}

// Sets "Data" (and "CheckGlyph") of an ordinary category's entry from its "Category-<name>" plist.
void SetOrdinaryCategoryData(const Bundle* application, const std::string& name,
                             const std::string& localization, MessageValue& entry) {
  const std::optional<plist::Dictionary> plist =
      LoadDictionaryPlist(application, "Category-" + name, localization);
  const plist::Value* data = nullptr;
  if (plist) {
    if (const auto it = plist->find("VTCategoryData"); it != plist->end()) data = &it->second;
  }
  // The segments: "DataArray" when it is there, else the data dictionary itself (which may be
  // missing: a one-element list holding nothing).
  const plist::Array* segments = nullptr;
  if (data != nullptr) {
    if (const plist::Value* array = data->Find("DataArray")) segments = array->AsArray();
  }

  std::optional<std::string> joined;
  bool skips_null_glyphs = false;
  auto walk = [&](const plist::Value* segment) {
    const std::string* segment_data = segment ? FindString(*segment, "Data") : nullptr;
    if (!joined) {
      if (segment_data) joined = *segment_data;
    } else if (segment_data) {
      *joined += ',';
      *joined += *segment_data;
    }
    // Only the presence of the key counts, whatever it holds.
    if (!skips_null_glyphs && segment != nullptr && segment->Find("VTSkipNullGlyphs") != nullptr) {
      skips_null_glyphs = true;
    }
  };
  if (segments != nullptr) {
    for (const plist::Value& segment : *segments) walk(&segment);
  } else {
    walk(data);
  }

  if (joined && !joined->empty()) {
    entry.Set("Data", MessageValue::String(std::move(*joined)));
    if (skips_null_glyphs) entry.Set("CheckGlyph", MessageValue::Bool(true));
  }
}

// The catalogue over the given bundles (either may be null: nothing is found in it).
MessageValue CreateCategoryDataArrayFromBundles(const StringList& names, const Bundle* application,
                                                const Bundle* framework) {
  MessageValue result = MessageValue::MakeArray();
  // The user's languages, read once per request.
  const std::vector<std::string> languages = PreferredLanguages();
  const std::string localization = PreferredLocalizationOfBundle(application, languages);
  // Read at every request, and deliberately not applied: the entries follow the request alone,
  // neither filtered nor reordered by what the plist offers.
  [[maybe_unused]] const std::optional<plist::Value> offered = SymbolsGroupCategories(application, localization);
  if (!names) return result;
  const PlainLookup application_lookup(application, languages);
  const PlainLookup framework_lookup(framework, languages);
  for (const std::string& name : *names) {
    MessageValue entry = MessageValue::MakeDictionary();
    if (name == kEmojiCategoryName) {
      entry.Set("Data", EmojiSubcategories(application, application_lookup, framework_lookup, localization));
    } else {
      SetOrdinaryCategoryData(application, name, localization, entry);
    }
    entry.Set("TitleText", MessageValue::String(
                               LocalizedStringForLanguage("CategoryName-" + name, application,
                                                          localization, std::nullopt, name)
                                   .value_or(name)));
    entry.Set("TitleImage", IconData("CategoryImage-" + name, {&application_lookup}));
    result.Append(std::move(entry));
  }
  return result;
}

}  // namespace

std::vector<CategoryGroup> ReadAvailableCategories(const Bundle& application,
                                                   std::string_view localization) {
  std::vector<CategoryGroup> result;
  const std::optional<plist::Dictionary> categories =
      LoadDictionaryPlist(&application, "Categories", localization);
  if (!categories) return result;
  const auto groups = categories->find("VTAvailableCategories");
  if (groups == categories->end() || groups->second.AsArray() == nullptr) return result;
  for (const plist::Value& group : *groups->second.AsArray()) {
    if (group.AsDictionary() == nullptr) continue;
    CategoryGroup& entry = result.emplace_back();
    if (const std::string* name = FindString(group, "Group")) entry.group = *name;
    const plist::Value* names = group.Find("Categories");
    if (names == nullptr || names->AsArray() == nullptr) continue;
    for (const plist::Value& name : *names->AsArray()) {
      if (const std::string* text = name.AsString()) entry.categories.push_back(*text);
    }
  }
  return result;
}

MessageValue CreateXPCCategoryDataArray(const StringList& names) {
  const std::optional<Bundle> application = OpenApplicationBundle();
  // Only emoji sub-category icons come from the framework bundle.
  const bool wants_emoji =
      names && std::find(names->begin(), names->end(), kEmojiCategoryName) != names->end();
  const std::optional<Bundle> framework =
      wants_emoji ? Bundle::Open(SystemPath(kFrameworkBundlePath)) : std::nullopt;
  return CreateCategoryDataArrayFromBundles(names, application ? &*application : nullptr,
                                            framework ? &*framework : nullptr);
}

}  // namespace lumeris
