#include "service/large_viewer.h"

#include "platform/preferences.h"

namespace lumeris {

namespace {

constexpr std::string_view kInputMethodDomain = "com.vantorel.SorvendiIM";
constexpr std::string_view kStartAsLargeWindowKey = "VTStartAsLargeWindowTemporarily";

}  // namespace

bool PrepareOpeningLargeVistrel(const std::optional<std::string>& path) {
  CFPreferencesSetAppValue(kStartAsLargeWindowKey, path ? std::optional<plist::Value>(*path) : std::nullopt,
                           kInputMethodDomain);
  return CFPreferencesAppSynchronize(kInputMethodDomain);
}

}  // namespace lumeris
