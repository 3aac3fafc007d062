// PickerConnection: the picker's one connection to the file service, used from the GTK main
// thread without ever blocking it. Requests run on a background thread (connecting first, which
// starts the service on demand); each reply is handed to a callback on the main thread through
// the poster the window supplies.
//
//   PickerConnection connection({}, post_to_main_loop);
//   connection.Request(read_request, [](std::optional<MessageValue> reply) { ... });
//   connection.Send(add_request);              // writing command: no reply
//   connection.SendConfirmed(set_request, [] { /* the service has handled it */ });
//
// Messages go out in call order on one connection, and the service handles one connection's
// messages in order, so a read sent after a write sees the write. When the connection fails,
// the next message connects again; a request that could not be answered gets std::nullopt.
//
// Thread-safety: call from the main thread. Callbacks run on the main thread, through the
// poster, which must drop them once their owner is gone. The destructor waits until the
// messages already queued are sent (so a final "save_state" is not lost).
#pragma once

#include <chrono>
#include <functional>
#include <memory>
#include <optional>

#include "client/service_client.h"
#include "picker/task_queue.h"
#include "service/message_value.h"

namespace lumeris::picker {

// Runs a callback on the main thread (e.g. through g_idle_add); callable from any thread.
using MainThreadPoster = std::function<void(std::function<void()>)>;

class PickerConnection {
 public:
  using ReplyHandler = std::function<void(std::optional<MessageValue>)>;

  PickerConnection(ServiceClientOptions options, MainThreadPoster post);
  ~PickerConnection();
  PickerConnection(const PickerConnection&) = delete;
  PickerConnection& operator=(const PickerConnection&) = delete;

  // Sends `request` wanting a reply; `on_reply` gets it, or std::nullopt when the service could
  // not be reached or did not answer within the reply timeout.
  void Request(MessageValue request, ReplyHandler on_reply);
  // Sends a writing command.
  void Send(MessageValue request);
  // Sends a writing command, then a probe on the same connection; `on_handled` runs once the
  // probe is answered, i.e. once the service has handled the command (not at all on failure).
  void SendConfirmed(MessageValue request, std::function<void()> on_handled);

  static constexpr std::chrono::milliseconds kReplyTimeout{5000};

 private:
  // The connected client, connecting first when needed; nullptr when the service is unreachable.
  // Called on the worker thread only.
  ServiceClient* Client();

  const ServiceClientOptions options_;
  const MainThreadPoster post_;
  std::unique_ptr<ServiceClient> client_;  // used on the worker thread only
  TaskQueue worker_;                       // last member: its thread stops before the others go
};

}  // namespace lumeris::picker
