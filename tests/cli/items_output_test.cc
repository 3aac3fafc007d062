// Items typed on the command line as entity IDs, entity IDs back as characters, and the human
// forms of the service's replies.
#include <gtest/gtest.h>

#include <sstream>
#include <string>
#include <vector>

#include "client/cli_items.h"
#include "client/cli_json_value.h"
#include "client/cli_output.h"

namespace lumeris::cli {
namespace {

// A reply value written as JSON (with the "$data" and other escapes).
MessageValue Json(const char* text) { return MessageValueFromJsonText(text, nullptr).value_or(MessageValue()); }

TEST(EntityIDForItemTest, TurnsCharactersIntoCurrentFormIDsAndKeepsIDs) {
  const struct {
    const char* item;
    ItemOptions options;
    const char* entity_id;
  } cases[] = {
      {"A", {}, R"(com.vantorel.lmk:{"char":"A"})"},
      {"😀", {.emoji_font = true}, R"(com.vantorel.lmk:{"char":"😀","font":"VantorelColorEmoji"})"},
      // A text font without a glyph is not recorded; with a glyph it is.
      {"A", {.font = "DejaVu Sans"}, R"(com.vantorel.lmk:{"char":"A"})"},
      {"A", {.font = "F", .glyph = 7}, R"(com.vantorel.lmk:{"char":"A","font":"F","glyph":7})"},
      {"A", {.emoji_font = true, .font = "F", .glyph = 7}, R"(com.vantorel.lmk:{"char":"A","font":"F","glyph":7})"},
      {R"(com.vantorel.lmk:{"char":"B"})", {.emoji_font = true}, R"(com.vantorel.lmk:{"char":"B"})"},
      {"com.vantorel.Lumeris:<font>F<string>C", {}, "com.vantorel.Lumeris:<font>F<string>C"},
      {"com.vantorel.lmkX", {}, R"(com.vantorel.lmk:{"char":"com.vantorel.lmkX"})"},
  };
  for (const auto& c : cases) EXPECT_EQ(EntityIDForItem(c.item, c.options), c.entity_id) << c.item;
}

TEST(FormatListsTest, CharactersAndItemsOneLineEach) {
  EXPECT_EQ(CodePoints("👍🏽中a\xFF"), "U+1F44D U+1F3FD U+4E2D U+0061 U+FFFD");
  const MessageValue characters = Json(R"(["😀", "A", 3])");  // not a string: skipped
  EXPECT_EQ(FormatCharacters(&characters), "😀\tU+1F600\nA\tU+0041\n");
  const MessageValue items = Json(R"([
      "com.vantorel.lmk:{\"char\":\"😀\",\"font\":\"VantorelColorEmoji\"}",
      "com.vantorel.Lumeris:<font>F<glyph>9<string>Z", "com.vantorel.lmk:{\"font\":\"F\"}", "opaque-token"])");
  EXPECT_EQ(FormatItems(&items),
            "😀\tU+1F600\tVantorelColorEmoji\nZ\tU+005A\tF\tglyph 9\n(no character)\t\tF\nopaque-token\t(opaque)\n");
  const std::map<std::string, std::string> names = {
      {"A", ShortCharacterName("LATIN CAPITAL LETTER A; a b")}};
  EXPECT_EQ(FormatCharacters(&characters, &names),
            "😀\tU+1F600\nA\tU+0041\tLATIN CAPITAL LETTER A\n");
  EXPECT_EQ(ShortCharacterName("one two three four five six seven; x"),
            "one two three four five six ...");
  EXPECT_EQ(FormatItems(nullptr), "");
}

TEST(FormatCharacterInfoTest, PrintsTheSixteenTagsInFieldOrderThenOtherKeys) {
  const char* const tags[] = {"unam", "jyom", "krpi", "spin", "swbx", "swbh", "sbix", "cbai",
                              "tcan", "tday", "tpin", "tzhu", "rsu1", "rsu2", "rsu3", "rsu4"};
  // Set in reverse order, without "spin", so the output order cannot come from the dictionary.
  MessageValue record = Json(R"({"zzzz": "extra"})");
  for (std::size_t i = std::size(tags); i-- > 0;) {
    if (i != 3) record.Set(tags[i], MessageValue::String("v" + std::to_string(i)));
  }
  std::istringstream lines(FormatCharacterInfo("中", &record));
  std::string line;
  ASSERT_TRUE(std::getline(lines, line));
  EXPECT_EQ(line, "中\tU+4E2D");
  for (std::size_t i = 0; i < std::size(tags) && std::getline(lines, line); ++i) {
    EXPECT_EQ(line.substr(0, 5), std::string(tags[i]) + "\t");
    EXPECT_EQ(line.substr(line.rfind('\t') + 1), i == 3 ? "" : "v" + std::to_string(i));
  }
  ASSERT_TRUE(std::getline(lines, line));
  EXPECT_EQ(line, "zzzz\t\textra");
  const MessageValue empty = MessageValue::MakeDictionary();
  EXPECT_EQ(FormatCharacterInfo("中", &empty), "");
}

TEST(ReadAllOutputTest, HumanAndJsonFormsShowThePayloadsAsJson) {
  MessageValue reply = Json(R"({"recents": ["com.vantorel.lmk:{\"char\":\"A\"}"], "favorites": null})");
  reply.Set("state", MessageValue::DataFromBytes(R"({"VTGlobalEmojiDiversityDescribed":true})"));
  EXPECT_EQ(FormatReadAll(reply),
            "recents:\nA\tU+0041\nfavorites: (none)\nskin tones: (none)\n"
            "state: {\"VTGlobalEmojiDiversityDescribed\":true}\n");

  const nlohmann::json json = ReplyJson(reply);
  EXPECT_EQ(json["state"]["VTGlobalEmojiDiversityDescribed"], true);
  EXPECT_TRUE(json["favorites"].is_null());
  EXPECT_FALSE(json.contains("skintones"));
  // A payload that is not JSON keeps its bytes, as a data escape.
  reply.Set("skintones", MessageValue::DataFromBytes("hi"));
  EXPECT_EQ(ReplyJson(reply)["skintones"], nlohmann::json({{"$base64", "aGk="}}));
}

}  // namespace
}  // namespace lumeris::cli
