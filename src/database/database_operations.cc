#include "database/database_operations.h"

#include <pthread.h>
#include <signal.h>

#include <thread>

#include "categories/regional_restriction.h"
#include "database/character_database.h"
#include "database/font_queries.h"
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
  // The thread (and the index completion it starts, which inherits its mask) never takes the
  // process's signals: the service ends on SIGTERM and SIGINT only through the thread that
  // waits for them, and a stop signal delivered here would kill the process without removing
  // its socket.
  sigset_t all;
  sigfillset(&all);
  sigset_t previous;
  pthread_sigmask(SIG_BLOCK, &all, &previous);
  // The index and the font lists (which the two font questions build on first use) are read on
  // two threads at once, so that the first search waits for the longer of the two only.
  std::thread([] { LMCharacterDatabase::sharedDatabase().PrepareSearchIndex(); }).detach();
  std::thread([] {
    DefaultLikeFontDrawsString(icu::UnicodeString(u"a"));
    ColorFontDrawsString(kColorEmojiFontName, icu::UnicodeString(u"a"));
  }).detach();
  pthread_sigmask(SIG_SETMASK, &previous, nullptr);
}

}  // namespace lumeris
