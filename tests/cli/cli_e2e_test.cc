// The real programs in an isolated user environment: what the service could not keep or send,
// `status`, the service's command line and start-up failure, the completion and manual pages.
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <chrono>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include <nlohmann/json.hpp>

#include "platform/property_list_io.h"
#include "support/service_fixture.h"
#include "support/temp_dir.h"

namespace lumeris::testing {
namespace {

using namespace std::chrono_literals;

struct ProgramResult {
  int status = -1;  // exit status; -1 when it had to be killed
  std::string out;
  std::string err;
};

std::string Quoted(std::string text) {
  for (std::size_t at = 0; (at = text.find('\'', at)) != std::string::npos; at += 4) text.replace(at, 1, "'\\''");
  return "'" + text + "'";
}

// Runs `command` (shell text; its words already quoted) with output captured in `dir`; one still
// running after `limit` is killed.
ProgramResult RunShell(const std::string& command, const std::filesystem::path& dir, std::chrono::seconds limit = 20s) {
  const std::filesystem::path out = dir / "out", err = dir / "err";
  const std::string line = "timeout -s KILL " + std::to_string(limit.count()) + " " + command + " >" + Quoted(out) +
                           " 2>" + Quoted(err);
  const int status = std::system(line.c_str());
  ProgramResult result;
  if (WIFEXITED(status) && WEXITSTATUS(status) != 137) result.status = WEXITSTATUS(status);
  EXPECT_NE(result.status, -1) << command << " did not finish within " << limit.count() << " s";
  for (auto [file, text] : {std::pair{&out, &result.out}, std::pair{&err, &result.err}}) {
    std::ostringstream contents;
    contents << std::ifstream(*file).rdbuf();
    *text = contents.str();
  }
  return result;
}

class LumerisProgramTest : public ServiceTest {
 protected:
  ProgramResult runLumeris(const std::vector<std::string>& args, const std::string& environment = "") {
    std::string command = environment + " " + Quoted(LUMERIS_TEST_CLI);
    for (const std::string& arg : args) command += " " + Quoted(arg);
    return RunShell(command, output_.path());
  }

