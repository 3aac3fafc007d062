// The character database subcommands of `lumeris`:
//   search TEXT [--limit N]    "search_matched_chars"
//   related CHAR [--limit N]   "search_related_chars"
//   info CHAR                  "search_character_info"
//
// Thread-safety: the registered callbacks run on the thread that parses the command line.
#pragma once

#include <CLI/CLI.hpp>

#include "client/cli_session.h"

namespace lumeris::cli {

// Adds the three subcommands to `app`; they talk through `session`, which must outlive `app`.
void AddSearchCommands(CLI::App& app, CliSession& session);

}  // namespace lumeris::cli
