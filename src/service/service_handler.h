// The service's connection and event handlers: what the runtime calls for each new connection
// and for each of its events.
//
// Thread-safety: HandleServiceMessage() runs once per event, never twice at the same time for one
// connection; it keeps no state of its own.
#pragma once

#include <memory>

#include "service/connection.h"
#include "service/service_operations.h"

namespace lumeris {

// Installs HandleServiceMessage, bound to `connection` and InstalledServiceOperations(), as the
// connection's event handler and resumes the connection.
void ServiceConnectionHandler(const std::shared_ptr<ServiceConnection>& connection);

// The same with other operations (tests). `operations` must outlive every connection.
ConnectionHandler MakeServiceConnectionHandler(const ServiceOperations& operations);

// Handles one event: a closed connection is ignored; a frame's body is dispatched, and a reply is
// sent (as a kind 2 frame with the message's id) only when the command has one and the message
// wanted one. A reply frame received from a client is ignored.
void HandleServiceMessage(ServiceConnection& connection, const ConnectionEvent& event,
                          const ServiceOperations& operations);

}  // namespace lumeris
