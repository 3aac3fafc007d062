#include "database/search_index_table.h"

#include <unicode/uversion.h>

#include <atomic>

namespace lumeris {
namespace {

bool Execute(sqlite3* db, const char* sql, std::string* error) {
  if (sqlite3_exec(db, sql, nullptr, nullptr, nullptr) == SQLITE_OK) return true;
  *error = sqlite3_errmsg(db);
  return false;
}

}  // namespace

bool WriteSearchIndexTable(sqlite3* db, std::string* error) {
  // Font answers are not stored: the builder never asks them.
  const std::unique_ptr<CharacterSearchIndex> index = CharacterSearchIndex::Build(db, FontQueries{});
  const std::atomic<bool> stop{false};
  if (!index || !index->BuildTrigrams(stop)) {
    *error = "cannot read unihan_dict";
    return false;
  }
  const std::string bytes = index->Serialize();
  // Any later change of unihan_dict, by any program, empties the table, so a stored index never
  // outlives the rows it was made from.
  if (!Execute(db,
               "begin;"
               "drop table if exists search_index;"
               "create table search_index (icu_version text not null, data blob not null);"
               "create trigger if not exists search_index_stale_on_insert after insert on unihan_dict"
               "  begin delete from search_index; end;"
               "create trigger if not exists search_index_stale_on_update after update on unihan_dict"
               "  begin delete from search_index; end;"
               "create trigger if not exists search_index_stale_on_delete after delete on unihan_dict"
               "  begin delete from search_index; end;",
               error)) {
    sqlite3_exec(db, "rollback", nullptr, nullptr, nullptr);
    return false;
  }
  sqlite3_stmt* statement = nullptr;
  bool ok = sqlite3_prepare_v2(db, "insert into search_index values (?, ?)", -1, &statement, nullptr) == SQLITE_OK;
  ok = ok && sqlite3_bind_text(statement, 1, U_ICU_VERSION, -1, SQLITE_STATIC) == SQLITE_OK &&
       sqlite3_bind_blob64(statement, 2, bytes.data(), bytes.size(), SQLITE_STATIC) == SQLITE_OK &&
       sqlite3_step(statement) == SQLITE_DONE;
  if (!ok) *error = sqlite3_errmsg(db);
  sqlite3_finalize(statement);
  ok = ok && Execute(db, "commit", error);
  if (!ok) sqlite3_exec(db, "rollback", nullptr, nullptr, nullptr);
  return ok;
}

std::unique_ptr<CharacterSearchIndex> ReadSearchIndexTable(sqlite3* db, const FontQueries& fonts) {
  sqlite3_stmt* statement = nullptr;
  sqlite3_int64 rowid = 0;
  bool current = false;
  if (sqlite3_prepare_v2(db, "select rowid, icu_version from search_index", -1, &statement, nullptr) == SQLITE_OK &&
      sqlite3_step(statement) == SQLITE_ROW) {
    rowid = sqlite3_column_int64(statement, 0);
    const auto* version = reinterpret_cast<const char*>(sqlite3_column_text(statement, 1));
    current = version != nullptr && std::string_view(version) == U_ICU_VERSION;
  }
  sqlite3_finalize(statement);
  if (!current) return nullptr;
  // Read straight into one buffer (a select would copy the blob once more).
  sqlite3_blob* blob = nullptr;
  std::string bytes;
  if (sqlite3_blob_open(db, "main", "search_index", "data", rowid, 0, &blob) == SQLITE_OK) {
    bytes.resize(static_cast<std::size_t>(sqlite3_blob_bytes(blob)));
    if (sqlite3_blob_read(blob, bytes.data(), static_cast<int>(bytes.size()), 0) != SQLITE_OK) bytes.clear();
  }
  sqlite3_blob_close(blob);
  return bytes.empty() ? nullptr : CharacterSearchIndex::Deserialize(bytes, fonts);
}

}  // namespace lumeris
