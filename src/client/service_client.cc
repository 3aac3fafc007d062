#include "client/service_client.h"

#include <errno.h>
#include <fcntl.h>
#include <poll.h>
#include <stdlib.h>
#include <string.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <syslog.h>
#include <systemd/sd-journal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <string_view>
#include <thread>
#include <vector>

#include "lumeris/config.h"
#include "service/socket_path.h"

namespace lumeris {

namespace {

using Clock = std::chrono::steady_clock;

constexpr char kProgramName[] = "lumeris-fileservice";

void SetError(std::string* error, std::string text) {
  if (error) *error = std::move(text);
}

int MillisecondsUntil(Clock::time_point deadline) {
  auto left = std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Clock::now());
  if (left.count() <= 0) return 0;
  return static_cast<int>(std::min<long long>(left.count(), 60'000));
}

// A connected, non-blocking, close-on-exec socket, or -1 (errno set).
int ConnectTo(const std::filesystem::path& path) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  const std::string& text = path.native();
  if (text.size() >= sizeof address.sun_path) {
    errno = ENAMETOOLONG;
    return -1;
  }
  memcpy(address.sun_path, text.c_str(), text.size() + 1);
  int fd = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
  if (fd < 0) return -1;
  int result;
  do {
    result = connect(fd, reinterpret_cast<const sockaddr*>(&address), sizeof address);
  } while (result != 0 && errno == EINTR);
  if (result != 0) {
    int saved = errno;
    close(fd);
    errno = saved;
    return -1;
  }
  fcntl(fd, F_SETFL, fcntl(fd, F_GETFL) | O_NONBLOCK);
  return fd;
}

// Holds an exclusive flock on the start lock beside the socket, so that clients starting at the
// same moment start one service between them.
class StartLock {
 public:
  StartLock(const std::filesystem::path& socket_path, Clock::time_point deadline) {
    std::filesystem::path lock_path = socket_path;
    lock_path += ".lock";
    fd_ = open(lock_path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
    if (fd_ < 0) return;
    while (flock(fd_, LOCK_EX | LOCK_NB) != 0) {
      if (errno != EWOULDBLOCK && errno != EINTR) break;
      if (Clock::now() >= deadline) break;
      std::this_thread::sleep_for(std::chrono::milliseconds(2));
    }
  }
  ~StartLock() {
    if (fd_ >= 0) close(fd_);  // closing releases the lock
  }
  StartLock(const StartLock&) = delete;
  StartLock& operator=(const StartLock&) = delete;

 private:
  int fd_ = -1;
};

bool IsExecutable(const std::filesystem::path& path) {
  std::error_code ignored;
  return std::filesystem::is_regular_file(path, ignored) && access(path.c_str(), X_OK) == 0;
}

}  // namespace

std::optional<std::filesystem::path> FindFileServiceProgram() {
  if (const char* explicit_path = getenv("LUMERIS_FILESERVICE")) {
    if (*explicit_path != '\0') return std::filesystem::path(explicit_path);
  }
  std::error_code ignored;
  std::filesystem::path self = std::filesystem::read_symlink("/proc/self/exe", ignored);
  if (!self.empty() && IsExecutable(self.parent_path() / kProgramName)) {
    return self.parent_path() / kProgramName;
  }
  std::filesystem::path installed = std::filesystem::path(config::kInstallBinDir) / kProgramName;
  if (IsExecutable(installed)) return installed;
  if (const char* path = getenv("PATH")) {
    std::string_view rest(path);
    while (!rest.empty()) {
      std::size_t colon = rest.find(':');
      std::string_view entry = rest.substr(0, colon);
      if (!entry.empty() && IsExecutable(std::filesystem::path(entry) / kProgramName)) {
        return std::filesystem::path(entry) / kProgramName;
      }
      rest = colon == std::string_view::npos ? std::string_view() : rest.substr(colon + 1);
    }
  }
  return std::nullopt;
}

std::optional<std::filesystem::path> ServiceLogFile() {
  std::filesystem::path state_home;
  if (const char* xdg = getenv("XDG_STATE_HOME"); xdg != nullptr && xdg[0] == '/') {
    state_home = xdg;
  } else if (const char* home = getenv("HOME"); home != nullptr && home[0] == '/') {
    state_home = std::filesystem::path(home) / ".local/state";
  } else {
    return std::nullopt;
  }
  return state_home / "lumeris" / "fileservice.log";
}

namespace {

// Where a service started here writes its standard error: a journal stream when the journal
// runs, else the log file (moved to "<file>.old" first once it is over kMaxServiceLogBytes),
// else /dev/null. A close-on-exec descriptor, or -1.
int OpenServiceLog() {
  const int journal = sd_journal_stream_fd(kProgramName, LOG_INFO, /*level_prefix=*/0);
  if (journal >= 0) {
    fcntl(journal, F_SETFD, FD_CLOEXEC);
    return journal;
  }
  if (std::optional<std::filesystem::path> file = ServiceLogFile()) {
    std::error_code ignored;
    std::filesystem::create_directories(file->parent_path(), ignored);
    struct stat st {};
    if (stat(file->c_str(), &st) == 0 && st.st_size > kMaxServiceLogBytes) {
      std::filesystem::rename(*file, std::filesystem::path(file->string() + ".old"), ignored);
    }
    const int fd = open(file->c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0600);
    if (fd >= 0) return fd;
  }
  return open("/dev/null", O_WRONLY | O_CLOEXEC);
}

}  // namespace

bool StartFileService(const std::filesystem::path& program, std::string* error, int* start_report) {
  // Everything the children need is prepared before fork(): after it only async-signal-safe
  // calls are made, since the caller may have other threads.
  const std::string program_text = program.string();
  const int log_fd = OpenServiceLog();
  char* const argv[] = {const_cast<char*>(program_text.c_str()), nullptr};
  // The service's start report arrives on fd 4 of the service (see ServiceMain).
  std::vector<std::string> environment;
  for (char** entry = environ; *entry != nullptr; ++entry) {
    if (std::string_view(*entry).starts_with("LUMERIS_START_REPORT_FD=")) continue;
    environment.emplace_back(*entry);
  }
  if (start_report) environment.emplace_back("LUMERIS_START_REPORT_FD=4");
  std::vector<char*> envp;
  for (std::string& entry : environment) envp.push_back(entry.data());
  envp.push_back(nullptr);
  int ready[2] = {-1, -1};
  if (start_report && pipe2(ready, O_CLOEXEC) != 0) {
    SetError(error, std::string("pipe2: ") + strerror(errno));
    if (log_fd >= 0) close(log_fd);
    return false;
  }
  const auto close_ready = [&ready] {
    for (int& fd : ready) {
      if (fd >= 0) close(fd);
      fd = -1;
    }
  };
  int report[2];
  if (pipe2(report, O_CLOEXEC) != 0) {
    SetError(error, std::string("pipe2: ") + strerror(errno));
    if (log_fd >= 0) close(log_fd);
    close_ready();
    return false;
  }
  pid_t child = fork();
  if (child < 0) {
    SetError(error, std::string("fork: ") + strerror(errno));
    close(report[0]);
    close(report[1]);
    if (log_fd >= 0) close(log_fd);
    close_ready();
    return false;
  }
  if (child == 0) {
    // The intermediate child starts a new session and leaves at once, so the service is
    // adopted by init (or the session's subreaper) and is nobody's zombie.
    setsid();
    pid_t service = fork();
    if (service != 0) _exit(service < 0 ? 1 : 0);
    close(report[0]);
    if (chdir("/") != 0) _exit(1);
    int null_fd = open("/dev/null", O_RDWR);
    if (null_fd >= 0) {
      dup2(null_fd, 0);
      dup2(null_fd, 1);
      dup2(log_fd >= 0 ? log_fd : null_fd, 2);
    }
    // Keep only the exec report pipe (as fd 3, closed by a successful exec) and the start report
    // pipe (as fd 4, kept open for the service) beside 0..2. fd 5 holds a copy first, so that
    // neither dup2 overwrites the other's source.
    const int start_copy = ready[1] >= 0 ? fcntl(ready[1], F_DUPFD_CLOEXEC, 5) : -1;
    if (report[1] != 3) {
      dup2(report[1], 3);
      fcntl(3, F_SETFD, FD_CLOEXEC);
    }
    if (start_copy >= 0) dup2(start_copy, 4);  // dup2 leaves fd 4 open across exec
    close_range(start_copy >= 0 ? 5 : 4, ~0U, 0);
    execve(argv[0], argv, envp.data());
    int failure = errno;
    ssize_t ignored = write(3, &failure, sizeof failure);
    (void)ignored;
    _exit(127);
  }
  close(report[1]);
  if (log_fd >= 0) close(log_fd);
  if (ready[1] >= 0) close(ready[1]);
  ready[1] = -1;
  int status = 0;
  while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
  }
  int failure = 0;
  ssize_t got;
  do {
    got = read(report[0], &failure, sizeof failure);
  } while (got < 0 && errno == EINTR);
  close(report[0]);
  if (got == static_cast<ssize_t>(sizeof failure)) {
    SetError(error, "cannot execute " + program_text + ": " + strerror(failure));
    close_ready();
    return false;
  }
  if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
    SetError(error, "cannot start " + program_text);
    close_ready();
    return false;
  }
  if (start_report) *start_report = ready[0];
  return true;
}

