// StopService: ends the file service that listens on the usual socket, for benchmark programs
// that started it on demand. The service is found by the peer credentials of a connection to its
// socket, sent SIGTERM, and waited for. Does nothing when nothing listens there.
#pragma once

#include <signal.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <filesystem>
#include <thread>

#include "service/socket_path.h"

namespace lumeris {

inline void StopService() {
  std::filesystem::path path = *ServiceSocketPath();
  int fd = socket(AF_UNIX, SOCK_STREAM, 0);
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  std::snprintf(address.sun_path, sizeof address.sun_path, "%s", path.c_str());
  ucred peer{};
  socklen_t size = sizeof peer;
  if (connect(fd, reinterpret_cast<sockaddr*>(&address), sizeof address) == 0 &&
      getsockopt(fd, SOL_SOCKET, SO_PEERCRED, &peer, &size) == 0 && peer.pid > 0) {
    close(fd);
    kill(peer.pid, SIGTERM);
    while (kill(peer.pid, 0) == 0) std::this_thread::sleep_for(std::chrono::milliseconds(1));
    return;
  }
  close(fd);
}

}  // namespace lumeris
