// CLDR annotations: the short name ("tts") and keywords of emoji and symbols in one language, from
// common/annotations/<lang>.xml and common/annotationsDerived/<lang>.xml.
//
//   CldrAnnotations en;
//   AddCldrAnnotations(xml_text, en);
//   en.at("😀").name == "grinning face"; en.at("😀").keywords == {"face", "grin", "grinning face"}
//
// Keys are the annotated text as CLDR writes it (UTF-8, usually without U+FE0F).
// Thread-safety: plain values; filling is not thread-safe, reading a filled map is.
#pragma once

#include <filesystem>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace lumeris::resources {

struct CldrAnnotation {
  std::string name;                   // the "tts" text; may be empty
  std::vector<std::string> keywords;  // the "|"-separated keywords, trimmed, in CLDR order
};

using CldrAnnotations = std::map<std::string, CldrAnnotation, std::less<>>;

// Adds the annotations of one CLDR annotation file; returns false when the text is not XML.
// Values that only mark inheritance ("↑↑↑") are skipped; a later file's entries replace earlier ones.
bool AddCldrAnnotations(std::string_view xml_text, CldrAnnotations& annotations);

// The English annotations under a CLDR "common" folder: annotations/en.xml, then
// annotationsDerived/en.xml. std::nullopt when either file cannot be read or parsed.
std::optional<CldrAnnotations> ReadEnglishCldrAnnotations(const std::filesystem::path& cldr_dir);

}  // namespace lumeris::resources
