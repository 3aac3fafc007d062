// The equality rule of the recents list: whether two entity IDs name the same recent character.
//
// All skin-tone variants of one emoji count as one recent entry, as long as both IDs agree on
// whether they were recorded in the emoji font; everything else must match exactly, the ID text
// included (two current-form IDs whose JSON keys stand in different orders differ).
//
// Thread-safety: pure (apart from the reader's log line for damaged JSON); safe on any thread.
#pragma once

#include <unicode/unistr.h>

namespace lumeris {

// True when `a` and `b` are equal as strings, or when both are entity IDs, both or neither are in
// the emoji font, and their characters contain the same non-zero skin-tone base emoji
// (ContainedDiversityUnicode).
bool IsEqualRecentEntityID(const icu::UnicodeString& a, const icu::UnicodeString& b);

}  // namespace lumeris
