// Where the panel runs: whether the code is inside the viewer input method, and the default of
// the panel's switch button.
//
// The running program's bundle (its "main bundle") is the nearest directory named "*.app" that
// holds the program's executable (/proc/self/exe, symbolic links resolved), e.g.
// ".../Sorvendi.app/Contents/MacOS/sorvendi"; its identifier is CFBundleIdentifier of its
// Info.plist (platform/bundle.h). A program outside any "*.app" directory has no bundle and so no
// identifier.
//
// Thread-safety: IsWorkingInVistrel() may be called from any thread; the first call compares the
// identifier once (std::call_once semantics of a function-local static) and every later call
// returns the stored answer. The other functions keep no state.
#pragma once

#include <filesystem>
#include <optional>
#include <string>

namespace lumeris {

// True when the running program's bundle identifier is exactly "com.vantorel.SorvendiIM"
// (case-sensitive); false without a bundle or an identifier. Decided once per process.
bool IsWorkingInVistrel();

// The bundle identifier of the program whose executable is `executable` (an absolute path with
// links resolved), by the rule above; std::nullopt when there is none.
std::optional<std::string> BundleIdentifierOfExecutable(const std::filesystem::path& executable);

// The panel switch button's default: always 0.
int DefaultSwitchForVistrelButton();

}  // namespace lumeris
