// CliSession: what every `lumeris` subcommand shares while one command line runs: the channel
// to the service, the output streams and the global options (--json, --timeout). Commands call
// Ask() for requests that answer and Tell() for those that never do; both report a failure to
// the error stream once, in one sentence ("lumeris: <what>: <reason>"), and the command then
// ends with a non-zero status.
//
// Exit statuses of `lumeris` (every subcommand): 0 done; 1 the command could not be carried
// out (the service unreachable or silent, a write the preference file does not hold, a missing
// key); 2 a usage error (an unknown subcommand or option, an argument the command cannot use),
// refused before anything is sent.
//
// Thread-safety: one session per command line, used by one thread.
#pragma once

#include <nlohmann/json.hpp>

#include <chrono>
#include <functional>
#include <optional>
#include <ostream>
#include <string>
#include <string_view>

#include "client/cli_channel.h"
#include "service/message_value.h"

namespace lumeris::cli {

inline constexpr int kExitFailure = 1;
inline constexpr int kExitUsage = 2;

// The exit statuses as `lumeris --help` and the manual page state them.
inline constexpr char kExitStatusText[] =
    "Exit status:\n"
    "  0  done\n"
    "  1  not done: the service could not be reached or did not answer in time, a write did not\n"
    "     reach the preference file, a key or domain is missing (the message says which)\n"
    "  2  usage error: an unknown subcommand or option, or an argument the command cannot use\n"
    "     (nothing was sent)\n";

inline constexpr char kDefaultIdentifier[] = "com.vantorel.Lumeris.DefaultDataStorage";
inline constexpr char kDefaultApplication[] = "com.vantorel.lumeris-cli";

struct CliSettings {
  bool json = false;
  double timeout_seconds = 5.0;
};

class CliSession {
 public:
  CliSession(ServiceChannel& channel, std::ostream& out, std::ostream& err)
      : channel_(channel), out_(out), err_(err) {}

  CliSettings& settings() { return settings_; }
  ServiceChannel& channel() { return channel_; }
  bool json() const { return settings_.json; }
  std::ostream& out() { return out_; }
  std::ostream& err() { return err_; }

  // --timeout as a duration (at least 1 ms).
  std::chrono::milliseconds timeout() const;

  // The reply to `request`, or std::nullopt after printing "lumeris: <what>: <reason>". A request
  // too big for one message ends the command with kExitUsage before anything is sent.
  std::optional<MessageValue> Ask(std::string_view what, const MessageValue& request);
  // The same with an explicit timeout and, when `quiet`, without printing.
  std::optional<MessageValue> Ask(std::string_view what, const MessageValue& request,
                                  std::chrono::milliseconds timeout, bool quiet);
  // Sends a request that never answers and waits until the service has handled it; false after
  // printing the reason.
  bool Tell(std::string_view what, const MessageValue& request);

  // What a write leaves under `key` of the store domain: `holds` tells whether the value found
  // there (nullptr when the key is absent) is the one the write meant.
  struct StoredCheck {
    std::string key;
    std::function<bool(const plist::Value* found)> holds;
  };
  // Tell(), then reads the preference file back (when the channel can see it): kExitFailure
  // when Tell() failed, or, after printing "<what>: not stored in <file>: <likely reason>", when
  // the file does not hold what `check` expects; else 0. Warns on the error stream when the
  // service moved an unparsable file aside meanwhile.
  int TellStored(std::string_view what, const MessageValue& request, const StoredCheck& check);

  // Prints "lumeris: <message>" to the error stream.
  void Complain(std::string_view message);
  // Complain()s "<what>: <reason>" and ends the command with kExitUsage.
  [[noreturn]] void Refuse(std::string_view what, std::string_view reason);
  // Prints `json` on one line to the output stream.
  void PrintJson(const nlohmann::json& json);
  // Prints `lines` (whole lines), or `when_empty` and a newline when there are none.
  void PrintLines(std::string_view lines, std::string_view when_empty);

 private:
  ServiceChannel& channel_;
  std::ostream& out_;
  std::ostream& err_;
  CliSettings settings_;
};

// Ends the running subcommand with `status` (CLI11 turns it into the program's exit status).
[[noreturn]] void ExitWith(int status);

// A request dictionary holding "command".
MessageValue CommandRequest(std::string_view command);

}  // namespace lumeris::cli
