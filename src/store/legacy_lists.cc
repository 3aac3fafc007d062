#include "store/legacy_lists.h"

#include <cstdint>

#include "platform/preferences.h"
#include "store/store_keys.h"
#include "text/utf8.h"

namespace lumeris {

namespace {

std::optional<icu::UnicodeString> StringMember(const plist::Dictionary& item, std::string_view key) {
  auto found = item.find(key);
  if (found == item.end()) return std::nullopt;
  const std::string* text = found->second.AsString();
  if (text == nullptr) return std::nullopt;
  return DecodeUtf8Lenient(*text);
}

std::optional<std::uint32_t> GlyphMember(const plist::Dictionary& item) {
  auto found = item.find("Glyph");
  if (found == item.end()) return std::nullopt;
  if (const std::int64_t* integer = found->second.AsInteger()) return static_cast<std::uint32_t>(*integer);
  if (const double* real = found->second.AsReal()) {
    if (*real >= 0 && *real < 4294967296.0) return static_cast<std::uint32_t>(*real);
  }
  return std::nullopt;
}

}  // namespace

VistrelItem VistrelItemFromPropertyList(const plist::Value& element) {
  VistrelItem item;
  const plist::Dictionary* dictionary = element.AsDictionary();
  if (dictionary == nullptr) return item;
  item.entity_id = StringMember(*dictionary, "EntityID");
  item.string = StringMember(*dictionary, "String");
  item.font = StringMember(*dictionary, "Font");
  item.glyph = GlyphMember(*dictionary);
  return item;
}

std::optional<plist::Array> EntityIDArrayFromOldPreferences(std::string_view old_key) {
  CFPreferencesAppSynchronize(kInputMethodDomain);
  std::optional<plist::Value> old_list = CFPreferencesCopyAppValue(old_key, kInputMethodDomain);
  if (!old_list && old_key == kOldFavoritesKey) {
    old_list = CFPreferencesCopyAppValue(kOlderServerFavoritesKey, kOlderServerDomain);
  }
  if (!old_list) return std::nullopt;
  const plist::Array* elements = old_list->AsArray();
  if (elements == nullptr) return std::nullopt;

  plist::Array ids;
  ids.reserve(elements->size());
  for (const plist::Value& element : *elements) {
    ids.emplace_back(EncodeUtf8Lenient(EntityIDFromVistrelItem(VistrelItemFromPropertyList(element))));
  }
  if (ids.empty()) return std::nullopt;
  return ids;
}

}  // namespace lumeris
