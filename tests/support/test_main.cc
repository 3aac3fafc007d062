// The main() of every test program: before any test runs, point HOME and the XDG directories
// at a sandbox inside the build tree, so no test can read or write the real user's
// preferences, sockets or caches, and point LUMERIS_SYSTEM_ROOT at the bundles the build wrote
// unless the caller chose another root, and LUMERIS_FONTCONFIG_FILE at the source tree's
// fontconfig file. Child processes the tests start inherit all of it.
//
// Built with LUMERIS_TEST_PRIVATE_BUS, it also starts a D-Bus session bus for this process
// alone (and the services its tests start), and stops it when the tests end.
#include <signal.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <sys/stat.h>

#include <filesystem>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "support/temp_dir.h"

namespace {

void EnterSandbox() {
  const std::filesystem::path sandbox = LUMERIS_TEST_SANDBOX;
  const struct { const char* variable; const char* directory; } kDirectories[] = {
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
  setenv("LUMERIS_FONTCONFIG_FILE", LUMERIS_TEST_FONTCONFIG_FILE, 0);
}

#ifdef LUMERIS_TEST_PRIVATE_BUS
// A dbus-daemon serving this test process only; DBUS_SESSION_BUS_ADDRESS points at it while it
// lives. Without dbus-daemon the variable is left as it was and bus tests skip themselves.
class PrivateSessionBus {
 public:
  PrivateSessionBus() {
    const std::string command = "dbus-daemon --session --fork --print-address=1 --print-pid=1 --address=unix:path=" +
                                (dir_.path() / "bus").string() + " 2>/dev/null";
    FILE* out = popen(command.c_str(), "r");
    if (out == nullptr) return;
    char address[512] = {};
    long pid = 0;
    if (fgets(address, sizeof address, out) != nullptr && fscanf(out, "%ld", &pid) == 1) {
      address[strcspn(address, "\r\n")] = '\0';
      setenv("DBUS_SESSION_BUS_ADDRESS", address, 1);
      pid_ = static_cast<pid_t>(pid);
    }
    pclose(out);
  }
  ~PrivateSessionBus() {
    if (pid_ > 0) kill(pid_, SIGTERM);
  }
  PrivateSessionBus(const PrivateSessionBus&) = delete;
  PrivateSessionBus& operator=(const PrivateSessionBus&) = delete;

 private:
  lumeris::testing::ScopedTempDir dir_;
  pid_t pid_ = -1;
};
#endif

}  // namespace

int main(int argc, char** argv) {
  EnterSandbox();
  testing::InitGoogleMock(&argc, argv);
#ifdef LUMERIS_TEST_PRIVATE_BUS
  PrivateSessionBus bus;
#endif
  return RUN_ALL_TESTS();
}
