// The system's two bundles as the category data uses them: the input-method application, whose
// resources hold the category lists, icons and strings tables, and the framework, whose resources
// hold the emoji sub-category icons and the panel's own strings.
//
//   std::optional<Bundle> app = OpenApplicationBundle();   // opened afresh at each call
//   const Bundle* framework = MyFrameworkBundle();         // held for the life of the process
//
// Both paths are resolved under the system root (platform/system_root.h).
//
// Thread-safety: all functions may be called from any thread at the same time. The framework
// bundle, once found, is held in a process-wide variable guarded by a mutex and never released,
// so the pointer MyFrameworkBundle() returns stays valid until the process ends; a lookup that
// finds nothing is repeated at the next call.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/bundle.h"

namespace lumeris {

inline constexpr std::string_view kApplicationBundlePath = "/System/Library/Input Methods/Sorvendi.app";
inline constexpr std::string_view kFrameworkBundlePath = "/System/Library/PrivateFrameworks/Lumeris.framework";

// The application bundle under the current system root; std::nullopt when it is not there.
std::optional<Bundle> OpenApplicationBundle();

// The framework bundle (borrowed, lives until the process ends); nullptr while it is not there.
// The first bundle found is kept, whatever later happens to the system root.
const Bundle* MyFrameworkBundle();

// The framework bundle's translation of `key` in its default table, following the user's
// languages; the key itself when there is none (or no framework bundle).
std::string MyFrameworkLocalizedString(std::string_view key);

}  // namespace lumeris
