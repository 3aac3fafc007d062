// The system root: the directory under which the system's absolute resource paths
// ("/System/Library/Input Methods/Sorvendi.app", "/System/Library/PrivateFrameworks/...") live.
//
//   std::filesystem::path app = SystemPath("/System/Library/Input Methods/Sorvendi.app");
//
// The root is $LUMERIS_SYSTEM_ROOT when that is set and non-empty, else the install root chosen at
// configure time (lumeris::config::kSystemRootDefault). It is read afresh at every call, so a test
// that changes the variable sees the change at once.
//
// Thread-safety: safe to call from any thread, provided nobody changes the environment meanwhile.
// Returns plain values owned by the caller.
#pragma once

#include <filesystem>
#include <string_view>

namespace lumeris {

// The current system root.
std::filesystem::path SystemRoot();

// `system_path` resolved under the system root: the root followed by the path's components.
// A leading "/" is optional; "/System/Library/X" and "System/Library/X" give the same result.
std::filesystem::path SystemPath(std::string_view system_path);

}  // namespace lumeris