std::unique_ptr<ServiceClient> ServiceClient::Connect(const ServiceClientOptions& options,
                                                      std::string* error) {
  std::string why;
  std::optional<std::filesystem::path> path = options.socket_path;
  const bool usual_path = !path.has_value();
  if (!path) path = ServiceSocketPath(&why);
  if (!path) {
    SetError(error, "no usable socket location: " + why);
    return nullptr;
  }
  int fd = ConnectTo(*path);
  if (fd >= 0) return std::make_unique<ServiceClient>(fd, options.send_timeout);
  const int first_errno = errno;
  if (!options.start_on_demand || !usual_path) {
    SetError(error, "cannot connect to " + path->string() + ": " + strerror(first_errno));
    return nullptr;
  }

  const Clock::time_point deadline = Clock::now() + options.start_timeout;
  StartLock lock(*path, deadline);
  // Another client may have started the service while this one waited for the lock.
  fd = ConnectTo(*path);
  if (fd >= 0) return std::make_unique<ServiceClient>(fd, options.send_timeout);

  std::optional<std::filesystem::path> program = FindFileServiceProgram();
  if (!program) {
    SetError(error, std::string("nothing listens on ") + path->string() + " and " + kProgramName +
                        " was not found (set LUMERIS_FILESERVICE)");
    return nullptr;
  }
  int report_fd = -1;
  if (!StartFileService(*program, &why, &report_fd)) {
    SetError(error, why);
    return nullptr;
  }
  // Waits on the start report between connection attempts: the service's reason, or the end of
  // the pipe (it listens, or it has exited), ends the wait at once.
  std::string report;
  bool report_ended = false;
  int pause_ms = 1;
  while (true) {
    fd = ConnectTo(*path);
    const int connect_errno = errno;
    if (fd >= 0) break;
    if (report_ended || Clock::now() >= deadline) {
      errno = connect_errno;
      break;
    }
    pollfd waiting{report_fd, POLLIN, 0};
    if (poll(&waiting, 1, std::min(pause_ms, MillisecondsUntil(deadline))) > 0) {
      char buffer[512];
      const ssize_t n = read(report_fd, buffer, sizeof buffer);
      if (n > 0) report.append(buffer, static_cast<std::size_t>(n));
      if (n == 0 || (n < 0 && errno != EINTR && errno != EAGAIN)) report_ended = true;
    }
    pause_ms = std::min(pause_ms * 2, 50);
  }
  const int saved_errno = errno;
  close(report_fd);
  if (fd >= 0) return std::make_unique<ServiceClient>(fd, options.send_timeout);
  if (!report.empty()) {
    SetError(error, std::string(kProgramName) + ": " + report);
  } else if (report_ended) {
    SetError(error, "started " + program->string() + " but could not connect to " + path->string() +
                        ": it ended before listening (its log says why; see lumeris status)");
  } else {
    SetError(error, "started " + program->string() + " but could not connect to " + path->string() + ": " +
                        strerror(saved_errno));
  }
  return nullptr;
}

