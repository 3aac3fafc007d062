// Stores the search index in a character database the resource builder wrote:
//   lumeris-search-index-writer <CharacterDB.sqlite3>
#include <sqlite3.h>

#include <cstdio>
#include <string>

#include "database/search_index_table.h"

int main(int argc, char** argv) {
  if (argc != 2) {
    std::fprintf(stderr, "usage: lumeris-search-index-writer <CharacterDB.sqlite3>\n");
    return 2;
  }
  sqlite3* db = nullptr;
  std::string error;
  const bool ok = sqlite3_open_v2(argv[1], &db, SQLITE_OPEN_READWRITE, nullptr) == SQLITE_OK &&
                  lumeris::WriteSearchIndexTable(db, &error);
  if (!ok) std::fprintf(stderr, "lumeris-search-index-writer: %s: %s\n", argv[1], error.empty() ? sqlite3_errmsg(db) : error.c_str());
  sqlite3_close(db);
  return ok ? 0 : 1;
}
