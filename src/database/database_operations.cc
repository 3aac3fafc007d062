#include "database/database_operations.h"

#include <thread>

#include "categories/regional_restriction.h"
#include "database/character_database.h"
#include "platform/font_coverage.h"
#include "text/utf8.h"

namespace lumeris {
namespace {

icu::UnicodeString RequestText(const std::string& utf8) {
  return DecodeUtf8(utf8).value_or(icu::UnicodeString());
}

}  // namespace

void InstallDatabaseOperations(ServiceOperations& operations) {
  operations.UpdateCountryInfoAndCheckSignificantChange =
      UpdateCountryInfoAndCheckSignificantChange;
  operations.createXPCArrayForSearchString = [](const std::string& text, std::uint64_t limit) {
    return LMCharacterDatabase::sharedDatabase().createXPCArrayForSearchString(
        RequestText(text), static_cast<std::int64_t>(limit));
  };
  operations.createXPCArrayForRelatedCharacters = [](const std::string& text, std::uint64_t limit) {
    return LMCharacterDatabase::sharedDatabase().createXPCArrayForRelatedCharacters(
        RequestText(text), static_cast<std::int64_t>(limit));
  };
  operations.createXPCDictionaryForCharacterInfo = [](const std::string& text) {
    return LMCharacterDatabase::sharedDatabase().createXPCDictionaryForCharacterInfo(
        RequestText(text));
  };
}

void PrepareCharacterDatabaseInBackground() {
  std::thread([] {
    LMCharacterDatabase::sharedDatabase().PrepareSearchIndex();
    // The two font questions build their font lists on first use.
    DefaultLikeFontDrawsString(icu::UnicodeString(u"a"));
  }).detach();
}

}  // namespace lumeris
