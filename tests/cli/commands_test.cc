// Command lines to requests and replies to output, without a service: the commands run against
// a channel that records what they send and answers from a script.
#include <gtest/gtest.h>

#include <functional>
#include <initializer_list>
#include <sstream>
#include <string>
#include <vector>

#include "client/cli_app.h"
#include "client/cli_json_value.h"
#include "client/commands/demo_command.h"

namespace lumeris::cli {
namespace {

using namespace std::chrono_literals;

// What a command handed to the channel.
struct Sent {
  MessageValue request;
  bool wants_reply;
  std::chrono::milliseconds timeout;
};

class ScriptedChannel : public ServiceChannel {
 public:
  // The reply to a request, or std::nullopt for "none in time".
  std::function<std::optional<MessageValue>(const MessageValue&)> answer =
      [](const MessageValue&) { return MessageValue::MakeDictionary(); };
  bool deliver = true;
  std::vector<Sent> sent;

  std::optional<MessageValue> Request(const MessageValue& request,
                                      std::chrono::milliseconds timeout,
                                      std::string* error) override {
    sent.push_back({request, true, timeout});
    std::optional<MessageValue> reply = answer(request);
    if (!reply && error) *error = "no reply from the file service within " + DescribeTimeout(timeout);
    return reply;
  }
  bool Send(const MessageValue& request, std::chrono::milliseconds timeout,
            std::string* error) override {
    sent.push_back({request, false, timeout});
    if (!deliver && error) *error = "cannot reach the file service: test";
    return deliver;
  }
};

// A request dictionary written as JSON (escapes included), so the tables read like the wire.
MessageValue Json(const std::string& text) {
  std::string error;
  std::optional<MessageValue> value = MessageValueFromJsonText(text, &error);
  EXPECT_TRUE(value) << text << ": " << error;
  return value.value_or(MessageValue());
}

class CliCommandTest : public ::testing::Test {
 protected:
  int run(std::vector<std::string> args) {
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

struct RequestCase {
  std::vector<std::string> args;
  const char* request_json;
  bool wants_reply;
};

std::string Joined(const std::vector<std::string>& args) {
  std::string text;
  for (const std::string& arg : args) text += (text.empty() ? "" : " ") + arg;
  return text;
}

void PrintTo(const RequestCase& c, std::ostream* os) { *os << Joined(c.args); }

class CliRequestTest : public CliCommandTest, public ::testing::WithParamInterface<RequestCase> {};

TEST_P(CliRequestTest, BuildsTheRequestDictionary) {
  const RequestCase& c = GetParam();
  ASSERT_EQ(run(c.args), 0) << errors();
  ASSERT_EQ(channel_.sent.size(), 1u);
  EXPECT_EQ(channel_.sent[0].request, Json(c.request_json));
  EXPECT_EQ(channel_.sent[0].wants_reply, c.wants_reply);
}

INSTANTIATE_TEST_SUITE_P(
    EverySubcommand, CliRequestTest,
    ::testing::Values(
        RequestCase{{"search", "cat face", "--limit", "3"},
                    R"({"command":"search_matched_chars","string":"cat face","limit":3,"transactionID":1})",
                    true},
        RequestCase{{"related", "中"},
                    R"({"command":"search_related_chars","string":"中","limit":20,"transactionID":1})",
                    true},
        RequestCase{{"info", "中", "--transaction-id", "9"},
                    R"({"command":"search_character_info","string":"中","transactionID":9})", true},
        RequestCase{{"categories", "Emoji", "Arrows"},
                    R"({"command":"read_categorydata","categories":["Emoji","Arrows"]})", true},
        RequestCase{{"recents"},
                    R"({"command":"read","target":"recents","identifier":"com.vantorel.Lumeris.DefaultDataStorage"})",
                    true},
        RequestCase{{"favorites", "--identifier", "X"},
                    R"({"command":"read","target":"favorites","identifier":"X"})", true},
        RequestCase{{"recents", "set", "A", R"(com.vantorel.lmk:{"char":"B"})"},
                    R"({"command":"set","target":"recents","identifier":"com.vantorel.Lumeris.DefaultDataStorage",
                        "array":["com.vantorel.lmk:{\"char\":\"A\"}","com.vantorel.lmk:{\"char\":\"B\"}"]})",
                    false},
        // No items: no "array", which removes the list.
        RequestCase{{"favorites", "set", "--identifier", "X"},
                    R"({"command":"set","target":"favorites","identifier":"X"})", false},
        RequestCase{{"favorites", "set", "😀", "--emoji-font"},
                    R"({"command":"set","target":"favorites","identifier":"com.vantorel.Lumeris.DefaultDataStorage",
                        "array":["com.vantorel.lmk:{\"char\":\"😀\",\"font\":\"VantorelColorEmoji\"}"]})",
                    false},
        // --identifier belongs to "recents" but may follow "add".
        RequestCase{{"recents", "add", "A", "--font", "F", "--glyph", "7", "--identifier", "Y"},
                    R"({"command":"add","target":"recents","identifier":"Y",
                        "item":"com.vantorel.lmk:{\"char\":\"A\",\"font\":\"F\",\"glyph\":7}"})",
                    false},
        RequestCase{{"skintone", "👍🏽", "--emoji-font"},
                    R"({"command":"set_skintone","identifier":"com.vantorel.Lumeris.DefaultDataStorage",
                        "item":"com.vantorel.lmk:{\"char\":\"👍🏽\",\"font\":\"VantorelColorEmoji\"}"})",
                    false},
        RequestCase{{"state", "save", "--application", "app", R"({"a": 1})"},
                    R"({"command":"save_state","application":"app","data":{"$data":"eyJhIjogMX0="}})",
                    false},
        RequestCase{{"state", "save", "{}"},
                    R"({"command":"save_state","application":"com.vantorel.lumeris-cli","data":{"$data":"e30="}})",
                    false},
        RequestCase{{"read-all", "--identifier", "X", "--application", "Y"},
                    R"({"command":"read_recents_favorites","identifier":"X","application":"Y"})",
                    true},
        RequestCase{{"open-large-viewer", "/tmp/p"},
                    R"({"command":"open_large_viewer","path":"/tmp/p"})", true},
        RequestCase{{"open-large-viewer"}, R"({"command":"open_large_viewer"})", true},
        RequestCase{{"raw", R"({"command":"x","limit":{"$uint64":"5"},"n":{"$int64":"-2"}})"},
                    R"({"command":"x","limit":5,"n":-2})", true},
        RequestCase{{"raw", "--no-reply", R"({"command":"add","data":{"$data":"AP8="},"v":null})"},
                    R"({"command":"add","data":{"$data":"AP8="},"v":null})", false}));

