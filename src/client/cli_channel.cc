#include "client/cli_channel.h"

#include <sstream>

namespace lumeris::cli {

ClientServiceChannel::ClientServiceChannel(ServiceClientOptions options)
    : options_(std::move(options)) {}

ServiceClient* ClientServiceChannel::Client(std::string* error) {
  if (client_ && client_->IsOpen()) return client_.get();
  std::string reason;
  client_ = ServiceClient::Connect(options_, &reason);
  if (!client_ && error) *error = "cannot reach the file service: " + reason;
  return client_.get();
}

std::optional<MessageValue> ClientServiceChannel::Request(const MessageValue& request,
                                                          std::chrono::milliseconds timeout,
                                                          std::string* error) {
  ServiceClient* client = Client(error);
  if (!client) return std::nullopt;
  std::optional<std::uint64_t> id = client->SendWantingReply(request);
  if (!id) {
    if (error) *error = "the connection to the file service ended while sending";
    return std::nullopt;
  }
  std::optional<MessageValue> reply = client->WaitForReply(*id, timeout);
  if (!reply && error) {
    *error = client->IsOpen()
                 ? "no reply from the file service within " + DescribeTimeout(timeout)
                 : "the file service closed the connection without replying";
  }
  return reply;
}

bool ClientServiceChannel::Send(const MessageValue& request, std::chrono::milliseconds timeout,
                                std::string* error) {
  ServiceClient* client = Client(error);
  if (!client) return false;
  if (!client->Send(request)) {
    if (error) *error = "the connection to the file service ended while sending";
    return false;
  }
  MessageValue confirmation = MessageValue::MakeDictionary();
  confirmation.Set("command", MessageValue::String("search_"));
  std::string reason;
  if (!Request(confirmation, timeout, &reason)) {
    if (error) *error = "the request was sent, but the file service did not confirm it: " + reason;
    return false;
  }
  return true;
}

std::string DescribeTimeout(std::chrono::milliseconds timeout) {
  std::ostringstream text;
  text << static_cast<double>(timeout.count()) / 1000.0 << " s";
  return text.str();
}

}  // namespace lumeris::cli
