// The list conversions: absent and empty lists, non-string elements.
#include "service/string_array.h"

#include <gtest/gtest.h>

namespace lumeris {
namespace {

using Strings = std::vector<std::string>;

TEST(CreateXPCArrayFromStringArray, EmptyOrAbsentListIsNull) {
  EXPECT_EQ(CreateXPCArrayFromStringArray(std::nullopt), MessageValue::Null());
  EXPECT_EQ(CreateXPCArrayFromStringArray(Strings{}), MessageValue::Null());
  EXPECT_EQ(CreateXPCArrayFromStringArray(Strings{"b", "", "a"}),
            MessageValue::MakeArray({MessageValue::String("b"), MessageValue::String(""),
                                     MessageValue::String("a")}));
}

TEST(StringArrayFromXPCArray, AbsentForNonArraysAndEmptyArraysEmptyForNoStrings) {
  struct Case {
    const char* name;
    std::optional<MessageValue> value;
    StringList expected;
  };
  const MessageValue a = MessageValue::String("a");
  const MessageValue b = MessageValue::String("b");
  const Case cases[] = {
      {"missing", std::nullopt, std::nullopt},
      {"null", MessageValue::Null(), std::nullopt},
      {"string", a, std::nullopt},
      {"dictionary", MessageValue::MakeDictionary({{"a", a}}), std::nullopt},
      {"empty array", MessageValue::MakeArray(), std::nullopt},
      {"only integers", MessageValue::MakeArray({MessageValue::Uint64(1), MessageValue::Int64(-1)}),
       Strings{}},
      {"strings kept in order", MessageValue::MakeArray({b, MessageValue::Null(), a,
                                                        MessageValue::MakeArray({a})}),
       Strings{"b", "a"}},
  };
  for (const Case& c : cases) {
    EXPECT_EQ(StringArrayFromXPCArray(c.value ? &*c.value : nullptr), c.expected) << c.name;
  }
}

TEST(StringArrayConversions, RoundTripKeepsNonEmptyLists) {
  const Strings list{"com.vantorel.lmk:{\"char\":\"x\"}", "\xff", "z"};
  MessageValue wire = CreateXPCArrayFromStringArray(list);
  EXPECT_EQ(StringArrayFromXPCArray(&wire), list);
}

}  // namespace
}  // namespace lumeris
