#include "text/replacement_dictionary.h"

#include <algorithm>
#include <string_view>

#include "text/emoji.h"
#include "text/emoji_tables.h"
#include "text/scalar.h"

namespace lumeris {
namespace {

// A keyable string holds at most two scalar values (four units); one more unit for U+FE0F.
constexpr int32_t kMaxKeyUnits = 5;

}  // namespace

std::optional<icu::UnicodeString> ReplacementDictionaryNormalizedKeyString(
    const icu::UnicodeString& text, bool* had_skin_tone) {
  const uint32_t base = ContainedDiversityUnicode(text);
  if (base == 0) return std::nullopt;
  // ContainedDiversityUnicode accepts at most two scalar values, so the string fits.
  const std::u16string_view source = UnitsOf(text);
  char16_t units[kMaxKeyUnits];
  std::copy(source.begin(), source.end(), units);
  auto n = static_cast<int32_t>(source.size());
  const bool skin_tone =
      n >= 3 && units[n - 2] == 0xD83C && units[n - 1] >= 0xDFFB && units[n - 1] <= 0xDFFF;
  if (skin_tone) n -= 2;
  if (IsValidEmojiScalarForVariant(base) && units[n - 1] != kEmojiPresentationSelector) {
    units[n++] = static_cast<char16_t>(kEmojiPresentationSelector);
  }
  if (had_skin_tone != nullptr) *had_skin_tone = skin_tone;
  return icu::UnicodeString(units, n);
}

bool UpdateReplacementDictionary(const icu::UnicodeString& text,
                                 ReplacementDictionary& dictionary) {
  if (text.isEmpty()) {
    dictionary.clear();
    return true;
  }
  bool skin_tone = false;
  std::optional<icu::UnicodeString> key = ReplacementDictionaryNormalizedKeyString(text, &skin_tone);
  if (!key) return false;
  icu::UnicodeString value = skin_tone ? text : *key;
  dictionary.insert_or_assign(std::move(*key), std::move(value));
  return true;
}

}  // namespace lumeris
