// RelatedCharacterIndex: the rows of related_dict read once per process, with the rows holding each
// code point, so that a related-characters request visits only the rows that can match its LIKE
// pattern instead of scanning every row.
//
//   std::unique_ptr<RelatedCharacterIndex> index = RelatedCharacterIndex::Build(db);
//   for (uint32_t row : index->RowsHolding(U'a')) ... index->text(row) ...
//
// A row is kept when its text is well-formed, non-empty UTF-8 (read as a C string, as the request
// reads it); other rows give a request nothing. RowsHolding(c) lists, in the table's scan order,
// the rows that hold c or, for an ASCII letter, the letter in the other case: exactly the rows
// that can contain a literal c under LIKE, which folds ASCII case only.
//
// Thread-safety: immutable after Build(); every member may be called from any thread at once.
#pragma once

#include <sqlite3.h>
#include <unicode/umachine.h>

#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <unordered_map>
#include <vector>

namespace lumeris {

class RelatedCharacterIndex {
 public:
  // Reads related_dict through `db`; nullptr when the table cannot be read to its end.
  static std::unique_ptr<RelatedCharacterIndex> Build(sqlite3* db);

  std::span<const uint32_t> RowsHolding(UChar32 c) const;
  const std::string& text(uint32_t row) const { return rows_[row]; }

 private:
  std::vector<std::string> rows_;
  std::unordered_map<UChar32, std::vector<uint32_t>> rows_holding_;  // key: ASCII lowered
};

}  // namespace lumeris
