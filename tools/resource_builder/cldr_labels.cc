#include "resource_builder/cldr_labels.h"

#include <pugixml.hpp>

#include "resource_builder/ucd_format.h"

namespace lumeris::resources {
namespace {

constexpr std::string_view kInheritanceMarker = "↑↑↑";

void CollectTexts(pugi::xml_node parent, const char* element,
                  std::map<std::string, std::string, std::less<>>& out) {
  for (pugi::xml_node node : parent.children(element)) {
    if (node.attribute("alt") || node.attribute("count")) continue;
    std::string type = node.attribute("type").value();
    std::string_view text = TrimAscii(node.child_value());
    if (type.empty() || text.empty() || text == kInheritanceMarker) continue;
    out.emplace(std::move(type), std::string(text));
  }
}

}  // namespace

std::optional<CldrLocaleTexts> ParseCldrLocaleTexts(std::string_view xml_text) {
  pugi::xml_document doc;
  if (!doc.load_buffer(xml_text.data(), xml_text.size())) return std::nullopt;
  pugi::xml_node ldml = doc.child("ldml");
  CldrLocaleTexts texts;
  CollectTexts(ldml.child("characterLabels"), "characterLabel", texts.character_labels);
  CollectTexts(ldml.child("characterLabels"), "characterLabelPattern", texts.label_patterns);
  CollectTexts(ldml.child("localeDisplayNames").child("scripts"), "script", texts.script_names);
  return texts;
}

std::map<std::string, std::string, std::less<>> ParseCldrParentLocales(std::string_view xml_text) {
  std::map<std::string, std::string, std::less<>> parents;
  pugi::xml_document doc;
  if (!doc.load_buffer(xml_text.data(), xml_text.size())) return parents;
  for (pugi::xml_node group : doc.child("supplementalData").child("parentLocales").children("parentLocale")) {
    if (group.attribute("component")) continue;  // parents for one component only
    std::string parent = group.attribute("parent").value();
    std::string_view locales = group.attribute("locales").value();
    size_t pos = 0;
    while (pos < locales.size()) {
      size_t space = locales.find(' ', pos);
      if (space == std::string_view::npos) space = locales.size();
      if (space > pos) parents.emplace(std::string(locales.substr(pos, space - pos)), parent);
      pos = space + 1;
    }
  }
  return parents;
}

std::optional<std::string> CldrParentLocale(
    std::string_view locale, const std::map<std::string, std::string, std::less<>>& explicit_parents) {
  if (locale == "root" || locale.empty()) return std::nullopt;
  if (auto it = explicit_parents.find(locale); it != explicit_parents.end()) return it->second;
  size_t underscore = locale.rfind('_');
  if (underscore == std::string_view::npos) return std::string("root");
  return std::string(locale.substr(0, underscore));
}

void InheritCldrLocaleTexts(CldrLocaleTexts& child, const CldrLocaleTexts& parent) {
  child.character_labels.insert(parent.character_labels.begin(), parent.character_labels.end());
  child.script_names.insert(parent.script_names.begin(), parent.script_names.end());
  child.label_patterns.insert(parent.label_patterns.begin(), parent.label_patterns.end());
}

std::string LocalizationNameOfCldrLocale(std::string_view locale) {
  std::string name(locale);
  for (char& c : name) {
    if (c == '_') c = '-';
  }
  return name;
}

}  // namespace lumeris::resources
