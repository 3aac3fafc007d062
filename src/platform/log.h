// The platform log: standard error, one line per entry, prefixed with the program name.
//
// When the service runs under systemd the journal collects these lines. Nothing here
// allocates a file or a connection; a failed write to standard error is ignored.
//
// Thread-safety: Log() may be called from any thread; each entry is written with a single
// write(2), so lines of concurrent callers never interleave.
#pragma once

#include <string_view>

namespace lumeris {

// Writes "<program>: <message>\n" to standard error.
void Log(std::string_view message);

// The name the log prefixes: program_invocation_short_name unless SetLogProgramName() was called.
std::string_view LogProgramName();

// Overrides the prefix (for tests, or a program started under another name).
// REQUIRES: called before other threads log.
void SetLogProgramName(std::string_view name);

}  // namespace lumeris
