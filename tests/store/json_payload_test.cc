// JSON payloads to and from property-list dictionaries.
#include <gtest/gtest.h>

#include <cmath>
#include <limits>

#include "store/json_payload.h"

namespace lumeris {
namespace {

using Status = JsonPayload::Status;

TEST(JsonPayload, StorableObjectsRoundTripToCompactJson) {
  const char* texts[] = {
      R"({})",
      R"({"a":1,"b":-2,"c":1.5,"d":true,"e":false,"f":"text"})",
      R"({"list":[1,"two",[3],{"four":4}],"nested":{"deeper":{"x":"y"}}})",
      "{\"\xF0\x9F\x91\x8D\":\"\xF0\x9F\x91\x8D\xF0\x9F\x8F\xBD\"}",
  };
  for (const char* text : texts) {
    JsonPayload payload = ParseJsonPayload(text);
    ASSERT_EQ(payload.status, Status::kObject) << text;
    EXPECT_EQ(JsonFromDictionary(payload.object), text);
  }
}

TEST(JsonPayload, ValuesMapToTheirPropertyListTypes) {
  JsonPayload payload = ParseJsonPayload(
      R"( { "int": 3, "neg": -4, "real": 2.0, "big": 18446744073709551615, "flag": true, "s": "x" } )");
  ASSERT_EQ(payload.status, Status::kObject);
  EXPECT_EQ(payload.object.at("int"), plist::Value(std::int64_t{3}));
  EXPECT_EQ(payload.object.at("neg"), plist::Value(std::int64_t{-4}));
  EXPECT_EQ(payload.object.at("real"), plist::Value(2.0));
  EXPECT_EQ(payload.object.at("big"), plist::Value(18446744073709551615.0));
  EXPECT_EQ(payload.object.at("flag"), plist::Value(true));
  EXPECT_EQ(payload.object.at("s"), plist::Value("x"));
}

TEST(JsonPayload, NullsAndOtherTopLevelsAreUnstorable) {
  const char* texts[] = {R"({"a":null})", R"({"a":[1,null]})", R"({"a":{"b":{"c":null}}})",
                         R"([])", R"([{"a":1}])", R"("text")", R"(3)", R"(null)"};
  for (const char* text : texts) EXPECT_EQ(ParseJsonPayload(text).status, Status::kUnstorable) << text;
}

TEST(JsonPayload, TextThatIsNotJsonIsReportedAsSuch) {
  const char* texts[] = {"", "{", "{\"a\":}", "not json", "{\"a\":1}trailing", "\xFF\xFE"};
  for (const char* text : texts) EXPECT_EQ(ParseJsonPayload(text).status, Status::kNotJson) << text;
}

TEST(JsonPayload, ValuesJsonCannotExpressAreLeftOut) {
  const plist::Dictionary dictionary{
      {"data", plist::Data{1, 2}},
      {"date", plist::Date{5}},
      {"inf", std::numeric_limits<double>::infinity()},
      {"nan", std::nan("")},
      {"list", plist::Array{plist::Data{}, "kept", plist::Date{}}},
      {"map", plist::Dictionary{{"gone", plist::Data{}}, {"kept", 1}}},
      {"ok", "yes"},
  };
  EXPECT_EQ(JsonFromDictionary(dictionary), R"({"list":["kept"],"map":{"kept":1},"ok":"yes"})");
}

TEST(JsonPayload, InvalidUtf8IsReplacedNotFatal) {
  EXPECT_EQ(JsonFromDictionary({{"k", std::string("a\xFF")}}), "{\"k\":\"a\xEF\xBF\xBD\"}");
}

}  // namespace
}  // namespace lumeris
