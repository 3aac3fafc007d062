#include "client/cli_json_value.h"

#include <charconv>
#include <cmath>
#include <limits>

#include "client/cli_base64.h"

namespace lumeris::cli {
namespace {

constexpr std::string_view kUint64Escape = "$uint64";
constexpr std::string_view kInt64Escape = "$int64";
constexpr std::string_view kDoubleEscape = "$double";
constexpr std::string_view kDataEscape = "$data";
constexpr std::string_view kDictionaryEscape = "$dictionary";

// Deeper nesting than this is refused rather than risking the stack.
constexpr int kMaxDepth = 1000;

using Json = nlohmann::json;

class Converter {
 public:
  explicit Converter(std::string* error) : error_(error) {}

  std::optional<MessageValue> Convert(const Json& json, const std::string& path, int depth) {
    if (depth > kMaxDepth) return Fail(path, "nested too deeply");
    switch (json.type()) {
      case Json::value_t::null:
        return MessageValue::Null();
      case Json::value_t::boolean:
        return MessageValue::Bool(json.get<bool>());
      case Json::value_t::number_unsigned:
        return MessageValue::Uint64(json.get<std::uint64_t>());
      case Json::value_t::number_integer:
        return MessageValue::Int64(json.get<std::int64_t>());
      case Json::value_t::number_float:
        return MessageValue::Double(json.get<double>());
      case Json::value_t::string:
        return MessageValue::String(json.get<std::string>());
      case Json::value_t::array: {
        MessageValue array = MessageValue::MakeArray();
        for (std::size_t i = 0; i < json.size(); ++i) {
          std::optional<MessageValue> element =
              Convert(json[i], path + "/" + std::to_string(i), depth + 1);
          if (!element) return std::nullopt;
          array.Append(std::move(*element));
        }
        return array;
      }
      case Json::value_t::object:
        if (json.size() == 1 && json.begin().key().starts_with("$")) {
          return ConvertEscape(json.begin().key(), json.begin().value(), path, depth);
        }
        return ConvertMembers(json, path, depth);
      default:
        return Fail(path, "binary JSON values have no message form");
    }
  }

 private:
  std::optional<MessageValue> ConvertMembers(const Json& object, const std::string& path,
                                             int depth) {
    MessageValue dictionary = MessageValue::MakeDictionary();
    for (const auto& [key, member] : object.items()) {
      std::optional<MessageValue> value = Convert(member, path + "/" + key, depth + 1);
      if (!value) return std::nullopt;
      dictionary.Set(key, std::move(*value));
    }
    return dictionary;
  }

  std::optional<MessageValue> ConvertEscape(const std::string& key, const Json& value,
                                            const std::string& path, int depth) {
    const std::string where = path + "/" + key;
    if (key == kUint64Escape) {
      if (value.is_number_unsigned()) return MessageValue::Uint64(value.get<std::uint64_t>());
      std::uint64_t number = 0;
      if (value.is_string() && ParseDecimal(value.get_ref<const std::string&>(), number)) {
        return MessageValue::Uint64(number);
      }
      return Fail(where, "expects decimal text of an unsigned 64-bit integer");
    }
    if (key == kInt64Escape) {
      if (value.is_number_integer() &&
          (!value.is_number_unsigned() ||
           value.get<std::uint64_t>() <= std::uint64_t{std::numeric_limits<std::int64_t>::max()})) {
        return MessageValue::Int64(value.get<std::int64_t>());
      }
      std::int64_t number = 0;
      if (value.is_string() && ParseDecimal(value.get_ref<const std::string&>(), number)) {
        return MessageValue::Int64(number);
      }
      return Fail(where, "expects decimal text of a signed 64-bit integer");
    }
    if (key == kDoubleEscape) {
      if (value.is_number()) return MessageValue::Double(value.get<double>());
      if (value.is_string()) {
        const std::string& text = value.get_ref<const std::string&>();
        if (text == "nan") return MessageValue::Double(std::numeric_limits<double>::quiet_NaN());
        if (text == "inf") return MessageValue::Double(std::numeric_limits<double>::infinity());
        if (text == "-inf") return MessageValue::Double(-std::numeric_limits<double>::infinity());
      }
      return Fail(where, "expects a number, \"nan\", \"inf\" or \"-inf\"");
    }
    if (key == kDataEscape) {
      if (value.is_string()) {
        if (auto bytes = DecodeBase64(value.get_ref<const std::string&>())) {
          return MessageValue::Data(std::move(*bytes));
        }
      }
      return Fail(where, "expects padded base64 text");
    }
    if (key == kDictionaryEscape) {
      if (value.is_object()) return ConvertMembers(value, where, depth + 1);
      return Fail(where, "expects a JSON object");
    }
    return Fail(where, "is not a known escape ($uint64, $int64, $double, $data, $dictionary); "
                       "wrap a literal dictionary in {\"$dictionary\": ...}");
  }

