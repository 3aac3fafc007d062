#include "resource_builder/related_db.h"

#include "resource_builder/sqlite_file.h"

namespace lumeris::resources {

bool WriteRelatedDatabase(const std::filesystem::path& path, const std::vector<std::string>& groups) {
  std::optional<SqliteFile> db = SqliteFile::Create(path);
  if (!db || !db->Execute("create table related_dict (relatedChars text not null)")) return false;
  bool ok = db->InsertRows("insert into related_dict (relatedChars) values (?)", groups.size(),
                           [&](size_t i, SqliteFile::Binder& bind) { bind.Text(1, groups[i]); });
  return db->Finish() && ok;
}

}  // namespace lumeris::resources
