#include "store/horse_racing.h"

#include <string>
#include <string_view>

namespace lumeris {

namespace {

// Quotation mark followed by U+1F3C7, in UTF-8. The entries are searched as UTF-8 bytes: a
// quotation mark byte never occurs inside a multi-byte sequence, so the span found is the one
// a search in UTF-16 units finds, and "longer than the plain form" means the same in both.
constexpr std::string_view kQuotedHorseRacing = "\"\xF0\x9F\x8F\x87";
constexpr std::string_view kPlainHorseRacingSpan = "\"\xF0\x9F\x8F\x87\"";

}  // namespace

std::optional<plist::Array> CreateArrayWithPlainHorseRacing(const std::optional<plist::Value>& stored) {
  if (!stored) return std::nullopt;
  const plist::Array* entries = stored->AsArray();
  if (entries == nullptr || entries->empty()) return std::nullopt;

  for (std::size_t index = 0; index < entries->size(); ++index) {
    const std::string* text = (*entries)[index].AsString();
    if (text == nullptr) continue;
    const std::size_t open = text->find(kQuotedHorseRacing);
    if (open == std::string::npos) continue;

    const std::size_t close = text->find('"', open + kQuotedHorseRacing.size());
    if (close == std::string::npos) return std::nullopt;
    const std::size_t span_length = close - open + 1;
    if (span_length <= kPlainHorseRacingSpan.size()) return std::nullopt;

    std::string repaired = *text;
    repaired.replace(open, span_length, kPlainHorseRacingSpan);
    plist::Array copy = *entries;
    copy[index] = plist::Value(std::move(repaired));
    return copy;
  }
  return std::nullopt;
}

}  // namespace lumeris
