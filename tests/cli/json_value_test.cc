// JSON <-> message value conversion of `lumeris raw` and --json output: plain kinds, the typed
// escapes, round trips, and the inputs that must be refused.
#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <string>

#include "client/cli_base64.h"
#include "client/cli_json_value.h"

namespace lumeris::cli {
namespace {

MessageValue Dict(MessageValue::Dictionary entries) {
  return MessageValue::MakeDictionary(std::move(entries));
}

struct ReadCase {
  const char* json;
  MessageValue expected;
};

void PrintTo(const ReadCase& c, std::ostream* os) { *os << c.json; }

class JsonReadTest : public ::testing::TestWithParam<ReadCase> {};

TEST_P(JsonReadTest, ReadsTheKindTheTextAsksFor) {
  std::string error;
  std::optional<MessageValue> value = MessageValueFromJsonText(GetParam().json, &error);
  ASSERT_TRUE(value) << error;
  EXPECT_EQ(*value, GetParam().expected) << GetParam().json;
}

INSTANTIATE_TEST_SUITE_P(
    PlainAndEscaped, JsonReadTest,
    ::testing::Values(
        ReadCase{"null", MessageValue::Null()}, ReadCase{"true", MessageValue::Bool(true)},
        ReadCase{"0", MessageValue::Uint64(0)}, ReadCase{"5", MessageValue::Uint64(5)},
        ReadCase{"18446744073709551615", MessageValue::Uint64(UINT64_MAX)},
        ReadCase{"-1", MessageValue::Int64(-1)},
        ReadCase{"-9223372036854775808", MessageValue::Int64(INT64_MIN)},
        ReadCase{"5.0", MessageValue::Double(5.0)}, ReadCase{"1e3", MessageValue::Double(1000.0)},
        ReadCase{"\"😀\"", MessageValue::String("😀")},
        ReadCase{R"({"$uint64": "18446744073709551615"})", MessageValue::Uint64(UINT64_MAX)},
        ReadCase{R"({"$uint64": 7})", MessageValue::Uint64(7)},
        ReadCase{R"({"$int64": "-1"})", MessageValue::Int64(-1)},
        ReadCase{R"({"$int64": "5"})", MessageValue::Int64(5)},
        ReadCase{R"({"$int64": -3})", MessageValue::Int64(-3)},
        ReadCase{R"({"$double": 5})", MessageValue::Double(5.0)},
        ReadCase{R"({"$double": "-inf"})",
                 MessageValue::Double(-std::numeric_limits<double>::infinity())},
        ReadCase{R"({"$data": ""})", MessageValue::Data({})},
        ReadCase{R"({"$data": "AP8Q"})", MessageValue::Data({0x00, 0xFF, 0x10})},
        ReadCase{R"({"$dictionary": {"$data": "x"}})", Dict({{"$data", MessageValue::String("x")}})},
        ReadCase{R"({"$a": 1, "$b": 2})",
                 Dict({{"$a", MessageValue::Uint64(1)}, {"$b", MessageValue::Uint64(2)}})},
        ReadCase{R"({"command": "set", "array": ["a", 1, null]})",
                 Dict({{"command", MessageValue::String("set")},
                       {"array", MessageValue::MakeArray({MessageValue::String("a"),
                                                          MessageValue::Uint64(1),
                                                          MessageValue::Null()})}})},
        ReadCase{R"({"outer": {"limit": {"$uint64": "3"}}})",
                 Dict({{"outer", Dict({{"limit", MessageValue::Uint64(3)}})}})}));

struct RefusedCase {
  const char* json;
  const char* named_in_error;
};

void PrintTo(const RefusedCase& c, std::ostream* os) { *os << c.json; }

class JsonRefusedTest : public ::testing::TestWithParam<RefusedCase> {};

TEST_P(JsonRefusedTest, RefusesWithAReasonNamingTheMember) {
  std::string error;
  EXPECT_FALSE(MessageValueFromJsonText(GetParam().json, &error)) << GetParam().json;
  EXPECT_NE(error.find(GetParam().named_in_error), std::string::npos) << error;
}

INSTANTIATE_TEST_SUITE_P(
    Errors, JsonRefusedTest,
    ::testing::Values(RefusedCase{"{\"command\": ", "not valid JSON"},
                      RefusedCase{R"({"$uint64": "-1"})", "$uint64"},
                      RefusedCase{R"({"$uint64": "18446744073709551616"})", "$uint64"},
                      RefusedCase{R"({"$uint64": "5x"})", "$uint64"},
                      RefusedCase{R"({"$uint64": ""})", "$uint64"},
                      RefusedCase{R"({"$int64": "9223372036854775808"})", "$int64"},
                      RefusedCase{R"({"$int64": 9223372036854775808})", "$int64"},
                      RefusedCase{R"({"$double": "many"})", "$double"},
                      RefusedCase{R"({"$data": "AP8"})", "$data"},
                      RefusedCase{R"({"$data": 5})", "$data"},
                      RefusedCase{R"({"$dictionary": [1]})", "$dictionary"},
                      RefusedCase{R"({"$unit64": "5"})", "$unit64"},
                      RefusedCase{R"({"a": [0, {"limit": {"$uint64": "x"}}]})",
                                  "/a/1/limit/$uint64"}));

// Printing then reading gives the same value back, for every kind and the awkward cases
// (non-negative int64, non-finite doubles, a dictionary whose only key looks like an escape).
TEST(JsonRoundTripTest, PrintedValuesReadBackUnchanged) {
  const MessageValue values[] = {
      MessageValue::Null(),
      MessageValue::Bool(false),
      MessageValue::Uint64(UINT64_MAX),
      MessageValue::Int64(INT64_MIN),
      MessageValue::Int64(0),
      MessageValue::Int64(42),
      MessageValue::Double(5.0),
      MessageValue::Double(-0.25),
      MessageValue::Double(std::numeric_limits<double>::infinity()),
      MessageValue::String("👍🏽 \"quoted\" \\ / \n"),
      MessageValue::Data({0, 1, 2, 253, 254, 255}),
      Dict({{"$uint64", MessageValue::String("not an escape")}}),
      Dict({{"$dictionary", Dict({})}}),
      Dict({{"array", MessageValue::MakeArray({MessageValue::Data({}), MessageValue::Null(),
                                               Dict({{"$data", MessageValue::Uint64(1)}})})},
            {"transactionID", MessageValue::Uint64(9)}}),
  };
  for (const MessageValue& value : values) {
    for (bool pretty : {false, true}) {
      const std::string text = JsonText(JsonFromMessageValue(value), pretty);
      std::string error;
      std::optional<MessageValue> back = MessageValueFromJsonText(text, &error);
      ASSERT_TRUE(back) << text << ": " << error;
      EXPECT_EQ(*back, value) << text;
    }
  }
}

TEST(JsonRoundTripTest, NanReadsBackAsNan) {
  const std::string text =
      JsonText(JsonFromMessageValue(MessageValue::Double(std::nan(""))), false);
  std::optional<MessageValue> back = MessageValueFromJsonText(text, nullptr);
  ASSERT_TRUE(back && back->AsDouble()) << text;
  EXPECT_TRUE(std::isnan(*back->AsDouble()));
}

TEST(JsonTextTest, InvalidUtf8IsReplacedNotFatal) {
  const std::string text = JsonText(JsonFromMessageValue(MessageValue::String("a\xFF" "b")), false);
  EXPECT_EQ(text, "\"a\xEF\xBF\xBD" "b\"");
}

struct Base64Case {
  std::string bytes;
  const char* text;
};

// The test vectors of RFC 4648, section 10.
TEST(Base64Test, EncodesAndDecodesTheStandardVectors) {
  const Base64Case cases[] = {{"", ""},          {"f", "Zg=="},         {"fo", "Zm8="},
                              {"foo", "Zm9v"},   {"foob", "Zm9vYg=="},  {"fooba", "Zm9vYmE="},
                              {"foobar", "Zm9vYmFy"}};
  for (const Base64Case& c : cases) {
    const std::vector<std::uint8_t> bytes(c.bytes.begin(), c.bytes.end());
    EXPECT_EQ(EncodeBase64(bytes), c.text);
    EXPECT_EQ(DecodeBase64(c.text), bytes) << c.text;
  }
}

TEST(Base64Test, EveryByteValueRoundTrips) {
  std::vector<std::uint8_t> bytes;
  for (int i = 0; i < 256; ++i) bytes.push_back(static_cast<std::uint8_t>(i));
  for (std::size_t length = 0; length <= bytes.size(); length += 37) {
    const std::vector<std::uint8_t> part(bytes.begin(), bytes.begin() + length);
    EXPECT_EQ(DecodeBase64(EncodeBase64(part)), part) << length;
  }
}

TEST(Base64Test, RefusesMalformedText) {
  for (const char* text : {"Zg", "Zg=", "Z===", "Zm9v!A==", "Zg==Zg==", "Zh==", "Zm9=", "=Zm9"}) {
    EXPECT_FALSE(DecodeBase64(text)) << text;
  }
}

}  // namespace
}  // namespace lumeris::cli
