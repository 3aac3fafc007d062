#include "database/character_database.h"

#include <string.h>

#include <array>
#include <utility>
#include <vector>

#include "categories/system_bundles.h"
#include "database/character_info_fields.h"
#include "database/search_filters.h"
#include "platform/property_list_io.h"
#include "text/replacement_dictionary.h"
#include "text/scalar.h"
#include "text/utf8.h"

namespace lumeris {
namespace {

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
  static LMCharacterDatabase* const shared =
      new LMCharacterDatabase(&ApplicationBundleResource, FontQueries::Installed());
  return *shared;
}

LMCharacterDatabase::LMCharacterDatabase(ResourcePathLookup lookup, FontQueries fonts)
    : lookup_(std::move(lookup)), fonts_(std::move(fonts)) {}

LMCharacterDatabase::~LMCharacterDatabase() {
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

MessageValue LMCharacterDatabase::createXPCArrayForSearchString(const icu::UnicodeString& text,
                                                                std::int64_t maxCount) {
  Connection* connection = Open(_charDatabase, "CharacterDB");
  if (connection == nullptr) return MessageValue::Null();
  const std::optional<std::string> utf8 = EncodeUtf8(text);
  if (!utf8) return MessageValue::Null();
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

MessageValue LMCharacterDatabase::createXPCArrayForRelatedCharacters(
    const icu::UnicodeString& character, std::int64_t maxCount) {
  Connection* connection = Open(_relatedCharDatabase, "RelatedCharDB");
  if (connection == nullptr) return MessageValue::Null();
  const std::optional<std::string> utf8 = EncodeUtf8(character);
  if (!utf8) return MessageValue::Null();
  // "!" escapes the first letter, so a "%" or "_" asked for matches only itself.
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
    const char16_t* units = row->getBuffer();
    const int32_t length = row->length();
    for (int32_t i = 0; i < length && count < maxCount;) {
      const int32_t step = i < length - 1 && IsSurrogatePair(units + i) ? 2 : 1;
      const icu::UnicodeString piece(units + i, step);
      i += step;
      if (piece == character || !fonts_.default_like_font_draws(piece)) continue;
      result.Append(MessageValue::String(EncodeUtf8Lenient(piece)));
      ++count;
    }
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
