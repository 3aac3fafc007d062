#include "platform/distributed_notifications.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <systemd/sd-bus.h>
#include <unistd.h>

#include <cerrno>
#include <mutex>
#include <string>
#include <vector>

namespace lumeris {
namespace {

struct BusUnref {
  void operator()(sd_bus* bus) const { sd_bus_flush_close_unref(bus); }
};
using BusPtr = std::unique_ptr<sd_bus, BusUnref>;

BusPtr OpenSessionBus() {
  sd_bus* bus = nullptr;
  if (sd_bus_open_user(&bus) < 0) return nullptr;
  return BusPtr(bus);
}

// The process's posting connection, opened on first use. Guarded by `mutex`.
struct PostingBus {
  std::mutex mutex;
  BusPtr bus;
};

PostingBus& SharedPostingBus() {
  static PostingBus* const shared = new PostingBus();
  return *shared;
}

std::string MatchRule(const std::optional<std::string>& name) {
  std::string rule = std::string("type='signal',interface='") + kDistributedNotificationInterface +
                     "',member='" + kDistributedNotificationMember + "'";
  if (name) {
    // Quotes cannot be escaped inside a match value; a name holding one can never match.
    rule += ",arg0='" + *name + "'";
  }
  return rule;
}

}  // namespace

bool PostDistributedNotification(std::string_view name, std::string_view object) {
  const std::string name_text(name);
  const std::string object_text(object);
  PostingBus& shared = SharedPostingBus();
  std::lock_guard lock(shared.mutex);
  // A connection that broke (bus restarted) or was inherited over fork() is replaced.
  if (shared.bus && sd_bus_is_open(shared.bus.get()) <= 0) shared.bus.reset();
  if (!shared.bus) shared.bus = OpenSessionBus();
  if (!shared.bus) return false;
  const int emitted = sd_bus_emit_signal(shared.bus.get(), kDistributedNotificationPath,
                                         kDistributedNotificationInterface, kDistributedNotificationMember,
                                         "ss", name_text.c_str(), object_text.c_str());
  if (emitted < 0) {
    shared.bus.reset();
    return false;
  }
  sd_bus_flush(shared.bus.get());
  return true;
}

struct DistributedNotificationObserver::Impl {
  BusPtr bus;
  int stop_fd = -1;
  std::vector<DistributedNotification> received;  // filled by the match callback during one process step

  ~Impl() {
    if (stop_fd >= 0) ::close(stop_fd);
  }

  static int OnSignal(sd_bus_message* message, void* userdata, sd_bus_error*) {
    const char* name = nullptr;
    const char* object = nullptr;
    if (sd_bus_message_read(message, "ss", &name, &object) < 0) return 0;
    static_cast<Impl*>(userdata)->received.push_back({name ? name : "", object ? object : ""});
    return 0;
  }
};

DistributedNotificationObserver::DistributedNotificationObserver(std::unique_ptr<Impl> impl)
    : impl_(std::move(impl)) {}

DistributedNotificationObserver::~DistributedNotificationObserver() = default;

std::unique_ptr<DistributedNotificationObserver> DistributedNotificationObserver::Open(
    std::optional<std::string> name) {
  auto impl = std::make_unique<Impl>();
  impl->bus = OpenSessionBus();
  if (!impl->bus) return nullptr;
  impl->stop_fd = ::eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
  if (impl->stop_fd < 0) return nullptr;
  // The slot is floating: it lives as long as the bus connection.
  if (sd_bus_add_match(impl->bus.get(), nullptr, MatchRule(name).c_str(), &Impl::OnSignal, impl.get()) < 0) {
    return nullptr;
  }
  return std::unique_ptr<DistributedNotificationObserver>(new DistributedNotificationObserver(std::move(impl)));
}

std::size_t DistributedNotificationObserver::Run(const Callback& callback, Limits limits) {
  using Clock = std::chrono::steady_clock;
  const std::optional<Clock::time_point> deadline =
      limits.timeout ? std::optional(Clock::now() + *limits.timeout) : std::nullopt;
  std::size_t delivered = 0;
  while (!limits.max_count || delivered < *limits.max_count) {
    const int processed = sd_bus_process(impl_->bus.get(), nullptr);
    if (processed < 0) break;  // the connection ended
    for (const DistributedNotification& notification : impl_->received) {
      if (limits.max_count && delivered >= *limits.max_count) break;
      callback(notification);
      ++delivered;
    }
    impl_->received.clear();
    if (processed > 0) continue;

    int timeout_ms = -1;
    if (deadline) {
      const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(*deadline - Clock::now()).count();
      if (left <= 0) break;
      timeout_ms = static_cast<int>(left);
    }
    pollfd fds[2] = {{sd_bus_get_fd(impl_->bus.get()), static_cast<short>(sd_bus_get_events(impl_->bus.get())), 0},
                     {impl_->stop_fd, POLLIN, 0}};
    const int ready = ::poll(fds, 2, timeout_ms);
    if (ready < 0 && errno != EINTR) break;
    if (fds[1].revents & POLLIN) {
      std::uint64_t count = 0;
      [[maybe_unused]] ssize_t ignored = ::read(impl_->stop_fd, &count, sizeof count);
      break;
    }
  }
  return delivered;
}

void DistributedNotificationObserver::Stop() {
  const std::uint64_t one = 1;
  [[maybe_unused]] ssize_t ignored = ::write(impl_->stop_fd, &one, sizeof one);
}

}  // namespace lumeris
