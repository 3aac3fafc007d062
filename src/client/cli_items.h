// Items of the recents, favourites and skin-tone commands: turning what a person types (a
// character, or an entity ID pasted from elsewhere) into the entity ID the service stores, and
// entity IDs back into characters for printing.
//
//   EntityIDForItem("A", {})                     -> com.vantorel.lmk:{"char":"A"}
//   EntityIDForItem("👍🏽", {.emoji_font = true})   -> com.vantorel.lmk:{"char":"👍🏽","font":"VantorelColorEmoji"}
//   EntityIDForItem("com.vantorel.lmk:{...}", {}) -> unchanged
//
// Thread-safety: pure functions (apart from the log line the entity reader writes for damaged
// JSON). Results are owned by the caller.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace lumeris::cli {

struct ItemOptions {
  // Record the character as picked in the colour emoji font.
  bool emoji_font = false;
  // Record a font and glyph (the entity writer keeps a font other than the emoji font only
  // together with a glyph).
  std::optional<std::string> font;
  std::optional<std::uint32_t> glyph;
};

// True when `text` begins with the current or the old entity-ID prefix.
bool IsEntityID(std::string_view text);

// Why the service could not use `item` as typed: empty, or an entity ID whose current-form JSON
// is not an object; std::nullopt when it is usable.
std::optional<std::string> ItemProblem(std::string_view item);

// True when `character` is an emoji whose skin tone the service remembers (a skin-tone base,
// alone or with one modifier).
bool TakesSkinTone(std::string_view character);

// `item` as an entity ID: an entity ID is returned as it is; anything else is taken as the
// character and written in the current form with the font and glyph of `options` (--font wins
// over --emoji-font).
std::string EntityIDForItem(std::string_view item, const ItemOptions& options);

// What an entity ID says, for printing. Members the ID does not hold are absent; `opaque` is
// true when the string has neither prefix (it is then kept as `character` unchanged).
struct ItemDescription {
  std::optional<std::string> character;
  std::optional<std::string> font;
  std::optional<std::uint32_t> glyph;
  bool opaque = false;
};
ItemDescription DescribeEntityID(std::string_view entity_id);

// The scalar values of UTF-8 text as "U+XXXX" (at least four hex digits) separated by spaces;
// an ill-formed sequence shows as U+FFFD.
std::string CodePoints(std::string_view utf8);

}  // namespace lumeris::cli
