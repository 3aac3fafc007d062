// `lumeris watch`: prints each distributed notification as it arrives, one line each:
//   <local time, YYYY-MM-DD HH:MM:SS.mmm>  <name>[  <object>]
// until interrupted (SIGINT or SIGTERM), or until --count notifications or --timeout seconds
// when given. --name limits it to one notification name. With the program's --json each
// notification is one JSON line: {"time": "<local time>", "name": "<name>", "object": "<object>"}.
//
// Exit status: 0, or 1 when no session bus is reachable.
//
// Thread-safety: run it from one thread at a time (it installs SIGINT/SIGTERM handlers for the
// duration of the run and restores the previous ones after).
#pragma once

#include <CLI/CLI.hpp>

#include <cstddef>
#include <functional>
#include <optional>
#include <ostream>
#include <string>

namespace lumeris::cli {

struct WatchRequest {
  std::optional<std::string> name;
  std::optional<std::size_t> count;
  std::optional<double> timeout_seconds;
  bool json = false;
};

// Runs until interrupted or a limit is reached; returns the exit status. `ready`, when given,
// is called once the subscription is in place (tests post after it).
int RunWatch(const WatchRequest& request, std::ostream& out, std::ostream& err,
             const std::function<void()>& ready = nullptr);

// Adds the "watch" subcommand to `app`; a non-zero status is reported as CLI::RuntimeError.
// `json`, when given, is the program's --json flag (read at run time).
CLI::App* AddWatchCommand(CLI::App& app, std::ostream& out, std::ostream& err, const bool* json = nullptr);

}  // namespace lumeris::cli
