// The user data store through the real service: every store command's wiring (the rules behind
// each are shown in store_test and dispatch_test, the notifications with a synchronous counter),
// the files on disk, the change notification on the private session bus, concurrent connections.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <set>
#include <thread>

#include "platform/distributed_notifications.h"
#include "store_fixture.h"
#include "support/service_fixture.h"

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
  return bytes ? std::optional(std::string(bytes->begin(), bytes->end())) : std::nullopt;
}

MessageValue Add(std::string item) {
  return Command("add", {{"target", Str("recents")}, {"item", Str(std::move(item))}, {"identifier", Str(kId)}});
}
MessageValue Set(std::string target, const StringVector& items) {
  return Command("set", {{"target", Str(std::move(target))}, {"array", Strings(items)}, {"identifier", Str(kId)}});
}

class StoreServiceTest : public ServiceTest {
 protected:
  void SetUp() override {
    if (std::getenv("DBUS_SESSION_BUS_ADDRESS") == nullptr) GTEST_SKIP() << "no session bus (source scripts/test-env.sh)";
    observer_ = DistributedNotificationObserver::Open("LMLumerisRecentsChangedNotification");
    ASSERT_TRUE(observer_);
    ServiceTest::SetUp();
    connection_.emplace(Connect());
  }

  // Send a writing command (applied before any later request) or a reading one on the test's connection.
  void send(MessageValue request) { connection_->SendMessage(request, FrameKind::kNoReply); }
  MessageValue ask(MessageValue request) {
    std::optional<MessageValue> reply = connection_->ReadReply(connection_->SendMessage(request), 5s);
    EXPECT_TRUE(reply) << "no reply to " << request;
    return reply.value_or(MessageValue::MakeDictionary());
  }
  MessageValue readAll(std::string application = "app") {
    return ask(Command("read_recents_favorites", {{"identifier", Str(kId)}, {"application", Str(std::move(application))}}));
  }
  std::optional<StringVector> read(std::string target) {
    return ReplyList(ask(Command("read", {{"target", Str(target)}, {"identifier", Str(kId)}})), "array");
  }
  // Waits for `count` notifications; returns how many came.
  std::size_t notifications(std::size_t count) {
    return observer_->Run([](const DistributedNotification&) {}, {.max_count = count, .timeout = 5s});
  }

  std::unique_ptr<DistributedNotificationObserver> observer_;
  std::optional<RawConnection> connection_;
};

TEST_F(StoreServiceTest, EveryStoreCommandNotifiesAndIsReadBackFromTheFile) {
  auto state = [](std::string_view data) {
    return Command("save_state", {{"data", MessageValue::DataFromBytes(data)}, {"application", Str("app")}});
  };
  const MessageValue requests[] = {
      Add(PlainID("a")),                                           // notifies
      Set("recents", {EmojiID(kThumbsUp), PlainID("a")}),          // notifies
      Add(EmojiID(kThumbsUpMedium)),                               // notifies
      Set("favorites", {PlainID("f1"), PlainID("f2")}),
      Command("set_skintone", {{"item", Str(EmojiID(kThumbsUpMedium))}, {"identifier", Str(kId)}}),  // notifies
      state(R"({"tab":1})"),
      state(R"({"VTGlobalEmojiDiversityDescribed":"g"})"),         // notifies
  };
  for (const MessageValue& request : requests) send(request);
  EXPECT_EQ(notifications(5), 5u);

  const MessageValue reply = readAll();
  EXPECT_THAT(ReplyList(reply, "recents"), Optional(ElementsAre(EmojiID(kThumbsUpMedium), PlainID("a"))));
  EXPECT_THAT(ReplyList(reply, "favorites"), Optional(ElementsAre(PlainID("f1"), PlainID("f2"))));
  EXPECT_THAT(read("favorites"), Optional(ElementsAre(PlainID("f1"), PlainID("f2"))));
  EXPECT_EQ(Payload(reply, "skintones"), "{\"" + std::string(kThumbsUp) + "\":\"" + kThumbsUpMedium + "\"}");
  EXPECT_EQ(Payload(reply, "state"), R"({"VTGlobalEmojiDiversityDescribed":"g","tab":1})");
  EXPECT_EQ(Payload(readAll("other.app"), "state"), R"({"VTGlobalEmojiDiversityDescribed":"g"})");
  using ::testing::Key;
  EXPECT_THAT(StoredDomain(), ElementsAre(Key("Favorites:test.identifier"), Key("Recents:test.identifier"),
                                          Key("SkinTones:test.identifier"), Key("State:app"),
                                          Key("VTGlobalEmojiDiversityDescribed"), Key("version")));

  send(Set("recents", {}));
  EXPECT_EQ(notifications(1), 1u) << "an empty recents list";
  const MessageValue emptied = readAll();
  EXPECT_TRUE(emptied.Find("recents")->is_null());
  EXPECT_EQ(emptied.Find("skintones"), nullptr) << "an empty recents list removes the skin tones";
}

