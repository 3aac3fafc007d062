// The user-data subcommands of `lumeris`:
//   recents [--identifier ID]                       "read" of the recents list
//   recents set ITEM... [--emoji-font]              "set" (no items removes the list)
//   recents add ITEM [--emoji-font] [--font F --glyph G]   "add"
//   favorites [--identifier ID]                     "read" of the favourites list
//   favorites set ITEM... [--emoji-font]            "set"
//   skintone ITEM [--emoji-font]                    "set_skintone"
//   state save [--application APP] JSON             "save_state"
//   read-all [--identifier ID] [--application APP]  "read_recents_favorites"
// Items are characters (turned into entity IDs) or entity IDs (sent as they are); lists print
// as characters. The identifier defaults to the panel's default storage, the application to
// kDefaultApplication.
//
// Thread-safety: the registered callbacks run on the thread that parses the command line.
#pragma once

#include <CLI/CLI.hpp>

#include "client/cli_session.h"

namespace lumeris::cli {

// Adds the subcommands to `app`; they talk through `session`, which must outlive `app`.
void AddStoreCommands(CLI::App& app, CliSession& session);

}  // namespace lumeris::cli
