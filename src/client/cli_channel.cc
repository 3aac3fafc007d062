#include "client/cli_channel.h"

#include <sstream>

#include "platform/preference_store.h"
#include "platform/preferences_paths.h"
#include "platform/property_list_io.h"

namespace lumeris::cli {
namespace {

// The user data store's preference domain.
constexpr char kStoreDomainName[] = "com.vantorel.Lumeris";

}  // namespace

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
    *error = client->IsOpen() ? "no reply from the file service within " + DescribeTimeout(timeout)
                              : client->CloseReason();
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

std::optional<StoreFileSnapshot> ClientServiceChannel::SnapshotStoreFile() {
  std::optional<std::filesystem::path> path =
      PreferencesFilePath(kStoreDomainName, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
  if (!path) return std::nullopt;
  StoreFileSnapshot snapshot{*path, plist::Dictionary(), {}};
  std::error_code error;
  if (std::filesystem::exists(*path, error)) {
    std::optional<plist::Value> file = plist::ReadPropertyListFile(*path);
    plist::Dictionary* content = file ? file->AsDictionary() : nullptr;
    snapshot.content = content ? std::optional<plist::Dictionary>(std::move(*content)) : std::nullopt;
  }
  const std::string prefix = path->filename().string() + ".corrupt-";
  for (std::filesystem::directory_iterator it(path->parent_path(), error), end; !error && it != end;
       it.increment(error)) {
    std::string name = it->path().filename().string();
    if (name.compare(0, prefix.size(), prefix) == 0) snapshot.corrupt_copies.insert(std::move(name));
  }
  return snapshot;
}

bool ClientServiceChannel::RemoveStoreKey(const std::string& key, std::string* error) {
  PreferenceStore& store = PreferenceStore::Shared();
  store.SetValue(key, std::nullopt, kStoreDomainName, kCFPreferencesCurrentUser, kCFPreferencesAnyHost);
  if (store.Synchronize(kStoreDomainName, kCFPreferencesCurrentUser, kCFPreferencesAnyHost)) return true;
  if (error) *error = "cannot write the preferences of " + std::string(kStoreDomainName);
  return false;
}

std::string DescribeTimeout(std::chrono::milliseconds timeout) {
  std::ostringstream text;
  text << static_cast<double>(timeout.count()) / 1000.0 << " s";
  return text.str();
}

}  // namespace lumeris::cli
