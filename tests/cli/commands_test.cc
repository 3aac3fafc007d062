// Command lines to requests and replies to output, without a service: the commands run against
// a channel that records what they send and answers from a script.
#include <gtest/gtest.h>

#include <functional>
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

using namespace std::chrono_literals;
using Args = std::vector<std::string>;
using Answer = std::function<std::optional<MessageValue>(const MessageValue&)>;

// What a command handed to the channel.
struct Sent {
  MessageValue request;
  bool wants_reply;
  std::chrono::milliseconds timeout;
};

class ScriptedChannel : public ServiceChannel {
 public:
  // The reply to a request, or std::nullopt for "none in time".
  Answer answer = [](const MessageValue&) { return MessageValue::MakeDictionary(); };
  bool deliver = true;
  std::vector<Sent> sent;

  std::optional<MessageValue> Request(const MessageValue& request, std::chrono::milliseconds timeout,
                                      std::string* error) override {
    sent.push_back({request, true, timeout});
    std::optional<MessageValue> reply = answer(request);
    if (!reply && error) *error = "no reply from the file service within " + DescribeTimeout(timeout);
    return reply;
  }
  bool Send(const MessageValue& request, std::chrono::milliseconds timeout, std::string* error) override {
    sent.push_back({request, false, timeout});
    if (!deliver && error) *error = "cannot reach the file service: test";
    return deliver;
  }
};

// A message written as JSON (escapes included), so the tables read like the wire.
MessageValue Json(const std::string& text) {
  std::string error;
  std::optional<MessageValue> value = MessageValueFromJsonText(text, &error);
  EXPECT_TRUE(value) << text << ": " << error;
  return value.value_or(MessageValue());
}

// Answers by command; commands not listed get no reply.
Answer ByCommand(std::map<std::string, const char*> replies) {
  return [replies](const MessageValue& request) -> std::optional<MessageValue> {
    const auto found = replies.find(*request.GetString("command"));
    if (found == replies.end()) return std::nullopt;
    return Json(found->second);
  };
}

std::string Joined(const Args& args) {
  std::string text;
  for (const std::string& arg : args) text += (text.empty() ? "" : " ") + arg;
  return text;
}

class CliCommandTest : public ::testing::Test {
 protected:
  int run(Args args) {
    args.insert(args.begin(), "lumeris");
    std::vector<const char*> argv;
    for (const std::string& arg : args) argv.push_back(arg.c_str());
    out_.str("");
    err_.str("");
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

struct RequestCase {
  Args args;
  const char* request_json;
  bool wants_reply;
};

TEST_F(CliCommandTest, EverySubcommandBuildsItsRequestDictionary) {
  for (const RequestCase& c : std::initializer_list<RequestCase>{
           {{"search", "cat face", "--limit", "3"},
            R"({"command":"search_matched_chars","string":"cat face","limit":3,"transactionID":1})", true},
           {{"related", "中"}, R"({"command":"search_related_chars","string":"中","limit":20,"transactionID":1})", true},
           {{"info", "中", "--transaction-id", "9"},
            R"({"command":"search_character_info","string":"中","transactionID":9})", true},
           {{"categories", "Emoji", "Arrows"}, R"({"command":"read_categorydata","categories":["Emoji","Arrows"]})", true},
           {{"recents"}, R"({"command":"read","target":"recents",)" STORE "}", true},
           {{"favorites", "--identifier", "X"}, R"({"command":"read","target":"favorites","identifier":"X"})", true},
           {{"recents", "set", "A", R"(com.vantorel.lmk:{"char":"B"})"},
            R"({"command":"set","target":"recents",)" STORE R"(,"array":[")" LMK R"(char\":\"A\"}",")" LMK
            R"(char\":\"B\"}"]})", false},
           // No items: no "array", which removes the list.
           {{"favorites", "set", "--identifier", "X"}, R"({"command":"set","target":"favorites","identifier":"X"})", false},
           {{"favorites", "set", "😀", "--emoji-font"},
            R"({"command":"set","target":"favorites",)" STORE R"(,"array":[")" LMK
            R"(char\":\"😀\",\"font\":\"VantorelColorEmoji\"}"]})", false},
           // --identifier belongs to "recents" but may follow "add".
           {{"recents", "add", "A", "--font", "F", "--glyph", "7", "--identifier", "Y"},
            R"({"command":"add","target":"recents","identifier":"Y","item":")" LMK
            R"(char\":\"A\",\"font\":\"F\",\"glyph\":7}"})", false},
           {{"skintone", "👍🏽", "--emoji-font"},
            R"({"command":"set_skintone",)" STORE R"(,"item":")" LMK R"(char\":\"👍🏽\",\"font\":\"VantorelColorEmoji\"}"})",
            false},
           {{"state", "save", "--application", "app", R"({"a": 1})"},
            R"({"command":"save_state","application":"app","data":{"$data":"eyJhIjogMX0="}})", false},
           {{"state", "save", "{}"},
            R"({"command":"save_state","application":"com.vantorel.lumeris-cli","data":{"$data":"e30="}})", false},
           {{"read-all", "--identifier", "X", "--application", "Y"},
            R"({"command":"read_recents_favorites","identifier":"X","application":"Y"})", true},
           {{"open-large-viewer", "/tmp/p"}, R"({"command":"open_large_viewer","path":"/tmp/p"})", true},
           {{"open-large-viewer"}, R"({"command":"open_large_viewer"})", true},
           {{"raw", R"({"command":"x","limit":{"$uint64":"5"},"n":{"$int64":"-2"}})"},
            R"({"command":"x","limit":5,"n":-2})", true},
           {{"raw", "--no-reply", R"({"command":"add","data":{"$data":"AP8="},"v":null})"},
            R"({"command":"add","data":{"$data":"AP8="},"v":null})", false}}) {
    SCOPED_TRACE(Joined(c.args));
    channel_.sent.clear();
    ASSERT_EQ(run(c.args), 0) << errors();
    ASSERT_EQ(channel_.sent.size(), 1u);
    EXPECT_EQ(channel_.sent[0].request, Json(c.request_json));
    EXPECT_EQ(channel_.sent[0].wants_reply, c.wants_reply);
  }
}

