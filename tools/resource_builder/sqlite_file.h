// A new SQLite database file written in one transaction: the builder's way of producing the
// read-only databases of the bundle.
//
//   std::optional<SqliteFile> db = SqliteFile::Create(path);   // replaces any existing file
//   db->Execute("create table t (a text)");
//   db->InsertRows("insert into t values (?)", n, [&](size_t i, SqliteFile::Binder& bind) { bind.Text(1, x[i]); });
//   db->Finish();                                              // commits; false on any failure
//
// Journaling and syncing are off while writing: a failed build leaves a file that Finish never
// committed, and the build then fails. Thread-safety: one object per thread. Move-only; closes the
// connection when destroyed.
#pragma once

#include <sqlite3.h>

#include <filesystem>
#include <functional>
#include <optional>
#include <string>
#include <string_view>

namespace lumeris::resources {

class SqliteFile {
 public:
  class Binder {
   public:
    explicit Binder(sqlite3_stmt* statement) : statement_(statement) {}
    void Text(int index, std::string_view text);

   private:
    sqlite3_stmt* statement_;
  };

  static std::optional<SqliteFile> Create(const std::filesystem::path& path);
  SqliteFile(SqliteFile&& other) noexcept;
  SqliteFile& operator=(SqliteFile&&) = delete;
  SqliteFile(const SqliteFile&) = delete;
  SqliteFile& operator=(const SqliteFile&) = delete;
  ~SqliteFile();

  bool Execute(const char* sql);
  // Prepares `sql` once and runs it `count` times, `bind` filling the parameters of row i.
  bool InsertRows(const char* sql, size_t count, const std::function<void(size_t, Binder&)>& bind);
  // Commits the transaction and closes the file.
  bool Finish();

 private:
  explicit SqliteFile(sqlite3* db) : db_(db) {}
  sqlite3* db_;
};

}  // namespace lumeris::resources
