#include "database/search_filters.h"

#include <string.h>
#include <unicode/uchar.h>
#include <unicode/ustring.h>
#include <unicode/utf16.h>
#include <unicode/utf8.h>

#include <algorithm>
#include <iterator>
#include <string>
#include <string_view>

#include "categories/regional_restriction.h"
#include "text/utf8.h"

namespace lumeris {

bool FirstCodePointIsShowable(const char* utf8) {
  const uint8_t* s = reinterpret_cast<const uint8_t*>(utf8 != nullptr ? utf8 : "");
  int32_t i = 0;
  UChar32 c;
  U8_NEXT(s, i, -1, c);
  return u_isprint(c) && !u_isUWhiteSpace(c) &&
         !u_hasBinaryProperty(c, UCHAR_DEFAULT_IGNORABLE_CODE_POINT);
}

std::optional<icu::UnicodeString> ShowableSearchCandidateIgnoringRegion(const char* utf8) {
  if (!FirstCodePointIsShowable(utf8)) return std::nullopt;
  std::optional<icu::UnicodeString> text = DecodeUtf8(std::string_view(utf8));
  if (!text || text->isEmpty()) return std::nullopt;
  return text;
}

std::optional<icu::UnicodeString> ShowableSearchCandidate(const char* utf8) {
  std::optional<icu::UnicodeString> text = ShowableSearchCandidateIgnoringRegion(utf8);
  if (!text || ShouldHideThisCharacter(*text)) return std::nullopt;
  return text;
}

icu::UnicodeString CaseInsensitiveText::Fold(const icu::UnicodeString& text) {
  icu::UnicodeString folded(text);
  folded.foldCase(U_FOLD_CASE_DEFAULT);
  return folded;
}

CaseInsensitiveText::CaseInsensitiveText(const icu::UnicodeString& text) : original_(text) {
  const int32_t length = original_.length();
  const char16_t* units = original_.getBuffer();
  folded_index_.assign(static_cast<std::size_t>(length) + 1, 0);
  folded_start_.reserve(static_cast<std::size_t>(length));
  folded_end_.reserve(static_cast<std::size_t>(length));
  std::u16string folded;
  folded.reserve(static_cast<std::size_t>(length));
  for (int32_t i = 0; i < length;) {
    const int32_t start = i;
    U16_FWD_1(units, i, length);
    // Full case folding of one code point: at most three code points (six units) come out. An
    // ASCII letter folds to its lower case and any other ASCII character to itself, which
    // spares ICU the most frequent case.
    char16_t buffer[U16_MAX_LENGTH * 3 + 2];
    int32_t n = 1;
    if (units[start] < 0x80) {
      buffer[0] = units[start] >= u'A' && units[start] <= u'Z' ? units[start] + (u'a' - u'A') : units[start];
    } else {
      UErrorCode status = U_ZERO_ERROR;
      n = u_strFoldCase(buffer, static_cast<int32_t>(std::size(buffer)), units + start, i - start,
                        U_FOLD_CASE_DEFAULT, &status);
      if (U_FAILURE(status)) {
        n = i - start;
        std::copy(units + start, units + i, buffer);
      }
    }
    folded_index_[static_cast<std::size_t>(start)] = static_cast<int32_t>(folded.size());
    folded.append(buffer, static_cast<std::size_t>(n));
    for (int32_t k = 0; k < n; ++k) {
      folded_start_.push_back(start);
      folded_end_.push_back(i);
    }
    for (int32_t inner = start + 1; inner < i; ++inner) {
      folded_index_[static_cast<std::size_t>(inner)] = static_cast<int32_t>(folded.size());
    }
  }
  folded_index_[static_cast<std::size_t>(length)] = static_cast<int32_t>(folded.size());
  folded_ = icu::UnicodeString(folded.data(), static_cast<int32_t>(folded.size()));
}

std::optional<CaseInsensitiveText::Match> CaseInsensitiveText::Find(
    const icu::UnicodeString& folded_needle, int32_t from) const {
  if (folded_needle.isEmpty() || from < 0 || from > original_.length()) return std::nullopt;
  const int32_t position =
      folded_.indexOf(folded_needle, folded_index_[static_cast<std::size_t>(from)]);
  if (position < 0) return std::nullopt;
  const int32_t last = position + folded_needle.length() - 1;
  return Match{folded_start_[static_cast<std::size_t>(position)],
               folded_end_[static_cast<std::size_t>(last)]};
}

}  // namespace lumeris
