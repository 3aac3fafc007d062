#include "service/listener.h"

#include <errno.h>
#include <string.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <systemd/sd-daemon.h>
#include <unistd.h>

#include "service/socket_path.h"

namespace lumeris {

namespace {

void SetWhy(std::string* why, std::string text) {
  if (why) *why = std::move(text);
}

std::optional<sockaddr_un> AddressOf(const std::filesystem::path& path) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (path.native().size() >= sizeof address.sun_path) return std::nullopt;
  memcpy(address.sun_path, path.c_str(), path.native().size() + 1);
  return address;
}

// True when something accepts connections at `address`.
bool SomebodyListens(const sockaddr_un& address) {
  int probe = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
  if (probe < 0) return false;
  int result;
  do {
    result = connect(probe, reinterpret_cast<const sockaddr*>(&address), sizeof address);
  } while (result != 0 && errno == EINTR);
  close(probe);
  return result == 0;
}

}  // namespace

std::optional<ServiceListener> BindServiceSocket(const std::filesystem::path& path,
                                                 std::string* why) {
  std::optional<sockaddr_un> address = AddressOf(path);
  if (!address) {
    SetWhy(why, "socket path too long: " + path.string());
    return std::nullopt;
  }
  struct stat existing {};
  if (lstat(path.c_str(), &existing) == 0) {
    if (!S_ISSOCK(existing.st_mode)) {
      SetWhy(why, path.string() + " exists and is not a socket");
      return std::nullopt;
    }
    if (SomebodyListens(*address)) {
      SetWhy(why, "another service already listens on " + path.string());
      return std::nullopt;
    }
    unlink(path.c_str());
  }
  int fd = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0);
  if (fd < 0) {
    SetWhy(why, std::string("socket: ") + strerror(errno));
    return std::nullopt;
  }
  if (bind(fd, reinterpret_cast<const sockaddr*>(&*address), sizeof *address) != 0 ||
      chmod(path.c_str(), 0600) != 0 || listen(fd, SOMAXCONN) != 0) {
    SetWhy(why, "cannot listen on " + path.string() + ": " + strerror(errno));
    close(fd);
    return std::nullopt;
  }
  return ServiceListener{fd, path};
}

std::optional<ServiceListener> OpenServiceListener(std::string* why) {
  int passed = sd_listen_fds(/*unset_environment=*/1);
  if (passed >= 1) {
    const int fd = SD_LISTEN_FDS_START;
    if (sd_is_socket_unix(fd, SOCK_STREAM, /*listening=*/1, nullptr, 0) <= 0) {
      SetWhy(why, "the socket passed by systemd is not a listening Unix stream socket");
      return std::nullopt;
    }
    // Extra sockets are not ours to use.
    for (int extra = fd + 1; extra < SD_LISTEN_FDS_START + passed; ++extra) close(extra);
    return ServiceListener{fd, std::nullopt};
  }
  std::optional<std::filesystem::path> path = ServiceSocketPath(why);
  if (!path) return std::nullopt;
  return BindServiceSocket(*path, why);
}

}  // namespace lumeris