ServiceClient::ServiceClient(int fd, std::chrono::milliseconds send_timeout)
    : fd_(fd), send_timeout_(send_timeout) {
  fcntl(fd_, F_SETFL, fcntl(fd_, F_GETFL) | O_NONBLOCK);
}

ServiceClient::~ServiceClient() { close(fd_); }

void ServiceClient::MarkClosed(std::string reason) {
  if (!open_.exchange(false)) return;
  shutdown(fd_, SHUT_RDWR);
  std::lock_guard<std::mutex> hold(reason_mutex_);
  close_reason_ = std::move(reason);
}

std::string ServiceClient::CloseReason() const {
  std::lock_guard<std::mutex> hold(reason_mutex_);
  return close_reason_;
}

int ServiceClient::PeerProcessId() const {
  ucred peer{};
  socklen_t size = sizeof peer;
  if (getsockopt(fd_, SOL_SOCKET, SO_PEERCRED, &peer, &size) != 0 || peer.pid <= 0) return -1;
  return peer.pid;
}

bool ServiceClient::SendFrame(const Frame& frame) {
  const std::string bytes = EncodeFrame(frame);
  if (bytes.size() > kMaxFrameBytes) return false;
  std::lock_guard<std::mutex> hold(send_mutex_);
  if (!open_) return false;
  const Clock::time_point deadline = Clock::now() + send_timeout_;
  std::size_t sent = 0;
  while (sent < bytes.size()) {
    ssize_t n = send(fd_, bytes.data() + sent, bytes.size() - sent, MSG_NOSIGNAL);
    if (n > 0) {
      sent += static_cast<std::size_t>(n);
      continue;
    }
    if (n < 0 && errno == EINTR) continue;
    if (n < 0 && (errno == EAGAIN || errno == EWOULDBLOCK)) {
      pollfd waiting{fd_, POLLOUT, 0};
      int left = MillisecondsUntil(deadline);
      if (left > 0 && poll(&waiting, 1, left) >= 0) continue;
    }
    MarkClosed("the connection to the file service ended while sending");
    return false;
  }
  return true;
}

