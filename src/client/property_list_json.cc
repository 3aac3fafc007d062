#include "client/property_list_json.h"

#include <cmath>
#include <cstdio>
#include <ctime>

#include "client/cli_base64.h"
#include "client/json_notation.h"

namespace lumeris::cli {
namespace {

constexpr double kUnixSecondsAt2001 = 978307200;

}  // namespace

std::optional<plist::Data> ParseHex(std::string_view hex) { return DecodeHex(hex); }

std::optional<plist::Date> ParseIsoDate(std::string_view text) {
  int year = 0, month = 0, day = 0, hour = 0, minute = 0, consumed = 0;
  double second = 0;
  const std::string copy(text);
  if (std::sscanf(copy.c_str(), "%4d-%2d-%2dT%2d:%2d:%lfZ%n", &year, &month, &day, &hour, &minute, &second,
                  &consumed) != 6 ||
      static_cast<std::size_t>(consumed) != copy.size() || month < 1 || month > 12 || day < 1 || day > 31 ||
      hour > 23 || minute > 59 || second < 0 || second >= 61) {
    return std::nullopt;
  }
  std::tm parts{};
  parts.tm_year = year - 1900;
  parts.tm_mon = month - 1;
  parts.tm_mday = day;
  parts.tm_hour = hour;
  parts.tm_min = minute;
  const double unix_seconds = static_cast<double>(timegm(&parts)) + second;
  return plist::Date{unix_seconds - kUnixSecondsAt2001};
}

std::string FormatIsoDate(plist::Date date) {
  const double unix_seconds = date.seconds_since_2001 + kUnixSecondsAt2001;
  const double whole = std::floor(unix_seconds);
  const auto micros = static_cast<long>(std::llround((unix_seconds - whole) * 1e6));
  std::time_t t = static_cast<std::time_t>(whole) + (micros >= 1000000 ? 1 : 0);
  std::tm parts{};
  gmtime_r(&t, &parts);
  char text[64];
  std::size_t length = std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%S", &parts);
  std::string result(text, length);
  if (micros > 0 && micros < 1000000) {
    char fraction[16];
    std::snprintf(fraction, sizeof fraction, ".%06ld", micros);
    std::string f(fraction);
    while (f.back() == '0') f.pop_back();
    result += f;
  }
  return result + "Z";
}

nlohmann::json PropertyListToJson(const plist::Value& value) {
  switch (value.type()) {
    case plist::Value::Type::kString:
      return *value.AsString();
    case plist::Value::Type::kInteger:
      return *value.AsInteger();
    case plist::Value::Type::kReal:
      return DoubleJson(*value.AsReal());
    case plist::Value::Type::kBool:
      return *value.AsBool();
    case plist::Value::Type::kDate:
      return Tagged(kDateTag, FormatIsoDate(*value.AsDate()));
    case plist::Value::Type::kData:
      return BytesJson(*value.AsData());
    case plist::Value::Type::kArray: {
      nlohmann::json array = nlohmann::json::array();
      for (const plist::Value& item : *value.AsArray()) array.push_back(PropertyListToJson(item));
      return array;
    }
    case plist::Value::Type::kDictionary: {
      nlohmann::json object = nlohmann::json::object();
      for (const auto& [key, item] : *value.AsDictionary()) object[key] = PropertyListToJson(item);
      // A lone key beginning with "$" would read back as a tag.
      if (!TagOf(object).empty()) return Tagged(kDictionaryTag, std::move(object));
      return object;
    }
  }
  return nullptr;
}

namespace {

// Deeper nesting than this is refused rather than risking the stack.
constexpr int kMaxDepth = 1000;

class PropertyListReader {
 public:
  PropertyListReader(std::string* error, std::string* note) : error_(error), note_(note) {}

