#include "client/commands/category_command.h"

#include <unicode/uchar.h>
#include <unicode/unistr.h>

#include <filesystem>
#include <fstream>
#include <memory>
#include <system_error>

#include "categories/category_catalogue.h"
#include "categories/data_notation.h"
#include "categories/localization_lookup.h"
#include "categories/system_bundles.h"
#include "client/cli_output.h"
#include "platform/system_root.h"

namespace lumeris::cli {
namespace {

// Characters per line of rendered data.
constexpr std::size_t kCharactersPerLine = 32;

struct CategoryOptions {
  std::vector<std::string> names;
  std::string icons;  // --icons DIR; empty for none
};

std::string Utf8(std::u32string_view text) {
  std::string out;
  icu::UnicodeString::fromUTF32(reinterpret_cast<const UChar32*>(text.data()),
                                static_cast<int32_t>(text.size()))
      .toUTF8String(out);
  return out;
}

// One character as a person can see it: a combining mark on a dotted circle; a character that
// shows nothing (controls, format characters, spaces, unassigned code points) as "U+XXXX".
std::string Visible(const std::u32string& character) {
  const UChar32 first = static_cast<UChar32>(character.front());
  switch (u_charType(first)) {
    case U_NON_SPACING_MARK:
    case U_ENCLOSING_MARK:
    case U_COMBINING_SPACING_MARK:
      return "\u25CC" + Utf8(character);
    case U_CONTROL_CHAR:
    case U_FORMAT_CHAR:
    case U_SPACE_SEPARATOR:
    case U_LINE_SEPARATOR:
    case U_PARAGRAPH_SEPARATOR:
    case U_UNASSIGNED:
      if (character.size() == 1) {
        char code[12];
        std::snprintf(code, sizeof code, "U+%04X", static_cast<unsigned>(first));
        return code;
      }
      return Utf8(character);
    default:
      return Utf8(character);
  }
}

// The characters of `data`, space-separated, kCharactersPerLine to a line, each line indented.
std::string RenderData(const std::string& data, std::string_view indent, std::optional<std::size_t> max) {
  const std::optional<std::vector<std::u32string>> characters = CategoryCharacters(data);
  if (!characters) return std::string(indent) + data + "\t(not in the Data notation)\n";
  std::string text;
  const std::size_t shown = max ? std::min(*max, characters->size()) : characters->size();
  for (std::size_t i = 0; i < shown; ++i) {
    text += i % kCharactersPerLine == 0 ? (i == 0 ? "" : "\n") + std::string(indent) : std::string(" ");
    text += Visible((*characters)[i]);
  }
  if (shown < characters->size()) text += shown == 0 ? std::string(indent) + "..." : " ...";
  return text.empty() ? text : text + "\n";
}

std::string IconDescription(const MessageValue& entry) {
  const MessageValue::Bytes* icon = entry.GetData("TitleImage");
  if (icon == nullptr || icon->empty()) return "no icon";
  return "icon " + std::to_string(icon->size()) + " bytes " + std::string(IconType(*icon));
}

std::string CharacterCount(std::size_t count) {
  return std::to_string(count) + (count == 1 ? " character" : " characters");
}

std::string FormatEntry(const std::string& name, const MessageValue& entry, std::optional<std::size_t> max) {
  const std::string* title = entry.GetString("TitleText");
  std::string text = name + "\t" + (title ? *title : std::string("(no title)")) + "\t" + IconDescription(entry);
  const MessageValue* data = entry.Find("Data");
  if (const MessageValue::Array* subcategories = data ? data->AsArray() : nullptr) {
    text += "\t" + std::to_string(subcategories->size()) +
            (subcategories->size() == 1 ? " sub-category\t" : " sub-categories\t") +
            CharacterCount(CountCategoryCharacters(entry)) + "\n";
    for (const MessageValue& sub : *subcategories) {
      const std::string* sub_title = sub.GetString("TitleText");
      const std::string* sub_data = sub.GetString("Data");
      const auto characters = sub_data ? CategoryCharacters(*sub_data) : std::nullopt;
      text += "  " + (sub_title ? *sub_title : std::string("(no title)")) + "\t" + IconDescription(sub) + "\t" +
              CharacterCount(characters ? characters->size() : 0) + "\n";
      if (sub_data) text += RenderData(*sub_data, "    ", max);
    }
    return text;
  }
  const bool checked = entry.Find("CheckGlyph") && entry.Find("CheckGlyph")->AsBool() &&
                       *entry.Find("CheckGlyph")->AsBool();
  text += std::string("\t") + (checked ? "glyphs checked" : "glyphs not checked") + "\t" +
          CharacterCount(CountCategoryCharacters(entry)) + "\n";
  if (const std::string* characters = data ? data->AsString() : nullptr) text += RenderData(*characters, "  ", max);
  return text;
}

// A file name made of `name`'s ASCII letters, digits, "-" and "_"; each run of other bytes
// becomes one "_".
std::string SafeFileName(std::string_view name) {
  std::string safe;
  for (char c : name) {
    const bool plain = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '-' ||
                       c == '_';
    if (plain) {
      safe += c;
    } else if (safe.empty() || safe.back() != '_') {
      safe += '_';
    }
  }
  return safe.empty() ? "_" : safe;
}

// Writes the icon of `entry` as `stem` plus its type's extension; false when writing failed.
// An entry without icon bytes writes nothing.
bool WriteIcon(const std::filesystem::path& dir, const std::string& stem, const MessageValue& entry, int& written) {
  const MessageValue::Bytes* icon = entry.GetData("TitleImage");
  if (icon == nullptr || icon->empty()) return true;
  const std::string_view type = IconType(*icon);
  const std::string extension = type == "PDF" ? ".pdf" : type == "TIFF" ? ".tiff" : ".bin";
  std::ofstream out(dir / (stem + extension), std::ios::binary | std::ios::trunc);
  out.write(reinterpret_cast<const char*>(icon->data()), static_cast<std::streamsize>(icon->size()));
  out.close();
  if (!out) return false;
  ++written;
  return true;
}

// Writes every icon of the result; the number written, or std::nullopt after complaining.
std::optional<int> WriteIcons(CliSession& session, const std::string& dir, const std::vector<std::string>& names,
                              const MessageValue* result) {
  std::error_code error;
  std::filesystem::create_directories(dir, error);
  if (error) {
    session.Complain("categories: cannot create " + dir + ": " + error.message());
    return std::nullopt;
  }
  int written = 0;
  const MessageValue::Array* entries = result ? result->AsArray() : nullptr;
  for (std::size_t i = 0; entries && i < entries->size() && i < names.size(); ++i) {
    const MessageValue& entry = (*entries)[i];
    const std::string stem = SafeFileName(names[i]);
    bool ok = WriteIcon(dir, stem, entry, written);
    const MessageValue* data = entry.Find("Data");
    if (const MessageValue::Array* subcategories = data ? data->AsArray() : nullptr) {
      for (std::size_t k = 0; k < subcategories->size(); ++k) {
        const std::string* title = (*subcategories)[k].GetString("TitleText");
        ok = ok && WriteIcon(dir, stem + "-" + std::to_string(k + 1) + "-" + SafeFileName(title ? *title : ""),
                             (*subcategories)[k], written);
      }
    }
    if (!ok) {
      session.Complain("categories: cannot write the icons of " + names[i] + " to " + dir);
      return std::nullopt;
    }
  }
  return written;
}

std::optional<MessageValue> AskForCategories(CliSession& session, const std::vector<std::string>& names) {
  MessageValue request = CommandRequest("read_categorydata");
  MessageValue array = MessageValue::MakeArray();
  for (const std::string& name : names) array.Append(MessageValue::String(name));
  request.Set("categories", std::move(array));
  return session.Ask("categories", request);
}

// Without names: the offered categories, group by group, with titles and counts.
void ListAvailableCategories(CliSession& session, const CategoryOptions& options) {
  const std::optional<Bundle> application = OpenApplicationBundle();
  if (!application) {
    session.Complain("categories: no input-method bundle at " + SystemPath(kApplicationBundlePath).string());
    ExitWith(kExitFailure);
  }
  const std::vector<CategoryGroup> groups =
      ReadAvailableCategories(*application, PreferredLocalizationOfBundle(&*application));
  std::vector<std::string> names;
  for (const CategoryGroup& group : groups) names.insert(names.end(), group.categories.begin(), group.categories.end());
  if (names.empty()) {
    session.PrintLines("", "(none)");
    return;
  }
  std::optional<MessageValue> reply = AskForCategories(session, names);
  if (!reply) ExitWith(kExitFailure);
  const MessageValue* result = reply->Find("result");
  const MessageValue::Array* entries = result ? result->AsArray() : nullptr;
  const MessageValue none;

  nlohmann::json json_groups = nlohmann::json::array();
  std::string text;
  std::size_t index = 0;
  for (const CategoryGroup& group : groups) {
    nlohmann::json json_categories = nlohmann::json::array();
    text += (group.group.empty() ? std::string("(no group)") : group.group) + "\n";
    for (const std::string& name : group.categories) {
      const MessageValue& entry = entries && index < entries->size() ? (*entries)[index] : none;
      ++index;
      const std::string* title = entry.GetString("TitleText");
      const std::size_t count = CountCategoryCharacters(entry);
      text += "  " + name + "\t" + (title ? *title : std::string("(no title)")) + "\t" + CharacterCount(count) + "\n";
      json_categories.push_back({{"name", name}, {"title", title ? *title : std::string()}, {"characters", count}});
    }
    json_groups.push_back({{"group", group.group}, {"categories", std::move(json_categories)}});
  }
  std::optional<int> icons;
  if (!options.icons.empty() && !(icons = WriteIcons(session, options.icons, names, result))) {
    ExitWith(kExitFailure);
  }
  if (session.json()) {
    session.PrintJson({{"groups", std::move(json_groups)}});
    return;
  }
  session.out() << text;
  if (icons) session.out() << *icons << " icon files written to " << options.icons << "\n";
}

void ShowCategories(CliSession& session, const CategoryOptions& options) {
  std::optional<MessageValue> reply = AskForCategories(session, options.names);
  if (!reply) ExitWith(kExitFailure);
  std::optional<int> icons;
  if (!options.icons.empty() && !(icons = WriteIcons(session, options.icons, options.names, reply->Find("result")))) {
    ExitWith(kExitFailure);
  }
  if (session.json()) {
    session.PrintJson(ReplyJson(*reply));
    return;
  }
  session.PrintLines(FormatCategoryEntries(options.names, reply->Find("result")), "(none)");
  if (icons) session.out() << *icons << " icon files written to " << options.icons << "\n";
}

}  // namespace

std::optional<std::vector<std::u32string>> CategoryCharacters(std::string_view data) {
  if (data.substr(0, kEmojiDataPrefix.size()) == kEmojiDataPrefix) data.remove_prefix(kEmojiDataPrefix.size());
  return ParseDataString(data);
}

std::size_t CountCategoryCharacters(const MessageValue& entry) {
  const MessageValue* data = entry.Find("Data");
  if (data == nullptr) return 0;
  auto count = [](const MessageValue* value) -> std::size_t {
    const std::string* text = value ? value->AsString() : nullptr;
    const auto characters = text ? CategoryCharacters(*text) : std::nullopt;
    return characters ? characters->size() : 0;
  };
  if (const MessageValue::Array* subcategories = data->AsArray()) {
    std::size_t total = 0;
    for (const MessageValue& sub : *subcategories) total += count(sub.Find("Data"));
    return total;
  }
  return count(data);
}

std::string_view IconType(const MessageValue::Bytes& icon) {
  const std::string_view head(reinterpret_cast<const char*>(icon.data()), std::min<std::size_t>(icon.size(), 4));
  if (head == "%PDF") return "PDF";
  if (head == std::string_view("II*\0", 4) || head == std::string_view("MM\0*", 4)) return "TIFF";
  return "unknown";
}

std::string FormatCategoryEntries(const std::vector<std::string>& names, const MessageValue* result,
                                  std::optional<std::size_t> max_characters) {
  std::string text;
  if (result == nullptr || !result->is_array()) return text;
  const MessageValue::Array& entries = *result->AsArray();
  for (std::size_t i = 0; i < entries.size(); ++i) {
    text += FormatEntry(i < names.size() ? names[i] : "?", entries[i], max_characters);
  }
  return text;
}

void AddCategoryCommand(CLI::App& app, CliSession& session) {
  auto options = std::make_shared<CategoryOptions>();
  CLI::App* sub = app.add_subcommand(
      "categories", "Titles, icons and characters of the categories NAME... (none: list them all)");
  sub->add_option("names", options->names, "category names, e.g. Emoji Arrows");
  sub->add_option("--icons", options->icons, "write each icon file into DIR")->type_name("DIR");
  sub->footer(
      "Examples:\n"
      "  lumeris categories\n"
      "  lumeris categories Emoji Arrows --icons /tmp/icons");
  sub->callback([&session, options] {
    if (options->names.empty()) {
      ListAvailableCategories(session, *options);
    } else {
      ShowCategories(session, *options);
    }
  });
}

}  // namespace lumeris::cli
