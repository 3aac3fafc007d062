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
    out_.str("");
    err_.str("");
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
  std::ostringstream out_;
  std::ostringstream err_;
};

TEST_F(DefaultsCommandTest, WriteStoresValueOfTheGivenForm) {
  struct Case {
    std::vector<std::string> value_args;
    Value expected;
  };
  const Case cases[] = {
      {{"123"}, Value(123)},
      {{"-5"}, Value(-5)},
      {{"1.5"}, Value(1.5)},
      {{"true"}, Value(true)},
      {{"hello world"}, Value("hello world")},
      {{"\"123\""}, Value("123")},
      {{"[1,\"a\",[]]"}, Value(plist::Array{1, "a", plist::Array{}})},
      {{"{\"a\":{\"$data\":\"00ff\"},\"b\":{}}"}, Value(plist::Dictionary{{"a", plist::Data{0, 0xff}}, {"b", plist::Dictionary{}}})},
      {{"{\"$date\":\"2001-01-01T00:01:00Z\"}"}, Value(plist::Date{60})},
      {{"42", "--type", "integer"}, Value(42)},
      {{"2", "--type", "real"}, Value(2.0)},
      {{"yes", "--type", "bool"}, Value(true)},
      {{"0", "--type", "bool"}, Value(false)},
      {{"0aFF", "--type", "data"}, Value(plist::Data{0x0a, 0xff})},
      {{"2001-01-02T00:00:00.5Z", "--type", "date"}, Value(plist::Date{86400.5})},
      {{"123", "--type", "string"}, Value("123")},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.value_args[0]);
    std::vector<std::string> args = {"write", kDomain, "key"};
    args.insert(args.end(), c.value_args.begin(), c.value_args.end());
    ASSERT_EQ(Defaults(args), 0) << err_.str();
    std::optional<Value> stored = Stored("key");
    ASSERT_TRUE(stored.has_value());
    EXPECT_TRUE(*stored == c.expected);
  }
}

TEST_F(DefaultsCommandTest, ReadPrintsJsonThatWritesBackTheSameValue) {
  const Value value = plist::Dictionary{{"s", "x"}, {"i", 7}, {"r", 1.0}, {"b", false},
                                        {"d", plist::Data{1, 2}}, {"t", plist::Date{3600.25}},
                                        {"a", plist::Array{plist::Dictionary{{"n", -1}}}}};
  ASSERT_EQ(Defaults({"write", kDomain, "all", PropertyListToJson(value).dump()}), 0) << err_.str();
  ASSERT_EQ(Defaults({"read", kDomain, "all"}), 0);
  std::optional<Value> printed = PropertyListFromJson(nlohmann::json::parse(out_.str()));
  ASSERT_TRUE(printed.has_value());
  EXPECT_TRUE(*printed == value);

  ASSERT_EQ(Defaults({"read", kDomain}), 0);
  nlohmann::json domain = nlohmann::json::parse(out_.str());
  ASSERT_TRUE(domain.is_object());
  EXPECT_EQ(domain.size(), 1u);
  EXPECT_EQ(domain["all"]["r"].dump(), "1.0") << "a real must stay a real";
}

TEST_F(DefaultsCommandTest, DeleteRemovesOneKeyOrTheWholeDomain) {
  ASSERT_EQ(Defaults({"write", kDomain, "a", "1"}), 0);
  ASSERT_EQ(Defaults({"write", kDomain, "b", "2"}), 0);
  ASSERT_EQ(Defaults({"delete", kDomain, "a"}), 0);
  EXPECT_FALSE(Stored("a").has_value());
  EXPECT_TRUE(Stored("b").has_value());
  ASSERT_EQ(Defaults({"delete", kDomain}), 0);
  EXPECT_FALSE(Stored("b").has_value());
}

