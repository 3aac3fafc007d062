// The real `lumeris` program against the real service, in an isolated user environment: what
// crosses the socket for `raw`, the message (not a hang) when a command never answers, the demo.
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <chrono>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include <nlohmann/json.hpp>

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

class LumerisProgramTest : public ServiceTest {
 protected:
  // Runs the lumeris program with `args` through the shell; one still running after `limit` is
  // killed.
  ProgramResult runLumeris(std::vector<std::string> args, std::chrono::seconds limit = 20s) {
    const auto quoted = [](std::string text) {
      for (std::size_t at = 0; (at = text.find('\'', at)) != std::string::npos; at += 4) text.replace(at, 1, "'\\''");
      return "'" + text + "'";
    };
    const std::filesystem::path out = output_.path() / "out", err = output_.path() / "err";
    std::string command = "timeout -s KILL " + std::to_string(limit.count()) + " " + quoted(LUMERIS_TEST_CLI);
    for (const std::string& arg : args) command += " " + quoted(arg);
    command += " >" + quoted(out) + " 2>" + quoted(err);
    const int status = std::system(command.c_str());
    ProgramResult result;
    if (WIFEXITED(status) && WEXITSTATUS(status) != 137) result.status = WEXITSTATUS(status);
    EXPECT_NE(result.status, -1) << "lumeris did not finish within " << limit.count() << " s";
    for (auto [file, text] : {std::pair{&out, &result.out}, std::pair{&err, &result.err}}) {
      std::ostringstream contents;
      contents << std::ifstream(*file).rdbuf();
      *text = contents.str();
    }
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

TEST_F(LumerisProgramTest, WriteIsSentWithNoReplyAndNeverAnsweredWithout) {
  const char* add = R"({"command":"add","target":"recents","item":"x"})";
  ProgramResult result = runLumeris({"raw", "--no-reply", add});
  EXPECT_EQ(result.status, 0) << result.err;
  EXPECT_EQ(result.out, "sent\n");

  result = runLumeris({"--timeout", "0.3", "raw", add}, 10s);
  EXPECT_EQ(result.status, 1);
  EXPECT_NE(result.err.find("no reply from the file service within 0.3 s"), std::string::npos)
      << result.err;
  EXPECT_NE(result.err.find("--no-reply"), std::string::npos) << result.err;
}

TEST_F(LumerisProgramTest, DemoRunsAgainstTheService) {
  ProgramResult result = runLumeris({"--timeout", "1", "demo"}, 60s);
  EXPECT_EQ(result.status, 0) << result.out << result.err;
  EXPECT_NE(result.out.find("The service answers."), std::string::npos) << result.out;
}

// What the service could not keep is never presented as kept: an unparsable file moved aside is
// logged and warned about, and a preferences location that cannot be written (a file where the
// directory belongs, which stops root too) gives a log line naming the file and a failing
// `lumeris` that says why, while reads show only what is on disk.
TEST_F(LumerisProgramTest, CorruptFilesAndFailedWritesAreReportedNotHidden) {
  const std::filesystem::path dir = environment_.config_home() / "vantorel/Preferences";
  const std::filesystem::path file = dir / "com.vantorel.Lumeris.plist";
  std::filesystem::create_directories(dir);
  std::ofstream(file) << "not a property list";
  service_.Stop();
  ::testing::internal::CaptureStderr();  // the service inherits this standard error
  ASSERT_TRUE(service_.Start(socket_path_));

  ProgramResult moved = runLumeris({"favorites", "set", "a"});
  EXPECT_EQ(moved.status, 0) << moved.err;
  EXPECT_NE(moved.err.find("warning: " + file.string() + " could not be parsed"), std::string::npos) << moved.err;

  std::filesystem::remove_all(dir);
  std::ofstream(dir) << "";
  ProgramResult add = runLumeris({"recents", "add", "x"});
  ProgramResult set = runLumeris({"favorites", "set", "y"});
  ProgramResult read = runLumeris({"--json", "favorites"});
  service_.Stop();
  const std::string log = ::testing::internal::GetCapturedStderr();

  for (const ProgramResult* failed : {&add, &set}) {
    EXPECT_EQ(failed->status, 3);
    EXPECT_NE(failed->err.find("not stored in " + file.string() + ": " + dir.string() + ": Not a directory"),
              std::string::npos)
        << failed->err;
  }
  EXPECT_EQ(nlohmann::json::parse(read.out), nlohmann::json::parse(R"({"array":null})")) << read.err;
  EXPECT_NE(log.find("moved it aside to " + file.string() + ".corrupt-"), std::string::npos) << log;
  EXPECT_NE(log.find("cannot save preferences file " + file.string() + ": cannot create its directory"),
            std::string::npos)
      << log;
}

}  // namespace
}  // namespace lumeris::testing
