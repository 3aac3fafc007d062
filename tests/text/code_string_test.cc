#include "text/code_string.h"

#include <gtest/gtest.h>

#include <string>

#include "text/unicode_strings.h"

namespace lumeris {
namespace {

using testing::Scalars;
using testing::Units;

struct CodeStringCase {
  const char16_t* typed;
  std::optional<icu::UnicodeString> expected;
};

void ExpectDecodes(const CodeStringCase& c) {
  std::string typed;
  icu::UnicodeString(c.typed).toUTF8String(typed);
  EXPECT_EQ(StringFromUnicodeCodeString(icu::UnicodeString(c.typed)), c.expected)
      << "typed: \"" << typed << '"';
}

TEST(StringFromUnicodeCodeString, DecodesTheDocumentedExamples) {
  const CodeStringCase cases[] = {
      {u"U+1F44D", Scalars({0x1F44D})},
      {u"u+1f44d", Scalars({0x1F44D})},
      {u"1F44D", Scalars({0x1F44D})},
      {u"0x1F44D", Scalars({0x1F44D})},
      {u"D83D DC4D", Scalars({0x1F44D})},
      {u"D83D+DC4D", Scalars({0x1F44D})},
      {u"E2 9C 88", Scalars({0x2708})},
      {u"41,42", Scalars({0x41, 0x42})},
      {u"U+0041 U+0042", Scalars({0x41, 0x42})},
      {u"41 00 42", Scalars({0x41})},
      {u"41 zz 42", Scalars({0x41})},
      {u"1F44D 1F3FD", std::nullopt},
      {u"0", std::nullopt},
      {u"110000", std::nullopt},
      {u"", std::nullopt},
  };
  for (const CodeStringCase& c : cases) ExpectDecodes(c);
}

TEST(StringFromUnicodeCodeString, ReadsSingleNumbers) {
  const CodeStringCase cases[] = {
      {u"10FFFF", Scalars({0x10FFFF})},
      {u"C3", Scalars({0xC3})},
      {u"\t 1f44d \n", Scalars({0x1F44D})},
      {u"0X41", Scalars({0x41})},
      {u"U+0x41", Scalars({0x41})},
      {u"D800", Units({0xD800})},                 // a lone surrogate is kept
      {u"4010000", Units({0xD800, 0xDC00})},      // wraps through the 32-bit surrogate test
      {u"FFFFFFFFFF", std::nullopt},              // overflow reads as 0xFFFFFFFF
      {u"1F44Dz", std::nullopt},                  // only white space may follow
      {u"0x", std::nullopt},                      // "0" then "x" left over
      {u"zz", std::nullopt},
      {u"   ", std::nullopt},
      {u"u+", std::nullopt},
  };
  for (const CodeStringCase& c : cases) ExpectDecodes(c);
}

TEST(StringFromUnicodeCodeString, JoinsSurrogateHalvesByTheirLow16Bits) {
  const CodeStringCase cases[] = {
      {u"1D83D 1DC4D", Scalars({0x1F44D})},
      {u"U+D83D U+DC4D", Scalars({0x1F44D})},
      {u"d83d,dc4d", Scalars({0x1F44D})},
      {u"DC4D D83D", std::nullopt},
      {u"D83D DC4D 41", std::nullopt},
      // A later separator's pair replaces the earlier one.
      {u"D83D+DC4D,DC00", Scalars({0x1F400})},
  };
  for (const CodeStringCase& c : cases) ExpectDecodes(c);
}

TEST(StringFromUnicodeCodeString, DecodesByteListsAsUtf8) {
  const CodeStringCase cases[] = {
      {u"C3 A9", Scalars({0xE9})},
      {u"F0 9F 91 8D", Scalars({0x1F44D})},
      {u"41,,42", Scalars({0x41, 0x42})},
      {u"41+42+", Scalars({0x41, 0x42})},
      {u"41 +42", Scalars({0x41, 0x42})},
      {u"00 41", icu::UnicodeString()},  // the first byte ends the text: empty, not none
      {u"C3 28", std::nullopt},          // invalid UTF-8
      {u"ED A0 80", std::nullopt},       // an encoded surrogate
      {u"C0 80", std::nullopt},          // an overlong form
      {u"E2 9C", std::nullopt},          // a truncated sequence
      {u"41 100", std::nullopt},         // a number above 0xFF abandons the byte reading
      // A byte list never replaces the result of an earlier separator.
      {u"41+42,43", Scalars({0x41, 0x42})},
  };
  for (const CodeStringCase& c : cases) ExpectDecodes(c);
}

TEST(StringFromUnicodeCodeString, ReadsAtMostFortyNumbers) {
  icu::UnicodeString typed;
  for (int i = 0; i < 45; ++i) typed.append(i % 2 ? u"41 " : u"42 ");
  icu::UnicodeString expected;
  for (int i = 0; i < 40; ++i) expected.append(i % 2 ? u'A' : u'B');
  EXPECT_EQ(StringFromUnicodeCodeString(typed), expected);
}

}  // namespace
}  // namespace lumeris
