#include "platform/system_root.h"

#include <cstdlib>

#include "lumeris/config.h"

namespace lumeris {

std::filesystem::path SystemRoot() {
  const char* root = std::getenv("LUMERIS_SYSTEM_ROOT");
  if (root != nullptr && *root != '\0') return std::filesystem::path(root);
  return std::filesystem::path(config::kSystemRootDefault);
}

std::filesystem::path SystemPath(std::string_view system_path) {
  while (!system_path.empty() && system_path.front() == '/') system_path.remove_prefix(1);
  return SystemRoot() / std::filesystem::path(system_path);
}

}  // namespace lumeris
