// The service's listening socket: the one systemd handed over (socket activation), else one the
// service binds at ServiceSocketPath() itself.
//
// Binding replaces an existing socket file only when a connect to it fails (a stale file left by a
// service that died); a live listener there, or a file that is not a socket, makes binding fail.
//
// Thread-safety: call from one thread at start-up. Ownership: the caller owns the returned fd.
#pragma once

#include <filesystem>
#include <optional>
#include <string>

namespace lumeris {

struct ServiceListener {
  int fd = -1;  // listening, non-blocking, close-on-exec
  // The path this process bound (and removes at exit); absent for a socket from systemd.
  std::optional<std::filesystem::path> bound_path;
};

// The socket systemd passed (LISTEN_FDS, which is then cleared from the environment), else a
// socket bound at ServiceSocketPath(). std::nullopt with the reason in `*why` on failure.
std::optional<ServiceListener> OpenServiceListener(std::string* why = nullptr);

// Binds and listens at `path` with the stale-socket rule above; the socket file gets mode 0600.
std::optional<ServiceListener> BindServiceSocket(const std::filesystem::path& path,
                                                 std::string* why = nullptr);

}  // namespace lumeris
