#include "service/dispatch.h"

#include <nlohmann/json.hpp>

#include <cstring>
#include <string>

namespace lumeris {

namespace {

// The values derived from every request before its command is tested, in the order they are
// derived.
struct Request {
  const MessageValue& message;
  MessageValue reply;
  const std::string* command;  // nullptr when absent: then no row matches
  const std::string* target;   // nullptr when absent: then favourites are selected
  OptionalString identifier;
  OptionalString application;
};

enum class ReplyAction { kSend, kRelease };

using CommandHandler = ReplyAction (*)(Request& request, const ServiceOperations& operations);

// Every test compares the command against a literal over `compare_length` characters, like
// strncmp, and the first matching row wins.
struct CommandRow {
  const char* literal;
  std::size_t compare_length;
  CommandHandler handler;
};

bool Matches(const std::string& command, const char* literal, std::size_t compare_length) {
  return std::strncmp(command.c_str(), literal, compare_length) == 0;
}

// A target that begins with "recents" selects the recents list; anything else, a missing
// target included, selects favourites.
bool IsRecentsTarget(const std::string* target) {
  return target != nullptr && std::strncmp(target->c_str(), "recents", 7) == 0;
}

// A string value converted from UTF-8: absent when missing, not well-formed or holding NUL.
OptionalString StringValue(const MessageValue& message, std::string_view key) {
  return ConvertedString(message.GetString(key));
}

// A string the command needs; a missing one (or one that does not convert) counts as empty.
std::string RequiredString(const MessageValue& message, std::string_view key) {
  return StringValue(message, key).value_or(std::string());
}

// The search sub-commands: each returns the "result" value, or std::nullopt when its operation
// is not installed.
using SearchHandler = std::optional<MessageValue> (*)(const std::string& text,
                                                      const MessageValue& message,
                                                      const ServiceOperations& operations);

struct SearchRow {
  const char* literal;
  std::size_t compare_length;
  SearchHandler handler;
};

std::optional<MessageValue> SearchMatchedChars(const std::string& text, const MessageValue& message,
                                               const ServiceOperations& operations) {
  if (!operations.createXPCArrayForSearchString) return std::nullopt;
  if (operations.UpdateCountryInfoAndCheckSignificantChange) {
    operations.UpdateCountryInfoAndCheckSignificantChange();
  }
  return operations.createXPCArrayForSearchString(text, message.GetUint64("limit"));
}

std::optional<MessageValue> SearchRelatedChars(const std::string& text, const MessageValue& message,
                                               const ServiceOperations& operations) {
  if (!operations.createXPCArrayForRelatedCharacters) return std::nullopt;
  return operations.createXPCArrayForRelatedCharacters(text, message.GetUint64("limit"));
}

std::optional<MessageValue> SearchCharacterInfo(const std::string& text, const MessageValue&,
                                                const ServiceOperations& operations) {
  if (!operations.createXPCDictionaryForCharacterInfo) return std::nullopt;
  return operations.createXPCDictionaryForCharacterInfo(text);
}

constexpr SearchRow kSearchTable[] = {
    {"search_matched_chars", 20, &SearchMatchedChars},
    {"search_related_chars", 20, &SearchRelatedChars},
    {"search_character_info", 21, &SearchCharacterInfo},
};

ReplyAction HandleSearch(Request& request, const ServiceOperations& operations) {
  const std::string text = RequiredString(request.message, "string");
  for (const SearchRow& row : kSearchTable) {
    if (!Matches(*request.command, row.literal, row.compare_length)) continue;
    std::optional<MessageValue> result = row.handler(text, request.message, operations);
    if (!result) return ReplyAction::kRelease;
    request.reply.Set("result", std::move(*result));
    break;
  }
  // Every search reply carries the request's number; an unknown sub-command gets only that.
  request.reply.Set("transactionID",
                    MessageValue::Uint64(request.message.GetUint64("transactionID")));
  return ReplyAction::kSend;
}

ReplyAction HandleReadCategoryData(Request& request, const ServiceOperations& operations) {
  if (!operations.CreateXPCCategoryDataArray) return ReplyAction::kRelease;
  StringList names = StringArrayFromXPCArray(request.message.Find("categories"));
  request.reply.Set("result", operations.CreateXPCCategoryDataArray(names));
  return ReplyAction::kSend;
}

ReplyAction HandleReadRecentsFavorites(Request& request, const ServiceOperations& operations) {
  if (!operations.CopyRecentsIDArray || !operations.CopyFavoritesIDArray ||
      !operations.CopySkinToneHistory || !operations.CopyLastState) {
    return ReplyAction::kRelease;
  }
  request.reply.Set("recents", CreateXPCArrayFromStringArray(
                                   operations.CopyRecentsIDArray(request.identifier)));
  request.reply.Set("favorites", CreateXPCArrayFromStringArray(
                                     operations.CopyFavoritesIDArray(request.identifier)));
  if (OptionalString skin_tones = operations.CopySkinToneHistory(request.identifier)) {
    request.reply.Set("skintones", MessageValue::DataFromBytes(*skin_tones));
  }
  if (OptionalString state = operations.CopyLastState(request.application)) {
    request.reply.Set("state", MessageValue::DataFromBytes(*state));
  }
  return ReplyAction::kSend;
}

// The "data" bytes when they parse as JSON with an object or array at the top (the only top
// levels strict JSON reading accepts), else absent.
OptionalString ParsedStateData(const MessageValue& message) {
  const MessageValue::Bytes* data = message.GetData("data");
  if (data == nullptr) return std::nullopt;
  std::string text(data->begin(), data->end());
  nlohmann::json parsed = nlohmann::json::parse(text, nullptr, /*allow_exceptions=*/false);
  if (!parsed.is_object() && !parsed.is_array()) return std::nullopt;
  return text;
}

ReplyAction HandleSaveState(Request& request, const ServiceOperations& operations) {
  if (operations.SetLastState) {
    operations.SetLastState(ParsedStateData(request.message), request.application);
  }
  return ReplyAction::kRelease;
}

ReplyAction HandleSetSkinTone(Request& request, const ServiceOperations& operations) {
  if (operations.SetLastSkinToneSelection) {
    operations.SetLastSkinToneSelection(RequiredString(request.message, "item"),
                                        request.identifier);
  }
  return ReplyAction::kRelease;
}

ReplyAction HandleRead(Request& request, const ServiceOperations& operations) {
  const auto& copy = IsRecentsTarget(request.target) ? operations.CopyRecentsIDArray
                                                     : operations.CopyFavoritesIDArray;
  if (!copy) return ReplyAction::kRelease;
  request.reply.Set("array", CreateXPCArrayFromStringArray(copy(request.identifier)));
  return ReplyAction::kSend;
}

ReplyAction HandleSet(Request& request, const ServiceOperations& operations) {
  const auto& set = IsRecentsTarget(request.target) ? operations.SetRecentsIDArray
                                                    : operations.SetFavoritesIDArray;
  if (set) set(StringArrayFromXPCArray(request.message.Find("array")), request.identifier);
  return ReplyAction::kRelease;
}

ReplyAction HandleAdd(Request& request, const ServiceOperations& operations) {
  // Only the recents list takes single additions; any other target changes nothing.
  if (IsRecentsTarget(request.target) && operations.AddRecentID) {
    operations.AddRecentID(RequiredString(request.message, "item"), request.identifier);
  }
  return ReplyAction::kRelease;
}

ReplyAction HandleOpenLargeViewer(Request& request, const ServiceOperations& operations) {
  if (!operations.PrepareOpeningLargeVistrel) return ReplyAction::kRelease;
  // The empty reply tells the client that the preference is written.
  operations.PrepareOpeningLargeVistrel(StringValue(request.message, "path"));
  return ReplyAction::kSend;
}

// The command table, walked in order. Earlier prefixes shadow later ones, so the order is part
// of the protocol: "read_categorydata" and "read_recents_favorites" before "read", "save_state"
// and "set_skintone" before "set". "set_skintone" is compared over 15 characters, more than its
// 12, so only the exact command matches it and "set_skintones" falls through to "set".
constexpr CommandRow kCommandTable[] = {
    // literal                  n   handler
    {"search_",                 7,  &HandleSearch},
    {"read_categorydata",       17, &HandleReadCategoryData},
    {"read_recents_favorites",  22, &HandleReadRecentsFavorites},
    {"save_state",              10, &HandleSaveState},
    {"set_skintone",            15, &HandleSetSkinTone},
    {"read",                    4,  &HandleRead},
    {"set",                     3,  &HandleSet},
    {"add",                     3,  &HandleAdd},
    {"open_large_viewer",       17, &HandleOpenLargeViewer},
};

}  // namespace

std::optional<MessageValue> DispatchServiceRequest(const MessageValue& message,
                                                   const ServiceOperations& operations) {
  Request request{
      message,
      MessageValue::MakeDictionary(),
      message.GetString("command"),
      message.GetString("target"),
      StringValue(message, "identifier"),
      StringValue(message, "application"),
  };
  if (request.command == nullptr) return std::nullopt;
  for (const CommandRow& row : kCommandTable) {
    if (!Matches(*request.command, row.literal, row.compare_length)) continue;
    if (row.handler(request, operations) == ReplyAction::kSend) return std::move(request.reply);
    return std::nullopt;
  }
  return std::nullopt;
}

}  // namespace lumeris
