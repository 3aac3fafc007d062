#include "text/emoji.h"

#include <algorithm>

#include "text/emoji_tables.h"
#include "text/scalar.h"
#include "text/scratch_buffer.h"

namespace lumeris {
namespace {

using text_internal::ScratchBuffer;

// Enough for any string the panel compares as one emoji sequence.
constexpr size_t kInlineScalars = 32;

// Converts `text` into `scalars` and keeps only the entries the flags call significant; returns
// how many remain.
int64_t FilteredScalars(const icu::UnicodeString& text, bool selectors_significant,
                        bool skin_tones_significant, uint32_t* scalars) {
  const int64_t count = StringToScalerValues(text, scalars);
  int64_t kept = 0;
  for (int64_t i = 0; i < count; ++i) {
    const uint32_t value = scalars[i];
    if (!skin_tones_significant && IsSkinToneModifier(value)) continue;
    if (!selectors_significant &&
        (value == kTextPresentationSelector || value == kEmojiPresentationSelector)) {
      continue;
    }
    scalars[kept++] = value;
  }
  return kept;
}

}  // namespace

bool IsEmojiFontName(const icu::UnicodeString& font_name) {
  return UnitsOf(font_name) == kEmojiFontName;
}

uint32_t ContainedDiversityUnicode(const icu::UnicodeString& text) {
  if (text.isEmpty()) return 0;
  // A scalar takes at most two units, so five or more units always make more than two scalars.
  if (text.length() > 4) return 0;
  ScratchBuffer<uint32_t, kInlineScalars> scalars(static_cast<size_t>(text.length()));
  const int64_t count = StringToScalerValues(text, scalars.data());
  if (count > 2) return 0;
  if (count == 2 && scalars.data()[1] == kTextPresentationSelector) return 0;
  const uint32_t* first = scalars.data();
  const uint32_t* last = first + count;
  for (uint32_t base : kSkinToneBaseTable) {
    if (std::find(first, last, base) != last) return base;
  }
  return 0;
}

bool IsValidEmojiScalarForVariant(uint32_t value) {
  return std::find(kVariantEmojiTable.begin(), kVariantEmojiTable.end(), value) !=
         kVariantEmojiTable.end();
}

bool CompareEmojiStrings(const icu::UnicodeString& a, const icu::UnicodeString& b,
                         bool selectors_significant, bool skin_tones_significant) {
  if (selectors_significant && skin_tones_significant) return a == b;
  ScratchBuffer<uint32_t, kInlineScalars> a_scalars(static_cast<size_t>(a.length()));
  ScratchBuffer<uint32_t, kInlineScalars> b_scalars(static_cast<size_t>(b.length()));
  const int64_t a_count =
      FilteredScalars(a, selectors_significant, skin_tones_significant, a_scalars.data());
  const int64_t b_count =
      FilteredScalars(b, selectors_significant, skin_tones_significant, b_scalars.data());
  return a_count == b_count && std::equal(a_scalars.data(), a_scalars.data() + a_count,
                                          b_scalars.data());
}

}  // namespace lumeris
