// The large-window preference: "open_large_viewer" hands the viewer a path through the input
// method's preference domain, which the input method reads when it opens the panel's large window.
//
//   bool written = PrepareOpeningLargeVistrel("/path/for/viewer");
//
// Thread-safety: may be called from any thread. Returns a plain value.
#pragma once

#include <optional>
#include <string>

namespace lumeris {

// Sets "VTStartAsLargeWindowTemporarily" in "com.vantorel.SorvendiIM" to `path` (std::nullopt
// removes it) and synchronises that domain; returns the result of the synchronise.
bool PrepareOpeningLargeVistrel(const std::optional<std::string>& path);

}  // namespace lumeris
