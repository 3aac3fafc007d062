#include "client/commands/viewer_command.h"

#include <filesystem>
#include <memory>
#include <optional>
#include <string>

#include "client/cli_output.h"

namespace lumeris::cli {

void AddViewerCommand(CLI::App& app, CliSession& session) {
  auto path = std::make_shared<std::optional<std::string>>();
  CLI::App* sub = app.add_subcommand(
      "open-large-viewer", "Record PATH for the input method's large window (none: clear it)");
  sub->add_option("path", *path, "the file to hand to the large window; a relative path is taken from the "
                                 "current directory");
  sub->footer(
      "Examples:\n"
      "  lumeris open-large-viewer picked.txt\n"
      "  lumeris open-large-viewer");
  sub->callback([&session, path] {
    MessageValue request = CommandRequest("open_large_viewer");
    std::string absolute;
    if (*path) {
      if ((*path)->empty()) session.Refuse("open-large-viewer", "the path is empty (leave it out to clear it)");
      // The service and the input method do not share this directory: the path must not depend on it.
      std::error_code error;
      absolute = std::filesystem::absolute(**path, error).string();
      if (error) session.Refuse("open-large-viewer", **path + ": " + error.message());
      request.Set("path", MessageValue::String(absolute));
    }
    std::optional<MessageValue> reply = session.Ask("open-large-viewer", request);
    if (!reply) ExitWith(kExitFailure);
    if (session.json()) {
      session.PrintJson(ReplyJson(*reply));
    } else {
      session.out() << (*path ? "open-large-viewer: set to " + absolute : std::string("open-large-viewer: cleared"))
                    << '\n';
    }
  });
}

}  // namespace lumeris::cli
