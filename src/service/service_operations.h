// ServiceOperations: the operations the dispatcher calls, one member per operation of the data
// store, the category catalogue, the character database and the large-viewer preference.
//
// The dispatcher reaches the rest of the service only through this struct, so each area fills
// in its own members (see InstalledServiceOperations()) and tests put doubles in. A member left
// empty makes every command that needs it behave as an unknown command: it does nothing and
// sends no reply.
//
// Conventions of the members:
// - identifier / application: the request's "identifier" and "application" strings, absent when
//   the request has none (or a value that is not a string);
// - lists: StringList, where an absent list and an empty one differ (see string_array.h);
// - JSON payloads: the compact UTF-8 text of a JSON object, as bytes;
// - results for the client: MessageValues the operation creates and the dispatcher owns.
//
// Thread-safety: the service calls the members from several connections at once, so every
// member must be safe to call concurrently. The struct itself is read-only once installed.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>

#include "service/message_value.h"
#include "service/string_array.h"

namespace lumeris {

using OptionalString = std::optional<std::string>;

struct ServiceOperations {
  // Recents and favourites lists of a storage identifier.
  std::function<StringList(const OptionalString& identifier)> CopyRecentsIDArray;
  std::function<void(const StringList& list, const OptionalString& identifier)> SetRecentsIDArray;
  std::function<void(const std::string& item, const OptionalString& identifier)> AddRecentID;
  std::function<StringList(const OptionalString& identifier)> CopyFavoritesIDArray;
  std::function<void(const StringList& list, const OptionalString& identifier)> SetFavoritesIDArray;

  // Skin-tone history (JSON object text, absent when none is stored) and saved panel state.
  std::function<OptionalString(const OptionalString& identifier)> CopySkinToneHistory;
  std::function<void(const std::string& item, const OptionalString& identifier)>
      SetLastSkinToneSelection;
  std::function<OptionalString(const OptionalString& application)> CopyLastState;
  // `state`: the request's "data" bytes when they parse as JSON, else absent.
  std::function<void(const OptionalString& state, const OptionalString& application)> SetLastState;

  // Category catalogue: the reply's "result" array for the category names asked for.
  std::function<MessageValue(const StringList& names)> CreateXPCCategoryDataArray;

  // Character database. The regional state is refreshed before every text search; the result
  // of that refresh is not used by the dispatcher.
  std::function<bool()> UpdateCountryInfoAndCheckSignificantChange;
  std::function<MessageValue(const std::string& text, std::uint64_t limit)>
      createXPCArrayForSearchString;
  std::function<MessageValue(const std::string& text, std::uint64_t limit)>
      createXPCArrayForRelatedCharacters;
  std::function<MessageValue(const std::string& text)> createXPCDictionaryForCharacterInfo;

  // Writes the large-window preference and synchronises it; the reply waits for it.
  // An absent path removes the preference.
  std::function<bool(const OptionalString& path)> PrepareOpeningLargeVistrel;
};

// The operations the running service uses: every area that has landed fills in its members
// here. Built once, on first use; the reference stays valid until the process ends.
const ServiceOperations& InstalledServiceOperations();

}  // namespace lumeris
