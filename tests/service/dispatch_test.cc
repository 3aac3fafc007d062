// The dispatcher against recording doubles of every operation.
#include "service/dispatch.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace lumeris {
namespace {

MessageValue Request(std::string command,
                     std::vector<std::pair<std::string, MessageValue>> more = {}) {
  MessageValue request = MessageValue::MakeDictionary();
  request.Set("command", MessageValue::String(std::move(command)));
  for (auto& [key, value] : more) request.Set(key, std::move(value));
  return request;
}

MessageValue Strings(std::vector<std::string> strings) {
  MessageValue array = MessageValue::MakeArray();
  for (std::string& s : strings) array.Append(MessageValue::String(std::move(s)));
  return array;
}

std::string Show(const OptionalString& text) { return text ? "'" + *text + "'" : "absent"; }

std::string Show(const StringList& list) {
  if (!list) return "absent";
  std::string out = "[";
  for (const std::string& s : *list) out += (out.size() > 1 ? "," : "") + s;
  return out + "]";
}

// Every operation installed; each call is written to `calls` as "Name(arguments)".
class DispatchTest : public ::testing::Test {
 protected:
  DispatchTest() {
    ops_.CopyRecentsIDArray = [this](const OptionalString& id) {
      Record("CopyRecentsIDArray(" + Show(id) + ")");
      return recents_;
    };
    ops_.SetRecentsIDArray = [this](const StringList& list, const OptionalString& id) {
      Record("SetRecentsIDArray(" + Show(list) + "," + Show(id) + ")");
    };
    ops_.AddRecentID = [this](const std::string& item, const OptionalString& id) {
      Record("AddRecentID(" + item + "," + Show(id) + ")");
    };
    ops_.CopyFavoritesIDArray = [this](const OptionalString& id) {
      Record("CopyFavoritesIDArray(" + Show(id) + ")");
      return favorites_;
    };
    ops_.SetFavoritesIDArray = [this](const StringList& list, const OptionalString& id) {
      Record("SetFavoritesIDArray(" + Show(list) + "," + Show(id) + ")");
    };
    ops_.CopySkinToneHistory = [this](const OptionalString& id) {
      Record("CopySkinToneHistory(" + Show(id) + ")");
      return skin_tones_;
    };
    ops_.SetLastSkinToneSelection = [this](const std::string& item, const OptionalString& id) {
      Record("SetLastSkinToneSelection(" + item + "," + Show(id) + ")");
    };
    ops_.CopyLastState = [this](const OptionalString& application) {
      Record("CopyLastState(" + Show(application) + ")");
      return state_;
    };
    ops_.SetLastState = [this](const OptionalString& state, const OptionalString& application) {
      Record("SetLastState(" + Show(state) + "," + Show(application) + ")");
    };
    ops_.CreateXPCCategoryDataArray = [this](const StringList& names) {
      Record("CreateXPCCategoryDataArray(" + Show(names) + ")");
      return MessageValue::MakeArray({MessageValue::String("categories")});
    };
    ops_.UpdateCountryInfoAndCheckSignificantChange = [this] {
      Record("UpdateCountryInfoAndCheckSignificantChange()");
      return true;
    };
    ops_.createXPCArrayForSearchString = [this](const std::string& text, std::uint64_t limit) {
      Record("createXPCArrayForSearchString(" + text + "," + std::to_string(limit) + ")");
      return MessageValue::MakeArray({MessageValue::String("matched")});
    };
    ops_.createXPCArrayForRelatedCharacters = [this](const std::string& text, std::uint64_t limit) {
      Record("createXPCArrayForRelatedCharacters(" + text + "," + std::to_string(limit) + ")");
      return MessageValue::MakeArray({MessageValue::String("related")});
    };
    ops_.createXPCDictionaryForCharacterInfo = [this](const std::string& text) {
      Record("createXPCDictionaryForCharacterInfo(" + text + ")");
      return MessageValue::MakeDictionary({{"unam", MessageValue::String("info")}});
    };
    ops_.PrepareOpeningLargeVistrel = [this](const OptionalString& path) {
      Record("PrepareOpeningLargeVistrel(" + Show(path) + ")");
      return true;
    };
  }

  void Record(std::string call) { calls_.push_back(std::move(call)); }

  std::optional<MessageValue> Dispatch(const MessageValue& request) {
    calls_.clear();
    return DispatchServiceRequest(request, ops_);
  }

