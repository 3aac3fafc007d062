// The emoji test file (emoji/emoji-test.txt): every emoji in its recommended order, with group,
// subgroup, qualification status and name.
//
//   "1F44D 1F3FD ; fully-qualified # 👍🏽 E1.0 thumbs up: medium skin tone"
//   -> {sequence U"\U0001F44D\U0001F3FD", status kFullyQualified, group "People & Body",
//       subgroup "hand-fingers-closed", name "thumbs up: medium skin tone"}
//
// Thread-safety: pure function; the result belongs to the caller.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace lumeris::resources {

enum class EmojiStatus { kComponent, kFullyQualified, kMinimallyQualified, kUnqualified };

struct EmojiTestEntry {
  std::u32string sequence;
  EmojiStatus status = EmojiStatus::kFullyQualified;
  std::string group;
  std::string subgroup;
  std::string name;
};

// Entries in file order; lines that do not parse are skipped.
std::vector<EmojiTestEntry> ParseEmojiTest(std::string_view text);

// True when `sequence` holds one of the five skin-tone modifiers U+1F3FB..U+1F3FF.
bool HasSkinTone(std::u32string_view sequence);

}  // namespace lumeris::resources
