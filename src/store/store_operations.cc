#include "store/store_operations.h"

#include <string>
#include <utility>
#include <vector>

#include "store/favorites.h"
#include "store/json_payload.h"
#include "store/recents.h"
#include "store/saved_state.h"
#include "store/skin_tones.h"

namespace lumeris {

namespace {

StringList StringListFromStored(std::optional<plist::Value> stored) {
  if (!stored) return std::nullopt;
  const plist::Array* entries = stored->AsArray();
  if (entries == nullptr) return std::nullopt;
  std::vector<std::string> strings;
  strings.reserve(entries->size());
  for (const plist::Value& entry : *entries) {
    if (const std::string* text = entry.AsString()) strings.push_back(*text);
  }
  return strings;
}

std::optional<plist::Array> ArrayFromStringList(const StringList& list) {
  if (!list) return std::nullopt;
  plist::Array array;
  array.reserve(list->size());
  for (const std::string& entry : *list) array.emplace_back(entry);
  return array;
}

}  // namespace

void InstallStoreOperations(ServiceOperations& operations) {
  operations.CopyRecentsIDArray = [](const OptionalString& identifier) -> StringList {
    if (!identifier) return std::nullopt;
    return StringListFromStored(CopyRecentsIDArray(*identifier));
  };
  operations.SetRecentsIDArray = [](const StringList& list, const OptionalString& identifier) {
    if (identifier) SetRecentsIDArray(ArrayFromStringList(list), *identifier);
  };
  operations.AddRecentID = [](const std::string& item, const OptionalString& identifier) {
    if (identifier) AddRecentID(item, *identifier);
  };
  operations.CopyFavoritesIDArray = [](const OptionalString& identifier) -> StringList {
    if (!identifier) return std::nullopt;
    return StringListFromStored(CopyFavoritesIDArray(*identifier));
  };
  operations.SetFavoritesIDArray = [](const StringList& list, const OptionalString& identifier) {
    if (identifier) SetFavoritesIDArray(ArrayFromStringList(list), *identifier);
  };
  operations.CopySkinToneHistory = [](const OptionalString& identifier) -> OptionalString {
    if (!identifier) return std::nullopt;
    std::optional<plist::Dictionary> history = CopySkinToneHistory(*identifier);
    if (!history) return std::nullopt;
    return JsonFromDictionary(*history);
  };
  operations.SetLastSkinToneSelection = [](const std::string& item, const OptionalString& identifier) {
    if (identifier) SetLastSkinToneSelection(item, *identifier);
  };
  operations.CopyLastState = [](const OptionalString& application) -> OptionalString {
    return JsonFromDictionary(CopyLastState(application ? std::optional<std::string_view>(*application)
                                                        : std::nullopt));
  };
  operations.SetLastState = [](const OptionalString& state, const OptionalString& application) {
    if (!application) return;
    if (!state) {
      SetLastState(std::nullopt, *application);
      return;
    }
    JsonPayload payload = ParseJsonPayload(*state);
    switch (payload.status) {
      case JsonPayload::Status::kObject:
        SetLastState(std::move(payload.object), *application);
        break;
      case JsonPayload::Status::kNotJson:
        SetLastState(std::nullopt, *application);
        break;
      case JsonPayload::Status::kUnstorable:
        break;
    }
  };
}

}  // namespace lumeris