  ServiceOperations ops_;
  std::vector<std::string> calls_;
  StringList recents_ = std::vector<std::string>{"r1", "r2"};
  StringList favorites_ = std::vector<std::string>{"f1"};
  OptionalString skin_tones_ = R"({"a":"b"})";
  OptionalString state_ = "{}";
};

using Calls = std::vector<std::string>;

// --- Matching ------------------------------------------------------------------------------

TEST_F(DispatchTest, CommandsMatchByPrefixInTableOrder) {
  const MessageValue array = Strings({"x"});
  struct Case {
    const char* command;
    const char* first_call;  // "" when nothing may be called
  };
  const Case cases[] = {
      {"search_matched_chars", "createXPCArrayForSearchString(s,0)"},
      {"search_matched_charsXYZ", "createXPCArrayForSearchString(s,0)"},
      {"search_related_chars", "createXPCArrayForRelatedCharacters(s,0)"},
      {"search_character_info", "createXPCDictionaryForCharacterInfo(s)"},
      {"search_character_infos", "createXPCDictionaryForCharacterInfo(s)"},
      {"read_categorydata", "CreateXPCCategoryDataArray([x])"},
      {"read_categorydataX", "CreateXPCCategoryDataArray([x])"},
      {"read_recents_favorites", "CopyRecentsIDArray(absent)"},
      {"read_recents_favoritesX", "CopyRecentsIDArray(absent)"},
      {"read_recents", "CopyRecentsIDArray(absent)"},  // "read" with a recents target
      {"save_state", "SetLastState(absent,absent)"},
      {"save_stateful", "SetLastState(absent,absent)"},
      {"set_skintone", "SetLastSkinToneSelection(,absent)"},
      {"set_skintones", "SetRecentsIDArray([x],absent)"},
      {"set_skintonX", "SetRecentsIDArray([x],absent)"},
      {"readme", "CopyRecentsIDArray(absent)"},
      {"read", "CopyRecentsIDArray(absent)"},
      {"settle", "SetRecentsIDArray([x],absent)"},
      {"set", "SetRecentsIDArray([x],absent)"},
      {"adder", "AddRecentID(,absent)"},
      {"add", "AddRecentID(,absent)"},
      {"open_large_viewer", "PrepareOpeningLargeVistrel(absent)"},
      {"open_large_viewerX", "PrepareOpeningLargeVistrel(absent)"},
      {"open_large", ""},
      {"rea", ""},
      {"se", ""},
      {"Read", ""},
      {"", ""},
  };
  for (const Case& c : cases) {
    Dispatch(Request(c.command, {{"target", MessageValue::String("recents")},
                                 {"string", MessageValue::String("s")},
                                 {"categories", array},
                                 {"array", array}}));
    if (*c.first_call == '\0') {
      EXPECT_TRUE(calls_.empty()) << c.command;
    } else {
      ASSERT_FALSE(calls_.empty()) << c.command;
      // A text search refreshes the regional state first.
      const std::string& first =
          calls_[0] == "UpdateCountryInfoAndCheckSignificantChange()" ? calls_.at(1) : calls_[0];
      EXPECT_EQ(first, c.first_call) << c.command;
    }
  }
}

TEST_F(DispatchTest, RepliesOnlyForReadingCommands) {
  struct Case {
    const char* command;
    bool replies;
  };
  const Case cases[] = {
      {"search_matched_chars", true}, {"search_related_chars", true},
      {"search_character_info", true}, {"search_other", true},
      {"read_categorydata", true},    {"read_recents_favorites", true},
      {"read", true},                 {"open_large_viewer", true},
      {"save_state", false},          {"set_skintone", false},
      {"set", false},                 {"add", false},
      {"unknown", false},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(Dispatch(Request(c.command)).has_value(), c.replies) << c.command;
  }
  MessageValue no_command = MessageValue::MakeDictionary();
  EXPECT_FALSE(Dispatch(no_command));
  EXPECT_TRUE(calls_.empty());
  EXPECT_FALSE(Dispatch(MessageValue::MakeDictionary({{"command", MessageValue::Uint64(3)}})));
}

TEST_F(DispatchTest, TargetBeginningWithRecentsSelectsRecentsAnyOtherFavorites) {
  struct Case {
    std::optional<std::string> target;
    bool recents;
  };
  const Case cases[] = {{"recents", true},      {"recentsX", true}, {"favorites", false},
                        {"", false},            {"Recents", false}, {"recent", false},
                        {std::nullopt, false}};
  for (const Case& c : cases) {
    MessageValue read = Request("read");
    if (c.target) read.Set("target", MessageValue::String(*c.target));
    std::optional<MessageValue> reply = Dispatch(read);
    ASSERT_TRUE(reply);
    EXPECT_EQ(calls_, Calls{c.recents ? "CopyRecentsIDArray(absent)" : "CopyFavoritesIDArray(absent)"})
        << Show(c.target);
    MessageValue set = read;
    set.Set("command", MessageValue::String("set"));
    Dispatch(set);
    EXPECT_EQ(calls_, Calls{c.recents ? "SetRecentsIDArray(absent,absent)"
                                      : "SetFavoritesIDArray(absent,absent)"});
  }
}

TEST_F(DispatchTest, AddChangesOnlyTheRecentsList) {
  EXPECT_FALSE(Dispatch(Request("add", {{"target", MessageValue::String("favorites")},
                                        {"item", MessageValue::String("i")}})));
  EXPECT_TRUE(calls_.empty());
  EXPECT_FALSE(Dispatch(Request("add", {{"target", MessageValue::String("recents")},
                                        {"item", MessageValue::String("i")},
                                        {"identifier", MessageValue::String("id")}})));
  EXPECT_EQ(calls_, Calls{"AddRecentID(i,'id')"});
}

// --- Search --------------------------------------------------------------------------------

TEST_F(DispatchTest, SearchesPutResultAndEchoTransactionId) {
  std::optional<MessageValue> reply =
      Dispatch(Request("search_matched_chars", {{"string", MessageValue::String("cat")},
                                                {"limit", MessageValue::Uint64(12)},
                                                {"transactionID", MessageValue::Uint64(99)}}));
  ASSERT_TRUE(reply);
  EXPECT_EQ(calls_, (Calls{"UpdateCountryInfoAndCheckSignificantChange()",
                           "createXPCArrayForSearchString(cat,12)"}));
  EXPECT_EQ(*reply, MessageValue::MakeDictionary(
                        {{"result", MessageValue::MakeArray({MessageValue::String("matched")})},
                         {"transactionID", MessageValue::Uint64(99)}}));

  reply = Dispatch(Request("search_related_chars", {{"limit", MessageValue::String("12")}}));
  ASSERT_TRUE(reply);
  EXPECT_EQ(calls_, Calls{"createXPCArrayForRelatedCharacters(,0)"});
  EXPECT_EQ(reply->GetUint64("transactionID"), 0u);
}

TEST_F(DispatchTest, UnknownSearchSubCommandAnswersOnlyTheTransactionId) {
  std::optional<MessageValue> reply =
      Dispatch(Request("search_", {{"transactionID", MessageValue::Uint64(5)}}));
  ASSERT_TRUE(reply);
  EXPECT_TRUE(calls_.empty());
  EXPECT_EQ(*reply, MessageValue::MakeDictionary({{"transactionID", MessageValue::Uint64(5)}}));
}

TEST_F(DispatchTest, CommandWhoseOperationIsMissingBehavesAsUnknown) {
  ServiceOperations none;
  for (const char* command : {"search_matched_chars", "search_related_chars",
                              "search_character_info", "read_categorydata",
                              "read_recents_favorites", "read", "open_large_viewer"}) {
    EXPECT_FALSE(DispatchServiceRequest(Request(command), none)) << command;
  }
  EXPECT_TRUE(DispatchServiceRequest(Request("search_xyz"), none));
  // Without the regional refresh a text search still runs.
  ops_.UpdateCountryInfoAndCheckSignificantChange = nullptr;
  EXPECT_TRUE(Dispatch(Request("search_matched_chars")));
  EXPECT_EQ(calls_, Calls{"createXPCArrayForSearchString(,0)"});
}

// --- Store commands ------------------------------------------------------------------------

TEST_F(DispatchTest, ReadRecentsFavoritesCollectsFourValuesInOrder) {
  std::optional<MessageValue> reply =
      Dispatch(Request("read_recents_favorites", {{"identifier", MessageValue::String("id")},
                                                  {"application", MessageValue::String("app")}}));
  ASSERT_TRUE(reply);
  EXPECT_EQ(calls_, (Calls{"CopyRecentsIDArray('id')", "CopyFavoritesIDArray('id')",
                           "CopySkinToneHistory('id')", "CopyLastState('app')"}));
  EXPECT_EQ(*reply, MessageValue::MakeDictionary(
                        {{"recents", Strings({"r1", "r2"})},
                         {"favorites", Strings({"f1"})},
                         {"skintones", MessageValue::DataFromBytes(R"({"a":"b"})")},
                         {"state", MessageValue::DataFromBytes("{}")}}));
}

TEST_F(DispatchTest, EmptyAndAbsentListsTravelAsNullAndMissingHistoryIsLeftOut) {
  recents_ = std::vector<std::string>{};
  favorites_ = std::nullopt;
  skin_tones_ = std::nullopt;
  std::optional<MessageValue> reply = Dispatch(Request("read_recents_favorites"));
  ASSERT_TRUE(reply);
  EXPECT_EQ(*reply, MessageValue::MakeDictionary({{"recents", MessageValue::Null()},
                                                  {"favorites", MessageValue::Null()},
                                                  {"state", MessageValue::DataFromBytes("{}")}}));
  reply = Dispatch(Request("read", {{"target", MessageValue::String("recents")}}));
  ASSERT_TRUE(reply);
  EXPECT_EQ(*reply, MessageValue::MakeDictionary({{"array", MessageValue::Null()}}));
}

TEST_F(DispatchTest, SetPassesAbsentOrEmptyListByTheConversionRules) {
  struct Case {
    const char* name;
    std::optional<MessageValue> array;
    const char* call;
  };
  const Case cases[] = {
      {"missing", std::nullopt, "SetFavoritesIDArray(absent,absent)"},
      {"not an array", MessageValue::String("a"), "SetFavoritesIDArray(absent,absent)"},
      {"empty array", MessageValue::MakeArray(), "SetFavoritesIDArray(absent,absent)"},
      {"only integers", MessageValue::MakeArray({MessageValue::Uint64(1)}),
       "SetFavoritesIDArray([],absent)"},
      {"mixed", MessageValue::MakeArray({MessageValue::String("a"), MessageValue::Uint64(1),
                                         MessageValue::Null(), MessageValue::String("b")}),
       "SetFavoritesIDArray([a,b],absent)"},
  };
  for (const Case& c : cases) {
    MessageValue request = Request("set", {{"target", MessageValue::String("favorites")}});
    if (c.array) request.Set("array", *c.array);
    EXPECT_FALSE(Dispatch(request)) << c.name;
    EXPECT_EQ(calls_, Calls{c.call}) << c.name;
  }
}

TEST_F(DispatchTest, SaveStatePassesDataOnlyWhenItParsesAsJson) {
  struct Case {
    std::optional<MessageValue> data;
    const char* call;
  };
  const Case cases[] = {
      {MessageValue::DataFromBytes(R"({"k":1})"), R"(SetLastState('{"k":1}','app'))"},
      {MessageValue::DataFromBytes("[1]"), "SetLastState('[1]','app')"},
      {MessageValue::DataFromBytes("{broken"), "SetLastState(absent,'app')"},
      {MessageValue::DataFromBytes("5"), "SetLastState(absent,'app')"},
      {MessageValue::String(R"({"k":1})"), "SetLastState(absent,'app')"},
      {std::nullopt, "SetLastState(absent,'app')"},
  };
  for (const Case& c : cases) {
    MessageValue request = Request("save_state", {{"application", MessageValue::String("app")}});
    if (c.data) request.Set("data", *c.data);
    EXPECT_FALSE(Dispatch(request));
    EXPECT_EQ(calls_, Calls{c.call});
  }
}

TEST_F(DispatchTest, CategoryNamesGoThroughTheListConversion) {
  std::optional<MessageValue> reply = Dispatch(
      Request("read_categorydata", {{"categories", MessageValue::MakeArray()}}));
  ASSERT_TRUE(reply);
  EXPECT_EQ(calls_, Calls{"CreateXPCCategoryDataArray(absent)"});
  EXPECT_EQ(*reply->Find("result"), MessageValue::MakeArray({MessageValue::String("categories")}));
}

TEST_F(DispatchTest, OpenLargeViewerAnswersEmptyAfterWritingThePath) {
  std::optional<MessageValue> reply =
      Dispatch(Request("open_large_viewer", {{"path", MessageValue::String("/p")}}));
  ASSERT_TRUE(reply);
  EXPECT_EQ(calls_, Calls{"PrepareOpeningLargeVistrel('/p')"});
  EXPECT_EQ(*reply, MessageValue::MakeDictionary());
}

TEST_F(DispatchTest, WrongTypedScopesReadAsAbsentAndBytesArePassedAsSent) {
  const std::string invalid_utf8 = "\xff\xfe";
  Dispatch(Request("set_skintone", {{"item", MessageValue::String(invalid_utf8)},
                                    {"identifier", MessageValue::Uint64(1)}}));
  EXPECT_EQ(calls_, Calls{"SetLastSkinToneSelection(" + invalid_utf8 + ",absent)"});
}

}  // namespace
}  // namespace lumeris
