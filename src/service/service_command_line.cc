#include "service/service_command_line.h"

#include "lumeris/config.h"

namespace lumeris {

void BuildServiceCommandLine(CLI::App& app) {
  app.description(
      "The Lumeris file service: answers the emoji and symbol panel's requests (character search, the "
      "category catalogue, recents, favourites, skin tones, saved state) over a local socket. It is "
      "started on demand by the lumeris command and the client library, or by systemd socket activation, "
      "and serves until SIGTERM or SIGINT.");
  app.set_version_flag("--version", config::kVersion, "print the version and exit");
  app.set_help_flag("--help,-h", "print this help and exit");
  app.footer(
      "Environment:\n"
      "  XDG_RUNTIME_DIR       the socket's directory (an absolute path; a relative one is ignored)\n"
      "  LUMERIS_SYSTEM_ROOT   the root under which /System/Library/... resources are found\n"
      "  LANGUAGE, LC_ALL, LC_MESSAGES, LANG   the localization of category titles\n"
      "  XDG_CONFIG_HOME       the user's preferences ($XDG_CONFIG_HOME/vantorel/Preferences)\n"
      "Files:\n"
      "  $XDG_RUNTIME_DIR/com.vantorel.Lumeris.FileService   the socket\n"
      "  /tmp/lumeris-UID/com.vantorel.Lumeris.FileService   the socket without XDG_RUNTIME_DIR\n"
      "  $XDG_STATE_HOME/lumeris/fileservice.log             the log of a service started on demand\n"
      "                                                      when no systemd journal runs\n"
      "Exit status:\n"
      "  0  stopped by SIGTERM or SIGINT, or --help and --version\n"
      "  1  it cannot listen (the reason is logged, and told to the lumeris command that started it)\n"
      "  2  an unknown argument\n"
      "See also: lumeris(1), systemctl --user status com.vantorel.Lumeris.FileService.socket");
}

std::optional<int> ParseServiceCommandLine(int argc, const char* const* argv, std::ostream& out, std::ostream& err) {
  CLI::App app("", "lumeris-fileservice");
  BuildServiceCommandLine(app);
  try {
    app.parse(argc, argv);
  } catch (const CLI::CallForHelp&) {
    out << app.help();
    return 0;
  } catch (const CLI::CallForVersion&) {
    out << config::kVersion << '\n';
    return 0;
  } catch (const CLI::ParseError& error) {
    err << "lumeris-fileservice: " << error.what() << "\nRun lumeris-fileservice --help for the options.\n";
    return 2;
  }
  return std::nullopt;
}

}  // namespace lumeris