TEST_F(CliCommandTest, TimeoutOptionReachesTheChannelBeforeOrAfterTheSubcommand) {
  ASSERT_EQ(run({"--timeout", "0.25", "recents"}), 0);
  ASSERT_EQ(run({"recents", "--timeout", "2"}), 0);
  ASSERT_EQ(channel_.sent.size(), 2u);
  EXPECT_EQ(channel_.sent[0].timeout, 250ms);
  EXPECT_EQ(channel_.sent[1].timeout, 2000ms);
}

struct OutputCase {
  Args args;
  const char* reply_json;
  const char* output;  // exact text; with --json, compared as JSON
};

TEST_F(CliCommandTest, PrintsRepliesForPeopleOrAsJson) {
  for (const OutputCase& c : std::initializer_list<OutputCase>{
           {{"search", "smil"}, R"({"result":["😀","☺"],"transactionID":1})", "😀\tU+1F600\n☺\tU+263A\n"},
           {{"--json", "search", "smil"}, R"({"result":["😀","☺"],"transactionID":1})",
            R"({"result":["😀","☺"],"transactionID":1})"},
           {{"search", "zzz"}, R"({"result":[],"transactionID":1})", "no characters found\n"},
           {{"recents"}, R"({"array":null})", "(empty)\n"},
           // Items print as characters, not only as IDs.
           {{"recents"}, R"({"array":[")" LMK R"(char\":\"👍🏽\",\"font\":\"VantorelColorEmoji\"}"]})",
            "👍🏽\tU+1F44D U+1F3FD\tVantorelColorEmoji\n"},
           {{"recents", "add", "A"}, "{}", "recents: added A\n"},
           {{"--json", "recents", "add", "A"}, "{}",
            R"({"sent":{"command":"add","target":"recents",)" STORE R"(,"item":")" LMK R"(char\":\"A\"}"}})"},
           // The raw reply keeps kinds JSON cannot tell apart, in the escaped notation.
           {{"--json", "raw", R"({"command":"read"})"}, R"({"d":{"$data":"/w=="},"n":{"$int64":"-4"}})",
            R"({"d":{"$data":"/w=="},"n":-4})"}}) {
    SCOPED_TRACE(Joined(c.args));
    channel_.answer = [&c](const MessageValue&) { return Json(c.reply_json); };
    ASSERT_EQ(run(c.args), 0) << errors();
    if (c.args[0] == "--json") {
      EXPECT_EQ(nlohmann::json::parse(output()), nlohmann::json::parse(c.output)) << output();
    } else {
      EXPECT_EQ(output(), c.output);
    }
  }
}

// --- Errors ---------------------------------------------------------------------------------

