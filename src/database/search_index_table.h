// The search index kept in the character database beside `unihan_dict`, written by the resource
// builder so that a service reads it at start instead of scanning and folding every row.
//
//   WriteSearchIndexTable(db, &error);                                  // the builder, once
//   std::unique_ptr<CharacterSearchIndex> index = ReadSearchIndexTable(db, fonts);  // at start
//
// Table "search_index" holds one row: the ICU version that folded the texts and
// CharacterSearchIndex::Serialize(). Triggers on `unihan_dict` empty it at any change of the rows,
// whoever makes it. A reader that finds no row, another ICU version or bytes that do not read
// back gets nullptr and builds the index from the table itself, so a stale or damaged copy
// costs time, never a different reply. Tools that only know `unihan_dict` and `related_dict` are
// not affected by the extra table.
//
// Thread-safety: each call uses only `db`, which the caller must not use from another thread
// meanwhile.
#pragma once

#include <sqlite3.h>

#include <memory>
#include <string>

#include "database/character_search_index.h"

namespace lumeris {

// Builds the index from `unihan_dict` of `db` (opened for writing) and stores it, replacing any
// earlier copy. False, with the reason in `error`, when that fails.
bool WriteSearchIndexTable(sqlite3* db, std::string* error);

std::unique_ptr<CharacterSearchIndex> ReadSearchIndexTable(sqlite3* db, const FontQueries& fonts);

}  // namespace lumeris
