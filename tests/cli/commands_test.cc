// Command lines to requests, replies to output, and every error to its exit status and message,
// without a service: the commands run against a channel that records what they send and
// answers from a script.
#include <gtest/gtest.h>

#include <initializer_list>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include "client/cli_app.h"
#include "client/cli_json_value.h"
#include "client/commands/demo_command.h"

namespace lumeris::cli {
namespace {

using Args = std::vector<std::string>;

// What a command handed to the channel.
struct Sent {
  MessageValue request;
  bool wants_reply;
  std::chrono::milliseconds timeout;
};

// A message written as JSON (tags included), so the tables read like the wire.
MessageValue Json(const std::string& text) {
  std::string error;
  std::optional<MessageValue> value = MessageValueFromJsonText(text, &error);
  EXPECT_TRUE(value) << text << ": " << error;
  return value.value_or(MessageValue());
}

class ScriptedChannel : public ServiceChannel {
 public:
  // Replies by command (JSON); commands not listed get none. "*" answers every other command.
  std::map<std::string, std::string> replies = {{"*", "{}"}};
  bool deliver = true;
  std::vector<Sent> sent;
  std::vector<std::string> removed_keys;

  std::optional<MessageValue> Request(const MessageValue& request, std::chrono::milliseconds timeout,
                                      std::string* error) override {
    sent.push_back({request, true, timeout});
    auto found = replies.find(*request.GetString("command"));
    if (found == replies.end()) found = replies.find("*");
    if (found != replies.end()) return Json(found->second);
    *error = "no reply from the file service within " + DescribeTimeout(timeout);
    return std::nullopt;
  }
  bool Send(const MessageValue& request, std::chrono::milliseconds timeout, std::string* error) override {
    sent.push_back({request, false, timeout});
    if (!deliver) *error = "cannot reach the file service: test";
    return deliver;
  }
  bool RemoveStoreKey(const std::string& key, std::string*) override {
    removed_keys.push_back(key);
    return true;
  }
};

class CliCommandTest : public ::testing::Test {
 protected:
  int run(Args args) {
    args.insert(args.begin(), "lumeris");
    std::vector<const char*> argv;
    for (const std::string& arg : args) argv.push_back(arg.c_str());
    out_.str("");
    err_.str("");
    channel_.sent.clear();
    return RunCli(static_cast<int>(argv.size()), argv.data(), channel_, out_, err_);
  }
  std::string output() const { return out_.str(); }
  std::string errors() const { return err_.str(); }

  ScriptedChannel channel_;
  std::ostringstream out_;
  std::ostringstream err_;
};

#define LMK R"(com.vantorel.lmk:{\")"
#define STORE R"("identifier":"com.vantorel.Lumeris.DefaultDataStorage")"

// The last request a command line sends (favourites add and remove read the list first).
TEST_F(CliCommandTest, EverySubcommandBuildsItsRequestDictionary) {
  channel_.replies["read"] = R"({"array":[")" LMK R"(char\":\"A\"}"]})";
  const std::string here = std::filesystem::current_path().string();
  for (const auto& [args, request_json, wants_reply] : std::initializer_list<std::tuple<Args, std::string, bool>>{
           {{"search", "cat face", "--limit", "3"},
            R"({"command":"search_matched_chars","string":"cat face","limit":3,"transactionID":1})", true},
           {{"info", "中", "--transaction-id", "9"}, R"({"command":"search_character_info","string":"中","transactionID":9})",
            true},
           {{"favorites", "read", "--identifier", "X"}, R"({"command":"read","target":"favorites","identifier":"X"})", true},
           {{"recents", "set", "A", R"(com.vantorel.lmk:{"char":"B"})"},
            R"({"command":"set","target":"recents",)" STORE R"(,"array":[")" LMK R"(char\":\"A\"}",")" LMK R"(char\":\"B\"}"]})",
            false},
           // No items: no "array", which removes the list.
           {{"favorites", "set", "--identifier", "X"}, R"({"command":"set","target":"favorites","identifier":"X"})", false},
           {{"favorites", "add", "😀", "--emoji-font"},
            R"({"command":"set","target":"favorites",)" STORE R"(,"array":[")" LMK R"(char\":\"A\"}",")" LMK
            R"(char\":\"😀\",\"font\":\"VantorelColorEmoji\"}"]})", false},
           {{"favorites", "remove", "A"}, R"({"command":"set","target":"favorites",)" STORE "}", false},
           // --identifier belongs to "recents" but may follow "add".
           {{"recents", "add", "A", "--font", "F", "--glyph", "7", "--identifier", "Y"},
            R"({"command":"add","target":"recents","identifier":"Y","item":")" LMK R"(char\":\"A\",\"font\":\"F\",\"glyph\":7}"})",
            false},
           // An emoji's skin tone is recorded in the emoji font without being asked.
           {{"skintone", "👍🏽"},
            R"({"command":"set_skintone",)" STORE R"(,"item":")" LMK R"(char\":\"👍🏽\",\"font\":\"VantorelColorEmoji\"}"})", false},
           {{"state", "save", "--application", "app", R"({"a": 1})"},
            R"({"command":"save_state","application":"app","data":{"$base64":"eyJhIjogMX0="}})", false},
           {{"state", "--application", "app"},
            R"({"command":"read_recents_favorites",)" STORE R"(,"application":"app"})", true},
           {{"read-all", "--identifier", "X", "--application", "Y"},
            R"({"command":"read_recents_favorites","identifier":"X","application":"Y"})", true},
           {{"open-large-viewer", "p"}, R"({"command":"open_large_viewer","path":")" + here + R"(/p"})", true},
           {{"open-large-viewer"}, R"({"command":"open_large_viewer"})", true},
           {{"raw", R"({"command":"x","limit":{"$uint64":"5"},"n":{"$int64":"-2"},"h":{"$hex":"00ff"}})"},
            R"({"command":"x","limit":5,"n":-2,"h":{"$base64":"AP8="}})", true},
           {{"raw", "--no-reply", R"({"command":"add","data":{"$base64":"AP8="},"v":null})"},
            R"({"command":"add","data":{"$base64":"AP8="},"v":null})", false}}) {
    SCOPED_TRACE(::testing::PrintToString(args));
    ASSERT_EQ(run(args), 0) << errors();
    ASSERT_FALSE(channel_.sent.empty());
    EXPECT_EQ(channel_.sent.back().request, Json(request_json));
    EXPECT_EQ(channel_.sent.back().wants_reply, wants_reply);
  }
  ASSERT_EQ(run({"recents", "--timeout", "0.25"}), 0);
  EXPECT_EQ(channel_.sent.back().timeout, std::chrono::milliseconds(250));
}

