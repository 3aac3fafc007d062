// Unit tests of the resource builder's parsers and encoders on small inline inputs.
#include <gtest/gtest.h>

#include <fstream>
#include <map>
#include <string>
#include <tuple>
#include <vector>

#include "resource_builder/character_info.h"
#include "resource_builder/cldr_annotations.h"
#include "resource_builder/cldr_labels.h"
#include "resource_builder/emoji_test.h"
#include "resource_builder/han_language_info.h"
#include "resource_builder/related_chars.h"
#include "resource_builder/ucd_format.h"
#include "resource_builder/unicode_data.h"
#include "resource_builder/unihan.h"
#include "resource_builder/utf8.h"
#include "resource_builder/zhuyin.h"
#include "support/temp_dir.h"

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

TEST_F(UnicodeDataTest, RangesExpandWithDerivedNamesAndOnlyCharactersAreListed) {
  EXPECT_EQ(NameOf(0x4E00), "CJK UNIFIED IDEOGRAPH-4E00");
  EXPECT_EQ(NameOf(0x4E02), "CJK UNIFIED IDEOGRAPH-4E02");
  EXPECT_EQ(NameOf(0xAC01), "HANGUL SYLLABLE GAG");
  EXPECT_EQ(NameOf(0x0000), "");
  EXPECT_EQ(table_.Find(0x4E03), nullptr);
  EXPECT_EQ(table_.Find(U'a')->simple_uppercase, U'A');
  EXPECT_EQ(table_.Find(U'A')->simple_lowercase, U'a');
  size_t listed = 0;
  for (const CodePointRecord& record : table_.records()) listed += IsListedCharacter(record) ? 1 : 0;
  // 9 single records + 3 ideographs + 2 syllables; the malformed line, surrogates and private use
  // are not listed.
  EXPECT_EQ(listed, 14u);
  ASSERT_NE(table_.Find(0xE000), nullptr);
  EXPECT_FALSE(IsListedCharacter(*table_.Find(0xE000)));
  EXPECT_FALSE(IsListedCharacter(*table_.Find(0xD800)));
}

TEST(HangulNameTest, FollowsTheUnicodeAlgorithm) {
  const std::pair<char32_t, const char*> kNames[] = {{0xAC00, "HANGUL SYLLABLE GA"}, {0xD7A3, "HANGUL SYLLABLE HIH"},
      {0xD4DB, "HANGUL SYLLABLE PWILH"}, {0xC544, "HANGUL SYLLABLE A"}, {0xABFF, "<none>"}, {0xD7A4, "<none>"}};
  for (const auto& [cp, name] : kNames) EXPECT_EQ(HangulSyllableName(cp).value_or("<none>"), name) << std::hex << +cp;
}

TEST(UcdFormatTest, RangesSequencesAliasesAndUnihanValues) {
  std::vector<std::tuple<char32_t, char32_t, std::string>> ranges;
  for (const CodePointRange& r : ParseCodePointRanges("# comment\n0000..007F; Basic Latin\n\n00AA ; Latin # Lo FEMININE\n"
                                                      "ZZZZ..0001; Bad\n0010..0005; Backwards\n")) {
    ranges.emplace_back(r.first, r.last, r.value);
  }
  EXPECT_EQ(ranges, (decltype(ranges){{0, 0x7F, "Basic Latin"}, {0xAA, 0xAA, "Latin"}}));
  EXPECT_EQ(ParseCodePointSequence("1F44D 1F3FD"), std::u32string(U"\U0001F44D\U0001F3FD"));
  for (const char* bad : {"", "110000", "12G4"}) EXPECT_FALSE(ParseCodePointSequence(bad)) << bad;
  auto aliases = ParseNameAliases("0000;NULL;control\n0000;NUL;abbreviation\n01A2;LATIN CAPITAL LETTER GHA;correction\n");
  ASSERT_EQ(aliases[0].size(), 2u);
  EXPECT_EQ(aliases[0][1].alias + " " + aliases[0][1].type, "NUL abbreviation");  // file order per code point
  EXPECT_EQ(aliases[0x1A2][0].type, "correction");
  // Unihan variant values drop their source annotations.
  EXPECT_EQ(ParseUnihanCodePoints("U+53D1<kMatthews,kMeyerWempe U+5F42 junk"), (std::vector<char32_t>{0x53D1, 0x5F42}));
  EXPECT_TRUE(ParseUnihanCodePoints("").empty());
}

