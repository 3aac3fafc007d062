// The service runtime: accepts connections on a listening socket and runs their events on a
// small thread pool, one strand per connection, so the messages of one connection are handled
// one at a time in arrival order while different connections run at the same time.
//
// Each accepted peer is checked with SO_PEERCRED before anything is read: a peer whose uid
// differs from the service's is closed at once. A connection that sends a malformed frame is
// logged once and closed; nothing else is affected. A reply that would be a frame over
// kMaxFrameBytes is not sent: the connection is logged and closed instead, since every reader
// must refuse such a frame.
//
//   ServiceServer server(listener.fd, ServiceConnectionHandler);
//   server.Start();   // returns at once; the pool serves until Stop()
//
// Thread-safety: Start() and Stop() from one controlling thread. Ownership: the server owns the
// listening fd and every connection it accepted.
#pragma once

#include <cstddef>
#include <memory>

#include "service/connection.h"

namespace lumeris {

class ServiceServer {
 public:
  // Takes ownership of `listening_fd`. `threads` 0 picks a default for this machine.
  ServiceServer(int listening_fd, ConnectionHandler handler, std::size_t threads = 0);
  // Stops the server if it still runs.
  ~ServiceServer();
  ServiceServer(const ServiceServer&) = delete;
  ServiceServer& operator=(const ServiceServer&) = delete;

  // Starts accepting and serving on the pool's threads.
  void Start();
  // Stops accepting, closes every connection (their handlers are released) and joins the pool.
  void Stop();

 private:
  class Impl;
  std::unique_ptr<Impl> impl_;
};

// The service's main loop: opens the listener (systemd's socket, else its own), serves with
// `handler` until SIGTERM or SIGINT, then removes the socket file it bound (never one systemd
// handed over). Returns the process's exit status: 0 after a signal, 1 when it cannot listen.
// When LUMERIS_START_REPORT_FD names an open descriptor (set by the program that started the
// service and waits for it), the reason it cannot listen is also written there; the descriptor is
// closed once the service listens.
int ServiceMain(const ConnectionHandler& handler);

}  // namespace lumeris
