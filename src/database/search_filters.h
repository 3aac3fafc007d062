// The tests a search candidate (the `uchr` text of a matching row) must pass before the font test
// decides where it goes, and the case-insensitive search that finds the search text in a row's
// `info` text. Shared by the reference search and any faster path, so that both admit exactly the
// same characters.
//
//   std::optional<icu::UnicodeString> c = ShowableSearchCandidate(uchr);   // nullopt: leave out
//   CaseInsensitiveText info(info_text);
//   const icu::UnicodeString needle = CaseInsensitiveText::Fold(search_text);
//   for (auto m = info.Find(needle, 0); m; m = info.Find(needle, m->end)) ...
//
// Thread-safety: pure functions and plain values, apart from ShouldHideThisCharacter's
// process-wide flag (categories/regional_restriction.h).
#pragma once

#include <unicode/unistr.h>

#include <cstdint>
#include <optional>
#include <vector>

namespace lumeris {

// True when the first code point of the NUL-terminated UTF-8 text (decoded as ICU's U8_NEXT does,
// a malformed start giving a negative value) is printable, is not white space and is not a
// default-ignorable code point. nullptr counts as the empty string.
bool FirstCodePointIsShowable(const char* utf8);

// The candidate as a string when it passes FirstCodePointIsShowable, is well-formed non-empty
// UTF-8 and is not hidden by the regional restriction; std::nullopt otherwise.
std::optional<icu::UnicodeString> ShowableSearchCandidate(const char* utf8);
// The same tests without the regional one, whose answer can change from one request to the next.
std::optional<icu::UnicodeString> ShowableSearchCandidateIgnoringRegion(const char* utf8);

// A text prepared for repeated case-insensitive searches (full Unicode case folding). Match
// positions are indexes into the original text, so a caller can count what precedes a match
// even where folding changes lengths ("ß" folds to "ss").
class CaseInsensitiveText {
 public:
  explicit CaseInsensitiveText(const icu::UnicodeString& text);

  struct Match {
    int32_t start;  // first UTF-16 unit of the original text in the match
    int32_t end;    // one past the last unit of the original text in the match
  };
  // `text` with full case folding: the form Find() takes its needle in.
  static icu::UnicodeString Fold(const icu::UnicodeString& text);

  // The first match of `folded_needle` that starts at or after original index `from`;
  // std::nullopt when there is none or the needle is empty.
  std::optional<Match> Find(const icu::UnicodeString& folded_needle, int32_t from) const;

  const icu::UnicodeString& original() const { return original_; }

 private:
  icu::UnicodeString original_;
  icu::UnicodeString folded_;
  std::vector<int32_t> folded_start_;  // per folded unit: start of its original code point
  std::vector<int32_t> folded_end_;    // per folded unit: end of its original code point
  std::vector<int32_t>
      folded_index_;  // per original index (and the end): first folded unit at or after it
};

}  // namespace lumeris
