// The dispatcher against recording doubles of every operation: which operation a request reaches,
// with which arguments, and what is answered. The conversions themselves are message_value_test's.
#include "service/dispatch.h"

#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

namespace lumeris {
namespace {

using Calls = std::vector<std::string>;

MessageValue Str(std::string text) { return MessageValue::String(std::move(text)); }
MessageValue U(std::uint64_t number) { return MessageValue::Uint64(number); }

MessageValue Request(std::string command, std::vector<std::pair<std::string, MessageValue>> more = {}) {
  MessageValue request = MessageValue::MakeDictionary({{"command", Str(command)}});
  for (auto& [key, value] : more) request.Set(key, std::move(value));
  return request;
}

MessageValue Strings(std::vector<std::string> strings) {
  MessageValue array = MessageValue::MakeArray();
  for (std::string& s : strings) array.Append(Str(std::move(s)));
  return array;
}

std::string Show(std::uint64_t number) { return std::to_string(number); }
std::string Show(const std::string& text) { return text; }
std::string Show(const OptionalString& text) { return text ? "'" + *text + "'" : "absent"; }
std::string Show(const StringList& list) {
  if (!list) return "absent";
  std::string out = "[";
  for (const std::string& s : *list) out += (out.size() > 1 ? "," : "") + s;
  return out + "]";
}

// Every operation installed; each call is written to `calls_` as "Name(arguments)" and returns
// the member the test may change.
class DispatchTest : public ::testing::Test {
 protected:
  template <typename Result = bool>
  auto Op(std::string name, const Result* result = nullptr) {
    return [this, name, result](const auto&... args) {
      std::string call = name + "(";
      [[maybe_unused]] const char* separator = "";
      ((call += std::exchange(separator, ",") + Show(args)), ...);
      calls_.push_back(call + ")");
      return result ? *result : Result{};
    };
  }

#define OP(name, ...) ops_.name = Op(#name __VA_OPT__(, ) __VA_ARGS__)
  DispatchTest() {
    OP(CopyRecentsIDArray, &recents_); OP(SetRecentsIDArray); OP(AddRecentID); OP(CopyFavoritesIDArray, &favorites_);
    OP(SetFavoritesIDArray); OP(CopySkinToneHistory, &skin_tones_); OP(SetLastSkinToneSelection);
    OP(CopyLastState, &state_); OP(SetLastState); OP(CreateXPCCategoryDataArray, &categories_);
    OP(UpdateCountryInfoAndCheckSignificantChange, &yes_); OP(createXPCArrayForSearchString, &matched_);
    OP(createXPCArrayForRelatedCharacters, &related_); OP(createXPCDictionaryForCharacterInfo, &info_);
    OP(PrepareOpeningLargeVistrel, &yes_);
  }
#undef OP

  std::optional<MessageValue> Dispatch(const MessageValue& request) {
    calls_.clear();
    return DispatchServiceRequest(request, ops_);
  }

