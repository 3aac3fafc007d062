// CharacterSearchIndex: an in-memory copy of what the character search needs from unihan_dict,
// read once per process, so that a search visits only the rows whose field 0 holds the search
// text instead of running a LIKE scan over every row.
//
//   std::unique_ptr<CharacterSearchIndex> index = CharacterSearchIndex::Build(db, fonts);
//   index->ForEachMatch(folded_utf8, [&](uint32_t row) { ...; return true; });  // row order
//   index->CompleteInBackground(stop);   // emoji answers of every row and a trigram index
//
// What it keeps, per row of the table that can ever produce a search result (its `info` text is
// well-formed UTF-8 and its `uchr` text is well-formed, non-empty UTF-8 whose first code point is
// printable, not white space and not default-ignorable): the `uchr` text, the rowid, field 0 of
// `info` with full Unicode case folding (the folding the search uses) as UTF-8, whether field 0 is
// pure ASCII, and two lazily filled answers: does the colour emoji font draw `uchr`, and does a
// font like the default font draw it. Rows are kept in the table's scan order, the order a search
// statement without ORDER BY returns them in.
//
// The folded texts lie end to end in one buffer, each followed by a NUL, so that a search text
// without NUL is found by a single pass of memmem over the buffer. CompleteInBackground() adds a
// trigram index over the folded bytes (per trigram, the rows holding it, delta-coded), after
// which texts of three bytes or more visit only the rows of their rarest trigram, then asks the
// emoji question for every row, after which the position of the last emoji row is known.
//
// The resource builder stores the index with its trigrams in the database (search_index_table.h),
// so that a service reads it at start instead of scanning and folding the whole table:
// Serialize() writes everything but the font answers, Deserialize() checks and reads it back.
//
// Thread-safety: after Build() or Deserialize() every const member may be called from any thread
// at the same time; CompleteInBackground() runs on one thread beside them (what it adds is
// published with release stores). The font answers are cached per row with atomics; the font
// queries must give the same answer for the same string for the life of the index.
#pragma once

#include <sqlite3.h>
#include <string.h>
#include <unicode/unistr.h>

#include <algorithm>
#include <atomic>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "database/font_queries.h"

namespace lumeris {

class CharacterSearchIndex {
 public:
  // Reads unihan_dict through `db` (the caller holds whatever lock the connection needs);
  // nullptr when the table cannot be read to its end.
  static std::unique_ptr<CharacterSearchIndex> Build(sqlite3* db, const FontQueries& fonts);

  // Calls `visit(row)` for each row, in row order, whose folded field 0 contains `folded`
  // (UTF-8, non-empty, without NUL) until `visit` returns false. With `emoji_only`, visits only
  // rows whose `uchr` the emoji font draws (all rows until the emoji answers are complete).
  template <typename Visit>
  void ForEachMatch(std::string_view folded, bool emoji_only, Visit&& visit) const;

  std::string_view uchr(uint32_t row) const {
    return std::string_view(uchr_).substr(uchr_start_[row],
                                          uchr_start_[row + 1] - uchr_start_[row]);
  }
  sqlite3_int64 rowid(uint32_t row) const { return rowid_[row]; }
  bool field0_is_ascii(uint32_t row) const { return ascii_[row] != 0; }
  bool EmojiFontDraws(uint32_t row) const;
  bool DefaultLikeFontDraws(uint32_t row) const;
  // True when the emoji answers of all rows are known and no row after `row` is an emoji row.
  bool NoEmojiRowAfter(uint32_t row) const;

  // Builds the trigram index unless it was read with the index, then asks the emoji question for
  // every row; returns early when `stop` becomes true. Call at most once.
  void CompleteInBackground(const std::atomic<bool>& stop);

  // The trigram index alone (for the builder, before Serialize()); false when `stop` became true.
  bool BuildTrigrams(const std::atomic<bool>& stop);

