// The whole resource build: reads Debian's Unicode and CLDR data and writes, under an output
// system root, the application bundle "System/Library/Input Methods/Sorvendi.app" and the
// framework bundle "System/Library/PrivateFrameworks/Lumeris.framework" with every resource the
// service and the panel read (databases, property lists, strings tables, icons, license notice).
//
//   ResourceBuildOptions options{.output_root = build_dir / "root", .license_file = "LICENSES/Unicode-DFS-2016.txt"};
//   ResourceBuildResult result = BuildResources(options);
//   if (!result.ok) Log(result.error);
//
// Thread-safety: one build at a time per output root. Bundles are first written into a temporary
// folder beside them and then moved into place, so readers never see a half-written bundle.
#pragma once

#include <filesystem>
#include <string>

namespace lumeris::resources {

struct ResourceBuildOptions {
  std::filesystem::path unicode_dir = "/usr/share/unicode";             // unicode-data
  std::filesystem::path cldr_dir = "/usr/share/unicode/cldr/common";    // unicode-cldr-core
  std::filesystem::path output_root;                                    // the system root to write
  std::filesystem::path license_file;                                   // copied into both bundles
};

struct ResourceBuildResult {
  bool ok = false;
  std::string error;  // what failed, when !ok
  std::string summary;  // row and file counts, when ok
};

ResourceBuildResult BuildResources(const ResourceBuildOptions& options);

// Bundle locations under a system root.
inline constexpr const char kApplicationBundlePath[] = "System/Library/Input Methods/Sorvendi.app";
inline constexpr const char kFrameworkBundlePath[] = "System/Library/PrivateFrameworks/Lumeris.framework";

}  // namespace lumeris::resources