  ServiceOperations ops_;
  Calls calls_;
  StringList recents_ = std::vector<std::string>{"r1", "r2"};
  StringList favorites_ = std::vector<std::string>{"f1"};
  OptionalString skin_tones_ = R"({"a":"b"})";
  OptionalString state_ = "{}";
  bool yes_ = true;
  MessageValue categories_ = Strings({"categories"});
  MessageValue matched_ = Strings({"matched"});
  MessageValue related_ = Strings({"related"});
  MessageValue info_ = MessageValue::MakeDictionary({{"unam", Str("info")}});
};

TEST_F(DispatchTest, CommandsMatchByPrefixInTableOrderAndOnlyReadingCommandsReply) {
  // `first_call` is "" when nothing may be called.
  const struct { const char* command, *first_call; bool replies; } cases[] = {
      {"search_matched_chars", "createXPCArrayForSearchString(s,0)", true},
      {"search_matched_charsXYZ", "createXPCArrayForSearchString(s,0)", true},
      {"search_related_chars", "createXPCArrayForRelatedCharacters(s,0)", true},
      {"search_character_info", "createXPCDictionaryForCharacterInfo(s)", true},
      {"search_character_infos", "createXPCDictionaryForCharacterInfo(s)", true}, {"search_other", "", true},
      {"read_categorydata", "CreateXPCCategoryDataArray([x])", true},
      {"read_categorydataX", "CreateXPCCategoryDataArray([x])", true},
      {"read_recents_favorites", "CopyRecentsIDArray(absent)", true},
      {"read_recents_favoritesX", "CopyRecentsIDArray(absent)", true},
      {"read_recents", "CopyRecentsIDArray(absent)", true},  // "read" with a recents target
      {"save_state", "SetLastState(absent,absent)", false}, {"save_stateful", "SetLastState(absent,absent)", false},
      {"set_skintone", "SetLastSkinToneSelection(,absent)", false},
      {"set_skintones", "SetRecentsIDArray([x],absent)", false}, {"set_skintonX", "SetRecentsIDArray([x],absent)", false},
      {"readme", "CopyRecentsIDArray(absent)", true}, {"read", "CopyRecentsIDArray(absent)", true},
      {"settle", "SetRecentsIDArray([x],absent)", false}, {"set", "SetRecentsIDArray([x],absent)", false},
      {"adder", "AddRecentID(,absent)", false}, {"add", "AddRecentID(,absent)", false},
      {"open_large_viewer", "PrepareOpeningLargeVistrel(absent)", true},
      {"open_large_viewerX", "PrepareOpeningLargeVistrel(absent)", true},
      {"open_large", "", false}, {"rea", "", false}, {"se", "", false}, {"Read", "", false}, {"", "", false},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.command);
    const MessageValue array = Strings({"x"});
    std::optional<MessageValue> reply = Dispatch(Request(
        c.command, {{"target", Str("recents")}, {"string", Str("s")}, {"categories", array}, {"array", array}}));
    EXPECT_EQ(reply.has_value(), c.replies);
    // A text search refreshes the regional state first.
    if (!calls_.empty() && calls_[0] == "UpdateCountryInfoAndCheckSignificantChange()") calls_.erase(calls_.begin());
    EXPECT_EQ(calls_.empty() ? "" : calls_[0], c.first_call);
  }
  EXPECT_FALSE(Dispatch(MessageValue::MakeDictionary()));
  EXPECT_FALSE(Dispatch(MessageValue::MakeDictionary({{"command", U(3)}})));
  EXPECT_TRUE(calls_.empty());
}

TEST_F(DispatchTest, TargetBeginningWithRecentsSelectsRecentsAnyOtherFavoritesAndAddOnlyRecents) {
  const std::pair<std::optional<std::string>, std::string> cases[] = {
      {"recents", "Recents"}, {"recentsX", "Recents"}, {"favorites", "Favorites"}, {"", "Favorites"},
      {"Recents", "Favorites"}, {"recent", "Favorites"}, {std::nullopt, "Favorites"}};
  for (const auto& [target, list] : cases) {
    SCOPED_TRACE(Show(target));
    MessageValue request = Request("read", {{"item", Str("i")}, {"identifier", Str("id")}});
    if (target) request.Set("target", Str(*target));
    EXPECT_TRUE(Dispatch(request));
    EXPECT_EQ(calls_, Calls{"Copy" + list + "IDArray('id')"});
    request.Set("command", Str("set"));
    Dispatch(request);
    EXPECT_EQ(calls_, Calls{"Set" + list + "IDArray(absent,'id')"});
    request.Set("command", Str("add"));
    EXPECT_FALSE(Dispatch(request));
    EXPECT_EQ(calls_, list == "Recents" ? Calls{"AddRecentID(i,'id')"} : Calls{});
  }
}

TEST_F(DispatchTest, RepliesCarryTheResultSearchesEchoTheTransactionIdAndOpenLargeViewerAnswersEmpty) {
  EXPECT_EQ(Dispatch(Request("search_matched_chars",
                             {{"string", Str("cat")}, {"limit", U(12)}, {"transactionID", U(99)}})),
            MessageValue::MakeDictionary({{"result", matched_}, {"transactionID", U(99)}}));
  EXPECT_EQ(calls_, (Calls{"UpdateCountryInfoAndCheckSignificantChange()", "createXPCArrayForSearchString(cat,12)"}));
  EXPECT_EQ(Dispatch(Request("search_related_chars", {{"limit", Str("12")}})),
            MessageValue::MakeDictionary({{"result", related_}, {"transactionID", U(0)}}));
  EXPECT_EQ(calls_, Calls{"createXPCArrayForRelatedCharacters(,0)"});
  EXPECT_EQ(Dispatch(Request("search_", {{"transactionID", U(5)}})),
            MessageValue::MakeDictionary({{"transactionID", U(5)}}));
  EXPECT_TRUE(calls_.empty());
  EXPECT_EQ(Dispatch(Request("read_categorydata")), MessageValue::MakeDictionary({{"result", categories_}}));
  EXPECT_EQ(calls_, Calls{"CreateXPCCategoryDataArray(absent)"});
  EXPECT_EQ(Dispatch(Request("open_large_viewer", {{"path", Str("/p")}})), MessageValue::MakeDictionary());
  EXPECT_EQ(calls_, Calls{"PrepareOpeningLargeVistrel('/p')"});
}

TEST_F(DispatchTest, ReadRecentsFavoritesCollectsFourValuesInOrder) {
  EXPECT_EQ(Dispatch(Request("read_recents_favorites", {{"identifier", Str("id")}, {"application", Str("app")}})),
            MessageValue::MakeDictionary({{"recents", Strings({"r1", "r2"})}, {"favorites", Strings({"f1"})},
                                          {"skintones", MessageValue::DataFromBytes(R"({"a":"b"})")},
                                          {"state", MessageValue::DataFromBytes("{}")}}));
  EXPECT_EQ(calls_, (Calls{"CopyRecentsIDArray('id')", "CopyFavoritesIDArray('id')", "CopySkinToneHistory('id')",
                           "CopyLastState('app')"}));
  // Empty and absent lists travel as null; a missing history is left out.
  recents_ = std::vector<std::string>{};
  favorites_ = std::nullopt;
  skin_tones_ = std::nullopt;
  EXPECT_EQ(Dispatch(Request("read_recents_favorites")),
            MessageValue::MakeDictionary({{"recents", MessageValue::Null()},
                                          {"favorites", MessageValue::Null()},
                                          {"state", MessageValue::DataFromBytes("{}")}}));
  EXPECT_EQ(Dispatch(Request("read", {{"target", Str("recents")}})),
            MessageValue::MakeDictionary({{"array", MessageValue::Null()}}));
}

TEST_F(DispatchTest, SaveStatePassesDataOnlyWhenItParsesAsJson) {
  const std::pair<std::optional<MessageValue>, const char*> cases[] = {
      {MessageValue::DataFromBytes(R"({"k":1})"), R"('{"k":1}')"}, {MessageValue::DataFromBytes("[1]"), "'[1]'"},
      {MessageValue::DataFromBytes("{broken"), "absent"},           {MessageValue::DataFromBytes("5"), "absent"},
      {Str(R"({"k":1})"), "absent"},                               {std::nullopt, "absent"},
  };
  for (const auto& [data, passed] : cases) {
    MessageValue request = Request("save_state", {{"application", Str("app")}});
    if (data) request.Set("data", *data);
    EXPECT_FALSE(Dispatch(request));
    EXPECT_EQ(calls_, Calls{"SetLastState(" + std::string(passed) + ",'app')"});
  }
}

// Every string a request carries goes through the conversion: one that does not convert, like a
// value of another type, is missing (an item then reads empty, an identifier absent).
TEST_F(DispatchTest, WrongTypedValuesAndTextThatDoesNotConvertReadAsAbsent) {
  for (const MessageValue& bad : {U(1), Str("\xff\xfe")}) {
    Dispatch(Request("set_skintone", {{"item", bad}, {"identifier", bad}}));
    EXPECT_EQ(calls_, Calls{"SetLastSkinToneSelection(,absent)"}) << bad;
    Dispatch(Request("save_state", {{"application", bad}}));
    EXPECT_EQ(calls_, Calls{"SetLastState(absent,absent)"}) << bad;
    Dispatch(Request("open_large_viewer", {{"path", bad}}));
    EXPECT_EQ(calls_, Calls{"PrepareOpeningLargeVistrel(absent)"}) << bad;
    Dispatch(Request("search_character_info", {{"string", bad}}));
    EXPECT_EQ(calls_, Calls{"createXPCDictionaryForCharacterInfo()"}) << bad;
  }
}

TEST_F(DispatchTest, CommandWhoseOperationIsMissingBehavesAsUnknown) {
  ServiceOperations none;
  for (const char* command : {"search_matched_chars", "search_related_chars", "search_character_info",
                              "read_categorydata", "read_recents_favorites", "read", "open_large_viewer"}) {
    EXPECT_FALSE(DispatchServiceRequest(Request(command), none)) << command;
  }
  EXPECT_TRUE(DispatchServiceRequest(Request("search_xyz"), none));
  // Without the regional refresh a text search still runs.
  ops_.UpdateCountryInfoAndCheckSignificantChange = nullptr;
  EXPECT_TRUE(Dispatch(Request("search_matched_chars")));
  EXPECT_EQ(calls_, Calls{"createXPCArrayForSearchString(,0)"});
}

}  // namespace
}  // namespace lumeris
