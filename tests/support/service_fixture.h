// End-to-end helpers for tests that talk to the real `lumeris-fileservice` over its socket.
//
// ServiceProcess starts the program (LUMERIS_FILESERVICE, else the path the build compiled in) in
// the test's environment and stops it with a signal. RawConnection is a plain blocking socket client
// that speaks the wire itself, so tests exercise the bytes other clients send. ServiceTest is a
// fixture with an isolated user environment and a running service. Link the CMake target
// `lumeris_service_fixture` to get the program built and its path defined.
// Not thread-safe: each object belongs to one thread.
#pragma once

#include <errno.h>
#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <string.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <filesystem>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <thread>
#include <utility>
#include <vector>

#include "service/message_value.h"
#include "service/socket_path.h"
#include "service/wire.h"
#include "support/scoped_env.h"

extern char** environ;

namespace lumeris::testing {

using namespace std::chrono_literals;

inline std::filesystem::path FileServiceProgram() {
  if (const char* path = getenv("LUMERIS_FILESERVICE"); path && *path) return path;
  return LUMERIS_TEST_FILESERVICE;
}

// A Unix stream socket connected to `path`, or -1. The caller owns the descriptor.
inline int ConnectUnixSocket(const std::filesystem::path& path) {
  int fd = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  strncpy(address.sun_path, path.c_str(), sizeof address.sun_path - 1);
  if (connect(fd, reinterpret_cast<sockaddr*>(&address), sizeof address) == 0) return fd;
  close(fd);
  return -1;
}

// A request dictionary with "command" and further keys.
inline MessageValue Command(std::string command,
                            std::vector<std::pair<std::string, MessageValue>> more = {}) {
  MessageValue request = MessageValue::MakeDictionary({{"command", MessageValue::String(std::move(command))}});
  for (auto& [key, value] : more) request.Set(key, std::move(value));
  return request;
}

class RawConnection {
 public:
  static std::optional<RawConnection> Open(const std::filesystem::path& path) {
    const int fd = ConnectUnixSocket(path);
    return fd < 0 ? std::nullopt : std::optional(RawConnection(fd));
  }
  RawConnection(RawConnection&& other) noexcept
      : fd_(std::exchange(other.fd_, -1)), next_id_(other.next_id_) {}
  RawConnection& operator=(RawConnection&&) = delete;
  ~RawConnection() { if (fd_ >= 0) close(fd_); }

  // Writes all of `bytes`; false when the peer has gone.
  bool SendBytes(std::string_view bytes) {
    while (!bytes.empty()) {
      ssize_t n = send(fd_, bytes.data(), bytes.size(), MSG_NOSIGNAL);
      if (n < 0 && errno == EINTR) continue;
      if (n <= 0) return false;
      bytes.remove_prefix(static_cast<std::size_t>(n));
    }
    return true;
  }
  // Sends `body` with the given kind; returns the id used.
  std::uint64_t SendMessage(const MessageValue& body, FrameKind kind = FrameKind::kWantsReply) {
    const std::uint64_t id = next_id_++;
    SendBytes(EncodeFrame(Frame{kind, id, body}));
    return id;
  }
  void CloseWriting() { shutdown(fd_, SHUT_WR); }

  // The next frame, or std::nullopt after `timeout` or when the peer closed.
  std::optional<Frame> ReadFrame(std::chrono::milliseconds timeout = 2s) {
    const auto deadline = std::chrono::steady_clock::now() + timeout;
    while (true) {
      if (std::optional<Frame> frame = decoder_.Next()) return frame;
      if (peer_closed_ || decoder_.error() || !ReadSome(deadline)) return std::nullopt;
    }
  }
  // The body of the next frame, which must be the reply to `id`.
  std::optional<MessageValue> ReadReply(std::uint64_t id, std::chrono::milliseconds timeout = 2s) {
    std::optional<Frame> frame = ReadFrame(timeout);
    if (!frame || frame->kind != FrameKind::kReply || frame->id != id) return std::nullopt;
    return std::move(frame->body);
  }
  // True when the peer closes the connection within `timeout` (bytes it sends first are read).
  bool WaitForPeerClose(std::chrono::milliseconds timeout = 3s) {
    for (const auto deadline = std::chrono::steady_clock::now() + timeout; !peer_closed_;) {
      if (!ReadSome(deadline)) return false;
    }
    return true;
  }

