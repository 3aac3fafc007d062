// The user data store through the real service: requests over the socket, the preference files
// on disk, and the change notifications on the private session bus.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <cstdlib>
#include <set>
#include <thread>

#include "platform/distributed_notifications.h"
#include "platform/preferences_file_system.h"
#include "support/service_fixture.h"
#include "store_fixture.h"
#include "viewer/notification_names.h"

namespace lumeris {
namespace {

using ::testing::ElementsAre;
using ::testing::Optional;
using namespace testing;  // lumeris::testing
using namespace std::chrono_literals;

constexpr char kId[] = "test.identifier";

MessageValue Str(std::string text) { return MessageValue::String(std::move(text)); }

MessageValue Strings(const StringVector& strings) {
  MessageValue array = MessageValue::MakeArray();
  for (const std::string& text : strings) array.Append(Str(text));
  return array;
}

// The strings of a reply's ID array; std::nullopt for null (an empty or absent list).
std::optional<StringVector> ReplyList(const MessageValue& reply, std::string_view key) {
  const MessageValue* value = reply.Find(key);
  if (value == nullptr || value->is_null()) return std::nullopt;
  StringVector strings;
  for (const MessageValue& element : *value->AsArray()) strings.push_back(*element.AsString());
  return strings;
}

std::optional<std::string> Payload(const MessageValue& reply, std::string_view key) {
  const MessageValue::Bytes* bytes = reply.GetData(key);
  if (bytes == nullptr) return std::nullopt;
  return std::string(bytes->begin(), bytes->end());
}

class StoreServiceTest : public ServiceTest {
 protected:
  void SetUp() override {
    if (std::getenv("DBUS_SESSION_BUS_ADDRESS") == nullptr) GTEST_SKIP() << "no session bus (source scripts/test-env.sh)";
    observer_ = DistributedNotificationObserver::Open(kLMLumerisRecentsChangedNotification);
    ASSERT_TRUE(observer_);
    ServiceTest::SetUp();
    connection_.emplace(Connect());
  }

  // Sends a writing command on the test's connection; it is applied before any later request.
  void send(MessageValue request) { connection_->SendMessage(request, FrameKind::kNoReply); }
  // Sends a reading command on the test's connection and returns its reply.
  MessageValue ask(MessageValue request) {
    std::optional<MessageValue> reply = connection_->ReadReply(connection_->SendMessage(request), 10s);
    EXPECT_TRUE(reply) << "no reply to " << request;
    return reply.value_or(MessageValue::MakeDictionary());
  }
  MessageValue readAll(std::string identifier = kId, std::string application = "app") {
    return ask(Command("read_recents_favorites",
                       {{"identifier", Str(std::move(identifier))}, {"application", Str(std::move(application))}}));
  }
  std::optional<StringVector> read(std::string target, std::string identifier = kId) {
    return ReplyList(ask(Command("read", {{"target", Str(target)}, {"identifier", Str(identifier)}})), "array");
  }
  void add(std::string item) {
    send(Command("add", {{"target", Str("recents")}, {"item", Str(item)}, {"identifier", Str(kId)}}));
  }
  void set(std::string target, MessageValue array, std::string identifier = kId) {
    send(Command("set", {{"target", Str(target)}, {"array", std::move(array)}, {"identifier", Str(identifier)}}));
  }
  void saveState(std::string_view data) {
    send(Command("save_state", {{"data", MessageValue::DataFromBytes(data)}, {"application", Str("app")}}));
  }
  // Waits until every request sent so far has been handled.
  void settle() { ask(Command("read", {{"target", Str("favorites")}, {"identifier", Str("settle")}})); }

  // The notifications that arrive from now until `quiet` passes without one.
  std::size_t notifications(std::chrono::milliseconds quiet = 400ms) {
    settle();
    std::size_t total = 0;
    while (std::size_t n = observer_->Run([](const DistributedNotification&) {}, {.max_count = 1, .timeout = quiet})) {
      total += n;
    }
    return total;
  }

