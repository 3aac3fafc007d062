// `lumeris status`: whether the file service runs, and with what: its process, socket, log, the
// bundle root and localization it uses (read from its own environment, so they are the ones the
// running service chose), and how many connections it serves. Never starts the service.
//
//   service       running (pid 4242, /usr/bin/lumeris-fileservice)
//   socket        /run/user/1000/com.vantorel.Lumeris.FileService
//   log           the systemd journal (journalctl --user -t lumeris-fileservice)
//   bundle root   /usr/share/lumeris/root (input-method bundle present)
//   localization  en
//   connections   2 besides this one
//
// --json prints the same as one object. Exit status 0 when the service runs, 1 when it does not
// (then the lines say what a service started from this shell would use).
//
// Thread-safety: the registered callback runs on the thread that parses the command line; it
// changes the process environment for a moment and must run while no other thread reads it.
#pragma once

#include <CLI/CLI.hpp>

#include "client/cli_session.h"

namespace lumeris::cli {

// Adds "status" to `app`; it talks through `session`, which must outlive `app`.
void AddStatusCommand(CLI::App& app, CliSession& session);

}  // namespace lumeris::cli
