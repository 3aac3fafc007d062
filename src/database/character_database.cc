#include "database/character_database.h"

#include <stdlib.h>
#include <string.h>
#include <sys/resource.h>
#include <unicode/utf8.h>
#include <unistd.h>

#include <array>
#include <utility>
#include <vector>

#include "categories/regional_restriction.h"
#include "categories/system_bundles.h"
#include "database/character_info_fields.h"
#include "database/search_filters.h"
#include "database/search_index_table.h"
#include "platform/property_list_io.h"
#include "text/replacement_dictionary.h"
#include "text/scalar.h"
#include "text/utf8.h"

namespace lumeris {
namespace {

// Longest search text (UTF-8 bytes) the index answers; see createXPCArrayForSearchString.
constexpr std::size_t kIndexedSearchMaxBytes = 1000;

// A prepared statement and its SQL text, released together.
class Statement {
 public:
  explicit Statement(char* sql) : sql_(sql) {}
  Statement(const Statement&) = delete;
  Statement& operator=(const Statement&) = delete;
  ~Statement() {
    sqlite3_finalize(statement_);
    sqlite3_free(sql_);
  }
  bool Prepare(sqlite3* db) {
    return sqlite3_prepare_v2(db, sql_, static_cast<int>(strlen(sql_)), &statement_, nullptr) ==
           SQLITE_OK;
  }
  bool Step() { return sqlite3_step(statement_) == SQLITE_ROW; }
  sqlite3_stmt* get() const { return statement_; }
  const char* Text(int column) const {
    return reinterpret_cast<const char*>(sqlite3_column_text(statement_, column));
  }

