// The real `lumeris` program against the real service, in an isolated user environment: what
// crosses the socket for `raw`, the message (not a hang) when a command never answers, the help
// text and the demo.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <fstream>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include <nlohmann/json.hpp>

#include "support/service_fixture.h"
#include "support/temp_dir.h"

extern char** environ;

namespace lumeris::testing {
namespace {

using namespace std::chrono_literals;

struct ProgramResult {
  int status = -1;  // exit status; -1 when it had to be killed
  std::string out;
  std::string err;
};

std::string ReadFile(const std::filesystem::path& path) {
  std::ifstream file(path);
  std::ostringstream text;
  text << file.rdbuf();
  return text.str();
}

class LumerisProgramTest : public ServiceTest {
 protected:
  // Runs the lumeris program with `args`; one that is still running after `limit` is killed.
  ProgramResult runLumeris(std::vector<std::string> args,
                           std::chrono::milliseconds limit = 20s) {
    args.insert(args.begin(), LUMERIS_TEST_CLI);
    std::vector<char*> argv;
    for (std::string& arg : args) argv.push_back(arg.data());
    argv.push_back(nullptr);
    const std::filesystem::path out = output_.path() / "out";
    const std::filesystem::path err = output_.path() / "err";
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, 1, out.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    posix_spawn_file_actions_addopen(&actions, 2, err.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    pid_t pid = -1;
    const int spawned = posix_spawn(&pid, argv[0], &actions, nullptr, argv.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    ProgramResult result;
    if (spawned != 0) {
      ADD_FAILURE() << "cannot start " << argv[0];
      return result;
    }
    const auto deadline = std::chrono::steady_clock::now() + limit;
    int wait_status = 0;
    while (waitpid(pid, &wait_status, WNOHANG) == 0) {
      if (std::chrono::steady_clock::now() > deadline) {
        kill(pid, SIGKILL);
        waitpid(pid, &wait_status, 0);
        ADD_FAILURE() << "lumeris did not finish within " << limit.count() << " ms";
        break;
      }
      std::this_thread::sleep_for(5ms);
    }
    if (WIFEXITED(wait_status)) result.status = WEXITSTATUS(wait_status);
    result.out = ReadFile(out);
    result.err = ReadFile(err);
    return result;
  }

  ScopedTempDir output_;
};

TEST_F(LumerisProgramTest, RawCarriesTypedValuesThroughTheService) {
  // An unknown search sub-command echoes "transactionID": the largest uint64 must survive the
  // escape, the wire and the printing.
  ProgramResult result = runLumeris(
      {"--json", "raw", R"({"command":"search_nothing","transactionID":{"$uint64":"18446744073709551615"}})"});
  ASSERT_EQ(result.status, 0) << result.err;
  EXPECT_EQ(nlohmann::json::parse(result.out),
            nlohmann::json::parse(R"({"transactionID":18446744073709551615})"));

  // A negative number is an int64, which does not read as the uint64 "transactionID": 0.
  result = runLumeris({"--json", "raw", R"({"command":"search_nothing","transactionID":-1})"});
  ASSERT_EQ(result.status, 0) << result.err;
  EXPECT_EQ(nlohmann::json::parse(result.out), nlohmann::json::parse(R"({"transactionID":0})"));
}

TEST_F(LumerisProgramTest, RawNoReplyIsConfirmed) {
  ProgramResult result =
      runLumeris({"raw", "--no-reply", R"({"command":"add","target":"recents","item":"x"})"});
  EXPECT_EQ(result.status, 0) << result.err;
  EXPECT_EQ(result.out, "sent\n");
}

TEST_F(LumerisProgramTest, CommandThatNeverAnswersEndsWithAMessage) {
  ProgramResult result =
      runLumeris({"--timeout", "0.3", "raw", R"({"command":"add","target":"recents","item":"x"})"},
                 10s);
  EXPECT_EQ(result.status, 1);
  EXPECT_NE(result.err.find("no reply from the file service within 0.3 s"), std::string::npos)
      << result.err;
  EXPECT_NE(result.err.find("--no-reply"), std::string::npos) << result.err;
}

TEST_F(LumerisProgramTest, HelpListsEverySubcommand) {
  ProgramResult result = runLumeris({"--help"});
  ASSERT_EQ(result.status, 0) << result.err;
  for (const char* name : {"search", "related", "info", "categories", "recents", "favorites",
                           "skintone", "state", "read-all", "open-large-viewer", "raw", "demo",
                           "defaults", "watch"}) {
    EXPECT_NE(result.out.find(std::string("\n  ") + name + " "), std::string::npos) << name;
  }
}

TEST_F(LumerisProgramTest, DemoRunsAgainstTheService) {
  ProgramResult result = runLumeris({"--timeout", "1", "demo"}, 60s);
  EXPECT_EQ(result.status, 0) << result.out << result.err;
  EXPECT_NE(result.out.find("The service answers."), std::string::npos) << result.out;
}

}  // namespace
}  // namespace lumeris::testing
