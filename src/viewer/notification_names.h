// The names of the distributed notifications the system posts, shared by the service and the
// panel's code. Header-only constants; safe to use from any thread.
#pragma once

namespace lumeris {

// Posted (no object) after the recents list, the skin-tone history or the global emoji-
// diversity state changed, so that every panel of the user reloads.
inline constexpr char kLMLumerisRecentsChangedNotification[] = "LMLumerisRecentsChangedNotification";

}  // namespace lumeris
