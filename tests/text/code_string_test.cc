// StringFromUnicodeCodeString: typed code strings and the text they denote, one table per rule.
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

void ExpectDecodes(std::initializer_list<CodeStringCase> cases) {
  for (const CodeStringCase& c : cases) {
    std::string typed;
    EXPECT_EQ(StringFromUnicodeCodeString(icu::UnicodeString(c.typed)), c.expected)
        << "typed: \"" << icu::UnicodeString(c.typed).toUTF8String(typed) << '"';
  }
}

const icu::UnicodeString kThumbs = Scalars({0x1F44D});
const icu::UnicodeString kA = Scalars({0x41});
const icu::UnicodeString kAB = Scalars({0x41, 0x42});

TEST(StringFromUnicodeCodeString, DecodesTheDocumentedExamples) {
  ExpectDecodes({{u"U+1F44D", kThumbs}, {u"u+1f44d", kThumbs}, {u"1F44D", kThumbs},
                 {u"0x1F44D", kThumbs}, {u"D83D DC4D", kThumbs}, {u"D83D+DC4D", kThumbs},
                 {u"E2 9C 88", Scalars({0x2708})}, {u"41,42", kAB}, {u"U+0041 U+0042", kAB},
                 {u"41 00 42", kA}, {u"41 zz 42", kA},
                 {u"1F44D 1F3FD", std::nullopt}, {u"0", std::nullopt}, {u"110000", std::nullopt},
                 {u"", std::nullopt}});
}

TEST(StringFromUnicodeCodeString, ReadsSingleNumbers) {
  ExpectDecodes({{u"10FFFF", Scalars({0x10FFFF})}, {u"C3", Scalars({0xC3})},
                 {u"\t 1f44d \n", kThumbs}, {u"0X41", kA}, {u"U+0x41", kA},
                 {u"D800", Units({0xD800})},             // a lone surrogate is kept
                 {u"4010000", Units({0xD800, 0xDC00})},  // wraps through the 32-bit surrogate test
                 {u"FFFFFFFFFF", std::nullopt},          // overflow reads as 0xFFFFFFFF
                 {u"1F44Dz", std::nullopt},              // only white space may follow
                 {u"0x", std::nullopt},                  // "0" then "x" left over
                 {u"zz", std::nullopt}, {u"   ", std::nullopt}, {u"u+", std::nullopt}});
}

TEST(StringFromUnicodeCodeString, JoinsSurrogateHalvesByTheirLow16Bits) {
  ExpectDecodes({{u"1D83D 1DC4D", kThumbs}, {u"U+D83D U+DC4D", kThumbs}, {u"d83d,dc4d", kThumbs},
                 {u"DC4D D83D", std::nullopt}, {u"D83D DC4D 41", std::nullopt},
                 // A later separator's pair replaces the earlier one.
                 {u"D83D+DC4D,DC00", Scalars({0x1F400})}});
}

TEST(StringFromUnicodeCodeString, DecodesByteListsAsUtf8) {
  ExpectDecodes({{u"C3 A9", Scalars({0xE9})}, {u"F0 9F 91 8D", kThumbs}, {u"41,,42", kAB},
                 {u"41+42+", kAB}, {u"41 +42", kAB},
                 {u"00 41", icu::UnicodeString()},  // the first byte ends the text: empty, not none
                 {u"C3 28", std::nullopt},          // invalid UTF-8
                 {u"ED A0 80", std::nullopt},       // an encoded surrogate
                 {u"C0 80", std::nullopt},          // an overlong form
                 {u"E2 9C", std::nullopt},          // a truncated sequence
                 {u"41 100", std::nullopt},         // above 0xFF: no byte reading at all
                 {u"41+42,43", kAB},                // never replaces an earlier separator's result
                 // At most forty numbers are read: 45 here.
                 {u"42 41 42 41 42 41 42 41 42 41 42 41 42 41 42 41 42 41 42 41 42 41 42 41 42 41 42 41 42 41 "
                  u"42 41 42 41 42 41 42 41 42 41 42 41 42 41 42",
                  icu::UnicodeString(u"BABABABABABABABABABABABABABABABABABABABA")}});
}

}  // namespace
}  // namespace lumeris