TEST_F(CliCommandTest, BadArgumentsAreRefusedWithoutSendingAnything) {
  for (const auto& [args, in_error] : std::initializer_list<std::pair<Args, const char*>>{
           {{"raw", "{\"command\":"}, "not valid JSON"}, {{"raw", "[1, 2]"}, "must be a JSON object"},
           {{"raw", R"({"limit":{"$uint64":"-5"}})"}, "/limit/$uint64"},
           {{"state", "save", "not json"}, "not valid JSON"}, {{"recents", "add", "A", "--font", "F"}, "--glyph"},
           {{"--timeout", "0", "recents"}, "--timeout"}, {{"search"}, "text"}, {{}, "subcommand"}}) {
    EXPECT_NE(run(args), 0) << Joined(args);
    EXPECT_TRUE(channel_.sent.empty()) << Joined(args);
    EXPECT_NE(errors().find(in_error), std::string::npos) << Joined(args) << ": " << errors();
  }
}

TEST_F(CliCommandTest, NoAnswerIsAClearMessageAndStatusOne) {
  channel_.answer = [](const MessageValue&) { return std::nullopt; };
  EXPECT_EQ(run({"--timeout", "0.5", "info", "中"}), kExitNoAnswer);
  EXPECT_EQ(errors(), "lumeris: info: no reply from the file service within 0.5 s\n");
  EXPECT_EQ(output(), "");
  // A raw request that gets none points at --no-reply.
  EXPECT_EQ(run({"raw", R"({"command":"add"})"}), kExitNoAnswer);
  EXPECT_NE(errors().find("--no-reply"), std::string::npos) << errors();

  channel_.deliver = false;
  EXPECT_EQ(run({"favorites", "set", "A"}), kExitNoAnswer);
  EXPECT_EQ(errors(), "lumeris: favorites set: cannot reach the file service: test\n");
}

// --- Help and demo --------------------------------------------------------------------------

TEST_F(CliCommandTest, HelpNamesEverySubcommandWithAnExample) {
  ASSERT_EQ(run({"--help"}), 0);
  for (const char* name : {"search", "related", "info", "categories", "recents", "favorites", "skintone",
                           "state", "read-all", "open-large-viewer", "raw", "demo", "defaults", "watch"}) {
    EXPECT_NE(output().find(std::string("\n  ") + name + " "), std::string::npos) << name;
    EXPECT_NE(output().find(std::string("lumeris ") + name), std::string::npos) << name;
  }
  for (const char* escape : {"$uint64", "$int64", "$double", "$data"}) {
    EXPECT_NE(output().find(escape), std::string::npos) << escape;
  }
}

TEST_F(CliCommandTest, DemoGoesOnWhenOperationsDoNotAnswer) {
  // Only the unknown search command answers, as a service with no operations installed does.
  channel_.answer = ByCommand({{"search_", R"({"transactionID":7})"}});
  ASSERT_EQ(run({"demo"}), 0) << errors();
  EXPECT_NE(output().find("The service answers."), std::string::npos) << output();
  EXPECT_NE(output().find("no answer"), std::string::npos) << output();
  // Everything the demo stores goes under its own identifier, and is removed at the end.
  std::vector<const Sent*> writes;
  for (const Sent& sent : channel_.sent) {
    if (const std::string* identifier = sent.request.GetString("identifier")) {
      EXPECT_EQ(*identifier, kDemoIdentifier);
    }
    if (!sent.wants_reply) writes.push_back(&sent);
  }
  ASSERT_GE(writes.size(), 2u);
  for (const Sent* removal : {writes[writes.size() - 2], writes.back()}) {
    EXPECT_EQ(*removal->request.GetString("command"), "set");
    EXPECT_EQ(removal->request.Find("array"), nullptr);
  }
}

TEST_F(CliCommandTest, DemoShowsAnswersAndFailsOnlyWhenTheServiceIsUnreachable) {
  channel_.answer = ByCommand({{"search_matched_chars", R"({"result":["😃"],"transactionID":0})"},
                               {"read", R"({"array":[")" LMK R"(char\":\"A\"}"]})"},
                               {"search_", R"({"transactionID":7})"}});
  ASSERT_EQ(run({"demo"}), 0) << errors();
  for (const char* shown : {"  😃\tU+1F603\n", "Related to a", "  A\tU+0041\n"}) {
    EXPECT_NE(output().find(shown), std::string::npos) << output();
  }
  channel_.answer = [](const MessageValue&) { return std::nullopt; };
  EXPECT_EQ(run({"demo"}), kExitNoAnswer);
  EXPECT_NE(errors().find("lumeris: demo:"), std::string::npos) << errors();
}

}  // namespace
}  // namespace lumeris::cli
