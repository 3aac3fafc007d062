// `lumeris categories` against the catalogue itself (answered in-process over a bundle the test
// writes, no service): the list of offered categories, entries rendered from the Data notation,
// and icon files.
#include <gtest/gtest.h>

#include <fstream>
#include <iterator>
#include <sstream>
#include <string>
#include <vector>

#include "bundle/bundle_fixture.h"
#include "categories/category_catalogue.h"
#include "client/cli_app.h"
#include "client/commands/category_command.h"
#include "support/scoped_env.h"
#include "support/temp_dir.h"

namespace lumeris::cli {
namespace {

namespace fs = std::filesystem;
using testing::BundleWriter;

// Answers "read_categorydata" with the catalogue and records every request.
class CatalogueChannel : public ServiceChannel {
 public:
  std::vector<MessageValue> requests;

  std::optional<MessageValue> Request(const MessageValue& request, std::chrono::milliseconds,
                                      std::string*) override {
    requests.push_back(request);
    MessageValue reply = MessageValue::MakeDictionary();
    reply.Set("result", CreateXPCCategoryDataArray(StringArrayFromXPCArray(request.Find("categories"))));
    return reply;
  }
  bool Send(const MessageValue&, std::chrono::milliseconds, std::string*) override { return true; }
  bool RemoveStoreKey(const std::string&, std::string*) override { return true; }
};

std::string FileText(const fs::path& path) {
  std::ifstream in(path, std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
}

class CategoryCommandTest : public ::testing::Test {
 protected:
  CategoryCommandTest() {
    env_.Set("LUMERIS_SYSTEM_ROOT", root_.path().string());
    testing::SetUserLanguages(env_, "en");
    BundleWriter app = BundleWriter::Application(root_.path() / "System/Library/Input Methods/Sorvendi.app",
                                                 "com.example.cli-categories", "en");
    BundleWriter framework =
        BundleWriter::Framework(root_.path() / "System/Library/PrivateFrameworks/Lumeris.framework", "f", "en");
    const auto group = [](const char* name, plist::Array categories) {
      return plist::Dictionary{{"Group", name}, {"Categories", std::move(categories)}};
    };
    BundleWriter::WritePlist(app.Folder("en") / "Categories.plist",
                             plist::Dictionary{{"VTAvailableCategories",
                                                plist::Array{group("CategoryGroup-Symbols", {"Emoji", "Arrows"}),
                                                             group("CategoryGroup-Letters", {"Greek"})}}});
    BundleWriter::WritePlist(
        app.Folder("en") / "Category-Arrows.plist",
        plist::Dictionary{{"VTCategoryData",
                           plist::Dictionary{{"DataArray", plist::Array{plist::Dictionary{{"Data", "2190-2192"}},
                                                                        plist::Dictionary{{"Data", "1F850"},
                                                                                          {"VTSkipNullGlyphs", true}}}}}}});
    BundleWriter::WritePlist(app.Folder("en") / "Category-Greek.plist",
                             plist::Dictionary{{"VTCategoryData", plist::Dictionary{{"Data", "03B1,0301,0007"}}}});
    BundleWriter::WritePlist(
        app.Folder("") / "Category-Emoji.plist",
        plist::Dictionary{{"EmojiDataArray",
                           plist::Array{plist::Dictionary{{"VTDataTitle", "Smileys & People"},
                                                          {"VTCategoryImage", "EmojiCategory-Smileys"},
                                                          {"VTCategoryData", plist::Dictionary{{"Data", "1F600,1F44D+1F3FD"}}}}}}});
    app.WriteStringsTable("en", "Localizable", {{"CategoryName-Greek", "Greek letters"}});
    app.WriteResource("", "CategoryImage-Arrows.pdf", "%PDF-1.5 arrows");
    app.WriteResource("", "CategoryImage-Greek.tiff", std::string("II*\0greek", 9));
    framework.WriteResource("", "EmojiCategory-Smileys.pdf", "%PDF smileys");
  }

  int run(std::vector<std::string> args) {
    args.insert(args.begin(), "lumeris");
    std::vector<const char*> argv;
    for (const std::string& arg : args) argv.push_back(arg.c_str());
    out_.str("");
    err_.str("");
    return RunCli(static_cast<int>(argv.size()), argv.data(), channel_, out_, err_);
  }

  testing::ScopedTempDir root_;
  testing::ScopedEnv env_;
  CatalogueChannel channel_;
  std::ostringstream out_, err_;
};

TEST_F(CategoryCommandTest, NamedCategoriesShowTitlesIconsAndRenderedCharacters) {
  ASSERT_EQ(run({"categories", "Arrows", "Greek", "Emoji", "Nothing"}), 0) << err_.str();
  EXPECT_EQ(out_.str(),
            "Arrows\tArrows\ticon 15 bytes PDF\tglyphs checked\t4 characters\n"
            "  ← ↑ → 🡐\n"
            "Greek\tGreek letters\ticon 9 bytes TIFF\tglyphs not checked\t3 characters\n"
            "  α ◌́ U+0007\n"
            "Emoji\tEmoji\tno icon\t1 sub-category\t2 characters\n"
            "  Smileys & People\ticon 12 bytes PDF\t2 characters\n"
            "    😀 👍🏽\n"
            "Nothing\tNothing\tno icon\tglyphs not checked\t0 characters\n");
}

TEST_F(CategoryCommandTest, WithoutNamesListsTheOfferedCategoriesByGroup) {
  ASSERT_EQ(run({"categories"}), 0) << err_.str();
  EXPECT_EQ(out_.str(),
            "CategoryGroup-Symbols\n"
            "  Emoji\tEmoji\t2 characters\n"
            "  Arrows\tArrows\t4 characters\n"
            "CategoryGroup-Letters\n"
            "  Greek\tGreek letters\t3 characters\n");
  EXPECT_EQ(channel_.requests.size(), 1u) << "one request for all the categories";
}

TEST_F(CategoryCommandTest, IconsAreWrittenAsFilesOfTheirType) {
  const fs::path dir = root_.path() / "icons/new";
  ASSERT_EQ(run({"categories", "Arrows", "Greek", "Emoji", "--icons", dir.string()}), 0) << err_.str();
  EXPECT_EQ(FileText(dir / "Arrows.pdf"), "%PDF-1.5 arrows");
  EXPECT_EQ(FileText(dir / "Greek.tiff"), std::string("II*\0greek", 9));
  EXPECT_EQ(FileText(dir / "Emoji-1-Smileys_People.pdf"), "%PDF smileys");
  EXPECT_EQ(std::distance(fs::directory_iterator(dir), fs::directory_iterator()), 3);
  EXPECT_NE(out_.str().find("3 icon files written to " + dir.string() + "\n"), std::string::npos) << out_.str();

  // A directory that cannot be made fails the command.
  EXPECT_EQ(run({"categories", "Arrows", "--icons", (dir / "Arrows.pdf" / "x").string()}), kExitFailure);
  EXPECT_NE(err_.str().find("cannot create"), std::string::npos) << err_.str();
}

}  // namespace
}  // namespace lumeris::cli
