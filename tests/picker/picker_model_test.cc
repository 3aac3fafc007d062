// What the picker knows without a window: search transactions, grid navigation, skin tones,
// entity IDs and the saved state.
#include <gtest/gtest.h>

#include "picker/character_items.h"
#include "picker/grid_navigation.h"
#include "picker/picker_state.h"
#include "picker/search_requests.h"
#include "text/utf8.h"

namespace lumeris::picker {
namespace {

TEST(SearchRequestsTest, OneSearchInFlightAndOnlyTheNewestTextIsShown) {
  SearchRequests searches;
  const auto h = searches.TextChanged("h");
  ASSERT_TRUE(h);
  EXPECT_FALSE(searches.TextChanged("he"));   // waits behind "h"
  EXPECT_FALSE(searches.TextChanged("hea"));  // replaces "he"
  EXPECT_FALSE(searches.ReplyArrived(h->transaction + 7).show);  // a stray reply changes nothing
  const SearchRequests::Outcome after_h = searches.ReplyArrived(h->transaction);
  EXPECT_FALSE(after_h.show) << "the reply to \"h\" answers an old text";
  ASSERT_TRUE(after_h.next);
  EXPECT_EQ(after_h.next->text, "hea");
  EXPECT_NE(after_h.next->transaction, h->transaction);
  EXPECT_TRUE(searches.ReplyArrived(after_h.next->transaction).show);
  EXPECT_FALSE(searches.ReplyArrived(after_h.next->transaction).show) << "a reply is taken once";
}

TEST(SearchRequestsTest, ClearingTheFieldDropsTheReplyInFlight) {
  SearchRequests searches;
  const auto star = searches.TextChanged("star");
  ASSERT_TRUE(star);
  EXPECT_FALSE(searches.TextChanged(""));
  const SearchRequests::Outcome outcome = searches.ReplyArrived(star->transaction);
  EXPECT_FALSE(outcome.show);
  EXPECT_FALSE(outcome.next);
  EXPECT_TRUE(searches.TextChanged("moon")) << "nothing in flight any more";
}

TEST(GridNavigationTest, MovesStopAtTheEdgesAndKeepTheColumn) {
  // 10 cells in rows of 4:  0 1 2 3 / 4 5 6 7 / 8 9
  const struct {
    std::size_t from;
    GridMove move;
    std::size_t to;
  } kCases[] = {
      {0, GridMove::kLeft, 0},      {3, GridMove::kRight, 4},    {9, GridMove::kRight, 9},
      {1, GridMove::kUp, 1},        {5, GridMove::kDown, 9},     {6, GridMove::kDown, 6},
      {9, GridMove::kUp, 5},        {2, GridMove::kPageDown, 6}, {7, GridMove::kPageDown, 7},
      {9, GridMove::kPageUp, 5},    {1, GridMove::kPageUp, 1},   {5, GridMove::kHome, 0},
      {5, GridMove::kEnd, 9},
  };
  for (const auto& c : kCases) {
    GridNavigation navigation;
    navigation.Reset(10, 4);
    navigation.Select(c.from);
    navigation.Apply(c.move, 1);
    EXPECT_EQ(navigation.selected(), c.to) << "from " << c.from << " move " << static_cast<int>(c.move);
  }
  GridNavigation empty;
  empty.Reset(0, 4);
  EXPECT_FALSE(empty.Apply(GridMove::kDown, 1));
  GridNavigation fresh;
  fresh.Reset(10, 4);
  EXPECT_TRUE(fresh.Apply(GridMove::kDown, 1));
  EXPECT_EQ(fresh.selected(), 0u) << "the first move selects the first cell";
}

TEST(CharacterItemsTest, EntityIDsNameTheEmojiFontOnlyForEmoji) {
  EXPECT_EQ(EntityIDForCharacter("❤️"), "com.vantorel.lmk:{\"char\":\"❤️\",\"font\":\"VantorelColorEmoji\"}");
  EXPECT_EQ(EntityIDForCharacter("❤"), "com.vantorel.lmk:{\"char\":\"❤\"}");
  EXPECT_EQ(EntityIDForCharacter("7"), "com.vantorel.lmk:{\"char\":\"7\"}");
  EXPECT_EQ(CharacterOfEntityID("com.vantorel.lmk:{\"char\":\"α\"}"), "α");
  EXPECT_EQ(CharacterOfEntityID("com.vantorel.lmk:{}"), std::nullopt);
}

TEST(CharacterItemsTest, SkinTonesOfferedAndRemembered) {
  EXPECT_EQ(SkinToneVariants("👍"), (std::vector<std::string>{"👍", "👍🏻", "👍🏼", "👍🏽", "👍🏾", "👍🏿"}));
  EXPECT_EQ(SkinToneVariants("👍🏿").front(), "👍");
  EXPECT_EQ(SkinToneVariants("☝️"), (std::vector<std::string>{"☝️", "☝🏻", "☝🏼", "☝🏽", "☝🏾", "☝🏿"}));
  EXPECT_TRUE(SkinToneVariants("❤️").empty());
  EXPECT_TRUE(SkinToneVariants("α").empty());

  const std::string json = R"({"👍":"👍🏽","☝️":"☝️"})";
  const MessageValue::Bytes bytes(json.begin(), json.end());
  const ReplacementDictionary history = ParseSkinToneHistory(&bytes);
  EXPECT_EQ(WithRememberedSkinTone("👍", history), "👍🏽");
  EXPECT_EQ(WithRememberedSkinTone("👍🏿", history), "👍🏿") << "an explicit tone is kept";
  EXPECT_EQ(WithRememberedSkinTone("☝️", history), "☝️");
  EXPECT_EQ(WithRememberedSkinTone("👋", history), "👋");
  const std::string broken = "{not json";
  const MessageValue::Bytes broken_bytes(broken.begin(), broken.end());
  EXPECT_TRUE(ParseSkinToneHistory(&broken_bytes).empty());
}

TEST(PickerStateTest, RoundTripKeepsOtherMembersAndIgnoresWrongTypes) {
  const std::string stored =
      R"({"category":"Greek","closeAfterPick":true,"keepSearch":true,"searchText":"heart",)"
      R"("windowWidth":900,"windowHeight":"tall","VTGlobalEmojiDiversityDescribed":true})";
  const MessageValue::Bytes bytes(stored.begin(), stored.end());
  std::string others;
  PickerState state = ParsePickerState(&bytes, &others);
  EXPECT_EQ(state.category, "Greek");
  EXPECT_TRUE(state.close_after_pick);
  EXPECT_EQ(state.search_text, "heart");
  EXPECT_EQ(state.window_width, 900);
  EXPECT_EQ(state.window_height, 0) << "a string is not a height";

  state.keep_search = false;
  state.window_height = 600;
  EXPECT_EQ(PickerStateJson(state, others),
            R"({"VTGlobalEmojiDiversityDescribed":true,"category":"Greek","closeAfterPick":true,)"
            R"("keepSearch":false,"searchText":"","windowHeight":600,"windowWidth":900})");
  EXPECT_EQ(ParsePickerState(nullptr).category, "");
}

}  // namespace
}  // namespace lumeris::picker
