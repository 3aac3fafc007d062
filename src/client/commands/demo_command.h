// `lumeris demo`: a short tour through the service (started on demand), what `./run` shows with
// no arguments. It searches, asks for related characters, information and a category, then
// adds, sets and reads recents, favourites and a skin tone under a storage identifier of its
// own (kDemoIdentifier, removed again at the end, so the panel's own lists are not touched),
// printing human-readable results. A request the service does not answer (its operation is not
// there yet) is reported as such and the tour goes on; only a service that cannot be reached at
// all fails the command.
//
// Thread-safety: the registered callback runs on the thread that parses the command line.
#pragma once

#include <CLI/CLI.hpp>

#include "client/cli_session.h"

namespace lumeris::cli {

inline constexpr char kDemoIdentifier[] = "com.vantorel.lumeris-cli.Demo";

// Adds "demo" to `app`; it talks through `session`, which must outlive `app`.
void AddDemoCommand(CLI::App& app, CliSession& session);

// Runs the tour; returns the exit status.
int RunDemo(CliSession& session);

}  // namespace lumeris::cli
