// The service's request dispatch: turns one request dictionary into one call of a
// ServiceOperations member and, for the commands that answer, the reply dictionary.
//
// For every request the dispatcher first derives, in this order: the reply (an empty
// dictionary), "command", "target", "identifier" and "application". It then walks its command
// table in order and takes the first row whose literal matches the command over the row's
// compare length (strncmp semantics: a compare length equal to the literal's length is a prefix
// test, one past it an exact test). Commands that no row matches, and rows whose operation is
// not installed, do nothing and answer nothing.
//
//   std::optional<MessageValue> reply = DispatchServiceRequest(request, operations);
//   if (reply && wants_reply) Send(*reply);
//
// Knows nothing of sockets or frames. Thread-safety: reentrant; it holds no state, and
// concurrent calls meet only inside the operations.
#pragma once

#include <optional>

#include "service/message_value.h"
#include "service/service_operations.h"

namespace lumeris {

// Handles `request`. Returns the reply to send, or std::nullopt when the command sends none
// (writing and unknown commands). The reply is the caller's.
std::optional<MessageValue> DispatchServiceRequest(const MessageValue& request,
                                                   const ServiceOperations& operations);

}  // namespace lumeris