  std::unique_ptr<DistributedNotificationObserver> observer_;
  std::optional<RawConnection> connection_;
};

// Every store command through the service in one history: what each one notifies, then the four
// values the panel reads back and the keys in the file. The rules behind each step are shown
// request by request in the store and dispatch tests; this shows the wiring.
TEST_F(StoreServiceTest, EveryStoreCommandNotifiesAndIsReadBackFromTheFile) {
  readAll();  // versions the domain, as the panel's first read does
  auto add_request = [](std::string item, std::optional<std::string> identifier) {
    MessageValue request = Command("add", {{"target", Str("recents")}, {"item", Str(std::move(item))}});
    if (identifier) request.Set("identifier", Str(*identifier));
    return request;
  };
  auto set_request = [](std::string target, const StringVector& items) {
    return Command("set", {{"target", Str(std::move(target))}, {"array", Strings(items)}, {"identifier", Str(kId)}});
  };
  auto skin_tone = [](std::string item) {
    return Command("set_skintone", {{"item", Str(std::move(item))}, {"identifier", Str(kId)}});
  };
  auto state = [](std::string_view data) {
    return Command("save_state", {{"data", MessageValue::DataFromBytes(data)}, {"application", Str("app")}});
  };
  const std::string other_font =
      "com.vantorel.lmk:{\"char\":\"" + std::string(kThumbsUpDark) + "\",\"font\":\"Courier\"}";
  const struct {
    const char* name;
    MessageValue request;
    std::size_t notifications;
  } steps[] = {
      {"add", add_request(PlainID("a"), kId), 1},
      {"add without identifier", add_request(PlainID("x"), std::nullopt), 0},
      {"set recents", set_request("recents", {EmojiID(kThumbsUp), PlainID("a")}), 1},
      {"add an existing item with new text", add_request(EmojiID(kThumbsUpMedium), kId), 1},
      {"set favorites", set_request("favorites", {PlainID("f1"), PlainID("f2")}), 0},
      {"skin tone in the emoji font", skin_tone(EmojiID(kThumbsUpMedium)), 1},
      {"skin tone in another font", skin_tone(other_font), 0},
      {"state without the global member", state(R"({"tab":1})"), 0},
      {"state with the global member", state(R"({"VTGlobalEmojiDiversityDescribed":"g"})"), 1},
      {"state that is not JSON", state("not json"), 0},
  };
  for (const auto& step : steps) {
    send(step.request);
    EXPECT_EQ(notifications(), step.notifications) << step.name;
  }

  const MessageValue reply = readAll();
  EXPECT_THAT(ReplyList(reply, "recents"), Optional(ElementsAre(EmojiID(kThumbsUpMedium), PlainID("a"))));
  EXPECT_THAT(ReplyList(reply, "favorites"), Optional(ElementsAre(PlainID("f1"), PlainID("f2"))));
  EXPECT_THAT(read("favorites"), Optional(ElementsAre(PlainID("f1"), PlainID("f2"))));
  EXPECT_EQ(Payload(reply, "skintones"), "{\"" + std::string(kThumbsUp) + "\":\"" + kThumbsUpMedium + "\"}");
  EXPECT_EQ(Payload(reply, "state"), R"({"VTGlobalEmojiDiversityDescribed":"g","tab":1})");
  EXPECT_EQ(Payload(readAll(kId, "other.app"), "state"), R"({"VTGlobalEmojiDiversityDescribed":"g"})");
  StringVector keys;
  for (const auto& [key, value] : StoredDomain()) keys.push_back(key);
  EXPECT_THAT(keys, ElementsAre("Favorites:test.identifier", "Recents:test.identifier", "SkinTones:test.identifier",
                                "State:app", "VTGlobalEmojiDiversityDescribed", "version"));

  set("recents", Strings({}));
  EXPECT_EQ(notifications(), 1u) << "an empty recents list";
  const MessageValue emptied = readAll();
  EXPECT_TRUE(emptied.Find("recents")->is_null());
  EXPECT_EQ(emptied.Find("skintones"), nullptr) << "an empty recents list removes the skin tones";
}

// Another program removes the file (as `lumeris defaults delete` does) or replaces it: every read
// sees the file as it is now, so the next store runs the version check against the real file and
// keeps "version", and a later recents read does not wipe what was just stored.
TEST_F(StoreServiceTest, ReadsSeeTheFileAsItIsNowAfterAnOutsideResetOrReplace) {
  set("favorites", Strings({"before"}));
  EXPECT_FALSE(read("recents"));
  std::filesystem::remove(DomainFile("com.vantorel.Lumeris"));
  set("favorites", Strings({"after"}));
  EXPECT_FALSE(read("recents"));
  EXPECT_THAT(read("favorites"), Optional(ElementsAre("after")));
  EXPECT_EQ(StoredValue("version"), plist::Value(1));

  SeedStore({{"version", 1}, {"Favorites:test.identifier", plist::Array{"seeded"}}});
  EXPECT_THAT(read("favorites"), Optional(ElementsAre("seeded")));
}

// Strings that are not well-formed UTF-8 or hold NUL do not convert, so they count as absent
// (skipped inside a list, empty as an item): what the service answers is what is on disk, and
// both are the same after a restart.
TEST_F(StoreServiceTest, TextThatDoesNotConvertIsAnsweredAsStoredBeforeAndAfterARestart) {
  const std::string invalid = "bad\xC3(", with_nul("nul\0x", 5);
  set("favorites", Strings({"ok", invalid, with_nul, "\xED\xA0\x80"}));
  add(invalid);
  add(with_nul);
  send(Command("add", {{"target", Str("recents")}, {"item", Str("kept")}, {"identifier", Str(with_nul)}}));
  const MessageValue before = readAll();
  EXPECT_THAT(ReplyList(before, "favorites"), Optional(ElementsAre("ok")));
  EXPECT_THAT(ReplyList(before, "recents"), Optional(ElementsAre("")));

  service_.Stop();
  ASSERT_TRUE(service_.Start(socket_path_));
  connection_.emplace(Connect());
  EXPECT_EQ(readAll(), before);
  EXPECT_THAT(StoredList("Favorites:test.identifier"), Optional(ElementsAre("ok")));
}

// Eight connections add distinct items to one identifier at the same time while a ninth stores
// favourites. The service serialises the read-modify-write of its adds, so every item is kept;
// every add stores and notifies once, the file is never torn (each store replaces it
// atomically), and the favourites written meanwhile survive (a synchronise merges key by key).
TEST_F(StoreServiceTest, ConcurrentAddsKeepEveryItemAndOtherKeys) {
  constexpr int kConnections = 8;
  constexpr int kAddsEach = 10;
  std::atomic<bool> adding{true};
  std::atomic<int> torn_reads{0};
  std::atomic<int> answered{0};
  auto item_of = [](int c, int n) { return PlainID("c" + std::to_string(c) + "-" + std::to_string(n)); };

  std::thread watcher([&] {
    while (adding) {
      // One read decides: a file that appears between two looks is not torn.
      const FileContents file = PreferencesFileSystem().Read(DomainFile("com.vantorel.Lumeris"));
      if (file.status == ReadStatus::kOk && !plist::ParsePropertyList(file.bytes)) ++torn_reads;
    }
  });
  std::vector<std::thread> writers;
  for (int c = 0; c < kConnections; ++c) {
    writers.emplace_back([&, c] {
      RawConnection connection = *RawConnection::Open(socket_path_);
      for (int n = 0; n < kAddsEach; ++n) {
        connection.SendMessage(
            Command("add", {{"target", Str("recents")}, {"item", Str(item_of(c, n))}, {"identifier", Str(kId)}}),
            FrameKind::kNoReply);
      }
      const std::uint64_t id =
          connection.SendMessage(Command("read", {{"target", Str("favorites")}, {"identifier", Str("settle")}}));
      if (connection.ReadReply(id, 30s)) ++answered;
    });
  }
  for (int n = 0; n < kAddsEach; ++n) set("favorites", Strings({"fav-" + std::to_string(n)}));
  settle();
  for (std::thread& writer : writers) writer.join();
  adding = false;
  watcher.join();

  EXPECT_EQ(answered, kConnections);
  EXPECT_EQ(torn_reads, 0);
  EXPECT_EQ(observer_->Run([](const DistributedNotification&) {}, {.max_count = kConnections * kAddsEach, .timeout = 10s}),
            static_cast<std::size_t>(kConnections * kAddsEach))
      << "every add stored once";

  std::set<std::string> added;
  for (int c = 0; c < kConnections; ++c) {
    for (int n = 0; n < kAddsEach; ++n) added.insert(item_of(c, n));
  }
  const std::optional<StringVector> recents = read("recents");
  ASSERT_TRUE(recents);
  EXPECT_EQ(std::set<std::string>(recents->begin(), recents->end()), added) << "every item, once";
  EXPECT_EQ(recents->size(), added.size());
  EXPECT_THAT(read("favorites"), Optional(ElementsAre("fav-" + std::to_string(kAddsEach - 1))));
}

}  // namespace
}  // namespace lumeris
