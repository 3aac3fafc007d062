// ServiceConnection: the service's side of one client connection, as its event handler sees it.
//
// A connection delivers events to the handler set with SetEventHandler(), once Resume() has been
// called: each received frame, in arrival order and one at a time, and finally one
// ConnectionClosed when the peer has gone or sent a malformed frame. After ConnectionClosed the
// handler is released, so a handler may keep its connection alive by capturing it.
//
// Thread-safety: events of one connection never overlap; events of different connections may run
// at the same time on different threads. SendMessage() may be called from any thread.
// Ownership: connections are shared; the runtime keeps one alive while it has work pending.
#pragma once

#include <functional>
#include <memory>
#include <variant>

#include "service/wire.h"

namespace lumeris {

// The peer closed the connection, or it was closed because of a malformed frame.
struct ConnectionClosed {};

using ConnectionEvent = std::variant<ConnectionClosed, Frame>;

class ServiceConnection {
 public:
  using EventHandler = std::function<void(const ConnectionEvent& event)>;

  virtual ~ServiceConnection() = default;

  // Installs the handler. REQUIRES: called before Resume().
  virtual void SetEventHandler(EventHandler handler) = 0;
  // Starts delivering events.
  virtual void Resume() = 0;
  // Queues `frame` for sending. Does nothing once the connection is closed.
  virtual void SendMessage(const Frame& frame) = 0;
};

// Called for each accepted connection; typically installs an event handler and resumes it.
using ConnectionHandler = std::function<void(const std::shared_ptr<ServiceConnection>& connection)>;

}  // namespace lumeris
