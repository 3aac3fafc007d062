#include "client/commands/status_command.h"

#include <stdlib.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <map>
#include <sstream>
#include <string>

#include "categories/localization_lookup.h"
#include "categories/system_bundles.h"
#include "client/service_client.h"
#include "platform/system_root.h"
#include "service/socket_path.h"

namespace lumeris::cli {
namespace {

// The variables that decide the bundle root and the localization.
constexpr const char* kServiceChoiceVariables[] = {"LUMERIS_SYSTEM_ROOT", "LANGUAGE", "LC_ALL", "LC_MESSAGES",
                                                   "LANG"};

// The environment of process `pid` (readable for a process of the same user).
std::map<std::string, std::string> ProcessEnvironment(int pid) {
  std::map<std::string, std::string> environment;
  std::ifstream in("/proc/" + std::to_string(pid) + "/environ", std::ios::binary);
  for (std::string entry; std::getline(in, entry, '\0');) {
    const std::size_t equals = entry.find('=');
    if (equals != std::string::npos) environment[entry.substr(0, equals)] = entry.substr(equals + 1);
  }
  return environment;
}

// Sets the choice variables as `environment` has them for its lifetime, then restores this
// process's own.
class ScopedChoiceVariables {
 public:
  explicit ScopedChoiceVariables(const std::map<std::string, std::string>& environment) {
    for (const char* name : kServiceChoiceVariables) {
      if (const char* value = getenv(name)) saved_[name] = value;
      auto found = environment.find(name);
      if (found != environment.end()) {
        setenv(name, found->second.c_str(), 1);
      } else {
        unsetenv(name);
      }
    }
  }
  ~ScopedChoiceVariables() {
    for (const char* name : kServiceChoiceVariables) {
      auto found = saved_.find(name);
      if (found != saved_.end()) {
        setenv(name, found->second.c_str(), 1);
      } else {
        unsetenv(name);
      }
    }
  }
  ScopedChoiceVariables(const ScopedChoiceVariables&) = delete;
  ScopedChoiceVariables& operator=(const ScopedChoiceVariables&) = delete;

 private:
  std::map<std::string, std::string> saved_;
};

// Connected sockets the service accepted on `socket` (the kernel lists them with its path).
int AcceptedConnections(const std::filesystem::path& socket) {
  std::ifstream in("/proc/net/unix");
  int count = 0;
  std::string line;
  std::getline(in, line);  // the heading
  while (std::getline(in, line)) {
    std::istringstream fields(line);
    std::string num, refs, protocol, flags, type, state, inode, path;
    fields >> num >> refs >> protocol >> flags >> type >> state >> inode;
    std::getline(fields >> std::ws, path);
    if (path == socket.string() && state == "03") ++count;
  }
  return count;
}

// Where standard error of process `pid` goes, as a person reads it.
std::string LogDescription(int pid) {
  std::error_code error;
  const std::filesystem::path target =
      std::filesystem::read_symlink("/proc/" + std::to_string(pid) + "/fd/2", error);
  if (error) return "unknown (" + error.message() + ")";
  const std::string text = target.string();
  if (text.starts_with("socket:")) return "the systemd journal (journalctl --user -t lumeris-fileservice)";
  if (text == "/dev/null") return "none (standard error goes to /dev/null)";
  return text;
}

}  // namespace

void AddStatusCommand(CLI::App& app, CliSession& session) {
  CLI::App* sub = app.add_subcommand("status", "Whether the file service runs, where, and with what");
  sub->footer("Examples:\n  lumeris status\n  lumeris --json status");
  sub->callback([&session] {
    std::string why;
    const std::optional<std::filesystem::path> socket = ServiceSocketPath(&why);
    ServiceClientOptions options;
    options.start_on_demand = false;
    std::string connect_error;
    std::unique_ptr<ServiceClient> client = socket ? ServiceClient::Connect(options, &connect_error) : nullptr;
    const int pid = client ? client->PeerProcessId() : -1;

    nlohmann::json status;
    status["running"] = client != nullptr;
    status["socket"] = socket ? socket->string() : "none: " + why;
    std::map<std::string, std::string> environment;
    if (pid > 0) {
      status["pid"] = pid;
      std::error_code error;
      status["program"] = std::filesystem::read_symlink("/proc/" + std::to_string(pid) + "/exe", error).string();
      status["log"] = LogDescription(pid);
      environment = ProcessEnvironment(pid);
      status["connections"] = std::max(0, AcceptedConnections(*socket) - 1);
    } else {
      for (const char* name : kServiceChoiceVariables) {
        if (const char* value = getenv(name)) environment[name] = value;
      }
      const std::optional<std::filesystem::path> file = ServiceLogFile();
      status["log"] = std::filesystem::exists("/run/systemd/journal/stdout")
                          ? std::string("the systemd journal (journalctl --user -t lumeris-fileservice)")
                          : file ? file->string() : std::string("none");
    }
    {
      const ScopedChoiceVariables choices(environment);
      const std::optional<Bundle> bundle = OpenApplicationBundle();
      status["bundle_root"] = SystemRoot().string();
      status["bundle"] = bundle ? "present" : "missing";
      status["localization"] = PreferredLocalizationOfBundle(bundle ? &*bundle : nullptr);
    }

    if (session.json()) {
      session.PrintJson(status);
    } else {
      std::ostream& out = session.out();
      if (client) {
        out << "service       running (pid " << pid << ", " << status["program"].get<std::string>() << ")\n";
      } else {
        out << "service       not running (" << connect_error << "); a lumeris command starts it\n";
      }
      out << "socket        " << status["socket"].get<std::string>() << '\n'
          << "log           " << status["log"].get<std::string>() << '\n'
          << "bundle root   " << status["bundle_root"].get<std::string>() << " (input-method bundle "
          << status["bundle"].get<std::string>() << ")\n"
          << "localization  " << status["localization"].get<std::string>() << '\n';
      if (client) out << "connections   " << status["connections"].get<int>() << " besides this one\n";
    }
    if (!client) ExitWith(kExitFailure);
  });
}

}  // namespace lumeris::cli
