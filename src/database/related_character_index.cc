#include "database/related_character_index.h"

#include <unicode/utf8.h>

#include <algorithm>

#include "text/utf8.h"

namespace lumeris {
namespace {

UChar32 AsciiLower(UChar32 c) { return c >= 'A' && c <= 'Z' ? c - 'A' + 'a' : c; }

}  // namespace

std::unique_ptr<RelatedCharacterIndex> RelatedCharacterIndex::Build(sqlite3* db) {
  sqlite3_stmt* statement = nullptr;
  if (sqlite3_prepare_v2(db, "select relatedChars from related_dict", -1, &statement, nullptr) !=
      SQLITE_OK) {
    sqlite3_finalize(statement);
    return nullptr;
  }
  auto index = std::make_unique<RelatedCharacterIndex>();
  int status;
  std::vector<UChar32> held;
  while ((status = sqlite3_step(statement)) == SQLITE_ROW) {
    const auto* text = reinterpret_cast<const char*>(sqlite3_column_text(statement, 0));
    if (text == nullptr || *text == '\0' || !DecodeUtf8(text)) continue;
    const auto row = static_cast<uint32_t>(index->rows_.size());
    index->rows_.emplace_back(text);
    const std::string& utf8 = index->rows_.back();
    held.clear();
    for (int32_t i = 0, length = static_cast<int32_t>(utf8.size()); i < length;) {
      UChar32 c;
      U8_NEXT(utf8.data(), i, length, c);
      held.push_back(AsciiLower(c));
    }
    std::sort(held.begin(), held.end());
    held.erase(std::unique(held.begin(), held.end()), held.end());
    for (UChar32 c : held) index->rows_holding_[c].push_back(row);
  }
  sqlite3_finalize(statement);
  if (status != SQLITE_DONE) return nullptr;
  return index;
}

std::span<const uint32_t> RelatedCharacterIndex::RowsHolding(UChar32 c) const {
  auto it = rows_holding_.find(AsciiLower(c));
  if (it == rows_holding_.end()) return {};
  return it->second;
}

}  // namespace lumeris
