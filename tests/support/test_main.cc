// The main() of every test program: before any test runs, point HOME and the XDG directories
// at a sandbox inside the build tree, so no test can read or write the real user's
// preferences, sockets or caches, and point LUMERIS_SYSTEM_ROOT at the bundles the build wrote
// unless the caller chose another root. Child processes the tests start inherit all of it.
#include <stdlib.h>
#include <sys/stat.h>

#include <filesystem>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace {

void EnterSandbox() {
  const std::filesystem::path sandbox = LUMERIS_TEST_SANDBOX;
  const struct {
    const char* variable;
    const char* directory;
  } kDirectories[] = {
      {"HOME", "home"},
      {"XDG_CONFIG_HOME", "config"},
      {"XDG_CONFIG_DIRS", "config-dirs"},
      {"XDG_RUNTIME_DIR", "runtime"},
  };
  for (const auto& entry : kDirectories) {
    const std::filesystem::path dir = sandbox / entry.directory;
    std::filesystem::create_directories(dir);
    chmod(dir.c_str(), 0700);
    setenv(entry.variable, dir.c_str(), 1);
  }
  setenv("LUMERIS_SYSTEM_ROOT", LUMERIS_TEST_SYSTEM_ROOT, 0);
}

}  // namespace

int main(int argc, char** argv) {
  EnterSandbox();
  testing::InitGoogleMock(&argc, argv);
  return RUN_ALL_TESTS();
}
