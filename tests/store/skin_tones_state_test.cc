// The skin-tone history and the saved panel state: which choices are recorded, the horse-racing
// rule, the global member and the rules that make a saved state change nothing.
#include <gtest/gtest.h>

#include "store/saved_state.h"
#include "store/skin_tones.h"
#include "store_fixture.h"

namespace lumeris {
namespace {

using testing::EmojiID;
using testing::kThumbsUp;
using testing::kThumbsUpDark;
using testing::kThumbsUpMedium;
using testing::PlainID;
using testing::StoreTest;

class SkinToneTest : public StoreTest {
 protected:
  void SetUp() override { seedStore({{"version", 1}, {"SkinTones:id", plist::Dictionary{{"x", "y"}}}}); }
  std::optional<plist::Value> history() { return storedValue("SkinTones:id"); }
};

TEST_F(SkinToneTest, ChoicesThatAreNotSkinToneEmojiInTheEmojiFontChangeNothing) {
  const std::string refused[] = {
      PlainID(kThumbsUpMedium),                                                  // no font
      "com.vantorel.lmk:{\"char\":\"" + std::string(kThumbsUpMedium) + "\",\"font\":\"Courier\"}",
      EmojiID(testing::kGrinning),                                               // takes no skin tone
      EmojiID(std::string(kThumbsUp) + kThumbsUp + kThumbsUp),                   // more than two scalars
      "not an entity id",
      "com.vantorel.lmk:{",                                                      // damaged JSON
  };
  for (const std::string& item : refused) {
    EXPECT_FALSE(SetLastSkinToneSelection(item, "id")) << item;
    EXPECT_EQ(history(), plist::Value(plist::Dictionary{{"x", "y"}})) << item;
  }
  EXPECT_EQ(posts(), 0);
}

TEST_F(SkinToneTest, SkinToneEmojiInTheEmojiFontAreRecordedWithOrWithoutAModifier) {
  struct Case {
    std::string character;
    std::string key;
    std::string value;
  };
  const Case cases[] = {
      {kThumbsUpMedium, kThumbsUp, kThumbsUpMedium},
      {kThumbsUpDark, kThumbsUp, kThumbsUpDark},
      {kThumbsUp, kThumbsUp, kThumbsUp},
      // U+261D takes a presentation selector: its key (and plain value) gets U+FE0F.
      {"\xE2\x98\x9D", "\xE2\x98\x9D\xEF\xB8\x8F", "\xE2\x98\x9D\xEF\xB8\x8F"},
  };
  int expected_posts = 0;
  for (const Case& c : cases) {
    EXPECT_TRUE(SetLastSkinToneSelection(EmojiID(c.character), "id"));
    EXPECT_EQ(posts(), ++expected_posts);
    const std::optional<plist::Value> stored = history();
    ASSERT_TRUE(stored && stored->AsDictionary());
    ASSERT_NE(stored->Find(c.key), nullptr) << c.character;
    EXPECT_EQ(*stored->Find(c.key), plist::Value(c.value));
    EXPECT_EQ(*stored->Find("x"), plist::Value("y")) << "other entries stay";
  }
}

TEST_F(SkinToneTest, AnEmptyOrAbsentChoiceRemovesTheHistoryAndNotifies) {
  EXPECT_TRUE(SetLastSkinToneSelection(std::string(), "id"));
  EXPECT_FALSE(history());
  EXPECT_TRUE(SetLastSkinToneSelection(std::nullopt, "id"));
  EXPECT_FALSE(history());
  EXPECT_EQ(posts(), 2);
}

TEST_F(SkinToneTest, HorseRacingIsNeverReportedAndTheNextWriteDropsIt) {
  seedStore({{"version", 1},
             {"SkinTones:id", plist::Dictionary{{testing::kHorseRacing, testing::kHorseRacingLight},
                                                {kThumbsUp, kThumbsUpDark}}}});
  EXPECT_EQ(CopySkinToneHistory("id"), (plist::Dictionary{{kThumbsUp, kThumbsUpDark}}));
  EXPECT_NE(history()->Find(testing::kHorseRacing), nullptr);

  SetLastSkinToneSelection(EmojiID(kThumbsUpMedium), "id");
  EXPECT_EQ(history(), plist::Value(plist::Dictionary{{kThumbsUp, kThumbsUpMedium}}));
}

TEST_F(SkinToneTest, AStoredHistoryOfAnotherTypeReadsAsNone) {
  seedStore({{"version", 1}, {"SkinTones:id", plist::Array{"x"}}});
  EXPECT_FALSE(CopySkinToneHistory("id"));
  EXPECT_TRUE(SetLastSkinToneSelection(EmojiID(kThumbsUpMedium), "id"));
  EXPECT_EQ(history(), plist::Value(plist::Dictionary{{kThumbsUp, kThumbsUpMedium}}));
}

// ---- Saved state ----

class SavedStateTest : public StoreTest {
 protected:
  void SetUp() override {
    seedStore({{"version", 1},
               {"State:app", plist::Dictionary{{"tab", 2}, {"VTGlobalEmojiDiversityDescribed", "old"}}}});
  }
};

TEST_F(SavedStateTest, TheGlobalMemberAloneKeepsTheApplicationsStateAndNotifies) {
  SetLastState(plist::Dictionary{{"VTGlobalEmojiDiversityDescribed", true}}, "app");
  EXPECT_EQ(posts(), 1);
  EXPECT_EQ(storedValue("VTGlobalEmojiDiversityDescribed"), plist::Value(true));
  EXPECT_EQ(CopyLastState("app"), (plist::Dictionary{{"tab", 2}, {"VTGlobalEmojiDiversityDescribed", true}}));
  EXPECT_EQ(CopyLastState("other"), (plist::Dictionary{{"VTGlobalEmojiDiversityDescribed", true}}));
}

TEST_F(SavedStateTest, AStateReplacesTheStoredOneWholeWithoutTheGlobalMember) {
  SetLastState(plist::Dictionary{{"search", "x"}, {"VTGlobalEmojiDiversityDescribed", 1}}, "app");
  EXPECT_EQ(storedValue("State:app"), plist::Value(plist::Dictionary{{"search", "x"}}));
  EXPECT_EQ(posts(), 1);
  SetLastState(plist::Dictionary{{"tab", 3}}, "app");
  EXPECT_EQ(storedValue("State:app"), plist::Value(plist::Dictionary{{"tab", 3}}));
  EXPECT_EQ(posts(), 1) << "a state without the global member posts nothing";
}

TEST_F(SavedStateTest, AnEmptyOrAbsentStateChangesNothing) {
  const plist::Dictionary before = storedDomain();
  SetLastState(plist::Dictionary{}, "app");
  SetLastState(std::nullopt, "app");
  EXPECT_EQ(storedDomain(), before);
  EXPECT_EQ(posts(), 0);
}

TEST_F(SavedStateTest, ReadingMergesTheGlobalMemberOverTheApplicationsOwn) {
  EXPECT_EQ(CopyLastState("app"), (plist::Dictionary{{"tab", 2}, {"VTGlobalEmojiDiversityDescribed", "old"}}));
  EXPECT_EQ(CopyLastState("nothing stored"), plist::Dictionary{});
  seedStore({{"version", 1},
             {"State:app", plist::Dictionary{{"VTGlobalEmojiDiversityDescribed", "old"}}},
             {"VTGlobalEmojiDiversityDescribed", "global"}});
  EXPECT_EQ(CopyLastState("app"), (plist::Dictionary{{"VTGlobalEmojiDiversityDescribed", "global"}}));
}

}  // namespace
}  // namespace lumeris
