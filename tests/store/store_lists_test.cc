// The recents and favourites lists: the version wipe, adding, the horse-racing repair, the
// one-time conversions of the older lists, and the asymmetry between the two lists.
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

using ::testing::ElementsAre;
using ::testing::Optional;
using testing::EmojiID;
using testing::kDefaultIdentifier;
using testing::PlainID;
using testing::StoreTest;
using StringVector = std::vector<std::string>;

// ---- The version check ----

struct WipeCase {
  const char* name;
  std::function<void()> operation;
  bool wipes;
  friend void PrintTo(const WipeCase& c, std::ostream* os) { *os << c.name; }
};

class VersionCheckTest : public StoreTest, public ::testing::WithParamInterface<WipeCase> {};

TEST_P(VersionCheckTest, UnversionedDomainIsWipedOnlyByTheOperationsThatCheck) {
  seedStore({{"Recents:old", plist::Array{"x"}}, {"Leftover", 3}});
  GetParam().operation();
  // Whatever the operation left pending (a wipe included) reaches the file with the probe.
  CFPreferencesAppSynchronize(kStoreDomain);
  CFPreferencesSetAppValue("Probe", plist::Value(true), kStoreDomain);
  CFPreferencesAppSynchronize(kStoreDomain);
  const plist::Dictionary domain = storedDomain();
  if (GetParam().wipes) {
    EXPECT_FALSE(domain.contains("Leftover"));
    EXPECT_FALSE(domain.contains("Recents:old"));
    EXPECT_EQ(domain.at("version"), plist::Value(std::int64_t{1}));
  } else {
    EXPECT_TRUE(domain.contains("Leftover"));
    EXPECT_FALSE(domain.contains("version"));
  }
}

INSTANTIATE_TEST_SUITE_P(
    Operations, VersionCheckTest,
    ::testing::Values(
        WipeCase{"CopyRecents", [] { CopyRecentsIDArray("id"); }, true},
        WipeCase{"SetRecents", [] { SetRecentsIDArray(plist::Array{"a"}, "id"); }, true},
        WipeCase{"SetFavorites", [] { SetFavoritesIDArray(plist::Array{"a"}, "id"); }, true},
        WipeCase{"SetStateAbsent", [] { SetLastState(std::nullopt, "app"); }, true},
        WipeCase{"CopyFavorites", [] { CopyFavoritesIDArray("id"); }, false},
        WipeCase{"CopySkinTones", [] { CopySkinToneHistory("id"); }, false},
        WipeCase{"CopyState", [] { CopyLastState("app"); }, false},
        WipeCase{"SetSkinTone", [] { SetLastSkinToneSelection(EmojiID(testing::kThumbsUpMedium), "id"); },
                 false}),
    [](const ::testing::TestParamInfo<WipeCase>& info) { return info.param.name; });

TEST_F(StoreTest, AnyNonZeroVersionIsAccepted) {
  seedStore({{"version", 7}, {"Keep", 1}});
  CheckDataStorageVersion();
  SetRecentsIDArray(plist::Array{"a"}, "id");
  EXPECT_TRUE(storedDomain().contains("Keep"));
  EXPECT_EQ(storedDomain().at("version"), plist::Value(std::int64_t{7}));
}

TEST_F(StoreTest, TheWipeHappensOnlyOnce) {
  seedStore({{"Old", 1}});
  SetRecentsIDArray(plist::Array{"a"}, "id");
  SetFavoritesIDArray(plist::Array{"f"}, "id");
  EXPECT_THAT(storedList("Recents:id"), Optional(ElementsAre("a")));
  EXPECT_THAT(storedList("Favorites:id"), Optional(ElementsAre("f")));
  EXPECT_FALSE(storedDomain().contains("Old"));
}

// ---- Adding to recents ----

class RecentsTest : public StoreTest {
 protected:
  void SetUp() override { seedStore({{"version", 1}}); }
  void storeRecents(const StringVector& list) { SetRecentsIDArray(testing::IDArray(list), "id"); }
  std::optional<StringVector> recents() { return storedList("Recents:id"); }
};

