#include "client/commands/search_commands.h"

#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "client/cli_output.h"

namespace lumeris::cli {
namespace {

struct SearchOptions {
  std::string text;
  std::uint64_t limit = 20;
  std::uint64_t transaction_id = 1;
};

MessageValue SearchRequest(std::string_view command, const SearchOptions& options,
                           bool with_limit) {
  MessageValue request = CommandRequest(command);
  request.Set("string", MessageValue::String(options.text));
  if (with_limit) request.Set("limit", MessageValue::Uint64(options.limit));
  request.Set("transactionID", MessageValue::Uint64(options.transaction_id));
  return request;
}

// One character-database query: its subcommand, the command it sends and how its reply prints.
struct CharacterQuery {
  const char* name;
  const char* command;
  const char* description;
  const char* argument;
  const char* argument_description;
  bool has_limit;
  const char* example;
  // The human form of the reply's "result" (empty when there is nothing) and what to say then.
  std::string (*format)(CliSession& session, const SearchOptions& options,
                        const MessageValue* result);
  const char* when_empty;
};

// The first words of each found character's name, asked of the service one character at a time;
// a character whose record does not come is shown without a name.
std::map<std::string, std::string> CharacterNames(CliSession& session, const MessageValue* result) {
  std::map<std::string, std::string> names;
  if (result == nullptr || !result->is_array()) return names;
  for (const MessageValue& element : *result->AsArray()) {
    const std::string* character = element.AsString();
    if (character == nullptr || names.count(*character)) continue;
    MessageValue request = CommandRequest("search_character_info");
    request.Set("string", MessageValue::String(*character));
    std::optional<MessageValue> reply =
        session.Ask("info", request, session.timeout(), /*quiet=*/true);
    const MessageValue* record = reply ? reply->Find("result") : nullptr;
    const std::string* unam = record ? record->GetString("unam") : nullptr;
    names[*character] = unam ? ShortCharacterName(*unam) : std::string();
  }
  return names;
}

std::string FormatFoundCharacters(CliSession& session, const SearchOptions&,
                                  const MessageValue* result) {
  const std::map<std::string, std::string> names = CharacterNames(session, result);
  return FormatCharacters(result, &names);
}

std::string FormatInformation(CliSession&, const SearchOptions& options,
                              const MessageValue* result) {
  return FormatCharacterInfo(options.text, result);
}

constexpr CharacterQuery kCharacterQueries[] = {
    {"search", "search_matched_chars",
     "Characters whose name contains TEXT, with code points and names", "text",
     "the text to look for in character names", true, "lumeris search 'smiling face' --limit 5",
     &FormatFoundCharacters, "(none)"},
    {"related", "search_related_chars", "Characters related to CHARACTER, with code points and names",
     "character", "the character", true, "lumeris related 中 --limit 10", &FormatFoundCharacters,
     "(none)"},
    {"info", "search_character_info",
     "The sixteen information fields of CHARACTER, in field order, with what each holds", "character",
     "the character", false, "lumeris info 中", &FormatInformation,
     "(none)"},
};

void AddCharacterQuery(CLI::App& app, CliSession& session, const CharacterQuery& query) {
  auto options = std::make_shared<SearchOptions>();
  CLI::App* sub = app.add_subcommand(query.name, query.description);
  sub->add_option(query.argument, options->text, query.argument_description)->required();
  if (query.has_limit) {
    sub->add_option("--limit", options->limit, "largest number of results")->capture_default_str();
  }
  sub->add_option("--transaction-id", options->transaction_id,
                  "the number the reply echoes under \"transactionID\"")
      ->capture_default_str();
  sub->footer(std::string("Example: ") + query.example);
  sub->callback([&session, options, &query] {
    std::optional<MessageValue> reply =
        session.Ask(query.name, SearchRequest(query.command, *options, query.has_limit));
    if (!reply) ExitWith(kExitFailure);
    if (session.json()) {
      session.PrintJson(ReplyJson(*reply));
    } else {
      session.PrintLines(query.format(session, *options, reply->Find("result")), query.when_empty);
    }
  });
}

}  // namespace

void AddSearchCommands(CLI::App& app, CliSession& session) {
  for (const CharacterQuery& query : kCharacterQueries) AddCharacterQuery(app, session, query);
}

}  // namespace lumeris::cli
