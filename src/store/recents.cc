#include "store/recents.h"

#include <algorithm>
#include <mutex>
#include <utility>

#include "entity/entity_id.h"
#include "entity/recent_equality.h"
#include "platform/preferences.h"
#include "store/change_notification.h"
#include "store/id_list_read.h"
#include "store/skin_tones.h"
#include "store/storage_version.h"
#include "store/store_keys.h"
#include "text/emoji.h"
#include "text/utf8.h"

namespace lumeris {

namespace {

// Whether `item` is an entity ID whose character holds a skin-tone-capable emoji. For any other
// item IsEqualRecentEntityID(entry, item) is plain text equality (its skin-tone rule needs a
// non-zero base emoji on both sides), so adding it needs no decoding of the stored entries.
bool HoldsSkinToneEmoji(const icu::UnicodeString& item) {
  std::optional<icu::UnicodeString> character;
  return CharacterInfoFromEntityID(item, nullptr, &character) && character &&
         ContainedDiversityUnicode(*character) != 0;
}

}  // namespace

std::optional<plist::Value> CopyRecentsIDArray(std::string_view identifier) {
  CheckDataStorageVersion();
  return CopyIDArrayConvertingOnce(
      {kRecentsKeyPrefix, kRecentsConvertedKey, kOldRecentsKey}, identifier,
      [identifier](std::optional<plist::Array> list) { SetRecentsIDArray(std::move(list), identifier); });
}

bool SetRecentsIDArray(std::optional<plist::Array> list, std::string_view identifier) {
  // The history step takes the first entry; a first entry that is not a string is not usable.
  std::optional<std::string> first;
  bool first_usable = true;
  if (list && !list->empty()) {
    const std::string* text = list->front().AsString();
    first_usable = text != nullptr;
    if (text != nullptr) first = *text;
  }

  CheckDataStorageVersion();
  CFPreferencesSetAppValue(StoreKey(kRecentsKeyPrefix, identifier),
                           list ? std::optional<plist::Value>(std::move(*list)) : std::nullopt, kStoreDomain);
  CFPreferencesAppSynchronize(kStoreDomain);

  if (first_usable && SetLastSkinToneSelection(first, identifier)) return true;
  PostRecentsChangedNotification();
  return false;
}

void AddRecentID(const std::string& item, std::string_view identifier) {
  // Adds of one process never lose each other: the read and the store happen under one lock.
  static std::mutex read_modify_write;
  std::lock_guard lock(read_modify_write);
  plist::Array list;
  if (std::optional<plist::Value> stored = CopyRecentsIDArray(identifier)) {
    if (plist::Array* entries = stored->AsArray()) list = std::move(*entries);
  }

  const icu::UnicodeString item_text = DecodeUtf8Lenient(item);
  const bool text_equality_only = !HoldsSkinToneEmoji(item_text);
  for (const plist::Value& entry : list) {
    const std::string* entry_text = entry.AsString();
    if (entry_text == nullptr) continue;
    const bool equal = text_equality_only ? *entry_text == item
                                          : IsEqualRecentEntityID(DecodeUtf8Lenient(*entry_text), item_text);
    if (!equal) continue;
    const std::string replaced = *entry_text;
    std::erase_if(list, [&](const plist::Value& other) {
      const std::string* other_text = other.AsString();
      return other_text != nullptr && *other_text == replaced;
    });
    break;
  }
  list.insert(list.begin(), plist::Value(item));
  SetRecentsIDArray(std::move(list), identifier);
}

void ClearRecents(std::string_view identifier) { SetRecentsIDArray(plist::Array{}, identifier); }

}  // namespace lumeris
