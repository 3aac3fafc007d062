#include "picker/picker_model.h"

#include <algorithm>

#include "categories/category_catalogue.h"
#include "categories/system_bundles.h"
#include "client/commands/category_command.h"
#include "picker/character_items.h"
#include "text/utf8.h"

namespace lumeris::picker {
namespace {

std::string Utf8(const std::u32string& text) {
  std::string out;
  icu::UnicodeString::fromUTF32(reinterpret_cast<const UChar32*>(text.data()), static_cast<int32_t>(text.size()))
      .toUTF8String(out);
  return out;
}

Section SectionOf(std::string id, const MessageValue& entry) {
  Section section;
  section.id = std::move(id);
  const std::string* title = entry.GetString("TitleText");
  section.title = title && !title->empty() ? *title : section.id;
  if (const MessageValue::Bytes* icon = entry.GetData("TitleImage")) section.icon = *icon;
  if (const std::string* data = entry.GetString("Data")) {
    for (const std::u32string& c : cli::CategoryCharacters(*data).value_or(std::vector<std::u32string>{})) {
      section.characters.push_back(Utf8(c));
    }
  }
  const MessageValue* check = entry.Find("CheckGlyph");
  section.check_glyph = check && check->AsBool() && *check->AsBool();
  return section;
}

}  // namespace

PickerModel::PickerModel() {
  sections_.push_back({std::string(kRecentsSection), MyFrameworkLocalizedString("Recently Used"), {}, {}, false});
  sections_.push_back({std::string(kFavoritesSection), MyFrameworkLocalizedString("Favorites"), {}, {}, false});
}

void PickerModel::SetUserData(const MessageValue& reply) {
  sections_[0].characters = CharactersOfIDArray(reply.Find("recents"));
  sections_[1].characters.clear();
  favorite_ids_.clear();
  const MessageValue* favorites = reply.Find("favorites");
  for (const MessageValue& id : favorites && favorites->AsArray() ? *favorites->AsArray() : MessageValue::Array{}) {
    const std::optional<std::string> character = id.AsString() ? CharacterOfEntityID(*id.AsString()) : std::nullopt;
    if (!character) continue;
    sections_[1].characters.push_back(*character);
    favorite_ids_.push_back(*id.AsString());
  }
  skin_tones_ = ParseSkinToneHistory(reply.GetData("skintones"));
}

void PickerModel::SetCategories(const std::vector<std::string>& names, const MessageValue* result) {
  sections_.resize(2);
  const MessageValue::Array* entries = result ? result->AsArray() : nullptr;
  for (std::size_t i = 0; entries && i < entries->size() && i < names.size(); ++i) {
    const MessageValue* data = (*entries)[i].Find("Data");
    if (const MessageValue::Array* subcategories = data ? data->AsArray() : nullptr) {
      for (std::size_t k = 0; k < subcategories->size(); ++k) {
        sections_.push_back(SectionOf(names[i] + "-" + std::to_string(k + 1), (*subcategories)[k]));
      }
    } else {
      sections_.push_back(SectionOf(names[i], (*entries)[i]));
    }
  }
  std::erase_if(sections_, [](const Section& s) {
    return s.characters.empty() && s.id != kRecentsSection && s.id != kFavoritesSection;
  });
}

void PickerModel::SetCheckedCharacters(std::size_t index, std::vector<std::string> characters) {
  if (index >= sections_.size()) return;
  sections_[index].characters = std::move(characters);
  sections_[index].check_glyph = false;
}

std::optional<std::size_t> PickerModel::SectionIndex(std::string_view id) const {
  for (std::size_t i = 0; i < sections_.size(); ++i) {
    if (sections_[i].id == id) return i;
  }
  return std::nullopt;
}

std::string PickerModel::Displayed(std::string_view character) const {
  return WithRememberedSkinTone(character, skin_tones_);
}

std::vector<std::string> PickerModel::DisplayedCharacters(std::size_t index) const {
  std::vector<std::string> shown;
  if (index >= sections_.size()) return shown;
  // Recents and favourites show exactly what was picked.
  if (index < 2) return sections_[index].characters;
  shown.reserve(sections_[index].characters.size());
  for (const std::string& c : sections_[index].characters) shown.push_back(Displayed(c));
  return shown;
}

bool PickerModel::IsFavorite(std::string_view character) const {
  const std::vector<std::string>& favorites = sections_[1].characters;
  return std::find(favorites.begin(), favorites.end(), character) != favorites.end();
}

std::vector<std::string> PickerModel::FavoriteIDsToggling(std::string_view character) const {
  std::vector<std::string> ids;
  bool removed = false;
  for (std::size_t i = 0; i < favorite_ids_.size(); ++i) {
    if (sections_[1].characters[i] == character) {
      removed = true;
    } else {
      ids.push_back(favorite_ids_[i]);
    }
  }
  if (!removed) ids.push_back(EntityIDForCharacter(character));
  return ids;
}

void PickerModel::RememberSkinTone(std::string_view variant) {
  UpdateReplacementDictionary(DecodeUtf8Lenient(variant), skin_tones_);
}

}  // namespace lumeris::picker
