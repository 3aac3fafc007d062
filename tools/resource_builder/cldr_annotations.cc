#include "resource_builder/cldr_annotations.h"

#include <pugixml.hpp>

#include "resource_builder/input_files.h"
#include "resource_builder/ucd_format.h"

namespace lumeris::resources {
namespace {

constexpr std::string_view kInheritanceMarker = "↑↑↑";

std::vector<std::string> SplitKeywords(std::string_view text) {
  std::vector<std::string> keywords;
  size_t pos = 0;
  while (pos <= text.size()) {
    size_t bar = text.find('|', pos);
    if (bar == std::string_view::npos) bar = text.size();
    std::string_view keyword = TrimAscii(text.substr(pos, bar - pos));
    if (!keyword.empty()) keywords.emplace_back(keyword);
    pos = bar + 1;
  }
  return keywords;
}

}  // namespace

bool AddCldrAnnotations(std::string_view xml_text, CldrAnnotations& annotations) {
  pugi::xml_document doc;
  if (!doc.load_buffer(xml_text.data(), xml_text.size())) return false;
  for (pugi::xml_node node : doc.child("ldml").child("annotations").children("annotation")) {
    std::string cp = node.attribute("cp").value();
    std::string_view text = TrimAscii(node.child_value());
    if (cp.empty() || text.empty() || text == kInheritanceMarker) continue;
    CldrAnnotation& entry = annotations[cp];
    if (std::string_view(node.attribute("type").value()) == "tts") {
      entry.name = std::string(text);
    } else {
      entry.keywords = SplitKeywords(text);
    }
  }
  return true;
}

std::optional<CldrAnnotations> ReadEnglishCldrAnnotations(const std::filesystem::path& cldr_dir) {
  CldrAnnotations english;
  for (const char* folder : {"annotations", "annotationsDerived"}) {
    std::optional<std::string> text = ReadTextFile(cldr_dir / folder / "en.xml");
    if (!text || !AddCldrAnnotations(*text, english)) return std::nullopt;
  }
  return english;
}

}  // namespace lumeris::resources
