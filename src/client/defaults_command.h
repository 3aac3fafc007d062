// `lumeris defaults`: read and write the preference store from a shell, through the same
// PreferenceStore the service uses (each command synchronises, so it sees and is seen by the
// service at once).
//
//   lumeris defaults read DOMAIN              the whole domain as a JSON object
//   lumeris defaults read DOMAIN KEY          one value as JSON
//   lumeris defaults write DOMAIN KEY VALUE   VALUE is JSON; text that is not JSON is a string
//   lumeris defaults write DOMAIN KEY VALUE --type integer|real|bool|string|data|date
//   lumeris defaults delete DOMAIN [KEY]      one key, or every key of the domain
//   --current-host                            the host-specific file (ByHost) instead
//
// JSON forms of data and dates are described in client/property_list_json.h; with --type,
// VALUE is plain text: an integer, a real, true/false/yes/no/1/0, hex digits, or an ISO 8601
// UTC date. Results go to `out`, messages to `err`; the exit status is 0 on success, 1 for a
// missing key or domain, 2 for a value that does not convert, 3 when the store cannot be written.
//
// Thread-safety: RunDefaults may run on any thread; the registered command writes to the
// streams given at registration, which must outlive the parse.
#pragma once

#include <CLI/CLI.hpp>

#include <optional>
#include <ostream>
#include <string>

namespace lumeris::cli {

struct DefaultsRequest {
  enum class Action { kRead, kWrite, kDelete };
  Action action = Action::kRead;
  std::string domain;
  std::optional<std::string> key;
  std::optional<std::string> value;  // kWrite only
  std::optional<std::string> type;   // kWrite only: integer, real, bool, string, data, date
  bool current_host = false;
};

// Runs one request; returns the exit status.
int RunDefaults(const DefaultsRequest& request, std::ostream& out, std::ostream& err);

// Adds the "defaults" subcommand (with read, write, delete) to `app`. When it is parsed the
// request runs; a non-zero status is reported as CLI::RuntimeError(status), as CLI11 expects.
CLI::App* AddDefaultsCommand(CLI::App& app, std::ostream& out, std::ostream& err);

}  // namespace lumeris::cli
