#include "database/character_search_index.h"

#include <malloc.h>
#include <unicode/utf8.h>

#include <unordered_map>
#include <utility>

#include "database/search_filters.h"
#include "text/utf8.h"

namespace lumeris {
namespace {

uint32_t Trigram(const char* bytes) {
  return static_cast<uint32_t>(static_cast<uint8_t>(bytes[0])) << 16 |
         static_cast<uint32_t>(static_cast<uint8_t>(bytes[1])) << 8 |
         static_cast<uint32_t>(static_cast<uint8_t>(bytes[2]));
}

void AppendVarint(std::string& out, uint32_t value) {
  while (value >= 0x80) {
    out.push_back(static_cast<char>((value & 0x7f) | 0x80));
    value >>= 7;
  }
  out.push_back(static_cast<char>(value));
}

// Whether `text` is well-formed UTF-8: what DecodeUtf8 accepts (ICU decodes by the same rule),
// without making the string.
bool IsWellFormedUtf8(std::string_view text) {
  const auto length = static_cast<int32_t>(text.size());
  for (int32_t i = 0; i < length;) {
    UChar32 c;
    U8_NEXT(text.data(), i, length, c);
    if (c < 0) return false;
  }
  return true;
}

bool IsAscii(std::string_view text) {
  std::size_t i = 0;
  for (; i + 8 <= text.size(); i += 8) {
    uint64_t word;
    memcpy(&word, text.data() + i, 8);
    if ((word & 0x8080808080808080ULL) != 0) return false;
  }
  for (; i < text.size(); ++i) {
    if (static_cast<unsigned char>(text[i]) >= 0x80) return false;
  }
  return true;
}

// Field 0 folded as the search folds the whole `info` text (full case folding, code point by code
// point, which is context-free); ASCII needs no table: folding maps A-Z to a-z and nothing else.
std::optional<std::string> FoldedField0(std::string_view field0, bool ascii) {
  if (ascii) {
    std::string folded(field0);
    for (char& c : folded) {
      if (c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
    }
    return folded;
  }
  const std::optional<icu::UnicodeString> text = DecodeUtf8(field0);
  if (!text) return std::nullopt;
  return EncodeUtf8(CaseInsensitiveText::Fold(*text));
}

}  // namespace

std::unique_ptr<CharacterSearchIndex> CharacterSearchIndex::Build(sqlite3* db,
                                                                  const FontQueries& fonts) {
  sqlite3_stmt* statement = nullptr;
  // The same scan, in the same order, as the search statement (no ORDER BY, no usable index).
  if (sqlite3_prepare_v2(db, "select rowid, uchr, info from unihan_dict", -1, &statement,
                         nullptr) != SQLITE_OK) {
    sqlite3_finalize(statement);
    return nullptr;
  }
  std::unique_ptr<CharacterSearchIndex> index(new CharacterSearchIndex(fonts));
  // Room for the bundle's table (about 150,000 rows, 5 MB of field 0) without regrowing.
  index->folded_.reserve(6 << 20);
  for (auto* offsets : {&index->folded_start_, &index->uchr_start_}) offsets->reserve(160000);
  index->rowid_.reserve(160000);
  index->ascii_.reserve(160000);
  int status;
  while ((status = sqlite3_step(statement)) == SQLITE_ROW) {
    const auto* uchr = reinterpret_cast<const char*>(sqlite3_column_text(statement, 1));
    const auto* info = reinterpret_cast<const char*>(sqlite3_column_text(statement, 2));
    // Rows the search can never take a result from: no info text or one that does not decode
    // (the search skips the row), or a `uchr` the candidate tests always reject.
    // ShowableSearchCandidateIgnoringRegion without making the string: DecodeUtf8 succeeds on
    // exactly the well-formed texts.
    if (info == nullptr || !FirstCodePointIsShowable(uchr) || *uchr == '\0' ||
        !IsWellFormedUtf8(uchr)) {
      continue;
    }
    // As a C string, like the search reads it.
    const std::string_view info_text(info);
    const bool info_ascii = IsAscii(info_text);
    if (!info_ascii && !IsWellFormedUtf8(info_text)) continue;
    const std::string_view field0 = info_text.substr(0, info_text.find('|'));
    const bool ascii = info_ascii || IsAscii(field0);
    std::optional<std::string> folded = FoldedField0(field0, ascii);
    if (!folded) continue;
    index->folded_start_.push_back(static_cast<uint32_t>(index->folded_.size()));
    index->folded_ += *folded;
    index->folded_.push_back('\0');
    index->uchr_start_.push_back(static_cast<uint32_t>(index->uchr_.size()));
    index->uchr_ += uchr;
    index->rowid_.push_back(sqlite3_column_int64(statement, 0));
    index->ascii_.push_back(ascii ? 1 : 0);
  }
  sqlite3_finalize(statement);
  if (status != SQLITE_DONE) return nullptr;
  index->folded_start_.push_back(static_cast<uint32_t>(index->folded_.size()));
  index->uchr_start_.push_back(static_cast<uint32_t>(index->uchr_.size()));
  index->folded_.shrink_to_fit();
  index->uchr_.shrink_to_fit();
  const std::size_t rows = index->rowid_.size();
  index->emoji_ = std::make_unique<std::atomic<uint8_t>[]>(rows);
  index->default_like_ = std::make_unique<std::atomic<uint8_t>[]>(rows);
  return index;
}

bool CharacterSearchIndex::Contains(uint32_t row, std::string_view needle) const {
  const std::string_view text = folded(row);
  return memmem(text.data(), text.size(), needle.data(), needle.size()) != nullptr;
}

namespace {

template <typename Ask>
bool CachedAnswer(std::atomic<uint8_t>& slot, Ask&& ask) {
  uint8_t answer = slot.load(std::memory_order_relaxed);
  if (answer == 0) {
    answer = ask() ? 2 : 1;
    slot.store(answer, std::memory_order_relaxed);
  }
  return answer == 2;
}

}  // namespace

bool CharacterSearchIndex::EmojiFontDraws(uint32_t row) const {
  return CachedAnswer(emoji_[row],
                      [&] { return fonts_.emoji_font_draws(DecodeUtf8Lenient(uchr(row))); });
}

bool CharacterSearchIndex::DefaultLikeFontDraws(uint32_t row) const {
  return CachedAnswer(default_like_[row],
                      [&] { return fonts_.default_like_font_draws(DecodeUtf8Lenient(uchr(row))); });
}

bool CharacterSearchIndex::NoEmojiRowAfter(uint32_t row) const {
  return emoji_complete_.load(std::memory_order_acquire) &&
         static_cast<int64_t>(row) >= last_emoji_row_;
}

std::string_view CharacterSearchIndex::RarestPostings(std::string_view needle) const {
  std::string_view rarest;
  for (std::size_t i = 0; i + 3 <= needle.size(); ++i) {
    const auto it = std::lower_bound(trigrams_.begin(), trigrams_.end(), Trigram(needle.data() + i));
    if (it == trigrams_.end() || *it != Trigram(needle.data() + i)) return {};
    const auto k = static_cast<std::size_t>(it - trigrams_.begin());
    const std::string_view list =
        std::string_view(postings_).substr(posting_start_[k], posting_start_[k + 1] - posting_start_[k]);
    if (rarest.empty() || list.size() < rarest.size()) rarest = list;
  }
  return rarest;
}

bool CharacterSearchIndex::BuildTrigrams(const std::atomic<bool>& stop) {
  const uint32_t rows = size();
  // Each row's distinct trigrams, appended to their lists in row order, as deltas from the
  // list's previous row.
  std::unordered_map<uint32_t, std::pair<std::string, uint32_t>> lists;
  std::vector<uint32_t> trigrams;
  for (uint32_t row = 0; row < rows; ++row) {
    if ((row & 1023) == 0 && stop.load(std::memory_order_relaxed)) return false;
    const std::string_view text = folded(row);
    trigrams.clear();
    for (std::size_t i = 0; i + 3 <= text.size(); ++i) trigrams.push_back(Trigram(text.data() + i));
    std::sort(trigrams.begin(), trigrams.end());
    trigrams.erase(std::unique(trigrams.begin(), trigrams.end()), trigrams.end());
    for (uint32_t trigram : trigrams) {
      auto& [bytes, previous] = lists[trigram];
      AppendVarint(bytes, bytes.empty() ? row : row - previous);
      previous = row;
    }
  }
  trigrams_.reserve(lists.size());
  for (const auto& entry : lists) trigrams_.push_back(entry.first);
  std::sort(trigrams_.begin(), trigrams_.end());
  posting_start_.reserve(trigrams_.size() + 1);
  for (uint32_t trigram : trigrams_) {
    posting_start_.push_back(static_cast<uint32_t>(postings_.size()));
    postings_ += lists[trigram].first;
  }
  posting_start_.push_back(static_cast<uint32_t>(postings_.size()));
  lists = {};
  // The lists grew by reallocation; give the freed pages back.
  malloc_trim(0);
  trigrams_complete_.store(true, std::memory_order_release);
  return true;
}

void CharacterSearchIndex::CompleteInBackground(const std::atomic<bool>& stop) {
  // Trigrams first: they serve the searches of whole words, the most frequent.
  if (!trigrams_complete_.load(std::memory_order_acquire) && !BuildTrigrams(stop)) return;
  std::vector<uint32_t> emoji_rows;
  for (uint32_t row = 0; row < size(); ++row) {
    if (stop.load(std::memory_order_relaxed)) return;
    if (EmojiFontDraws(row)) emoji_rows.push_back(row);
  }
  emoji_rows_ = std::move(emoji_rows);
  last_emoji_row_ = emoji_rows_.empty() ? -1 : emoji_rows_.back();
  emoji_complete_.store(true, std::memory_order_release);
}

namespace {

// "LMSI", the format number and a byte-order mark, so that an index of another version or of a
// machine of the other byte order is rebuilt instead of misread.
constexpr std::string_view kMagic = "LMSI";
constexpr uint32_t kFormat = 1;
constexpr uint32_t kByteOrderMark = 0x01020304;

class Writer {
 public:
  template <typename T>
  void Pod(const T& value) {
    out_.append(reinterpret_cast<const char*>(&value), sizeof value);
  }
  template <typename T>
  void Vector(const std::vector<T>& values) {
    Pod(static_cast<uint64_t>(values.size()));
    out_.append(reinterpret_cast<const char*>(values.data()), values.size() * sizeof(T));
  }
  void Bytes(std::string_view bytes) {
    Pod(static_cast<uint64_t>(bytes.size()));
    out_.append(bytes);
  }
  std::string Take() { return std::move(out_); }

