#include "categories/system_bundles.h"

#include <mutex>

#include "platform/system_root.h"

namespace lumeris {
namespace {

struct HeldFrameworkBundle {
  std::mutex mutex;
  const Bundle* bundle = nullptr;  // guarded by mutex; owned, never deleted
};

HeldFrameworkBundle& Held() {
  static HeldFrameworkBundle* const held = new HeldFrameworkBundle();
  return *held;
}

}  // namespace

std::optional<Bundle> OpenApplicationBundle() { return Bundle::Open(SystemPath(kApplicationBundlePath)); }

const Bundle* MyFrameworkBundle() {
  HeldFrameworkBundle& held = Held();
  std::lock_guard lock(held.mutex);
  if (held.bundle == nullptr) {
    if (std::optional<Bundle> found = Bundle::Open(SystemPath(kFrameworkBundlePath))) {
      held.bundle = new Bundle(std::move(*found));
    }
  }
  return held.bundle;
}

std::string MyFrameworkLocalizedString(std::string_view key) {
  const Bundle* framework = MyFrameworkBundle();
  if (framework == nullptr) return std::string(key);
  return framework->LocalizedString(key, key, std::nullopt);
}

}  // namespace lumeris
