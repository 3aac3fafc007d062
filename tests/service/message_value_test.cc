// MessageValue accessors (wrong-typed values read as absent, writes apply only to their kind) and
// the conversions of request strings and lists (absent versus empty lists, non-string elements).
#include "service/message_value.h"

#include <gtest/gtest.h>

#include <tuple>

#include "service/string_array.h"

namespace lumeris {
namespace {

using Strings = std::vector<std::string>;

TEST(MessageValue, GettersReadWrongTypesAndNonDictionariesAsAbsent) {
  MessageValue dictionary = MessageValue::MakeDictionary(
      {{"s", MessageValue::String("x")}, {"u", MessageValue::Uint64(4)}, {"i", MessageValue::Int64(-4)},
       {"d", MessageValue::DataFromBytes("b")}});
  EXPECT_EQ(*dictionary.GetString("s"), "x");
  EXPECT_EQ(dictionary.GetString("u"), nullptr);
  EXPECT_EQ(dictionary.GetString("missing"), nullptr);
  EXPECT_EQ(dictionary.GetUint64("u"), 4u);
  EXPECT_EQ(dictionary.GetUint64("i"), 0u);
  EXPECT_EQ(dictionary.GetUint64("s"), 0u);
  EXPECT_EQ(dictionary.GetData("s"), nullptr);
  EXPECT_EQ(*dictionary.GetData("d"), MessageValue::Bytes{'b'});
  for (const MessageValue& other : {MessageValue::Null(), MessageValue::String("s"),
                                    MessageValue::MakeArray({MessageValue::String("s")})}) {
    EXPECT_EQ(other.Find("s"), nullptr);
    EXPECT_EQ(other.GetString("s"), nullptr);
    EXPECT_EQ(other.GetUint64("u"), 0u);
  }
}

TEST(MessageValue, SetReplacesAndWritesApplyOnlyToTheirKind) {
  MessageValue dictionary = MessageValue::MakeDictionary();
  dictionary.Set("k", MessageValue::Uint64(1));
  dictionary.Set("k", MessageValue::String("two"));
  dictionary.Append(MessageValue::Null());
  EXPECT_EQ(dictionary, MessageValue::MakeDictionary({{"k", MessageValue::String("two")}}));
  MessageValue array = MessageValue::MakeArray();
  array.Set("k", MessageValue::Uint64(1));
  array.Append(MessageValue::Bool(true));
  EXPECT_EQ(array, MessageValue::MakeArray({MessageValue::Bool(true)}));
}

TEST(MessageValue, EqualityDistinguishesKindsWithEqualContent) {
  EXPECT_NE(MessageValue::Uint64(1), MessageValue::Int64(1));
  EXPECT_NE(MessageValue::String("a"), MessageValue::DataFromBytes("a"));
  EXPECT_NE(MessageValue::Null(), MessageValue::MakeArray());
  EXPECT_EQ(MessageValue(), MessageValue::Null());
}

// Every string the service takes from a request: kept only when it is well-formed UTF-8 without NUL.
TEST(StringArrayConversions, OnlyWellFormedUtf8WithoutNulConverts) {
  const std::pair<std::string, bool> cases[] = {
      {"", true}, {"plain", true}, {"\xF0\x9F\x98\x80", true}, {"\xff\xfe", false}, {std::string("a\0b", 3), false},
      {"\xED\xA0\x80", false}, {"\xC0\x80", false}, {"\xF0\x9F\x98", false}};
  for (const auto& [text, converts] : cases) {
    EXPECT_EQ(ConvertedString(&text), converts ? std::optional(text) : std::nullopt) << ::testing::PrintToString(text);
  }
  EXPECT_EQ(ConvertedString(nullptr), std::nullopt);
}

TEST(StringArrayConversions, EmptyOrAbsentListIsNullAndNonEmptyListsRoundTrip) {
  EXPECT_EQ(CreateXPCArrayFromStringArray(std::nullopt), MessageValue::Null());
  EXPECT_EQ(CreateXPCArrayFromStringArray(Strings{}), MessageValue::Null());
  const Strings list{"b", "", "com.vantorel.lmk:{\"char\":\"x\"}"};
  MessageValue wire = CreateXPCArrayFromStringArray(list);
  EXPECT_EQ(wire, MessageValue::MakeArray({MessageValue::String(list[0]), MessageValue::String(list[1]),
                                           MessageValue::String(list[2])}));
  EXPECT_EQ(StringArrayFromXPCArray(&wire), list);
}

TEST(StringArrayConversions, AbsentForNonArraysAndEmptyArraysEmptyForNoStrings) {
  const MessageValue a = MessageValue::String("a");
  const MessageValue b = MessageValue::String("b");
  const std::tuple<const char*, std::optional<MessageValue>, StringList> cases[] = {
      {"missing", std::nullopt, std::nullopt},
      {"null", MessageValue::Null(), std::nullopt},
      {"string", a, std::nullopt},
      {"dictionary", MessageValue::MakeDictionary({{"a", a}}), std::nullopt},
      {"empty array", MessageValue::MakeArray(), std::nullopt},
      {"only integers", MessageValue::MakeArray({MessageValue::Uint64(1), MessageValue::Int64(-1)}), Strings{}},
      {"strings kept in order", MessageValue::MakeArray({b, MessageValue::Null(), a, MessageValue::String("\xff")}),
       Strings{"b", "a"}},
  };
  for (const auto& [name, value, expected] : cases) {
    EXPECT_EQ(StringArrayFromXPCArray(value ? &*value : nullptr), expected) << name;
  }
}

}  // namespace
}  // namespace lumeris
