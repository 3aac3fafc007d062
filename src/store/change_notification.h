// The store's change notification: "LMLumerisRecentsChangedNotification", posted with no object
// after every store of the recents list, every write of the skin-tone history and every saved
// state that carries the global emoji-diversity member, so that every panel of the user reloads.
//
// Posting goes through a replaceable sink so that tests count posts without a message bus:
//
//   int posts = 0;
//   ScopedChangeNotificationSink counting([&] { ++posts; });
//   AddRecentID(item, identifier);   // posts == 1
//
// Thread-safety: PostRecentsChangedNotification may be called from any thread; the sink is read
// under a mutex and called outside it. A ScopedChangeNotificationSink is meant for tests: install
// it before the code under test runs on other threads.
#pragma once

#include <functional>

namespace lumeris {

// Posts the notification through the current sink (the session bus unless replaced). Never
// fails the caller: with no bus reachable the post is dropped.
void PostRecentsChangedNotification();

// Replaces the sink for its lifetime and restores the previous one after.
class ScopedChangeNotificationSink {
 public:
  explicit ScopedChangeNotificationSink(std::function<void()> sink);
  ~ScopedChangeNotificationSink();
  ScopedChangeNotificationSink(const ScopedChangeNotificationSink&) = delete;
  ScopedChangeNotificationSink& operator=(const ScopedChangeNotificationSink&) = delete;

 private:
  std::function<void()> previous_;
};

}  // namespace lumeris