 private:
  char* sql_;
  sqlite3_stmt* statement_ = nullptr;
};

// One info field's share of a search: the emoji-font characters (UTF-8, in row order), the other
// candidates waiting for the reply (in row order) and whether the emoji part reached the limit.
struct SearchBucket {
  bool used = false;
  bool full = false;
  std::vector<std::string> emoji;
  std::vector<icu::UnicodeString> deferred;
};

std::optional<std::filesystem::path> ApplicationBundleResource(std::string_view name,
                                                               std::string_view type) {
  std::optional<Bundle> bundle = OpenApplicationBundle();
  if (!bundle) return std::nullopt;
  return bundle->PathForResource(name, type);
}

}  // namespace

LMCharacterDatabase& LMCharacterDatabase::sharedDatabase() {
  // LUMERIS_DATABASE_RULES=reference selects the reference rules, for benchmarks comparing them.
  static LMCharacterDatabase* const shared = [] {
    const char* rules = getenv("LUMERIS_DATABASE_RULES");
    return new LMCharacterDatabase(
        &ApplicationBundleResource, FontQueries::Installed(),
        rules != nullptr && strcmp(rules, "reference") == 0 ? Rules::kReference : Rules::kIndexed);
  }();
  return *shared;
}

LMCharacterDatabase::LMCharacterDatabase(ResourcePathLookup lookup, FontQueries fonts, Rules rules)
    : lookup_(std::move(lookup)), fonts_(std::move(fonts)), rules_(rules) {}

LMCharacterDatabase::~LMCharacterDatabase() {
  stopping_.store(true);
  if (completion_.joinable()) completion_.join();
  if (_charDatabase.handle != nullptr) sqlite3_close(_charDatabase.handle);
  if (_relatedCharDatabase.handle != nullptr) sqlite3_close(_relatedCharDatabase.handle);
}

sqlite3* LMCharacterDatabase::_openDatabase(std::string_view name) {
  const std::optional<std::filesystem::path> path = lookup_(name, "sqlite3");
  // Without a path the open call still runs, on "" (an empty private database): the request
  // then fails at its query, and the handle is kept like any other.
  sqlite3* db = nullptr;
  sqlite3_open_v2(path ? path->c_str() : "", &db, SQLITE_OPEN_READONLY, nullptr);
  return db;
}

LMCharacterDatabase::Connection* LMCharacterDatabase::Open(Connection& connection,
                                                           std::string_view name) {
  std::lock_guard lock(open_mutex_);
  if (connection.handle == nullptr) connection.handle = _openDatabase(name);
  return connection.handle != nullptr ? &connection : nullptr;
}

const plist::Dictionary* LMCharacterDatabase::_hanLanguageInfo() {
  std::lock_guard lock(open_mutex_);
  if (_languageInfo) return _languageInfo.get();
  const std::optional<std::filesystem::path> path = lookup_("HanLanguageInfo", "plist");
  if (!path) return nullptr;
  std::optional<plist::Value> value = plist::ReadPropertyListFile(*path);
  if (!value || value->AsDictionary() == nullptr) return nullptr;
  _languageInfo = std::make_unique<const plist::Dictionary>(std::move(*value->AsDictionary()));
  return _languageInfo.get();
}

std::optional<plist::Value> LMCharacterDatabase::LanguageListEntry(std::string_view list,
                                                                   std::string_view key) {
  const plist::Dictionary* info = _hanLanguageInfo();
  if (info == nullptr) return std::nullopt;
  auto table = info->find(list);
  const plist::Dictionary* entries = table != info->end() ? table->second.AsDictionary() : nullptr;
  if (entries == nullptr) return std::nullopt;
  auto entry = entries->find(key);
  if (entry == entries->end()) return std::nullopt;
  return entry->second;
}

std::optional<plist::Value> LMCharacterDatabase::languageForFieldTag(std::string_view tag) {
  return LanguageListEntry("tags", tag);
}

std::optional<plist::Value> LMCharacterDatabase::tagsForLanguage(std::string_view language) {
  return LanguageListEntry("languages", language);
}

void LMCharacterDatabase::PrepareSearchIndex() {
  if (rules_ != Rules::kIndexed) return;
  Connection* connection = Open(_charDatabase, "CharacterDB");
  if (connection == nullptr) return;
  SearchIndex(*connection);
}

const CharacterSearchIndex* LMCharacterDatabase::SearchIndex(Connection& connection) {
  std::call_once(search_index_once_, [&] {
    // On a connection of its own, so that searches answered by the reference meanwhile (see
    // createXPCArrayForSearchString) do not wait for the whole table to be read.
    const char* path = sqlite3_db_filename(connection.handle, "main");
    sqlite3* db = nullptr;
    if (path != nullptr && *path != '\0' &&
        sqlite3_open_v2(path, &db, SQLITE_OPEN_READONLY, nullptr) == SQLITE_OK) {
      // The copy the resource builder stored (read in a few milliseconds: searches wait for
      // it), else the table itself (searches meanwhile go to the reference).
      search_index_ = ReadSearchIndexTable(db, fonts_);
      if (!search_index_) {
        reading_table_.store(true);
        search_index_ = CharacterSearchIndex::Build(db, fonts_);
      }
    }
    sqlite3_close(db);
    if (search_index_) {
      completion_ = std::thread([this] {
        // Below the requests: they are served from the index as it stands meanwhile.
        setpriority(PRIO_PROCESS, static_cast<id_t>(gettid()), 10);
        search_index_->CompleteInBackground(stopping_);
      });
    }
    search_index_ready_.store(true, std::memory_order_release);
  });
  return search_index_.get();
}

const RelatedCharacterIndex* LMCharacterDatabase::RelatedIndex(Connection& connection) {
  std::call_once(related_index_once_, [&] {
    std::lock_guard lock(connection.query_mutex);
    related_index_ = RelatedCharacterIndex::Build(connection.handle);
  });
  return related_index_.get();
}

bool LMCharacterDatabase::InfoMatchesLike(Connection& connection, sqlite3_int64 rowid,
                                          const std::string& pattern) {
  std::lock_guard lock(connection.query_mutex);
  sqlite3_stmt* statement = nullptr;
  bool matches = false;
  if (sqlite3_prepare_v2(connection.handle, "select info from unihan_dict where rowid = ?", -1,
                         &statement, nullptr) == SQLITE_OK) {
    sqlite3_bind_int64(statement, 1, rowid);
    if (sqlite3_step(statement) == SQLITE_ROW) {
      const auto* info = reinterpret_cast<const char*>(sqlite3_column_text(statement, 0));
      // The LIKE operator without ESCAPE is this comparison (ASCII case folded, "%" and "_"
      // wildcards, no escape character).
      matches = info != nullptr && sqlite3_strlike(pattern.c_str(), info, 0) == 0;
    }
  }
  sqlite3_finalize(statement);
  return matches;
}

MessageValue LMCharacterDatabase::createXPCArrayForSearchString(const icu::UnicodeString& text,
                                                                std::int64_t maxCount) {
  Connection* connection = Open(_charDatabase, "CharacterDB");
  if (connection == nullptr) return MessageValue::Null();
  const std::optional<std::string> utf8 = EncodeUtf8(text);
  if (!utf8) return MessageValue::Null();
  // The index answers texts without NUL (the statement would see the text cut there) and
  // without "|" (a match could then run from field 0 into the next field), short enough that
  // the LIKE pattern stays far below SQLite's pattern length limit; the reference answers the
  // rest.
  if (rules_ == Rules::kIndexed && utf8->find('\0') == std::string::npos &&
      utf8->find('|') == std::string::npos && utf8->size() <= kIndexedSearchMaxBytes) {
    // While the index is built from the table, the reference answers (reading the table takes
    // several times as long as one reference search).
    const bool wait = search_index_ready_.load(std::memory_order_acquire) || !reading_table_.load();
    if (wait && SearchIndex(*connection) != nullptr)
      return IndexedSearch(*connection, *utf8, text, maxCount);
  }
  return ReferenceSearch(*connection, *utf8, text, maxCount);
}

// Why the indexed search gives the reference's reply:
// - Row set. The reference takes a row when `info` LIKE "%text%" and the first case-insensitive
//   match of the text in `info` starts in field 0; later matches of the row add nothing (a match
//   in field 0 again is skipped, other fields have no search tag), so a row gives at most one
//   candidate, always to bucket 0, and only bucket 0 reaches the reply. The text holds no "|" and
//   folding maps nothing else to "|", so a match never spans a "|": the first match starts in
//   field 0 exactly when folded field 0 contains the folded text. UTF-8 is self-synchronizing,
//   so comparing UTF-8 bytes finds the same containment as comparing UTF-16 units.
// - LIKE. Then "%text%" must also match `info`. When the text is ASCII without "%" and "_" and
//   field 0 is ASCII, folded field 0 is field 0 with A-Z lowered, so it containing the lowered
//   text means field 0, and so `info`, contains the text up to ASCII case: the LIKE holds. In
//   every other case the row's `info` is read and tested with SQLite's own LIKE comparison.
// - Candidate tests. Rows the index left out fail a test for every request; the regional test
//   runs per request; the font answers are fixed per string, so caching them per row is safe.
// - Stopping early. Once the emoji part is full (only with a limit from 0 to 2^63 - 1) the
//   reference appends no further emoji, and no deferred one (n >= limit): nothing later counts.
//   The reference admits the first limit - n drawable deferred characters, n the final emoji
//   count; n only grows, so keeping the first limit - (emoji so far) drawable ones suffices, and
//   once that many are kept and no emoji row follows, nothing later counts. With a negative
//   limit no deferred character is admitted, so only emoji rows are visited.
MessageValue LMCharacterDatabase::IndexedSearch(Connection& connection, const std::string& utf8,
                                                const icu::UnicodeString& text,
                                                std::int64_t maxCount) {
  const CharacterSearchIndex& index = *search_index_;
  const std::optional<std::string> folded = EncodeUtf8(CaseInsensitiveText::Fold(text));
  // An empty text (or one folding to nothing) matches no row.
  if (!folded || folded->empty()) return MessageValue::MakeArray();
  bool ascii_plain = true;
  for (char c : utf8) {
    if (static_cast<unsigned char>(c) >= 0x80 || c == '%' || c == '_') ascii_plain = false;
  }
  const std::string pattern = "%" + utf8 + "%";
  const bool negative = maxCount < 0;
  std::vector<std::string> emoji;
  std::vector<std::string> deferred;
  index.ForEachMatch(*folded, negative, [&](uint32_t row) {
    const bool is_emoji = index.EmojiFontDraws(row);
    const auto room = negative ? 0 : maxCount - static_cast<std::int64_t>(emoji.size());
    if (!is_emoji && static_cast<std::int64_t>(deferred.size()) >= room) {
      return !index.NoEmojiRowAfter(row);
    }
    if (!(ascii_plain && index.field0_is_ascii(row)) &&
        !InfoMatchesLike(connection, index.rowid(row), pattern)) {
      return true;
    }
    const std::string_view uchr = index.uchr(row);
    if (ShouldHideThisCharacter(DecodeUtf8Lenient(uchr))) return true;
    if (is_emoji) {
      emoji.emplace_back(uchr);
      // Unsigned on purpose, as in the reference.
      return static_cast<std::uint64_t>(emoji.size()) < static_cast<std::uint64_t>(maxCount);
    }
    if (index.DefaultLikeFontDraws(row))
      deferred.push_back(EncodeUtf8Lenient(DecodeUtf8Lenient(uchr)));
    return true;
  });

  MessageValue result = MessageValue::MakeArray();
  for (std::string& character : emoji) result.Append(MessageValue::String(std::move(character)));
  const auto n = static_cast<std::int64_t>(emoji.size());
  for (std::size_t i = 0; i < deferred.size() && n + static_cast<std::int64_t>(i) < maxCount; ++i)
    result.Append(MessageValue::String(std::move(deferred[i])));
  return result;
}

MessageValue LMCharacterDatabase::ReferenceSearch(Connection& connection_ref,
                                                  const std::string& utf8_text,
                                                  const icu::UnicodeString& text,
                                                  std::int64_t maxCount) {
  Connection* connection = &connection_ref;
  const std::string* utf8 = &utf8_text;
  char* sql =
      sqlite3_mprintf("select * from unihan_dict where info like '%%%q%%' ;", utf8->c_str());
  if (sql == nullptr) return MessageValue::Null();
  Statement statement(sql);
  std::lock_guard lock(connection->query_mutex);
  if (!statement.Prepare(connection->handle)) return MessageValue::Null();

  // LIKE folds ASCII case only; the search in each row's text decides, ignoring case fully.
  const icu::UnicodeString needle = CaseInsensitiveText::Fold(text);
  std::array<SearchBucket, kCharacterInfoFieldCount> buckets;
  while (statement.Step()) {
    const char* uchr = statement.Text(0);
    const char* info_utf8 = statement.Text(1);
    if (info_utf8 == nullptr) continue;
    const std::optional<icu::UnicodeString> decoded = DecodeUtf8(info_utf8);
    if (!decoded) continue;
    const CaseInsensitiveText info(*decoded);
    int32_t last_field = -1;
    for (auto match = info.Find(needle, 0); match; match = info.Find(needle, match->end)) {
      int32_t field = 0;
      int32_t field_start = 0;
      for (int32_t i = 0; i < match->start; ++i) {
        if (decoded->charAt(i) == u'|') {
          ++field;
          field_start = i + 1;
        }
      }
      if (field == last_field) continue;
      // A row with more than sixteen fields: the extra ones have no search tag.
      const std::string_view tag = static_cast<std::size_t>(field) < SearchFieldTags.size()
                                       ? SearchFieldTags[static_cast<std::size_t>(field)]
                                       : "";
      int32_t field_end = decoded->indexOf(u'|', match->end);
      if (field_end < 0) field_end = decoded->length();
      last_field = field;
      if (tag.empty() || field_end == field_start) continue;

      SearchBucket& bucket = buckets[static_cast<std::size_t>(field)];
      bucket.used = true;
      if (bucket.full) continue;
      const std::optional<icu::UnicodeString> candidate = ShowableSearchCandidate(uchr);
      if (!candidate) continue;
      if (fonts_.emoji_font_draws(*candidate)) {
        bucket.emoji.emplace_back(uchr);
        // Unsigned on purpose: a limit of 2^63 or more never fills a bucket.
        if (static_cast<std::uint64_t>(bucket.emoji.size()) >=
            static_cast<std::uint64_t>(maxCount)) {
          bucket.full = true;
        }
      } else {
        bucket.deferred.push_back(*candidate);
      }
    }
  }

  MessageValue result = MessageValue::MakeArray();
  for (SearchBucket& bucket : buckets) {
    if (!bucket.used) continue;
    for (std::string& character : bucket.emoji)
      result.Append(MessageValue::String(std::move(character)));
    const auto n = static_cast<std::int64_t>(bucket.emoji.size());
    // Signed on purpose: a limit of 2^63 or more admits no deferred character.
    if (bucket.deferred.empty() || n >= maxCount) continue;
    std::int64_t count = 0;
    for (const icu::UnicodeString& candidate : bucket.deferred) {
      if (!fonts_.default_like_font_draws(candidate)) continue;
      result.Append(MessageValue::String(EncodeUtf8Lenient(candidate)));
      if (n + ++count >= maxCount) break;
    }
  }
  return result;
}

void LMCharacterDatabase::AppendRelatedPieces(const icu::UnicodeString& row,
                                              const icu::UnicodeString& character,
                                              std::int64_t maxCount, std::int64_t& count,
                                              MessageValue& result) {
  const char16_t* units = row.getBuffer();
  const int32_t length = row.length();
  for (int32_t i = 0; i < length && count < maxCount;) {
    const int32_t step = i < length - 1 && IsSurrogatePair(units + i) ? 2 : 1;
    const icu::UnicodeString piece(units + i, step);
    i += step;
    if (piece == character || !fonts_.default_like_font_draws(piece)) continue;
    result.Append(MessageValue::String(EncodeUtf8Lenient(piece)));
    ++count;
  }
}

MessageValue LMCharacterDatabase::createXPCArrayForRelatedCharacters(
    const icu::UnicodeString& character, std::int64_t maxCount) {
  Connection* connection = Open(_relatedCharDatabase, "RelatedCharDB");
  if (connection == nullptr) return MessageValue::Null();
  const std::optional<std::string> utf8 = EncodeUtf8(character);
  if (!utf8) return MessageValue::Null();
  // "!" escapes the first letter, so a "%" or "_" asked for matches only itself.
  const std::string pattern = "%!" + *utf8 + "%";

  // Indexed: the pattern needs the first letter literally (up to ASCII case), so only the rows
  // holding it can match, in table order; SQLite's LIKE comparison with the same pattern and
  // escape then decides each, exactly as the statement would. An empty text (the pattern then
  // escapes the closing "%"), a NUL (the statement would see the text cut there) or a very long
  // text goes to the reference.
  if (rules_ == Rules::kIndexed && !utf8->empty() && utf8->find('\0') == std::string::npos &&
      utf8->size() <= kIndexedSearchMaxBytes) {
    if (const RelatedCharacterIndex* index = RelatedIndex(*connection)) {
      MessageValue result = MessageValue::MakeArray();
      std::int64_t count = 0;
      int32_t i = 0;
      UChar32 first;
      U8_NEXT(utf8->data(), i, static_cast<int32_t>(utf8->size()), first);
      for (uint32_t row : index->RowsHolding(first)) {
        if (count >= maxCount) break;
        const std::string& text = index->text(row);
        if (sqlite3_strlike(pattern.c_str(), text.c_str(), '!') != 0) continue;
        AppendRelatedPieces(DecodeUtf8Lenient(text), character, maxCount, count, result);
      }
      return result;
    }
  }

  char* sql = sqlite3_mprintf(
      "select relatedChars from related_dict where relatedChars like '%%!%q%%' escape '!';",
      utf8->c_str());
  if (sql == nullptr) return MessageValue::Null();
  Statement statement(sql);
  MessageValue result = MessageValue::MakeArray();
  std::lock_guard lock(connection->query_mutex);
  if (!statement.Prepare(connection->handle)) return result;

  std::int64_t count = 0;
  while (count < maxCount && statement.Step()) {
    const char* row_utf8 = statement.Text(0);
    const std::optional<icu::UnicodeString> row = DecodeUtf8(row_utf8 != nullptr ? row_utf8 : "");
    if (!row || row->isEmpty()) continue;
    AppendRelatedPieces(*row, character, maxCount, count, result);
  }
  return result;
}

std::optional<CharacterInfoRecord> LMCharacterDatabase::searchCharacterInfo(
    const icu::UnicodeString& character) {
  Connection* connection = Open(_charDatabase, "CharacterDB");
  if (connection == nullptr) return std::nullopt;
  const std::optional<icu::UnicodeString> key = ReplacementDictionaryNormalizedKeyString(character);
  const std::optional<std::string> utf8 = EncodeUtf8(key ? *key : character);
  if (!utf8) return std::nullopt;
  char* sql = sqlite3_mprintf("select * from unihan_dict where uchr = '%q' ;", utf8->c_str());
  if (sql == nullptr) return std::nullopt;
  Statement statement(sql);
  std::lock_guard lock(connection->query_mutex);
  if (!statement.Prepare(connection->handle)) return std::nullopt;

  while (statement.Step()) {
    const char* column_name = sqlite3_column_name(statement.get(), 1);
    if (column_name == nullptr) break;
    if (strlen(column_name) >= 5) continue;
    const char* info = statement.Text(1);
    if (info == nullptr || *info == '\0' || !DecodeUtf8(info)) continue;
    std::vector<std::string_view> fields;
    std::string_view rest(info);
    for (std::size_t bar; (bar = rest.find('|')) != std::string_view::npos;
         rest.remove_prefix(bar + 1)) {
      fields.push_back(rest.substr(0, bar));
    }
    fields.push_back(rest);
    if (fields.size() != CharacterInfoFieldTags.size()) continue;
    CharacterInfoRecord record;
    for (std::size_t i = 0; i < fields.size(); ++i) {
      record.emplace(std::string(CharacterInfoFieldTags[i]), std::string(fields[i]));
    }
    return record;
  }
  return std::nullopt;
}

MessageValue LMCharacterDatabase::createXPCDictionaryForCharacterInfo(
    const icu::UnicodeString& character) {
  MessageValue dictionary = MessageValue::MakeDictionary();
  if (std::optional<CharacterInfoRecord> record = searchCharacterInfo(character)) {
    for (auto& [tag, value] : *record) dictionary.Set(tag, MessageValue::String(value));
  }
  return dictionary;
}

}  // namespace lumeris
