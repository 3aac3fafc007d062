// lumeris-reference OUTPUT_DIR: writes the manual pages lumeris.1 and lumeris-fileservice.8 and
// the completions lumeris.bash, _lumeris and lumeris.fish from the two programs' command-line
// definitions. The build runs it; nothing installs it.
#include <fstream>
#include <iostream>
#include <sstream>

#include "client/cli_app.h"
#include "client/cli_reference.h"
#include "lumeris/config.h"
#include "service/service_command_line.h"

namespace {

// The definitions are only walked, never run: no command reaches a service.
class NoChannel : public lumeris::cli::ServiceChannel {
 public:
  std::optional<lumeris::MessageValue> Request(const lumeris::MessageValue&, std::chrono::milliseconds,
                                               std::string*) override {
    return std::nullopt;
  }
  bool Send(const lumeris::MessageValue&, std::chrono::milliseconds, std::string*) override { return false; }
  bool RemoveStoreKey(const std::string&, std::string*) override { return false; }
};

bool Write(const std::string& dir, const std::string& name, const std::string& text) {
  std::ofstream out(dir + "/" + name, std::ios::binary | std::ios::trunc);
  out << text;
  out.close();
  if (out) return true;
  std::cerr << "lumeris-reference: cannot write " << dir << "/" << name << "\n";
  return false;
}

}  // namespace

int main(int argc, char** argv) {
  if (argc != 2) {
    std::cerr << "usage: lumeris-reference OUTPUT_DIR\n";
    return 2;
  }
  const std::string dir = argv[1];
  NoChannel channel;
  std::ostringstream out, err;
  lumeris::cli::CliSession session(channel, out, err);
  CLI::App client("", "lumeris");
  lumeris::cli::BuildCliApp(client, session);
  CLI::App service("", "lumeris-fileservice");
  lumeris::BuildServiceCommandLine(service);
  const bool written =
      Write(dir, "lumeris.1", lumeris::cli::ManualPage(client, {1, "User Commands", lumeris::config::kVersion})) &&
      Write(dir, "lumeris-fileservice.8",
            lumeris::cli::ManualPage(service, {8, "System Administration", lumeris::config::kVersion})) &&
      Write(dir, "lumeris.bash", lumeris::cli::BashCompletion(client)) &&
      Write(dir, "_lumeris", lumeris::cli::ZshCompletion(client)) &&
      Write(dir, "lumeris.fish", lumeris::cli::FishCompletion(client));
  return written ? 0 : 1;
}