 private:
  explicit RawConnection(int fd) : fd_(fd) {}

  // Reads what is there into the decoder (or notes the peer's close); false on timeout.
  bool ReadSome(std::chrono::steady_clock::time_point deadline) {
    const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(
        deadline - std::chrono::steady_clock::now());
    pollfd waiting{fd_, POLLIN, 0};
    if (left.count() <= 0 || poll(&waiting, 1, static_cast<int>(left.count())) <= 0) return false;
    char buffer[65536];
    const ssize_t n = recv(fd_, buffer, sizeof buffer, 0);
    peer_closed_ = n <= 0;
    if (n > 0) decoder_.Feed(std::string_view(buffer, static_cast<std::size_t>(n)));
    return true;
  }

  int fd_;
  std::uint64_t next_id_ = 1;
  FrameDecoder decoder_;
  bool peer_closed_ = false;
};

class ServiceProcess {
 public:
  ServiceProcess() = default;
  ServiceProcess(const ServiceProcess&) = delete;
  ServiceProcess& operator=(const ServiceProcess&) = delete;
  ~ServiceProcess() { Stop(); }

  // Starts `argv` (the service program by default) and waits until `socket` accepts connections.
  bool Start(const std::filesystem::path& socket, std::vector<std::string> argv = {}) {
    if (argv.empty()) argv.push_back(FileServiceProgram().string());
    std::vector<char*> args;
    for (std::string& arg : argv) args.push_back(arg.data());
    args.push_back(nullptr);
    if (posix_spawnp(&pid_, args[0], nullptr, nullptr, args.data(), environ) != 0) {
      pid_ = -1;
      return false;
    }
    for (const auto deadline = std::chrono::steady_clock::now() + 5s;
         std::chrono::steady_clock::now() < deadline && !Exited();
         std::this_thread::sleep_for(2ms)) {
      if (RawConnection::Open(socket)) return true;
    }
    return false;
  }

  // True when the process has ended (reaping it).
  bool Exited() {
    if (pid_ > 0 && waitpid(pid_, &status_, WNOHANG) == pid_) pid_ = -1;
    return pid_ <= 0;
  }

  // Sends `signal_number`, waits for the end (SIGKILL after 5 s) and returns the wait status.
  int Stop(int signal_number = SIGTERM) {
    if (pid_ > 0) kill(pid_, signal_number);
    for (const auto deadline = std::chrono::steady_clock::now() + 5s; !Exited();
         std::this_thread::sleep_for(2ms)) {
      if (std::chrono::steady_clock::now() > deadline) kill(pid_, SIGKILL);
    }
    return status_;
  }

 private:
  pid_t pid_ = -1;
  int status_ = 0;
};

class ServiceTest : public ::testing::Test {
 protected:
  void SetUp() override {
    socket_path_ = ServiceSocketPath().value();
    ASSERT_TRUE(service_.Start(socket_path_)) << "cannot start " << FileServiceProgram();
  }

  RawConnection Connect() {
    std::optional<RawConnection> connection = RawConnection::Open(socket_path_);
    if (!connection) throw std::runtime_error("cannot connect to " + socket_path_.string());
    return std::move(*connection);
  }

  // Sends `request` wanting a reply on a new connection; returns the reply body.
  std::optional<MessageValue> sendRequest(const MessageValue& request,
                                          std::chrono::milliseconds timeout = 2s) {
    RawConnection connection = Connect();
    return connection.ReadReply(connection.SendMessage(request), timeout);
  }

  IsolatedUserEnvironment environment_;
  std::filesystem::path socket_path_;
  ServiceProcess service_;
};

}  // namespace lumeris::testing
