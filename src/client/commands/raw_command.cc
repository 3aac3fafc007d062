#include "client/commands/raw_command.h"

#include <memory>
#include <string>

#include "client/cli_json_value.h"

namespace lumeris::cli {
namespace {

struct RawOptions {
  std::string json;
  bool no_reply = false;
};

}  // namespace

void AddRawCommand(CLI::App& app, CliSession& session) {
  auto options = std::make_shared<RawOptions>();
  CLI::App* raw = app.add_subcommand("raw", "Send any request dictionary given as JSON");
  raw->add_option("json", options->json, "the request dictionary")->required();
  raw->add_flag("--no-reply", options->no_reply,
                "send it as a message that wants no reply (for set, add, set_skintone, "
                "save_state and unknown commands)");
  raw->footer(
      "Typed values where JSON cannot tell: {\"$uint64\": \"5\"}, {\"$int64\": \"-1\"}, "
      "{\"$double\": 5}, {\"$data\": \"<base64>\"}; null is JSON null; "
      "{\"$dictionary\": {...}} keeps a literal key that begins with \"$\".\n"
      "Example: lumeris raw '{\"command\":\"read\",\"target\":\"recents\","
      "\"identifier\":\"com.vantorel.Lumeris.DefaultDataStorage\"}'");
  raw->callback([&session, options] {
    std::string error;
    std::optional<MessageValue> request = MessageValueFromJsonText(options->json, &error);
    if (request && !request->is_dictionary()) {
      request.reset();
      error = "the request must be a JSON object";
    }
    if (!request) {
      session.Complain("raw: " + error);
      ExitWith(kExitBadArgument);
    }
    if (options->no_reply) {
      if (!session.Tell("raw", *request)) ExitWith(kExitNoAnswer);
      if (!session.json()) session.out() << "sent\n";
      return;
    }
    std::optional<MessageValue> reply = session.Ask("raw", *request);
    if (!reply) {
      session.Complain(
          "raw: commands that never answer (set, add, set_skintone, save_state, unknown ones) "
          "are sent with --no-reply");
      ExitWith(kExitNoAnswer);
    }
    session.out() << JsonText(JsonFromMessageValue(*reply), !session.json()) << '\n';
  });
}

}  // namespace lumeris::cli
