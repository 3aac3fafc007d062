// The stored search index: read back it visits the rows the index built from the table visits;
// a stale, foreign or damaged copy is refused (or, damaged past the checks, still never read
// out of bounds), so the reader builds from the table instead.
#include "database/search_index_table.h"

#include <gtest/gtest.h>

#include <random>
#include <string>
#include <vector>

namespace lumeris {
namespace {

struct Database {
  Database() {
    sqlite3_open(":memory:", &db);
    Exec("create table unihan_dict (uchr text not null, info text not null)");
    for (const char* row : {"('→', 'RIGHTWARDS ARROW|x')", "('é', 'LATIN SMALL LETTER E WITH ACUTE|')",
                            "('😀', 'grinning face|happy')", "('Ǆ', 'Ǆ DŽ DIGRAPH|')", "('a', 'a|ar|arrow')",
                            "(char(9), 'TAB ARROW|')"}) {
      Exec(std::string("insert into unihan_dict values ") + row);
    }
  }
  ~Database() { sqlite3_close(db); }
  void Exec(const std::string& sql) { ASSERT_EQ(sqlite3_exec(db, sql.c_str(), nullptr, nullptr, nullptr), SQLITE_OK) << sql; }
  sqlite3* db = nullptr;
};

std::vector<uint32_t> Rows(const CharacterSearchIndex& index, std::string_view needle) {
  std::vector<uint32_t> rows;
  index.ForEachMatch(needle, false, [&](uint32_t row) {
    rows.push_back(row);
    return true;
  });
  return rows;
}

constexpr std::string_view kNeedles[] = {"a", "e", "ar", "arr", "arrow", "letter e", "ǆ", "é", "grinning", "zzz", "tab"};

TEST(SearchIndexTableTest, AStoredIndexVisitsTheRowsOfOneBuiltFromTheTable) {
  Database database;
  std::string error;
  ASSERT_TRUE(WriteSearchIndexTable(database.db, &error)) << error;
  const auto stored = ReadSearchIndexTable(database.db, FontQueries{});
  const auto built = CharacterSearchIndex::Build(database.db, FontQueries{});
  ASSERT_TRUE(stored && built);
  ASSERT_EQ(stored->size(), 5u) << "the tab row can never be a result";
  for (std::string_view needle : kNeedles) {
    EXPECT_EQ(Rows(*stored, needle), Rows(*built, needle)) << needle;
  }
  EXPECT_EQ(Rows(*stored, "e"), (std::vector<uint32_t>{1, 2}));
  for (uint32_t row = 0; row < stored->size(); ++row) {
    EXPECT_EQ(stored->uchr(row), built->uchr(row));
    EXPECT_EQ(stored->rowid(row), built->rowid(row));
    EXPECT_EQ(stored->field0_is_ascii(row), built->field0_is_ascii(row));
  }
}

TEST(SearchIndexTableTest, AStaleOrForeignCopyIsNotRead) {
  const std::vector<std::string> changes = {
      "insert into unihan_dict values ('b', 'b|')",
      "update unihan_dict set info = 'LEFTWARDS ARROW|' where uchr = '→'",
      "delete from unihan_dict where uchr = 'a'",
      "update search_index set icu_version = '0.0'",  // folded by another ICU
      "update search_index set data = substr(data, 1, length(data) - 1)",
  };
  for (const std::string& change : changes) {
    Database database;
    std::string error;
    ASSERT_TRUE(WriteSearchIndexTable(database.db, &error)) << error;
    database.Exec(change);
    EXPECT_EQ(ReadSearchIndexTable(database.db, FontQueries{}), nullptr) << change;
  }
}

TEST(SearchIndexTableTest, DamagedBytesAreRefusedOrSearchedWithinBounds) {
  Database database;
  const auto built = CharacterSearchIndex::Build(database.db, FontQueries{});
  const std::atomic<bool> stop{false};
  ASSERT_TRUE(built->BuildTrigrams(stop));
  const std::string bytes = built->Serialize();
  std::mt19937 random(7);
  int refused = 0;
  for (int round = 0; round < 3000; ++round) {
    std::string damaged = bytes;
    for (int i = 0; i < 2; ++i) damaged[random() % damaged.size()] = static_cast<char>(random());
    const auto index = CharacterSearchIndex::Deserialize(damaged, FontQueries{});
    if (!index) {
      ++refused;
      continue;
    }
    // Under the address sanitizer, a read out of bounds fails here.
    for (std::string_view needle : kNeedles) Rows(*index, needle);
  }
  EXPECT_GT(refused, 100);
}

}  // namespace
}  // namespace lumeris
