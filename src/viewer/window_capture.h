// Window capture for the panel's large-window animation: a picture of an X window's pixels as the
// X server holds them, as a cairo image surface.
//
//   cairo_surface_t* picture = lumeris::CacheWindowContentsImage(connection, window, {});  // whole
//   cairo_surface_t* part = lumeris::CacheWindowContentsImage(connection, window, {10, 10, 40, 20});
//   ...
//   cairo_surface_destroy(picture);
//
// Coordinates are the window's own X coordinates: origin at the top-left corner inside the
// border, y growing downwards. The rectangle is in the panel's points; `device_scale` pixels make
// one point (1 unless the panel draws at a larger scale, e.g. 2 on a display it treats as two
// pixels per point). The pixel rectangle is the point rectangle times the scale, widened to whole
// pixels (origin rounded down, far edges rounded up).
//
// - An empty rectangle (zero or negative width or height) means the whole window: the picture is
//   the window's full size in pixels.
// - Otherwise the picture has the pixel rectangle's size and shows that part of the window; parts
//   of the rectangle outside the window are white; a rectangle wholly outside gives nullptr.
// - The picture is opaque: the window's pixels are laid over white, so transparent parts of a
//   window with an alpha channel (a 32-bit ARGB visual, premultiplied) come out white.
// The pixels are those of the window's own storage (xcb_get_image). A window with an ARGB visual
// is kept off-screen by the X server and is read whole. An ordinary window is read from the
// screen: parts beyond the screen's edges come out white, and parts covered by other windows
// show whatever the server holds there, as the core protocol says.
//
// Failures are values: nullptr when the window does not exist, is unmapped or not viewable, the
// rectangle lies wholly outside the window (or, for an ordinary window, off the screen), or
// its pixel format is not 32 bits per pixel TrueColor (depth 24 or 32), or the server gives no
// image.
//
// Thread-safety: only requests on `connection` (XCB connections may be shared between threads);
// no state. Ownership: the caller owns the returned CAIRO_FORMAT_ARGB32 surface
// (cairo_surface_destroy).
#pragma once

#include <cairo.h>
#include <xcb/xcb.h>

#include "platform/geometry.h"

namespace lumeris {

cairo_surface_t* CacheWindowContentsImage(xcb_connection_t* connection, xcb_window_t window, Rect rect,
                                          double device_scale = 1.0);

}  // namespace lumeris
