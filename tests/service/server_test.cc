// The runtime in-process: per-connection ordering, concurrency between connections, handler
// lifetime, and the private runtime directory rule.
#include "service/server.h"

#include <sys/stat.h>

#include <atomic>
#include <fstream>
#include <future>
#include <mutex>

#include "service/listener.h"
#include "service/service_handler.h"
#include "support/service_fixture.h"

namespace lumeris::testing {
namespace {

// Serves `handler` on a socket in a temporary directory.
class InProcessService {
 public:
  explicit InProcessService(ConnectionHandler handler) {
    socket_path_ = dir_.path() / "socket";
    std::optional<ServiceListener> listener = BindServiceSocket(socket_path_);
    EXPECT_TRUE(listener);
    server_ = std::make_unique<ServiceServer>(listener->fd, std::move(handler), 2);
    server_->Start();
  }
  RawConnection Connect() { return std::move(*RawConnection::Open(socket_path_)); }
  void Stop() { server_->Stop(); }

 private:
  ScopedTempDir dir_;
  std::filesystem::path socket_path_;
  std::unique_ptr<ServiceServer> server_;
};

// Character info that blocks on "slow" until released, and records the order of calls.
struct GatedOperations {
  GatedOperations() {
    operations.createXPCDictionaryForCharacterInfo = [this](const std::string& text) {
      Record("start " + text);
      if (text == "slow") gate.wait();
      Record("end " + text);
      return MessageValue::MakeDictionary({{"for", MessageValue::String(text)}});
    };
  }
  void Record(std::string entry) {
    std::lock_guard<std::mutex> hold(mutex);
    log.push_back(std::move(entry));
  }
  // Where `entry` stands in the log; read only after the calls have ended.
  std::ptrdiff_t Position(const std::string& entry) {
    std::lock_guard<std::mutex> hold(mutex);
    return std::find(log.begin(), log.end(), entry) - log.begin();
  }

  ServiceOperations operations;
  std::promise<void> release;
  std::shared_future<void> gate = release.get_future().share();
  std::mutex mutex;
  std::vector<std::string> log;
};

MessageValue Info(const char* text) {
  return Command("search_character_info", {{"string", MessageValue::String(text)}});
}

TEST(ServiceRuntime, SlowRequestDelaysItsOwnConnectionButNotAnother) {
  GatedOperations gated;
  InProcessService service(MakeServiceConnectionHandler(gated.operations));
  RawConnection slow = service.Connect();
  RawConnection fast = service.Connect();

  const std::uint64_t blocked = slow.SendMessage(Info("slow"));
  const std::uint64_t queued = slow.SendMessage(Info("after"));
  // The other connection is answered while the slow request still runs.
  std::optional<MessageValue> reply = fast.ReadReply(fast.SendMessage(Info("fast")), 5s);
  ASSERT_TRUE(reply);
  EXPECT_EQ(*reply->Find("result")->GetString("for"), "fast");
  EXPECT_FALSE(slow.ReadFrame(50ms)) << "nothing may come back before the slow request ends";

  gated.release.set_value();
  std::optional<MessageValue> first = slow.ReadReply(blocked, 5s);
  std::optional<MessageValue> second = slow.ReadReply(queued, 5s);
  ASSERT_TRUE(first && second);
  EXPECT_EQ(*first->Find("result")->GetString("for"), "slow");
  EXPECT_EQ(*second->Find("result")->GetString("for"), "after");
  // One at a time on a connection: "after" starts only when "slow" has ended.
  EXPECT_LT(gated.Position("end slow"), gated.Position("start after"));
  EXPECT_LT(gated.Position("end fast"), gated.Position("end slow"));
}

TEST(ServiceRuntime, HandlerIsReleasedWhenThePeerCloses) {
  std::promise<std::weak_ptr<ServiceConnection>> accepted;
  std::atomic<int> closed_events{0};
  ServiceOperations none;
  InProcessService service([&](const std::shared_ptr<ServiceConnection>& connection) {
    accepted.set_value(connection);
    connection->SetEventHandler([connection, &closed_events, &none](const ConnectionEvent& event) {
      if (std::holds_alternative<ConnectionClosed>(event)) ++closed_events;
      HandleServiceMessage(*connection, event, none);
    });
    connection->Resume();
  });
  std::weak_ptr<ServiceConnection> weak;
  {
    RawConnection client = service.Connect();
    weak = accepted.get_future().get();
    EXPECT_TRUE(client.ReadReply(client.SendMessage(Command("search_x"))));
    EXPECT_FALSE(weak.expired());
  }
  for (int i = 0; i < 500 && !weak.expired(); ++i) std::this_thread::sleep_for(2ms);
  EXPECT_TRUE(weak.expired()) << "the handler still holds the connection";
  EXPECT_EQ(closed_events.load(), 1);
}

TEST(ServiceRuntime, StoppingReleasesOpenConnections) {
  std::weak_ptr<ServiceConnection> weak;
  ServiceOperations none;
  ConnectionHandler base = MakeServiceConnectionHandler(none);
  InProcessService service([&](const std::shared_ptr<ServiceConnection>& connection) {
    weak = connection;
    base(connection);
  });
  RawConnection client = service.Connect();
  ASSERT_TRUE(client.ReadReply(client.SendMessage(Command("search_x"))));
  service.Stop();
  EXPECT_TRUE(weak.expired());
  EXPECT_TRUE(client.WaitForPeerClose());
}

TEST(PrivateRuntimeDirectory, AcceptsOnlyAnOwnDirectoryOfMode0700) {
  ScopedTempDir dir;
  const std::filesystem::path fresh = dir.path() / "fresh";
  std::string why;
  EXPECT_TRUE(EnsurePrivateDirectory(fresh, &why)) << why;
  EXPECT_EQ(std::filesystem::status(fresh).permissions(), std::filesystem::perms::owner_all);

  std::filesystem::create_directory(dir.path() / "open");
  chmod((dir.path() / "open").c_str(), 0755);
  std::filesystem::create_directory_symlink(fresh, dir.path() / "link");
  std::ofstream(dir.path() / "file") << "x";
  std::filesystem::create_directory(dir.path() / "foreign");
  chmod((dir.path() / "foreign").c_str(), 0700);
  std::vector<std::pair<std::string, std::string>> refused = {
      {"open", "0700"}, {"link", ""}, {"file", ""}};
  if (chown((dir.path() / "foreign").c_str(), 65534, 65534) == 0) {
    refused.emplace_back("foreign", "another user");
  }
  for (const auto& [name, reason] : refused) {
    EXPECT_FALSE(EnsurePrivateDirectory(dir.path() / name, &why)) << name;
    EXPECT_NE(why.find(reason), std::string::npos) << name << ": " << why;
  }
}

TEST(ServiceSocketPathRule, UsesRuntimeDirectoryWhenSet) {
  ScopedEnv env;
  env.Set("XDG_RUNTIME_DIR", "/run/user/1234");
  EXPECT_EQ(ServiceSocketPath(), std::filesystem::path("/run/user/1234/com.vantorel.Lumeris.FileService"));
  EXPECT_EQ(FallbackRuntimeDirectory(1234), std::filesystem::path("/tmp/lumeris-1234"));
}

}  // namespace
}  // namespace lumeris::testing
