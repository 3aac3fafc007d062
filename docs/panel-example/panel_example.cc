// A panel's use of liblumeris: fit a character to a grid cell, tint an icon, capture the panel's
// window when an X server is there, meter the frames. Build it with find_package(Lumeris) (see
// CMakeLists.txt here) or with pkg-config:
//   c++ -std=c++20 panel_example.cc $(pkg-config --cflags --libs lumeris) -o panel_example
#include <cstdio>

#include "categories/font_fitting.h"
#include "categories/tinted_image.h"
#include "text/emoji.h"
#include "viewer/frame_rate_meter.h"
#include "viewer/notification_names.h"
#include "viewer/window_capture.h"

int main() {
  // The largest size, at most 64 pt, at which "A" fits a 32 x 32 cell.
  PangoFontDescription* font = pango_font_description_from_string("DejaVu Sans 64");
  lumeris::Rect glyph;
  PangoFontDescription* fitted = lumeris::FontForCharacterFittingInRect("A", font, &glyph, {0, 0, 32, 32});
  if (fitted == nullptr) return 1;
  std::printf("fitted size %d, glyph %gx%g\n", pango_font_description_get_size(fitted) / PANGO_SCALE, glyph.width,
              glyph.height);

  // An icon's shape in the selection colour.
  cairo_surface_t* icon = cairo_image_surface_create(CAIRO_FORMAT_ARGB32, 16, 16);
  cairo_surface_t* selected = lumeris::CreateTintedImage(icon, {0.0, 0.48, 1.0, 1.0});

  // A picture of the panel's window for the large-window animation (here: the root window).
  xcb_connection_t* connection = xcb_connect(nullptr, nullptr);
  if (!xcb_connection_has_error(connection)) {
    xcb_window_t root = xcb_setup_roots_iterator(xcb_get_setup(connection)).data->root;
    if (cairo_surface_t* picture = lumeris::CacheWindowContentsImage(connection, root, {0, 0, 8, 8})) {
      cairo_surface_destroy(picture);
    }
  }
  xcb_disconnect(connection);

  auto meter = lumeris::MeasureFrameRate(lumeris::LMKVistrelWindowDidOpen);
  lumeris::AdvanceFrameCount();
  meter();
  std::printf("emoji font: %d\n", lumeris::IsEmojiFontName(icu::UnicodeString(u"VantorelColorEmoji")));

  cairo_surface_destroy(selected);
  cairo_surface_destroy(icon);
  pango_font_description_free(fitted);
  pango_font_description_free(font);
  return 0;
}
