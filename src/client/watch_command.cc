#include "client/watch_command.h"

#include <signal.h>

#include <atomic>
#include <chrono>
#include <cstdio>
#include <ctime>
#include <memory>

#include <nlohmann/json.hpp>

#include "platform/distributed_notifications.h"

namespace lumeris::cli {
namespace {

// The observer a signal handler stops; set only while RunWatch runs.
std::atomic<DistributedNotificationObserver*> g_running_observer{nullptr};

void StopRunningObserver(int) {
  if (DistributedNotificationObserver* observer = g_running_observer.load()) observer->Stop();
}

std::string LocalTimeNow() {
  const auto now = std::chrono::system_clock::now();
  const std::time_t seconds = std::chrono::system_clock::to_time_t(now);
  const auto millis =
      std::chrono::duration_cast<std::chrono::milliseconds>(now.time_since_epoch()).count() % 1000;
  std::tm parts{};
  localtime_r(&seconds, &parts);
  char text[64];
  const std::size_t length = std::strftime(text, sizeof text, "%Y-%m-%d %H:%M:%S", &parts);
  char fraction[8];
  std::snprintf(fraction, sizeof fraction, ".%03d", static_cast<int>(millis));
  return std::string(text, length) + fraction;
}

// Installs the stop handler for SIGINT and SIGTERM and restores the previous ones on scope exit.
class ScopedStopSignals {
 public:
  explicit ScopedStopSignals(DistributedNotificationObserver* observer) {
    g_running_observer = observer;
    struct sigaction action {};
    action.sa_handler = StopRunningObserver;
    sigemptyset(&action.sa_mask);
    sigaction(SIGINT, &action, &old_int_);
    sigaction(SIGTERM, &action, &old_term_);
  }
  ~ScopedStopSignals() {
    sigaction(SIGINT, &old_int_, nullptr);
    sigaction(SIGTERM, &old_term_, nullptr);
    g_running_observer = nullptr;
  }
  ScopedStopSignals(const ScopedStopSignals&) = delete;
  ScopedStopSignals& operator=(const ScopedStopSignals&) = delete;

 private:
  struct sigaction old_int_ {};
  struct sigaction old_term_ {};
};

}  // namespace

int RunWatch(const WatchRequest& request, std::ostream& out, std::ostream& err, const std::function<void()>& ready) {
  std::unique_ptr<DistributedNotificationObserver> observer = DistributedNotificationObserver::Open(request.name);
  if (!observer) {
    err << "lumeris: watch: no session bus is reachable\n";
    return 1;
  }
  ScopedStopSignals signals(observer.get());
  if (ready) ready();
  DistributedNotificationObserver::Limits limits;
  limits.max_count = request.count;
  if (request.timeout_seconds) {
    limits.timeout = std::chrono::milliseconds(static_cast<std::int64_t>(*request.timeout_seconds * 1000));
  }
  observer->Run(
      [&out, &request](const DistributedNotification& notification) {
        if (request.json) {
          out << nlohmann::json{{"time", LocalTimeNow()}, {"name", notification.name}, {"object", notification.object}}
                     .dump(-1, ' ', false, nlohmann::json::error_handler_t::replace)
              << std::endl;
          return;
        }
        out << LocalTimeNow() << "  " << notification.name;
        if (!notification.object.empty()) out << "  " << notification.object;
        out << std::endl;
      },
      limits);
  return 0;
}

CLI::App* AddWatchCommand(CLI::App& app, std::ostream& out, std::ostream& err, const bool* json) {
  CLI::App* watch = app.add_subcommand("watch", "Print distributed notifications as they arrive");
  auto request = std::make_shared<WatchRequest>();
  watch->add_option("--name", request->name, "only notifications of this name");
  watch->add_option("--count", request->count, "stop after this many notifications")->check(CLI::PositiveNumber);
  watch->add_option("--timeout", request->timeout_seconds, "stop after this many seconds")
      ->check(CLI::NonNegativeNumber);
  watch->footer(
      "Examples:\n"
      "  lumeris watch\n"
      "  lumeris --json watch --name LMLumerisRecentsChangedNotification --count 1");
  watch->callback([request, &out, &err, json] {
    request->json = json != nullptr && *json;
    const int status = RunWatch(*request, out, err);
    if (status != 0) throw CLI::RuntimeError(status);
  });
  return watch;
}

}  // namespace lumeris::cli
