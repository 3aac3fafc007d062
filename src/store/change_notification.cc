#include "store/change_notification.h"

#include <mutex>
#include <utility>

#include "platform/distributed_notifications.h"
#include "viewer/notification_names.h"

namespace lumeris {

namespace {

void PostOnSessionBus() { PostDistributedNotification(kLMLumerisRecentsChangedNotification); }

// The current sink, guarded by SinkMutex().
std::function<void()>& Sink() {
  static std::function<void()> sink = PostOnSessionBus;
  return sink;
}

std::mutex& SinkMutex() {
  static std::mutex mutex;
  return mutex;
}

std::function<void()> ExchangeSink(std::function<void()> replacement) {
  std::lock_guard lock(SinkMutex());
  return std::exchange(Sink(), std::move(replacement));
}

}  // namespace

void PostRecentsChangedNotification() {
  std::function<void()> sink;
  {
    std::lock_guard lock(SinkMutex());
    sink = Sink();
  }
  if (sink) sink();
}

ScopedChangeNotificationSink::ScopedChangeNotificationSink(std::function<void()> sink)
    : previous_(ExchangeSink(std::move(sink))) {}

ScopedChangeNotificationSink::~ScopedChangeNotificationSink() { ExchangeSink(std::move(previous_)); }

}  // namespace lumeris
