// The `lumeris` command line: builds the CLI11 app with every subcommand and runs one command
// line through it. main() is RunCli(argc, argv, std::cout, std::cerr); tests pass their own
// channel (to see the requests a command line builds without a service) and streams.
//
//   lumeris [--json] [--timeout SECONDS] <subcommand> ...
//
// Thread-safety: one command line at a time per app; RunCli may run on any thread.
#pragma once

#include <CLI/CLI.hpp>

#include <ostream>

#include "client/cli_channel.h"
#include "client/cli_session.h"

namespace lumeris::cli {

// Adds the global options and every subcommand to `app`, all talking through `session`, which
// must outlive `app`.
void BuildCliApp(CLI::App& app, CliSession& session);

// Parses and runs one command line against `channel`; returns the exit status (kExitStatusText):
// help and version print to `out` and give 0; a usage error prints "lumeris: <problem>" (with
// the nearest subcommand for an unknown one) and a hint to `err` and gives 2, before anything
// is sent.
int RunCli(int argc, const char* const* argv, ServiceChannel& channel, std::ostream& out,
           std::ostream& err);

// The same against the real service (connecting, and starting it, on first use).
int RunCli(int argc, const char* const* argv, std::ostream& out, std::ostream& err);

}  // namespace lumeris::cli
