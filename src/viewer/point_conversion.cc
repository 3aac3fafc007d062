#include "viewer/point_conversion.h"

#include <cstdlib>
#include <memory>
#include <optional>

#include "viewer/xcb_reply.h"

namespace lumeris {
namespace {

// Where a view sits: its top-level window (itself when it is one) and its screen's root.
struct Placement {
  xcb_window_t window = XCB_NONE;
  xcb_window_t root = XCB_NONE;
};

// The top-level ancestor of `view`: the one whose parent is the root. The root itself has no
// window; neither has an id that no longer exists.
std::optional<Placement> Locate(xcb_connection_t* connection, xcb_window_t view) {
  if (view == XCB_NONE) return std::nullopt;
  xcb_window_t current = view;
  for (;;) {
    XcbReply<xcb_query_tree_reply_t> tree(xcb_query_tree_reply(connection, xcb_query_tree(connection, current), nullptr));
    if (!tree || tree->parent == XCB_NONE) return std::nullopt;
    if (tree->parent == tree->root) return Placement{current, tree->root};
    current = tree->parent;
  }
}

// p moved from `from`'s coordinates into `to`'s; (0,0) when either is missing or they lie on
// different screens.
Point Translate(xcb_connection_t* connection, xcb_window_t from, xcb_window_t to, Point p) {
  if (from == XCB_NONE || to == XCB_NONE) return {};
  if (from == to) return p;
  XcbReply<xcb_translate_coordinates_reply_t> moved(
      xcb_translate_coordinates_reply(connection, xcb_translate_coordinates(connection, from, to, 0, 0), nullptr));
  if (!moved || !moved->same_screen) return {};
  return {p.x + moved->dst_x, p.y + moved->dst_y};
}

}  // namespace

Point ConvertPointBetweenViews(xcb_connection_t* connection, xcb_window_t source, xcb_window_t destination,
                               Point point) {
  if (connection == nullptr || xcb_connection_has_error(connection)) return {};
  const std::optional<Placement> from = Locate(connection, source);
  const std::optional<Placement> to = Locate(connection, destination);
  const xcb_window_t source_window = from ? from->window : XCB_NONE;
  const xcb_window_t destination_window = to ? to->window : XCB_NONE;
  // A source that is a window has no view; a missing one counts as a view without a window.
  const xcb_window_t source_view = source == source_window ? XCB_NONE : source;

  // Source view -> source window -> screen.
  const auto to_screen = [&](Point p) {
    if (source_view != XCB_NONE) p = Translate(connection, source_view, source_window, p);
    return Translate(connection, source_window, from ? from->root : XCB_NONE, p);
  };
  // Screen -> destination window -> destination view.
  const auto from_screen = [&](Point p) {
    p = Translate(connection, to ? to->root : XCB_NONE, destination_window, p);
    return Translate(connection, destination_window, destination, p);
  };

  if (source == XCB_NONE && destination == XCB_NONE) return {};
  if (destination == XCB_NONE) return to_screen(point);
  if (source == XCB_NONE) return from_screen(point);
  if (source_window == destination_window) return Translate(connection, source, destination, point);
  return from_screen(to_screen(point));
}

}  // namespace lumeris