  // The rows and trigrams as bytes of this machine's byte order; Deserialize() takes them back,
  // and gives nullptr for bytes that are not a whole, consistent index.
  std::string Serialize() const;
  static std::unique_ptr<CharacterSearchIndex> Deserialize(std::string_view bytes, const FontQueries& fonts);

  uint32_t size() const { return static_cast<uint32_t>(rowid_.size()); }

 private:
  explicit CharacterSearchIndex(FontQueries fonts) : fonts_(std::move(fonts)) {}
  std::string_view folded(uint32_t row) const {
    return std::string_view(folded_).substr(folded_start_[row],
                                            folded_start_[row + 1] - folded_start_[row] - 1);
  }
  bool Contains(uint32_t row, std::string_view needle) const;
  // The posting list of the rarest trigram of `needle` (at least three bytes); empty when some
  // trigram of it is in no row.
  std::string_view RarestPostings(std::string_view needle) const;
  // Whether the offsets and posting lists stay inside the buffers (checked on Deserialize()).
  bool IsConsistent() const;

  const FontQueries fonts_;
  std::string folded_;                  // folded field 0 of every row, each followed by NUL
  std::vector<uint32_t> folded_start_;  // size() + 1 offsets into folded_
  std::string uchr_;
  std::vector<uint32_t> uchr_start_;  // size() + 1 offsets into uchr_
  std::vector<sqlite3_int64> rowid_;
  std::vector<uint8_t> ascii_;
  // Font answers per row: 0 not asked yet, 1 no, 2 yes.
  std::unique_ptr<std::atomic<uint8_t>[]> emoji_;
  std::unique_ptr<std::atomic<uint8_t>[]> default_like_;

  // Filled by CompleteInBackground, readable once the flags below are set (acquire).
  std::vector<uint32_t> emoji_rows_;
  int64_t last_emoji_row_ = -1;
  std::atomic<bool> emoji_complete_{false};
  // Per trigram in ascending order, its rows as varint deltas: postings_ from posting_start_[i].
  std::vector<uint32_t> trigrams_;
  std::vector<uint32_t> posting_start_;  // trigrams_.size() + 1 offsets into postings_
  std::string postings_;
  std::atomic<bool> trigrams_complete_{false};
};

template <typename Visit>
void CharacterSearchIndex::ForEachMatch(std::string_view needle, bool emoji_only,
                                        Visit&& visit) const {
  if (emoji_only && emoji_complete_.load(std::memory_order_acquire)) {
    for (uint32_t row : emoji_rows_) {
      if (Contains(row, needle) && !visit(row)) return;
    }
    return;
  }
  if (needle.size() >= 3 && trigrams_complete_.load(std::memory_order_acquire)) {
    const std::string_view postings = RarestPostings(needle);
    uint32_t row = 0;
    for (std::size_t i = 0; i < postings.size();) {
      uint32_t delta = 0;
      for (int shift = 0; shift < 32; shift += 7) {
        const auto byte = static_cast<uint8_t>(postings[i++]);
        delta |= static_cast<uint32_t>(byte & 0x7f) << shift;
        if ((byte & 0x80) == 0) break;
      }
      row += delta;
      // Only a damaged stored index has rows beyond the last.
      if (row >= size()) return;
      if (Contains(row, needle) && !visit(row)) return;
    }
    return;
  }
  // One pass over the whole buffer: a hit cannot span two rows, the needle having no NUL.
  const char* const begin = folded_.data();
  const char* const end = begin + folded_.size();
  const char* from = begin;
  while (from < end) {
    const void* hit =
        memmem(from, static_cast<std::size_t>(end - from), needle.data(), needle.size());
    if (hit == nullptr) return;
    const auto offset = static_cast<uint32_t>(static_cast<const char*>(hit) - begin);
    const auto next = std::upper_bound(folded_start_.begin(), folded_start_.end(), offset);
    const auto row = static_cast<uint32_t>(next - folded_start_.begin() - 1);
    if (!visit(row)) return;
    from = begin + *next;
  }
}

}  // namespace lumeris