TEST_F(CliCommandTest, PrintsRepliesForPeopleOrAsJson) {
  for (const auto& [args, reply_json, printed] : std::initializer_list<std::tuple<Args, const char*, const char*>>{
           {{"search", "smil"}, R"({"result":["😀","☺"],"transactionID":1})", "😀\tU+1F600\n☺\tU+263A\n"},
           {{"recents"}, R"({"array":null})", "(none)\n"},
           {{"recents"}, R"({"array":[")" LMK R"(char\":\"👍🏽\",\"font\":\"VantorelColorEmoji\"}"]})",
            "👍🏽\tU+1F44D U+1F3FD\tVantorelColorEmoji\n"},
           {{"recents", "add", "A"}, "{}", "recents: added A\n"},
           {{"favorites", "set"}, "{}", "favorites: cleared\n"},
           {{"--json", "recents", "add", "A"}, "{}",
            R"({"sent":{"command":"add","target":"recents",)" STORE R"(,"item":")" LMK R"(char\":\"A\"}"}})"},
           {{"--json", "raw", "--no-reply", R"({"command":"add"})"}, "{}", R"({"sent":{"command":"add"}})"},
           {{"state"}, R"({"state":{"$base64":"eyJhIjoxfQ=="}})", "{\"a\":1}\n"},
           {{"state", "read"}, R"({"state":{"$base64":"e30="}})", "(none)\n"},
           {{"state", "clear", "--application", "app"}, "{}", "state: cleared for app\n"},
           {{"open-large-viewer"}, "{}", "open-large-viewer: cleared\n"},
           // The raw reply keeps kinds JSON cannot tell apart, in the tagged notation.
           {{"--json", "raw", R"({"command":"read"})"}, R"({"d":{"$base64":"/w=="},"n":{"$int64":"-4"}})",
            R"({"d":{"$base64":"/w=="},"n":-4})"}}) {
    SCOPED_TRACE(::testing::PrintToString(args));
    channel_.replies["*"] = reply_json;
    ASSERT_EQ(run(args), 0) << errors();
    if (args[0] == "--json") {
      EXPECT_EQ(nlohmann::json::parse(output()), nlohmann::json::parse(printed)) << output();
    } else {
      EXPECT_EQ(output(), printed);
    }
  }
  EXPECT_EQ(channel_.removed_keys, std::vector<std::string>{"State:app"});
}

// --- Errors ---------------------------------------------------------------------------------

struct ErrorCase {
  Args args;
  int status;
  std::string first_line;
  bool answered = true;  // false: the service never replies
  bool delivered = true;
};

