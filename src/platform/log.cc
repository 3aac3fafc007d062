#include "platform/log.h"

#include <errno.h>
#include <unistd.h>

#include <string>

namespace lumeris {
namespace {

std::string& ProgramNameOverride() {
  static std::string name;
  return name;
}

}  // namespace

std::string_view LogProgramName() {
  const std::string& name = ProgramNameOverride();
  if (!name.empty()) return name;
  return program_invocation_short_name;
}

void SetLogProgramName(std::string_view name) { ProgramNameOverride() = std::string(name); }

void Log(std::string_view message) {
  std::string line;
  line.reserve(LogProgramName().size() + message.size() + 3);
  line.append(LogProgramName()).append(": ").append(message).push_back('\n');
  const char* data = line.data();
  size_t left = line.size();
  while (left > 0) {
    ssize_t n = ::write(STDERR_FILENO, data, left);
    if (n < 0 && errno == EINTR) continue;
    if (n <= 0) return;
    data += n;
    left -= static_cast<size_t>(n);
  }
}

}  // namespace lumeris
