#include "resource_builder/icons.h"

#include <cairo-pdf.h>
#include <cairo.h>
#include <pango/pangocairo.h>

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

// Lays `text` out to fit the icon; the layout belongs to the caller.
std::unique_ptr<PangoLayout, GObjectUnref> MakeLayout(cairo_t* cr, const std::string& text) {
  std::unique_ptr<PangoLayout, GObjectUnref> layout(pango_cairo_create_layout(cr));
  std::unique_ptr<PangoFontDescription, FontDescriptionFree> font(pango_font_description_from_string("DejaVu Sans"));
  double size = text.size() > 4 ? 12.0 : 22.0;
  pango_font_description_set_absolute_size(font.get(), size * PANGO_SCALE);
  pango_layout_set_font_description(layout.get(), font.get());
  pango_layout_set_text(layout.get(), text.c_str(), static_cast<int>(text.size()));
  return layout;
}

// True when some glyph of the layout is missing from the fonts ("tofu"), or it lies in the
// emoji font, which a vector icon cannot reproduce.
bool HasMissingGlyphs(PangoLayout* layout) {
  if (pango_layout_get_unknown_glyphs_count(layout) > 0) return true;
  PangoLayoutIter* iter = pango_layout_get_iter(layout);
  bool foreign = false;
  do {
    PangoLayoutRun* run = pango_layout_iter_get_run_readonly(iter);
    if (run == nullptr) continue;
    PangoFontDescription* description = pango_font_describe(run->item->analysis.font);
    const char* family = pango_font_description_get_family(description);
    foreign = foreign || family == nullptr || std::string(family).find("DejaVu") == std::string::npos;
    pango_font_description_free(description);
  } while (pango_layout_iter_next_run(iter));
  pango_layout_iter_free(iter);
  return foreign;
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
    std::unique_ptr<PangoLayout, GObjectUnref> layout = MakeLayout(cr, text);
    if (HasMissingGlyphs(layout.get())) layout = MakeLayout(cr, fallback_text);
    int width = 0, height = 0;
    pango_layout_get_pixel_size(layout.get(), &width, &height);
    cairo_set_source_rgb(cr, 0, 0, 0);
    cairo_move_to(cr, (kIconSize - width) / 2.0, (kIconSize - height) / 2.0);
    pango_cairo_show_layout(cr, layout.get());
  }
  cairo_destroy(cr);
  cairo_surface_finish(surface);
  bool ok = cairo_surface_status(surface) == CAIRO_STATUS_SUCCESS;
  cairo_surface_destroy(surface);
  return ok;
}

}  // namespace lumeris::resources
