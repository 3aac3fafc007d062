// `lumeris raw JSON [--no-reply]`: sends any request dictionary written as JSON, with the typed
// escapes of client/cli_json_value.h for the kinds JSON cannot tell apart, and prints the reply
// as JSON in the same notation (indented; one line with --json). With --no-reply the message
// goes out as one that wants no reply (kind 0), as the panel sends its writing commands.
//
//   lumeris raw '{"command":"search_matched_chars","string":"cat","limit":{"$uint64":"5"}}'
//   lumeris raw --no-reply '{"command":"save_state","data":{"$data":"e30="},"application":"x"}'
//
// Thread-safety: the registered callback runs on the thread that parses the command line.
#pragma once

#include <CLI/CLI.hpp>

#include "client/cli_session.h"

namespace lumeris::cli {

// Adds "raw" to `app`; it talks through `session`, which must outlive `app`.
void AddRawCommand(CLI::App& app, CliSession& session);

}  // namespace lumeris::cli
