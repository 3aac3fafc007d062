#include "client/property_list_json.h"

#include <cmath>
#include <cstdio>
#include <ctime>

namespace lumeris::cli {
namespace {

constexpr double kUnixSecondsAt2001 = 978307200;
constexpr char kDataTag[] = "$data";
constexpr char kDateTag[] = "$date";

std::string ToHex(const plist::Data& data) {
  static constexpr char kDigits[] = "0123456789abcdef";
  std::string hex;
  hex.reserve(data.size() * 2);
  for (std::uint8_t byte : data) {
    hex.push_back(kDigits[byte >> 4]);
    hex.push_back(kDigits[byte & 0xf]);
  }
  return hex;
}

int HexDigit(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  if (c >= 'a' && c <= 'f') return c - 'a' + 10;
  if (c >= 'A' && c <= 'F') return c - 'A' + 10;
  return -1;
}

}  // namespace

std::optional<plist::Data> ParseHex(std::string_view hex) {
  if (hex.size() % 2 != 0) return std::nullopt;
  plist::Data data;
  for (std::size_t i = 0; i < hex.size(); i += 2) {
    const int high = HexDigit(hex[i]);
    const int low = HexDigit(hex[i + 1]);
    if (high < 0 || low < 0) return std::nullopt;
    data.push_back(static_cast<std::uint8_t>(high * 16 + low));
  }
  return data;
}

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
      return *value.AsReal();
    case plist::Value::Type::kBool:
      return *value.AsBool();
    case plist::Value::Type::kDate:
      return nlohmann::json{{kDateTag, FormatIsoDate(*value.AsDate())}};
    case plist::Value::Type::kData:
      return nlohmann::json{{kDataTag, ToHex(*value.AsData())}};
    case plist::Value::Type::kArray: {
      nlohmann::json array = nlohmann::json::array();
      for (const plist::Value& item : *value.AsArray()) array.push_back(PropertyListToJson(item));
      return array;
    }
    case plist::Value::Type::kDictionary: {
      nlohmann::json object = nlohmann::json::object();
      for (const auto& [key, item] : *value.AsDictionary()) object[key] = PropertyListToJson(item);
      return object;
    }
  }
  return nullptr;
}

std::optional<plist::Value> PropertyListFromJson(const nlohmann::json& json) {
  switch (json.type()) {
    case nlohmann::json::value_t::string:
      return plist::Value(json.get<std::string>());
    case nlohmann::json::value_t::number_integer:
      return plist::Value(json.get<std::int64_t>());
    case nlohmann::json::value_t::number_unsigned: {
      const auto unsigned_value = json.get<std::uint64_t>();
      if (unsigned_value > static_cast<std::uint64_t>(INT64_MAX)) return std::nullopt;
      return plist::Value(static_cast<std::int64_t>(unsigned_value));
    }
    case nlohmann::json::value_t::number_float:
      return plist::Value(json.get<double>());
    case nlohmann::json::value_t::boolean:
      return plist::Value(json.get<bool>());
    case nlohmann::json::value_t::array: {
      plist::Array array;
      for (const nlohmann::json& item : json) {
        std::optional<plist::Value> converted = PropertyListFromJson(item);
        if (!converted) return std::nullopt;
        array.push_back(std::move(*converted));
      }
      return plist::Value(std::move(array));
    }
    case nlohmann::json::value_t::object: {
      if (json.size() == 1 && json.begin()->is_string()) {
        const std::string& tag = json.begin().key();
        const std::string text = json.begin()->get<std::string>();
        if (tag == kDataTag) {
          std::optional<plist::Data> data = ParseHex(text);
          return data ? std::optional<plist::Value>(plist::Value(std::move(*data))) : std::nullopt;
        }
        if (tag == kDateTag) {
          std::optional<plist::Date> date = ParseIsoDate(text);
          return date ? std::optional<plist::Value>(plist::Value(*date)) : std::nullopt;
        }
      }
      plist::Dictionary dictionary;
      for (auto it = json.begin(); it != json.end(); ++it) {
        std::optional<plist::Value> converted = PropertyListFromJson(it.value());
        if (!converted) return std::nullopt;
        dictionary.insert_or_assign(it.key(), std::move(*converted));
      }
      return plist::Value(std::move(dictionary));
    }
    default:  // null, binary, discarded
      return std::nullopt;
  }
}

}  // namespace lumeris::cli
