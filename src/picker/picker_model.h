// PickerModel: what the picker shows, as plain data: the sections of its sidebar (Recents and
// Favourites first, then every category, the emoji category as one section per sub-category),
// the characters of each, the favourites and the skin-tone history, built from the service's
// replies.
//
//   model.SetUserData(read_recents_favorites_reply);
//   model.SetCategories(names, read_categorydata_result);
//   for (const Section& s : model.sections()) ...
//   std::string shown = model.Displayed("👍");   // with the remembered skin tone
//
// Thread-safety: not thread-safe; one thread (the picker's main thread) owns a model.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "service/message_value.h"
#include "text/replacement_dictionary.h"

namespace lumeris::picker {

inline constexpr std::string_view kRecentsSection = "Recents";
inline constexpr std::string_view kFavoritesSection = "Favorites";

struct Section {
  std::string id;     // "Recents", "Favorites", a category name, or "Emoji-<n>" (n from 1)
  std::string title;  // localized
  MessageValue::Bytes icon;  // PDF or TIFF bytes; empty for none
  std::vector<std::string> characters;
  // The characters still have to be checked for a glyph before they are shown.
  bool check_glyph = false;
};

class PickerModel {
 public:
  PickerModel();

  // Takes recents, favourites and the skin-tone history from a "read_recents_favorites" reply.
  void SetUserData(const MessageValue& reply);
  // Adds a section per entry of a "read_categorydata" `result` (entries pair with `names`),
  // after Recents and Favourites, replacing earlier categories.
  void SetCategories(const std::vector<std::string>& names, const MessageValue* result);
  // The characters of section `index` after the glyph check kept `characters`.
  void SetCheckedCharacters(std::size_t index, std::vector<std::string> characters);

  const std::vector<Section>& sections() const { return sections_; }
  std::optional<std::size_t> SectionIndex(std::string_view id) const;

  // `character` as shown: with the skin tone last chosen for it.
  std::string Displayed(std::string_view character) const;
  // The characters of section `index`, as shown.
  std::vector<std::string> DisplayedCharacters(std::size_t index) const;

  bool IsFavorite(std::string_view character) const;
  // The favourites' entity IDs after adding `character` (at the end) or removing it.
  std::vector<std::string> FavoriteIDsToggling(std::string_view character) const;

  // Notes a skin-tone choice locally until the service's next reply says the same.
  void RememberSkinTone(std::string_view variant);

 private:
  std::vector<Section> sections_;
  std::vector<std::string> favorite_ids_;  // parallel to the Favorites section's characters
  ReplacementDictionary skin_tones_;
};

}  // namespace lumeris::picker