// The reply to "open_large_viewer" comes once the input method's preference is on disk.
TEST_F(StoreServiceTest, OpenLargeViewerWritesThePathBeforeItAnswersAndRemovesItWithoutOne) {
  SeedDomain("com.vantorel.SorvendiIM", {{"VTRecentItems", plist::Array{}}});
  for (const std::optional<std::string>& path : {std::optional<std::string>("/tmp/a path"), std::optional<std::string>()}) {
    MessageValue request = Command("open_large_viewer");
    if (path) request.Set("path", Str(*path));
    EXPECT_EQ(ask(request), MessageValue::MakeDictionary());
    plist::Dictionary expected{{"VTRecentItems", plist::Array{}}};  // other keys stay
    if (path) expected.emplace("VTStartAsLargeWindowTemporarily", *path);
    EXPECT_EQ(StoredDomain("com.vantorel.SorvendiIM"), expected);
  }
}

// Another program removes the file (as `lumeris defaults delete` does) or replaces it: every read
// sees the file as it is now, so the next store runs the version check against the real file and
// keeps "version", and a later recents read does not wipe what was just stored.
TEST_F(StoreServiceTest, ReadsSeeTheFileAsItIsNowAfterAnOutsideResetOrReplace) {
  send(Set("favorites", {"before"}));
  EXPECT_FALSE(read("recents"));
  std::filesystem::remove(DomainFile("com.vantorel.Lumeris"));
  send(Set("favorites", {"after"}));
  EXPECT_FALSE(read("recents"));
  EXPECT_THAT(read("favorites"), Optional(ElementsAre("after")));
  EXPECT_EQ(StoredValue("version"), plist::Value(1));

  SeedStore({{"version", 1}, {"Favorites:test.identifier", plist::Array{"seeded"}}});
  EXPECT_THAT(read("favorites"), Optional(ElementsAre("seeded")));
}

// Eight connections add distinct items to one identifier at the same time while a ninth stores
// favourites. The service serialises the read-modify-write of its adds, so every item is kept and
// every add stores and notifies once, and the favourites written meanwhile survive (a synchronise
// merges key by key).
TEST_F(StoreServiceTest, ConcurrentAddsKeepEveryItemAndOtherKeys) {
  constexpr int kConnections = 8, kAddsEach = 10;
  auto item_of = [](int c, int n) { return PlainID("c" + std::to_string(c) + "-" + std::to_string(n)); };
  std::vector<std::thread> writers;
  std::set<std::string> added;
  for (int c = 0; c < kConnections; ++c) {
    for (int n = 0; n < kAddsEach; ++n) added.insert(item_of(c, n));
    writers.emplace_back([&, c] {
      RawConnection connection = *RawConnection::Open(socket_path_);
      for (int n = 0; n < kAddsEach; ++n) connection.SendMessage(Add(item_of(c, n)), FrameKind::kNoReply);
    });
  }
  for (int n = 0; n < kAddsEach; ++n) send(Set("favorites", {"fav-" + std::to_string(n)}));
  for (std::thread& writer : writers) writer.join();
  EXPECT_EQ(notifications(kConnections * kAddsEach), static_cast<std::size_t>(kConnections * kAddsEach));

  const std::optional<StringVector> recents = read("recents");
  ASSERT_TRUE(recents);
  EXPECT_EQ(std::set<std::string>(recents->begin(), recents->end()), added) << "every item, once";
  EXPECT_EQ(recents->size(), added.size());
  EXPECT_THAT(read("favorites"), Optional(ElementsAre("fav-" + std::to_string(kAddsEach - 1))));
}

}  // namespace
}  // namespace lumeris
