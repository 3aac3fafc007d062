// `lumeris categories [NAME...] [--icons DIR]`: the category catalogue ("read_categorydata").
//
// - Without names: the categories the input-method bundle offers (its "Categories" property list
//   for the user's localization, read from the bundle under the system root), group by group,
//   each with the title and the number of characters the service answers for it.
// - With names: for each entry, in request order, its title, the size and type of its icon,
//   whether the panel is told to check glyphs, and its characters rendered from the "Data"
//   notation (the emoji category: one block per sub-category).
// - --icons DIR writes every icon the reply holds to DIR as a file a viewer opens (".pdf" or
//   ".tiff", told by the bytes): "<name>.pdf", and "<name>-<n>-<title>.pdf" for the emoji
//   sub-categories; each run of characters other than ASCII letters, digits, "-" and "_" becomes
//   one "_".
// - --json: with names, the reply; without, {"groups": [{"group", "categories": [{"name",
//   "title", "characters"}]}]}.
//
// Thread-safety: the registered callback runs on the thread that parses the command line; the
// formatting functions are pure. Results are owned by the caller.
#pragma once

#include <CLI/CLI.hpp>

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "client/cli_session.h"
#include "service/message_value.h"

namespace lumeris::cli {

// Adds "categories" to `app`; it talks through `session`, which must outlive `app`.
void AddCategoryCommand(CLI::App& app, CliSession& session);

// The characters a Data string denotes (an emoji sub-category's "<emoji>" prefix dropped);
// std::nullopt when it is not in the notation.
std::optional<std::vector<std::u32string>> CategoryCharacters(std::string_view data);

// How many characters a category entry holds (the emoji category: all its sub-categories);
// data that is not in the notation counts nothing.
std::size_t CountCategoryCharacters(const MessageValue& entry);

// "PDF", "TIFF" or "unknown", told by the first bytes of an icon file.
std::string_view IconType(const MessageValue::Bytes& icon);

// The entries of a "read_categorydata" result paired with the names asked for, as text: a line
// "<name>\t<title>\t<icon>\t<glyphs>\t<n> characters", then the characters separated by spaces,
// 32 to a line and indented; at most `max_characters` of them per category or sub-category when
// given, then "...". Data not in the notation shows as it is, marked "(not in the Data notation)".
std::string FormatCategoryEntries(const std::vector<std::string>& names, const MessageValue* result,
                                  std::optional<std::size_t> max_characters = std::nullopt);

}  // namespace lumeris::cli