  ScopedTempDir output_;
};

TEST_F(LumerisProgramTest, StatusDescribesTheRunningService) {
  const ProgramResult result = runLumeris({"--json", "status"});
  ASSERT_EQ(result.status, 0) << result.err;
  const nlohmann::json status = nlohmann::json::parse(result.out);
  EXPECT_EQ(status["running"], true);
  EXPECT_EQ(status["socket"], socket_path_.string());
  EXPECT_GT(status["pid"].get<int>(), 0);
  EXPECT_EQ(status["connections"], 0);
}

// What the service could not keep or send is never presented as done: an unparsable file moved
// aside is warned about; a preferences location that cannot be written (a file where the
// directory belongs, which stops root too) fails the writes with the reason; a reply over the
// 16 MiB frame limit is refused by the service, and `lumeris` says so.
TEST_F(LumerisProgramTest, WhatTheServiceCouldNotKeepOrSendIsReportedNotHidden) {
  const std::filesystem::path dir = environment_.config_home() / "vantorel/Preferences";
  const std::filesystem::path file = dir / "com.vantorel.Lumeris.plist";
  std::filesystem::create_directories(dir);
  std::ofstream(file) << "not a property list";
  ProgramResult moved = runLumeris({"favorites", "set", "a"});
  EXPECT_EQ(moved.status, 0) << moved.err;
  EXPECT_NE(moved.err.find("warning: " + file.string() + " could not be parsed"), std::string::npos) << moved.err;

  const std::string huge = R"(com.vantorel.lmk:{"char":")" + std::string(17 << 20, 'y') + R"("})";
  const std::vector<std::uint8_t> bytes = plist::SerializeBinaryPropertyList(
      plist::Dictionary{{"version", 1}, {"Favorites:com.vantorel.Lumeris.DefaultDataStorage", plist::Array{huge}}});
  std::ofstream(file, std::ios::binary | std::ios::trunc).write(reinterpret_cast<const char*>(bytes.data()), bytes.size());
  ProgramResult too_big = runLumeris({"--timeout", "20", "favorites"});
  EXPECT_EQ(too_big.status, 1);
  EXPECT_NE(too_big.err.find("for a reply over the 16 MiB one message may hold"), std::string::npos) << too_big.err;

  std::filesystem::remove_all(dir);
  std::ofstream(dir) << "";
  for (const std::vector<std::string>& args : {std::vector<std::string>{"recents", "add", "x"}, {"favorites", "set", "y"}}) {
    const ProgramResult failed = runLumeris(args);
    EXPECT_EQ(failed.status, 1);
    EXPECT_NE(failed.err.find("not stored in " + file.string() + ": " + dir.string() + ": Not a directory"),
              std::string::npos)
        << failed.err;
  }
}

// The service's command line, and a service that cannot start: its own reason, at once.
TEST_F(LumerisProgramTest, ServiceProgramHelpVersionAndStartFailure) {
  const std::string service = Quoted(LUMERIS_TEST_FILESERVICE);
  EXPECT_EQ(RunShell(service + " --version", output_.path()).out, "0.1.0\n");
  const ProgramResult help = RunShell(service + " --help", output_.path());
  EXPECT_EQ(help.status, 0);
  EXPECT_NE(help.out.find("Usage: lumeris-fileservice [OPTIONS]"), std::string::npos) << help.out;

  const std::filesystem::path missing = output_.path() / "missing";
  const auto started = std::chrono::steady_clock::now();
  const ProgramResult failed = runLumeris({"recents"}, "env XDG_RUNTIME_DIR=" + Quoted(missing));
  EXPECT_LT(std::chrono::steady_clock::now() - started, 4s) << "waited for the start timeout";
  EXPECT_EQ(failed.status, 1);
  EXPECT_EQ(failed.err, "lumeris: recents: cannot reach the file service: lumeris-fileservice: cannot listen: cannot listen on " +
                            (missing / "com.vantorel.Lumeris.FileService").string() + ": No such file or directory\n");

  // A relative XDG_RUNTIME_DIR is not a socket directory.
  const ProgramResult relative = runLumeris({"--json", "status"}, "env XDG_RUNTIME_DIR=relative");
  EXPECT_EQ(nlohmann::json::parse(relative.out)["socket"].get<std::string>().rfind("/tmp/lumeris-", 0), 0u) << relative.out;
}

TEST(LumerisReferenceTest, CompletionLoadsInBashAndManualPagesRender) {
  ScopedTempDir dir;
  const std::string bash = "bash -c " + Quoted(std::string("set -eu; source ") + LUMERIS_TEST_REFERENCE_DIR +
                                               "/lumeris.bash; complete -p lumeris; "
                                               "COMP_WORDS=(lumeris rec); COMP_CWORD=1; _lumeris; echo \"${COMPREPLY[@]}\"; "
                                               "COMP_WORDS=(lumeris --json favorites r); COMP_CWORD=3; _lumeris; "
                                               "echo \"${COMPREPLY[@]}\"");
  const ProgramResult completion = RunShell(bash, dir.path());
  EXPECT_EQ(completion.status, 0);
  EXPECT_EQ(completion.err, "");
  EXPECT_EQ(completion.out, "complete -F _lumeris lumeris\nrecents\nread remove\n");
  for (const char* page : {"lumeris.1", "lumeris-fileservice.8"}) {
    const ProgramResult manual = RunShell(
        "env MANWIDTH=80 man -l " + Quoted(std::string(LUMERIS_TEST_REFERENCE_DIR) + "/" + page), dir.path());
    EXPECT_EQ(manual.status, 0) << manual.err;
    EXPECT_NE(manual.out.find("EXIT STATUS"), std::string::npos) << page;
  }
}

}  // namespace
}  // namespace lumeris::testing
