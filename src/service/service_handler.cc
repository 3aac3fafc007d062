#include "service/service_handler.h"

#include "service/dispatch.h"

namespace lumeris {

void HandleServiceMessage(ServiceConnection& connection, const ConnectionEvent& event,
                          const ServiceOperations& operations) {
  const Frame* message = std::get_if<Frame>(&event);
  if (message == nullptr || message->kind == FrameKind::kReply) return;
  std::optional<MessageValue> reply = DispatchServiceRequest(message->body, operations);
  // A message that wants no reply has no reply context: its reply is dropped.
  if (reply && message->kind == FrameKind::kWantsReply) {
    connection.SendMessage(Frame{FrameKind::kReply, message->id, std::move(*reply)});
  }
}

ConnectionHandler MakeServiceConnectionHandler(const ServiceOperations& operations) {
  return [&operations](const std::shared_ptr<ServiceConnection>& connection) {
    // The handler holds the connection until the runtime releases it after ConnectionClosed.
    connection->SetEventHandler([connection, &operations](const ConnectionEvent& event) {
      HandleServiceMessage(*connection, event, operations);
    });
    connection->Resume();
  };
}

void ServiceConnectionHandler(const std::shared_ptr<ServiceConnection>& connection) {
  static const ConnectionHandler handler = MakeServiceConnectionHandler(InstalledServiceOperations());
  handler(connection);
}

}  // namespace lumeris
