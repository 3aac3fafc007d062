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
// connections wait for each other). Indexed searches read their immutable index without a lock and
// take the connection's lock only for the rare row whose LIKE test needs its whole `info` text, so
// searches from several threads run in parallel.
//
// Ownership: every create... result is a new value owned by the caller; sharedDatabase() is
// borrowed and lives until the process ends.
#pragma once

#include <sqlite3.h>
#include <unicode/unistr.h>

#include <atomic>
#include <cstdint>
#include <filesystem>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <thread>

#include "database/character_search_index.h"
#include "database/font_queries.h"
#include "database/related_character_index.h"
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

  // How the search and related-characters requests find their rows. Both give the same replies:
  // kReference runs each request's statement over the whole table, as the rules are written;
  // kIndexed answers from in-memory indexes read once (character_search_index.h,
  // related_character_index.h) and stops as soon as no later row can change the reply. The
  // reference stays for the differential tests and benchmarks, which compare the two.
  enum class Rules { kIndexed, kReference };

  // A database over the resources `lookup` finds, asking `fonts` its font questions (whose
  // answers must not change for a string). Opens nothing yet.
  LMCharacterDatabase(ResourcePathLookup lookup, FontQueries fonts, Rules rules = Rules::kIndexed);
  LMCharacterDatabase(const LMCharacterDatabase&) = delete;
  LMCharacterDatabase& operator=(const LMCharacterDatabase&) = delete;
  // Stops the indexing thread, then closes the connections that were opened.
  ~LMCharacterDatabase();

  // Opens CharacterDB and reads the search index now, if the rules use one; the rest of the index
  // is completed on a thread of this object. Searches made meanwhile wait for the index stored in
  // the database; when there is none and the index is built from the table, they are answered by
  // the reference rules instead. Without this call the first search reads the index.
  void PrepareSearchIndex();

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

  MessageValue ReferenceSearch(Connection& connection, const std::string& utf8,
                               const icu::UnicodeString& text, std::int64_t maxCount);
  MessageValue IndexedSearch(Connection& connection, const std::string& utf8,
                             const icu::UnicodeString& text, std::int64_t maxCount);
  // Whether the `info` text of `rowid` matches the LIKE `pattern`, as the search statement tests.
  bool InfoMatchesLike(Connection& connection, sqlite3_int64 rowid, const std::string& pattern);
  // The search index, read on first use; nullptr when CharacterDB's table cannot be read.
  const CharacterSearchIndex* SearchIndex(Connection& connection);
  const RelatedCharacterIndex* RelatedIndex(Connection& connection);
  // Appends the pieces of one related_dict row as the related-characters rules say.
  void AppendRelatedPieces(const icu::UnicodeString& row, const icu::UnicodeString& character,
                           std::int64_t maxCount, std::int64_t& count, MessageValue& result);

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
  const Rules rules_;
  std::once_flag search_index_once_;
  std::unique_ptr<CharacterSearchIndex> search_index_;  // set once, under search_index_once_
  std::atomic<bool> search_index_ready_{false};         // search_index_once_ has run
  std::atomic<bool> reading_table_{false};  // the index is being built from unihan_dict itself
  std::once_flag related_index_once_;
  std::unique_ptr<RelatedCharacterIndex> related_index_;  // set once, under related_index_once_
  std::atomic<bool> stopping_{false};
  std::thread completion_;  // CharacterSearchIndex::CompleteInBackground
};

}  // namespace lumeris
