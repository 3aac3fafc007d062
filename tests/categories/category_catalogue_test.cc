// The category catalogue over a small system root the tests write: the joining of data segments,
// the emoji sub-categories and their icons, titles in the user's language. Each category of the
// fixture bundle is made for one rule.
#include "categories/category_catalogue.h"

#include <gtest/gtest.h>

#include <map>
#include <string>
#include <vector>

#include "bundle/bundle_fixture.h"
#include "support/scoped_env.h"
#include "support/temp_dir.h"

namespace lumeris {
namespace {

namespace fs = std::filesystem;
using testing::BundleWriter;
using Names = std::vector<std::string>;

MessageValue Str(std::string text) { return MessageValue::String(std::move(text)); }
MessageValue Bytes(std::string_view bytes) { return MessageValue::DataFromBytes(bytes); }
MessageValue Dict(MessageValue::Dictionary entries) { return MessageValue::MakeDictionary(std::move(entries)); }

plist::Dictionary Segment(std::optional<std::string> data, std::optional<bool> skip = std::nullopt) {
  plist::Dictionary segment;
  if (data) segment.emplace("Data", *data);
  if (skip) segment.emplace("VTSkipNullGlyphs", *skip);
  return segment;
}
plist::Value Segments(plist::Array segments) {
  return plist::Dictionary{{"VTCategoryData", plist::Dictionary{{"DataArray", std::move(segments)}}}};
}
plist::Dictionary Subcategory(std::optional<std::string> title, std::string image, std::optional<std::string> data) {
  plist::Dictionary entry{{"VTCategoryImage", std::move(image)}};
  if (title) entry.emplace("VTDataTitle", *title);
  entry.emplace("VTCategoryData", data ? plist::Dictionary{{"Data", *data}} : plist::Dictionary{});
  return entry;
}

// The application and framework bundles under a system root of the test's own. Every fixture
// gets an application identifier of its own, so the process-wide strings-table cache never
// answers from another test's files.
class CategoryCatalogueTest : public ::testing::Test {
 protected:
  CategoryCatalogueTest()
      : app_(BundleWriter::Application(root_.path() / "System/Library/Input Methods/Sorvendi.app",
                                       "com.example.catalogue." + std::to_string(++instances_), "en")),
        framework_(BundleWriter::Framework(root_.path() / "System/Library/PrivateFrameworks/Lumeris.framework",
                                           "com.example.framework", "en")) {
    env_.Set("LUMERIS_SYSTEM_ROOT", root_.path().string());
    testing::SetUserLanguages(env_, "en");
    auto plist = [&](std::string_view loc, const std::string& name, const plist::Value& value) {
      BundleWriter::WritePlist(app_.Folder(loc) / (name + ".plist"), value);
    };
    // Offers only "Single": requests for anything else, in any order, are answered all the same.
    plist("en", "Categories",
          plist::Dictionary{{"VTAvailableCategories",
                             plist::Array{plist::Dictionary{{"Group", "CategoryGroup-Symbols"},
                                                            {"Categories", plist::Array{"Single"}}}}}});
    plist("en", "Category-Three", Segments({Segment("0041"), Segment(std::nullopt), Segment("0043")}));
    plist("en", "Category-GapFirst", Segments({Segment(std::nullopt), Segment("0042")}));
    plist("en", "Category-EmptyFirst", Segments({Segment(""), Segment("0042")}));
    plist("en", "Category-SkipFalse", Segments({Segment("0041"), Segment("0042", false)}));
    plist("en", "Category-SkipNoData", Segments({Segment(std::nullopt, true)}));
    plist("en", "Category-Single", plist::Dictionary{{"VTCategoryData", Segment("0058-005A")}});
    plist("en", "Category-Local", plist::Dictionary{{"VTCategoryData", Segment("0065")}});
    plist("de", "Category-Local", plist::Dictionary{{"VTCategoryData", Segment("0064")}});
    plist("", "Category-Emoji",
          plist::Dictionary{{"EmojiDataArray",
                             plist::Array{Subcategory("Smileys", "FwPdfAppTiff", "1F600"),
                                          Subcategory("Untranslated", "FwTiffAppTiff", "1F436"),
                                          Subcategory("Smileys", "FwPdfAppPdf", std::nullopt),
                                          Subcategory(std::nullopt, "AppPdf", "1F34E"),
                                          Subcategory("Smileys", "Nowhere", "2764+FE0F")}}});
    app_.WriteStringsTable("en", "Localizable", {{"CategoryName-Single", "Single (en)"},
                                                 {"CategoryName-Local", "Local (en)"},
                                                 {"CategoryName-Emoji", "Emoji (en)"}});
    app_.WriteStringsTable("de", "Localizable", {{"CategoryName-Local", "Lokal"}, {"CategoryName-Emoji", "Emoji (de)"}});
    app_.WriteStringsTable("en", "Emoji_Category", {{"Smileys", "Smileys (en)"}});
    app_.WriteStringsTable("de", "Emoji_Category", {{"Smileys", "Smileys (de)"}});
    // Icons hold their own bundle and type, so every answer shows which file was read.
    for (const char* name : {"FwPdfAppTiff.pdf", "FwTiffAppTiff.tiff", "FwPdfAppPdf.pdf"}) {
      framework_.WriteResource("", name, std::string("framework ") + name);
    }
    for (const char* name : {"FwPdfAppTiff.tiff", "FwTiffAppTiff.tiff", "FwPdfAppPdf.pdf", "AppPdf.pdf",
                             "CategoryImage-Single.tiff", "CategoryImage-Single.pdf", "CategoryImage-Three.pdf",
                             "CategoryImage-Emoji.pdf"}) {
      app_.WriteResource("", name, std::string("app ") + name);
    }
  }

