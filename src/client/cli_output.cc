#include "client/cli_output.h"

#include <algorithm>

#include "client/cli_items.h"
#include "client/cli_json_value.h"

namespace lumeris::cli {
namespace {

// Characters of a category's data shown before the rest is summarised.
constexpr std::size_t kCategoryPreviewCharacters = 40;

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

// The first kCategoryPreviewCharacters scalar values of UTF-8 text, then " ..." when there is
// more.
std::string Preview(std::string_view text) {
  std::size_t scalars = 0;
  std::size_t i = 0;
  for (; i < text.size(); ++i) {
    if ((static_cast<unsigned char>(text[i]) & 0xC0) == 0x80) continue;
    if (scalars++ == kCategoryPreviewCharacters) break;
  }
  return i < text.size() ? std::string(text.substr(0, i)) + " ..." : std::string(text);
}

std::string FormatCategory(const std::string& name, const MessageValue& entry) {
  std::string text = name;
  if (const std::string* title = entry.GetString("TitleText")) text += "\t" + *title;
  if (const MessageValue::Bytes* image = entry.GetData("TitleImage")) {
    text += "\t(icon " + std::to_string(image->size()) + " bytes)";
  }
  text += "\n";
  const MessageValue* data = entry.Find("Data");
  if (data == nullptr) return text;
  if (const std::string* characters = data->AsString()) {
    text += "  " + Preview(*characters) + "\n";
  } else if (const MessageValue::Array* subcategories = data->AsArray()) {
    for (const MessageValue& subcategory : *subcategories) {
      const std::string* title = subcategory.GetString("TitleText");
      const std::string* characters = subcategory.GetString("Data");
      text += "  " + (title ? *title : std::string("?")) + "\t" +
              (characters ? Preview(*characters) : std::string()) + "\n";
    }
  }
  return text;
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

std::string FormatCategories(const std::vector<std::string>& names, const MessageValue* result) {
  std::string text;
  if (result == nullptr || !result->is_array()) return text;
  const MessageValue::Array& entries = *result->AsArray();
  for (std::size_t i = 0; i < entries.size(); ++i) {
    text += FormatCategory(i < names.size() ? names[i] : "?", entries[i]);
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
