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
      "Tags give the kinds JSON cannot tell apart: {\"$uint64\": \"5\"}, {\"$int64\": \"-1\"}, "
      "{\"$double\": \"nan\"}, bytes as {\"$base64\": \"AP8=\"} or {\"$hex\": \"00ff\"}; "
      "{\"$dictionary\": {...}} keeps a literal key that begins with \"$\". Replies print the same way.\n"
      "Examples:\n"
      "  lumeris raw '{\"command\":\"search_matched_chars\",\"string\":\"cat\",\"limit\":{\"$uint64\":\"5\"}}'\n"
      "  lumeris raw --no-reply '{\"command\":\"save_state\",\"application\":\"x\",\"data\":{\"$base64\":\"e30=\"}}'");
  raw->callback([&session, options] {
    std::string error;
    std::string note;
    std::optional<MessageValue> request = MessageValueFromJsonText(options->json, &error, &note);
    if (request && !request->is_dictionary()) {
      request.reset();
      error = "the request must be a JSON object";
    }
    if (!request) session.Refuse("raw", error);
    if (!note.empty()) session.Complain("raw: warning: " + note);
    if (options->no_reply) {
      if (!session.Tell("raw", *request)) ExitWith(kExitFailure);
      if (session.json()) {
        session.PrintJson({{"sent", JsonFromMessageValue(*request)}});
      } else {
        session.out() << "raw: sent; the service has handled it (such messages get no reply)\n";
      }
      return;
    }
    std::optional<MessageValue> reply = session.Ask("raw", *request);
    if (!reply) {
      session.Complain(
          "raw: commands that never answer (set, add, set_skintone, save_state, unknown ones) "
          "are sent with --no-reply");
      ExitWith(kExitFailure);
    }
    session.out() << JsonText(JsonFromMessageValue(*reply), !session.json()) << '\n';
  });
}

}  // namespace lumeris::cli
