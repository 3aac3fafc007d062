// The client library: on-demand start, waiting with timeouts, reply routing, a misbehaving peer.
#include "client/service_client.h"

#include <sys/socket.h>

#include <fstream>
#include <future>
#include <iterator>
#include <set>

#include "support/service_fixture.h"

namespace lumeris::testing {
namespace {

// The pid of the process listening on `socket_path`, from the peer credentials of a connection.
pid_t ListenerPid(const std::filesystem::path& socket_path) {
  int fd = ConnectUnixSocket(socket_path);
  ucred peer{};
  socklen_t size = sizeof peer;
  if (fd < 0 || getsockopt(fd, SOL_SOCKET, SO_PEERCRED, &peer, &size) != 0) peer.pid = -1;
  if (fd >= 0) close(fd);
  return peer.pid;
}

// Stops the service that a test had the client start (it is not this process's child).
void StopStartedService(const std::filesystem::path& socket_path) {
  pid_t pid = ListenerPid(socket_path);
  if (pid <= 0) return;
  kill(pid, SIGTERM);
  for (int i = 0; i < 1000 && kill(pid, 0) == 0; ++i) std::this_thread::sleep_for(2ms);
}

class OnDemandStart : public ::testing::Test {
 protected:
  OnDemandStart() { environment_.env().Set("LUMERIS_FILESERVICE", FileServiceProgram().string()); }
  ~OnDemandStart() override { StopStartedService(*ServiceSocketPath()); }

  IsolatedUserEnvironment environment_;
};

TEST_F(OnDemandStart, ConnectStartsTheServiceWhenNothingListens) {
  std::string error;
  std::unique_ptr<ServiceClient> client = ServiceClient::Connect({}, &error);
  ASSERT_TRUE(client) << error;
  std::optional<MessageValue> reply =
      client->Request(Command("search_x", {{"transactionID", MessageValue::Uint64(8)}}), 2s);
  ASSERT_TRUE(reply);
  EXPECT_EQ(reply->GetUint64("transactionID"), 8u);
  EXPECT_NE(ListenerPid(*ServiceSocketPath()), getpid());
}

TEST_F(OnDemandStart, ClientsStartingTogetherShareOneService) {
  std::vector<std::future<std::unique_ptr<ServiceClient>>> starting;
  for (int i = 0; i < 4; ++i) {
    starting.push_back(std::async(std::launch::async, [] { return ServiceClient::Connect(); }));
  }
  std::vector<std::unique_ptr<ServiceClient>> clients;
  for (auto& future : starting) clients.push_back(future.get());
  for (auto& client : clients) {
    ASSERT_TRUE(client);
    EXPECT_TRUE(client->Request(Command("search_x"), 2s));
  }
  // A second service would have failed to bind next to the first and exited; one answers.
  EXPECT_GT(ListenerPid(*ServiceSocketPath()), 0);
}

// Without a journal, what a service started on demand writes to standard error is appended to
// the log file under XDG_STATE_HOME, which a start moves aside once it is too large.
TEST_F(OnDemandStart, StartedServiceLogsToTheStateDirectoryWithoutAJournal) {
  if (std::filesystem::exists("/run/systemd/journal/stdout")) GTEST_SKIP() << "a journal runs here";
  const std::filesystem::path log = environment_.state_home() / "lumeris/fileservice.log";
  ASSERT_EQ(ServiceLogFile(), log);
  std::filesystem::create_directories(log.parent_path());
  std::ofstream(log) << std::string(kMaxServiceLogBytes + 1, 'x');
  const std::filesystem::path program = environment_.root() / "logging-service";
  std::ofstream(program) << "#!/bin/sh\necho 'one line' >&2\n";
  std::filesystem::permissions(program, std::filesystem::perms::owner_all);
  std::string error;
  ASSERT_TRUE(StartFileService(program, &error)) << error;
  std::string text;
  for (const auto deadline = std::chrono::steady_clock::now() + 10s;
       text.find('\n') == std::string::npos && std::chrono::steady_clock::now() < deadline;
       std::this_thread::sleep_for(5ms)) {
    std::ifstream in(log);
    text.assign(std::istreambuf_iterator<char>(in), {});
  }
  EXPECT_EQ(text, "one line\n");
  EXPECT_EQ(std::filesystem::file_size(log.string() + ".old"), static_cast<std::uintmax_t>(kMaxServiceLogBytes + 1));
}

TEST(ClientConnectErrors, ReportWhyInsteadOfHanging) {
  IsolatedUserEnvironment environment;
  std::string error;
  ServiceClientOptions no_start;
  no_start.start_on_demand = false;
  EXPECT_FALSE(ServiceClient::Connect(no_start, &error));
  EXPECT_NE(error.find("cannot connect"), std::string::npos) << error;

  environment.env().Set("LUMERIS_FILESERVICE", (environment.root() / "missing").string());
  EXPECT_FALSE(ServiceClient::Connect({}, &error));
  EXPECT_NE(error.find("cannot execute"), std::string::npos) << error;

  // A program that runs but never listens: Connect gives up after the start timeout.
  environment.env().Set("LUMERIS_FILESERVICE", "/bin/true");
  ServiceClientOptions short_wait;
  short_wait.start_timeout = 200ms;
  EXPECT_FALSE(ServiceClient::Connect(short_wait, &error));
  EXPECT_NE(error.find("could not connect"), std::string::npos) << error;
}

TEST(FindFileServiceProgram, EnvironmentVariableComesFirst) {
  ScopedEnv env;
  env.Set("LUMERIS_FILESERVICE", "/opt/elsewhere/lumeris-fileservice");
  EXPECT_EQ(FindFileServiceProgram(), std::filesystem::path("/opt/elsewhere/lumeris-fileservice"));
  env.Set("LUMERIS_FILESERVICE", std::nullopt);
  env.Set("PATH", FileServiceProgram().parent_path().string());
  std::optional<std::filesystem::path> found = FindFileServiceProgram();
  ASSERT_TRUE(found);
  EXPECT_EQ(found->filename(), "lumeris-fileservice");
}

// A client on one end of a socket pair, with the test playing the service on the other.
class ClientWithFakeService : public ::testing::Test {
 protected:
  ClientWithFakeService() {
    int fds[2];
    socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, fds);
    client_ = std::make_unique<ServiceClient>(fds[0]);
    service_fd_ = fds[1];
  }
  ~ClientWithFakeService() override { close(service_fd_); }

