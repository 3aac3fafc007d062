#include "store/recents.h"

#include <algorithm>
#include <utility>

#include "entity/recent_equality.h"
#include "platform/preferences.h"
#include "store/change_notification.h"
#include "store/horse_racing.h"
#include "store/legacy_lists.h"
#include "store/skin_tones.h"
#include "store/storage_version.h"
#include "store/store_keys.h"
#include "text/utf8.h"

namespace lumeris {

std::optional<plist::Value> CopyRecentsIDArray(std::string_view identifier) {
  CheckDataStorageVersion();
  const std::string key = StoreKey(kRecentsKeyPrefix, identifier);
  CFPreferencesAppSynchronize(kStoreDomain);
  std::optional<plist::Value> stored = CFPreferencesCopyAppValue(key, kStoreDomain);

  if (std::optional<plist::Array> repaired = CreateArrayWithPlainHorseRacing(stored)) {
    return plist::Value(std::move(*repaired));
  }
  if (stored) return stored;

  if (identifier != kDefaultDataStorageIdentifier) return std::nullopt;
  if (CFPreferencesGetAppBooleanValue(kRecentsConvertedKey, kStoreDomain)) return std::nullopt;

  // The flag goes first, so the conversion is tried once only, even when it yields nothing.
  CFPreferencesSetAppValue(kRecentsConvertedKey, plist::Value(true), kStoreDomain);
  std::optional<plist::Array> converted = EntityIDArrayFromOldPreferences(kOldRecentsKey);
  SetRecentsIDArray(converted, identifier);
  if (!converted) return std::nullopt;
  return plist::Value(std::move(*converted));
}

bool SetRecentsIDArray(const std::optional<plist::Array>& list, std::string_view identifier) {
  CheckDataStorageVersion();
  CFPreferencesSetAppValue(StoreKey(kRecentsKeyPrefix, identifier),
                           list ? std::optional<plist::Value>(*list) : std::nullopt, kStoreDomain);
  CFPreferencesAppSynchronize(kStoreDomain);

  bool history_posted = false;
  if (!list || list->empty()) {
    history_posted = SetLastSkinToneSelection(std::nullopt, identifier);
  } else if (const std::string* first = list->front().AsString()) {
    history_posted = SetLastSkinToneSelection(*first, identifier);
  }
  if (history_posted) return true;
  PostRecentsChangedNotification();
  return false;
}

void AddRecentID(const std::string& item, std::string_view identifier) {
  plist::Array list;
  if (std::optional<plist::Value> stored = CopyRecentsIDArray(identifier)) {
    if (plist::Array* entries = stored->AsArray()) list = std::move(*entries);
  }

  const icu::UnicodeString item_text = DecodeUtf8Lenient(item);
  for (const plist::Value& entry : list) {
    const std::string* entry_text = entry.AsString();
    if (entry_text == nullptr || !IsEqualRecentEntityID(DecodeUtf8Lenient(*entry_text), item_text)) continue;
    const std::string replaced = *entry_text;
    std::erase_if(list, [&](const plist::Value& other) {
      const std::string* other_text = other.AsString();
      return other_text != nullptr && *other_text == replaced;
    });
    break;
  }
  list.insert(list.begin(), plist::Value(item));
  SetRecentsIDArray(list, identifier);
}

void ClearRecents(std::string_view identifier) { SetRecentsIDArray(plist::Array{}, identifier); }

}  // namespace lumeris
