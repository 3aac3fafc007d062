#include "client/commands/search_commands.h"

#include <cstdint>
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
  std::string (*format)(const SearchOptions& options, const MessageValue* result);
  const char* when_empty;
};

std::string FormatFoundCharacters(const SearchOptions&, const MessageValue* result) {
  return FormatCharacters(result);
}

std::string FormatInformation(const SearchOptions& options, const MessageValue* result) {
  return FormatCharacterInfo(options.text, result);
}

constexpr CharacterQuery kCharacterQueries[] = {
    {"search", "search_matched_chars", "Characters whose name contains TEXT, with code points",
     "text", "the text to look for in character names", true,
     "lumeris search 'smiling face' --limit 5", &FormatFoundCharacters, "no characters found"},
    {"related", "search_related_chars", "Characters related to CHAR, with code points",
     "character", "the character", true, "lumeris related 中 --limit 10", &FormatFoundCharacters,
     "no related characters"},
    {"info", "search_character_info", "The sixteen information fields of CHAR, in field order",
     "character", "the character", false, "lumeris info 中", &FormatInformation,
     "no information about this character"},
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
    if (!reply) ExitWith(kExitNoAnswer);
    if (session.json()) {
      session.PrintJson(ReplyJson(*reply));
    } else {
      session.PrintLines(query.format(*options, reply->Find("result")), query.when_empty);
    }
  });
}

}  // namespace

void AddSearchCommands(CLI::App& app, CliSession& session) {
  for (const CharacterQuery& query : kCharacterQueries) AddCharacterQuery(app, session, query);
}

}  // namespace lumeris::cli
