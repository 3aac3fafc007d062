// The adapter between the dispatcher's types and the store: missing identifiers and
// applications, list conversion, and the save_state payload rules.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "store/store_operations.h"
#include "store_fixture.h"

namespace lumeris {
namespace {

using ::testing::ElementsAre;
using ::testing::Optional;
using testing::EmojiID;

class StoreOperationsTest : public testing::StoreTest {
 protected:
  StoreOperationsTest() { InstallStoreOperations(operations_); }
  ServiceOperations operations_;
};

TEST_F(StoreOperationsTest, WithoutIdentifierOrApplicationNothingIsReadOrWritten) {
  seedStore({{"Recents:", plist::Array{"r"}},
             {"Favorites:", plist::Array{"f"}},
             {"SkinTones:", plist::Dictionary{{"a", "b"}}},
             {"State:", plist::Dictionary{{"s", 1}}},
             {"VTGlobalEmojiDiversityDescribed", true}});
  const plist::Dictionary before = storedDomain();

  EXPECT_FALSE(operations_.CopyRecentsIDArray(std::nullopt));
  EXPECT_FALSE(operations_.CopyFavoritesIDArray(std::nullopt));
  EXPECT_FALSE(operations_.CopySkinToneHistory(std::nullopt));
  EXPECT_EQ(operations_.CopyLastState(std::nullopt), "{}");
  operations_.SetRecentsIDArray(std::vector<std::string>{"x"}, std::nullopt);
  operations_.AddRecentID("x", std::nullopt);
  operations_.SetFavoritesIDArray(std::nullopt, std::nullopt);
  operations_.SetLastSkinToneSelection("", std::nullopt);
  operations_.SetLastState(std::string(R"({"VTGlobalEmojiDiversityDescribed":false})"), std::nullopt);
  operations_.SetLastState(std::nullopt, std::nullopt);

  EXPECT_EQ(storedDomain(), before) << "the unversioned domain was not even wiped";
  EXPECT_EQ(posts(), 0);
}

TEST_F(StoreOperationsTest, StoredListsReachTheDispatcherAsStrings) {
  seedStore({{"version", 1},
             {"Recents:id", plist::Array{"a", plist::Value(1), "b"}},
             {"Favorites:id", plist::Dictionary{{"not", "a list"}}}});
  EXPECT_THAT(operations_.CopyRecentsIDArray("id"), Optional(ElementsAre("a", "b")));
  EXPECT_FALSE(operations_.CopyFavoritesIDArray("id"));

  operations_.SetFavoritesIDArray(std::vector<std::string>{}, "id");
  EXPECT_THAT(operations_.CopyFavoritesIDArray("id"), Optional(::testing::IsEmpty()));
  operations_.SetFavoritesIDArray(std::nullopt, "id");
  EXPECT_FALSE(storedValue("Favorites:id"));
}

TEST_F(StoreOperationsTest, SkinTonesAndStateTravelAsCompactJson) {
  seedStore({{"version", 1}});
  EXPECT_FALSE(operations_.CopySkinToneHistory("id"));
  operations_.SetLastSkinToneSelection(EmojiID(testing::kThumbsUpMedium), "id");
  EXPECT_EQ(operations_.CopySkinToneHistory("id"),
            "{\"" + std::string(testing::kThumbsUp) + "\":\"" + testing::kThumbsUpMedium + "\"}");

  operations_.SetLastState(std::string(R"( {"tab": 2, "VTGlobalEmojiDiversityDescribed": true} )"), "app");
  EXPECT_EQ(operations_.CopyLastState("app"), R"({"VTGlobalEmojiDiversityDescribed":true,"tab":2})");
  EXPECT_EQ(operations_.CopyLastState("other"), R"({"VTGlobalEmojiDiversityDescribed":true})");
}

TEST_F(StoreOperationsTest, UnstorablePayloadsAreIgnoredWithoutWriting) {
  seedStore({{"Unversioned", 1}});
  const plist::Dictionary before = storedDomain();
  for (const char* payload : {R"({"VTGlobalEmojiDiversityDescribed":null})", R"([1,2])", R"({"a":[null]})"}) {
    operations_.SetLastState(std::string(payload), "app");
  }
  EXPECT_EQ(storedDomain(), before);
  EXPECT_EQ(posts(), 0);
}

TEST_F(StoreOperationsTest, APayloadThatIsNotJsonStillRunsTheVersionCheck) {
  seedStore({{"Unversioned", 1}});
  operations_.SetLastState(std::string("not json"), "app");
  EXPECT_EQ(storedDomain(), (plist::Dictionary{{"version", std::int64_t{1}}}));
  EXPECT_EQ(posts(), 0);
}

}  // namespace
}  // namespace lumeris
