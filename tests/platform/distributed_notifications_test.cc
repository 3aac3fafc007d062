// Distributed notifications on the private session bus of the test environment.
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <string>
#include <thread>
#include <vector>

#include "platform/distributed_notifications.h"
#include "support/scoped_env.h"
#include "viewer/notification_names.h"

namespace lumeris {
namespace {

using namespace std::chrono_literals;

class DistributedNotificationsTest : public ::testing::Test {
 protected:
  void SetUp() override {
    if (std::getenv("DBUS_SESSION_BUS_ADDRESS") == nullptr) GTEST_SKIP() << "no session bus (source scripts/test-env.sh)";
  }

  // What `observer` receives within `wait`, up to `count` notifications.
  static std::vector<DistributedNotification> Collect(DistributedNotificationObserver& observer,
                                                      std::optional<std::size_t> count,
                                                      std::chrono::milliseconds wait) {
    std::vector<DistributedNotification> seen;
    observer.Run([&](const DistributedNotification& n) { seen.push_back(n); }, {.max_count = count, .timeout = wait});
    return seen;
  }
};

TEST_F(DistributedNotificationsTest, PostReachesObserverExactlyOnce) {
  auto observer = DistributedNotificationObserver::Open(kLMLumerisRecentsChangedNotification);
  ASSERT_NE(observer, nullptr);
  ASSERT_TRUE(PostDistributedNotification(kLMLumerisRecentsChangedNotification));
  std::vector<DistributedNotification> seen = Collect(*observer, 1, 5000ms);
  ASSERT_EQ(seen.size(), 1u);
  EXPECT_EQ(seen[0].name, kLMLumerisRecentsChangedNotification);
  EXPECT_EQ(seen[0].object, "");
  EXPECT_TRUE(Collect(*observer, std::nullopt, 300ms).empty()) << "delivered more than once";
}

TEST_F(DistributedNotificationsTest, ObserverSeesOnlyItsNameInPostingOrder) {
  auto named = DistributedNotificationObserver::Open("Wanted");
  auto all = DistributedNotificationObserver::Open();
  ASSERT_NE(named, nullptr);
  ASSERT_NE(all, nullptr);
  PostDistributedNotification("Unwanted", "x");
  PostDistributedNotification("Wanted", "first");
  PostDistributedNotification("Wanted", "second");
  std::vector<std::string> seen;
  for (const DistributedNotification& n : Collect(*named, 2, 5000ms)) seen.push_back(n.name + ":" + n.object);
  EXPECT_EQ(seen, (std::vector<std::string>{"Wanted:first", "Wanted:second"}));
  seen.clear();
  for (const DistributedNotification& n : Collect(*all, 3, 5000ms)) seen.push_back(n.name);
  EXPECT_EQ(seen, (std::vector<std::string>{"Unwanted", "Wanted", "Wanted"}));
}

TEST_F(DistributedNotificationsTest, StopEndsRunFromAnotherThread) {
  auto observer = DistributedNotificationObserver::Open("Never");
  ASSERT_NE(observer, nullptr);
  std::thread stopper([&] {
    std::this_thread::sleep_for(50ms);
    observer->Stop();
  });
  const auto start = std::chrono::steady_clock::now();
  EXPECT_EQ(observer->Run([](const DistributedNotification&) {}), 0u);
  stopper.join();
  EXPECT_LT(std::chrono::steady_clock::now() - start, 30s) << "Run ignored Stop()";
}

// Without a session bus a post is dropped quietly and no observer can be opened. The posting
// connection of this process may already exist, so a forked child checks a first post.
TEST(DistributedNotificationsWithoutBusTest, PostIsDroppedWithoutFailing) {
  testing::IsolatedUserEnvironment env;
  env.env().Set("DBUS_SESSION_BUS_ADDRESS", "unix:path=" + (env.runtime_dir() / "no-bus").string());
  EXPECT_EQ(DistributedNotificationObserver::Open(), nullptr);
  const pid_t child = fork();
  ASSERT_GE(child, 0);
  if (child == 0) _exit(PostDistributedNotification("Dropped") ? 1 : 0);
  int status = 0;
  ASSERT_EQ(waitpid(child, &status, 0), child);
  ASSERT_TRUE(WIFEXITED(status));
  EXPECT_EQ(WEXITSTATUS(status), 0);
}

}  // namespace
}  // namespace lumeris
