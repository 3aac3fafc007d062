#include "service/message_value.h"

#include <cstdio>
#include <utility>

namespace lumeris {

// Each factory fills a null value in place; building a temporary variant and moving it in
// trips g++ 12's -Wmaybe-uninitialized on the recursive alternatives.
template <typename T, typename Arg>
MessageValue MessageValue::Make(Arg&& arg) {
  MessageValue result;
  result.value_.emplace<T>(std::forward<Arg>(arg));
  return result;
}

MessageValue MessageValue::Bool(bool value) { return Make<bool>(value); }
MessageValue MessageValue::Uint64(std::uint64_t value) { return Make<std::uint64_t>(value); }
MessageValue MessageValue::Int64(std::int64_t value) { return Make<std::int64_t>(value); }
MessageValue MessageValue::Double(double value) { return Make<double>(value); }
MessageValue MessageValue::String(std::string value) { return Make<std::string>(std::move(value)); }
MessageValue MessageValue::Data(Bytes value) { return Make<Bytes>(std::move(value)); }

MessageValue MessageValue::DataFromBytes(std::string_view bytes) {
  return Data(Bytes(bytes.begin(), bytes.end()));
}

MessageValue MessageValue::MakeArray(Array elements) { return Make<Array>(std::move(elements)); }

MessageValue MessageValue::MakeDictionary(Dictionary entries) {
  return Make<Dictionary>(std::move(entries));
}

const MessageValue* MessageValue::Find(std::string_view key) const {
  const Dictionary* entries = AsDictionary();
  if (entries == nullptr) return nullptr;
  auto it = entries->find(key);
  return it == entries->end() ? nullptr : &it->second;
}

const std::string* MessageValue::GetString(std::string_view key) const {
  const MessageValue* value = Find(key);
  return value ? value->AsString() : nullptr;
}

std::uint64_t MessageValue::GetUint64(std::string_view key) const {
  const MessageValue* value = Find(key);
  const std::uint64_t* number = value ? value->AsUint64() : nullptr;
  return number ? *number : 0;
}

const MessageValue::Bytes* MessageValue::GetData(std::string_view key) const {
  const MessageValue* value = Find(key);
  return value ? value->AsData() : nullptr;
}

void MessageValue::Set(std::string key, MessageValue value) {
  Dictionary* entries = AsDictionary();
  if (entries == nullptr) return;
  entries->insert_or_assign(std::move(key), std::move(value));
}

void MessageValue::Append(MessageValue value) {
  Array* elements = AsArray();
  if (elements == nullptr) return;
  elements->push_back(std::move(value));
}

bool operator==(const MessageValue& a, const MessageValue& b) { return a.value_ == b.value_; }

namespace {

void DescribeString(std::string_view text, std::string& out) {
  out += '"';
  for (unsigned char c : text) {
    if (c == '"' || c == '\\') {
      out += '\\';
      out += static_cast<char>(c);
    } else if (c < 0x20 || c >= 0x7f) {
      char escaped[8];
      std::snprintf(escaped, sizeof escaped, "\\x%02x", c);
      out += escaped;
    } else {
      out += static_cast<char>(c);
    }
  }
  out += '"';
}

void DescribeInto(const MessageValue& value, std::string& out) {
  switch (value.kind()) {
    case MessageValue::Kind::kNull:
      out += "null";
      return;
    case MessageValue::Kind::kBool:
      out += *value.AsBool() ? "true" : "false";
      return;
    case MessageValue::Kind::kUint64:
      out += std::to_string(*value.AsUint64());
      return;
    case MessageValue::Kind::kInt64:
      out += std::to_string(*value.AsInt64());
      return;
    case MessageValue::Kind::kDouble: {
      char number[32];
      std::snprintf(number, sizeof number, "%.17g", *value.AsDouble());
      out += number;
      return;
    }
    case MessageValue::Kind::kString:
      DescribeString(*value.AsString(), out);
      return;
    case MessageValue::Kind::kData: {
      out += '<';
      for (std::uint8_t byte : *value.AsData()) {
        char hex[4];
        std::snprintf(hex, sizeof hex, "%02x", byte);
        out += hex;
      }
      out += '>';
      return;
    }
    case MessageValue::Kind::kArray: {
      out += '[';
      bool first = true;
      for (const MessageValue& element : *value.AsArray()) {
        if (!first) out += ',';
        first = false;
        DescribeInto(element, out);
      }
      out += ']';
      return;
    }
    case MessageValue::Kind::kDictionary: {
      out += '{';
      bool first = true;
      for (const auto& [key, element] : *value.AsDictionary()) {
        if (!first) out += ',';
        first = false;
        DescribeString(key, out);
        out += ':';
        DescribeInto(element, out);
      }
      out += '}';
      return;
    }
  }
}

}  // namespace

std::string MessageValue::Describe() const {
  std::string out;
  DescribeInto(*this, out);
  return out;
}

std::ostream& operator<<(std::ostream& out, const MessageValue& value) {
  return out << value.Describe();
}

}  // namespace lumeris
