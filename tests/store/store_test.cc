// The store's functions on isolated preference files: the version wipe, recents and favourites
// (adding, the horse-racing repair, the one-time conversions, their asymmetry), the skin-tone
// history and the saved state, counting the change notifications each posts.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <functional>

#include "platform/preferences.h"
#include "store/favorites.h"
#include "store/horse_racing.h"
#include "store/recents.h"
#include "store/saved_state.h"
#include "store/skin_tones.h"
#include "store/storage_version.h"
#include "store_fixture.h"

namespace lumeris {
namespace {

using namespace testing;  // lumeris::testing
using ::testing::ElementsAre;
using ::testing::Optional;

constexpr char kGlobal[] = "VTGlobalEmojiDiversityDescribed";
constexpr char kDefaultIdentifier[] = "com.vantorel.Lumeris.DefaultDataStorage";

// A domain without a version is wiped (and versioned) by the operations that check it, before
// they write; any other version is accepted as it is.
TEST_F(StoreTest, UnversionedDomainIsWipedOnlyByTheOperationsThatCheck) {
  const struct {
    const char* name;
    std::function<void()> operation;
    std::optional<std::int64_t> version;  // the domain's before
    bool wipes;
    const char* written;  // a key the operation stores, or ""
  } cases[] = {
      {"CopyRecents", [] { CopyRecentsIDArray("id"); }, {}, true, ""},
      {"SetRecents", [] { SetRecentsIDArray(plist::Array{"a"}, "id"); }, {}, true, "Recents:id"},
      {"SetFavorites", [] { SetFavoritesIDArray(plist::Array{"a"}, "id"); }, {}, true, "Favorites:id"},
      {"SetStateAbsent", [] { SetLastState(std::nullopt, "app"); }, {}, true, ""},
      {"CopyFavorites", [] { CopyFavoritesIDArray("id"); }, {}, false, ""},
      {"CopySkinTones", [] { CopySkinToneHistory("id"); }, {}, false, ""},
      {"CopyState", [] { CopyLastState("app"); }, {}, false, ""},
      {"SetSkinTone", [] { SetLastSkinToneSelection(EmojiID(kThumbsUpMedium), "id"); }, {}, false, "SkinTones:id"},
      {"SetRecents at version 7", [] { SetRecentsIDArray(plist::Array{"a"}, "id"); }, 7, false, "Recents:id"},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.name);
    plist::Dictionary seed{{"Recents:old", plist::Array{"x"}}, {"Leftover", 3}};
    if (c.version) seed.emplace("version", *c.version);
    SeedStore(seed);
    CFPreferencesAppSynchronize("com.vantorel.Lumeris");  // the view a fresh process would load
    c.operation();
    // Whatever the operation left pending (a wipe included) reaches the file with the probe.
    CFPreferencesSetAppValue("Probe", plist::Value(true), "com.vantorel.Lumeris");
    CFPreferencesAppSynchronize("com.vantorel.Lumeris");
    const plist::Dictionary domain = StoredDomain();
    EXPECT_EQ(domain.contains("Leftover"), !c.wipes);
    EXPECT_EQ(domain.contains("Recents:old"), !c.wipes);
    EXPECT_TRUE(*c.written == '\0' || domain.contains(c.written));
    const std::optional<plist::Value> version = c.version ? std::optional(plist::Value(*c.version)) : std::nullopt;
    EXPECT_EQ(StoredValue("version"), c.wipes ? plist::Value(1) : version);
  }
}

// ---- Recents ----

class RecentsTest : public StoreTest {
 protected:
  void SetUp() override { SeedStore({{"version", 1}}); }
  static void storeRecents(const StringVector& list) { SetRecentsIDArray(plist::Array(list.begin(), list.end()), "id"); }
};

TEST_F(RecentsTest, AddingPutsTheItemFirstRemovingEntriesOfTheSameTextAndNotifiesOnce) {
  const std::string a = PlainID("a"), b = PlainID("b"), c = PlainID("c");
  const std::string up = EmojiID(kThumbsUp), dark = EmojiID(kThumbsUpDark), medium = EmojiID(kThumbsUpMedium);
  const struct { const char* name; plist::Value stored; std::string added; StringVector expected; } cases[] = {
      {"equal emoji moves with the new text", plist::Array{a, b, up, c, up}, dark, {dark, a, b, c}},
      {"only the first equal entry's text goes", plist::Array{up, a, medium}, dark, {dark, a, medium}},
      {"emoji font and plain stay apart", plist::Array{PlainID(kThumbsUp)}, up, {up, PlainID(kThumbsUp)}},
      {"the first item again", plist::Array{a, b}, a, {a, b}},
      {"over a value that is not a list", plist::Value("not a list"), "token", {"token"}},
      {"never trimmed", plist::Array(200, plist::Value(a)), b, [&] { StringVector v(201, a); v[0] = b; return v; }()},
  };
  for (const auto& t : cases) {
    SCOPED_TRACE(t.name);
    SeedStore({{"version", 1}, {"Recents:id", t.stored}});
    resetPosts();
    AddRecentID(t.added, "id");
    EXPECT_EQ(StoredList("Recents:id"), t.expected);
    EXPECT_EQ(posts(), 1);
  }
}

TEST_F(RecentsTest, EveryStoreNotifiesOnceAndKeepsTheHistoryInStepWithTheList) {
  const std::pair<std::optional<plist::Array>, bool> cases[] = {  // the list, whether the history is written
      {plist::Array{PlainID("a")}, false}, {plist::Array{EmojiID(kThumbsUpMedium)}, true}, {plist::Array{}, true},
      {std::nullopt, true}, {plist::Array{plist::Value(3), "b"}, false}};
  for (const auto& [list, history_written] : cases) {
    resetPosts();
    EXPECT_EQ(SetRecentsIDArray(list, "id"), history_written);
    EXPECT_EQ(posts(), 1);
  }

  storeRecents({EmojiID(kThumbsUpMedium), EmojiID(kThumbsUpDark)});
  EXPECT_EQ(StoredValue("SkinTones:id"), plist::Value(plist::Dictionary{{kThumbsUp, kThumbsUpMedium}}))
      << "the first entry is recorded";
  storeRecents({});
  EXPECT_FALSE(StoredValue("SkinTones:id"));
  EXPECT_THAT(StoredList("Recents:id"), Optional(::testing::IsEmpty()));
  storeRecents({EmojiID(kThumbsUpMedium)});
  ClearRecents("id");
  EXPECT_FALSE(StoredValue("SkinTones:id"));
  storeRecents({EmojiID(kThumbsUpMedium)});
  SetRecentsIDArray(std::nullopt, "id");
  EXPECT_FALSE(StoredValue("SkinTones:id"));
  EXPECT_FALSE(StoredValue("Recents:id"));
}

TEST(HorseRacingRepair, RepairsOnlyTheFirstQuotedSpanThatCarriesAModifier) {
  const std::string plain = PlainID(kHorseRacing), modified = PlainID(kHorseRacingLight);
  const std::string quoted = std::string("\"") + kHorseRacing;
  const struct { const char* name; std::optional<plist::Value> stored; std::optional<StringVector> repaired; } cases[] = {
      {"absent", std::nullopt, std::nullopt}, {"not a list", plist::Value(modified), std::nullopt},
      {"empty", plist::Array{}, std::nullopt}, {"no horse", plist::Array{PlainID("a")}, std::nullopt},
      {"already plain", plist::Array{plain}, std::nullopt},
      {"plain first stops the search", plist::Array{plain, modified}, std::nullopt},
      {"no closing quote", plist::Array{std::string("\"") + kHorseRacingLight, modified}, std::nullopt},
      {"modifier", plist::Array{plist::Value(1), PlainID("a"), modified, modified},
       StringVector{PlainID("a"), plain, modified}},
      {"other text inside the quotes", plist::Array{quoted + "x\" and " + quoted + "y\""},
       StringVector{quoted + "\" and " + quoted + "y\""}},
  };
  for (const auto& c : cases) EXPECT_EQ(StringsOf(CreateArrayWithPlainHorseRacing(c.stored)), c.repaired) << c.name;
}

TEST_F(RecentsTest, HorseRacingIsReadPlainWhileTheStoredTextKeepsTheModifier) {
  storeRecents({PlainID(kHorseRacingLight), PlainID("a")});
  EXPECT_THAT(StringsOf(CopyRecentsIDArray("id")), Optional(ElementsAre(PlainID(kHorseRacing), PlainID("a"))));
  EXPECT_THAT(StoredList("Recents:id"), Optional(ElementsAre(PlainID(kHorseRacingLight), PlainID("a"))));
  SetFavoritesIDArray(plist::Array{PlainID(kHorseRacingLight)}, "id");
  EXPECT_THAT(StringsOf(CopyFavoritesIDArray("id")), Optional(ElementsAre(PlainID(kHorseRacing))));
  EXPECT_THAT(StoredList("Favorites:id"), Optional(ElementsAre(PlainID(kHorseRacingLight))));
}

TEST_F(RecentsTest, StoringFavoritesNeitherNotifiesNorTouchesTheHistory) {
  SetLastSkinToneSelection(EmojiID(kThumbsUpMedium), "id");
  resetPosts();
  EXPECT_TRUE(SetFavoritesIDArray(plist::Array{}, "id"));
  EXPECT_TRUE(SetFavoritesIDArray(plist::Array{EmojiID(kThumbsUpDark)}, "id"));
  EXPECT_EQ(posts(), 0);
  EXPECT_EQ(StoredValue("SkinTones:id"), plist::Value(plist::Dictionary{{kThumbsUp, kThumbsUpMedium}}));
  EXPECT_TRUE(SetFavoritesIDArray(std::nullopt, "id"));
  EXPECT_FALSE(StoredValue("Favorites:id"));
}

// ---- The one-time conversions of the older lists ----

plist::Array OldItems(const StringVector& characters) {
  plist::Array items;
  for (const std::string& character : characters) items.emplace_back(plist::Dictionary{{"String", character}});
  return items;
}

// Older items become entity IDs; elements of other types become empty items.
TEST_F(StoreTest, TheDefaultIdentifierConvertsOlderRecentsOnceAndOthersNever) {
  SeedDomain("com.vantorel.SorvendiIM",
             {{"VTRecentItems", plist::Array{plist::Dictionary{{"EntityID", "kept-as-is"}},
                                             plist::Dictionary{{"String", "A"}, {"Font", "Courier"}}, "text",
                                             plist::Dictionary{{"String", 5}, {"Glyph", 12}, {"Font", "F"}}}},
              {"VTFavorites", OldItems({"F"})}});
  const auto converted = ElementsAre("kept-as-is", PlainID("A"), "com.vantorel.lmk:{}",
                                     "com.vantorel.lmk:{\"font\":\"F\",\"glyph\":12}");
  EXPECT_FALSE(CopyRecentsIDArray("other"));
  EXPECT_FALSE(CopyFavoritesIDArray("other"));
  EXPECT_FALSE(StoredValue("VTRecentsConverted"));
  EXPECT_FALSE(StoredValue("VTFavoritesConverted"));

  const std::string key = "Recents:com.vantorel.Lumeris.DefaultDataStorage";
  EXPECT_THAT(StringsOf(CopyRecentsIDArray(kDefaultIdentifier)), Optional(converted));
  EXPECT_THAT(StoredList(key), Optional(converted));
  EXPECT_EQ(StoredValue("VTRecentsConverted"), plist::Value(true));
  EXPECT_EQ(posts(), 1);
  SetRecentsIDArray(std::nullopt, kDefaultIdentifier);
  EXPECT_FALSE(CopyRecentsIDArray(kDefaultIdentifier));
  EXPECT_TRUE(StoredDomain("com.vantorel.SorvendiIM").contains("VTRecentItems"));
}

TEST_F(StoreTest, FavoritesComeFromTheInputMethodFirstThenTheOlderServerWithoutNotifying) {
  const std::pair<bool, StringVector> cases[] = {{true, {PlainID("F")}}, {false, {PlainID("S"), PlainID("T")}}};
  for (const auto& [input_method, expected] : cases) {  // whether the input method holds favourites
    SeedStore({{"version", 1}});
    SeedDomain("com.vantorel.SorvexServer", {{"SorvexFavorites", OldItems({"S", "T"})}});
    SeedDomain("com.vantorel.SorvendiIM",
               input_method ? plist::Dictionary{{"VTFavorites", OldItems({"F"})}} : plist::Dictionary{});
    EXPECT_EQ(StringsOf(CopyFavoritesIDArray(kDefaultIdentifier)), expected);
    EXPECT_EQ(StoredList("Favorites:com.vantorel.Lumeris.DefaultDataStorage"), expected);
    EXPECT_EQ(StoredValue("VTFavoritesConverted"), plist::Value(true));
  }
  EXPECT_EQ(posts(), 0);
}

TEST_F(StoreTest, WithNoOlderListsTheConversionIsTriedOnce) {
  SeedStore({{"version", 1}});
  EXPECT_FALSE(CopyFavoritesIDArray(kDefaultIdentifier));
  EXPECT_FALSE(CopyRecentsIDArray(kDefaultIdentifier));
  EXPECT_EQ(StoredValue("VTFavoritesConverted"), plist::Value(true));
  EXPECT_EQ(StoredValue("VTRecentsConverted"), plist::Value(true));
  SeedDomain("com.vantorel.SorvendiIM", {{"VTRecentItems", OldItems({"A"})}, {"VTFavorites", OldItems({"F"})}});
  EXPECT_FALSE(CopyFavoritesIDArray(kDefaultIdentifier));
  EXPECT_FALSE(CopyRecentsIDArray(kDefaultIdentifier));
}

// ---- The skin-tone history ----

class SkinToneTest : public StoreTest {
 protected:
  void SetUp() override { SeedStore({{"version", 1}, {"SkinTones:id", plist::Dictionary{{"x", "y"}}}}); }
  static std::optional<plist::Value> history() { return StoredValue("SkinTones:id"); }
};

// Only skin-tone emoji in the emoji font are recorded (and notified); other entries stay.
TEST_F(SkinToneTest, SkinToneEmojiInTheEmojiFontAreRecordedAndNotifiedAndOtherChoicesChangeNothing) {
  const struct { std::string item, key, value; } cases[] = {  // key "" when refused
      {PlainID(kThumbsUpMedium), "", ""},  // no font
      {"com.vantorel.lmk:{\"char\":\"" + std::string(kThumbsUpMedium) + "\",\"font\":\"Courier\"}", "", ""},
      {EmojiID(kGrinning), "", ""},  // takes no skin tone
      {EmojiID(std::string(kThumbsUp) + kThumbsUp + kThumbsUp), "", ""},  // more than two scalars
      {"not an entity id", "", ""}, {"com.vantorel.lmk:{", "", ""},  // damaged JSON
      {EmojiID(kThumbsUpMedium), kThumbsUp, kThumbsUpMedium}, {EmojiID(kThumbsUpDark), kThumbsUp, kThumbsUpDark},
      {EmojiID(kThumbsUp), kThumbsUp, kThumbsUp},
      // U+261D takes a presentation selector: its key (and plain value) gets U+FE0F.
      {EmojiID("\xE2\x98\x9D"), "\xE2\x98\x9D\xEF\xB8\x8F", "\xE2\x98\x9D\xEF\xB8\x8F"},
  };
  plist::Dictionary expected{{"x", "y"}};
  int expected_posts = 0;
  for (const auto& c : cases) {
    SCOPED_TRACE(c.item);
    EXPECT_EQ(SetLastSkinToneSelection(c.item, "id"), !c.key.empty());
    if (!c.key.empty()) expected.insert_or_assign(c.key, c.value);
    expected_posts += !c.key.empty();
    EXPECT_EQ(history(), plist::Value(expected));
    EXPECT_EQ(posts(), expected_posts);
  }
  EXPECT_TRUE(SetLastSkinToneSelection(std::string(), "id"));
  EXPECT_FALSE(history());
  EXPECT_TRUE(SetLastSkinToneSelection(std::nullopt, "id"));
  EXPECT_EQ(posts(), expected_posts + 2) << "an empty or absent choice removes the history and notifies";
}

TEST_F(SkinToneTest, HorseRacingAndHistoriesOfAnotherTypeAreNeverReportedAndTheNextWriteDropsThem) {
  const plist::Value stored[] = {
      plist::Dictionary{{kHorseRacing, kHorseRacingLight}, {kThumbsUp, kThumbsUpDark}},
      plist::Array{"x"},
  };
  for (const plist::Value& history_value : stored) {
    SeedStore({{"version", 1}, {"SkinTones:id", history_value}});
    const std::optional<plist::Dictionary> read = CopySkinToneHistory("id");
    const plist::Dictionary reported{{kThumbsUp, kThumbsUpDark}};
    EXPECT_EQ(read, history_value.AsArray() ? std::nullopt : std::optional<plist::Dictionary>(reported));
    EXPECT_EQ(history(), history_value) << "reading writes nothing back";
    EXPECT_TRUE(SetLastSkinToneSelection(EmojiID(kThumbsUpMedium), "id"));
    EXPECT_EQ(history(), plist::Value(plist::Dictionary{{kThumbsUp, kThumbsUpMedium}}));
  }
}

// ---- The saved state (the notification and no-change rules are shown end to end) ----

TEST_F(StoreTest, TheGlobalMemberIsStoredApartAndMergedOverEachApplicationsState) {
  SeedStore({{"version", 1}, {"State:app", plist::Dictionary{{"tab", 2}, {kGlobal, "old"}}}});
  EXPECT_EQ(CopyLastState("app"), (plist::Dictionary{{"tab", 2}, {kGlobal, "old"}}));
  EXPECT_EQ(CopyLastState("nothing stored"), plist::Dictionary{});
  SetLastState(plist::Dictionary{{kGlobal, true}}, "app");
  EXPECT_EQ(CopyLastState("app"), (plist::Dictionary{{"tab", 2}, {kGlobal, true}})) << "the old state is kept";
  SetLastState(plist::Dictionary{{"search", "x"}, {kGlobal, "new"}}, "app");
  EXPECT_EQ(StoredValue("State:app"), plist::Value(plist::Dictionary{{"search", "x"}})) << "replaced whole";
  EXPECT_EQ(StoredValue(kGlobal), plist::Value("new"));
  EXPECT_EQ(CopyLastState("other"), (plist::Dictionary{{kGlobal, "new"}}));
  EXPECT_EQ(posts(), 2);
  const plist::Dictionary before = StoredDomain();
  SetLastState(plist::Dictionary{}, "app");
  SetLastState(std::nullopt, "app");
  EXPECT_EQ(StoredDomain(), before) << "an empty or absent state changes nothing";
  SetLastState(plist::Dictionary{{"tab", 3}}, "app");
  EXPECT_EQ(StoredValue("State:app"), plist::Value(plist::Dictionary{{"tab", 3}}));
  EXPECT_EQ(posts(), 2) << "only a state with the global member notifies";
}

}  // namespace
}  // namespace lumeris
