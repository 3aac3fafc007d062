#include "client/commands/store_commands.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <memory>
#include <string>
#include <vector>

#include "client/cli_items.h"
#include "client/cli_json_value.h"
#include "client/cli_output.h"
#include "store/json_payload.h"
#include "store/store_keys.h"

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
  sub.add_flag("--emoji-font", item.emoji_font, "record the characters as picked in the colour emoji font");
}

// After a write: the request in --json mode, else "<subject>: <what was done>".
void ReportDone(CliSession& session, const MessageValue& request, const std::string& line) {
  if (session.json()) {
    session.PrintJson({{"sent", JsonFromMessageValue(request)}});
  } else {
    session.out() << line << '\n';
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

// The entity IDs of the typed items; a usage error for an item the service cannot use.
std::vector<std::string> EntityIDs(CliSession& session, const std::string& what, const ListOptions& options) {
  std::vector<std::string> ids;
  for (const std::string& item : options.items) {
    if (std::optional<std::string> problem = ItemProblem(item)) session.Refuse(what, *problem);
    ids.push_back(EntityIDForItem(item, options.item));
  }
  return ids;
}

// The stored list of `target`, read through the service; ends the command when there is none.
std::vector<std::string> ReadList(CliSession& session, const std::string& what, const std::string& target,
                                  const std::string& identifier) {
  MessageValue request = CommandRequest("read");
  request.Set("target", MessageValue::String(target));
  request.Set("identifier", MessageValue::String(identifier));
  std::optional<MessageValue> reply = session.Ask(what, request);
  if (!reply) ExitWith(kExitFailure);
  std::vector<std::string> ids;
  const MessageValue* array = reply->Find("array");
  if (const MessageValue::Array* elements = array ? array->AsArray() : nullptr) {
    for (const MessageValue& element : *elements) {
      if (const std::string* id = element.AsString()) ids.push_back(*id);
    }
  }
  return ids;
}

// Sends "set" of `ids` for `target` (none: removes the list) and checks the file holds it.
MessageValue SetList(CliSession& session, const std::string& what, const std::string& target,
                     const std::string& identifier, const std::vector<std::string>& ids) {
  MessageValue request = CommandRequest("set");
  request.Set("target", MessageValue::String(target));
  request.Set("identifier", MessageValue::String(identifier));
  if (!ids.empty()) {
    MessageValue array = MessageValue::MakeArray();
    for (const std::string& id : ids) array.Append(MessageValue::String(id));
    request.Set("array", std::move(array));
  }
  const std::string key = StoreKey(target == "recents" ? kRecentsKeyPrefix : kFavoritesKeyPrefix, identifier);
  const int status = session.TellStored(what, request, {key, [&ids](const plist::Value* found) {
    if (ids.empty()) return found == nullptr;
    const plist::Array* stored = found ? found->AsArray() : nullptr;
    return stored != nullptr && std::equal(stored->begin(), stored->end(), ids.begin(), ids.end(),
                                           [](const plist::Value& a, const std::string& b) {
                                             return a.AsString() && *a.AsString() == b;
                                           });
  }});
  if (status != 0) ExitWith(status);
  return request;
}

void PrintList(CliSession& session, const std::string& target, const std::string& identifier) {
  MessageValue request = CommandRequest("read");
  request.Set("target", MessageValue::String(target));
  request.Set("identifier", MessageValue::String(identifier));
  std::optional<MessageValue> reply = session.Ask(target, request);
  if (!reply) ExitWith(kExitFailure);
  if (session.json()) {
    session.PrintJson(ReplyJson(*reply));
  } else {
    session.PrintLines(FormatItems(reply->Find("array")), "(none)");
  }
}

// "recents" or "favorites": read (also with no verb), set, add, and for favourites remove.
void AddListCommands(CLI::App& app, CliSession& session, const std::string& target, const std::string& description) {
  auto options = std::make_shared<ListOptions>();
  const bool recents = target == "recents";
  CLI::App* list = app.add_subcommand(target, description);
  AddIdentifierOption(*list, options->identifier);
  list->footer("Examples:\n  lumeris " + target + "\n  lumeris --json " + target + " --identifier " +
               kDefaultIdentifier);
  list->callback([&session, options, target, list] {
    if (list->get_subcommands().empty()) PrintList(session, target, options->identifier);
  });

  CLI::App* read = list->add_subcommand("read", "Print the " + target + " list, one character per line");
  read->footer("Example: lumeris " + target + " read");
  read->callback([&session, options, target] { PrintList(session, target, options->identifier); });

  CLI::App* set = list->add_subcommand("set", "Replace the whole " + target + " list");
  set->add_option("items", options->items, "characters or entity IDs, in order (none: clear the list)");
  AddEmojiFontFlag(*set, options->item);
  set->footer("Examples:\n  lumeris " + target + " set 😀 ★ --emoji-font\n  lumeris " + target + " set");
  set->callback([&session, options, target] {
    const std::string what = target + " set";
    const std::vector<std::string> ids = EntityIDs(session, what, *options);
    const MessageValue request = SetList(session, what, target, options->identifier, ids);
    ReportDone(session, request, ids.empty() ? target + ": cleared" : target + ": set to " + ItemsText(ids));
  });

  CLI::App* add = list->add_subcommand(
      "add", recents ? "Put ITEM at the front of the recents list" : "Put ITEM at the end of the favorites list");
  add->add_option("item", options->items, "a character or an entity ID")->required()->expected(1);
  AddEmojiFontFlag(*add, options->item);
  CLI::Option* font = add->add_option("--font", options->item.font, "the font it was picked in");
  CLI::Option* glyph = add->add_option("--glyph", options->item.glyph, "its glyph index in that font");
  font->needs(glyph);
  glyph->needs(font);
  add->footer("Examples:\n  lumeris " + target + " add 👍🏽 --emoji-font\n  lumeris " + target +
              " add A --font 'DejaVu Sans' --glyph 36");
  add->callback([&session, options, target, recents] {
    const std::string what = target + " add";
    const std::string id = EntityIDs(session, what, *options).front();
    if (!recents) {
      // Favourites have no "add" request: the list is read, extended and set.
      std::vector<std::string> ids = ReadList(session, what, target, options->identifier);
      if (std::find(ids.begin(), ids.end(), id) != ids.end()) {
        session.Complain(what + ": " + ItemsText({id}) + " is already in the list; nothing changed");
        return;
      }
      ids.push_back(id);
      ReportDone(session, SetList(session, what, target, options->identifier, ids),
                 target + ": added " + ItemsText({id}));
      return;
    }
    MessageValue request = CommandRequest("add");
    request.Set("target", MessageValue::String(target));
    request.Set("identifier", MessageValue::String(options->identifier));
    request.Set("item", MessageValue::String(id));
    const int status = session.TellStored(
        what, request, {StoreKey(kRecentsKeyPrefix, options->identifier), [&id](const plist::Value* found) {
          const plist::Array* stored = found ? found->AsArray() : nullptr;
          return stored && !stored->empty() && stored->front().AsString() && *stored->front().AsString() == id;
        }});
    if (status != 0) ExitWith(status);
    ReportDone(session, request, target + ": added " + ItemsText({id}));
  });

  if (recents) return;  // setting recents also records a skin tone: no read-modify-set for them
  CLI::App* remove = list->add_subcommand("remove", "Take ITEM out of the favorites list");
  remove->add_option("item", options->items, "a character or an entity ID")->required()->expected(1);
  AddEmojiFontFlag(*remove, options->item);
  remove->footer("Example: lumeris favorites remove ★");
  remove->callback([&session, options, target] {
    const std::string what = target + " remove";
    const std::string id = EntityIDs(session, what, *options).front();
    std::vector<std::string> ids = ReadList(session, what, target, options->identifier);
    if (std::erase(ids, id) == 0) {
      session.Complain(what + ": " + ItemsText({id}) + " is not in the list");
      ExitWith(kExitFailure);
    }
    ReportDone(session, SetList(session, what, target, options->identifier, ids),
               target + ": removed " + ItemsText({id}));
  });
}

void AddSkinToneCommand(CLI::App& app, CliSession& session) {
  auto options = std::make_shared<ListOptions>();
  CLI::App* sub = app.add_subcommand("skintone", "Remember ITEM as the skin tone last chosen for its emoji");
  sub->add_option("item", options->items, "an emoji with its skin tone, or an entity ID")->required()->expected(1);
  sub->add_flag("--emoji-font", options->item.emoji_font, "record the colour emoji font (the default)");
  AddIdentifierOption(*sub, options->identifier);
  sub->footer("Examples:\n  lumeris skintone 👍🏽\n  lumeris skintone 👍  (back to the plain emoji)");
  sub->callback([&session, options] {
    // The service keeps a skin tone only for an emoji picked in the emoji font.
    options->item.emoji_font = true;
    const std::string id = EntityIDs(session, "skintone", *options).front();
    const ItemDescription item = DescribeEntityID(id);
    if (!item.character || !TakesSkinTone(*item.character)) {
      session.Refuse("skintone", ItemsText({id}) + " is not an emoji that takes a skin tone");
    }
    if (item.font.value_or("") != "VantorelColorEmoji") {
      session.Refuse("skintone", "the service keeps skin tones only for the emoji font VantorelColorEmoji");
    }
    MessageValue request = CommandRequest("set_skintone");
    request.Set("identifier", MessageValue::String(options->identifier));
    request.Set("item", MessageValue::String(id));
    const std::string character = *item.character;
    if (!session.Tell("skintone", request)) ExitWith(kExitFailure);
    ReportDone(session, request, "skintone: set to " + character);
  });
}

struct StateOptions {
  std::string application = kDefaultApplication;
  std::string json;
};

void AddApplicationOption(CLI::App& sub, std::string& application) {
  sub.add_option("--application", application, "client application")->capture_default_str();
}

void PrintState(CliSession& session, const std::string& application) {
  MessageValue request = CommandRequest("read_recents_favorites");
  request.Set("identifier", MessageValue::String(kDefaultIdentifier));
  request.Set("application", MessageValue::String(application));
  std::optional<MessageValue> reply = session.Ask("state", request);
  if (!reply) ExitWith(kExitFailure);
  nlohmann::json state = ReplyJson(*reply).value("state", nlohmann::json::object());
  if (session.json()) {
    session.PrintJson(state);
  } else {
    session.PrintLines(state.empty() ? "" : JsonText(state, false) + "\n", "(none)");
  }
}

void AddStateCommands(CLI::App& app, CliSession& session) {
  auto options = std::make_shared<StateOptions>();
  CLI::App* state = app.add_subcommand("state", "The panel's saved state per application (read, save, clear)");
  AddApplicationOption(*state, options->application);
  state->footer("Examples:\n  lumeris state --application com.example.app\n  lumeris state clear");
  state->callback([&session, options, state] {
    if (state->get_subcommands().empty()) PrintState(session, options->application);
  });

  CLI::App* read = state->add_subcommand("read", "Print the state saved for APP, as JSON");
  read->footer("Example: lumeris state read --application com.example.app");
  read->callback([&session, options] { PrintState(session, options->application); });

  CLI::App* save = state->add_subcommand("save", "Save JSON (an object without null) as the state of APP");
  save->add_option("json", options->json, "the state, a JSON object")->required();
  save->footer(
      "Example: lumeris state save --application com.example.app '{\"VTGlobalEmojiDiversityDescribed\":true}'\n"
      "The member VTGlobalEmojiDiversityDescribed is kept once for every application.");
  save->callback([&session, options] {
    // The service's own rule: it keeps only a JSON object without null.
    const JsonPayload payload = ParseJsonPayload(options->json);
    if (payload.status == JsonPayload::Status::kNotJson) session.Refuse("state save", "not valid JSON: " + options->json);
    if (payload.status == JsonPayload::Status::kUnstorable) {
      session.Refuse("state save", "the state must be a JSON object with no null in it");
    }
    if (payload.object.empty()) session.Refuse("state save", "an empty object changes nothing (state clear removes the state)");
    MessageValue request = CommandRequest("save_state");
    request.Set("application", MessageValue::String(options->application));
    request.Set("data", MessageValue::DataFromBytes(options->json));
    plist::Dictionary expected = payload.object;
    std::string key = StoreKey(kStateKeyPrefix, options->application);
    if (expected.size() == 1 && expected.contains(kGlobalEmojiDiversityKey)) key = std::string(kGlobalEmojiDiversityKey);
    expected.erase(std::string(kGlobalEmojiDiversityKey));
    const plist::Value* global = payload.object.contains(kGlobalEmojiDiversityKey)
                                     ? &payload.object.find(kGlobalEmojiDiversityKey)->second
                                     : nullptr;
    const int status = session.TellStored("state save", request, {key, [&](const plist::Value* found) {
      if (expected.empty()) return found != nullptr && global != nullptr && *found == *global;
      return found != nullptr && *found == plist::Value(expected);
    }});
    if (status != 0) ExitWith(status);
    ReportDone(session, request, "state: saved for " + options->application);
  });

  CLI::App* clear = state->add_subcommand("clear", "Remove the state saved for APP");
  clear->footer("Example: lumeris state clear --application com.example.app\n"
                "VTGlobalEmojiDiversityDescribed, kept for every application, stays.");
  clear->callback([&session, options] {
    // No request removes a state (saving an empty object changes nothing): the preference file is
    // written directly, under the same lock the service takes.
    std::string error;
    if (!session.channel().RemoveStoreKey(StoreKey(kStateKeyPrefix, options->application), &error)) {
      session.Complain("state clear: " + error);
      ExitWith(kExitFailure);
    }
    if (session.json()) {
      session.PrintJson({{"cleared", options->application}});
    } else {
      session.out() << "state: cleared for " << options->application << '\n';
    }
  });
}

void AddReadAllCommand(CLI::App& app, CliSession& session) {
  auto options = std::make_shared<StateOptions>();
  auto identifier = std::make_shared<std::string>(kDefaultIdentifier);
  CLI::App* sub = app.add_subcommand("read-all", "Recents, favourites, skin tones and saved state in one request");
  AddIdentifierOption(*sub, *identifier);
  AddApplicationOption(*sub, options->application);
  sub->footer("Examples:\n  lumeris read-all --application com.example.app\n  lumeris --json read-all");
  sub->callback([&session, options, identifier] {
    MessageValue request = CommandRequest("read_recents_favorites");
    request.Set("identifier", MessageValue::String(*identifier));
    request.Set("application", MessageValue::String(options->application));
    std::optional<MessageValue> reply = session.Ask("read-all", request);
    if (!reply) ExitWith(kExitFailure);
    if (session.json()) {
      session.PrintJson(ReplyJson(*reply));
    } else {
      session.out() << FormatReadAll(*reply);
    }
  });
}

}  // namespace

void AddStoreCommands(CLI::App& app, CliSession& session) {
  AddListCommands(app, session, "recents", "Recently used characters (read, set, add)");
  AddListCommands(app, session, "favorites", "Favourite characters (read, set, add, remove)");
  AddSkinToneCommand(app, session);
  AddStateCommands(app, session);
  AddReadAllCommand(app, session);
}

}  // namespace lumeris::cli
