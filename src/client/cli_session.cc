#include "client/cli_session.h"

#include <CLI/CLI.hpp>

#include <algorithm>
#include <cmath>

#include "client/cli_json_value.h"

namespace lumeris::cli {

std::chrono::milliseconds CliSession::timeout() const {
  const double millis = std::ceil(settings_.timeout_seconds * 1000.0);
  return std::chrono::milliseconds(static_cast<long long>(std::max(1.0, millis)));
}

std::optional<MessageValue> CliSession::Ask(std::string_view what, const MessageValue& request) {
  return Ask(what, request, timeout(), /*quiet=*/false);
}

std::optional<MessageValue> CliSession::Ask(std::string_view what, const MessageValue& request,
                                            std::chrono::milliseconds timeout, bool quiet) {
  std::string error;
  std::optional<MessageValue> reply = channel_.Request(request, timeout, &error);
  if (!reply && !quiet) Complain(std::string(what) + ": " + error);
  return reply;
}

bool CliSession::Tell(std::string_view what, const MessageValue& request) {
  std::string error;
  if (channel_.Send(request, timeout(), &error)) return true;
  Complain(std::string(what) + ": " + error);
  return false;
}

void CliSession::Complain(std::string_view message) { err_ << "lumeris: " << message << '\n'; }

void CliSession::PrintJson(const nlohmann::json& json) { out_ << JsonText(json, false) << '\n'; }

void CliSession::PrintLines(std::string_view lines, std::string_view when_empty) {
  if (lines.empty()) {
    out_ << when_empty << '\n';
  } else {
    out_ << lines;
  }
}

void ExitWith(int status) { throw CLI::RuntimeError(status); }

MessageValue CommandRequest(std::string_view command) {
  MessageValue request = MessageValue::MakeDictionary();
  request.Set("command", MessageValue::String(std::string(command)));
  return request;
}

}  // namespace lumeris::cli
