#include "store/skin_tones.h"

#include <utility>

#include "entity/entity_id.h"
#include "platform/preferences.h"
#include "store/change_notification.h"
#include "store/store_keys.h"
#include "text/emoji.h"
#include "text/replacement_dictionary.h"
#include "text/utf8.h"

namespace lumeris {

namespace {

constexpr std::string_view kHorseRacing = "\xF0\x9F\x8F\x87";

// The history with `character` recorded. String members go through the replacement dictionary;
// members of any other type (never written by the store) are carried over untouched.
plist::Dictionary HistoryWithChoice(plist::Dictionary history, const icu::UnicodeString& character) {
  ReplacementDictionary replacements;
  for (auto it = history.begin(); it != history.end();) {
    if (const std::string* value = it->second.AsString()) {
      replacements.emplace(DecodeUtf8Lenient(it->first), DecodeUtf8Lenient(*value));
      it = history.erase(it);
    } else {
      ++it;
    }
  }
  UpdateReplacementDictionary(character, replacements);
  for (const auto& [key, value] : replacements) {
    history.insert_or_assign(EncodeUtf8Lenient(key), plist::Value(EncodeUtf8Lenient(value)));
  }
  return history;
}

}  // namespace

std::optional<plist::Dictionary> CopySkinToneHistory(std::string_view identifier) {
  const std::string key = StoreKey(kSkinTonesKeyPrefix, identifier);
  CFPreferencesAppSynchronize(kStoreDomain);
  std::optional<plist::Value> stored = CFPreferencesCopyAppValue(key, kStoreDomain);
  if (!stored) return std::nullopt;
  plist::Dictionary* history = stored->AsDictionary();
  if (history == nullptr) return std::nullopt;
  if (auto horse_racing = history->find(kHorseRacing); horse_racing != history->end()) {
    history->erase(horse_racing);
  }
  return std::move(*history);
}

bool SetLastSkinToneSelection(const std::optional<std::string>& item, std::string_view identifier) {
  std::optional<plist::Dictionary> new_history;
  if (item && !item->empty()) {
    std::optional<icu::UnicodeString> character;
    std::optional<icu::UnicodeString> font;
    if (!CharacterInfoFromEntityID(DecodeUtf8Lenient(*item), nullptr, &character, &font)) return false;
    if (!font || !IsEmojiFontName(*font)) return false;
    if (!character || ContainedDiversityUnicode(*character) == 0) return false;
    new_history = HistoryWithChoice(CopySkinToneHistory(identifier).value_or(plist::Dictionary{}), *character);
  }

  CFPreferencesSetAppValue(StoreKey(kSkinTonesKeyPrefix, identifier),
                           new_history ? std::optional<plist::Value>(std::move(*new_history)) : std::nullopt,
                           kStoreDomain);
  CFPreferencesAppSynchronize(kStoreDomain);
  PostRecentsChangedNotification();
  return true;
}

}  // namespace lumeris
