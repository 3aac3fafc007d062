#include "text/utf8.h"

#include <gtest/gtest.h>

#include <string>

#include "text/unicode_strings.h"

namespace lumeris {
namespace {

using testing::Scalars;
using testing::Units;

TEST(DecodeUtf8, DecodesWellFormedText) {
  EXPECT_EQ(DecodeUtf8(""), icu::UnicodeString());
  EXPECT_EQ(DecodeUtf8("A\xC3\xA9\xE2\x9C\x88\xF0\x9F\x91\x8D"),
            Scalars({0x41, 0xE9, 0x2708, 0x1F44D}));
  EXPECT_EQ(DecodeUtf8(std::string_view("a\0b", 3)), Scalars({0x61, 0, 0x62}));
}

TEST(DecodeUtf8Errors, RejectsIllFormedSequences) {
  const char* ill_formed[] = {
      "\x80",              // a lone continuation byte
      "\xC3",              // truncated
      "\xE2\x9C",          // truncated
      "\xC0\x80",          // overlong
      "\xE0\x80\x80",      // overlong
      "\xED\xA0\x80",      // an encoded surrogate
      "\xF4\x90\x80\x80",  // above U+10FFFF
      "\xF5\x80\x80\x80",  // not a lead byte
      "\xFF",              // never valid
      "ok\xC3(",           // a bad continuation after good text
  };
  for (const char* bytes : ill_formed) {
    EXPECT_FALSE(DecodeUtf8(bytes).has_value()) << bytes;
    EXPECT_TRUE(DecodeUtf8Lenient(bytes).indexOf(static_cast<char16_t>(0xFFFD)) >= 0) << bytes;
  }
}

TEST(EncodeUtf8, RoundTripsThroughDecode) {
  const icu::UnicodeString text = Scalars({0x41, 0xE9, 0x2708, 0x1F44D, 0x10FFFF});
  const std::optional<std::string> utf8 = EncodeUtf8(text);
  ASSERT_TRUE(utf8.has_value());
  EXPECT_EQ(DecodeUtf8(*utf8), text);
  EXPECT_EQ(EncodeUtf8Lenient(text), *utf8);
}

TEST(EncodeUtf8Errors, RejectsUnpairedSurrogatesUnlessLenient) {
  for (const icu::UnicodeString& text :
       {Units({0xD83D}), Units({0x41, 0xDC4D}), Units({0xDC4D, 0xD83D})}) {
    EXPECT_FALSE(EncodeUtf8(text).has_value()) << ::testing::PrintToString(text);
    EXPECT_NE(EncodeUtf8Lenient(text).find("\xEF\xBF\xBD"), std::string::npos);
  }
}

}  // namespace
}  // namespace lumeris
