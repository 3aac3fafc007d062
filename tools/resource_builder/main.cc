// lumeris-resource-builder: writes the resource bundles under a system root.
//
//   lumeris-resource-builder --output <root> --license LICENSES/Unicode-DFS-2016.txt [--stamp <file>]
#include <CLI/CLI.hpp>

#include <fstream>
#include <iostream>

#include "resource_builder/resource_build.h"

int main(int argc, char** argv) {
  lumeris::resources::ResourceBuildOptions options;
  std::string stamp;
  CLI::App app{"Builds the Lumeris resource bundles from the Unicode and CLDR data"};
  app.add_option("--output", options.output_root, "System root to write the bundles under")->required();
  app.add_option("--license", options.license_file, "License notice to copy into the bundles")->required();
  app.add_option("--unicode-dir", options.unicode_dir, "Unicode Character Database folder");
  app.add_option("--cldr-dir", options.cldr_dir, "CLDR common folder");
  app.add_option("--stamp", stamp, "File to touch after a successful build");
  CLI11_PARSE(app, argc, argv);

  lumeris::resources::ResourceBuildResult result = lumeris::resources::BuildResources(options);
  if (!result.ok) {
    std::cerr << "lumeris-resource-builder: " << result.error << '\n';
    return 1;
  }
  std::cout << "lumeris-resource-builder: " << result.summary << '\n';
  if (!stamp.empty()) std::ofstream(stamp, std::ios::trunc) << result.summary << '\n';
  return 0;
}
