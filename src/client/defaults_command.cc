#include "client/defaults_command.h"

#include <cerrno>
#include <cstdlib>
#include <memory>

#include "client/property_list_json.h"
#include "platform/preference_store.h"

namespace lumeris::cli {
namespace {

constexpr int kFailed = 1;
constexpr int kBadValue = 2;

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

// VALUE as --type or the JSON notation says; std::nullopt with the reason in `*error`.
std::optional<plist::Value> ParseValue(const std::string& text, const std::optional<std::string>& type,
                                       std::string* error, std::string* note) {
  if (type) {
    std::optional<plist::Value> value = ParseTypedValue(text, *type);
    if (!value) *error = "\"" + text + "\" is not " + (*type == "integer" ? "an " : "a ") + *type + " value";
    return value;
  }
  nlohmann::json json = nlohmann::json::parse(text, nullptr, /*allow_exceptions=*/false);
  if (json.is_discarded()) return plist::Value(text);
  std::optional<plist::Value> value = PropertyListFromJson(json, error, note);
  if (!value) *error = "\"" + text + "\": " + *error;
  return value;
}

std::string JsonOutput(const plist::Value& value, bool one_line) {
  return PropertyListToJson(value).dump(one_line ? -1 : 2, ' ', false, nlohmann::json::error_handler_t::replace);
}

}  // namespace

int RunDefaults(const DefaultsRequest& request, std::ostream& out, std::ostream& err) {
  PreferenceStore& store = PreferenceStore::Shared();
  const PreferencesHost host = request.current_host ? kCFPreferencesCurrentHost : kCFPreferencesAnyHost;
  if (!PreferencesFilePath(request.domain, kCFPreferencesCurrentUser, host)) {
    err << "lumeris: defaults: \"" << request.domain << "\" is not a usable domain name\n";
    return kBadValue;
  }
  store.Synchronize(request.domain, kCFPreferencesCurrentUser, host);

  switch (request.action) {
    case DefaultsRequest::Action::kRead: {
      if (!request.key) {
        plist::Dictionary domain = store.CopyDomain(request.domain, kCFPreferencesCurrentUser, host);
        if (domain.empty()) {
          err << "lumeris: defaults: domain \"" << request.domain << "\" is empty\n";
          return kFailed;
        }
        out << JsonOutput(plist::Value(std::move(domain)), request.json) << "\n";
        return 0;
      }
      std::optional<plist::Value> value = store.CopyValue(*request.key, request.domain, kCFPreferencesCurrentUser, host);
      if (!value) {
        err << "lumeris: defaults: no key \"" << *request.key << "\" in domain \"" << request.domain << "\"\n";
        return kFailed;
      }
      out << JsonOutput(*value, request.json) << "\n";
      return 0;
    }
    case DefaultsRequest::Action::kWrite: {
      if (!request.key || !request.value) {
        err << "lumeris: defaults: write needs a key and a value\n";
        return kBadValue;
      }
      std::string error;
      std::string note;
      std::optional<plist::Value> value = ParseValue(*request.value, request.type, &error, &note);
      if (!value) {
        err << "lumeris: defaults: " << error << "\n";
        return kBadValue;
      }
      if (!note.empty()) err << "lumeris: defaults: warning: " << note << "\n";
      store.SetValue(*request.key, std::move(value), request.domain, kCFPreferencesCurrentUser, host);
      break;
    }
    case DefaultsRequest::Action::kDelete: {
      std::vector<std::string> keys;
      if (request.key) {
        if (!store.CopyValue(*request.key, request.domain, kCFPreferencesCurrentUser, host)) {
          err << "lumeris: defaults: no key \"" << *request.key << "\" in domain \"" << request.domain << "\"\n";
          return kFailed;
        }
        keys.push_back(*request.key);
      } else {
        keys = store.CopyKeyList(request.domain, kCFPreferencesCurrentUser, host);
        if (keys.empty()) {
          err << "lumeris: defaults: domain \"" << request.domain << "\" is empty\n";
          return kFailed;
        }
      }
      for (const std::string& key : keys) store.SetValue(key, std::nullopt, request.domain, kCFPreferencesCurrentUser, host);
      break;
    }
  }
  if (!store.Synchronize(request.domain, kCFPreferencesCurrentUser, host)) {
    err << "lumeris: defaults: could not write the preferences of \"" << request.domain << "\"\n";
    return kFailed;
  }
  return 0;
}

CLI::App* AddDefaultsCommand(CLI::App& app, std::ostream& out, std::ostream& err, const bool* json) {
  CLI::App* defaults = app.add_subcommand("defaults", "Read and write the preference store directly");
  defaults->require_subcommand(1);
  auto request = std::make_shared<DefaultsRequest>();
  defaults->add_flag("--current-host", request->current_host, "use the host-specific preference file");
  defaults->footer(
      "Examples:\n"
      "  lumeris defaults read com.vantorel.Lumeris\n"
      "  lumeris defaults write com.vantorel.Lumeris version 1 --type integer");

  auto run = [request, &out, &err, json] {
    request->json = json != nullptr && *json;
    const int status = RunDefaults(*request, out, err);
    if (status != 0) throw CLI::RuntimeError(status);
  };

  CLI::App* read = defaults->add_subcommand("read", "Print a domain, or one key of it, as JSON");
  read->add_option("domain", request->domain, "preference domain")->required();
  read->add_option("key", request->key, "key (the whole domain when omitted)");
  read->footer("Example: lumeris defaults read com.vantorel.SorvendiIM VTStartAsLargeWindowTemporarily");
  read->callback([request, run] {
    request->action = DefaultsRequest::Action::kRead;
    run();
  });

  CLI::App* write = defaults->add_subcommand(
      "write",
      "Set a key. VALUE is JSON (text that is not JSON is stored as a string); data is "
      "{\"$base64\":\"AP8=\"} or {\"$hex\":\"00ff\"}, a date {\"$date\":\"2024-05-01T12:00:00Z\"}. "
      "With --type, VALUE is plain text of that type.");
  write->add_option("domain", request->domain, "preference domain")->required();
  write->add_option("key", request->key, "key")->required();
  write->add_option("value", request->value, "value")->required();
  write->footer(
      "Examples:\n"
      "  lumeris defaults write com.vantorel.Lumeris 'Favorites:com.vantorel.Lumeris.DefaultDataStorage' '[\"a\"]'\n"
      "  lumeris defaults write com.example blob '{\"$hex\":\"00ff\"}'");
  write->add_option("--type", request->type,
                    "integer (123), real (1.5), bool (true/false/yes/no/1/0), string, data (hex "
                    "digits), date (ISO 8601 UTC)")
      ->check(CLI::IsMember({"integer", "real", "bool", "string", "data", "date"}));
  write->callback([request, run] {
    request->action = DefaultsRequest::Action::kWrite;
    run();
  });

  CLI::App* remove = defaults->add_subcommand("delete", "Remove a key, or every key of a domain");
  remove->add_option("domain", request->domain, "preference domain")->required();
  remove->add_option("key", request->key, "key (every key when omitted)");
  remove->footer("Example: lumeris defaults delete com.example.app");
  remove->callback([request, run] {
    request->action = DefaultsRequest::Action::kDelete;
    run();
  });
  return defaults;
}

}  // namespace lumeris::cli
