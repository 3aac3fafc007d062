// The runtime in-process: per-connection ordering, concurrency between connections, handler
// lifetime, failing handlers, unread replies, and the private runtime directory rule.
#include "service/server.h"

#include <grp.h>
#include <sys/stat.h>

#include <condition_variable>
#include <fstream>
#include <future>
#include <mutex>

#include "service/listener.h"
#include "service/service_handler.h"
#include "support/service_fixture.h"

namespace lumeris::testing {
namespace {

// Serves `operations` on a socket in a temporary directory, counting closed connections.
class InProcessService {
 public:
  explicit InProcessService(const ServiceOperations& operations) {
    std::optional<ServiceListener> listener = BindServiceSocket(socket_path_);
    EXPECT_TRUE(listener);
    auto serve = [this, &operations](const std::shared_ptr<ServiceConnection>& connection) {
      accepted_ = connection;
      connection->SetEventHandler([this, connection, &operations](const ConnectionEvent& event) {
        if (std::holds_alternative<ConnectionClosed>(event)) {
          std::lock_guard hold(mutex_);
          ++closed_;
          changed_.notify_all();
        }
        HandleServiceMessage(*connection, event, operations);
      });
      connection->Resume();
    };
    server_ = std::make_unique<ServiceServer>(listener->fd, serve, 2);
    server_->Start();
  }
  RawConnection Connect() { return std::move(*RawConnection::Open(socket_path_)); }
  void Stop() { server_->Stop(); }
  // True once `count` connections have been closed, within a few seconds.
  bool WaitForClosed(int count) {
    std::unique_lock hold(mutex_);
    return changed_.wait_for(hold, 5s, [&] { return closed_ >= count; });
  }

  ScopedTempDir dir_;
  const std::filesystem::path socket_path_ = dir_.path() / "socket";
  std::weak_ptr<ServiceConnection> accepted_;  // the latest connection

