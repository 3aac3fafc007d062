// Property-list values and their binary/XML encodings.
#include <gtest/gtest.h>

#include <cstdint>
#include <fstream>
#include <limits>
#include <string>
#include <vector>

#include "platform/property_list.h"
#include "platform/property_list_io.h"
#include "support/temp_dir.h"

namespace lumeris::plist {
namespace {

enum class Format { kBinary, kXml };

std::optional<Value> RoundTrip(const Value& value, Format format) {
  if (format == Format::kBinary) return ParsePropertyList(SerializeBinaryPropertyList(value));
  std::string xml = SerializeXmlPropertyList(value);
  return ParsePropertyList(std::span(reinterpret_cast<const std::uint8_t*>(xml.data()), xml.size()));
}

std::span<const std::uint8_t> Bytes(std::string_view text) {
  return {reinterpret_cast<const std::uint8_t*>(text.data()), text.size()};
}

Value Nested(int depth) {
  Value value = Array{};
  for (int i = 0; i < depth; ++i) value = Array{value};
  return value;
}

// `count` distinct strings that all end alike, as entity IDs do.
Value ManyStrings(int count) {
  Array array;
  for (int i = 0; i < count; ++i) array.emplace_back("\u65e5" + std::to_string(i) + "\"}");
  return array;
}

std::vector<std::pair<const char*, Value>> RoundTripCases() {
  return {
      {"long_strings", Value(Array{std::string(300, 'a'), "\u00e9" + std::string(20, 'b')})},
      {"two_byte_references", ManyStrings(300)}, {"four_byte_references", ManyStrings(70000)},
      {"empty_string", Value()}, {"ascii_string", Value("Sorvendi")},
      {"non_ascii_string", Value("caf\u00e9 \u65e5\u672c \U0001F600")},
      {"zero", Value(0)}, {"small_int", Value(255)}, {"two_byte_int", Value(256)},
      {"four_byte_int", Value(std::int64_t{1} << 31)}, {"large_int", Value(std::int64_t{1} << 40)},
      {"negative_int", Value(-1)}, {"int64_min", Value(INT64_MIN)}, {"int64_max", Value(INT64_MAX)},
      {"real", Value(0.1)}, {"negative_real", Value(-1.5e300)}, {"true", Value(true)}, {"false", Value(false)},
      {"date", Value(Date{725846400})}, {"date_before_epoch", Value(Date{-86400 * 365})},
      {"empty_data", Value(Data{})}, {"data", Value(Data{0, 1, 0xfe, 0xff, 0x80})},
      {"empty_array", Value(Array{})}, {"empty_dictionary", Value(Dictionary{})},
      {"mixed_array", Value(Array{1, "two", 3.5, true, Data{9}})},
      {"deep_nesting_within_limit", Nested(255)},
      {"nested", Value(Dictionary{{"recents", Array{"\U0001F600", "\u2764\uFE0F"}}, {"flag", false}, {"when", Date{1.0}},
                                  {"skin", Dictionary{{"\U0001F44D", 3}, {"deep", Dictionary{{"x", Array{Array{}}}}}}}})},
  };
}

class PropertyListRoundTrip : public ::testing::TestWithParam<Format> {};

TEST_P(PropertyListRoundTrip, EveryTypeSurvivesUnchanged) {
  for (const auto& [name, value] : RoundTripCases()) {
    SCOPED_TRACE(name);
    EXPECT_EQ(RoundTrip(value, GetParam()), value);
  }
}

// The writers never shorten or alter a string: a value holding one that is not well-formed
// UTF-8 or holds NUL is not written at all.
TEST_P(PropertyListRoundTrip, StringsThatCannotBeKeptWholeAreNotWritten) {
  for (const std::string& text : {std::string("a\0b", 3), std::string("cut\xFF"), std::string("\xED\xA0\x80")}) {
    for (const Value& value : {Value(text), Value(Array{"ok", text}), Value(Dictionary{{text, 1}})}) {
      EXPECT_TRUE(GetParam() == Format::kBinary ? SerializeBinaryPropertyList(value).empty()
                                                : SerializeXmlPropertyList(value).empty());
    }
  }
}

INSTANTIATE_TEST_SUITE_P(Formats, PropertyListRoundTrip, ::testing::Values(Format::kBinary, Format::kXml),
                         [](const auto& info) { return info.param == Format::kBinary ? "Binary" : "Xml"; });

TEST(PropertyListIo, BinaryDatesKeepSubSecondPrecisionOnBothSidesOfTheEpoch) {
  for (double seconds : {725846400.25, 0.5, 1.000001, -1.25, -86400.5, -700000000.75}) {
    SCOPED_TRACE(seconds);
    const Value back = RoundTrip(Date{seconds}, Format::kBinary).value_or(Value());
    ASSERT_NE(back.AsDate(), nullptr);
    EXPECT_NEAR(back.AsDate()->seconds_since_2001, seconds, 1e-6);
  }
}

// A wrong-typed value reads as absent; equality is deep and never converts between types.
TEST(PropertyListValue, AccessorsAndEqualityAreTypeStrict) {
  const Value integer = 7;
  EXPECT_TRUE(integer.AsString() == nullptr && integer.AsReal() == nullptr && integer.Find("x") == nullptr);
  EXPECT_EQ(*integer.AsInteger(), 7);
  EXPECT_NE(Value(1), Value(1.0));
  EXPECT_NE(Value(1), Value(true));
  EXPECT_NE(Value("1"), Value(1));
  EXPECT_NE(Value(Dictionary{{"a", Array{1, 2}}}), Value(Dictionary{{"a", Array{2, 1}}}));
}

TEST(PropertyListIo, ReadsXmlWrittenByOtherTools) {
  constexpr std::string_view kXml = R"(<?xml version="1.0" encoding="UTF-8"?>
<!DOCTYPE plist PUBLIC "-//Apple//DTD PLIST 1.0//EN" "http://www.apple.com/DTDs/PropertyList-1.0.dtd">
<plist version="1.0">
<dict>
  <key>CFBundleIdentifier</key><string>com.vantorel.Sorvendi</string> <key>Count</key><integer>-42</integer>
  <key>Scale</key><real>2.5</real> <key>Enabled</key><true/> <key>Blob</key><data>AAEC</data>
</dict>
</plist>
)";
  EXPECT_EQ(ParsePropertyList(Bytes(kXml)), Value(Dictionary{{"CFBundleIdentifier", "com.vantorel.Sorvendi"},
                                                             {"Count", -42}, {"Scale", 2.5}, {"Enabled", true},
                                                             {"Blob", Data{0, 1, 2}}}));
}

TEST(PropertyListIo, ReadsFilesAndMissingOnesReadAsNothing) {
  testing::ScopedTempDir dir;
  Value value = Dictionary{{"k", Array{"x", 2}}};
  std::vector<std::uint8_t> bytes = SerializeBinaryPropertyList(value);
  std::ofstream(dir.path() / "a.plist", std::ios::binary).write(reinterpret_cast<const char*>(bytes.data()),
                                                              static_cast<std::streamsize>(bytes.size()));
  EXPECT_EQ(ReadPropertyListFile(dir.path() / "a.plist"), value);
  EXPECT_FALSE(ReadPropertyListFile(dir.path() / "absent.plist").has_value());
  EXPECT_FALSE(ReadPropertyListFile(dir.path()).has_value());
}

// Error paths: nothing that fails to parse crashes or yields a value.
TEST(PropertyListIoErrors, UnparsableInputReadsAsNothing) {
  std::vector<std::uint8_t> valid = SerializeBinaryPropertyList(Dictionary{{"key", Array{1, 2, 3}}});
  std::vector<std::uint8_t> truncated(valid.begin(), valid.begin() + static_cast<std::ptrdiff_t>(valid.size() / 2));
  std::vector<std::uint8_t> bad_trailer = valid;
  for (std::size_t i = bad_trailer.size() - 32; i < bad_trailer.size(); ++i) bad_trailer[i] = 0xff;
  const std::vector<std::pair<const char*, std::vector<std::uint8_t>>> cases = {
      {"empty", {}}, {"text", {'h', 'e', 'l', 'l', 'o'}}, {"magic_only", {'b', 'p', 'l', 'i', 's', 't', '0', '0'}},
      {"truncated_binary", truncated}, {"corrupt_trailer", bad_trailer},
      {"nesting_beyond_limit", SerializeBinaryPropertyList(Nested(257))},
  };
  for (const auto& [name, bytes] : cases) {
    SCOPED_TRACE(name);
    EXPECT_FALSE(ParsePropertyList(bytes).has_value());
  }
  for (std::string_view xml : {std::string_view("<plist><dict><key>a</key>"),
                               std::string_view("<?xml version=\"1.0\"?><plist><integer>1</plist>")}) {
    SCOPED_TRACE(xml);
    EXPECT_FALSE(ParsePropertyList(Bytes(xml)).has_value());
  }
}

}  // namespace
}  // namespace lumeris::plist
