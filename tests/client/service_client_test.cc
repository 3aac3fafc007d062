// The client library: on-demand start (once, however many clients start together), waiting with
// timeouts, reply routing, a misbehaving peer.
#include "client/service_client.h"

#include <sys/file.h>
#include <sys/inotify.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/syscall.h>

#include <fstream>
#include <future>
#include <iterator>
#include <set>

#include "service/listener.h"
#include "support/service_fixture.h"

namespace lumeris::testing {
namespace {

std::string FileText(const std::filesystem::path& path) {
  std::ifstream in(path);
  return std::string(std::istreambuf_iterator<char>(in), {});
}

// Ends the service that a client started on `socket_path` (not this process's child) and waits
// for its end.
void StopStartedService(const std::filesystem::path& socket_path) {
  const int fd = ConnectUnixSocket(socket_path);
  ucred peer{};
  socklen_t size = sizeof peer;
  const bool found = fd >= 0 && getsockopt(fd, SOL_SOCKET, SO_PEERCRED, &peer, &size) == 0;
  if (fd >= 0) close(fd);
  if (!found || peer.pid == getpid()) return;
  pollfd ended{static_cast<int>(syscall(SYS_pidfd_open, peer.pid, 0)), POLLIN, 0};
  kill(peer.pid, SIGTERM);
  poll(&ended, 1, 5000);
  close(ended.fd);
}

class OnDemandStart : public ::testing::Test {
 protected:
  OnDemandStart() { environment_.env().Set("LUMERIS_FILESERVICE", FileServiceProgram().string()); }
  ~OnDemandStart() override { StopStartedService(socket_path_); }
  // An executable shell script at the top of the test's directory.
  std::filesystem::path Script(const std::string& name, const std::string& body) {
    const std::filesystem::path path = environment_.root() / name;
    std::ofstream(path) << "#!/bin/sh\n" << body;
    std::filesystem::permissions(path, std::filesystem::perms::owner_all);
    return path;
  }

