#include "client/cli_output.h"

#include <algorithm>

#include "client/cli_items.h"
#include "client/cli_json_value.h"

namespace lumeris::cli {
namespace {

std::string CharacterLine(std::string_view character) {
  return std::string(character) + "\t" + CodePoints(character) + "\n";
}

// The JSON held in a data payload, or its base64 escape when it is not JSON.
nlohmann::json PayloadJson(const MessageValue& value) {
  if (const MessageValue::Bytes* bytes = value.AsData()) {
    nlohmann::json parsed = nlohmann::json::parse(bytes->begin(), bytes->end(), nullptr,
                                                  /*allow_exceptions=*/false);
    if (!parsed.is_discarded()) return parsed;
  }
  return JsonFromMessageValue(value);
}

}  // namespace

std::string ShortCharacterName(std::string_view names) {
  names = names.substr(0, names.find("; "));
  std::size_t words = 0;
  for (std::size_t i = 0; i < names.size(); ++i) {
    if (names[i] == ' ' && ++words == 6) return std::string(names.substr(0, i)) + " ...";
  }
  return std::string(names);
}

std::string FormatCharacters(const MessageValue* result,
                             const std::map<std::string, std::string>* names) {
  std::string text;
  if (result == nullptr || !result->is_array()) return text;
  for (const MessageValue& element : *result->AsArray()) {
    const std::string* character = element.AsString();
    if (character == nullptr) continue;
    std::string line = CharacterLine(*character);
    if (names != nullptr) {
      if (auto name = names->find(*character); name != names->end() && !name->second.empty()) {
        line.insert(line.size() - 1, "\t" + name->second);
      }
    }
    text += line;
  }
  return text;
}

std::string FormatCharacterInfo(std::string_view character, const MessageValue* record) {
  std::string text;
  const MessageValue::Dictionary* fields = record ? record->AsDictionary() : nullptr;
  if (fields == nullptr || fields->empty()) return text;
  text += CharacterLine(character);
  for (std::size_t i = 0; i < kCharacterInfoTags.size(); ++i) {
    const MessageValue* value = record->Find(kCharacterInfoTags[i]);
    const std::string* field = value ? value->AsString() : nullptr;
    text += std::string(kCharacterInfoTags[i]) + "\t" + std::string(kCharacterInfoMeanings[i]) +
            "\t" + (field ? *field : std::string()) + "\n";
  }
  for (const auto& [key, value] : *fields) {
    if (std::find(kCharacterInfoTags.begin(), kCharacterInfoTags.end(), key) !=
        kCharacterInfoTags.end()) {
      continue;
    }
    const std::string* field = value.AsString();
    text += key + "\t\t" + (field ? *field : JsonText(JsonFromMessageValue(value), false)) + "\n";
  }
  return text;
}

std::string FormatItems(const MessageValue* list) {
  std::string text;
  if (list == nullptr || !list->is_array()) return text;
  for (const MessageValue& element : *list->AsArray()) {
    const std::string* id = element.AsString();
    if (id == nullptr) continue;
    const ItemDescription item = DescribeEntityID(*id);
    if (item.opaque) {
      text += *id + "\t(opaque)\n";
      continue;
    }
    const std::string character = item.character.value_or("");
    std::string line = (item.character ? character : std::string("(no character)")) + "\t" +
                       CodePoints(character);
    if (item.font) line += "\t" + *item.font;
    if (item.glyph) line += "\tglyph " + std::to_string(*item.glyph);
    text += line + "\n";
  }
  return text;
}

std::string FormatReadAll(const MessageValue& reply) {
  std::string text;
  for (const auto& [key, heading] : {std::pair{"recents", "recents:"},
                                     std::pair{"favorites", "favorites:"}}) {
    const std::string items = FormatItems(reply.Find(key));
    text += std::string(heading) + (items.empty() ? " (none)\n" : "\n" + items);
  }
  for (const auto& [key, heading] : {std::pair{"skintones", "skin tones: "},
                                     std::pair{"state", "state: "}}) {
    const MessageValue* payload = reply.Find(key);
    text += std::string(heading) +
            (payload ? JsonText(PayloadJson(*payload), false) : std::string("(none)")) + "\n";
  }
  return text;
}

nlohmann::json ReplyJson(const MessageValue& reply) {
  nlohmann::json json = JsonFromMessageValue(reply);
  if (!json.is_object()) return json;
  for (const char* key : {"skintones", "state"}) {
    if (const MessageValue* payload = reply.Find(key); payload && payload->AsData()) {
      json[key] = PayloadJson(*payload);
    }
  }
  return json;
}

}  // namespace lumeris::cli
