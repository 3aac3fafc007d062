// MessageValue accessors: wrong-typed values read as absent, writes only apply to their kind.
#include "service/message_value.h"

#include <gtest/gtest.h>

namespace lumeris {
namespace {

TEST(MessageValue, DictionaryGettersReadWrongTypesAsAbsent) {
  MessageValue dictionary = MessageValue::MakeDictionary({
      {"s", MessageValue::String("x")},
      {"u", MessageValue::Uint64(4)},
      {"i", MessageValue::Int64(-4)},
      {"d", MessageValue::DataFromBytes("b")},
  });
  EXPECT_EQ(*dictionary.GetString("s"), "x");
  EXPECT_EQ(dictionary.GetString("u"), nullptr);
  EXPECT_EQ(dictionary.GetString("missing"), nullptr);
  EXPECT_EQ(dictionary.GetUint64("u"), 4u);
  EXPECT_EQ(dictionary.GetUint64("i"), 0u);
  EXPECT_EQ(dictionary.GetUint64("s"), 0u);
  EXPECT_EQ(dictionary.GetData("s"), nullptr);
  EXPECT_EQ(*dictionary.GetData("d"), MessageValue::Bytes{'b'});

  // Every getter on a value that is not a dictionary reads as absent.
  for (const MessageValue& other : {MessageValue::Null(), MessageValue::String("s"),
                                    MessageValue::MakeArray({MessageValue::String("s")})}) {
    EXPECT_EQ(other.Find("s"), nullptr);
    EXPECT_EQ(other.GetString("s"), nullptr);
    EXPECT_EQ(other.GetUint64("u"), 0u);
  }
}

TEST(MessageValue, SetReplacesAndAppliesOnlyToDictionaries) {
  MessageValue dictionary = MessageValue::MakeDictionary();
  dictionary.Set("k", MessageValue::Uint64(1));
  dictionary.Set("k", MessageValue::String("two"));
  EXPECT_EQ(dictionary, MessageValue::MakeDictionary({{"k", MessageValue::String("two")}}));

  MessageValue array = MessageValue::MakeArray();
  array.Set("k", MessageValue::Uint64(1));
  array.Append(MessageValue::Bool(true));
  EXPECT_EQ(array, MessageValue::MakeArray({MessageValue::Bool(true)}));
  dictionary.Append(MessageValue::Null());
  EXPECT_EQ(dictionary.AsDictionary()->size(), 1u);
}

TEST(MessageValue, EqualityDistinguishesKindsWithEqualNumbers) {
  EXPECT_NE(MessageValue::Uint64(1), MessageValue::Int64(1));
  EXPECT_NE(MessageValue::String("a"), MessageValue::DataFromBytes("a"));
  EXPECT_NE(MessageValue::Null(), MessageValue::MakeArray());
  EXPECT_EQ(MessageValue(), MessageValue::Null());
}

TEST(MessageValue, DescribeEscapesBytesAndShowsKinds) {
  MessageValue value = MessageValue::MakeDictionary({
      {"a", MessageValue::MakeArray({MessageValue::Int64(-2), MessageValue::Null()})},
      {"b", MessageValue::String("q\"\n\xff")},
      {"c", MessageValue::DataFromBytes("\x01\xab")},
  });
  EXPECT_EQ(value.Describe(), R"({"a":[-2,null],"b":"q\"\x0a\xff","c":<01ab>})");
}

}  // namespace
}  // namespace lumeris
