// ServiceClient: one connection to the file service, for programs and tests that talk to it.
//
//   std::string error;
//   std::unique_ptr<ServiceClient> client = ServiceClient::Connect({}, &error);
//   if (!client) { Report(error); return; }
//   MessageValue request = MessageValue::MakeDictionary();
//   request.Set("command", MessageValue::String("read"));
//   request.Set("target", MessageValue::String("recents"));
//   std::optional<MessageValue> reply = client->Request(request, std::chrono::seconds(2));
//   if (!reply) { /* no reply in time, or the connection ended: see IsOpen() */ }
//
// Connect() finds the socket as the service does ($XDG_RUNTIME_DIR, else /tmp/lumeris-<uid>).
// When nothing listens there it starts `lumeris-fileservice` itself, detached in its own session,
// at most one starter at a time (an exclusive lock on "<socket>.lock" beside the socket), and
// retries until it connects or the start timeout passes. The started service reports through a
// pipe (LUMERIS_START_REPORT_FD) why it cannot listen, so that failure is told at once, in the
// service's own words, instead of after the timeout. The program is found through the
// environment variable LUMERIS_FILESERVICE, else next to the running executable, else in the
// installation's bin directory, else on PATH.
//
// Commands that never answer ("set", "add", "set_skintone", "save_state", unknown ones) should
// be sent with Send(); waiting for their reply only runs into the timeout.
//
// Thread-safety: every member may be called from several threads at once. Sends are
// serialised; one thread reads the socket at a time, and a reply that arrives for another
// waiter is kept for it. No call blocks longer than its timeout (sends: the send timeout).
#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <filesystem>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <unordered_map>

#include "service/message_value.h"
#include "service/wire.h"

namespace lumeris {

struct ServiceClientOptions {
  // The socket to connect to; the service's usual path when unset.
  std::optional<std::filesystem::path> socket_path;
  // Start the service when nothing listens (only for the usual path, which the started service
  // binds).
  bool start_on_demand = true;
  // How long Connect() keeps trying after starting the service.
  std::chrono::milliseconds start_timeout{5000};
  // How long a send may wait for room in the socket before the connection is given up.
  std::chrono::milliseconds send_timeout{5000};
};

class ServiceClient {
 public:
  // A connected client, or nullptr with the reason in `*error` (when given).
  static std::unique_ptr<ServiceClient> Connect(const ServiceClientOptions& options = {},
                                                std::string* error = nullptr);

  // Takes ownership of `fd`, an already connected stream socket (tests use socketpair()).
  explicit ServiceClient(int fd, std::chrono::milliseconds send_timeout = std::chrono::seconds(5));
  ~ServiceClient();
  ServiceClient(const ServiceClient&) = delete;
  ServiceClient& operator=(const ServiceClient&) = delete;

  // Sends `message` (a dictionary) as a message that wants no reply. False when the connection
  // is gone or the send timed out (the connection is then closed), or when the message would be
  // a frame over kMaxFrameBytes (it is not sent; the connection stays open).
  bool Send(const MessageValue& message);
  // Sends `message` as a message that wants a reply; returns its id, or std::nullopt as Send().
  std::optional<std::uint64_t> SendWantingReply(const MessageValue& message);
  // The reply to the message with `id`, or std::nullopt when none arrives within `timeout` or
  // the connection ends first. A reply is handed out once.
  std::optional<MessageValue> WaitForReply(std::uint64_t id, std::chrono::milliseconds timeout);
  // SendWantingReply() followed by WaitForReply().
  std::optional<MessageValue> Request(const MessageValue& message,
                                      std::chrono::milliseconds timeout);

  // False once the service closed the connection, sent malformed bytes or a send failed.
  bool IsOpen() const { return open_.load(); }
  // Why the connection ended, as a sentence for the user; empty while it is open.
  std::string CloseReason() const;
  // The process id of the service at the other end (SO_PEERCRED), or -1.
  int PeerProcessId() const;

 private:
  bool SendFrame(const Frame& frame);
  // Reads what the socket has, waiting until `deadline`; stores replies. REQUIRES: receive_mutex_.
  void ReadSome(std::chrono::steady_clock::time_point deadline);
  void MarkClosed(std::string reason);

  const int fd_;
  const std::chrono::milliseconds send_timeout_;
  std::atomic<bool> open_{true};
  std::atomic<std::uint64_t> next_id_{1};

  mutable std::mutex reason_mutex_;  // guards close_reason_
  std::string close_reason_;

  std::mutex send_mutex_;  // guards writes to fd_

  std::timed_mutex receive_mutex_;  // guards reads from fd_ and the two members below
  FrameDecoder decoder_;
  std::unordered_map<std::uint64_t, MessageValue> replies_;
};

// The `lumeris-fileservice` program to start, found as described above, or std::nullopt.
std::optional<std::filesystem::path> FindFileServiceProgram();

// The log file of a service started on demand when no systemd journal runs:
// "$XDG_STATE_HOME/lumeris/fileservice.log" ($XDG_STATE_HOME defaults to ~/.local/state); kept
// under kMaxServiceLogBytes by moving it to "fileservice.log.old" before a start finds it larger.
std::optional<std::filesystem::path> ServiceLogFile();
inline constexpr long kMaxServiceLogBytes = 256 * 1024;

// Starts `program` detached: in a new session, with standard input and output on /dev/null,
// standard error on the systemd journal when it runs (else on ServiceLogFile()), inheriting the
// environment, and not a child of this process. False, with the reason in `*error`, when it
// could not be executed. With `report`, `*report` receives the read end of the start-report
// pipe (close-on-exec, owned by the caller): the service writes there why it cannot listen, and
// the pipe ends (end of file) once it listens or exits.
bool StartFileService(const std::filesystem::path& program, std::string* error = nullptr, int* report = nullptr);

}  // namespace lumeris
