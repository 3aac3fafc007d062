// The adapter between the dispatcher's types and the store (missing identifiers, list
// conversion, the save_state payload rules) and the JSON payloads it converts.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>
#include <limits>

#include "store/json_payload.h"
#include "store/store_operations.h"
#include "store_fixture.h"

namespace lumeris {
namespace {

using namespace testing;  // lumeris::testing
using ::testing::ElementsAre;
using ::testing::Optional;
using Status = JsonPayload::Status;

class StoreOperationsTest : public StoreTest {
 protected:
  StoreOperationsTest() { InstallStoreOperations(operations_); }
  ServiceOperations operations_;
};

// The global member does not depend on the application, so it is the one thing read without one.
TEST_F(StoreOperationsTest, WithoutIdentifierOrApplicationNothingIsWrittenAndOnlyTheGlobalMemberRead) {
  SeedStore({{"Recents:", plist::Array{"r"}}, {"Favorites:", plist::Array{"f"}},
             {"SkinTones:", plist::Dictionary{{"a", "b"}}}, {"State:", plist::Dictionary{{"s", 1}}},
             {"VTGlobalEmojiDiversityDescribed", true}});
  const plist::Dictionary before = StoredDomain();
  EXPECT_FALSE(operations_.CopyRecentsIDArray(std::nullopt));
  EXPECT_FALSE(operations_.CopyFavoritesIDArray(std::nullopt));
  EXPECT_FALSE(operations_.CopySkinToneHistory(std::nullopt));
  EXPECT_EQ(operations_.CopyLastState(std::nullopt), R"({"VTGlobalEmojiDiversityDescribed":true})");
  operations_.SetRecentsIDArray(StringVector{"x"}, std::nullopt);
  operations_.AddRecentID("x", std::nullopt);
  operations_.SetFavoritesIDArray(std::nullopt, std::nullopt);
  operations_.SetLastSkinToneSelection("", std::nullopt);
  operations_.SetLastState(std::string(R"({"VTGlobalEmojiDiversityDescribed":false})"), std::nullopt);
  operations_.SetLastState(std::nullopt, std::nullopt);
  EXPECT_EQ(StoredDomain(), before) << "the unversioned domain was not even wiped";
  EXPECT_EQ(posts(), 0);
}

TEST_F(StoreOperationsTest, ListsTravelAsStringsAndPayloadsAsCompactJson) {
  SeedStore({{"version", 1}, {"Recents:id", plist::Array{"a", plist::Value(1), "b"}},
             {"Favorites:id", plist::Dictionary{{"not", "a list"}}}});
  EXPECT_THAT(operations_.CopyRecentsIDArray("id"), Optional(ElementsAre("a", "b")));
  EXPECT_FALSE(operations_.CopyFavoritesIDArray("id"));
  operations_.SetFavoritesIDArray(StringVector{}, "id");
  EXPECT_THAT(operations_.CopyFavoritesIDArray("id"), Optional(::testing::IsEmpty()));
  operations_.SetFavoritesIDArray(std::nullopt, "id");
  EXPECT_FALSE(StoredValue("Favorites:id"));

  EXPECT_FALSE(operations_.CopySkinToneHistory("id"));
  operations_.SetLastSkinToneSelection(EmojiID(kThumbsUpMedium), "id");
  EXPECT_EQ(operations_.CopySkinToneHistory("id"), "{\"" + std::string(kThumbsUp) + "\":\"" + kThumbsUpMedium + "\"}");
  operations_.SetLastState(std::string(R"( {"tab": 2, "VTGlobalEmojiDiversityDescribed": true} )"), "app");
  EXPECT_EQ(operations_.CopyLastState("app"), R"({"VTGlobalEmojiDiversityDescribed":true,"tab":2})");
}

TEST_F(StoreOperationsTest, UnstorablePayloadsWriteNothingAndTextThatIsNotJsonOnlyVersions) {
  SeedStore({{"Unversioned", 1}});
  const plist::Dictionary before = StoredDomain();
  for (const char* payload : {R"({"VTGlobalEmojiDiversityDescribed":null})", R"([1,2])", R"({"a":[null]})"}) {
    operations_.SetLastState(std::string(payload), "app");
  }
  EXPECT_EQ(StoredDomain(), before);
  operations_.SetLastState(std::string("not json"), "app");
  EXPECT_EQ(StoredDomain(), (plist::Dictionary{{"version", std::int64_t{1}}}));
  EXPECT_EQ(posts(), 0);
}

TEST(JsonPayload, StorableObjectsRoundTripToCompactJson) {
  for (const char* text : {R"({})", R"({"a":1,"b":-2,"c":1.5,"d":true,"e":false,"f":"text"})",
                           R"({"max":9223372036854775807,"min":-9223372036854775808})",
                           R"({"list":[1,"two",[3],{"four":4}],"nested":{"deeper":{"x":"y"}}})",
                           "{\"\xF0\x9F\x91\x8D\":\"\xF0\x9F\x91\x8D\xF0\x9F\x8F\xBD\"}"}) {
    JsonPayload payload = ParseJsonPayload(text);
    ASSERT_EQ(payload.status, Status::kObject) << text;
    EXPECT_EQ(JsonFromDictionary(payload.object), text);
  }
}

// Integers stay integers within the signed 64-bit range and become reals beyond it.
TEST(JsonPayload, NumbersKeepTheirPropertyListTypes) {
  const std::pair<const char*, plist::Value> cases[] = {
      {"3", std::int64_t{3}}, {"2.0", 2.0}, {"9223372036854775807", INT64_MAX}, {"-9223372036854775808", INT64_MIN},
      {"9223372036854775808", 9223372036854775808.0}, {"18446744073709551615", 18446744073709551615.0},
      {"18446744073709551616", 18446744073709551616.0}, {"-9223372036854775809", -9223372036854775809.0}};
  for (const auto& [number, value] : cases) {
    EXPECT_EQ(ParseJsonPayload(std::string(R"({"n":)") + number + "}").object, (plist::Dictionary{{"n", value}}))
        << number;
  }
}

TEST(JsonPayload, NullsOtherTopLevelsAndNonJsonAreReportedApart) {
  for (const char* text : {R"({"a":null})", R"({"a":[1,null]})", R"({"a":{"b":{"c":null}}})", R"([])",
                           R"([{"a":1}])", R"("text")", R"(3)", R"(null)"}) {
    EXPECT_EQ(ParseJsonPayload(text).status, Status::kUnstorable) << text;
  }
  for (const char* text : {"", "{", "{\"a\":}", "not json", "{\"a\":1}trailing", "\xFF\xFE"}) {
    EXPECT_EQ(ParseJsonPayload(text).status, Status::kNotJson) << text;
  }
}

TEST(JsonPayload, ValuesJsonCannotExpressAreLeftOutAndBadUtf8IsReplaced) {
  const plist::Dictionary dictionary{
      {"data", plist::Data{1, 2}}, {"date", plist::Date{5}}, {"inf", std::numeric_limits<double>::infinity()},
      {"nan", std::nan("")}, {"list", plist::Array{plist::Data{}, "kept", plist::Date{}}},
      {"map", plist::Dictionary{{"gone", plist::Data{}}, {"kept", 1}}}, {"ok", "yes"}};
  EXPECT_EQ(JsonFromDictionary(dictionary), R"({"list":["kept"],"map":{"kept":1},"ok":"yes"})");
  EXPECT_EQ(JsonFromDictionary({{"k", std::string("a\xFF")}}), "{\"k\":\"a\xEF\xBF\xBD\"}");
}

}  // namespace
}  // namespace lumeris
