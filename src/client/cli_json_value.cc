#include "client/cli_json_value.h"

#include "client/json_notation.h"

namespace lumeris::cli {
namespace {

// Deeper nesting than this is refused rather than risking the stack.
constexpr int kMaxDepth = 1000;

using Json = nlohmann::json;

class Converter {
 public:
  Converter(std::string* error, std::string* note) : error_(error), note_(note) {}

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
          std::optional<MessageValue> element = Convert(json[i], path + "/" + std::to_string(i), depth + 1);
          if (!element) return std::nullopt;
          array.Append(std::move(*element));
        }
        return array;
      }
      case Json::value_t::object:
        if (const std::string_view tag = TagOf(json); !tag.empty()) {
          return ConvertTagged(tag, json.begin().value(), path + "/" + std::string(tag), depth);
        }
        return ConvertMembers(json, path, depth);
      default:
        return Fail(path, "binary JSON values have no message form");
    }
  }

 private:
  std::optional<MessageValue> ConvertMembers(const Json& object, const std::string& path, int depth) {
    MessageValue dictionary = MessageValue::MakeDictionary();
    for (const auto& [key, member] : object.items()) {
      std::optional<MessageValue> value = Convert(member, path + "/" + key, depth + 1);
      if (!value) return std::nullopt;
      dictionary.Set(key, std::move(*value));
    }
    return dictionary;
  }

  std::optional<MessageValue> ConvertTagged(std::string_view tag, const Json& value, const std::string& where,
                                            int depth) {
    if (tag == kUint64Tag) {
      if (auto number = Uint64FromTag(value)) return MessageValue::Uint64(*number);
      return Fail(where, "expects decimal text of an unsigned 64-bit integer");
    }
    if (tag == kInt64Tag) {
      if (auto number = Int64FromTag(value)) return MessageValue::Int64(*number);
      return Fail(where, "expects decimal text of a signed 64-bit integer");
    }
    if (tag == kDoubleTag) {
      if (auto number = DoubleFromTag(value)) return MessageValue::Double(*number);
      return Fail(where, "expects a number, \"nan\", \"inf\" or \"-inf\"");
    }
    if (IsBytesTag(tag)) {
      std::string reason;
      if (auto bytes = BytesFromTag(tag, value, &reason, note_)) return MessageValue::Data(std::move(*bytes));
      return Fail(where, reason);
    }
    if (tag == kDictionaryTag) {
      if (value.is_object()) return ConvertMembers(value, where, depth + 1);
      return Fail(where, "expects a JSON object");
    }
    if (tag == kDateTag) return Fail(where, "a date has no message form");
    return Fail(where, UnknownTagReason());
  }

  std::optional<MessageValue> Fail(const std::string& path, std::string_view reason) {
    if (error_) *error_ = DescribePointer(path) + " " + std::string(reason);
    return std::nullopt;
  }

  std::string* error_;
  std::string* note_;
};

}  // namespace

std::optional<MessageValue> MessageValueFromJson(const nlohmann::json& json, std::string* error, std::string* note) {
  return Converter(error, note).Convert(json, "", 0);
}

std::optional<MessageValue> MessageValueFromJsonText(std::string_view text, std::string* error, std::string* note) {
  Json json = Json::parse(text, nullptr, /*allow_exceptions=*/false);
  if (json.is_discarded()) {
    if (error) *error = "not valid JSON: " + std::string(text);
    return std::nullopt;
  }
  return MessageValueFromJson(json, error, note);
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
      return Tagged(kInt64Tag, std::to_string(number));
    }
    case MessageValue::Kind::kDouble:
      return DoubleJson(*value.AsDouble());
    case MessageValue::Kind::kString:
      return *value.AsString();
    case MessageValue::Kind::kData:
      return BytesJson(*value.AsData());
    case MessageValue::Kind::kArray: {
      Json array = Json::array();
      for (const MessageValue& element : *value.AsArray()) array.push_back(JsonFromMessageValue(element));
      return array;
    }
    case MessageValue::Kind::kDictionary: {
      Json object = Json::object();
      for (const auto& [key, member] : *value.AsDictionary()) object[key] = JsonFromMessageValue(member);
      // A lone key beginning with "$" would read back as a tag.
      if (!TagOf(object).empty()) return Tagged(kDictionaryTag, std::move(object));
      return object;
    }
  }
  return nullptr;
}

std::string JsonText(const nlohmann::json& json, bool pretty) {
  return json.dump(pretty ? 2 : -1, ' ', /*ensure_ascii=*/false, nlohmann::json::error_handler_t::replace);
}

}  // namespace lumeris::cli
