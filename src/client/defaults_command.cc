#include "client/defaults_command.h"

#include <cerrno>
#include <cstdlib>
#include <memory>

#include "client/property_list_json.h"
#include "platform/preference_store.h"

namespace lumeris::cli {
namespace {

constexpr int kMissing = 1;
constexpr int kBadValue = 2;
constexpr int kNotWritten = 3;

std::optional<plist::Value> ParseTypedValue(const std::string& text, const std::string& type) {
  if (type == "string") return plist::Value(text);
  if (type == "integer") {
    errno = 0;
    char* end = nullptr;
    const long long number = std::strtoll(text.c_str(), &end, 10);
    if (text.empty() || *end != '\0' || errno == ERANGE) return std::nullopt;
    return plist::Value(static_cast<std::int64_t>(number));
  }
  if (type == "real") {
    char* end = nullptr;
    const double number = std::strtod(text.c_str(), &end);
    if (text.empty() || *end != '\0') return std::nullopt;
    return plist::Value(number);
  }
  if (type == "bool") {
    if (text == "true" || text == "yes" || text == "1") return plist::Value(true);
    if (text == "false" || text == "no" || text == "0") return plist::Value(false);
    return std::nullopt;
  }
  if (type == "data") {
    std::optional<plist::Data> data = ParseHex(text);
    return data ? std::optional<plist::Value>(plist::Value(std::move(*data))) : std::nullopt;
  }
  if (type == "date") {
    std::optional<plist::Date> date = ParseIsoDate(text);
    return date ? std::optional<plist::Value>(plist::Value(*date)) : std::nullopt;
  }
  return std::nullopt;
}

std::optional<plist::Value> ParseValue(const std::string& text, const std::optional<std::string>& type) {
  if (type) return ParseTypedValue(text, *type);
  nlohmann::json json = nlohmann::json::parse(text, nullptr, /*allow_exceptions=*/false);
  if (json.is_discarded()) return plist::Value(text);
  return PropertyListFromJson(json);
}

}  // namespace

int RunDefaults(const DefaultsRequest& request, std::ostream& out, std::ostream& err) {
  PreferenceStore& store = PreferenceStore::Shared();
  const PreferencesHost host = request.current_host ? kCFPreferencesCurrentHost : kCFPreferencesAnyHost;
  if (!PreferencesFilePath(request.domain, kCFPreferencesCurrentUser, host)) {
    err << "lumeris defaults: \"" << request.domain << "\" is not a usable domain name\n";
    return kBadValue;
  }
  store.Synchronize(request.domain, kCFPreferencesCurrentUser, host);

  switch (request.action) {
    case DefaultsRequest::Action::kRead: {
      if (!request.key) {
        out << PropertyListToJson(store.CopyDomain(request.domain, kCFPreferencesCurrentUser, host)).dump(2) << "\n";
        return 0;
      }
      std::optional<plist::Value> value = store.CopyValue(*request.key, request.domain, kCFPreferencesCurrentUser, host);
      if (!value) {
        err << "lumeris defaults: no key \"" << *request.key << "\" in domain \"" << request.domain << "\"\n";
        return kMissing;
      }
      out << PropertyListToJson(*value).dump(2) << "\n";
      return 0;
    }
    case DefaultsRequest::Action::kWrite: {
      if (!request.key || !request.value) {
        err << "lumeris defaults: write needs a key and a value\n";
        return kBadValue;
      }
      std::optional<plist::Value> value = ParseValue(*request.value, request.type);
      if (!value) {
        err << "lumeris defaults: \"" << *request.value << "\" is not a valid "
            << (request.type ? *request.type : std::string("JSON")) << " value\n";
        return kBadValue;
      }
      store.SetValue(*request.key, std::move(value), request.domain, kCFPreferencesCurrentUser, host);
      break;
    }
    case DefaultsRequest::Action::kDelete: {
      std::vector<std::string> keys;
      if (request.key) {
        if (!store.CopyValue(*request.key, request.domain, kCFPreferencesCurrentUser, host)) {
          err << "lumeris defaults: no key \"" << *request.key << "\" in domain \"" << request.domain << "\"\n";
          return kMissing;
        }
        keys.push_back(*request.key);
      } else {
        keys = store.CopyKeyList(request.domain, kCFPreferencesCurrentUser, host);
        if (keys.empty()) {
          err << "lumeris defaults: domain \"" << request.domain << "\" is empty\n";
          return kMissing;
        }
      }
      for (const std::string& key : keys) store.SetValue(key, std::nullopt, request.domain, kCFPreferencesCurrentUser, host);
      break;
    }
  }
  if (!store.Synchronize(request.domain, kCFPreferencesCurrentUser, host)) {
    err << "lumeris defaults: could not write the preferences of \"" << request.domain << "\"\n";
    return kNotWritten;
  }
  return 0;
}

CLI::App* AddDefaultsCommand(CLI::App& app, std::ostream& out, std::ostream& err) {
  CLI::App* defaults = app.add_subcommand("defaults", "Read and write the preference store");
  defaults->require_subcommand(1);
  auto request = std::make_shared<DefaultsRequest>();
  defaults->add_flag("--current-host", request->current_host, "Use the host-specific preference file");

  auto run = [request, &out, &err] {
    const int status = RunDefaults(*request, out, err);
    if (status != 0) throw CLI::RuntimeError(status);
  };

  CLI::App* read = defaults->add_subcommand("read", "Print a domain, or one key of it, as JSON");
  read->add_option("domain", request->domain, "Preference domain")->required();
  read->add_option("key", request->key, "Key (the whole domain when omitted)");
  read->callback([request, run] {
    request->action = DefaultsRequest::Action::kRead;
    run();
  });

  CLI::App* write = defaults->add_subcommand(
      "write",
      "Set a key. VALUE is JSON (text that is not JSON is stored as a string); data is "
      "{\"$data\":\"<hex>\"} and a date {\"$date\":\"2024-05-01T12:00:00Z\"}. With --type, VALUE "
      "is plain text of that type.");
  write->add_option("domain", request->domain, "Preference domain")->required();
  write->add_option("key", request->key, "Key")->required();
  write->add_option("value", request->value, "Value")->required();
  write->add_option("--type", request->type,
                    "integer (123), real (1.5), bool (true/false/yes/no/1/0), string, data (hex "
                    "digits), date (ISO 8601 UTC)")
      ->check(CLI::IsMember({"integer", "real", "bool", "string", "data", "date"}));
  write->callback([request, run] {
    request->action = DefaultsRequest::Action::kWrite;
    run();
  });

  CLI::App* remove = defaults->add_subcommand("delete", "Remove a key, or every key of a domain");
  remove->add_option("domain", request->domain, "Preference domain")->required();
  remove->add_option("key", request->key, "Key (every key when omitted)");
  remove->callback([request, run] {
    request->action = DefaultsRequest::Action::kDelete;
    run();
  });
  return defaults;
}

}  // namespace lumeris::cli
