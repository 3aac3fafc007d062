// `lumeris defaults` and `lumeris watch` driven through CLI11, as the lumeris program runs them.
#include <gtest/gtest.h>

#include <cstdlib>
#include <regex>
#include <sstream>
#include <string>
#include <vector>

#include "client/defaults_command.h"
#include "client/property_list_json.h"
#include "client/watch_command.h"
#include "platform/distributed_notifications.h"
#include "platform/preference_store.h"
#include "platform/property_list_io.h"
#include "support/scoped_env.h"

namespace lumeris::cli {
namespace {

using plist::Value;
constexpr char kDomain[] = "test.defaults";

class DefaultsCommandTest : public ::testing::Test {
 protected:
  // Runs `lumeris defaults <args...>`; returns the exit status.
  int Defaults(std::vector<std::string> args) {
    out_.str(""), err_.str("");
    CLI::App app("lumeris");
    AddDefaultsCommand(app, out_, err_);
    args.insert(args.begin(), "defaults");
    std::reverse(args.begin(), args.end());  // CLI11 takes the arguments last-first
    try {
      app.parse(args);
    } catch (const CLI::ParseError& error) {
      return error.get_exit_code();
    }
    return 0;
  }
  // What the domain's file holds, read by a store of its own.
  std::optional<Value> Stored(const std::string& key) {
    PreferenceStore store;
    return store.CopyValue(key, kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
  }

  testing::IsolatedUserEnvironment env_;
  std::ostringstream out_, err_;
};

TEST_F(DefaultsCommandTest, WriteStoresValueOfTheGivenForm) {
  const std::pair<std::vector<std::string>, Value> cases[] = {
      {{"123"}, Value(123)}, {{"-5"}, Value(-5)}, {{"1.5"}, Value(1.5)}, {{"true"}, Value(true)},
      {{"hello world"}, Value("hello world")}, {{"\"123\""}, Value("123")},
      {{"9223372036854775807"}, Value(INT64_MAX)}, {{"-9223372036854775808"}, Value(INT64_MIN)},
      {{"[1,\"a\",[]]"}, Value(plist::Array{1, "a", plist::Array{}})},
      {{"{\"a\":{\"$data\":\"00ff\"},\"b\":{}}"}, Value(plist::Dictionary{{"a", plist::Data{0, 0xff}}, {"b", plist::Dictionary{}}})},
      {{"{\"$date\":\"2001-01-01T00:01:00Z\"}"}, Value(plist::Date{60})},
      {{"9223372036854775807", "--type", "integer"}, Value(INT64_MAX)}, {{"2", "--type", "real"}, Value(2.0)},
      {{"yes", "--type", "bool"}, Value(true)}, {{"0", "--type", "bool"}, Value(false)},
      {{"0aFF", "--type", "data"}, Value(plist::Data{0x0a, 0xff})},
      {{"2001-01-02T00:00:00.5Z", "--type", "date"}, Value(plist::Date{86400.5})},
      {{"123", "--type", "string"}, Value("123")},
  };
  for (const auto& [value_args, expected] : cases) {
    std::vector<std::string> args = {"write", kDomain, "key"};
    args.insert(args.end(), value_args.begin(), value_args.end());
    ASSERT_EQ(Defaults(args), 0) << value_args[0] << ": " << err_.str();
    EXPECT_EQ(Stored("key"), expected) << value_args[0];
  }
}

TEST_F(DefaultsCommandTest, ReadPrintsJsonThatWritesBackTheSameValue) {
  const Value value = plist::Dictionary{{"s", "x"}, {"i", 7}, {"r", 1.0}, {"b", false},
                                        {"d", plist::Data{1, 2}}, {"t", plist::Date{3600.25}},
                                        {"a", plist::Array{plist::Dictionary{{"n", -1}}}}};
  ASSERT_EQ(Defaults({"write", kDomain, "all", PropertyListToJson(value).dump()}), 0) << err_.str();
  ASSERT_EQ(Defaults({"read", kDomain, "all"}), 0);
  EXPECT_EQ(PropertyListFromJson(nlohmann::json::parse(out_.str())), value);

  ASSERT_EQ(Defaults({"read", kDomain}), 0);
  nlohmann::json domain = nlohmann::json::parse(out_.str());
  ASSERT_TRUE(domain.is_object());
  EXPECT_EQ(domain.size(), 1u);
  EXPECT_EQ(domain["all"]["r"].dump(), "1.0") << "a real must stay a real";
}

// Every command sees the file as it is now: what another writer stored, what a delete removed.
TEST_F(DefaultsCommandTest, DeleteRemovesOneKeyOrTheWholeDomainAndReadsSeeOtherWriters) {
  PreferenceStore other;
  ASSERT_EQ(Defaults({"write", kDomain, "a", "1"}), 0);
  ASSERT_EQ(Defaults({"read", kDomain, "b"}), 1);  // loads the domain before the other write
  other.SetValue("b", Value("yes"), kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
  ASSERT_TRUE(other.Synchronize(kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost));
  ASSERT_EQ(Defaults({"read", kDomain, "b"}), 0);
  EXPECT_EQ(out_.str(), "\"yes\"\n");
  ASSERT_EQ(Defaults({"delete", kDomain, "a"}), 0);
  EXPECT_FALSE(Stored("a").has_value());
  EXPECT_TRUE(Stored("b").has_value());
  ASSERT_EQ(Defaults({"delete", kDomain}), 0);
  EXPECT_FALSE(Stored("b").has_value());
}

// Error paths: nothing is written and the status says why.
TEST_F(DefaultsCommandTest, BadRequestsFailWithStatusAndWriteNothing) {
  const std::pair<std::vector<std::string>, int> cases[] = {
      {{"write", kDomain, "k", "abc", "--type", "integer"}, 2}, {{"write", kDomain, "k", "9223372036854775808"}, 2},
      {{"write", kDomain, "k", "9223372036854775808", "--type", "integer"}, 2},
      {{"write", kDomain, "k", "abc", "--type", "data"}, 2}, {{"write", kDomain, "k", "maybe", "--type", "bool"}, 2},
      {{"write", kDomain, "k", "yesterday", "--type", "date"}, 2}, {{"write", kDomain, "k", "null"}, 2},
      {{"write", kDomain, "k", "[1,null]"}, 2}, {{"write", kDomain, "k", "{\"$data\":\"xyz\"}"}, 2},
      {{"write", "../escape", "k", "1"}, 2}, {{"read", kDomain, "missing"}, 1}, {{"delete", kDomain, "missing"}, 1},
      {{"delete", kDomain}, 1},
  };
  for (const auto& [args, status] : cases) {
    EXPECT_EQ(Defaults(args), status) << args.back();
    EXPECT_FALSE(err_.str().empty()) << args.back();
    EXPECT_FALSE(Stored("k").has_value()) << args.back();
  }
  EXPECT_NE(Defaults({"write", kDomain, "k", "1", "--type", "float"}), 0) << "unknown --type accepted";
}

TEST(PropertyListJsonTest, DatesPrintAsIsoUtcAndParseBack) {
  const std::pair<double, const char*> cases[] = {{0, "2001-01-01T00:00:00Z"}, {-978307200, "1970-01-01T00:00:00Z"},
                                                  {86400.5, "2001-01-02T00:00:00.5Z"}, {725846400, "2024-01-02T00:00:00Z"}};
  for (const auto& [seconds, text] : cases) {
    EXPECT_EQ(FormatIsoDate({seconds}), text);
    EXPECT_EQ(ParseIsoDate(text).value_or(plist::Date{-1}).seconds_since_2001, seconds) << text;
  }
  for (const char* bad : {"", "2001-01-01", "2001-13-01T00:00:00Z", "2001-01-01T00:00:00", "2001-01-01T00:00:00Zx"}) {
    EXPECT_FALSE(ParseIsoDate(bad).has_value()) << bad;
  }
}

TEST(WatchCommandTest, PrintsEachNotificationOfItsNameWithLocalTimeAndFailsWithoutABus) {
  if (std::getenv("DBUS_SESSION_BUS_ADDRESS") == nullptr) GTEST_SKIP() << "no session bus (source scripts/test-env.sh)";
  std::ostringstream out, err;
  const int status = RunWatch({.name = "Watched", .count = 2, .timeout_seconds = 5}, out, err, [] {
    PostDistributedNotification("Other");
    PostDistributedNotification("Watched");
    PostDistributedNotification("Watched", "obj");
  });
  EXPECT_EQ(status, 0) << err.str();
  const std::string time = R"(\d{4}-\d\d-\d\d \d\d:\d\d:\d\d\.\d{3}  )";
  EXPECT_TRUE(std::regex_match(out.str(), std::regex(time + "Watched\n" + time + "Watched  obj\n"))) << out.str();

  testing::IsolatedUserEnvironment env;
  env.env().Set("DBUS_SESSION_BUS_ADDRESS", "unix:path=" + (env.runtime_dir() / "none").string());
  EXPECT_EQ(RunWatch({.count = 1, .timeout_seconds = 1}, out, err), 1);
  EXPECT_NE(err.str().find("no session bus"), std::string::npos);
}

}  // namespace
}  // namespace lumeris::cli
