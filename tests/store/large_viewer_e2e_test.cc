// "open_large_viewer" through the real service: the preference is on disk when the reply comes.
#include <gtest/gtest.h>

#include "store_fixture.h"
#include "support/service_fixture.h"

namespace lumeris {
namespace {

using testing::Command;

constexpr char kKey[] = "VTStartAsLargeWindowTemporarily";

class LargeViewerTest : public testing::ServiceTest {
 protected:
  // Sends "open_large_viewer" and reads the input method's file as soon as the reply is in.
  std::optional<plist::Value> openAndReadBack(std::optional<std::string> path) {
    MessageValue request = Command("open_large_viewer");
    if (path) request.Set("path", MessageValue::String(*path));
    std::optional<MessageValue> reply = sendRequest(request);
    EXPECT_TRUE(reply && reply->AsDictionary() && reply->AsDictionary()->empty()) << "an empty reply";
    const plist::Dictionary domain = testing::StoredDomain("com.vantorel.SorvendiIM");
    auto found = domain.find(kKey);
    if (found == domain.end()) return std::nullopt;
    return found->second;
  }
};

TEST_F(LargeViewerTest, ThePathIsWrittenBeforeTheReplyAndRemovedWithoutOne) {
  testing::SeedDomain("com.vantorel.SorvendiIM", {{"VTRecentItems", plist::Array{}}});
  EXPECT_EQ(openAndReadBack("/home/user/first"), plist::Value("/home/user/first"));
  EXPECT_EQ(openAndReadBack("/tmp/second path"), plist::Value("/tmp/second path"));
  EXPECT_EQ(openAndReadBack(std::nullopt), std::nullopt);
  EXPECT_TRUE(testing::StoredDomain("com.vantorel.SorvendiIM").contains("VTRecentItems")) << "other keys stay";
}

}  // namespace
}  // namespace lumeris
