#include "client/cli_app.h"

#include <charconv>
#include <cmath>

#include "client/cli_suggestion.h"
#include "client/commands/category_command.h"
#include "client/commands/demo_command.h"
#include "client/commands/raw_command.h"
#include "client/commands/search_commands.h"
#include "client/commands/status_command.h"
#include "client/commands/store_commands.h"
#include "client/commands/viewer_command.h"
#include "client/defaults_command.h"
#include "client/watch_command.h"
#include "lumeris/config.h"
#include "platform/property_list_io.h"

namespace lumeris::cli {
namespace {

// The longest --timeout: a day, far beyond any reply, and safe to add to the clock.
constexpr double kMaxTimeoutSeconds = 86400;

constexpr char kFooter[] = R"(Examples:
  lumeris search 'smiling face' --limit 5      characters and their code points
  lumeris recents add 👍🏽                       put an emoji at the front of the recents
  lumeris favorites --json                      the favourites as JSON, for scripts
  lumeris status                                is the service running, and with what
Each subcommand's --help shows its own options and examples (lumeris recents --help).
Items are characters (sent as entity IDs) or entity IDs (sent as they are). In JSON, tags give
the kinds JSON cannot tell apart: {"$base64": "AP8="} or {"$hex": "00ff"} for bytes,
{"$uint64": "5"}, {"$int64": "-1"}, {"$double": "nan"}, {"$date": "2024-05-01T12:00:00Z"}.
)";

constexpr char kUsageHint[] = "run 'lumeris --help' for the subcommands, 'lumeris SUBCOMMAND --help' for one";

// --timeout: a positive number of seconds, said so when it is anything else.
std::string CheckTimeout(std::string& text) {
  double seconds = 0;
  const auto [end, status] = std::from_chars(text.data(), text.data() + text.size(), seconds);
  if (status == std::errc() && end == text.data() + text.size() && std::isfinite(seconds) && seconds > 0 &&
      seconds <= kMaxTimeoutSeconds) {
    return {};
  }
  return "expects a positive number of seconds (at most 86400), not \"" + text + "\"";
}

// The subcommand names of `app`.
std::vector<std::string> SubcommandNames(const CLI::App& app) {
  std::vector<std::string> names;
  for (const CLI::App* sub : app.get_subcommands([](const CLI::App*) { return true; })) {
    names.push_back(sub->get_name());
  }
  return names;
}

// The option `name` of `app` or, through fallthrough, of its parents; nullptr when none has it.
const CLI::Option* FindOption(const CLI::App* app, const std::string& name) {
  for (; app != nullptr; app = app->get_parent()) {
    if (const CLI::Option* option = app->get_option_no_throw(name)) return option;
  }
  return nullptr;
}

// Walks the command line as the subcommand tree expects it and returns a usage error for the
// first option that no level knows, or the first word that stands where a subcommand belongs but
// names none ("lumeris recent", with the nearest name); empty when there is none.
std::string UnknownSubcommand(const CLI::App& app, int argc, const char* const* argv) {
  const CLI::App* current = &app;
  for (int i = 1; i < argc; ++i) {
    const std::string word = argv[i];
    if (word == "--") break;
    if (word.starts_with("-") && word.size() > 1) {
      const std::string name = word.substr(0, word.find('='));
      const CLI::Option* option = FindOption(current, name);
      if (option == nullptr && name.starts_with("--")) return "unknown option \"" + name + "\"";
      if (option != nullptr && name.size() == word.size() && option->get_expected_max() > 0) ++i;
      continue;
    }
    const std::vector<std::string> names = SubcommandNames(*current);
    if (std::find(names.begin(), names.end(), word) != names.end()) {
      current = current->get_subcommand(word);
      continue;
    }
    // A level with positional arguments takes the word as one of them.
    if (names.empty() || !current->get_options([](const CLI::Option* o) { return o->get_positional(); }).empty()) {
      return {};
    }
    std::string what = current == &app ? "" : current->get_name() + ": ";
    std::string message = what + "unknown subcommand \"" + word + "\"";
    if (std::optional<std::string> nearest = NearestName(word, names)) message += "; did you mean \"" + *nearest + "\"?";
    return message;
  }
  return {};
}

}  // namespace

void BuildCliApp(CLI::App& app, CliSession& session) {
  app.description(
      "The Lumeris file service from a shell: one subcommand per request. It connects to the "
      "service's socket and starts lumeris-fileservice when nothing listens there.");
  app.set_version_flag("--version", lumeris::config::kVersion, "print the version and exit");
  app.set_help_flag("--help,-h", "print this help (or a subcommand's) and exit");
  app.add_flag("--json", session.settings().json, "print machine-readable JSON (one line) instead of text for people");
  app.add_option("--timeout", session.settings().timeout_seconds, "seconds to wait for a reply before giving up")
      ->capture_default_str()
      ->type_name("SECONDS")
      ->check(CLI::Validator(CheckTimeout, "", "positive seconds"));
  // Global options may also follow the subcommand.
  app.fallthrough();
  app.require_subcommand(1);

  AddSearchCommands(app, session);
  AddCategoryCommand(app, session);
  AddStoreCommands(app, session);
  AddViewerCommand(app, session);
  AddRawCommand(app, session);
  AddStatusCommand(app, session);
  AddDemoCommand(app, session);
  AddDefaultsCommand(app, session.out(), session.err(), &session.settings().json);
  AddWatchCommand(app, session.out(), session.err(), &session.settings().json);
  // Set last: a subcommand copies its parent's footer when it is added.
  app.footer(std::string(kFooter) + kExitStatusText);
}

int RunCli(int argc, const char* const* argv, ServiceChannel& channel, std::ostream& out, std::ostream& err) {
  CliSession session(channel, out, err);
  // The service keeps only well-formed UTF-8; an argument it would drop is refused here.
  for (int i = 1; i < argc; ++i) {
    if (!plist::IsPropertyListText(argv[i])) {
      session.Complain("argument " + std::to_string(i) + " is not valid UTF-8");
      return kExitUsage;
    }
  }
  CLI::App app("", "lumeris");
  BuildCliApp(app, session);
  if (const std::string unknown = UnknownSubcommand(app, argc, argv); !unknown.empty()) {
    session.Complain(unknown);
    session.Complain(kUsageHint);
    return kExitUsage;
  }
  try {
    app.parse(argc, argv);
  } catch (const CLI::CallForHelp&) {
    out << app.help();
    return 0;
  } catch (const CLI::CallForAllHelp&) {
    out << app.help("", CLI::AppFormatMode::All);
    return 0;
  } catch (const CLI::CallForVersion&) {
    out << lumeris::config::kVersion << '\n';
    return 0;
  } catch (const CLI::RuntimeError& error) {
    return error.get_exit_code();  // the command has said why
  } catch (const CLI::ParseError& error) {
    std::string message = error.what();
    if (argc == 1 || message == "A subcommand is required") message = "a subcommand is required";
    session.Complain(message);
    session.Complain(kUsageHint);
    return kExitUsage;
  }
  return 0;
}

int RunCli(int argc, const char* const* argv, std::ostream& out, std::ostream& err) {
  ClientServiceChannel channel;
  return RunCli(argc, argv, channel, out, err);
}

}  // namespace lumeris::cli