TEST_F(RecentsTest, AddingPutsNewItemsFirstWithoutTrimming) {
  for (int n = 0; n < 150; ++n) AddRecentID(PlainID(std::to_string(n)), "id");
  const std::optional<StringVector> list = recents();
  ASSERT_TRUE(list);
  ASSERT_EQ(list->size(), 150u);
  EXPECT_EQ(list->front(), PlainID("149"));
  EXPECT_EQ(list->back(), PlainID("0"));
  EXPECT_EQ(posts(), 150);
}

TEST_F(RecentsTest, AddingAnEqualEmojiMovesItToTheFrontWithTheNewText) {
  storeRecents({PlainID("a"), PlainID("b"), EmojiID(testing::kThumbsUp), PlainID("c"), EmojiID(testing::kThumbsUp)});
  resetPosts();
  AddRecentID(EmojiID(testing::kThumbsUpDark), "id");
  EXPECT_THAT(recents(),
              Optional(ElementsAre(EmojiID(testing::kThumbsUpDark), PlainID("a"), PlainID("b"), PlainID("c"))));
  EXPECT_EQ(posts(), 1);
}

TEST_F(RecentsTest, OnlyEntriesWithTheFirstEqualEntrysTextAreRemoved) {
  storeRecents({EmojiID(testing::kThumbsUp), PlainID("a"), EmojiID(testing::kThumbsUpMedium)});
  AddRecentID(EmojiID(testing::kThumbsUpDark), "id");
  EXPECT_THAT(recents(), Optional(ElementsAre(EmojiID(testing::kThumbsUpDark), PlainID("a"),
                                              EmojiID(testing::kThumbsUpMedium))));
}

TEST_F(RecentsTest, EmojiFontAndPlainEntriesOfOneEmojiStaySeparate) {
  storeRecents({PlainID(testing::kThumbsUp)});
  AddRecentID(EmojiID(testing::kThumbsUp), "id");
  EXPECT_THAT(recents(), Optional(ElementsAre(EmojiID(testing::kThumbsUp), PlainID(testing::kThumbsUp))));
}

TEST_F(RecentsTest, AddingTheFirstItemAgainStillStoresAndNotifies) {
  storeRecents({PlainID("a"), PlainID("b")});
  resetPosts();
  AddRecentID(PlainID("a"), "id");
  EXPECT_THAT(recents(), Optional(ElementsAre(PlainID("a"), PlainID("b"))));
  EXPECT_EQ(posts(), 1);
}

TEST_F(RecentsTest, AddingOverAStoredValueThatIsNotAListStartsANewList) {
  seedStore({{"version", 1}, {"Recents:id", "not a list"}});
  AddRecentID("token", "id");
  EXPECT_THAT(recents(), Optional(ElementsAre("token")));
}

TEST_F(RecentsTest, EveryStoreNotifiesExactlyOnce) {
  struct Case {
    std::optional<plist::Array> list;
    bool history_written;
  };
  const Case cases[] = {
      {plist::Array{PlainID("a")}, false},
      {plist::Array{EmojiID(testing::kThumbsUpMedium)}, true},
      {plist::Array{}, true},
      {std::nullopt, true},
      {plist::Array{plist::Value(3), "b"}, false},
  };
  for (const Case& c : cases) {
    resetPosts();
    EXPECT_EQ(SetRecentsIDArray(c.list, "id"), c.history_written);
    EXPECT_EQ(posts(), 1);
  }
}

TEST_F(RecentsTest, StoringAnEmptyOrAbsentListRemovesTheSkinToneHistory) {
  storeRecents({EmojiID(testing::kThumbsUpMedium)});
  ASSERT_TRUE(storedValue("SkinTones:id"));
  storeRecents({});
  EXPECT_FALSE(storedValue("SkinTones:id"));
  EXPECT_THAT(recents(), Optional(::testing::IsEmpty()));

  storeRecents({EmojiID(testing::kThumbsUpMedium)});
  ClearRecents("id");
  EXPECT_FALSE(storedValue("SkinTones:id"));

  storeRecents({EmojiID(testing::kThumbsUpMedium)});
  SetRecentsIDArray(std::nullopt, "id");
  EXPECT_FALSE(storedValue("SkinTones:id"));
  EXPECT_FALSE(storedValue("Recents:id"));
}

TEST_F(RecentsTest, StoringAListRecordsItsFirstEntryInTheHistory) {
  storeRecents({EmojiID(testing::kThumbsUpMedium), EmojiID(testing::kThumbsUpDark)});
  const std::optional<plist::Value> history = storedValue("SkinTones:id");
  ASSERT_TRUE(history);
  EXPECT_EQ(*history, plist::Value(plist::Dictionary{{testing::kThumbsUp, testing::kThumbsUpMedium}}));
}

