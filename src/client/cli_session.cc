#include "client/cli_session.h"

#include <CLI/CLI.hpp>

#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <cstring>

#include "client/cli_json_value.h"
#include "service/wire.h"

namespace lumeris::cli {

std::chrono::milliseconds CliSession::timeout() const {
  const double millis = std::ceil(settings_.timeout_seconds * 1000.0);
  return std::chrono::milliseconds(static_cast<long long>(std::max(1.0, millis)));
}

std::optional<MessageValue> CliSession::Ask(std::string_view what, const MessageValue& request) {
  return Ask(what, request, timeout(), /*quiet=*/false);
}

namespace {

// Ends the command when `request` cannot travel as one message.
void CheckFitsOneMessage(CliSession& session, std::string_view what, const MessageValue& request) {
  const std::size_t size = EncodeFrame(Frame{FrameKind::kWantsReply, 0, request}).size();
  if (size <= kMaxFrameBytes) return;
  session.Refuse(what, "the request is " + std::to_string(size) + " bytes, over the 16 MiB one message may hold");
}

}  // namespace

std::optional<MessageValue> CliSession::Ask(std::string_view what, const MessageValue& request,
                                            std::chrono::milliseconds timeout, bool quiet) {
  CheckFitsOneMessage(*this, what, request);
  std::string error;
  std::optional<MessageValue> reply = channel_.Request(request, timeout, &error);
  if (!reply && !quiet) Complain(std::string(what) + ": " + error);
  return reply;
}

bool CliSession::Tell(std::string_view what, const MessageValue& request) {
  CheckFitsOneMessage(*this, what, request);
  std::string error;
  if (channel_.Send(request, timeout(), &error)) return true;
  Complain(std::string(what) + ": " + error);
  return false;
}

namespace {

// Why the service may have failed to write `file`, as far as this process can tell.
std::string LikelyWriteObstacle(const std::filesystem::path& file) {
  const std::filesystem::path dir = file.parent_path();
  struct stat st {};
  if (::stat(dir.c_str(), &st) == 0 && !S_ISDIR(st.st_mode)) return dir.string() + ": " + std::strerror(ENOTDIR);
  if (::access(dir.c_str(), W_OK) != 0) return dir.string() + ": " + std::strerror(errno);
  if (::access(file.c_str(), F_OK) == 0 && ::access(file.c_str(), R_OK) != 0) {
    return file.string() + ": " + std::strerror(errno);
  }
  return "it does not hold the change (the file service's log says why; another program may have "
         "written after it)";
}

}  // namespace

int CliSession::TellStored(std::string_view what, const MessageValue& request, const StoredCheck& check) {
  const std::optional<StoreFileSnapshot> before = channel_.SnapshotStoreFile();
  if (!Tell(what, request)) return kExitFailure;
  const std::optional<StoreFileSnapshot> after = channel_.SnapshotStoreFile();
  if (!after) return 0;
  for (const std::string& copy : after->corrupt_copies) {
    if (before && before->corrupt_copies.contains(copy)) continue;
    Complain("warning: " + after->path.string() + " could not be parsed; the file service moved it aside to " +
             (after->path.parent_path() / copy).string());
  }
  const plist::Value* found = nullptr;
  if (after->content) {
    auto it = after->content->find(check.key);
    found = it == after->content->end() ? nullptr : &it->second;
  }
  if (after->content && check.holds(found)) return 0;
  Complain(std::string(what) + ": not stored in " + after->path.string() + ": " +
           LikelyWriteObstacle(after->path));
  return kExitFailure;
}

void CliSession::Complain(std::string_view message) { err_ << "lumeris: " << message << '\n'; }

void CliSession::Refuse(std::string_view what, std::string_view reason) {
  Complain(std::string(what) + ": " + std::string(reason));
  ExitWith(kExitUsage);
}

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
