// Distributed notifications: a name (and an optional object string) broadcast to every
// process of the user, carried on the D-Bus session bus as the signal
//   interface com.vantorel.DistributedNotificationCenter, member Notification,
//   path /com/vantorel/DistributedNotificationCenter, arguments (s name, s object).
//
//   PostDistributedNotification(kLMLumerisRecentsChangedNotification);
//
//   auto observer = DistributedNotificationObserver::Open("SomeName");   // nullptr: no bus
//   observer->Run([](const DistributedNotification& n) { ... }, {.max_count = 1});
//
// Posting opens one bus connection for the process, lazily, on first use; with no session bus
// reachable a post is dropped (and tried again on the next post). Posting never fails the
// caller and never blocks for long: the signal is queued and flushed at once.
//
// Thread-safety: PostDistributedNotification may be called from any thread (the shared
// connection is guarded by a mutex). An observer is used by one thread at a time, except Stop(),
// which any thread or a signal handler may call.
#pragma once

#include <chrono>
#include <cstddef>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

namespace lumeris {

inline constexpr char kDistributedNotificationInterface[] = "com.vantorel.DistributedNotificationCenter";
inline constexpr char kDistributedNotificationPath[] = "/com/vantorel/DistributedNotificationCenter";
inline constexpr char kDistributedNotificationMember[] = "Notification";

// Posts `name` with `object` ("" when there is none). True when the signal was handed to the
// bus; false when it was dropped (no bus). Callers may ignore the result.
bool PostDistributedNotification(std::string_view name, std::string_view object = {});

struct DistributedNotification {
  std::string name;
  std::string object;
};

class DistributedNotificationObserver {
 public:
  using Callback = std::function<void(const DistributedNotification&)>;
  struct Limits {
    std::optional<std::size_t> max_count;              // stop after this many notifications
    std::optional<std::chrono::milliseconds> timeout;  // stop after this much time
  };

  // Connects to the session bus and subscribes to notifications named `name` (all names
  // when std::nullopt). Returns nullptr when no session bus is reachable. The subscription is
  // in place when Open returns: a notification posted afterwards is delivered.
  static std::unique_ptr<DistributedNotificationObserver> Open(std::optional<std::string> name = std::nullopt);

  ~DistributedNotificationObserver();
  DistributedNotificationObserver(const DistributedNotificationObserver&) = delete;
  DistributedNotificationObserver& operator=(const DistributedNotificationObserver&) = delete;

  // Calls `callback` for each notification as it arrives, in order, until Stop() is called,
  // a limit is reached or the bus connection ends. Returns the number delivered.
  std::size_t Run(const Callback& callback, Limits limits = {});

  // Makes a running (or the next) Run return promptly. Async-signal-safe.
  void Stop();

 private:
  struct Impl;
  explicit DistributedNotificationObserver(std::unique_ptr<Impl> impl);
  std::unique_ptr<Impl> impl_;
};

}  // namespace lumeris
