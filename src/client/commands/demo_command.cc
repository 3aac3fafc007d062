#include "client/commands/demo_command.h"

#include <algorithm>
#include <chrono>
#include <functional>
#include <string>

#include "client/cli_items.h"
#include "client/cli_output.h"
#include "client/commands/category_command.h"
#include "service/socket_path.h"

namespace lumeris::cli {
namespace {

using namespace std::chrono_literals;

// A tour step waits at most this long for an answer (or --timeout when that is shorter).
constexpr std::chrono::milliseconds kStepTimeout = 1500ms;

class Tour {
 public:
  explicit Tour(CliSession& session)
      : session_(session), timeout_(std::min(session.timeout(), kStepTimeout)) {}

  // Prints `title`, then the formatted reply (indented), or why there is none.
  std::optional<MessageValue> Show(const std::string& title, const MessageValue& request,
                                   const std::function<std::string(const MessageValue&)>& format) {
    session_.out() << title << '\n';
    std::optional<MessageValue> reply = session_.Ask(title, request, timeout_, /*quiet=*/true);
    if (!reply) {
      session_.out() << "  (no answer: the service does not handle this request yet)\n";
      return reply;
    }
    const std::string text = format(*reply);
    if (text.empty()) session_.out() << "  (none)\n";
    std::size_t start = 0;
    while (start < text.size()) {
      const std::size_t end = text.find('\n', start);
      session_.out() << "  " << text.substr(start, end - start) << '\n';
      start = end == std::string::npos ? text.size() : end + 1;
    }
    return reply;
  }

 private:
  CliSession& session_;
  std::chrono::milliseconds timeout_;
};

MessageValue ListRequest(const char* command, const char* target) {
  MessageValue request = CommandRequest(command);
  request.Set("target", MessageValue::String(target));
  request.Set("identifier", MessageValue::String(kDemoIdentifier));
  return request;
}

MessageValue Strings(std::initializer_list<std::string> strings) {
  MessageValue array = MessageValue::MakeArray();
  for (const std::string& text : strings) array.Append(MessageValue::String(text));
  return array;
}

}  // namespace

int RunDemo(CliSession& session) {
  std::string where = "(unknown socket)";
  if (auto path = ServiceSocketPath()) where = path->string();
  session.out() << "A tour of the Lumeris file service at " << where << '\n';

  // An unknown search sub-command is always answered: it shows the service is there.
  MessageValue ping = CommandRequest("search_");
  ping.Set("transactionID", MessageValue::Uint64(7));
  if (!session.Ask("demo", ping)) return kExitFailure;
  session.out() << "The service answers.\n\n";

  Tour tour(session);
  MessageValue search = CommandRequest("search_matched_chars");
  search.Set("string", MessageValue::String("heart"));
  search.Set("limit", MessageValue::Uint64(5));
  tour.Show("Search \"heart\" (at most 5):", search,
            [](const MessageValue& reply) { return FormatCharacters(reply.Find("result")); });

  MessageValue related = CommandRequest("search_related_chars");
  related.Set("string", MessageValue::String("a"));
  related.Set("limit", MessageValue::Uint64(12));
  tour.Show("Related to a (at most 12):", related,
            [](const MessageValue& reply) { return FormatCharacters(reply.Find("result")); });

  const std::string character = "中";
  MessageValue info = CommandRequest("search_character_info");
  info.Set("string", MessageValue::String(character));
  tour.Show("Information about " + character + ":", info, [&](const MessageValue& reply) {
    return FormatCharacterInfo(character, reply.Find("result"));
  });

  MessageValue categories = CommandRequest("read_categorydata");
  categories.Set("categories", Strings({"Arrows", "Emoji"}));
  tour.Show("The Arrows and Emoji categories (the first 12 characters of each):", categories,
            [](const MessageValue& reply) {
              return FormatCategoryEntries({"Arrows", "Emoji"}, reply.Find("result"), 12);
            });

  session.out() << "\nUser data, under the storage identifier " << kDemoIdentifier << ":\n";
  const ItemOptions emoji{.emoji_font = true};
  MessageValue add = ListRequest("add", "recents");
  add.Set("item", MessageValue::String(EntityIDForItem("😀", emoji)));
  MessageValue add_second = ListRequest("add", "recents");
  add_second.Set("item", MessageValue::String(EntityIDForItem("A", {})));
  MessageValue favorites = ListRequest("set", "favorites");
  favorites.Set("array", Strings({EntityIDForItem("★", {}), EntityIDForItem("♥", {})}));
  MessageValue skin_tone = CommandRequest("set_skintone");
  skin_tone.Set("identifier", MessageValue::String(kDemoIdentifier));
  skin_tone.Set("item", MessageValue::String(EntityIDForItem("👍🏽", emoji)));
  if (!session.Tell("demo", add) || !session.Tell("demo", add_second) ||
      !session.Tell("demo", favorites) || !session.Tell("demo", skin_tone)) {
    return kExitFailure;
  }
  const auto items = [](const MessageValue& reply) { return FormatItems(reply.Find("array")); };
  tour.Show("Recents after adding 😀 and A:", ListRequest("read", "recents"), items);
  tour.Show("Favourites after setting ★ ♥:", ListRequest("read", "favorites"), items);
  MessageValue read_all = CommandRequest("read_recents_favorites");
  read_all.Set("identifier", MessageValue::String(kDemoIdentifier));
  read_all.Set("application", MessageValue::String(kDefaultApplication));
  tour.Show("Everything at once, after choosing 👍🏽:", read_all,
            [](const MessageValue& reply) { return FormatReadAll(reply); });

  // Setting no list removes it, and an empty recents list takes the skin tones with it.
  if (!session.Tell("demo", ListRequest("set", "recents")) ||
      !session.Tell("demo", ListRequest("set", "favorites"))) {
    return kExitFailure;
  }
  session.out() << "\nThe demo's entries are removed again.\n";
  return 0;
}

void AddDemoCommand(CLI::App& app, CliSession& session) {
  CLI::App* demo = app.add_subcommand("demo", "A short tour through the service");
  demo->footer("Example: lumeris demo");
  demo->callback([&session] {
    if (int status = RunDemo(session); status != 0) ExitWith(status);
  });
}

}  // namespace lumeris::cli
