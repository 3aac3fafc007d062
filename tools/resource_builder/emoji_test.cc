#include "resource_builder/emoji_test.h"

#include <optional>

#include "resource_builder/ucd_format.h"

namespace lumeris::resources {
namespace {

std::optional<EmojiStatus> ParseStatus(std::string_view text) {
  if (text == "fully-qualified") return EmojiStatus::kFullyQualified;
  if (text == "minimally-qualified") return EmojiStatus::kMinimallyQualified;
  if (text == "unqualified") return EmojiStatus::kUnqualified;
  if (text == "component") return EmojiStatus::kComponent;
  return std::nullopt;
}

// The name after the emoji and its version in the comment: "👍🏽 E1.0 thumbs up" -> "thumbs up".
std::string NameFromComment(std::string_view comment) {
  size_t version = comment.find(" E");
  while (version != std::string_view::npos) {
    size_t digit = version + 2;
    if (digit < comment.size() && comment[digit] >= '0' && comment[digit] <= '9') {
      size_t space = comment.find(' ', digit);
      return space == std::string_view::npos ? std::string() : std::string(TrimAscii(comment.substr(space)));
    }
    version = comment.find(" E", version + 1);
  }
  return {};
}

}  // namespace

std::vector<EmojiTestEntry> ParseEmojiTest(std::string_view text) {
  std::vector<EmojiTestEntry> entries;
  std::string group, subgroup;
  ForEachLine(text, [&](std::string_view raw) {
    std::string_view line = TrimAscii(raw);
    if (line.starts_with("# group:")) {
      group = std::string(TrimAscii(line.substr(8)));
      return;
    }
    if (line.starts_with("# subgroup:")) {
      subgroup = std::string(TrimAscii(line.substr(11)));
      return;
    }
    if (line.empty() || line.starts_with("#")) return;
    size_t semi = line.find(';');
    size_t hash = line.find('#');
    if (semi == std::string_view::npos || hash == std::string_view::npos || hash < semi) return;
    std::optional<std::u32string> sequence = ParseCodePointSequence(TrimAscii(line.substr(0, semi)));
    std::optional<EmojiStatus> status = ParseStatus(TrimAscii(line.substr(semi + 1, hash - semi - 1)));
    if (!sequence || !status) return;
    entries.push_back({std::move(*sequence), *status, group, subgroup, NameFromComment(line.substr(hash + 1))});
  });
  return entries;
}

bool HasSkinTone(std::u32string_view sequence) {
  for (char32_t cp : sequence) {
    if (cp >= 0x1F3FB && cp <= 0x1F3FF) return true;
  }
  return false;
}

}  // namespace lumeris::resources
