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
class GatedOperations {
 public:
  GatedOperations() {
    operations.createXPCDictionaryForCharacterInfo = [this](const std::string& text) {
      Record("start " + text);
      if (text == "slow") gate_.wait();
      Record("end " + text);
      return MessageValue::MakeDictionary({{"for", MessageValue::String(text)}});
    };
  }
  void Release() { release_.set_value(); }
  std::vector<std::string> log() {
    std::lock_guard<std::mutex> hold(mutex_);
    return log_;
  }

  ServiceOperations operations;

 private:
  void Record(std::string entry) {
    std::lock_guard<std::mutex> hold(mutex_);
    log_.push_back(std::move(entry));
  }
  std::promise<void> release_;
  std::shared_future<void> gate_ = release_.get_future().share();
  std::mutex mutex_;
  std::vector<std::string> log_;
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

  gated.Release();
  std::optional<MessageValue> first = slow.ReadReply(blocked, 5s);
  std::optional<MessageValue> second = slow.ReadReply(queued, 5s);
  ASSERT_TRUE(first && second);
  EXPECT_EQ(*first->Find("result")->GetString("for"), "slow");
  EXPECT_EQ(*second->Find("result")->GetString("for"), "after");
  // One at a time on a connection: "after" starts only when "slow" has ended.
  std::vector<std::string> log = gated.log();
  auto position = [&](const std::string& entry) {
    return std::find(log.begin(), log.end(), entry) - log.begin();
  };
  EXPECT_LT(position("end slow"), position("start after"));
  EXPECT_LT(position("end fast"), position("end slow"));
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
  struct stat info {};
  ASSERT_EQ(stat(fresh.c_str(), &info), 0);
  EXPECT_EQ(info.st_mode & 07777, 0700u);

  const std::filesystem::path open_to_others = dir.path() / "open";
  std::filesystem::create_directory(open_to_others);
  chmod(open_to_others.c_str(), 0755);
  EXPECT_FALSE(EnsurePrivateDirectory(open_to_others, &why));
  EXPECT_NE(why.find("0700"), std::string::npos) << why;

  const std::filesystem::path link = dir.path() / "link";
  std::filesystem::create_directory_symlink(fresh, link);
  EXPECT_FALSE(EnsurePrivateDirectory(link));

  const std::filesystem::path file = dir.path() / "file";
  std::ofstream(file) << "x";
  EXPECT_FALSE(EnsurePrivateDirectory(file));

  if (geteuid() == 0) {
    const std::filesystem::path foreign = dir.path() / "foreign";
    std::filesystem::create_directory(foreign);
    chmod(foreign.c_str(), 0700);
    ASSERT_EQ(chown(foreign.c_str(), 65534, 65534), 0);
    EXPECT_FALSE(EnsurePrivateDirectory(foreign, &why));
    EXPECT_NE(why.find("another user"), std::string::npos) << why;
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
