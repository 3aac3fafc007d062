// XcbReply<T>: owns a reply that libxcb allocated (xcb_*_reply() results are freed with free()).
//
//   XcbReply<xcb_get_geometry_reply_t> geometry(
//       xcb_get_geometry_reply(connection, xcb_get_geometry(connection, window), nullptr));
//   if (!geometry) return ...;  // no reply: the window is gone or the connection failed
//
// Thread-safety: as std::unique_ptr. Internal to the viewer helpers; not installed.
#pragma once

#include <cstdlib>
#include <memory>

namespace lumeris {

struct FreeXcbReply {
  void operator()(void* reply) const { std::free(reply); }
};

template <typename T>
using XcbReply = std::unique_ptr<T, FreeXcbReply>;

}  // namespace lumeris