  static MessageValue Request(const Names& names) { return CreateXPCCategoryDataArray(names); }
  // The single entry for `name`.
  static MessageValue Entry(const std::string& name) {
    const MessageValue result = Request({name});
    return result.AsArray() && result.AsArray()->size() == 1 ? result.AsArray()->front() : MessageValue();
  }

  static inline int instances_ = 0;
  testing::ScopedTempDir root_;
  testing::ScopedEnv env_;
  BundleWriter app_;
  BundleWriter framework_;
};

// An empty or absent list of names gives an empty array.
TEST_F(CategoryCatalogueTest, OrdinaryCategoriesJoinTheirSegments) {
  const struct { const char* name; MessageValue expected; } cases[] = {
      {"Three", Dict({{"Data", Str("0041,0043")}, {"TitleText", Str("Three")},
                      {"TitleImage", Bytes("app CategoryImage-Three.pdf")}})},
      {"GapFirst", Dict({{"Data", Str("0042")}, {"TitleText", Str("GapFirst")}, {"TitleImage", Bytes("")}})},
      {"EmptyFirst", Dict({{"Data", Str(",0042")}, {"TitleText", Str("EmptyFirst")}, {"TitleImage", Bytes("")}})},
      {"SkipFalse", Dict({{"Data", Str("0041,0042")}, {"CheckGlyph", MessageValue::Bool(true)},
                          {"TitleText", Str("SkipFalse")}, {"TitleImage", Bytes("")}})},
      {"SkipNoData", Dict({{"TitleText", Str("SkipNoData")}, {"TitleImage", Bytes("")}})},
      {"Single", Dict({{"Data", Str("0058-005A")}, {"TitleText", Str("Single (en)")},
                       {"TitleImage", Bytes("app CategoryImage-Single.tiff")}})},
      {"NoSuchPlist", Dict({{"TitleText", Str("NoSuchPlist")}, {"TitleImage", Bytes("")}})},
      {"../Category-Single", Dict({{"TitleText", Str("../Category-Single")}, {"TitleImage", Bytes("")}})},
  };
  for (const auto& c : cases) EXPECT_EQ(Entry(c.name), c.expected) << c.name;
  EXPECT_EQ(CreateXPCCategoryDataArray(std::nullopt), MessageValue::MakeArray());
  EXPECT_EQ(CreateXPCCategoryDataArray(Names{}), MessageValue::MakeArray());
}

TEST_F(CategoryCatalogueTest, EmojiSubcategoriesTakeTitlesIconsAndPrefixedData) {
  const MessageValue expected = Dict(
      {{"TitleText", Str("Emoji (en)")},
       {"TitleImage", Bytes("app CategoryImage-Emoji.pdf")},
       {"Data", MessageValue::MakeArray({
                    // Framework pdf and application tiff: the type loop is outermost.
                    Dict({{"TitleText", Str("Smileys (en)")}, {"TitleImage", Bytes("app FwPdfAppTiff.tiff")},
                          {"Data", Str("<emoji>1F600")}}),
                    // Untranslated: the key itself.
                    Dict({{"TitleText", Str("Untranslated")}, {"TitleImage", Bytes("framework FwTiffAppTiff.tiff")},
                          {"Data", Str("<emoji>1F436")}}),
                    // No "Data": what a "%@" format writes for a missing object.
                    Dict({{"TitleText", Str("Smileys (en)")}, {"TitleImage", Bytes("framework FwPdfAppPdf.pdf")},
                          {"Data", Str("<emoji>(null)")}}),
                    // No "VTDataTitle": an empty title.
                    Dict({{"TitleText", Str("")}, {"TitleImage", Bytes("app AppPdf.pdf")}, {"Data", Str("<emoji>1F34E")}}),
                    Dict({{"TitleText", Str("Smileys (en)")}, {"TitleImage", Bytes("")}, {"Data", Str("<emoji>2764+FE0F")}}),
                })}});
  const MessageValue result = Request({"Emoji", "Single", "Emoji"});
  ASSERT_EQ(result.AsArray()->size(), 3u);
  EXPECT_EQ(result.AsArray()->at(0), expected);
  EXPECT_EQ(result.AsArray()->at(2), expected);
  EXPECT_EQ(*result.AsArray()->at(1).GetString("TitleText"), "Single (en)") << "request order";

  // Without "Category-Emoji" the data is an empty array; the title and icon stay.
  fs::remove(app_.Folder("") / "Category-Emoji.plist");
  EXPECT_EQ(Entry("Emoji"), Dict({{"Data", MessageValue::MakeArray()}, {"TitleText", Str("Emoji (en)")},
                                  {"TitleImage", Bytes("app CategoryImage-Emoji.pdf")}}));
}

// The titles and data of "Local", the title of "Emoji" and of its first sub-category, the title
// of "Single": a title missing from the German table falls back to the name, not to English.
TEST_F(CategoryCatalogueTest, OneLocalizationFromTheUsersLanguagesServesTitlesAndPlists) {
  const Names german = {"Lokal", "0064", "Emoji (de)", "Smileys (de)", "Single"};
  const struct { const char* what; std::optional<std::string> language, lang; Names expected; } cases[] = {
      {"LANGUAGE", "it:de", std::nullopt, german},
      {"LANG", std::nullopt, "de_CH.UTF-8", german},
      {"no localization matches: English", "ja", "de_DE.UTF-8", {"Local (en)", "0065", "Emoji (en)", "Smileys (en)", "Single (en)"}},
  };
  for (const auto& c : cases) {
    testing::ScopedEnv env;
    testing::SetUserLanguages(env, c.language, c.lang);
    const MessageValue result = Request({"Local", "Emoji", "Single"});
    const MessageValue::Array& e = *result.AsArray();
    EXPECT_EQ((Names{*e[0].GetString("TitleText"), *e[0].GetString("Data"), *e[1].GetString("TitleText"),
                     *e[1].Find("Data")->AsArray()->front().GetString("TitleText"), *e[2].GetString("TitleText")}),
              c.expected) << c.what;
  }
}

}  // namespace
}  // namespace lumeris
