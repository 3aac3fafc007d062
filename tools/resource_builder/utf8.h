// UTF-8 encoding of code points, as the builder writes every text (database rows, plists).
//
// Thread-safety: pure functions; results are owned by the caller.
#pragma once

#include <string>
#include <string_view>

namespace lumeris::resources {

// Appends the UTF-8 form of `cp` (which must be a scalar value, not a surrogate) to `out`.
void AppendUtf8(char32_t cp, std::string& out);

// The UTF-8 form of a sequence of scalar values.
std::string ToUtf8(std::u32string_view text);

}  // namespace lumeris::resources
