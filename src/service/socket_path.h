// Where the service listens: $XDG_RUNTIME_DIR/com.vantorel.Lumeris.FileService, or, without
// XDG_RUNTIME_DIR (or with a relative one, which the XDG rules make invalid),
// /tmp/lumeris-<uid>/com.vantorel.Lumeris.FileService in a directory of mode 0700 owned by the
// user. The service and every client resolve the path the same way.
//
// Thread-safety: reads the environment and the file system; safe to call from any thread as
// long as nobody changes the environment at the same time.
#pragma once

#include <filesystem>
#include <optional>
#include <string>

namespace lumeris {

// The service's name, also the socket's file name.
inline constexpr char kServiceName[] = "com.vantorel.Lumeris.FileService";

// The socket path, or std::nullopt (with the reason in `*why`, when given) when the private
// fallback directory under /tmp cannot be created or is not a real directory of mode 0700 owned
// by the user. Creates that fallback directory when it is missing; never touches
// XDG_RUNTIME_DIR, which belongs to the session.
std::optional<std::filesystem::path> ServiceSocketPath(std::string* why = nullptr);

// The private fallback directory's path for `uid`: /tmp/lumeris-<uid>.
std::filesystem::path FallbackRuntimeDirectory(unsigned uid);

// Makes sure `directory` exists as a directory of mode 0700 owned by the effective user
// (creating it with that mode when missing). False, with the reason in `*why`, when it is a
// symbolic link, not a directory, owned by someone else or open to others.
bool EnsurePrivateDirectory(const std::filesystem::path& directory, std::string* why = nullptr);

}  // namespace lumeris
