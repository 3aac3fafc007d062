// Tinted images: an icon's shape filled with one colour, as the panel draws a selected icon.
//
//   cairo_surface_t* icon = cairo_image_surface_create_from_png("star.png");
//   cairo_surface_t* selected = lumeris::CreateTintedImage(icon, {0.0, 0.48, 1.0, 1.0});
//   ...
//   cairo_surface_destroy(selected);
//
// The result has the source's size; each of its pixels is the colour with the source pixel's
// alpha multiplied into the colour's alpha (the source's alpha channel used as a mask); the
// source's own colours are ignored. A source without alpha (CAIRO_FORMAT_RGB24) is fully opaque
// and gives a rectangle of the colour.
//
// Thread-safety: no shared state; the source is only read. Ownership: the caller owns the
// returned surface (cairo_surface_destroy).
#pragma once

#include <cairo.h>

namespace lumeris {

// A colour with straight (not premultiplied) components in 0..1.
struct RGBAColor {
  double red = 0;
  double green = 0;
  double blue = 0;
  double alpha = 1;
};

// A new CAIRO_FORMAT_ARGB32 image surface of `source`'s size, or nullptr when `source` is null,
// is not an image surface, or is in an error state.
cairo_surface_t* CreateTintedImage(cairo_surface_t* source, RGBAColor color);

}  // namespace lumeris
