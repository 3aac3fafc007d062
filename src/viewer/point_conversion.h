// Point conversion between the panel's views, also across windows.
//
//   lumeris::Point in_grid = lumeris::ConvertPointBetweenViews(connection, cell, grid, {4, 4});
//   lumeris::Point on_screen = lumeris::ConvertPointBetweenViews(connection, cell, XCB_NONE, {4, 4});
//
// Terms: a "window" is a top-level X window (a child of its screen's root window); a "view" is an
// X window inside a window, at any depth; "screen coordinates" are root-window coordinates. Every
// coordinate system has its origin at the top-left corner inside the window's border, y growing
// downwards. XCB_NONE stands for "nothing"; a window id that no longer exists counts as a view
// with no window.
//
// Rules (p is the point, "(0,0)" is the point a missing window or view gives at the step that
// needs it; later steps go on from there):
// - Source given, destination none: p from the source view to its window (when the source is a
//   view), then to the screen; (0,0) when the source has no window.
// - Source none: p is a screen point, converted into the destination's window, then into the
//   destination view; (0,0) when there is no destination window, or no destination either.
// - Both given, same window: p straight from the source to the destination; the screen is never
//   involved (so a window's own position, which a window manager may change, does not matter).
// - Both given, different windows: source view -> source window -> screen -> destination window
//   -> destination view.
// Fractions of a pixel are kept: X translates by whole pixels, and the offsets are added to p.
//
// Thread-safety: only requests on `connection`; no state. Returns a value.
#pragma once

#include <xcb/xcb.h>

#include "platform/geometry.h"

namespace lumeris {

Point ConvertPointBetweenViews(xcb_connection_t* connection, xcb_window_t source, xcb_window_t destination,
                               Point point);

}  // namespace lumeris
