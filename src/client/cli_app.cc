#include "client/cli_app.h"

#include "client/commands/category_command.h"
#include "client/commands/demo_command.h"
#include "client/commands/raw_command.h"
#include "client/commands/search_commands.h"
#include "client/commands/store_commands.h"
#include "client/commands/viewer_command.h"
#include "client/defaults_command.h"
#include "client/watch_command.h"
#include "lumeris/config.h"
#include "platform/property_list_io.h"

namespace lumeris::cli {
namespace {

constexpr char kExamples[] = R"(Examples:
  lumeris search 'smiling face' --limit 5      characters and their code points
  lumeris related 中 --limit 10                 related characters
  lumeris info 中                               the sixteen information fields
  lumeris categories                            the categories offered, with titles and counts
  lumeris categories Emoji --icons /tmp/icons   category titles, icons and characters
  lumeris recents                               the recents list, as characters
  lumeris recents add 👍🏽 --emoji-font           put an emoji at the front
  lumeris recents set A B C                     replace the list (no items: remove it)
  lumeris favorites set ★ ♥                     replace the favourites
  lumeris favorites --json                      the reply as JSON, for scripts
  lumeris skintone 👍🏽 --emoji-font              remember a skin tone
  lumeris state save --application com.example.app '{"VTGlobalEmojiDiversityDescribed":true}'
  lumeris read-all --application com.example.app   everything in one request
  lumeris open-large-viewer /tmp/picked.txt     record the large window's path
  lumeris raw '{"command":"read","target":"recents","identifier":"com.vantorel.Lumeris.DefaultDataStorage"}'
  lumeris raw --no-reply '{"command":"add","target":"recents","item":"x","identifier":"com.vantorel.Lumeris.DefaultDataStorage"}'
  lumeris demo                                  a short tour
  lumeris defaults read com.vantorel.Lumeris    the stored preferences, as JSON
  lumeris watch                                 notifications as they arrive
Items are characters (sent as entity IDs) or entity IDs (sent as they are); --identifier
defaults to com.vantorel.Lumeris.DefaultDataStorage, --application to com.vantorel.lumeris-cli.
In raw JSON, {"$uint64": "5"}, {"$int64": "-1"}, {"$double": 5} and {"$data": "<base64>"} give
the kinds JSON cannot tell apart; null is JSON null; {"$dictionary": {...}} is a literal dictionary.
Exit status: 0 done, 1 no answer (or the service unreachable), 2 an unusable argument (text
that is not valid UTF-8 among them), 3 a write the service handled but the preference file
does not hold.)";

}  // namespace

void BuildCliApp(CLI::App& app, CliSession& session) {
  app.description("The Lumeris file service from a shell: one subcommand per request.");
  app.set_version_flag("--version", lumeris::config::kVersion);
  app.add_flag("--json", session.settings().json, "print machine-readable JSON");
  app.add_option("--timeout", session.settings().timeout_seconds,
                 "seconds to wait for a reply before giving up")
      ->capture_default_str()
      ->check(CLI::PositiveNumber);
  // Global options may also follow the subcommand.
  app.fallthrough();
  app.require_subcommand(1);
  app.footer(kExamples);

  AddSearchCommands(app, session);
  AddCategoryCommand(app, session);
  AddStoreCommands(app, session);
  AddViewerCommand(app, session);
  AddRawCommand(app, session);
  AddDemoCommand(app, session);
  AddDefaultsCommand(app, session.out(), session.err());
  AddWatchCommand(app, session.out(), session.err());
}

int RunCli(int argc, const char* const* argv, ServiceChannel& channel, std::ostream& out,
           std::ostream& err) {
  CliSession session(channel, out, err);
  // The service keeps only well-formed UTF-8; an argument it would drop is refused here.
  for (int i = 1; i < argc; ++i) {
    if (!plist::IsPropertyListText(argv[i])) {
      session.Complain("argument " + std::to_string(i) + " is not valid UTF-8");
      return kExitBadArgument;
    }
  }
  CLI::App app("", "lumeris");
  BuildCliApp(app, session);
  try {
    app.parse(argc, argv);
  } catch (const CLI::ParseError& error) {
    return app.exit(error, out, err);
  }
  return 0;
}

int RunCli(int argc, const char* const* argv, std::ostream& out, std::ostream& err) {
  ClientServiceChannel channel;
  return RunCli(argc, argv, channel, out, err);
}

}  // namespace lumeris::cli