 private:
  std::mutex mutex_;
  std::condition_variable changed_;
  int closed_ = 0;
  std::unique_ptr<ServiceServer> server_;
};

MessageValue Info(const char* text) { return Command("search_character_info", {{"string", MessageValue::String(text)}}); }
// The "for" member of a reply's result, or "no reply".
std::string For(const std::optional<MessageValue>& reply) {
  const std::string* text = reply && reply->Find("result") ? reply->Find("result")->GetString("for") : nullptr;
  return text ? *text : "no reply";
}

// Character info that blocks on "slow" until released, and records the order of calls.
TEST(ServiceRuntime, SlowRequestDelaysItsOwnConnectionButNotAnother) {
  std::promise<void> release;
  std::shared_future<void> gate = release.get_future().share();
  std::mutex mutex;
  std::vector<std::string> log;
  auto record = [&](std::string entry) {
    std::lock_guard hold(mutex);
    log.push_back(std::move(entry));
  };
  ServiceOperations operations;
  operations.createXPCDictionaryForCharacterInfo = [&](const std::string& text) {
    record("start " + text);
    if (text == "slow") gate.wait();
    record("end " + text);
    return MessageValue::MakeDictionary({{"for", MessageValue::String(text)}});
  };
  InProcessService service(operations);
  RawConnection slow = service.Connect();
  RawConnection fast = service.Connect();

  const std::uint64_t blocked = slow.SendMessage(Info("slow"));
  const std::uint64_t queued = slow.SendMessage(Info("after"));
  // The other connection is answered while the slow request still runs.
  EXPECT_EQ(For(fast.ReadReply(fast.SendMessage(Info("fast")))), "fast");
  release.set_value();
  EXPECT_EQ(For(slow.ReadReply(blocked)), "slow");
  EXPECT_EQ(For(slow.ReadReply(queued)), "after");
  // One at a time on a connection: "after" starts only when "slow" has ended.
  auto at = [&](const char* entry) { return std::find(log.begin(), log.end(), entry) - log.begin(); };
  EXPECT_LT(at("end slow"), at("start after"));
  EXPECT_LT(at("end fast"), at("end slow"));
}

TEST(ServiceRuntime, ConnectionIsReleasedWhenThePeerClosesOrTheServerStops) {
  ServiceOperations none;
  InProcessService service(none);
  {
    RawConnection client = service.Connect();
    EXPECT_TRUE(client.ReadReply(client.SendMessage(Command("search_x"))));
  }
  ASSERT_TRUE(service.WaitForClosed(1));
  // The handler is dropped right after its ConnectionClosed event, and the connection with it.
  for (auto deadline = std::chrono::steady_clock::now() + 5s;
       !service.accepted_.expired() && std::chrono::steady_clock::now() < deadline;) {
    std::this_thread::yield();
  }
  EXPECT_TRUE(service.accepted_.expired()) << "the handler still holds the connection";

  RawConnection client = service.Connect();
  ASSERT_TRUE(client.ReadReply(client.SendMessage(Command("search_x"))));
  service.Stop();
  EXPECT_TRUE(service.accepted_.expired());
  EXPECT_TRUE(client.WaitForPeerClose());
}

// A handler that throws: its connection is closed and logged, every other one goes on.
TEST(ServiceRuntime, RequestWhoseHandlerThrowsClosesOnlyItsConnection) {
  ServiceOperations operations;
  operations.createXPCDictionaryForCharacterInfo = [](const std::string& text) {
    if (text == "throw") throw std::runtime_error("no memory");
    return MessageValue::MakeDictionary();
  };
  InProcessService service(operations);
  RawConnection failing = service.Connect();
  RawConnection other = service.Connect();
  ::testing::internal::CaptureStderr();
  failing.SendMessage(Info("throw"));
  EXPECT_TRUE(failing.WaitForPeerClose());
  const std::string log = ::testing::internal::GetCapturedStderr();
  EXPECT_NE(log.find("closing a connection after a failed request: no memory"), std::string::npos) << log;
  EXPECT_TRUE(other.ReadReply(other.SendMessage(Info("x"))));
  RawConnection later = service.Connect();
  EXPECT_TRUE(later.ReadReply(later.SendMessage(Info("x"))));
}

// Replies a client does not read are kept up to 64 MiB; beyond that its connection is closed.
TEST(ServiceRuntime, UnreadRepliesAreKeptUpTo64MebibytesThenTheConnectionIsClosed) {
  std::promise<void> marker;
  ServiceOperations operations;
  operations.createXPCDictionaryForCharacterInfo = [&](const std::string& text) {
    if (text == "marker") marker.set_value();
    return MessageValue::MakeDictionary({{"big", MessageValue::String(std::string(1 << 20, 'x'))}});
  };
  InProcessService service(operations);
  RawConnection client = service.Connect();
  std::vector<std::uint64_t> ids;
  for (int i = 0; i < 8; ++i) ids.push_back(client.SendMessage(Info("x")));
  ids.push_back(client.SendMessage(Info("marker")));
  // One connection's requests run in order: at the marker, eight replies wait unread.
  ASSERT_EQ(marker.get_future().wait_for(5s), std::future_status::ready) << "closed with 8 MiB unread";
  for (std::uint64_t id : ids) ASSERT_TRUE(client.ReadReply(id)) << "8 MiB unread closed the connection";

  for (int i = 0; i < 80; ++i) client.SendMessage(Info("x"));
  EXPECT_TRUE(service.WaitForClosed(1)) << "80 MiB unread kept the connection";
}

// A peer of another uid is closed before anything it sends is read; the own user is still served.
TEST(ServiceRuntime, PeerOfAnotherUidIsRefused) {
  if (geteuid() != 0) GTEST_SKIP() << "needs root to connect as another uid";
  ServiceOperations none;
  InProcessService service(none);
  // Let uid 65534 reach the socket, so that only the service's own check stands in its way.
  chmod(service.socket_path_.parent_path().c_str(), 0711);
  chmod(service.socket_path_.c_str(), 0666);
  const std::string request = EncodeFrame(Frame{FrameKind::kWantsReply, 1, Command("search_x")});
  const pid_t child = fork();  // the child makes system calls only
  if (child == 0) {
    if (setgroups(0, nullptr) != 0 || setresgid(65534, 65534, 65534) != 0 || setresuid(65534, 65534, 65534) != 0) _exit(2);
    const int fd = ConnectUnixSocket(service.socket_path_);
    if (fd < 0) _exit(3);
    const timeval wait{3, 0};
    setsockopt(fd, SOL_SOCKET, SO_RCVTIMEO, &wait, sizeof wait);
    [[maybe_unused]] ssize_t sent = send(fd, request.data(), request.size(), MSG_NOSIGNAL);
    char reply[64];
    const ssize_t got = recv(fd, reply, sizeof reply, 0);
    _exit(got == 0 || (got < 0 && errno == ECONNRESET) ? 0 : 1);
  }
  int status = -1;
  ASSERT_EQ(waitpid(child, &status, 0), child);
  EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0) << "answered or not closed: " << status;
  RawConnection own = service.Connect();
  EXPECT_TRUE(own.ReadReply(own.SendMessage(Command("search_x"))));
}

TEST(PrivateRuntimeDirectory, AcceptsOnlyAnOwnDirectoryOfMode0700) {
  ScopedTempDir dir;
  const std::filesystem::path fresh = dir.path() / "fresh";
  std::string why;
  EXPECT_TRUE(EnsurePrivateDirectory(fresh, &why)) << why;
  EXPECT_EQ(std::filesystem::status(fresh).permissions(), std::filesystem::perms::owner_all);

  for (const auto& [name, mode] : {std::pair{"open", 0755}, {"foreign", 0700}}) mkdir((dir.path() / name).c_str(), mode);
  chmod((dir.path() / "open").c_str(), 0755);  // whatever the umask
  std::filesystem::create_directory_symlink(fresh, dir.path() / "link");
  std::ofstream(dir.path() / "file") << "x";
  std::vector<std::pair<std::string, std::string>> refused = {{"open", "0700"}, {"link", ""}, {"file", ""}};
  if (chown((dir.path() / "foreign").c_str(), 65534, 65534) == 0) refused.emplace_back("foreign", "another user");
  for (const auto& [name, reason] : refused) {
    EXPECT_FALSE(EnsurePrivateDirectory(dir.path() / name, &why)) << name;
    EXPECT_NE(why.find(reason), std::string::npos) << name << ": " << why;
  }
}

// The socket path under XDG_RUNTIME_DIR is pinned by the socket activation test.
TEST(ServiceSocketPathRule, FallbackRuntimeDirectoryIsPerUser) {
  EXPECT_EQ(FallbackRuntimeDirectory(1234), std::filesystem::path("/tmp/lumeris-1234"));
}

}  // namespace
}  // namespace lumeris::testing
