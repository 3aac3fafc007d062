#include "resource_builder/icons.h"

#include <cairo-pdf.h>
#include <cairo.h>
#include <pango/pangocairo.h>

#include <algorithm>
#include <memory>

namespace lumeris::resources {
namespace {

constexpr double kIconSize = 32.0;

struct GObjectUnref {
  void operator()(void* object) const { g_object_unref(object); }
};
struct FontDescriptionFree {
  void operator()(PangoFontDescription* description) const { pango_font_description_free(description); }
};

// Lays `text` out at `size` pixels in DejaVu Sans alone (no fallback to other fonts: a vector
// icon cannot reproduce the colour emoji font, and the build machine's other fonts vary); the
// layout belongs to the caller.
std::unique_ptr<PangoLayout, GObjectUnref> MakeLayout(cairo_t* cr, const std::string& text, double size) {
  std::unique_ptr<PangoLayout, GObjectUnref> layout(pango_cairo_create_layout(cr));
  std::unique_ptr<PangoFontDescription, FontDescriptionFree> font(pango_font_description_from_string("DejaVu Sans"));
  pango_font_description_set_absolute_size(font.get(), size * PANGO_SCALE);
  pango_layout_set_font_description(layout.get(), font.get());
  PangoAttrList* attributes = pango_attr_list_new();
  pango_attr_list_insert(attributes, pango_attr_fallback_new(FALSE));
  pango_layout_set_attributes(layout.get(), attributes);
  pango_attr_list_unref(attributes);
  pango_layout_set_text(layout.get(), text.c_str(), static_cast<int>(text.size()));
  return layout;
}

// `text` when DejaVu Sans draws all of it, else `fallback_text`, at the largest size up to the
// usual one (22 px, 12 px for longer texts) whose ink fits the icon with a pixel to spare.
std::unique_ptr<PangoLayout, GObjectUnref> FittedLayout(cairo_t* cr, const std::string& text,
                                                        const std::string& fallback_text) {
  std::string shown = text;
  auto usual = [](const std::string& t) { return t.size() > 4 ? 12.0 : 22.0; };
  std::unique_ptr<PangoLayout, GObjectUnref> layout = MakeLayout(cr, shown, usual(shown));
  if (pango_layout_get_unknown_glyphs_count(layout.get()) > 0) {
    shown = fallback_text;
    layout = MakeLayout(cr, shown, usual(shown));
  }
  PangoRectangle ink;
  pango_layout_get_pixel_extents(layout.get(), &ink, nullptr);
  const double room = kIconSize - 2.0;
  const double scale = std::min({1.0, room / std::max(1, ink.width), room / std::max(1, ink.height)});
  if (scale < 1.0) layout = MakeLayout(cr, shown, usual(shown) * scale);
  return layout;
}

}  // namespace

bool WriteIconPdf(const std::filesystem::path& path, const std::string& text, const std::string& fallback_text) {
  cairo_surface_t* surface = cairo_pdf_surface_create(path.c_str(), kIconSize, kIconSize);
  if (cairo_surface_status(surface) != CAIRO_STATUS_SUCCESS) {
    cairo_surface_destroy(surface);
    return false;
  }
  cairo_t* cr = cairo_create(surface);
  {
    std::unique_ptr<PangoLayout, GObjectUnref> layout = FittedLayout(cr, text, fallback_text);
    // Centred on the ink, not on the logical box (which holds the line's ascent and descent).
    PangoRectangle ink;
    pango_layout_get_pixel_extents(layout.get(), &ink, nullptr);
    cairo_set_source_rgb(cr, 0, 0, 0);
    cairo_move_to(cr, (kIconSize - ink.width) / 2.0 - ink.x, (kIconSize - ink.height) / 2.0 - ink.y);
    pango_cairo_show_layout(cr, layout.get());
  }
  cairo_destroy(cr);
  cairo_surface_finish(surface);
  bool ok = cairo_surface_status(surface) == CAIRO_STATUS_SUCCESS;
  cairo_surface_destroy(surface);
  return ok;
}

}  // namespace lumeris::resources