// ---- The horse-racing repair ----

TEST(HorseRacingRepair, RepairsOnlyTheFirstQuotedSpanThatCarriesAModifier) {
  const std::string plain = PlainID(testing::kHorseRacing);
  const std::string modified = PlainID(testing::kHorseRacingLight);
  struct Case {
    const char* name;
    std::optional<plist::Value> stored;
    std::optional<StringVector> repaired;
  };
  const Case cases[] = {
      {"absent", std::nullopt, std::nullopt},
      {"not a list", plist::Value(modified), std::nullopt},
      {"empty", plist::Value(plist::Array{}), std::nullopt},
      {"no horse", plist::Value(plist::Array{PlainID("a")}), std::nullopt},
      {"already plain", plist::Value(plist::Array{plain}), std::nullopt},
      {"plain first stops the search", plist::Value(plist::Array{plain, modified}), std::nullopt},
      {"no closing quote", plist::Value(plist::Array{std::string("\"") + testing::kHorseRacingLight, modified}),
       std::nullopt},
      {"modifier", plist::Value(plist::Array{plist::Value(1), PlainID("a"), modified, modified}),
       StringVector{PlainID("a"), plain, modified}},
      {"other text inside the quotes",
       plist::Value(plist::Array{std::string("\"") + testing::kHorseRacing + "x\" and \"" + testing::kHorseRacing +
                                 "y\""}),
       StringVector{std::string("\"") + testing::kHorseRacing + "\" and \"" + testing::kHorseRacing + "y\""}},
  };
  for (const Case& c : cases) {
    std::optional<plist::Array> result = CreateArrayWithPlainHorseRacing(c.stored);
    EXPECT_EQ(testing::StringsOf(result ? std::optional<plist::Value>(*result) : std::nullopt),
              c.repaired)
        << c.name;
  }
}

TEST_F(RecentsTest, HorseRacingIsReadPlainWhileTheStoredTextKeepsTheModifier) {
  storeRecents({PlainID(testing::kHorseRacingLight), PlainID("a")});
  EXPECT_THAT(testing::StringsOf(CopyRecentsIDArray("id")), Optional(ElementsAre(PlainID(testing::kHorseRacing), PlainID("a"))));
  EXPECT_THAT(recents(), Optional(ElementsAre(PlainID(testing::kHorseRacingLight), PlainID("a"))));

  SetFavoritesIDArray(testing::IDArray({PlainID(testing::kHorseRacingLight)}), "id");
  EXPECT_THAT(testing::StringsOf(CopyFavoritesIDArray("id")), Optional(ElementsAre(PlainID(testing::kHorseRacing))));
  EXPECT_THAT(storedList("Favorites:id"), Optional(ElementsAre(PlainID(testing::kHorseRacingLight))));
}

// ---- The one-time conversions ----

class ConversionTest : public StoreTest {
 protected:
  static plist::Value OldItems(const StringVector& characters) {
    plist::Array items;
    for (const std::string& character : characters) items.emplace_back(plist::Dictionary{{"String", character}});
    return plist::Value(std::move(items));
  }
};

TEST_F(ConversionTest, DefaultIdentifierConvertsOlderRecentsOnce) {
  seedDomain(kInputMethodDomain,
             {{"VTRecentItems", plist::Array{plist::Dictionary{{"EntityID", "kept-as-is"}},
                                             plist::Dictionary{{"String", "A"}, {"Font", "Courier"}}}}});
  EXPECT_THAT(testing::StringsOf(CopyRecentsIDArray(kDefaultIdentifier)), Optional(ElementsAre("kept-as-is", PlainID("A"))));
  EXPECT_THAT(storedList(StoreKey(kRecentsKeyPrefix, kDefaultIdentifier)),
              Optional(ElementsAre("kept-as-is", PlainID("A"))));
  EXPECT_EQ(storedValue("VTRecentsConverted"), plist::Value(true));
  EXPECT_EQ(posts(), 1);

  SetRecentsIDArray(std::nullopt, kDefaultIdentifier);
  EXPECT_FALSE(CopyRecentsIDArray(kDefaultIdentifier));
  EXPECT_TRUE(storedDomain(kInputMethodDomain).contains("VTRecentItems"));
}

