#include "resource_builder/character_db.h"

#include "resource_builder/sqlite_file.h"

namespace lumeris::resources {

bool WriteCharacterDatabase(const std::filesystem::path& path, const std::vector<CharacterRow>& rows) {
  std::optional<SqliteFile> db = SqliteFile::Create(path);
  if (!db || !db->Execute("create table unihan_dict (uchr text not null, info text not null)")) return false;
  bool ok = db->InsertRows("insert into unihan_dict (uchr, info) values (?, ?)", rows.size(),
                           [&](size_t i, SqliteFile::Binder& bind) {
                             bind.Text(1, rows[i].uchr);
                             bind.Text(2, rows[i].info);
                           });
  ok = ok && db->Execute("create unique index unihan_dict_uchr on unihan_dict (uchr)");
  return db->Finish() && ok;
}

}  // namespace lumeris::resources