  template <typename Integer>
  static bool ParseDecimal(const std::string& text, Integer& number) {
    const char* end = text.data() + text.size();
    auto [stop, status] = std::from_chars(text.data(), end, number);
    return status == std::errc() && stop == end && !text.empty();
  }

  std::optional<MessageValue> Fail(const std::string& path, std::string_view reason) {
    if (error_) *error_ = (path.empty() ? std::string("the value") : path) + " " + std::string(reason);
    return std::nullopt;
  }

  std::string* error_;
};

Json Escape(std::string_view key, Json value) {
  Json object = Json::object();
  object[std::string(key)] = std::move(value);
  return object;
}

}  // namespace

std::optional<MessageValue> MessageValueFromJson(const nlohmann::json& json, std::string* error) {
  return Converter(error).Convert(json, "", 0);
}

std::optional<MessageValue> MessageValueFromJsonText(std::string_view text, std::string* error) {
  Json json = Json::parse(text, nullptr, /*allow_exceptions=*/false);
  if (json.is_discarded()) {
    if (error) *error = "not valid JSON: " + std::string(text);
    return std::nullopt;
  }
  return MessageValueFromJson(json, error);
}

nlohmann::json JsonFromMessageValue(const MessageValue& value) {
  switch (value.kind()) {
    case MessageValue::Kind::kNull:
      return nullptr;
    case MessageValue::Kind::kBool:
      return *value.AsBool();
    case MessageValue::Kind::kUint64:
      return *value.AsUint64();
    case MessageValue::Kind::kInt64: {
      // A JSON integer that is not negative reads back as a uint64.
      const std::int64_t number = *value.AsInt64();
      if (number < 0) return number;
      return Escape(kInt64Escape, std::to_string(number));
    }
    case MessageValue::Kind::kDouble: {
      const double number = *value.AsDouble();
      if (std::isnan(number)) return Escape(kDoubleEscape, "nan");
      if (std::isinf(number)) return Escape(kDoubleEscape, number > 0 ? "inf" : "-inf");
      return number;
    }
    case MessageValue::Kind::kString:
      return *value.AsString();
    case MessageValue::Kind::kData:
      return Escape(kDataEscape, EncodeBase64(*value.AsData()));
    case MessageValue::Kind::kArray: {
      Json array = Json::array();
      for (const MessageValue& element : *value.AsArray()) {
        array.push_back(JsonFromMessageValue(element));
      }
      return array;
    }
    case MessageValue::Kind::kDictionary: {
      Json object = Json::object();
      for (const auto& [key, member] : *value.AsDictionary()) {
        object[key] = JsonFromMessageValue(member);
      }
      // A lone key beginning with "$" would read back as an escape.
      if (object.size() == 1 && object.begin().key().starts_with("$")) {
        return Escape(kDictionaryEscape, std::move(object));
      }
      return object;
    }
  }
  return nullptr;
}

std::string JsonText(const nlohmann::json& json, bool pretty) {
  return json.dump(pretty ? 2 : -1, ' ', /*ensure_ascii=*/false,
                   nlohmann::json::error_handler_t::replace);
}

}  // namespace lumeris::cli