TEST_F(ConversionTest, OtherIdentifiersNeverConvert) {
  seedDomain(kInputMethodDomain, {{"VTRecentItems", OldItems({"A"})}, {"VTFavorites", OldItems({"F"})}});
  EXPECT_FALSE(CopyRecentsIDArray("other"));
  EXPECT_FALSE(CopyFavoritesIDArray("other"));
  EXPECT_FALSE(storedValue("VTRecentsConverted"));
  EXPECT_FALSE(storedValue("VTFavoritesConverted"));
}

TEST_F(ConversionTest, FavoritesComeFromTheInputMethodFirstThenTheOlderServer) {
  seedStore({{"version", 1}});
  seedDomain(kOlderServerDomain, {{"SorvexFavorites", OldItems({"S"})}});
  seedDomain(kInputMethodDomain, {{"VTFavorites", OldItems({"F"})}});
  EXPECT_THAT(testing::StringsOf(CopyFavoritesIDArray(kDefaultIdentifier)), Optional(ElementsAre(PlainID("F"))));
  EXPECT_THAT(storedList(StoreKey(kFavoritesKeyPrefix, kDefaultIdentifier)), Optional(ElementsAre(PlainID("F"))));
  EXPECT_EQ(storedValue("VTFavoritesConverted"), plist::Value(true));
  EXPECT_EQ(posts(), 0);
}

TEST_F(ConversionTest, FavoritesFallBackToTheOlderServer) {
  seedStore({{"version", 1}});
  seedDomain(kOlderServerDomain, {{"SorvexFavorites", OldItems({"S", "T"})}});
  EXPECT_THAT(testing::StringsOf(CopyFavoritesIDArray(kDefaultIdentifier)), Optional(ElementsAre(PlainID("S"), PlainID("T"))));
}

TEST_F(ConversionTest, WithNoOlderListsTheAttemptIsMadeOnce) {
  seedStore({{"version", 1}});
  EXPECT_FALSE(CopyFavoritesIDArray(kDefaultIdentifier));
  EXPECT_FALSE(CopyRecentsIDArray(kDefaultIdentifier));
  EXPECT_EQ(storedValue("VTFavoritesConverted"), plist::Value(true));
  EXPECT_EQ(storedValue("VTRecentsConverted"), plist::Value(true));

  seedDomain(kInputMethodDomain, {{"VTRecentItems", OldItems({"A"})}, {"VTFavorites", OldItems({"F"})}});
  EXPECT_FALSE(CopyFavoritesIDArray(kDefaultIdentifier));
  EXPECT_FALSE(CopyRecentsIDArray(kDefaultIdentifier));
}

TEST_F(ConversionTest, OlderElementsOfOtherTypesReadAsEmptyItems) {
  seedStore({{"version", 1}});
  seedDomain(kInputMethodDomain,
             {{"VTRecentItems", plist::Array{"text", plist::Dictionary{{"String", 5}, {"Glyph", 12}, {"Font", "F"}}}}});
  EXPECT_THAT(testing::StringsOf(CopyRecentsIDArray(kDefaultIdentifier)),
              Optional(ElementsAre("com.vantorel.lmk:{}", "com.vantorel.lmk:{\"font\":\"F\",\"glyph\":12}")));
}

// ---- Favourites differ from recents on purpose ----

TEST_F(StoreTest, StoringFavoritesNeitherNotifiesNorTouchesTheHistory) {
  seedStore({{"version", 1}});
  SetLastSkinToneSelection(EmojiID(testing::kThumbsUpMedium), "id");
  resetPosts();
  EXPECT_TRUE(SetFavoritesIDArray(plist::Array{}, "id"));
  EXPECT_TRUE(SetFavoritesIDArray(testing::IDArray({EmojiID(testing::kThumbsUpDark)}), "id"));
  EXPECT_EQ(posts(), 0);
  EXPECT_EQ(storedValue("SkinTones:id"),
            plist::Value(plist::Dictionary{{testing::kThumbsUp, testing::kThumbsUpMedium}}));
  EXPECT_TRUE(SetFavoritesIDArray(std::nullopt, "id"));
  EXPECT_FALSE(storedValue("Favorites:id"));
}

}  // namespace
}  // namespace lumeris
