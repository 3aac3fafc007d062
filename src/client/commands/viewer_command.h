// `lumeris open-large-viewer [PATH]`: asks the service to record PATH as the path the input
// method opens its large window with ("open_large_viewer"); without PATH the recorded path is
// removed. A relative PATH is made absolute against the current directory; an empty one is
// refused. The reply arrives once the preference is written, so the command returns after that.
//
// Thread-safety: the registered callback runs on the thread that parses the command line.
#pragma once

#include <CLI/CLI.hpp>

#include "client/cli_session.h"

namespace lumeris::cli {

// Adds "open-large-viewer" to `app`; it talks through `session`, which must outlive `app`.
void AddViewerCommand(CLI::App& app, CliSession& session);

}  // namespace lumeris::cli