bool ServiceClient::Send(const MessageValue& message) {
  return SendFrame(Frame{FrameKind::kNoReply, next_id_++, message});
}

std::optional<std::uint64_t> ServiceClient::SendWantingReply(const MessageValue& message) {
  const std::uint64_t id = next_id_++;
  if (!SendFrame(Frame{FrameKind::kWantsReply, id, message})) return std::nullopt;
  return id;
}

void ServiceClient::ReadSome(Clock::time_point deadline) {
  pollfd waiting{fd_, POLLIN, 0};
  int ready = poll(&waiting, 1, MillisecondsUntil(deadline));
  if (ready <= 0) return;
  char buffer[64 * 1024];
  ssize_t n = recv(fd_, buffer, sizeof buffer, 0);
  if (n < 0) {
    if (errno != EAGAIN && errno != EWOULDBLOCK && errno != EINTR) {
      MarkClosed(std::string("reading from the file service failed: ") + strerror(errno));
    }
    return;
  }
  if (n == 0) {
    MarkClosed(
        "the file service closed the connection without replying (it does so for a reply over the 16 MiB one "
        "message may hold, and when it stops; its log says why: see lumeris status)");
    return;
  }
  decoder_.Feed(std::string_view(buffer, static_cast<std::size_t>(n)));
  while (std::optional<Frame> frame = decoder_.Next()) {
    if (frame->kind == FrameKind::kReply) replies_.insert_or_assign(frame->id, std::move(frame->body));
  }
  if (std::optional<FrameError> problem = decoder_.error()) {
    MarkClosed(*problem == FrameError::kTooBig
                   ? "the file service's reply is over the 16 MiB one message may hold; it was not read"
                   : "the file service sent a malformed reply (" + std::string(FrameErrorName(*problem)) + ")");
  }
}

std::optional<MessageValue> ServiceClient::WaitForReply(std::uint64_t id,
                                                        std::chrono::milliseconds timeout) {
  const Clock::time_point deadline = Clock::now() + timeout;
  std::unique_lock<std::timed_mutex> hold(receive_mutex_, deadline);
  if (!hold.owns_lock()) return std::nullopt;
  while (true) {
    auto it = replies_.find(id);
    if (it != replies_.end()) {
      MessageValue reply = std::move(it->second);
      replies_.erase(it);
      return reply;
    }
    if (!open_ || Clock::now() >= deadline) return std::nullopt;
    ReadSome(deadline);
  }
}

std::optional<MessageValue> ServiceClient::Request(const MessageValue& message,
                                                   std::chrono::milliseconds timeout) {
  std::optional<std::uint64_t> id = SendWantingReply(message);
  if (!id) return std::nullopt;
  return WaitForReply(*id, timeout);
}

}  // namespace lumeris