TEST(ZhuyinTest, ConvertsTonedPinyinSyllablesOnly) {
  const std::pair<const char*, const char*> cases[] = {
      {"xīn", "ㄒㄧㄣ"},  {"shuǐ", "ㄕㄨㄟˇ"}, {"lǜ", "ㄌㄩˋ"},   {"zhī", "ㄓ"},   {"sì", "ㄙˋ"},
      {"yuè", "ㄩㄝˋ"}, {"wǒ", "ㄨㄛˇ"},   {"jiǔ", "ㄐㄧㄡˇ"}, {"qù", "ㄑㄩˋ"}, {"lùn", "ㄌㄨㄣˋ"},
      {"ér", "ㄦˊ"},    {"ma", "˙ㄇㄚ"},   {"yīng", "ㄧㄥ"},  {"xióng", "ㄒㄩㄥˊ"}, {"wēng", "ㄨㄥ"},
      {"", "<none>"},   {"q", "<none>"},   {"xyz", "<none>"}, {"ab1", "<none>"}, {"心", "<none>"},
  };
  for (const auto& [pinyin, zhuyin] : cases) EXPECT_EQ(PinyinToZhuyin(pinyin).value_or("<none>"), zhuyin) << pinyin;
}

TEST(CldrAnnotationsTest, SplitsKeywordsAndSkipsInheritanceMarkers) {
  CldrAnnotations annotations;
  ASSERT_TRUE(AddCldrAnnotations(R"(<ldml><annotations>
      <annotation cp="|">bar | pipe</annotation>
      <annotation cp="x">↑↑↑</annotation></annotations></ldml>)", annotations));
  EXPECT_EQ(annotations.at("|").keywords, (std::vector<std::string>{"bar", "pipe"}));
  EXPECT_FALSE(annotations.contains("x"));
  EXPECT_FALSE(AddCldrAnnotations("<ldml><unclosed>", annotations));
}

// A parent's texts, with the forms that are skipped (an "alt" form, a pattern by count, an
// inheritance marker), under a child that holds one label of its own.
TEST(CldrLabelsTest, ReadsLabelsScriptsAndPatternsAndTheChildsOwnWin) {
  std::optional<CldrLocaleTexts> parent = ParseCldrLocaleTexts(R"(<ldml>
    <localeDisplayNames><scripts><script type="Latn">Lateinisch</script>
      <script type="Latn" alt="short">Latein</script></scripts></localeDisplayNames>
    <characterLabels>
      <characterLabelPattern type="enclosed">{0} — umschlossen</characterLabelPattern>
      <characterLabelPattern type="strokes" count="one">{0} Strich</characterLabelPattern>
      <characterLabel type="arrows">Pfeil</characterLabel><characterLabel type="digits">Ziffern</characterLabel>
      <characterLabel type="braille">↑↑↑</characterLabel>
    </characterLabels></ldml>)");
  ASSERT_TRUE(parent);
  using Texts = std::map<std::string, std::string, std::less<>>;
  CldrLocaleTexts child;
  child.character_labels = {{"arrows", "Pfeile"}};
  InheritCldrLocaleTexts(child, *parent);
  EXPECT_EQ(child.character_labels, (Texts{{"arrows", "Pfeile"}, {"digits", "Ziffern"}}));
  EXPECT_EQ(child.script_names, (Texts{{"Latn", "Lateinisch"}}));
  EXPECT_EQ(child.label_patterns, (Texts{{"enclosed", "{0} — umschlossen"}}));
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

TEST(EmojiTestFileTest, ReadsEntriesWithGroupsAndNamesAndFamilies) {
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
  // Families of skin tones and genders.
  const std::vector<std::vector<std::u32string>> groups = EmojiGroups(entries);
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

TEST(InfoFieldsTest, AlwaysSixteenFieldsAndNamePartsWithoutRepeats) {
  InfoFields fields;
  fields[0] = "vertical line; bar | pipe";
  fields[5] = "line\nbreak";
  EXPECT_EQ(JoinInfoFields(fields), "vertical line; bar / pipe|||||line break||||||||||");
  EXPECT_EQ(JoinNameParts({"GRINNING FACE", "grinning face", "", "face", "Face", "grin"}), "GRINNING FACE; face; grin");
}

// The rows of the character database over tiny inputs in which every source (Unicode name, alias,
// English CLDR file, emoji-test name, Unihan property) holds a text no other source holds, so a
// field filled from the wrong source shows. Decoys: a figment alias, German annotations, Unihan
// properties the fields do not use, malformed Unihan lines.
class CharacterRowsTest : public ::testing::Test {
 protected:
  CharacterRowsTest() {
    const auto write = [&](const char* file, const char* annotations) {
      std::filesystem::create_directories((cldr_.path() / file).parent_path());
      std::ofstream(cldr_.path() / file) << "<ldml><annotations>" << annotations << "</annotations></ldml>";
    };
    write("annotations/en.xml", R"(<annotation cp="❤">love | heart</annotation>
        <annotation cp="❤" type="tts">red heart</annotation>
        <annotation cp="👍">+1 | thumbs up</annotation><annotation cp="👍" type="tts">thumbs up</annotation>)");
    write("annotationsDerived/en.xml", R"(<annotation cp="🏃‍♂">marathon</annotation>)");
    write("annotations/de.xml", R"(<annotation cp="A">Buchstabe</annotation>)");
    write("annotationsDerived/de.xml", R"(<annotation cp="🏃‍♂">Marathon</annotation>)");
    AddUnihanRecords("U+4E01\tkDefinition\tnail\nU+4E01\tkJapaneseOn\tTEI\nU+4E01\tkJapaneseKun\tHINOTO\n"
                     "U+4E01\tkHangul\t정:0E\nU+4E01\tkKorean\tCENG\nU+4E01\tkMandarin\tdīng zhēng\n"
                     "U+4E01\tkTotalStrokes\t2 3\nU+4E01\tkCantonese\tding1\nU+4E01\tkCangjie\tMN\n"
                     "U+4E01\tkRSUnicode\t1.1 1'.2 2.3 3.4 4.5\nU+4E01\tkXHC1983\t0001.010:dīng\n"
                     "U+4E01\tkFourCornerCode\t1020.0\nU+4E01\tkPhonetic\t1292\nU+ZZZZ\tkMandarin\tbad\n"
                     "U+4E02\tkMandarin\n# comment\n",
                     kUnihanFieldsUsed, unihan_);
  }

  // The rows by character, in database order.
  std::vector<std::pair<std::string, std::string>> Rows() {
    const std::optional<CldrAnnotations> english = ReadEnglishCldrAnnotations(cldr_.path());
    EXPECT_TRUE(english);
    const UnicodeCharacterTable unicode = ParseUnicodeData(std::string(kUnicodeData) +
        "2764;HEAVY BLACK HEART;So;0;ON;;;;;N;;;;;\n1F44D;THUMBS UP SIGN;So;0;ON;;;;;N;;;;;\n"
        "1F692;FIRE ENGINE;So;0;ON;;;;;N;;;;;\n");
    const auto aliases = ParseNameAliases("0041;ALIAS A;abbreviation\n0041;FIGMENT A;figment\n");
    // Equal name lengths: fewer code points first (U+FE0F not counted), then file order.
    const std::vector<EmojiTestEntry> emoji = ParseEmojiTest(
        "1F3C3 200D 2642 FE0F ; fully-qualified # 🏃‍♂️ E4.0 man running\n"
        "2764 FE0F ; fully-qualified # ❤️ E0.6 red heart\n"
        "2764 ; unqualified # ❤ E0.6 red heart\n"
        "1F44D ; fully-qualified # 👍 E0.6 thumbs up\n"
        "1F44D 1F3FD ; fully-qualified # 👍🏽 E1.0 thumbs up: medium skin tone\n"
        "1F692 ; fully-qualified # 🚒 E0.6 fire engine\n");
    std::vector<std::pair<std::string, std::string>> rows;
    for (const CharacterRow& row : BuildCharacterRows({unicode, aliases, unihan_, english.value_or(CldrAnnotations{}), emoji})) {
      rows.emplace_back(row.uchr, row.info);
    }
    return rows;
  }

  testing::ScopedTempDir cldr_;
  UnihanTable unihan_;
};

TEST_F(CharacterRowsTest, EachHanFieldComesFromItsOwnUnihanProperty) {
  const auto built = Rows();
  const std::map<std::string, std::string> rows(built.begin(), built.end());
  const struct { const char* tag; const char* value; } kFields[] = {
      {"unam", "CJK UNIFIED IDEOGRAPH-4E01; nail"},  // derived name; kDefinition
      {"jyom", "TEI; HINOTO"},                       // kJapaneseOn; kJapaneseKun
      {"krpi", "정; CENG"},                          // kHangul without its source tag; kKorean
      {"spin", "dīng"}, {"swbx", ""}, {"swbh", ""},  // kMandarin, first value
      {"sbix", "2"}, {"cbai", "ding1"}, {"tcan", "MN"}, {"tday", ""},  // kTotalStrokes, first value; kCantonese; kCangjie
      {"tpin", "zhēng"}, {"tzhu", "ㄓㄥ"},  // kMandarin, second value; its Zhuyin
      {"rsu1", "1.1"}, {"rsu2", "1'.2"}, {"rsu3", "2.3"}, {"rsu4", "3.4"},  // kRSUnicode, values 1 to 4
  };
  ASSERT_TRUE(rows.contains("丁"));
  std::string expected;
  for (size_t i = 0; i < std::size(kFields); ++i) {
    EXPECT_EQ(kCharacterInfoFieldTags[i], kFields[i].tag);
    expected += (i ? "|" : "") + std::string(kFields[i].value);
  }
  EXPECT_EQ(rows.at("丁"), expected);
  EXPECT_EQ(rows.at("丂"), "CJK UNIFIED IDEOGRAPH-4E02|||||||||||||||");  // a Unihan line without value
}

TEST_F(CharacterRowsTest, NamesGatherEveryEnglishTextAndEmojiComeFirstInSearchOrder) {
  const std::vector<std::pair<std::string, std::string>> rows = Rows();
  const std::string empty(15, '|');
  const std::vector<std::pair<std::string, std::string>> first = {
      // emoji-test name, the base's Unicode name, English CLDR name and keywords (key without U+FE0F)
      {"❤️", "red heart; HEAVY BLACK HEART; love; heart" + empty},
      // a code point: Unicode name, then CLDR; the emoji-test name is not used
      {"👍", "THUMBS UP SIGN; thumbs up; +1" + empty},
      {"🚒", "FIRE ENGINE" + empty},
      {"🏃‍♂️", "man running; marathon" + empty},  // from annotationsDerived/en.xml
      {std::string(1, '\0'), empty},
      {"A", "LATIN CAPITAL LETTER A; ALIAS A" + empty},  // no figment, no German
  };
  ASSERT_GE(rows.size(), first.size());
  EXPECT_EQ(std::vector(rows.begin(), rows.begin() + 6), first);
  // The unqualified ❤ keeps a code-point row; the skin-toned 👍🏽 has none.
  const std::map<std::string, std::string> by_character(rows.begin(), rows.end());
  EXPECT_EQ(by_character.at("❤"), "HEAVY BLACK HEART; red heart; love; heart" + empty);
  EXPECT_FALSE(by_character.contains("👍🏽"));
  EXPECT_EQ(by_character.size(), rows.size()) << "a character has two rows";
  EXPECT_EQ(rows.size(), 4u + 15u);  // four emoji, fourteen listed code points and ❤
}

TEST(HanLanguageInfoTest, NamesTheLanguageOfEveryHanField) {
  const std::pair<const char*, plist::Array> kLanguages[] = {
      {"ja", {"jyom"}}, {"ko", {"krpi"}}, {"zh-Hans", {"spin", "swbx", "swbh", "sbix"}}, {"yue", {"cbai"}},
      {"zh-Hant", {"tcan", "tday", "tpin", "tzhu"}}, {"zh", {"rsu1", "rsu2", "rsu3", "rsu4"}}};
  plist::Dictionary tags, languages;
  for (const auto& [language, fields] : kLanguages) {
    languages.emplace(language, fields);
    for (const plist::Value& tag : fields) tags.emplace(*tag.AsString(), language);
  }
  EXPECT_EQ(HanLanguageInfo(), (plist::Value(plist::Dictionary{{"tags", tags}, {"languages", languages}})));
}

}  // namespace
}  // namespace lumeris::resources
