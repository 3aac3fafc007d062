// Manual pages and shell completions written from a program's CLI11 definition, the one source
// its --help also prints, so that none of them can drift from the others.
//
//   CLI::App app("", "lumeris");
//   BuildCliApp(app, session);
//   std::string page = ManualPage(app, {.section = 1, .title = "User Commands"});
//   std::string bash = BashCompletion(app);
//
// The page has NAME (the description), SYNOPSIS, DESCRIPTION, OPTIONS, SUBCOMMANDS (each with its
// options and footer, nested ones included) and one section per heading of the program's footer
// (a line "Heading:" at the start of a line; "See also: x" puts "x" under SEE ALSO). Completions
// offer the subcommands and options that are valid after the words typed so far.
//
// Thread-safety: pure functions of `app`. Results are owned by the caller.
#pragma once

#include <CLI/CLI.hpp>

#include <string>

namespace lumeris::cli {

struct ManualInfo {
  int section = 1;
  std::string title;    // "User Commands", "System Administration"
  std::string version;  // shown in the page footer
};

// The roff (man(7)) text of the manual page of `app`.
std::string ManualPage(const CLI::App& app, const ManualInfo& info);

// Completion scripts for bash (sourced; defines and registers a function), zsh (a #compdef file
// for a directory on $fpath) and fish (a file for vendor_completions.d).
std::string BashCompletion(const CLI::App& app);
std::string ZshCompletion(const CLI::App& app);
std::string FishCompletion(const CLI::App& app);

}  // namespace lumeris::cli
