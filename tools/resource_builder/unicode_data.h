// The Unicode character table: UnicodeData.txt (with its First/Last ranges expanded and the
// names of ideographs and Hangul syllables derived) and NameAliases.txt.
//
//   UnicodeCharacterTable table = ParseUnicodeData(text);
//   const CodePointRecord* euro = table.Find(U'€');   // name "EURO SIGN", category "Sc"
//
// Thread-safety: a parsed table is an immutable value; concurrent reads are safe.
// Ownership: everything returned is owned by the caller (pointers from Find point into the table).
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace lumeris::resources {

// One assigned code point.
struct CodePointRecord {
  char32_t code_point = 0;
  std::string name;              // Unicode name; derived for ranges; "" for "<control>"
  std::string general_category;  // two letters, e.g. "Lu", "Sm", "Co"
  std::string decomposition;     // raw field: "<compat> 0020 0301", "0041 0300" or ""
  char32_t simple_uppercase = 0;  // 0 when there is none
  char32_t simple_lowercase = 0;
};

class UnicodeCharacterTable {
 public:
  explicit UnicodeCharacterTable(std::vector<CodePointRecord> records);

  // Records in ascending code-point order.
  const std::vector<CodePointRecord>& records() const { return records_; }
  const CodePointRecord* Find(char32_t cp) const;

 private:
  std::vector<CodePointRecord> records_;
};

// Parses UnicodeData.txt. Ranges ("<CJK Ideograph, First>" .. "<..., Last>") give one record per
// code point; ideographs are named "CJK UNIFIED IDEOGRAPH-XXXX" (and so on for other ranges),
// Hangul syllables by the Unicode algorithm. Malformed lines are skipped.
UnicodeCharacterTable ParseUnicodeData(std::string_view text);

// The name of the precomposed Hangul syllable `cp` ("HANGUL SYLLABLE GAG"), nullopt outside
// U+AC00..U+D7A3.
std::optional<std::string> HangulSyllableName(char32_t cp);

// True for the code points that the character database lists: assigned, and neither a surrogate
// nor private use.
bool IsListedCharacter(const CodePointRecord& record);

// A formal name alias of NameAliases.txt.
struct NameAlias {
  std::string alias;
  std::string type;  // "correction", "control", "alternate", "figment", "abbreviation"
};

// Aliases by code point, in file order.
std::map<char32_t, std::vector<NameAlias>> ParseNameAliases(std::string_view text);

}  // namespace lumeris::resources