  // The next frame the client sent.
  Frame Receive() {
    while (true) {
      if (std::optional<Frame> frame = decoder_.Next()) return *frame;
      char buffer[4096];
      ssize_t n = recv(service_fd_, buffer, sizeof buffer, 0);
      if (n <= 0) return Frame{};
      decoder_.Feed(std::string_view(buffer, static_cast<std::size_t>(n)));
    }
  }
  void Reply(std::uint64_t id, MessageValue body) {
    std::string bytes = EncodeFrame(Frame{FrameKind::kReply, id, std::move(body)});
    ASSERT_EQ(send(service_fd_, bytes.data(), bytes.size(), 0), static_cast<ssize_t>(bytes.size()));
  }

  std::unique_ptr<ServiceClient> client_;
  int service_fd_;
  FrameDecoder decoder_;
};

TEST_F(ClientWithFakeService, SendsKindsAndFreshIdsAndTimesOutWithoutAReply) {
  ASSERT_TRUE(client_->Send(Command("add")));
  std::optional<std::uint64_t> id = client_->SendWantingReply(Command("read"));
  ASSERT_TRUE(id);
  Frame first = Receive();
  Frame second = Receive();
  EXPECT_EQ(first.kind, FrameKind::kNoReply);
  EXPECT_EQ(second.kind, FrameKind::kWantsReply);
  EXPECT_EQ(second.id, *id);
  EXPECT_NE(first.id, second.id);
  EXPECT_EQ(*second.body.GetString("command"), "read");
  EXPECT_FALSE(client_->WaitForReply(*id, 50ms));
  EXPECT_TRUE(client_->IsOpen());
}

TEST_F(ClientWithFakeService, RepliesReachTheirOwnWaiterInAnyOrder) {
  std::uint64_t a = *client_->SendWantingReply(Command("read"));
  std::uint64_t b = *client_->SendWantingReply(Command("read"));
  Reply(b, MessageValue::MakeDictionary({{"n", MessageValue::String("b")}}));
  Reply(a, MessageValue::MakeDictionary({{"n", MessageValue::String("a")}}));
  std::optional<MessageValue> reply_a = client_->WaitForReply(a, 2s);
  std::optional<MessageValue> reply_b = client_->WaitForReply(b, 2s);
  ASSERT_TRUE(reply_a && reply_b);
  EXPECT_EQ(*reply_a->GetString("n"), "a");
  EXPECT_EQ(*reply_b->GetString("n"), "b");
  EXPECT_FALSE(client_->WaitForReply(a, 10ms)) << "a reply is handed out once";
}

TEST_F(ClientWithFakeService, MalformedBytesOrAClosedServiceEndTheWaitAtOnce) {
  std::uint64_t id = *client_->SendWantingReply(Command("read"));
  ASSERT_EQ(send(service_fd_, "\xc1", 1, 0), 1);
  const auto start = std::chrono::steady_clock::now();
  EXPECT_FALSE(client_->WaitForReply(id, 10s));
  EXPECT_LT(std::chrono::steady_clock::now() - start, 5s);
  EXPECT_FALSE(client_->IsOpen());
  EXPECT_FALSE(client_->Send(Command("add")));
}

}  // namespace
}  // namespace lumeris::testing
