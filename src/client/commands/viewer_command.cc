#include "client/commands/viewer_command.h"

#include <memory>
#include <optional>
#include <string>

#include "client/cli_output.h"

namespace lumeris::cli {

void AddViewerCommand(CLI::App& app, CliSession& session) {
  auto path = std::make_shared<std::optional<std::string>>();
  CLI::App* sub = app.add_subcommand(
      "open-large-viewer", "Record PATH for the input method's large window (none: remove it)");
  sub->add_option("path", *path, "the path to hand to the large window");
  sub->footer("Example: lumeris open-large-viewer /tmp/picked.txt");
  sub->callback([&session, path] {
    MessageValue request = CommandRequest("open_large_viewer");
    if (*path) request.Set("path", MessageValue::String(**path));
    std::optional<MessageValue> reply = session.Ask("open-large-viewer", request);
    if (!reply) ExitWith(kExitNoAnswer);
    if (session.json()) {
      session.PrintJson(ReplyJson(*reply));
    } else {
      session.out() << (*path ? "large window path recorded: " + **path
                              : std::string("large window path removed"))
                    << '\n';
    }
  });
}

}  // namespace lumeris::cli