TEST_F(CliCommandTest, TimeoutOptionReachesTheChannelBeforeOrAfterTheSubcommand) {
  ASSERT_EQ(run({"--timeout", "0.25", "recents"}), 0);
  ASSERT_EQ(run({"recents", "--timeout", "2"}), 0);
  ASSERT_EQ(channel_.sent.size(), 2u);
  EXPECT_EQ(channel_.sent[0].timeout, 250ms);
  EXPECT_EQ(channel_.sent[1].timeout, 2000ms);
}

// --- Output ---------------------------------------------------------------------------------

TEST_F(CliCommandTest, SearchPrintsCharactersWithCodePointsOrJson) {
  channel_.answer = [](const MessageValue&) {
    return Json(R"({"result":["😀","☺"],"transactionID":1})");
  };
  ASSERT_EQ(run({"search", "smil"}), 0);
  EXPECT_EQ(output(), "😀\tU+1F600\n☺\tU+263A\n");
  ASSERT_EQ(run({"search", "smil", "--json"}), 0);
  EXPECT_EQ(nlohmann::json::parse(output()),
            nlohmann::json::parse(R"({"result":["😀","☺"],"transactionID":1})"));
}

TEST_F(CliCommandTest, EmptyResultsAreSaidInWords) {
  channel_.answer = [](const MessageValue& request) {
    return *request.GetString("command") == "read" ? Json(R"({"array":null})")
                                                   : Json(R"({"result":[],"transactionID":1})");
  };
  ASSERT_EQ(run({"search", "zzz"}), 0);
  EXPECT_EQ(output(), "no characters found\n");
  ASSERT_EQ(run({"recents"}), 0);
  EXPECT_EQ(output(), "(empty)\n");
}

TEST_F(CliCommandTest, RecentsPrintCharactersNotOnlyIDs) {
  channel_.answer = [](const MessageValue&) {
    return Json(R"({"array":["com.vantorel.lmk:{\"char\":\"👍🏽\",\"font\":\"VantorelColorEmoji\"}"]})");
  };
  ASSERT_EQ(run({"recents"}), 0);
  EXPECT_EQ(output(), "👍🏽\tU+1F44D U+1F3FD\tVantorelColorEmoji\n");
}

TEST_F(CliCommandTest, WritesSayWhatWasSentAndJsonShowsTheRequest) {
  ASSERT_EQ(run({"recents", "add", "A"}), 0);
  EXPECT_EQ(output(), "recents: added A\n");
  ASSERT_EQ(run({"--json", "recents", "add", "A"}), 0);
  const nlohmann::json sent = nlohmann::json::parse(output());
  EXPECT_EQ(sent["sent"]["item"], R"(com.vantorel.lmk:{"char":"A"})");
}

TEST_F(CliCommandTest, RawPrintsTheReplyInTheEscapedNotation) {
  channel_.answer = [](const MessageValue&) {
    MessageValue reply = MessageValue::MakeDictionary();
    reply.Set("d", MessageValue::Data({0xFF}));
    reply.Set("n", MessageValue::Int64(-4));
    return reply;
  };
  ASSERT_EQ(run({"--json", "raw", R"({"command":"read"})"}), 0);
  EXPECT_EQ(output(), "{\"d\":{\"$data\":\"/w==\"},\"n\":-4}\n");
}

