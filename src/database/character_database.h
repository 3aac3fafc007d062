// LMCharacterDatabase: the shared, read-only character database of the service. It answers the
// three character requests (text search, related characters, information record) from two SQLite
// files of the input-method bundle, "CharacterDB" (table unihan_dict: uchr, info) and
// "RelatedCharDB" (table related_dict: relatedChars), and looks up languages in the
// "HanLanguageInfo" property list. docs/database.md describes the rules of each request.
//
//   LMCharacterDatabase& db = LMCharacterDatabase::sharedDatabase();
//   MessageValue found = db.createXPCArrayForSearchString(u"heart", 20);    // ["❤️", ...]
//   MessageValue record = db.createXPCDictionaryForCharacterInfo(u"中");    // {"unam": ..., ...}
//
// Lazy opening: a request looks at the connection it needs and, while it is null, opens the file
// read-only (the path found by the resource lookup; a missing file is opened all the same, as an
// empty private database, so that the request then fails at its query). A connection that the open
// call did not produce (null) is tried again at the next request; one once stored is kept, usable
// or not, until the object is destroyed. The language list is loaded on first lookup and loaded
// again at each lookup while loading fails.
//
// Thread-safety: every public member may be called from any thread at the same time. Opening and
// loading happen under one mutex, so each file is opened at most once. SQLite statements are
// serialized: each connection has its own mutex, held by a request from its query's preparation to
// its finalization, so at most one query runs on a connection at a time (searches of different
// connections wait for each other; the font queries inside a search run under that lock too).
//
// Ownership: every create... result is a new value owned by the caller; sharedDatabase() is
// borrowed and lives until the process ends.
#pragma once

#include <sqlite3.h>
#include <unicode/unistr.h>

#include <cstdint>
#include <filesystem>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>

#include "database/font_queries.h"
#include "platform/property_list.h"
#include "service/message_value.h"

namespace lumeris {

// A character information record: field tag -> field text (UTF-8), all sixteen tags.
using CharacterInfoRecord = std::map<std::string, std::string, std::less<>>;

class LMCharacterDatabase {
 public:
  // Where a resource of the bundle is: (name, type) -> path, or std::nullopt.
  using ResourcePathLookup = std::function<std::optional<std::filesystem::path>(
      std::string_view name, std::string_view type)>;

  // The one instance of the process, with the input-method bundle's resources and the installed
  // fonts. Created on first use, never destroyed.
  static LMCharacterDatabase& sharedDatabase();

  // A database over the resources `lookup` finds, asking `fonts` its font questions. Opens
  // nothing yet.
  LMCharacterDatabase(ResourcePathLookup lookup, FontQueries fonts);
  LMCharacterDatabase(const LMCharacterDatabase&) = delete;
  LMCharacterDatabase& operator=(const LMCharacterDatabase&) = delete;
  // Closes the connections that were opened.
  ~LMCharacterDatabase();

  // Characters whose field 0 ("unam") contains `text`, ignoring case: emoji-font characters
  // first, at most `maxCount` of each kind as the rules say. Null when CharacterDB cannot be
  // opened or queried; an array of UTF-8 strings otherwise.
  MessageValue createXPCArrayForSearchString(const icu::UnicodeString& text, std::int64_t maxCount);

  // The characters grouped with `character` in RelatedCharDB, one code point each (surrogate
  // pairs kept), that some font like the default font draws, `character` itself left out; at
  // most `maxCount`. Null when the database cannot be opened or the query not built; an empty
  // array when it cannot be prepared.
  MessageValue createXPCArrayForRelatedCharacters(const icu::UnicodeString& character,
                                                  std::int64_t maxCount);

  // The record of `character`, looked up under its normalized replacement-dictionary key when it
  // has one; std::nullopt when there is no row whose second column (named in under 5 bytes)
  // splits into exactly sixteen fields.
  std::optional<CharacterInfoRecord> searchCharacterInfo(const icu::UnicodeString& character);

  // searchCharacterInfo() as a dictionary of strings; an empty dictionary when there is none.
  MessageValue createXPCDictionaryForCharacterInfo(const icu::UnicodeString& character);

  // The "tags" entry of `tag` / the "languages" entry of `language` in HanLanguageInfo, as
  // stored; std::nullopt when absent or when the list cannot be loaded.
  std::optional<plist::Value> languageForFieldTag(std::string_view tag);
  std::optional<plist::Value> tagsForLanguage(std::string_view language);

 private:
  struct Connection {
    sqlite3* handle = nullptr;  // guarded by open_mutex_ until stored, then constant
    std::mutex query_mutex;     // held for the whole of one query
  };

  // The connection of `name` ("CharacterDB" or "RelatedCharDB"), opened now when its handle is
  // still null; nullptr while the open call produces no handle.
  Connection* Open(Connection& connection, std::string_view name);
  // Opens the resource `name` of type "sqlite3" read-only; the handle the open call stored.
  sqlite3* _openDatabase(std::string_view name);
  // The language list, loaded now when it is not yet; nullptr while it cannot be loaded.
  const plist::Dictionary* _hanLanguageInfo();
  std::optional<plist::Value> LanguageListEntry(std::string_view list, std::string_view key);

  const ResourcePathLookup lookup_;
  const FontQueries fonts_;
  std::mutex open_mutex_;
  Connection _charDatabase;
  Connection _relatedCharDatabase;
  std::unique_ptr<const plist::Dictionary> _languageInfo;  // guarded by open_mutex_; set once
};

}  // namespace lumeris
