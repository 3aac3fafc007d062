// WritePicture: saves a cairo surface as "<name>.png" in the build tree's test-pictures folder
// (LUMERIS_TEST_PICTURES), so that a person can look at what a drawing test produced.
#pragma once

#include <cairo.h>

#include <filesystem>
#include <string>

namespace lumeris::testing {

inline bool WritePicture(cairo_surface_t* surface, const std::string& name) {
  const std::filesystem::path folder = LUMERIS_TEST_PICTURES;
  std::error_code ignored;
  std::filesystem::create_directories(folder, ignored);
  return cairo_surface_write_to_png(surface, (folder / (name + ".png")).c_str()) == CAIRO_STATUS_SUCCESS;
}

// The pixel at (x, y) of an ARGB32 image surface, as cairo stores it (premultiplied 0xAARRGGBB).
inline uint32_t PixelAt(cairo_surface_t* surface, int x, int y) {
  cairo_surface_flush(surface);
  const unsigned char* row = cairo_image_surface_get_data(surface) + y * cairo_image_surface_get_stride(surface);
  return reinterpret_cast<const uint32_t*>(row)[x];
}

}  // namespace lumeris::testing
