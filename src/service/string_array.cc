#include "service/string_array.h"

#include "platform/property_list_io.h"

namespace lumeris {

std::optional<std::string> ConvertedString(const std::string* text) {
  if (text == nullptr || !plist::IsPropertyListText(*text)) return std::nullopt;
  return *text;
}

MessageValue CreateXPCArrayFromStringArray(const StringList& strings) {
  if (!strings || strings->empty()) return MessageValue::Null();
  MessageValue::Array elements;
  elements.reserve(strings->size());
  for (const std::string& entry : *strings) elements.push_back(MessageValue::String(entry));
  return MessageValue::MakeArray(std::move(elements));
}

StringList StringArrayFromXPCArray(const MessageValue* value) {
  const MessageValue::Array* elements = value ? value->AsArray() : nullptr;
  if (elements == nullptr || elements->empty()) return std::nullopt;
  std::vector<std::string> strings;
  for (const MessageValue& element : *elements) {
    if (std::optional<std::string> text = ConvertedString(element.AsString())) strings.push_back(std::move(*text));
  }
  return strings;
}

}  // namespace lumeris
