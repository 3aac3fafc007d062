// ServiceChannel: the seam between the `lumeris` subcommands and the file service. Commands
// build request dictionaries and hand them to a channel; the program uses a channel over the
// client library (ClientServiceChannel), tests use one that records requests and answers from
// a script.
//
// Thread-safety: a channel is used by one thread (the command being run).
#pragma once

#include <chrono>
#include <filesystem>
#include <memory>
#include <optional>
#include <set>
#include <string>

#include "client/service_client.h"
#include "platform/property_list.h"
#include "service/message_value.h"

namespace lumeris::cli {

// The store's preference file as this process finds it on disk.
struct StoreFileSnapshot {
  std::filesystem::path path;
  // The file's dictionary (empty when there is no file); std::nullopt when it exists but cannot
  // be read or parsed.
  std::optional<plist::Dictionary> content;
  // Names of the "<file>.corrupt-*" copies beside it.
  std::set<std::string> corrupt_copies;
};

class ServiceChannel {
 public:
  virtual ~ServiceChannel() = default;

  // Sends `request` as a message that wants a reply and waits up to `timeout` for it. On failure
  // returns std::nullopt with a sentence for the user in `*error` (no reply in time, the
  // connection ended, the service could not be reached).
  virtual std::optional<MessageValue> Request(const MessageValue& request,
                                              std::chrono::milliseconds timeout,
                                              std::string* error) = 0;

  // Sends `request` as a message that wants no reply and returns once the service has handled
  // it, so a following command (of this or another process) sees its effect. False, with the
  // reason in `*error`, when the send fails or the service does not confirm within `timeout`.
  virtual bool Send(const MessageValue& request, std::chrono::milliseconds timeout,
                    std::string* error) = 0;

  // The store domain's file, read by this process, so that a command can check that a write the
  // service confirmed reached the disk; std::nullopt when the channel cannot see the service's
  // files (then nothing is checked).
  virtual std::optional<StoreFileSnapshot> SnapshotStoreFile() { return std::nullopt; }

  // Removes `key` from the store domain's file directly (for what no request can remove), under
  // the same lock and synchronisation as the service. False with the reason in `*error`.
  virtual bool RemoveStoreKey(const std::string& key, std::string* error) = 0;
};

// The channel over one ServiceClient connection, made on first use (starting the service on
// demand). Send() confirms with a "search_" request on the same connection: the service handles
// one connection's messages in order and always answers a search command it does not know with
// just its "transactionID", so that reply means everything sent before it was handled.
class ClientServiceChannel : public ServiceChannel {
 public:
  explicit ClientServiceChannel(ServiceClientOptions options = {});

  std::optional<MessageValue> Request(const MessageValue& request,
                                      std::chrono::milliseconds timeout,
                                      std::string* error) override;
  bool Send(const MessageValue& request, std::chrono::milliseconds timeout,
            std::string* error) override;
  // Reads the file the service uses: the same XDG paths, as the service runs as the same user.
  std::optional<StoreFileSnapshot> SnapshotStoreFile() override;
  bool RemoveStoreKey(const std::string& key, std::string* error) override;

 private:
  // The connection, connecting first when needed; nullptr with the reason in `*error`.
  ServiceClient* Client(std::string* error);

  ServiceClientOptions options_;
  std::unique_ptr<ServiceClient> client_;
};

// "2 s", "0.25 s": a timeout as a person reads it.
std::string DescribeTimeout(std::chrono::milliseconds timeout);

}  // namespace lumeris::cli
