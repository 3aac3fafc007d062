#include "resource_builder/character_info.h"

#include <algorithm>
#include <cctype>
#include <unordered_set>

#include "resource_builder/utf8.h"
#include "resource_builder/zhuyin.h"

namespace lumeris::resources {
namespace {

enum FieldIndex : size_t {
  kUnam = 0, kJyom, kKrpi, kSpin, kSwbx, kSwbh, kSbix, kCbai,
  kTcan, kTday, kTpin, kTzhu, kRsu1, kRsu2, kRsu3, kRsu4,
};

std::vector<std::string_view> SplitSpaces(std::string_view text) {
  std::vector<std::string_view> out;
  size_t pos = 0;
  while (pos < text.size()) {
    size_t space = text.find(' ', pos);
    if (space == std::string_view::npos) space = text.size();
    if (space > pos) out.push_back(text.substr(pos, space - pos));
    pos = space + 1;
  }
  return out;
}

std::string Lowercase(std::string_view text) {
  std::string out(text);
  for (char& c : out) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
  return out;
}

// kHangul values carry a source tag ("심:0E"); the reading is the part before the colon.
std::string HangulReadings(std::string_view value) {
  std::string out;
  for (std::string_view item : SplitSpaces(value)) {
    std::string_view reading = item.substr(0, item.find(':'));
    if (!out.empty()) out += ' ';
    out += reading;
  }
  return out;
}

std::string Joined(std::string_view a, std::string_view b) {
  if (a.empty()) return std::string(b);
  if (b.empty()) return std::string(a);
  return std::string(a) + "; " + std::string(b);
}

void AddAnnotation(const CldrAnnotations& english, std::u32string_view text, std::vector<std::string>& parts) {
  std::u32string key;
  for (char32_t cp : text) {
    if (cp != 0xFE0F) key.push_back(cp);
  }
  auto it = english.find(ToUtf8(key));
  if (it == english.end()) return;
  parts.push_back(it->second.name);
  parts.insert(parts.end(), it->second.keywords.begin(), it->second.keywords.end());
}

std::vector<std::string> CodePointNameParts(const CodePointRecord& record, const CharacterSources& sources) {
  std::vector<std::string> parts;
  if (!record.name.empty()) parts.push_back(record.name);
  if (auto it = sources.aliases.find(record.code_point); it != sources.aliases.end()) {
    for (const NameAlias& alias : it->second) {
      if (alias.type != "figment") parts.push_back(alias.alias);
    }
  }
  AddAnnotation(sources.english, std::u32string(1, record.code_point), parts);
  parts.emplace_back(sources.unihan.Field(record.code_point, "kDefinition"));
  return parts;
}

InfoFields CodePointFields(const CodePointRecord& record, const CharacterSources& sources) {
  InfoFields fields = HanInfoFields(record.code_point, sources.unihan);
  fields[kUnam] = JoinNameParts(CodePointNameParts(record, sources));
  return fields;
}

InfoFields SequenceFields(const EmojiTestEntry& entry, const CharacterSources& sources) {
  std::vector<std::string> parts;
  parts.push_back(entry.name);
  // A single character with a presentation selector keeps that character's Unicode name too.
  if (entry.sequence.size() == 2 && entry.sequence[1] == 0xFE0F) {
    if (const CodePointRecord* base = sources.unicode.Find(entry.sequence[0])) parts.push_back(base->name);
  }
  AddAnnotation(sources.english, entry.sequence, parts);
  InfoFields fields;
  fields[kUnam] = JoinNameParts(parts);
  return fields;
}

}  // namespace

std::string JoinNameParts(const std::vector<std::string>& parts) {
  std::string out;
  std::vector<std::string> seen;
  for (const std::string& part : parts) {
    if (part.empty()) continue;
    std::string folded = Lowercase(part);
    if (std::find(seen.begin(), seen.end(), folded) != seen.end()) continue;
    seen.push_back(std::move(folded));
    if (!out.empty()) out += "; ";
    out += part;
  }
  return out;
}

std::string JoinInfoFields(const InfoFields& fields) {
  std::string out;
  for (size_t i = 0; i < fields.size(); ++i) {
    if (i > 0) out += '|';
    for (char c : fields[i]) {
      out += c == '|' ? '/' : (c == '\n' || c == '\r') ? ' ' : c;
    }
  }
  return out;
}

InfoFields HanInfoFields(char32_t cp, const UnihanTable& unihan) {
  InfoFields fields;
  fields[kJyom] = Joined(unihan.Field(cp, "kJapaneseOn"), unihan.Field(cp, "kJapaneseKun"));
  fields[kKrpi] = Joined(HangulReadings(unihan.Field(cp, "kHangul")), unihan.Field(cp, "kKorean"));
  std::vector<std::string_view> mandarin = SplitSpaces(unihan.Field(cp, "kMandarin"));
  if (!mandarin.empty()) {
    fields[kSpin] = std::string(mandarin[0]);
    fields[kTpin] = std::string(mandarin.size() > 1 ? mandarin[1] : mandarin[0]);
    if (std::optional<std::string> zhuyin = PinyinToZhuyin(fields[kTpin])) fields[kTzhu] = *zhuyin;
  }
  std::vector<std::string_view> strokes = SplitSpaces(unihan.Field(cp, "kTotalStrokes"));
  if (!strokes.empty()) fields[kSbix] = std::string(strokes[0]);
  fields[kCbai] = std::string(unihan.Field(cp, "kCantonese"));
  fields[kTcan] = std::string(unihan.Field(cp, "kCangjie"));
  std::vector<std::string_view> radicals = SplitSpaces(unihan.Field(cp, "kRSUnicode"));
  for (size_t i = 0; i < radicals.size() && i < 4; ++i) fields[kRsu1 + i] = std::string(radicals[i]);
  return fields;
}

std::vector<const EmojiTestEntry*> EmojiInSearchOrder(const std::vector<EmojiTestEntry>& emoji) {
  std::vector<const EmojiTestEntry*> ordered;
  for (const EmojiTestEntry& entry : emoji) {
    if (entry.status == EmojiStatus::kFullyQualified && !HasSkinTone(entry.sequence)) {
      ordered.push_back(&entry);
    }
  }
  // Search walks the rows in this order, so it is the ranking a person sees. A short name is the
  // emoji the word names most directly ("fire" before "firefighter"); among names of one length,
  // fewer code points is the base form (before its gender and ZWJ variants); the emoji test
  // file's own order settles the rest.
  auto code_points = [](const EmojiTestEntry* entry) {
    return std::count_if(entry->sequence.begin(), entry->sequence.end(), [](char32_t cp) { return cp != 0xFE0F; });
  };
  std::stable_sort(ordered.begin(), ordered.end(), [&](const EmojiTestEntry* a, const EmojiTestEntry* b) {
    if (a->name.size() != b->name.size()) return a->name.size() < b->name.size();
    return code_points(a) < code_points(b);
  });
  return ordered;
}

std::vector<CharacterRow> BuildCharacterRows(const CharacterSources& sources) {
  std::vector<CharacterRow> rows;
  rows.reserve(sources.unicode.records().size() + sources.emoji.size());
  std::unordered_set<std::string> emitted;
  for (const EmojiTestEntry* entry : EmojiInSearchOrder(sources.emoji)) {
    std::string uchr = ToUtf8(entry->sequence);
    if (!emitted.insert(uchr).second) continue;
    if (entry->sequence.size() == 1) {
      const CodePointRecord* record = sources.unicode.Find(entry->sequence[0]);
      if (record == nullptr) continue;  // left for the code-point pass, which skips it as well
      InfoFields fields = CodePointFields(*record, sources);
      rows.push_back({std::move(uchr), JoinInfoFields(fields)});
    } else {
      rows.push_back({std::move(uchr), JoinInfoFields(SequenceFields(*entry, sources))});
    }
  }
  std::string uchr;
  for (const CodePointRecord& record : sources.unicode.records()) {
    if (!IsListedCharacter(record)) continue;
    uchr.clear();
    AppendUtf8(record.code_point, uchr);
    if (emitted.contains(uchr)) continue;
    rows.push_back({uchr, JoinInfoFields(CodePointFields(record, sources))});
  }
  return rows;
}

}  // namespace lumeris::resources
