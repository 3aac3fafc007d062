#include "client/commands/store_commands.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <memory>
#include <string>
#include <vector>

#include "client/cli_items.h"
#include "client/cli_json_value.h"
#include "client/cli_output.h"

namespace lumeris::cli {
namespace {

struct ListOptions {
  std::string identifier = kDefaultIdentifier;
  std::vector<std::string> items;
  ItemOptions item;
};

void AddIdentifierOption(CLI::App& sub, std::string& identifier) {
  sub.add_option("--identifier", identifier, "storage identifier")->capture_default_str();
}

void AddEmojiFontFlag(CLI::App& sub, ItemOptions& item) {
  sub.add_flag("--emoji-font", item.emoji_font,
               "record the characters as picked in the colour emoji font");
}

// After a write: the request in --json mode, else one line saying what was done.
void ReportSent(CliSession& session, const MessageValue& request, const std::string& what) {
  if (session.json()) {
    session.PrintJson({{"sent", JsonFromMessageValue(request)}});
  } else {
    session.out() << what << '\n';
  }
}

// The characters of entity IDs, space-separated (an opaque ID stands for itself).
std::string ItemsText(const std::vector<std::string>& ids) {
  std::string characters;
  for (const std::string& id : ids) {
    if (!characters.empty()) characters += ' ';
    characters += DescribeEntityID(id).character.value_or(id);
  }
  return characters;
}

// "recents" or "favorites" with its "read" and "set" (and for recents "add").
void AddListCommands(CLI::App& app, CliSession& session, const std::string& target,
                     const std::string& description, bool with_add) {
  auto options = std::make_shared<ListOptions>();
  CLI::App* list = app.add_subcommand(target, description);
  AddIdentifierOption(*list, options->identifier);

  CLI::App* set = list->add_subcommand("set", "Replace the whole " + target + " list");
  set->add_option("items", options->items, "characters or entity IDs, in order (none: remove)");
  AddEmojiFontFlag(*set, options->item);
  set->footer("Example: lumeris " + target + " set 😀 ★ --emoji-font");
  set->callback([&session, options, target] {
    MessageValue request = CommandRequest("set");
    request.Set("target", MessageValue::String(target));
    request.Set("identifier", MessageValue::String(options->identifier));
    std::vector<std::string> ids;
    if (!options->items.empty()) {
      MessageValue array = MessageValue::MakeArray();
      for (const std::string& item : options->items) {
        ids.push_back(EntityIDForItem(item, options->item));
        array.Append(MessageValue::String(ids.back()));
      }
      request.Set("array", std::move(array));
    }
    const std::string key = (target == "recents" ? "Recents:" : "Favorites:") + options->identifier;
    const int status = session.TellStored(target + " set", request, {key, [&ids](const plist::Value* found) {
      if (ids.empty()) return found == nullptr;
      const plist::Array* stored = found ? found->AsArray() : nullptr;
      return stored != nullptr && std::equal(stored->begin(), stored->end(), ids.begin(), ids.end(),
                                             [](const plist::Value& a, const std::string& b) {
                                               return a.AsString() && *a.AsString() == b;
                                             });
    }});
    if (status != 0) ExitWith(status);
    ReportSent(session, request,
               ids.empty() ? target + ": removed" : target + ": set to " + ItemsText(ids));
  });

  if (with_add) {
    CLI::App* add = list->add_subcommand("add", "Put ITEM at the front of the " + target + " list");
    add->add_option("item", options->items, "a character or an entity ID")->required()->expected(1);
    AddEmojiFontFlag(*add, options->item);
    CLI::Option* font = add->add_option("--font", options->item.font, "the font it was picked in");
    CLI::Option* glyph =
        add->add_option("--glyph", options->item.glyph, "its glyph index in that font");
    font->needs(glyph);
    glyph->needs(font);
    add->footer("Example: lumeris " + target + " add 👍🏽 --emoji-font");
    add->callback([&session, options, target] {
      const std::string id = EntityIDForItem(options->items.front(), options->item);
      MessageValue request = CommandRequest("add");
      request.Set("target", MessageValue::String(target));
      request.Set("identifier", MessageValue::String(options->identifier));
      request.Set("item", MessageValue::String(id));
      const int status = session.TellStored(
          target + " add", request, {"Recents:" + options->identifier, [&id](const plist::Value* found) {
            const plist::Array* stored = found ? found->AsArray() : nullptr;
            return stored && !stored->empty() && stored->front().AsString() && *stored->front().AsString() == id;
          }});
      if (status != 0) ExitWith(status);
      ReportSent(session, request, target + ": added " + ItemsText({id}));
    });
  }

  list->footer("Example: lumeris " + target + " --identifier " + kDefaultIdentifier);
  list->callback([&session, options, target, list] {
    if (!list->get_subcommands().empty()) return;
    MessageValue request = CommandRequest("read");
    request.Set("target", MessageValue::String(target));
    request.Set("identifier", MessageValue::String(options->identifier));
    std::optional<MessageValue> reply = session.Ask(target, request);
    if (!reply) ExitWith(kExitNoAnswer);
    if (session.json()) {
      session.PrintJson(ReplyJson(*reply));
    } else {
      session.PrintLines(FormatItems(reply->Find("array")), "(empty)");
    }
  });
}

void AddSkinToneCommand(CLI::App& app, CliSession& session) {
  auto options = std::make_shared<ListOptions>();
  CLI::App* sub = app.add_subcommand("skintone", "Remember ITEM as the skin tone last chosen");
  sub->add_option("item", options->items, "an emoji with its skin tone, or an entity ID")
      ->required()
      ->expected(1);
  AddEmojiFontFlag(*sub, options->item);
  AddIdentifierOption(*sub, options->identifier);
  sub->footer("Example: lumeris skintone 👍🏽 --emoji-font");
  sub->callback([&session, options] {
    const std::string id = EntityIDForItem(options->items.front(), options->item);
    MessageValue request = CommandRequest("set_skintone");
    request.Set("identifier", MessageValue::String(options->identifier));
    request.Set("item", MessageValue::String(id));
    if (!session.Tell("skintone", request)) ExitWith(kExitNoAnswer);
    ReportSent(session, request, "skin tone: sent " + ItemsText({id}));
  });
}

struct StateOptions {
  std::string application = kDefaultApplication;
  std::string json;
};

void AddStateCommands(CLI::App& app, CliSession& session) {
  auto options = std::make_shared<StateOptions>();
  CLI::App* state = app.add_subcommand("state", "The panel's saved state");
  state->require_subcommand(1);
  CLI::App* save = state->add_subcommand("save", "Save JSON (an object) as the state of APP");
  save->add_option("--application", options->application, "client application")
      ->capture_default_str();
  save->add_option("json", options->json, "the state, a JSON object")->required();
  save->footer(
      "Example: lumeris state save --application com.example.app "
      "'{\"VTGlobalEmojiDiversityDescribed\":true}'");
  save->callback([&session, options] {
    if (!nlohmann::json::accept(options->json)) {
      session.Complain("state save: not valid JSON: " + options->json);
      ExitWith(kExitBadArgument);
    }
    MessageValue request = CommandRequest("save_state");
    request.Set("application", MessageValue::String(options->application));
    request.Set("data", MessageValue::DataFromBytes(options->json));
    if (!session.Tell("state save", request)) ExitWith(kExitNoAnswer);
    ReportSent(session, request, "state: saved for " + options->application);
  });
}

void AddReadAllCommand(CLI::App& app, CliSession& session) {
  auto options = std::make_shared<StateOptions>();
  auto identifier = std::make_shared<std::string>(kDefaultIdentifier);
  CLI::App* sub = app.add_subcommand(
      "read-all", "Recents, favourites, skin tones and saved state in one request");
  AddIdentifierOption(*sub, *identifier);
  sub->add_option("--application", options->application, "client application")
      ->capture_default_str();
  sub->footer("Example: lumeris read-all --application com.example.app");
  sub->callback([&session, options, identifier] {
    MessageValue request = CommandRequest("read_recents_favorites");
    request.Set("identifier", MessageValue::String(*identifier));
    request.Set("application", MessageValue::String(options->application));
    std::optional<MessageValue> reply = session.Ask("read-all", request);
    if (!reply) ExitWith(kExitNoAnswer);
    if (session.json()) {
      session.PrintJson(ReplyJson(*reply));
    } else {
      session.out() << FormatReadAll(*reply);
    }
  });
}

}  // namespace

void AddStoreCommands(CLI::App& app, CliSession& session) {
  AddListCommands(app, session, "recents", "Recently used characters (read, set, add)",
                  /*with_add=*/true);
  AddListCommands(app, session, "favorites", "Favourite characters (read, set)",
                  /*with_add=*/false);
  AddSkinToneCommand(app, session);
  AddStateCommands(app, session);
  AddReadAllCommand(app, session);
}

}  // namespace lumeris::cli
