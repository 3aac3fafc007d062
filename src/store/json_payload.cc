#include "store/json_payload.h"

#include <cmath>
#include <cstdint>
#include <limits>
#include <optional>

#include <nlohmann/json.hpp>

namespace lumeris {

namespace {

using Json = nlohmann::json;

// The property-list form of `json`, or std::nullopt when it holds a null anywhere.
std::optional<plist::Value> ValueFromJson(const Json& json) {
  switch (json.type()) {
    case Json::value_t::string:
      return plist::Value(json.get<std::string>());
    case Json::value_t::boolean:
      return plist::Value(json.get<bool>());
    case Json::value_t::number_integer:
      return plist::Value(json.get<std::int64_t>());
    case Json::value_t::number_unsigned: {
      const std::uint64_t value = json.get<std::uint64_t>();
      if (value <= static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max())) {
        return plist::Value(static_cast<std::int64_t>(value));
      }
      return plist::Value(static_cast<double>(value));
    }
    case Json::value_t::number_float:
      return plist::Value(json.get<double>());
    case Json::value_t::array: {
      plist::Array array;
      array.reserve(json.size());
      for (const Json& element : json) {
        std::optional<plist::Value> value = ValueFromJson(element);
        if (!value) return std::nullopt;
        array.push_back(std::move(*value));
      }
      return plist::Value(std::move(array));
    }
    case Json::value_t::object: {
      plist::Dictionary dictionary;
      for (const auto& [key, element] : json.items()) {
        std::optional<plist::Value> value = ValueFromJson(element);
        if (!value) return std::nullopt;
        dictionary.emplace(key, std::move(*value));
      }
      return plist::Value(std::move(dictionary));
    }
    case Json::value_t::null:
    case Json::value_t::binary:
    case Json::value_t::discarded:
      break;
  }
  return std::nullopt;
}

// The JSON form of `value`, or std::nullopt when JSON cannot express it.
std::optional<Json> JsonFromValue(const plist::Value& value) {
  switch (value.type()) {
    case plist::Value::Type::kString:
      return Json(*value.AsString());
    case plist::Value::Type::kInteger:
      return Json(*value.AsInteger());
    case plist::Value::Type::kReal:
      if (!std::isfinite(*value.AsReal())) return std::nullopt;
      return Json(*value.AsReal());
    case plist::Value::Type::kBool:
      return Json(*value.AsBool());
    case plist::Value::Type::kArray: {
      Json array = Json::array();
      for (const plist::Value& element : *value.AsArray()) {
        if (std::optional<Json> json = JsonFromValue(element)) array.push_back(std::move(*json));
      }
      return array;
    }
    case plist::Value::Type::kDictionary: {
      Json object = Json::object();
      for (const auto& [key, element] : *value.AsDictionary()) {
        if (std::optional<Json> json = JsonFromValue(element)) object[key] = std::move(*json);
      }
      return object;
    }
    case plist::Value::Type::kDate:
    case plist::Value::Type::kData:
      break;
  }
  return std::nullopt;
}

}  // namespace

JsonPayload ParseJsonPayload(std::string_view text) {
  const Json parsed = Json::parse(text, nullptr, /*allow_exceptions=*/false);
  if (parsed.is_discarded()) return {};
  if (!parsed.is_object()) return {JsonPayload::Status::kUnstorable, {}};
  std::optional<plist::Value> value = ValueFromJson(parsed);
  if (!value) return {JsonPayload::Status::kUnstorable, {}};
  return {JsonPayload::Status::kObject, std::move(*value->AsDictionary())};
}

std::string JsonFromDictionary(const plist::Dictionary& dictionary) {
  Json object = Json::object();
  for (const auto& [key, element] : dictionary) {
    if (std::optional<Json> json = JsonFromValue(element)) object[key] = std::move(*json);
  }
  return object.dump(-1, ' ', /*ensure_ascii=*/false, Json::error_handler_t::replace);
}

}  // namespace lumeris