TEST_F(CliCommandTest, ErrorsExitWithTheirStatusAndSayWhy) {
  channel_.replies["read"] = R"({"array":[")" LMK R"(char\":\"A\"}"]})";
  const std::string usage_hint = "lumeris: run 'lumeris --help' for the subcommands, 'lumeris SUBCOMMAND --help' for one";
  for (const ErrorCase& c : std::initializer_list<ErrorCase>{
           {{}, 2, "lumeris: a subcommand is required"},
           {{"recent"}, 2, "lumeris: unknown subcommand \"recent\"; did you mean \"recents\"?"},
           {{"favorites", "ad", "x"}, 2, "lumeris: favorites: unknown subcommand \"ad\"; did you mean \"add\"?"},
           {{"--bogus", "recents"}, 2, "lumeris: unknown option \"--bogus\""},
           {{"--timeout", "abc", "recents"}, 2,
            "lumeris: --timeout: expects a positive number of seconds (at most 86400), not \"abc\""},
           {{"recents", "--timeout", "0"}, 2,
            "lumeris: --timeout: expects a positive number of seconds (at most 86400), not \"0\""},
           {{"search"}, 2, "lumeris: text is required"},
           {{"recents", "add", "A", "--font", "F"}, 2, "lumeris: --font requires --glyph"},
           {{"info", "a\xFF"}, 2, "lumeris: argument 2 is not valid UTF-8"},
           {{"recents", "add", ""}, 2, "lumeris: recents add: an item is a character or an entity ID, not empty text"},
           {{"favorites", "set", "com.vantorel.lmk:{oops"}, 2,
            "lumeris: favorites set: \"com.vantorel.lmk:{oops\" is not a valid entity ID: after \"com.vantorel.lmk:\" "
            "comes a JSON object such as {\"char\":\"A\"}"},
           {{"skintone", "A"}, 2, "lumeris: skintone: A is not an emoji that takes a skin tone"},
           {{"state", "save", "not json"}, 2, "lumeris: state save: not valid JSON: not json"},
           {{"state", "save", R"({"a":{"b":null}})"}, 2,
            "lumeris: state save: the state must be a JSON object with no null in it"},
           {{"state", "save", "{}"}, 2,
            "lumeris: state save: an empty object changes nothing (state clear removes the state)"},
           {{"raw", "[1, 2]"}, 2, "lumeris: raw: the request must be a JSON object"},
           {{"raw", R"({"limit":{"$uint64":"-5"}})"}, 2,
            "lumeris: raw: /limit/$uint64 expects decimal text of an unsigned 64-bit integer"},
           {{"raw", R"({"d":{"$data":"AP8"}})"}, 2,
            "lumeris: raw: /d/$data expects hexadecimal digits or padded base64 text"},
           {{"open-large-viewer", ""}, 2, "lumeris: open-large-viewer: the path is empty (leave it out to clear it)"},
           {{"--timeout", "0.5", "info", "中"}, 1, "lumeris: info: no reply from the file service within 0.5 s", false},
           {{"raw", R"({"command":"add"})"}, 1, "lumeris: raw: no reply from the file service within 5 s", false},
           {{"favorites", "set", "A"}, 1, "lumeris: favorites set: cannot reach the file service: test", true, false},
           {{"favorites", "remove", "Z"}, 1, "lumeris: favorites remove: Z is not in the list"},
           {{"demo"}, 1, "lumeris: demo: no reply from the file service within 5 s", false}}) {
    SCOPED_TRACE(::testing::PrintToString(c.args));
    channel_.replies["*"] = "{}";
    if (!c.answered) channel_.replies.clear();
    channel_.deliver = c.delivered;
    EXPECT_EQ(run(c.args), c.status);
    EXPECT_EQ(errors().substr(0, errors().find('\n')), c.first_line);
    if (c.status == 2) {
      EXPECT_EQ(output(), "");
      EXPECT_TRUE(channel_.sent.empty()) << "a usage error sent a request";
      if (c.args.empty() || c.args[0].starts_with("-") || c.args[0] == "recent" || c.args[0] == "search") {
        EXPECT_NE(errors().find(usage_hint), std::string::npos) << errors();
      }
    }
  }
}

// --- Help and demo --------------------------------------------------------------------------

TEST_F(CliCommandTest, SubcommandHelpShowsItsOwnOptionsAndExamples) {
  ASSERT_EQ(run({"favorites", "add", "--help"}), 0);
  EXPECT_NE(output().find("--font"), std::string::npos) << output();
  EXPECT_NE(output().find("lumeris favorites add "), std::string::npos) << output();
  EXPECT_EQ(output().find("lumeris search"), std::string::npos) << "the global examples are repeated";
  ASSERT_EQ(run({"--help"}), 0);
  EXPECT_NE(output().find("Exit status:\n  0  done\n  1  not done"), std::string::npos) << output();
}

TEST_F(CliCommandTest, DemoGoesOnWhenOperationsDoNotAnswerAndCleansUp) {
  // Only the unknown search command answers, as a service with no operations installed does.
  channel_.replies = {{"search_", R"({"transactionID":7})"}};
  ASSERT_EQ(run({"demo"}), 0) << errors();
  EXPECT_NE(output().find("(no answer"), std::string::npos) << output();
  // Everything the demo stores goes under its own identifier, and both lists are removed at the end.
  for (const Sent& sent : channel_.sent) {
    if (const std::string* identifier = sent.request.GetString("identifier")) {
      EXPECT_EQ(*identifier, kDemoIdentifier);
    }
  }
  ASSERT_GE(channel_.sent.size(), 2u);
  EXPECT_EQ(channel_.sent[channel_.sent.size() - 2].request, Json(R"({"command":"set","target":"recents","identifier":")" +
                                                                   std::string(kDemoIdentifier) + "\"}"));
}

}  // namespace
}  // namespace lumeris::cli
