// The "Data" notation of the category property lists: what the builder writes reads back as the
// same characters, joined strings stay valid, and anything else is refused.
#include "categories/data_notation.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace lumeris {
namespace {

TEST(DataNotationTest, RoundTripsEveryKindOfCharacter) {
  const std::vector<std::u32string> characters = {
      U"A", U"B", U"C", U"D",                   // a run becomes a range
      U",",                                     // the separator itself
      U"e\u0301",                               // a letter with a combining mark
      U"\u0301",                                // a lone combining mark
      U"\U0001F44D\U0001F3FD",                  // skin-tone sequence
      U"\U0001F1E9\U0001F1EA",                  // flag
      U"#\uFE0F\u20E3",                         // keycap
      U"\U0001F468\u200D\U0001F469\u200D\U0001F467",  // family
      U"\U00010000", U"\U0010FFFD",
  };
  std::string data = FormatDataString(characters);
  EXPECT_EQ(data.find_first_not_of("0123456789ABCDEF,+-"), std::string::npos) << data;
  EXPECT_EQ(ParseDataString(data), characters);
  // Joined strings denote the concatenation.
  const std::vector<std::u32string> first(characters.begin(), characters.begin() + 6), rest(characters.begin() + 6, characters.end());
  EXPECT_EQ(ParseDataString(FormatDataString(first) + "," + FormatDataString(rest)), characters);
}

TEST(DataNotationTest, RejectsMalformedStrings) {
  for (const char* data : {"41", "0041,", ",0041", "0041--0042", "0042-0041", "0041++0042", "00g1", "0041 0042",
                           "D800", "110000", "0041+"}) {
    EXPECT_FALSE(ParseDataString(data)) << data;
  }
  EXPECT_EQ(ParseDataString(""), std::vector<std::u32string>{});
}

}  // namespace
}  // namespace lumeris
