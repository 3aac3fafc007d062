// The tagged JSON notation of `lumeris raw`, --json output and `lumeris defaults`: plain kinds,
// the tags, round trips, the inputs that must be refused, and the byte texts.
#include <gtest/gtest.h>

#include <cmath>
#include <initializer_list>
#include <limits>
#include <string>

#include "client/cli_base64.h"
#include "client/cli_json_value.h"
#include "client/property_list_json.h"

namespace lumeris::cli {
namespace {

using V = MessageValue;
constexpr double kInf = std::numeric_limits<double>::infinity();

V Dict(V::Dictionary entries) { return V::MakeDictionary(std::move(entries)); }

struct ReadCase {
  const char* json;
  V expected;
};

TEST(JsonReadTest, ReadsTheKindTheTextAsksFor) {
  for (const ReadCase& c : std::initializer_list<ReadCase>{
        {"null", V::Null()}, {"true", V::Bool(true)}, {"0", V::Uint64(0)},
        {"18446744073709551615", V::Uint64(UINT64_MAX)}, {"-1", V::Int64(-1)},
        {"-9223372036854775808", V::Int64(INT64_MIN)}, {"5.0", V::Double(5.0)},
        {"1e3", V::Double(1000.0)}, {"\"😀\"", V::String("😀")},
        {R"({"$uint64": "18446744073709551615"})", V::Uint64(UINT64_MAX)},
        {R"({"$uint64": 7})", V::Uint64(7)}, {R"({"$int64": "5"})", V::Int64(5)}, {R"({"$int64": -3})", V::Int64(-3)},
        {R"({"$double": 5})", V::Double(5.0)}, {R"({"$double": "-inf"})", V::Double(-kInf)},
        {R"({"$base64": ""})", V::Data({})}, {R"({"$base64": "AP8Q"})", V::Data({0x00, 0xFF, 0x10})},
        {R"({"$hex": "00fF10"})", V::Data({0x00, 0xFF, 0x10})},
        // The older "$data": hexadecimal when it is hex digits, else base64.
        {R"({"$data": "00ff"})", V::Data({0x00, 0xFF})}, {R"({"$data": "e30="})", V::Data({'{', '}'})},
        {R"({"$dictionary": {"$data": "x"}})", Dict({{"$data", V::String("x")}})},
        {R"({"command": "set", "array": ["a", 1, null]})",
                 Dict({{"command", V::String("set")},
                       {"array", V::MakeArray({V::String("a"), V::Uint64(1), V::Null()})}})},
        {R"({"outer": {"limit": {"$uint64": "3"}}})", Dict({{"outer", Dict({{"limit", V::Uint64(3)}})}})}}) {
    std::string error;
    std::optional<V> value = MessageValueFromJsonText(c.json, &error);
    EXPECT_TRUE(value) << c.json << ": " << error;
    EXPECT_EQ(value, c.expected) << c.json;
  }
}

TEST(JsonRefusedTest, RefusesWithAReasonNamingTheMember) {
  const std::pair<const char*, const char*> cases[] = {
      {"{\"command\": ", "not valid JSON"}, {R"({"$uint64": "-1"})", "$uint64"},
      {R"({"$uint64": "18446744073709551616"})", "$uint64"}, {R"({"$uint64": "5x"})", "$uint64"},
      {R"({"$uint64": ""})", "$uint64"}, {R"({"$int64": "9223372036854775808"})", "$int64"},
      {R"({"$int64": 9223372036854775808})", "$int64"}, {R"({"$double": "many"})", "$double"},
      {R"({"$base64": "00f"})", "$base64"}, {R"({"$hex": "e30="})", "$hex"}, {R"({"$data": 5})", "$data"},
      {R"({"$dictionary": [1]})", "$dictionary"}, {R"({"$date": "2024-05-01T12:00:00Z"})", "a date has no message form"},
      {R"({"$unit64": "5"})", "$unit64"}, {R"({"a": [0, {"limit": {"$uint64": "x"}}]})", "/a/1/limit/$uint64"},
  };
  for (const auto& [json, named_in_error] : cases) {
    std::string error;
    EXPECT_FALSE(MessageValueFromJsonText(json, &error)) << json;
    EXPECT_NE(error.find(named_in_error), std::string::npos) << json << ": " << error;
  }
}

// Printing then reading gives the same value back, for every kind and the awkward cases
// (non-negative int64, non-finite doubles, a dictionary whose only key looks like an escape).
TEST(JsonRoundTripTest, PrintedValuesReadBackUnchanged) {
  const V values[] = {
      V::Null(), V::Bool(false), V::Uint64(UINT64_MAX), V::Int64(INT64_MIN), V::Int64(0), V::Int64(42),
      V::Double(5.0), V::Double(-0.25), V::Double(kInf), V::String("👍🏽 \"quoted\" \\ / \n"),
      V::Data({0, 1, 2, 253, 254, 255}), Dict({{"$uint64", V::String("not an escape")}}),
      Dict({{"$dictionary", Dict({})}}),
      Dict({{"array", V::MakeArray({V::Data({}), V::Null(), Dict({{"$data", V::Uint64(1)}})})},
            {"transactionID", V::Uint64(9)}}),
  };
  for (const V& value : values) {
    for (bool pretty : {false, true}) {
      const std::string text = JsonText(JsonFromMessageValue(value), pretty);
      std::string error;
      std::optional<V> back = MessageValueFromJsonText(text, &error);
      ASSERT_TRUE(back) << text << ": " << error;
      EXPECT_EQ(*back, value) << text;
    }
  }
  // Invalid UTF-8 is replaced, not fatal.
  EXPECT_EQ(JsonText(JsonFromMessageValue(V::String("a\xFF" "b")), false), "\"a\xEF\xBF\xBD" "b\"");
}

// `defaults write` takes back everything `defaults read` prints, in the same notation as `raw`.
TEST(PropertyListJsonTest, PrintedValuesWriteBackAndOtherFormsAreRefusedWithTheReason) {
  const plist::Value value = plist::Dictionary{
      {"bytes", plist::Data{0, 0xFF}}, {"lone", plist::Dictionary{{"$data", "e30="}}}, {"nan", plist::Value(std::nan(""))},
      {"max", plist::Value(INT64_MAX)}, {"date", plist::Date{60}}};
  const nlohmann::json printed = PropertyListToJson(value);
  EXPECT_EQ(printed["bytes"], nlohmann::json::parse(R"({"$base64":"AP8="})"));
  std::string error;
  const std::optional<plist::Value> back = PropertyListFromJson(nlohmann::json::parse(printed.dump()), &error);
  ASSERT_TRUE(back) << error;
  EXPECT_TRUE(back->Find("lone") && *back->Find("lone") == *value.Find("lone"));
  EXPECT_TRUE(std::isnan(*back->Find("nan")->AsReal()));
  EXPECT_TRUE(*back->Find("bytes") == *value.Find("bytes") && *back->Find("date") == *value.Find("date"));

  std::string note;
  EXPECT_TRUE(PropertyListFromJson(nlohmann::json::parse(R"({"$data":"e30="})"), &error, &note));
  EXPECT_EQ(note, "");
  EXPECT_TRUE(PropertyListFromJson(nlohmann::json::parse(R"({"$data":"00ff"})"), &error, &note));
  EXPECT_EQ(note, "{\"$data\": \"00ff\"} was read as hexadecimal; write {\"$hex\": ...} or {\"$base64\": ...} to say "
                  "which is meant");
  for (const auto& [json, reason] : std::initializer_list<std::pair<const char*, const char*>>{
           {"18446744073709551615",
            "the value is outside the signed 64-bit range of a property-list integer (store it as text, or as a real "
            "with --type real)"},
           {R"([1, null])", "/1 is null, which has no property-list form"},
           {R"({"a": {"$hexx": "00"}})", "/a/$hexx is not a known tag"}}) {
    EXPECT_FALSE(PropertyListFromJson(nlohmann::json::parse(json), &error)) << json;
    EXPECT_EQ(error.substr(0, std::string(reason).size()), reason) << json;
  }
}

// The test vectors of RFC 4648, section 10, and text that is not base64 or hex.
TEST(ByteTextTest, DecodesBase64AndHexAndRefusesMalformedText) {
  const std::pair<std::string, const char*> cases[] = {
      {"", ""}, {"f", "Zg=="}, {"fo", "Zm8="}, {"foo", "Zm9v"}, {"foob", "Zm9vYg=="}, {"fooba", "Zm9vYmE="}, {"foobar", "Zm9vYmFy"}};
  for (const auto& [text, encoded] : cases) {
    const std::vector<std::uint8_t> bytes(text.begin(), text.end());
    EXPECT_EQ(EncodeBase64(bytes), encoded);
    EXPECT_EQ(DecodeBase64(encoded), bytes) << encoded;
  }
  for (const char* text : {"Zg", "Zg=", "Z===", "Zm9v!A==", "Zg==Zg==", "Zh==", "Zm9=", "=Zm9"}) {
    EXPECT_FALSE(DecodeBase64(text)) << text;
  }
  EXPECT_EQ(DecodeHex("0aFF"), (std::vector<std::uint8_t>{0x0A, 0xFF}));
  for (const char* text : {"0", "0g", "e30="}) EXPECT_FALSE(DecodeHex(text)) << text;
}

}  // namespace
}  // namespace lumeris::cli
