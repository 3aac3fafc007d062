#include "resource_builder/strings_tables.h"

#include <unicode/brkiter.h>
#include <unicode/locid.h>
#include <unicode/unistr.h>

#include <fstream>

#include "platform/property_list_io.h"

namespace lumeris::resources {
namespace {

std::string CapitalizeFirst(const std::string& text, const std::string& locale) {
  icu::UnicodeString unicode = icu::UnicodeString::fromUTF8(text);
  unicode.toTitle(nullptr, icu::Locale(locale.c_str()), U_TITLECASE_SENTENCES | U_TITLECASE_NO_LOWERCASE);
  std::string out;
  unicode.toUTF8String(out);
  return out;
}

const std::string* FindText(const std::map<std::string, std::string, std::less<>>& texts, const std::string& key) {
  auto it = texts.find(key);
  return it == texts.end() ? nullptr : &it->second;
}

bool WriteFile(const std::filesystem::path& path, const std::vector<std::uint8_t>& bytes) {
  std::ofstream out(path, std::ios::binary | std::ios::trunc);
  out.write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
  return static_cast<bool>(out);
}

}  // namespace

std::optional<std::string> ResolveTitle(const TitleSource& source, const CldrLocaleTexts& texts,
                                        const std::string& locale) {
  const std::string* text = nullptr;
  std::string composed;
  switch (source.kind) {
    case TitleSource::Kind::kCharacterLabel:
      text = FindText(texts.character_labels, source.key);
      break;
    case TitleSource::Kind::kScriptName:
      text = FindText(texts.script_names, source.key);
      break;
    case TitleSource::Kind::kLabelPattern: {
      const std::string* pattern = FindText(texts.label_patterns, source.pattern);
      const std::string* label = FindText(texts.character_labels, source.key);
      size_t slot = pattern ? pattern->find("{0}") : std::string::npos;
      if (label == nullptr || slot == std::string::npos) return std::nullopt;
      composed = *pattern;
      composed.replace(slot, 3, *label);
      text = &composed;
      break;
    }
  }
  if (text == nullptr) return std::nullopt;
  return CapitalizeFirst(*text, locale);
}

std::vector<LocalizedTables> BuildStringsTables(const std::vector<CategoryDefinition>& categories,
                                                const std::vector<EmojiSubcategory>& emoji,
                                                const std::map<std::string, CldrLocaleTexts>& locales) {
  std::vector<LocalizedTables> tables;
  for (const auto& [locale, texts] : locales) {
    LocalizedTables table{LocalizationNameOfCldrLocale(locale), {}, {}};
    for (const CategoryDefinition& category : categories) {
      if (std::optional<std::string> title = ResolveTitle(category.title, texts, locale)) {
        table.localizable.emplace("CategoryName-" + category.name, *title);
      }
    }
    TitleSource emoji_title{TitleSource::Kind::kCharacterLabel, "emoji", {}};
    if (std::optional<std::string> title = ResolveTitle(emoji_title, texts, locale)) {
      table.localizable.emplace("CategoryName-" + std::string(kEmojiCategoryName), *title);
    }
    for (const EmojiSubcategory& sub : emoji) {
      TitleSource source{TitleSource::Kind::kCharacterLabel, sub.label_type, {}};
      if (std::optional<std::string> title = ResolveTitle(source, texts, locale)) {
        table.emoji_category.emplace(sub.title_key, *title);
      }
    }
    tables.push_back(std::move(table));
  }
  return tables;
}

bool WriteStringsTables(const std::filesystem::path& resources, const std::vector<LocalizedTables>& tables) {
  for (const LocalizedTables& table : tables) {
    std::filesystem::path folder = resources / (table.localization + ".lproj");
    std::error_code error;
    std::filesystem::create_directories(folder, error);
    if (error) return false;
    if (!WriteFile(folder / "Localizable.strings", plist::SerializeBinaryPropertyList(table.localizable)) ||
        !WriteFile(folder / "Emoji_Category.strings", plist::SerializeBinaryPropertyList(table.emoji_category))) {
      return false;
    }
  }
  return true;
}

}  // namespace lumeris::resources
