#include "client/cli_reference.h"

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <sstream>
#include <vector>

namespace lumeris::cli {
namespace {

std::vector<const CLI::App*> Subcommands(const CLI::App& app) {
  std::vector<const CLI::App*> subs;
  for (const CLI::App* sub : app.get_subcommands([](const CLI::App*) { return true; })) subs.push_back(sub);
  return subs;
}

std::vector<const CLI::Option*> Options(const CLI::App& app, bool positional) {
  return app.get_options([positional](const CLI::Option* option) { return option->get_positional() == positional; });
}

// The names of a named option: "--json", or "-h", "--help".
std::vector<std::string> OptionNames(const CLI::Option& option) {
  std::vector<std::string> names;
  for (const std::string& name : option.get_snames()) names.push_back("-" + name);
  for (const std::string& name : option.get_lnames()) names.push_back("--" + name);
  return names;
}

bool TakesValue(const CLI::Option& option) { return option.get_expected_max() > 0; }

std::string Upper(std::string text) {
  for (char& c : text) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
  return text;
}

// "lumeris recents set": the words from the program to `app`.
std::string CommandPath(const CLI::App& app) {
  return app.get_parent() ? CommandPath(*app.get_parent()) + " " + app.get_name() : app.get_name();
}

// --- roff ------------------------------------------------------------------------------------

// Text safe in a roff line: backslashes and hyphens escaped, characters outside ASCII as
// \[uXXXX] (so the page needs no input encoding), a leading "." or "'" neutralised.
std::string Roff(const std::string& text) {
  std::string out;
  for (std::size_t i = 0; i < text.size(); ++i) {
    const auto byte = static_cast<unsigned char>(text[i]);
    if (byte >= 0x80) {
      const int length = byte >= 0xF0 ? 4 : byte >= 0xE0 ? 3 : 2;
      char32_t code = byte & (0x7F >> length);
      for (int k = 1; k < length && i + 1 < text.size(); ++k) code = (code << 6) | (text[++i] & 0x3F);
      char escape[16];
      std::snprintf(escape, sizeof escape, "\\[u%04X]", static_cast<unsigned>(code));
      out += escape;
    } else if (text[i] == '\\') {
      out += "\\e";
    } else if (text[i] == '-') {
      out += "\\-";
    } else {
      out += text[i];
    }
  }
  if (!out.empty() && (out[0] == '.' || out[0] == '\'')) out.insert(0, "\\&");
  return out;
}

std::string Usage(const CLI::App& app) {
  std::string usage = "\\fB" + Roff(CommandPath(app)) + "\\fR";
  if (!Options(app, false).empty()) usage += " [\\fIOPTIONS\\fR]";
  for (const CLI::Option* positional : Options(app, true)) {
    std::string name = "\\fI" + Upper(positional->get_name()) + "\\fR";
    if (positional->get_items_expected_max() > 1) name += "...";
    usage += " " + (positional->get_required() ? name : "[" + name + "]");
  }
  if (!Subcommands(app).empty()) usage += app.get_require_subcommand_min() > 0 ? " \\fISUBCOMMAND\\fR" : " [\\fISUBCOMMAND\\fR]";
  return usage;
}

void WriteOptions(std::ostringstream& page, const CLI::App& app) {
  for (const CLI::Option* option : Options(app, false)) {
    // Every subcommand has --help; the program's own entry says so once.
    if (app.get_parent() != nullptr && option == app.get_help_ptr()) continue;
    std::string names;
    for (const std::string& name : OptionNames(*option)) names += (names.empty() ? "" : ", ") + ("\\fB" + Roff(name) + "\\fR");
    if (TakesValue(*option)) names += " \\fI" + Roff(option->get_type_name()) + "\\fR";
    std::string description = option->get_description();
    if (!option->get_default_str().empty()) description += " (default: " + option->get_default_str() + ")";
    page << ".TP\n" << names << "\n" << Roff(description) << "\n";
  }
  for (const CLI::Option* positional : Options(app, true)) {
    page << ".TP\n\\fI" << Upper(positional->get_name()) << "\\fR\n" << Roff(positional->get_description()) << "\n";
  }
}

// Indented lines in a no-fill block; runs of other lines as filled paragraphs.
void WriteText(std::ostringstream& page, const std::vector<std::string>& lines) {
  bool literal = false;
  bool in_paragraph = false;
  for (const std::string& line : lines) {
    const bool indented = line.starts_with(" ");
    if (indented && !literal) page << ".PP\n.nf\n";
    if (!indented && literal) page << ".fi\n";
    if (!indented && !in_paragraph) page << ".PP\n";
    literal = indented;
    in_paragraph = !indented;
    page << Roff(line) << "\n";
  }
  if (literal) page << ".fi\n";
}

// "Exit status:" or "See also: x": a capitalised heading of words before a colon.
bool IsHeading(const std::string& line, std::size_t colon) {
  if (colon == std::string::npos || colon == 0 || !std::isupper(static_cast<unsigned char>(line[0]))) return false;
  return std::all_of(line.begin(), line.begin() + static_cast<long>(colon),
                     [](char c) { return std::isalpha(static_cast<unsigned char>(c)) || c == ' '; });
}

std::vector<std::string> Lines(const std::string& text) {
  std::vector<std::string> lines;
  std::istringstream in(text);
  for (std::string line; std::getline(in, line);) {
    if (!line.empty()) lines.push_back(line);
  }
  return lines;
}

void WriteSubcommand(std::ostringstream& page, const CLI::App& app) {
  page << ".SS \"" << Usage(app) << "\"\n" << Roff(app.get_description()) << "\n";
  WriteOptions(page, app);
  WriteText(page, Lines(app.get_footer()));
  for (const CLI::App* sub : Subcommands(app)) WriteSubcommand(page, *sub);
}

// --- completion data -------------------------------------------------------------------------

struct Level {
  std::string path;  // subcommand words after the program, space-separated ("" for the top)
  const CLI::App* app;
};

void CollectLevels(const CLI::App& app, const std::string& path, std::vector<Level>& levels) {
  levels.push_back({path, &app});
  for (const CLI::App* sub : Subcommands(app)) {
    CollectLevels(*sub, path.empty() ? sub->get_name() : path + " " + sub->get_name(), levels);
  }
}

std::string Join(const std::vector<std::string>& words) {
  std::string text;
  for (const std::string& word : words) text += (text.empty() ? "" : " ") + word;
  return text;
}

// The option names valid at a level: its own and, through fallthrough, its parents'.
std::vector<std::string> LevelOptions(const CLI::App& app) {
  std::vector<std::string> names;
  for (const CLI::App* level = &app; level != nullptr; level = level->get_parent()) {
    for (const CLI::Option* option : Options(*level, false)) {
      for (const std::string& name : OptionNames(*option)) {
        if (name.starts_with("--") && std::find(names.begin(), names.end(), name) == names.end()) names.push_back(name);
      }
    }
    if (!level->get_fallthrough()) break;
  }
  return names;
}

std::vector<std::string> SubcommandNames(const CLI::App& app) {
  std::vector<std::string> names;
  for (const CLI::App* sub : Subcommands(app)) names.push_back(sub->get_name());
  return names;
}

// Shell functions shared by bash and zsh: <program>_subcommands PATH and <program>_words PATH
// print the subcommands, and the subcommands and options, valid after PATH.
std::string CaseFunctions(const CLI::App& app, const std::string& prefix) {
  std::vector<Level> levels;
  CollectLevels(app, "", levels);
  std::ostringstream script;
  for (const bool with_options : {false, true}) {
    script << prefix << (with_options ? "_words" : "_subcommands") << "() {\n  case \"$1\" in\n";
    for (const Level& level : levels) {
      std::vector<std::string> words = SubcommandNames(*level.app);
      if (with_options) {
        const std::vector<std::string> options = LevelOptions(*level.app);
        words.insert(words.end(), options.begin(), options.end());
      }
      if (!words.empty()) script << "    \"" << level.path << "\") echo '" << Join(words) << "' ;;\n";
    }
    script << "  esac\n}\n";
  }
  // Options whose value is the next word: no completion of subcommands there.
  std::vector<std::string> valued;
  for (const Level& level : levels) {
    for (const CLI::Option* option : Options(*level.app, false)) {
      if (!TakesValue(*option)) continue;
      for (const std::string& name : OptionNames(*option)) {
        if (std::find(valued.begin(), valued.end(), name) == valued.end()) valued.push_back(name);
      }
    }
  }
  std::string pattern;
  for (const std::string& name : valued) pattern += (pattern.empty() ? "" : "|") + name;
  script << prefix << "_takes_value() {\n  case \"$1\" in\n    " << pattern << ") return 0 ;;\n  esac\n  return 1\n}\n";
  return script.str();
}

std::string Identifier(const std::string& name) {
  std::string id = "_";
  for (char c : name) id += std::isalnum(static_cast<unsigned char>(c)) ? c : '_';
  return id;
}

std::string FishQuote(const std::string& text) {
  std::string quoted = "'";
  for (char c : text) {
    if (c == '\'' || c == '\\') quoted += '\\';
    quoted += c;
  }
  return quoted + "'";
}

}  // namespace

std::string ManualPage(const CLI::App& app, const ManualInfo& info) {
  std::ostringstream page;
  const std::string name = app.get_name();
  page << ".\\\" Generated from the command-line definition of " << name << "; edit that, not this file.\n";
  page << ".TH " << Upper(Roff(name)) << " " << info.section << " \"\" \"" << Roff(name + " " + info.version)
       << "\" \"" << info.title << "\"\n";
  std::string summary = app.get_description();
  summary = summary.substr(0, std::min(summary.find(". "), summary.find(": ")));
  if (summary.ends_with(".")) summary.pop_back();
  page << ".SH NAME\n" << Roff(name) << " \\- " << Roff(summary) << "\n";
  page << ".SH SYNOPSIS\n" << Usage(app) << "\n";
  page << ".SH DESCRIPTION\n" << Roff(app.get_description()) << "\n";
  page << ".SH OPTIONS\n";
  WriteOptions(page, app);
  if (!Subcommands(app).empty()) {
    page << ".SH SUBCOMMANDS\n";
    for (const CLI::App* sub : Subcommands(app)) WriteSubcommand(page, *sub);
  }
  // The footer: "Heading:" lines open sections.
  std::vector<std::string> section;
  const auto flush = [&page, &section] {
    WriteText(page, section);
    section.clear();
  };
  for (const std::string& line : Lines(app.get_footer())) {
    const std::size_t colon = line.find(':');
    if (!IsHeading(line, colon)) {
      section.push_back(line);
      continue;
    }
    flush();
    page << ".SH " << Upper(Roff(line.substr(0, colon))) << "\n";
    std::string rest = line.substr(colon + 1);
    if (!rest.empty()) section.push_back(rest.substr(rest.find_first_not_of(' ')));
  }
  flush();
  return page.str();
}

std::string BashCompletion(const CLI::App& app) {
  const std::string name = app.get_name();
  const std::string f = Identifier(name);
  std::ostringstream script;
  script << "# bash completion for " << name << ", generated from its command-line definition.\n"
         << CaseFunctions(app, f) << f << "() {\n"
         << "  local cur=${COMP_WORDS[COMP_CWORD]} path= candidate i\n"
         << "  for ((i = 1; i < COMP_CWORD; i++)); do\n"
         << "    for candidate in $(" << f << "_subcommands \"$path\"); do\n"
         << "      if [[ ${COMP_WORDS[i]} == \"$candidate\" ]]; then path=${path:+$path }$candidate; break; fi\n"
         << "    done\n"
         << "  done\n"
         << "  if ((COMP_CWORD > 1)) && " << f << "_takes_value \"${COMP_WORDS[COMP_CWORD - 1]}\"; then\n"
         << "    mapfile -t COMPREPLY < <(compgen -f -- \"$cur\")\n"
         << "    return\n"
         << "  fi\n"
         << "  mapfile -t COMPREPLY < <(compgen -W \"$(" << f << "_words \"$path\")\" -- \"$cur\")\n"
         << "}\n"
         << "complete -F " << f << " " << name << "\n";
  return script.str();
}

std::string ZshCompletion(const CLI::App& app) {
  const std::string name = app.get_name();
  const std::string f = Identifier(name);
  std::ostringstream script;
  script << "#compdef " << name << "\n# zsh completion for " << name
         << ", generated from its command-line definition.\n"
         << CaseFunctions(app, f) << f << "() {\n"
         << "  local path= candidate i\n"
         << "  for ((i = 2; i < CURRENT; i++)); do\n"
         << "    for candidate in ${=$(" << f << "_subcommands \"$path\")}; do\n"
         << "      if [[ ${words[i]} == \"$candidate\" ]]; then path=${path:+$path }$candidate; break; fi\n"
         << "    done\n"
         << "  done\n"
         << "  if ((CURRENT > 2)) && " << f << "_takes_value \"${words[CURRENT - 1]}\"; then\n"
         << "    _files\n"
         << "    return\n"
         << "  fi\n"
         << "  compadd -- ${=$(" << f << "_words \"$path\")}\n"
         << "}\n"
         << f << " \"$@\"\n";
  return script.str();
}

std::string FishCompletion(const CLI::App& app) {
  const std::string name = app.get_name();
  std::ostringstream script;
  script << "# fish completion for " << name << ", generated from its command-line definition.\n"
         << "complete -c " << name << " -f\n";
  std::vector<Level> levels;
  CollectLevels(app, "", levels);
  for (const Level& level : levels) {
    // A subcommand is offered after its parent's word and before any of its siblings.
    const std::string last = level.path.substr(level.path.rfind(' ') == std::string::npos ? 0 : level.path.rfind(' ') + 1);
    const std::vector<std::string> children = SubcommandNames(*level.app);
    const std::string here = level.path.empty() ? "__fish_use_subcommand"
                                                : "__fish_seen_subcommand_from " + last + "; and not __fish_seen_subcommand_from " +
                                                      Join(children);
    for (const CLI::App* sub : Subcommands(*level.app)) {
      script << "complete -c " << name << " -n " << FishQuote(here) << " -a "
             << sub->get_name() << " -d " << FishQuote(sub->get_description()) << "\n";
    }
    for (const CLI::Option* option : Options(*level.app, false)) {
      script << "complete -c " << name;
      if (!level.path.empty()) script << " -n " << FishQuote("__fish_seen_subcommand_from " + last);
      for (const std::string& long_name : option->get_lnames()) script << " -l " << long_name;
      for (const std::string& short_name : option->get_snames()) script << " -s " << short_name;
      if (TakesValue(*option)) script << " -r";
      script << " -d " << FishQuote(option->get_description()) << "\n";
    }
  }
  return script.str();
}

}  // namespace lumeris::cli
