// Unit tests of the resource builder's parsers and encoders on small inline inputs.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "resource_builder/character_info.h"
#include "resource_builder/cldr_annotations.h"
#include "resource_builder/cldr_labels.h"
#include "resource_builder/emoji_test.h"
#include "resource_builder/related_chars.h"
#include "resource_builder/ucd_format.h"
#include "resource_builder/unicode_data.h"
#include "resource_builder/unihan.h"
#include "resource_builder/utf8.h"
#include "resource_builder/zhuyin.h"

namespace lumeris::resources {
namespace {

constexpr std::string_view kUnicodeData =
    "0000;<control>;Cc;0;BN;;;;;N;NULL;;;;\n"
    "0041;LATIN CAPITAL LETTER A;Lu;0;L;;;;;N;;;;0061;\n"
    "0061;LATIN SMALL LETTER A;Ll;0;L;;;;;N;;;0041;;0041\n"
    "00C0;LATIN CAPITAL LETTER A WITH GRAVE;Lu;0;L;0041 0300;;;;N;;;;00E0;\n"
    "00E0;LATIN SMALL LETTER A WITH GRAVE;Ll;0;L;0061 0300;;;;N;;;00C0;;00C0\n"
    "0300;COMBINING GRAVE ACCENT;Mn;230;NSM;;;;;N;;;;;\n"
    "24B6;CIRCLED LATIN CAPITAL LETTER A;So;0;L;<circle> 0041;;;;N;;;;24D0;\n"
    "24D0;CIRCLED LATIN SMALL LETTER A;So;0;L;<circle> 0061;;;;N;;;24B6;;24B6\n"
    "3392;SQUARE MHZ;So;0;L;<square> 004D 0048 007A;;;;N;;;;;\n"
    "this line is not a record\n"
    "4E00;<CJK Ideograph, First>;Lo;0;L;;;;;N;;;;;\n"
    "4E02;<CJK Ideograph, Last>;Lo;0;L;;;;;N;;;;;\n"
    "AC00;<Hangul Syllable, First>;Lo;0;L;;;;;N;;;;;\n"
    "AC01;<Hangul Syllable, Last>;Lo;0;L;;;;;N;;;;;\n"
    "D800;<Non Private Use High Surrogate, First>;Cs;0;L;;;;;N;;;;;\n"
    "DB7F;<Non Private Use High Surrogate, Last>;Cs;0;L;;;;;N;;;;;\n"
    "E000;<Private Use, First>;Co;0;L;;;;;N;;;;;\n"
    "F8FF;<Private Use, Last>;Co;0;L;;;;;N;;;;;\n";

class UnicodeDataTest : public ::testing::Test {
 protected:
  UnicodeCharacterTable table_ = ParseUnicodeData(kUnicodeData);
  std::string NameOf(char32_t cp) const {
    const CodePointRecord* record = table_.Find(cp);
    return record ? record->name : "<missing>";
  }
};

TEST_F(UnicodeDataTest, RangesExpandWithDerivedNames) {
  EXPECT_EQ(NameOf(0x4E00), "CJK UNIFIED IDEOGRAPH-4E00");
  EXPECT_EQ(NameOf(0x4E01), "CJK UNIFIED IDEOGRAPH-4E01");
  EXPECT_EQ(NameOf(0x4E02), "CJK UNIFIED IDEOGRAPH-4E02");
  EXPECT_EQ(NameOf(0xAC01), "HANGUL SYLLABLE GAG");
  EXPECT_EQ(table_.Find(0x4E03), nullptr);
}

TEST_F(UnicodeDataTest, ListsNeitherSurrogatesNorPrivateUse) {
  size_t listed = 0;
  for (const CodePointRecord& record : table_.records()) listed += IsListedCharacter(record) ? 1 : 0;
  // 9 single records + 3 ideographs + 2 syllables; the malformed line is skipped.
  EXPECT_EQ(listed, 14u);
  ASSERT_NE(table_.Find(0xE000), nullptr);
  EXPECT_FALSE(IsListedCharacter(*table_.Find(0xE000)));
  EXPECT_FALSE(IsListedCharacter(*table_.Find(0xD800)));
}

TEST_F(UnicodeDataTest, ControlsHaveNoNameButKeepCaseMappings) {
  EXPECT_EQ(NameOf(0x0000), "");
  EXPECT_EQ(table_.Find(U'a')->simple_uppercase, U'A');
  EXPECT_EQ(table_.Find(U'A')->simple_lowercase, U'a');
}

TEST(HangulNameTest, FollowsTheUnicodeAlgorithm) {
  struct Case {
    char32_t cp;
    const char* name;
  };
  for (const Case& c : {Case{0xAC00, "HANGUL SYLLABLE GA"}, Case{0xD7A3, "HANGUL SYLLABLE HIH"},
                        Case{0xD4DB, "HANGUL SYLLABLE PWILH"}, Case{0xC544, "HANGUL SYLLABLE A"}}) {
    EXPECT_EQ(HangulSyllableName(c.cp).value_or("<none>"), c.name) << std::hex << static_cast<unsigned>(c.cp);
  }
  EXPECT_FALSE(HangulSyllableName(0xABFF));
  EXPECT_FALSE(HangulSyllableName(0xD7A4));
}

TEST(UcdFormatTest, RangesAndSingleCodePoints) {
  std::vector<CodePointRange> ranges = ParseCodePointRanges(
      "# comment\n0000..007F; Basic Latin\n\n00AA          ; Latin # Lo FEMININE\nZZZZ..0001; Bad\n0010..0005; Backwards\n");
  ASSERT_EQ(ranges.size(), 2u);
  EXPECT_EQ(ranges[0].first, 0u);
  EXPECT_EQ(ranges[0].last, 0x7Fu);
  EXPECT_EQ(ranges[0].value, "Basic Latin");
  EXPECT_EQ(ranges[1].first, 0xAAu);
  EXPECT_EQ(ranges[1].last, 0xAAu);
  EXPECT_EQ(ranges[1].value, "Latin");
}

TEST(UcdFormatTest, CodePointSequences) {
  EXPECT_EQ(ParseCodePointSequence("1F44D 1F3FD"), std::u32string(U"\U0001F44D\U0001F3FD"));
  EXPECT_FALSE(ParseCodePointSequence(""));
  EXPECT_FALSE(ParseCodePointSequence("110000"));
  EXPECT_FALSE(ParseCodePointSequence("12G4"));
}

TEST(NameAliasTest, KeepsFileOrderPerCodePoint) {
  auto aliases = ParseNameAliases("0000;NULL;control\n0000;NUL;abbreviation\n01A2;LATIN CAPITAL LETTER GHA;correction\n");
  ASSERT_EQ(aliases[0].size(), 2u);
  EXPECT_EQ(aliases[0][1].alias, "NUL");
  EXPECT_EQ(aliases[0][1].type, "abbreviation");
  EXPECT_EQ(aliases[0x1A2][0].type, "correction");
}

TEST(UnihanTest, KeepsOnlyRequestedFields) {
  UnihanTable table;
  std::string_view fields[] = {"kMandarin", "kDefinition"};
  AddUnihanRecords("# header\nU+5FC3\tkMandarin\txīn\nU+5FC3\tkCantonese\tsam1\nU+5FC3\tkDefinition\theart; mind\n"
                   "U+ZZZZ\tkMandarin\tbad\nU+6C34\tkMandarin\n",
                   fields, table);
  EXPECT_EQ(table.Field(U'心', "kMandarin"), "xīn");
  EXPECT_EQ(table.Field(U'心', "kDefinition"), "heart; mind");
  EXPECT_EQ(table.Field(U'心', "kCantonese"), "");
  EXPECT_EQ(table.entries().size(), 1u);
}

TEST(UnihanTest, VariantValuesDropSourceAnnotations) {
  EXPECT_EQ(ParseUnihanCodePoints("U+53D1<kMatthews,kMeyerWempe U+5F42 junk"), (std::vector<char32_t>{0x53D1, 0x5F42}));
  EXPECT_TRUE(ParseUnihanCodePoints("").empty());
}

TEST(ZhuyinTest, ConvertsTonedPinyinSyllables) {
  struct Case {
    const char* pinyin;
    const char* zhuyin;
  };
  const Case cases[] = {
      {"xīn", "ㄒㄧㄣ"},  {"shuǐ", "ㄕㄨㄟˇ"}, {"lǜ", "ㄌㄩˋ"},   {"zhī", "ㄓ"},   {"sì", "ㄙˋ"},
      {"yuè", "ㄩㄝˋ"}, {"wǒ", "ㄨㄛˇ"},   {"jiǔ", "ㄐㄧㄡˇ"}, {"qù", "ㄑㄩˋ"}, {"lùn", "ㄌㄨㄣˋ"},
      {"ér", "ㄦˊ"},    {"ma", "˙ㄇㄚ"},   {"yīng", "ㄧㄥ"},  {"xióng", "ㄒㄩㄥˊ"}, {"wēng", "ㄨㄥ"},
  };
  for (const Case& c : cases) EXPECT_EQ(PinyinToZhuyin(c.pinyin).value_or("<none>"), c.zhuyin) << c.pinyin;
}

TEST(ZhuyinTest, RejectsWhatIsNotPinyin) {
  for (const char* text : {"", "q", "xyz", "ab1", "心"}) EXPECT_FALSE(PinyinToZhuyin(text)) << text;
}

constexpr std::string_view kAnnotations = R"(<?xml version="1.0" encoding="UTF-8" ?>
<ldml><annotations>
  <annotation cp="😀">face | grin | grinning face</annotation>
  <annotation cp="😀" type="tts">grinning face</annotation>
  <annotation cp="|">bar | pipe</annotation>
  <annotation cp="x">↑↑↑</annotation>
</annotations></ldml>)";

TEST(CldrAnnotationsTest, SplitsKeywordsAndNames) {
  CldrAnnotations annotations;
  ASSERT_TRUE(AddCldrAnnotations(kAnnotations, annotations));
  EXPECT_EQ(annotations.at("😀").name, "grinning face");
  EXPECT_EQ(annotations.at("😀").keywords, (std::vector<std::string>{"face", "grin", "grinning face"}));
  EXPECT_EQ(annotations.at("|").keywords, (std::vector<std::string>{"bar", "pipe"}));
  EXPECT_FALSE(annotations.contains("x"));
  EXPECT_FALSE(AddCldrAnnotations("<ldml><unclosed>", annotations));
}

TEST(CldrLabelsTest, ReadsLabelsScriptsAndPatterns) {
  std::optional<CldrLocaleTexts> texts = ParseCldrLocaleTexts(R"(<ldml>
    <localeDisplayNames><scripts><script type="Latn">Lateinisch</script>
      <script type="Latn" alt="short">Latein</script></scripts></localeDisplayNames>
    <characterLabels>
      <characterLabelPattern type="enclosed">{0} — umschlossen</characterLabelPattern>
      <characterLabelPattern type="strokes" count="one">{0} Strich</characterLabelPattern>
      <characterLabel type="arrows">Pfeil</characterLabel>
      <characterLabel type="braille">↑↑↑</characterLabel>
    </characterLabels></ldml>)");
  ASSERT_TRUE(texts);
  EXPECT_EQ(texts->script_names.at("Latn"), "Lateinisch");
  EXPECT_EQ(texts->character_labels.at("arrows"), "Pfeil");
  EXPECT_FALSE(texts->character_labels.contains("braille"));
  EXPECT_EQ(texts->label_patterns.at("enclosed"), "{0} — umschlossen");
  EXPECT_FALSE(texts->label_patterns.contains("strokes"));
}

TEST(CldrLabelsTest, ParentLocalesFollowExplicitParentsThenTruncation) {
  auto parents = ParseCldrParentLocales(R"(<supplementalData><parentLocales>
      <parentLocale parent="root" locales="zh_Hant sr_Latn"/>
      <parentLocale parent="en_001" locales="en_AU en_GB"/>
      <parentLocale parent="xx" component="segmentations" locales="de_CH"/>
    </parentLocales></supplementalData>)");
  EXPECT_EQ(CldrParentLocale("en_AU", parents), "en_001");
  EXPECT_EQ(CldrParentLocale("en_001", parents), "en");
  EXPECT_EQ(CldrParentLocale("en", parents), "root");
  EXPECT_EQ(CldrParentLocale("zh_Hant", parents), "root");
  EXPECT_EQ(CldrParentLocale("de_CH", parents), "de");
  EXPECT_FALSE(CldrParentLocale("root", parents));
  EXPECT_EQ(LocalizationNameOfCldrLocale("zh_Hant_HK"), "zh-Hant-HK");
}

TEST(CldrLabelsTest, ChildTextsWinOverInheritedOnes) {
  CldrLocaleTexts child, parent;
  child.character_labels = {{"arrows", "child"}};
  parent.character_labels = {{"arrows", "parent"}, {"digits", "parent digits"}};
  InheritCldrLocaleTexts(child, parent);
  EXPECT_EQ(child.character_labels.at("arrows"), "child");
  EXPECT_EQ(child.character_labels.at("digits"), "parent digits");
}

constexpr std::string_view kEmojiTest =
    "# group: People & Body\n"
    "# subgroup: hand-fingers-closed\n"
    "1F44D                                                  ; fully-qualified     # 👍 E0.6 thumbs up\n"
    "1F44D 1F3FD                                            ; fully-qualified     # 👍🏽 E1.0 thumbs up: medium skin tone\n"
    "# subgroup: person-activity\n"
    "1F3C3                                                  ; fully-qualified     # 🏃 E0.6 person running\n"
    "1F3C3 200D 2642 FE0F                                   ; fully-qualified     # 🏃‍♂️ E4.0 man running\n"
    "1F3C3 200D 2642                                        ; minimally-qualified # 🏃‍♂ E4.0 man running\n"
    "1F3C3 200D 2640 FE0F                                   ; fully-qualified     # 🏃‍♀️ E4.0 woman running\n"
    "1F3C3 1F3FD 200D 2640 FE0F                             ; fully-qualified     # 🏃🏽‍♀️ E4.0 woman running: medium skin tone\n"
    "XYZ ; fully-qualified # broken\n"
    "# group: Component\n"
    "1F3FB                                                  ; component           # 🏻 E1.0 light skin tone\n";

TEST(EmojiTestFileTest, ReadsEntriesWithGroupsAndNames) {
  std::vector<EmojiTestEntry> entries = ParseEmojiTest(kEmojiTest);
  ASSERT_EQ(entries.size(), 8u);
  EXPECT_EQ(entries[1].sequence, U"\U0001F44D\U0001F3FD");
  EXPECT_EQ(entries[1].name, "thumbs up: medium skin tone");
  EXPECT_EQ(entries[1].group, "People & Body");
  EXPECT_EQ(entries[3].subgroup, "person-activity");
  EXPECT_EQ(entries[4].status, EmojiStatus::kMinimallyQualified);
  EXPECT_EQ(entries[7].status, EmojiStatus::kComponent);
  EXPECT_TRUE(HasSkinTone(entries[1].sequence));
  EXPECT_FALSE(HasSkinTone(entries[3].sequence));
}

TEST(EmojiGroupsTest, SkinToneAndGenderFamilies) {
  std::vector<std::vector<std::u32string>> groups = EmojiGroups(ParseEmojiTest(kEmojiTest));
  const std::vector<std::u32string> thumbs = {U"\U0001F44D", U"\U0001F44D\U0001F3FD"};
  const std::vector<std::u32string> woman_running = {U"\U0001F3C3\u200D\u2640\uFE0F",
                                                     U"\U0001F3C3\U0001F3FD\u200D\u2640\uFE0F"};
  const std::vector<std::u32string> running = {U"\U0001F3C3", U"\U0001F3C3\u200D\u2642\uFE0F",
                                               U"\U0001F3C3\u200D\u2640\uFE0F"};
  EXPECT_EQ(groups, (std::vector<std::vector<std::u32string>>{thumbs, woman_running, running}));
}

TEST_F(UnicodeDataTest, LetterGroupsJoinCaseAccentsAndCompatibilityForms) {
  std::vector<std::u32string> groups = LetterGroups(table_);
  ASSERT_EQ(groups.size(), 1u);
  // The combining accent, the control and the squared abbreviation stay out.
  EXPECT_EQ(groups[0], U"AaÀàⒶⓐ");
}

TEST(HanVariantGroupsTest, UnitesVariantsTransitively) {
  UnihanTable table;
  AddUnihanRecords("U+767C\tkSimplifiedVariant\tU+53D1\nU+9AEE\tkSimplifiedVariant\tU+53D1\n"
                   "U+6C34\tkSemanticVariant\tU+6C35<kMatthews\n",
                   kUnihanFieldsUsed, table);
  std::vector<std::u32string> groups = HanVariantGroups(table);
  EXPECT_EQ(groups, (std::vector<std::u32string>{U"发發髮", U"水氵"}));
}

TEST(InfoFieldsTest, AlwaysSixteenFieldsWhateverTheText) {
  InfoFields fields;
  fields[0] = "vertical line; bar | pipe";
  fields[5] = "line\nbreak";
  std::string info = JoinInfoFields(fields);
  EXPECT_EQ(std::count(info.begin(), info.end(), '|'), 15);
  EXPECT_EQ(info.find('\n'), std::string::npos);
}

TEST(InfoFieldsTest, NamePartsDropRepeatsIgnoringCase) {
  EXPECT_EQ(JoinNameParts({"GRINNING FACE", "grinning face", "", "face", "Face", "grin"}), "GRINNING FACE; face; grin");
}

TEST(InfoFieldsTest, HanFieldsComeFromUnihan) {
  UnihanTable table;
  AddUnihanRecords("U+5FC3\tkJapaneseOn\tSHIN\nU+5FC3\tkJapaneseKun\tKOKORO\nU+5FC3\tkHangul\t심:0E\n"
                   "U+5FC3\tkKorean\tSIM\nU+5FC3\tkMandarin\txīn\nU+5FC3\tkRSUnicode\t61.0 61'.0\n",
                   kUnihanFieldsUsed, table);
  InfoFields fields = HanInfoFields(U'心', table);
  auto field = [&](std::string_view tag) {
    return fields[static_cast<size_t>(std::find(kCharacterInfoFieldTags.begin(), kCharacterInfoFieldTags.end(), tag) -
                                      kCharacterInfoFieldTags.begin())];
  };
  EXPECT_EQ(field("jyom"), "SHIN; KOKORO");
  EXPECT_EQ(field("krpi"), "심; SIM");
  EXPECT_EQ(field("spin"), "xīn");
  EXPECT_EQ(field("tpin"), "xīn");
  EXPECT_EQ(field("tzhu"), "ㄒㄧㄣ");
  EXPECT_EQ(field("rsu1"), "61.0");
  EXPECT_EQ(field("rsu2"), "61'.0");
  EXPECT_EQ(field("rsu3"), "");
  EXPECT_EQ(field("tday"), "");
}

}  // namespace
}  // namespace lumeris::resources