// --- Errors ---------------------------------------------------------------------------------

struct RefusedCase {
  std::vector<std::string> args;
  const char* in_error;
};

void PrintTo(const RefusedCase& c, std::ostream* os) { *os << Joined(c.args); }

class CliRefusedTest : public CliCommandTest, public ::testing::WithParamInterface<RefusedCase> {};

TEST_P(CliRefusedTest, RefusesWithoutSendingAnything) {
  EXPECT_NE(run(GetParam().args), 0);
  EXPECT_TRUE(channel_.sent.empty());
  EXPECT_NE(errors().find(GetParam().in_error), std::string::npos) << errors();
}

INSTANTIATE_TEST_SUITE_P(
    BadArguments, CliRefusedTest,
    ::testing::Values(RefusedCase{{"raw", "{\"command\":"}, "not valid JSON"},
                      RefusedCase{{"raw", "[1, 2]"}, "must be a JSON object"},
                      RefusedCase{{"raw", R"({"limit":{"$uint64":"-5"}})"}, "/limit/$uint64"},
                      RefusedCase{{"state", "save", "not json"}, "not valid JSON"},
                      RefusedCase{{"recents", "add", "A", "--font", "F"}, "--glyph"},
                      RefusedCase{{"--timeout", "0", "recents"}, "--timeout"},
                      RefusedCase{{"search"}, "text"},
                      RefusedCase{{}, "subcommand"}));

TEST_F(CliCommandTest, NoReplyIsAClearMessageAndStatusOne) {
  channel_.answer = [](const MessageValue&) { return std::nullopt; };
  EXPECT_EQ(run({"--timeout", "0.5", "info", "中"}), kExitNoAnswer);
  EXPECT_EQ(errors(), "lumeris: info: no reply from the file service within 0.5 s\n");
  EXPECT_EQ(output(), "");
}

TEST_F(CliCommandTest, RawWithoutReplyPointsAtNoReply) {
  channel_.answer = [](const MessageValue&) { return std::nullopt; };
  EXPECT_EQ(run({"raw", R"({"command":"add"})"}), kExitNoAnswer);
  EXPECT_NE(errors().find("--no-reply"), std::string::npos) << errors();
}

TEST_F(CliCommandTest, UndeliveredWriteFails) {
  channel_.deliver = false;
  EXPECT_EQ(run({"favorites", "set", "A"}), kExitNoAnswer);
  EXPECT_EQ(errors(), "lumeris: favorites set: cannot reach the file service: test\n");
}

// --- Help and demo --------------------------------------------------------------------------

TEST_F(CliCommandTest, HelpNamesEverySubcommandWithAnExample) {
  ASSERT_EQ(run({"--help"}), 0);
  for (const char* name : {"search", "related", "info", "categories", "recents", "favorites",
                           "skintone", "state", "read-all", "open-large-viewer", "raw", "demo",
                           "defaults", "watch"}) {
    EXPECT_NE(output().find(std::string("\n  ") + name + " "), std::string::npos) << name;
    EXPECT_NE(output().find(std::string("lumeris ") + name), std::string::npos) << name;
  }
  for (const char* escape : {"$uint64", "$int64", "$double", "$data"}) {
    EXPECT_NE(output().find(escape), std::string::npos) << escape;
  }
}

TEST_F(CliCommandTest, DemoGoesOnWhenOperationsDoNotAnswer) {
  // Only the unknown search command answers, as a service with no operations installed does.
  channel_.answer = [](const MessageValue& request) -> std::optional<MessageValue> {
    if (*request.GetString("command") == "search_") return Json(R"({"transactionID":7})");
    return std::nullopt;
  };
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

TEST_F(CliCommandTest, DemoShowsAnswersWhenThereAreSome) {
  channel_.answer = [](const MessageValue& request) -> std::optional<MessageValue> {
    const std::string command = *request.GetString("command");
    if (command == "search_matched_chars") return Json(R"({"result":["😃"],"transactionID":0})");
    if (command == "read") return Json(R"({"array":["com.vantorel.lmk:{\"char\":\"A\"}"]})");
    if (command == "search_") return Json(R"({"transactionID":7})");
    return std::nullopt;
  };
  ASSERT_EQ(run({"demo"}), 0) << errors();
  EXPECT_NE(output().find("  😃\tU+1F603\n"), std::string::npos) << output();
  EXPECT_NE(output().find("Related to 😃"), std::string::npos) << output();
  EXPECT_NE(output().find("  A\tU+0041\n"), std::string::npos) << output();
}

TEST_F(CliCommandTest, DemoFailsOnlyWhenTheServiceIsUnreachable) {
  channel_.answer = [](const MessageValue&) { return std::nullopt; };
  EXPECT_EQ(run({"demo"}), kExitNoAnswer);
  EXPECT_NE(errors().find("lumeris: demo:"), std::string::npos) << errors();
}

}  // namespace
}  // namespace lumeris::cli
