#include "viewer/vistrel_environment.h"

#include <system_error>

#include "platform/bundle.h"

namespace lumeris {
namespace {

constexpr std::string_view kVistrelInputMethodIdentifier = "com.vantorel.SorvendiIM";

std::optional<std::string> RunningProgramBundleIdentifier() {
  std::error_code error;
  const std::filesystem::path executable = std::filesystem::read_symlink("/proc/self/exe", error);
  if (error) return std::nullopt;
  return BundleIdentifierOfExecutable(executable);
}

}  // namespace

std::optional<std::string> BundleIdentifierOfExecutable(const std::filesystem::path& executable) {
  for (std::filesystem::path folder = executable.parent_path(); folder.has_relative_path();
       folder = folder.parent_path()) {
    if (folder.extension() != ".app") continue;
    const std::optional<Bundle> bundle = Bundle::Open(folder);
    return bundle ? bundle->identifier() : std::nullopt;
  }
  return std::nullopt;
}

bool IsWorkingInVistrel() {
  static const bool working_in_vistrel = RunningProgramBundleIdentifier() == kVistrelInputMethodIdentifier;
  return working_in_vistrel;
}

int DefaultSwitchForVistrelButton() { return 0; }

}  // namespace lumeris
