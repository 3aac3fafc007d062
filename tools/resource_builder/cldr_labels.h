// CLDR display texts for the category titles: the character labels ("arrows" -> "arrow") and the
// script names ("Latn" -> "Latin") of one locale of common/main, resolved through CLDR's
// locale inheritance (en_AU -> en_001 -> en; the parentLocales of supplementalData.xml).
//
//   CldrLocaleTexts de = ParseCldrLocaleTexts(de_xml);
//   de.character_labels.at("currency_symbols") == "Währungssymbol"
//
// Thread-safety: plain values; pure functions.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>

namespace lumeris::resources {

struct CldrLocaleTexts {
  std::map<std::string, std::string, std::less<>> character_labels;  // label type -> text
  std::map<std::string, std::string, std::less<>> script_names;      // script code -> name
  std::map<std::string, std::string, std::less<>> label_patterns;    // "enclosed" -> "{0} — enclosed"
};

// The texts that one common/main/<locale>.xml file itself holds (no inheritance). Inheritance
// markers and "alt" forms are skipped. nullopt when the text is not XML.
std::optional<CldrLocaleTexts> ParseCldrLocaleTexts(std::string_view xml_text);

// CLDR's explicit parent locales, child -> parent ("en_AU" -> "en_001"), from supplementalData.xml.
std::map<std::string, std::string, std::less<>> ParseCldrParentLocales(std::string_view xml_text);

// The parent of a CLDR locale id: the explicit parent, else the id without its last "_" subtag,
// else "root"; nullopt for "root" itself.
std::optional<std::string> CldrParentLocale(
    std::string_view locale, const std::map<std::string, std::string, std::less<>>& explicit_parents);

// Fills every entry missing from `child` with the one of `parent`.
void InheritCldrLocaleTexts(CldrLocaleTexts& child, const CldrLocaleTexts& parent);

// The localization folder name of a CLDR locale id: "pt_PT" -> "pt-PT", "zh_Hant" -> "zh-Hant".
std::string LocalizationNameOfCldrLocale(std::string_view locale);

}  // namespace lumeris::resources
