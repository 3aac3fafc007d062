#include "viewer/window_capture.h"

#include <algorithm>
#include <bit>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>

#include "viewer/xcb_reply.h"

namespace lumeris {
namespace {

const xcb_visualtype_t* FindVisual(const xcb_setup_t* setup, xcb_visualid_t id) {
  for (auto screens = xcb_setup_roots_iterator(setup); screens.rem; xcb_screen_next(&screens)) {
    for (auto depths = xcb_screen_allowed_depths_iterator(screens.data); depths.rem; xcb_depth_next(&depths)) {
      for (auto visuals = xcb_depth_visuals_iterator(depths.data); visuals.rem; xcb_visualtype_next(&visuals)) {
        if (visuals.data->visual_id == id) return visuals.data;
      }
    }
  }
  return nullptr;
}

const xcb_format_t* FindFormat(const xcb_setup_t* setup, uint8_t depth) {
  for (auto formats = xcb_setup_pixmap_formats_iterator(setup); formats.rem; xcb_format_next(&formats)) {
    if (formats.data->depth == depth) return formats.data;
  }
  return nullptr;
}

// One channel of a pixel as 0..255, whatever the width of its mask.
uint32_t Channel(uint32_t pixel, uint32_t mask) {
  if (mask == 0) return 0;
  const uint32_t value = (pixel & mask) >> std::countr_zero(mask);
  const uint32_t max = mask >> std::countr_zero(mask);
  return (value * 255 + max / 2) / max;
}

// How the server lays out the window's pixels: 32 bits per pixel, channels given by masks.
struct PixelLayout {
  uint32_t red = 0, green = 0, blue = 0, alpha = 0;
  bool most_significant_byte_first = false;
  uint32_t stride = 0;  // bytes per row of the reply
};

uint32_t ReadPixel(const uint8_t* p, bool msb_first) {
  if (msb_first) return uint32_t{p[0]} << 24 | uint32_t{p[1]} << 16 | uint32_t{p[2]} << 8 | p[3];
  return uint32_t{p[3]} << 24 | uint32_t{p[2]} << 16 | uint32_t{p[1]} << 8 | p[0];
}

// The pixel over white, opaque, as cairo's native ARGB32. X's alpha visuals hold premultiplied
// colour, so "over white" adds the uncovered part of white to each channel.
uint32_t OverWhite(uint32_t pixel, const PixelLayout& layout) {
  const uint32_t uncovered = layout.alpha == 0 ? 0 : 255 - Channel(pixel, layout.alpha);
  const auto over = [&](uint32_t mask) { return std::min<uint32_t>(255, Channel(pixel, mask) + uncovered); };
  return 0xFF000000u | over(layout.red) << 16 | over(layout.green) << 8 | over(layout.blue);
}

struct PixelBox {
  int x = 0, y = 0, width = 0, height = 0;
};

PixelBox ToPixels(Rect rect, double scale) {
  const double left = std::floor(rect.x * scale);
  const double top = std::floor(rect.y * scale);
  const double right = std::ceil((rect.x + rect.width) * scale);
  const double bottom = std::ceil((rect.y + rect.height) * scale);
  // Far beyond any X window (coordinates are 16-bit); keeps the conversions below defined.
  static constexpr double kLimit = 1 << 20;
  const auto clamp = [](double v) { return static_cast<int>(std::clamp(v, -kLimit, kLimit)); };
  return {clamp(left), clamp(top), clamp(right) - clamp(left), clamp(bottom) - clamp(top)};
}

}  // namespace

cairo_surface_t* CacheWindowContentsImage(xcb_connection_t* connection, xcb_window_t window, Rect rect,
                                          double device_scale) {
  if (connection == nullptr || xcb_connection_has_error(connection) || window == XCB_NONE) return nullptr;
  XcbReply<xcb_get_geometry_reply_t> geometry(
      xcb_get_geometry_reply(connection, xcb_get_geometry(connection, window), nullptr));
  if (!geometry) return nullptr;

  const PixelBox whole{0, 0, geometry->width, geometry->height};
  const PixelBox wanted = rect.IsEmpty() ? whole : ToPixels(rect, device_scale);
  if (wanted.width <= 0 || wanted.height <= 0) return nullptr;
  // The part of the wanted box inside the window: what the server is asked for.
  int left = std::max(wanted.x, 0);
  int top = std::max(wanted.y, 0);
  int right = std::min(wanted.x + wanted.width, whole.width);
  int bottom = std::min(wanted.y + wanted.height, whole.height);
  if (right <= left || bottom <= top) return nullptr;
  const auto fetch = [&] {
    return XcbReply<xcb_get_image_reply_t>(xcb_get_image_reply(
        connection,
        xcb_get_image(connection, XCB_IMAGE_FORMAT_Z_PIXMAP, window, static_cast<int16_t>(left),
                      static_cast<int16_t>(top), static_cast<uint16_t>(right - left),
                      static_cast<uint16_t>(bottom - top), ~0u),
        nullptr));
  };
  XcbReply<xcb_get_image_reply_t> image = fetch();
  // A window drawn straight on the screen can only be read where it is on the screen: ask again
  // for that part alone (the rest stays white).
  if (!image) {
    XcbReply<xcb_translate_coordinates_reply_t> origin(xcb_translate_coordinates_reply(
        connection, xcb_translate_coordinates(connection, window, geometry->root, 0, 0), nullptr));
    XcbReply<xcb_get_geometry_reply_t> screen(
        xcb_get_geometry_reply(connection, xcb_get_geometry(connection, geometry->root), nullptr));
    if (!origin || !screen) return nullptr;
    left = std::max(left, -origin->dst_x);
    top = std::max(top, -origin->dst_y);
    right = std::min(right, screen->width - origin->dst_x);
    bottom = std::min(bottom, screen->height - origin->dst_y);
    if (right <= left || bottom <= top) return nullptr;
    image = fetch();
  }
  if (!image) return nullptr;

  const xcb_setup_t* setup = xcb_get_setup(connection);
  const xcb_visualtype_t* visual = FindVisual(setup, image->visual);
  const xcb_format_t* format = FindFormat(setup, image->depth);
  if (visual == nullptr || format == nullptr || format->bits_per_pixel != 32 ||
      visual->_class != XCB_VISUAL_CLASS_TRUE_COLOR) {
    return nullptr;
  }
  PixelLayout layout;
  layout.red = visual->red_mask;
  layout.green = visual->green_mask;
  layout.blue = visual->blue_mask;
  if (image->depth == 32) layout.alpha = ~(layout.red | layout.green | layout.blue);
  layout.most_significant_byte_first = setup->image_byte_order == XCB_IMAGE_ORDER_MSB_FIRST;
  const uint32_t pad_bits = format->scanline_pad;
  const uint32_t row_bits = static_cast<uint32_t>(right - left) * 32;
  layout.stride = (row_bits + pad_bits - 1) / pad_bits * pad_bits / 8;
  const int length = xcb_get_image_data_length(image.get());
  if (length < 0 || static_cast<uint64_t>(length) < uint64_t{layout.stride} * static_cast<uint64_t>(bottom - top)) {
    return nullptr;
  }

  cairo_surface_t* picture = cairo_image_surface_create(CAIRO_FORMAT_ARGB32, wanted.width, wanted.height);
  if (cairo_surface_status(picture) != CAIRO_STATUS_SUCCESS) {
    cairo_surface_destroy(picture);
    return nullptr;
  }
  cairo_surface_flush(picture);
  uint8_t* pixels = cairo_image_surface_get_data(picture);
  const int stride = cairo_image_surface_get_stride(picture);
  const uint8_t* data = xcb_get_image_data(image.get());
  for (int y = 0; y < wanted.height; ++y) {
    auto* row = reinterpret_cast<uint32_t*>(pixels + static_cast<ptrdiff_t>(y) * stride);
    const int window_y = wanted.y + y;
    for (int x = 0; x < wanted.width; ++x) {
      const int window_x = wanted.x + x;
      if (window_x < left || window_x >= right || window_y < top || window_y >= bottom) {
        row[x] = 0xFFFFFFFFu;
        continue;
      }
      const uint8_t* source = data + static_cast<size_t>(window_y - top) * layout.stride +
                              static_cast<size_t>(window_x - left) * 4;
      row[x] = OverWhite(ReadPixel(source, layout.most_significant_byte_first), layout);
    }
  }
  cairo_surface_mark_dirty(picture);
  return picture;
}

}  // namespace lumeris
