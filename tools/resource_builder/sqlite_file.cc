#include "resource_builder/sqlite_file.h"

#include <system_error>

namespace lumeris::resources {

void SqliteFile::Binder::Text(int index, std::string_view text) {
  sqlite3_bind_text(statement_, index, text.data(), static_cast<int>(text.size()), SQLITE_TRANSIENT);
}

std::optional<SqliteFile> SqliteFile::Create(const std::filesystem::path& path) {
  std::error_code ignored;
  std::filesystem::remove(path, ignored);
  sqlite3* db = nullptr;
  if (sqlite3_open_v2(path.c_str(), &db, SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE, nullptr) != SQLITE_OK) {
    sqlite3_close(db);
    return std::nullopt;
  }
  SqliteFile file(db);
  if (!file.Execute("pragma journal_mode = off") || !file.Execute("pragma synchronous = off") ||
      !file.Execute("begin")) {
    return std::nullopt;
  }
  return file;
}

SqliteFile::SqliteFile(SqliteFile&& other) noexcept : db_(other.db_) { other.db_ = nullptr; }

SqliteFile::~SqliteFile() {
  if (db_ != nullptr) sqlite3_close(db_);
}

bool SqliteFile::Execute(const char* sql) {
  return db_ != nullptr && sqlite3_exec(db_, sql, nullptr, nullptr, nullptr) == SQLITE_OK;
}

bool SqliteFile::InsertRows(const char* sql, size_t count, const std::function<void(size_t, Binder&)>& bind) {
  if (db_ == nullptr) return false;
  sqlite3_stmt* statement = nullptr;
  if (sqlite3_prepare_v2(db_, sql, -1, &statement, nullptr) != SQLITE_OK) return false;
  Binder binder(statement);
  bool ok = true;
  for (size_t i = 0; i < count && ok; ++i) {
    bind(i, binder);
    ok = sqlite3_step(statement) == SQLITE_DONE;
    sqlite3_reset(statement);
  }
  sqlite3_finalize(statement);
  return ok;
}

bool SqliteFile::Finish() {
  bool ok = Execute("commit");
  ok = sqlite3_close(db_) == SQLITE_OK && ok;
  db_ = nullptr;
  return ok;
}

}  // namespace lumeris::resources
