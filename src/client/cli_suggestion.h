// The nearest name to a mistyped one, for "did you mean ...?" after an unknown subcommand.
//
//   NearestName("recent", {"recents", "related", "raw"})  ->  "recents"
//   NearestName("xyz", {"recents", "raw"})                ->  std::nullopt
//
// A name qualifies when it begins with the word (of at least two characters) or is within a
// small edit distance of it (insertions, deletions, substitutions and swaps of neighbours; at
// most one edit per three characters of the word, and at least one); the closest wins, the
// earlier name on a tie.
//
// Thread-safety: pure. Results are owned by the caller.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace lumeris::cli {

std::optional<std::string> NearestName(std::string_view word, const std::vector<std::string>& names);

}  // namespace lumeris::cli