TEST_F(DefaultsCommandTest, SeesWhatAnotherWriterStored) {
  PreferenceStore other;
  other.SetValue("fromService", Value("yes"), kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
  ASSERT_EQ(Defaults({"read", kDomain, "fromService"}), 1);  // loads the domain before the other write
  ASSERT_TRUE(other.Synchronize(kDomain, kCFPreferencesCurrentUser, kCFPreferencesAnyHost));
  ASSERT_EQ(Defaults({"read", kDomain, "fromService"}), 0);
  EXPECT_EQ(out_.str(), "\"yes\"\n");
}

// Error paths: nothing is written and the status says why.
TEST_F(DefaultsCommandTest, BadRequestsFailWithStatusAndWriteNothing) {
  struct Case {
    std::vector<std::string> args;
    int status;
  };
  const Case cases[] = {
      {{"write", kDomain, "k", "abc", "--type", "integer"}, 2},
      {{"write", kDomain, "k", "99999999999999999999", "--type", "integer"}, 2},
      {{"write", kDomain, "k", "abc", "--type", "data"}, 2},
      {{"write", kDomain, "k", "maybe", "--type", "bool"}, 2},
      {{"write", kDomain, "k", "yesterday", "--type", "date"}, 2},
      {{"write", kDomain, "k", "null"}, 2},
      {{"write", kDomain, "k", "[1,null]"}, 2},
      {{"write", kDomain, "k", "{\"$data\":\"xyz\"}"}, 2},
      {{"write", "../escape", "k", "1"}, 2},
      {{"read", kDomain, "missing"}, 1},
      {{"delete", kDomain, "missing"}, 1},
      {{"delete", kDomain}, 1},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.args[3 < c.args.size() ? 3 : c.args.size() - 1]);
    EXPECT_EQ(Defaults(c.args), c.status);
    EXPECT_FALSE(err_.str().empty());
    EXPECT_FALSE(Stored("k").has_value());
  }
  EXPECT_NE(Defaults({"write", kDomain, "k", "1", "--type", "float"}), 0) << "unknown --type accepted";
}

TEST(PropertyListJsonTest, DatesPrintAsIsoUtcAndParseBack) {
  struct Case {
    double seconds;
    const char* text;
  };
  for (const Case& c : {Case{0, "2001-01-01T00:00:00Z"}, Case{-978307200, "1970-01-01T00:00:00Z"},
                        Case{86400.5, "2001-01-02T00:00:00.5Z"}, Case{725846400, "2024-01-02T00:00:00Z"}}) {
    SCOPED_TRACE(c.text);
    EXPECT_EQ(FormatIsoDate({c.seconds}), c.text);
    std::optional<plist::Date> parsed = ParseIsoDate(c.text);
    ASSERT_TRUE(parsed.has_value());
    EXPECT_DOUBLE_EQ(parsed->seconds_since_2001, c.seconds);
  }
  for (const char* bad : {"", "2001-01-01", "2001-13-01T00:00:00Z", "2001-01-01T00:00:00", "2001-01-01T00:00:00Zx"}) {
    EXPECT_FALSE(ParseIsoDate(bad).has_value()) << bad;
  }
}

TEST(WatchCommandTest, PrintsEachNotificationWithLocalTime) {
  if (std::getenv("DBUS_SESSION_BUS_ADDRESS") == nullptr) GTEST_SKIP() << "no session bus (source scripts/test-env.sh)";
  std::ostringstream out;
  std::ostringstream err;
  WatchRequest request{.name = "WatchTestNotification", .count = 2, .timeout_seconds = 5};
  const int status = RunWatch(request, out, err, [] {
    PostDistributedNotification("OtherNotification");
    PostDistributedNotification("WatchTestNotification");
    PostDistributedNotification("WatchTestNotification", "obj");
  });
  EXPECT_EQ(status, 0) << err.str();
  const std::regex line(R"(\d{4}-\d\d-\d\d \d\d:\d\d:\d\d\.\d{3}  WatchTestNotification(  obj)?\n)");
  std::istringstream lines(out.str());
  std::vector<std::string> seen;
  for (std::string text; std::getline(lines, text);) seen.push_back(text + "\n");
  ASSERT_EQ(seen.size(), 2u) << out.str();
  EXPECT_TRUE(std::regex_match(seen[0], line)) << seen[0];
  EXPECT_TRUE(std::regex_match(seen[1], line)) << seen[1];
  EXPECT_EQ(seen[1].substr(seen[1].size() - 4), "obj\n");
}

TEST(WatchCommandTest, NoSessionBusFails) {
  testing::IsolatedUserEnvironment env;
  env.env().Set("DBUS_SESSION_BUS_ADDRESS", "unix:path=" + (env.runtime_dir() / "none").string());
  std::ostringstream out;
  std::ostringstream err;
  EXPECT_EQ(RunWatch({.count = 1, .timeout_seconds = 1}, out, err), 1);
  EXPECT_NE(err.str().find("no session bus"), std::string::npos);
}

}  // namespace
}  // namespace lumeris::cli