  IsolatedUserEnvironment environment_;
  const std::filesystem::path socket_path_ = *ServiceSocketPath();
};

// The start lock holds every other client back until the first has connected to the service it
// started, so clients that find no service at the same moment start one between them.
TEST_F(OnDemandStart, ClientsStartingTogetherStartOneService) {
  const std::filesystem::path starts = environment_.root() / "starts";
  environment_.env().Set("LUMERIS_FILESERVICE",
                         Script("counting", "echo started >> '" + starts.string() + "'\nexec '" +
                                                FileServiceProgram().string() + "'\n"));
  std::vector<std::future<std::unique_ptr<ServiceClient>>> starting;
  for (int i = 0; i < 4; ++i) starting.push_back(std::async(std::launch::async, [] { return ServiceClient::Connect(); }));
  for (auto& future : starting) {
    std::unique_ptr<ServiceClient> client = future.get();
    ASSERT_TRUE(client);
    const auto reply = client->Request(Command("search_x", {{"transactionID", MessageValue::Uint64(8)}}), 2s);
    EXPECT_EQ(reply.value_or(MessageValue()).GetUint64("transactionID"), 8u);
  }
  StopStartedService(socket_path_);
  EXPECT_EQ(FileText(starts), "started\n") << "more than one service was started";
}

// A client that waited for the start lock tries to connect again before starting anything: the
// client holding the lock has brought a service up meanwhile.
TEST_F(OnDemandStart, ClientThatWaitedForTheStartLockConnectsWithoutStartingAgain) {
  environment_.env().Set("LUMERIS_FILESERVICE", (environment_.root() / "missing").string());
  const std::string lock_path = socket_path_.string() + ".lock";
  const int lock = open(lock_path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
  ASSERT_EQ(flock(lock, LOCK_EX), 0);
  const int watch = inotify_init1(IN_CLOEXEC);
  inotify_add_watch(watch, lock_path.c_str(), IN_OPEN);
  std::string error;
  auto connecting = std::async(std::launch::async, [&] { return ServiceClient::Connect({}, &error); });
  pollfd opened{watch, POLLIN, 0};
  EXPECT_EQ(poll(&opened, 1, 5000), 1) << "the client did not go for the start lock";
  std::optional<ServiceListener> started = BindServiceSocket(socket_path_);  // as the other client's start
  close(lock);
  EXPECT_TRUE(connecting.get()) << error;
  if (started) close(started->fd);
  close(watch);
}

// Without a journal, what a service started on demand writes to standard error is appended to
// the log file under XDG_STATE_HOME, which a start moves aside once it is over 256 KiB.
TEST_F(OnDemandStart, StartedServiceLogsToTheStateDirectoryWithoutAJournal) {
  if (std::filesystem::exists("/run/systemd/journal/stdout")) GTEST_SKIP() << "a journal runs here";
  const std::filesystem::path log = environment_.state_home() / "lumeris/fileservice.log";
  ASSERT_EQ(ServiceLogFile(), log);
  std::filesystem::create_directories(log.parent_path());
  std::ofstream(log) << std::string(256 * 1024 + 1, 'x');
  const std::filesystem::path done = environment_.root() / "done";
  ASSERT_EQ(mkfifo(done.c_str(), 0600), 0);
  const int finished = open(done.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC);
  std::string error;
  ASSERT_TRUE(StartFileService(Script("logging", "echo 'one line' >&2\necho > '" + done.string() + "'\n"), &error))
      << error;
  pollfd wrote{finished, POLLIN, 0};
  EXPECT_EQ(poll(&wrote, 1, 5000), 1) << "the started program never finished";
  close(finished);
  EXPECT_EQ(FileText(log), "one line\n");
  EXPECT_EQ(std::filesystem::file_size(log.string() + ".old"), 256u * 1024 + 1);
}

TEST(ClientConnectErrors, ReportWhyInsteadOfHanging) {
  IsolatedUserEnvironment environment;
  // The program to start; without a start, a missing program, one that runs but never listens.
  const std::tuple<std::string, ServiceClientOptions, const char*> cases[] = {
      {FileServiceProgram().string(), {.start_on_demand = false}, "cannot connect"},
      {(environment.root() / "missing").string(), {}, "cannot execute"},
      {"/bin/true", {.start_timeout = 200ms}, "could not connect"}};
  for (const auto& [program, options, reason] : cases) {
    environment.env().Set("LUMERIS_FILESERVICE", program);
    std::string error;
    EXPECT_FALSE(ServiceClient::Connect(options, &error));
    EXPECT_NE(error.find(reason), std::string::npos) << error;
  }
}

// LUMERIS_FILESERVICE, when set, is what the on-demand tests start.
TEST(FindFileServiceProgram, WithoutTheVariableThePathIsSearched) {
  ScopedEnv env;
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
  void SendRaw(const std::string& bytes) {
    ASSERT_EQ(send(service_fd_, bytes.data(), bytes.size(), 0), static_cast<ssize_t>(bytes.size()));
  }

  std::unique_ptr<ServiceClient> client_;
  int service_fd_;
};

TEST_F(ClientWithFakeService, SendsKindsAndFreshIdsAndRepliesReachTheirOwnWaiterOnce) {
  ASSERT_TRUE(client_->Send(Command("add")));
  const std::uint64_t a = *client_->SendWantingReply(Command("read"));
  const std::uint64_t b = *client_->SendWantingReply(Command("read"));
  FrameDecoder decoder;
  std::vector<Frame> sent;
  char buffer[4096];
  for (ssize_t n; sent.size() < 3 && (n = recv(service_fd_, buffer, sizeof buffer, 0)) > 0;) {
    decoder.Feed(std::string_view(buffer, static_cast<std::size_t>(n)));
    while (std::optional<Frame> frame = decoder.Next()) sent.push_back(std::move(*frame));
  }
  ASSERT_EQ(sent.size(), 3u);
  EXPECT_EQ(sent[0].kind, FrameKind::kNoReply);
  EXPECT_EQ(sent[1].kind, FrameKind::kWantsReply);
  EXPECT_EQ(std::set<std::uint64_t>({sent[0].id, sent[1].id, sent[2].id}).size(), 3u) << "ids are fresh";
  EXPECT_EQ((std::vector<std::uint64_t>{sent[1].id, sent[2].id}), (std::vector<std::uint64_t>{a, b}));
  EXPECT_EQ(sent[1].body, Command("read"));
  EXPECT_FALSE(client_->WaitForReply(a, 50ms));
  EXPECT_TRUE(client_->IsOpen()) << "a timeout does not end the connection";

  SendRaw(EncodeFrame(Frame{FrameKind::kReply, b, Command("b")}) + EncodeFrame(Frame{FrameKind::kReply, a, Command("a")}));
  EXPECT_EQ(client_->WaitForReply(a, 2s), Command("a"));
  EXPECT_EQ(client_->WaitForReply(b, 2s), Command("b"));
  EXPECT_FALSE(client_->WaitForReply(a, 10ms)) << "a reply is handed out once";
}

TEST_F(ClientWithFakeService, MalformedBytesOrAClosedServiceEndTheWaitAtOnce) {
  const std::uint64_t id = *client_->SendWantingReply(Command("read"));
  SendRaw("\xc1");
  const auto start = std::chrono::steady_clock::now();
  EXPECT_FALSE(client_->WaitForReply(id, 5s));
  EXPECT_LT(std::chrono::steady_clock::now() - start, 3s);
  EXPECT_FALSE(client_->IsOpen());
  EXPECT_FALSE(client_->Send(Command("add")));
}

}  // namespace
}  // namespace lumeris::testing