 private:
  std::string out_;
};

class Reader {
 public:
  explicit Reader(std::string_view in) : in_(in) {}
  template <typename T>
  bool Pod(T* value) {
    if (in_.size() < sizeof *value) return false;
    memcpy(value, in_.data(), sizeof *value);
    in_.remove_prefix(sizeof *value);
    return true;
  }
  template <typename T>
  bool Vector(std::vector<T>* values) {
    uint64_t count = 0;
    if (!Pod(&count) || count > in_.size() / sizeof(T)) return false;
    values->resize(count);
    if (count > 0) memcpy(values->data(), in_.data(), count * sizeof(T));
    in_.remove_prefix(count * sizeof(T));
    return true;
  }
  bool Bytes(std::string* bytes) {
    uint64_t count = 0;
    if (!Pod(&count) || count > in_.size()) return false;
    bytes->assign(in_.substr(0, count));
    in_.remove_prefix(count);
    return true;
  }
  bool AtEnd() const { return in_.empty(); }

 private:
  std::string_view in_;
};

// Offsets that start at 0, never go down and end at `end`, one more than `count`.
bool AreOffsets(const std::vector<uint32_t>& offsets, std::size_t count, std::size_t end) {
  return offsets.size() == count + 1 && offsets.front() == 0 && offsets.back() == end &&
         std::is_sorted(offsets.begin(), offsets.end());
}

}  // namespace

std::string CharacterSearchIndex::Serialize() const {
  Writer out;
  out.Bytes(kMagic);
  out.Pod(kFormat);
  out.Pod(kByteOrderMark);
  out.Bytes(folded_);
  out.Vector(folded_start_);
  out.Bytes(uchr_);
  out.Vector(uchr_start_);
  out.Vector(rowid_);
  out.Vector(ascii_);
  out.Vector(trigrams_);
  out.Vector(posting_start_);
  out.Bytes(postings_);
  return out.Take();
}

std::unique_ptr<CharacterSearchIndex> CharacterSearchIndex::Deserialize(std::string_view bytes,
                                                                        const FontQueries& fonts) {
  std::unique_ptr<CharacterSearchIndex> index(new CharacterSearchIndex(fonts));
  Reader in(bytes);
  std::string magic;
  uint32_t format = 0;
  uint32_t byte_order = 0;
  if (!in.Bytes(&magic) || magic != kMagic || !in.Pod(&format) || format != kFormat ||
      !in.Pod(&byte_order) || byte_order != kByteOrderMark || !in.Bytes(&index->folded_) ||
      !in.Vector(&index->folded_start_) || !in.Bytes(&index->uchr_) || !in.Vector(&index->uchr_start_) ||
      !in.Vector(&index->rowid_) || !in.Vector(&index->ascii_) || !in.Vector(&index->trigrams_) ||
      !in.Vector(&index->posting_start_) || !in.Bytes(&index->postings_) || !in.AtEnd() ||
      !index->IsConsistent()) {
    return nullptr;
  }
  const std::size_t rows = index->rowid_.size();
  index->emoji_ = std::make_unique<std::atomic<uint8_t>[]>(rows);
  index->default_like_ = std::make_unique<std::atomic<uint8_t>[]>(rows);
  index->trigrams_complete_.store(true, std::memory_order_release);
  return index;
}

bool CharacterSearchIndex::IsConsistent() const {
  const std::size_t rows = rowid_.size();
  if (ascii_.size() != rows || !AreOffsets(folded_start_, rows, folded_.size()) ||
      !AreOffsets(uchr_start_, rows, uchr_.size()) ||
      !std::is_sorted(trigrams_.begin(), trigrams_.end()) ||
      !AreOffsets(posting_start_, trigrams_.size(), postings_.size())) {
    return false;
  }
  // Every folded text ends with its NUL; every posting list ends a number, so reading one never
  // runs into the next (ForEachMatch() also stops at a row beyond the last).
  for (std::size_t row = 0; row < rows; ++row) {
    if (folded_start_[row + 1] == folded_start_[row] || folded_[folded_start_[row + 1] - 1] != '\0') return false;
  }
  for (std::size_t k = 0; k < trigrams_.size(); ++k) {
    if (posting_start_[k + 1] == posting_start_[k] ||
        static_cast<uint8_t>(postings_[posting_start_[k + 1] - 1]) >= 0x80) {
      return false;
    }
  }
  return true;
}

}  // namespace lumeris
