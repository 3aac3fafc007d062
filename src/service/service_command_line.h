// The command line of lumeris-fileservice: no arguments serves; --help and --version print and
// exit. The same definition feeds `--help` and the manual page lumeris-fileservice(8), so the
// two cannot drift apart.
//
// Thread-safety: call from main() before other threads start.
#pragma once

#include <CLI/CLI.hpp>

#include <optional>
#include <ostream>

namespace lumeris {

// Describes the program, its options, environment and files in `app` (named
// "lumeris-fileservice").
void BuildServiceCommandLine(CLI::App& app);

// Parses argv: std::nullopt when the service is to run; else the exit status after printing the
// help or version to `out` (0) or "lumeris-fileservice: <problem>" to `err` (2).
std::optional<int> ParseServiceCommandLine(int argc, const char* const* argv, std::ostream& out,
                                           std::ostream& err);

}  // namespace lumeris
