#include "picker/picker_connection.h"

#include "platform/log.h"

namespace lumeris::picker {

PickerConnection::PickerConnection(ServiceClientOptions options, MainThreadPoster post)
    : options_(std::move(options)), post_(std::move(post)) {}

PickerConnection::~PickerConnection() = default;

ServiceClient* PickerConnection::Client() {
  if (client_ && client_->IsOpen()) return client_.get();
  std::string error;
  client_ = ServiceClient::Connect(options_, &error);
  if (!client_) Log("cannot reach the character service: " + error);
  return client_.get();
}

void PickerConnection::Request(MessageValue request, ReplyHandler on_reply) {
  worker_.Post([this, request = std::move(request), on_reply = std::move(on_reply)]() mutable {
    std::optional<MessageValue> reply;
    if (ServiceClient* client = Client()) reply = client->Request(request, kReplyTimeout);
    post_([on_reply = std::move(on_reply), reply = std::move(reply)]() mutable { on_reply(std::move(reply)); });
  });
}

void PickerConnection::Send(MessageValue request) {
  worker_.Post([this, request = std::move(request)] {
    if (ServiceClient* client = Client()) client->Send(request);
  });
}

void PickerConnection::SendConfirmed(MessageValue request, std::function<void()> on_handled) {
  worker_.Post([this, request = std::move(request), on_handled = std::move(on_handled)]() mutable {
    ServiceClient* client = Client();
    if (client == nullptr || !client->Send(request)) return;
    // An unknown "search_" command is always answered, after everything sent before it.
    MessageValue probe = MessageValue::MakeDictionary();
    probe.Set("command", MessageValue::String("search_probe"));
    if (client->Request(probe, kReplyTimeout)) post_(std::move(on_handled));
  });
}

}  // namespace lumeris::picker
