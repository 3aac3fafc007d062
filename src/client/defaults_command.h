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
// VALUE is in the tagged JSON notation of client/json_notation.h (data {"$base64": ...} or
// {"$hex": ...}, a date {"$date": ...}), so everything `read` prints writes back; with --type,
// VALUE is plain text: an integer, a real, true/false/yes/no/1/0, hex digits, or an ISO 8601
// UTC date. `read` prints indented JSON, one line with --json. Results go to `out`, messages
// ("lumeris: defaults: ...") to `err`; the exit status is 0 on success, 1 for a missing key, an
// empty domain or a store that cannot be written, 2 for a value or domain name that does not
// convert.
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
  bool json = false;  // read: one line instead of indented
};

// Runs one request; returns the exit status.
int RunDefaults(const DefaultsRequest& request, std::ostream& out, std::ostream& err);

// Adds the "defaults" subcommand (with read, write, delete) to `app`. When it is parsed the
// request runs; a non-zero status is reported as CLI::RuntimeError(status), as CLI11 expects.
// `json`, when given, is the program's --json flag (read at run time).
CLI::App* AddDefaultsCommand(CLI::App& app, std::ostream& out, std::ostream& err, const bool* json = nullptr);

}  // namespace lumeris::cli