  std::optional<plist::Value> Read(const nlohmann::json& json, const std::string& path, int depth) {
    using Type = nlohmann::json::value_t;
    if (depth > kMaxDepth) return Fail(path, "nested too deeply");
    switch (json.type()) {
      case Type::string:
        return plist::Value(json.get<std::string>());
      case Type::number_integer:
        return plist::Value(json.get<std::int64_t>());
      case Type::number_unsigned:
        if (auto number = Int64FromTag(json)) return plist::Value(*number);
        return Fail(path, "is outside the signed 64-bit range of a property-list integer (store it as text, or "
                          "as a real with --type real)");
      case Type::number_float:
        return plist::Value(json.get<double>());
      case Type::boolean:
        return plist::Value(json.get<bool>());
      case Type::array: {
        plist::Array array;
        for (std::size_t i = 0; i < json.size(); ++i) {
          std::optional<plist::Value> item = Read(json[i], path + "/" + std::to_string(i), depth + 1);
          if (!item) return std::nullopt;
          array.push_back(std::move(*item));
        }
        return plist::Value(std::move(array));
      }
      case Type::object:
        if (const std::string_view tag = TagOf(json); !tag.empty()) {
          return ReadTagged(tag, json.begin().value(), path + "/" + std::string(tag), depth);
        }
        return ReadMembers(json, path, depth);
      case Type::null:
        return Fail(path, "is null, which has no property-list form");
      default:
        return Fail(path, "has no property-list form");
    }
  }

 private:
  std::optional<plist::Value> ReadMembers(const nlohmann::json& object, const std::string& path, int depth) {
    plist::Dictionary dictionary;
    for (const auto& [key, member] : object.items()) {
      std::optional<plist::Value> value = Read(member, path + "/" + key, depth + 1);
      if (!value) return std::nullopt;
      dictionary.insert_or_assign(key, std::move(*value));
    }
    return plist::Value(std::move(dictionary));
  }

  std::optional<plist::Value> ReadTagged(std::string_view tag, const nlohmann::json& value, const std::string& where,
                                         int depth) {
    if (IsBytesTag(tag)) {
      std::string reason;
      if (auto bytes = BytesFromTag(tag, value, &reason, note_)) return plist::Value(std::move(*bytes));
      return Fail(where, reason);
    }
    if (tag == kDateTag) {
      if (auto date = value.is_string() ? ParseIsoDate(value.get_ref<const std::string&>()) : std::nullopt) {
        return plist::Value(*date);
      }
      return Fail(where, "expects an ISO 8601 UTC date such as \"2024-05-01T12:00:00Z\"");
    }
    if (tag == kInt64Tag || tag == kUint64Tag) {
      const std::optional<std::uint64_t> unsigned_number = tag == kUint64Tag ? Uint64FromTag(value) : std::nullopt;
      const std::optional<std::int64_t> number =
          tag == kInt64Tag ? Int64FromTag(value) : unsigned_number ? Int64FromTag(*unsigned_number) : std::nullopt;
      if (number) return plist::Value(*number);
      return Fail(where, "expects an integer in the signed 64-bit range of a property-list integer");
    }
    if (tag == kDoubleTag) {
      if (auto number = DoubleFromTag(value)) return plist::Value(*number);
      return Fail(where, "expects a number, \"nan\", \"inf\" or \"-inf\"");
    }
    if (tag == kDictionaryTag) {
      if (value.is_object()) return ReadMembers(value, where, depth + 1);
      return Fail(where, "expects a JSON object");
    }
    return Fail(where, UnknownTagReason());
  }

  std::optional<plist::Value> Fail(const std::string& path, std::string_view reason) {
    if (error_) *error_ = DescribePointer(path) + " " + std::string(reason);
    return std::nullopt;
  }

  std::string* error_;
  std::string* note_;
};

}  // namespace

std::optional<plist::Value> PropertyListFromJson(const nlohmann::json& json, std::string* error, std::string* note) {
  return PropertyListReader(error, note).Read(json, "", 0);
}

std::optional<plist::Value> PropertyListFromJson(const nlohmann::json& json) {
  return PropertyListFromJson(json, nullptr, nullptr);
}

}  // namespace lumeris::cli
