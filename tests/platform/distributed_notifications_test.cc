// Distributed notifications on the private session bus of the test program.
#include "platform/distributed_notifications.h"

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <systemd/sd-bus.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <thread>

#include "support/scoped_env.h"

namespace lumeris {
namespace {

using namespace std::chrono_literals;
using Seen = std::vector<std::string>;

class DistributedNotificationsTest : public ::testing::Test {
 protected:
  void SetUp() override {
    if (std::getenv("DBUS_SESSION_BUS_ADDRESS") == nullptr) GTEST_SKIP() << "no session bus (source scripts/test-env.sh)";
  }
  // "name:object" of what `observer` receives, waiting up to a few seconds for `count`.
  static Seen Collect(DistributedNotificationObserver& observer, std::size_t count) {
    Seen seen;
    observer.Run([&](const DistributedNotification& n) { seen.push_back(n.name + ":" + n.object); },
                 {.max_count = count, .timeout = 5s});
    return seen;
  }
};

// The posts of one process arrive in posting order, each once, at the observers of their name.
TEST_F(DistributedNotificationsTest, PostReachesTheObserversOfItsNameOnceInPostingOrder) {
  auto named = DistributedNotificationObserver::Open("LMLumerisRecentsChangedNotification");
  auto all = DistributedNotificationObserver::Open();
  ASSERT_TRUE(named && all);
  EXPECT_TRUE(PostDistributedNotification("LMLumerisRecentsChangedNotification"));
  PostDistributedNotification("Unwanted", "x");
  PostDistributedNotification("LMLumerisRecentsChangedNotification", "second");
  EXPECT_EQ(Collect(*named, 2),
            (Seen{"LMLumerisRecentsChangedNotification:", "LMLumerisRecentsChangedNotification:second"}));
  EXPECT_EQ(Collect(*all, 3), (Seen{"LMLumerisRecentsChangedNotification:", "Unwanted:x",
                                    "LMLumerisRecentsChangedNotification:second"}));
}

// Other programs post and match the signal by the names the platform contract fixes.
TEST_F(DistributedNotificationsTest, PostsAndObservesTheSignalOtherProgramsUse) {
  sd_bus* bus = nullptr;
  ASSERT_GE(sd_bus_open_user(&bus), 0);
  Seen raw;
  auto on_signal = [](sd_bus_message* message, void* seen, sd_bus_error*) {
    const char *name = nullptr, *object = nullptr;
    if (sd_bus_message_read(message, "ss", &name, &object) >= 0) {
      static_cast<Seen*>(seen)->push_back(std::string(name) + ":" + object);
    }
    return 0;
  };
  ASSERT_GE(sd_bus_add_match(bus, nullptr,
                             "type='signal',interface='com.vantorel.DistributedNotificationCenter',"
                             "member='Notification',path='/com/vantorel/DistributedNotificationCenter',arg0='Out'",
                             on_signal, &raw),
            0);
  PostDistributedNotification("Out", "obj");
  for (auto deadline = std::chrono::steady_clock::now() + 5s; raw.empty() && std::chrono::steady_clock::now() < deadline;) {
    if (sd_bus_process(bus, nullptr) == 0) sd_bus_wait(bus, 100'000);
  }
  sd_bus_flush_close_unref(bus);
  EXPECT_EQ(raw, Seen{"Out:obj"});

  auto observer = DistributedNotificationObserver::Open("In");
  ASSERT_TRUE(observer);
  ASSERT_EQ(std::system("dbus-send --session --type=signal /com/vantorel/DistributedNotificationCenter "
                        "com.vantorel.DistributedNotificationCenter.Notification string:In string:obj"),
            0);
  EXPECT_EQ(Collect(*observer, 1), Seen{"In:obj"});
}

// Stop() ends a Run that is running or, called before, the next one.
TEST_F(DistributedNotificationsTest, StopEndsRunFromAnotherThread) {
  auto observer = DistributedNotificationObserver::Open("Never");
  ASSERT_NE(observer, nullptr);
  const auto start = std::chrono::steady_clock::now();
  std::thread stopper([&] { observer->Stop(); });
  EXPECT_EQ(observer->Run([](const DistributedNotification&) {}, {.timeout = 5s}), 0u);
  stopper.join();
  EXPECT_LT(std::chrono::steady_clock::now() - start, 3s) << "Run ignored Stop()";
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
  EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
}

}  // namespace
}  // namespace lumeris
