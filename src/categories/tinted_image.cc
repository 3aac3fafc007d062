#include "categories/tinted_image.h"

namespace lumeris {

cairo_surface_t* CreateTintedImage(cairo_surface_t* source, RGBAColor color) {
  if (source == nullptr || cairo_surface_status(source) != CAIRO_STATUS_SUCCESS ||
      cairo_surface_get_type(source) != CAIRO_SURFACE_TYPE_IMAGE) {
    return nullptr;
  }
  const int width = cairo_image_surface_get_width(source);
  const int height = cairo_image_surface_get_height(source);
  cairo_surface_t* tinted = cairo_image_surface_create(CAIRO_FORMAT_ARGB32, width, height);
  cairo_t* cr = cairo_create(tinted);
  cairo_set_source_rgba(cr, color.red, color.green, color.blue, color.alpha);
  cairo_mask_surface(cr, source, 0, 0);
  cairo_destroy(cr);
  cairo_surface_flush(tinted);
  if (cairo_surface_status(tinted) != CAIRO_STATUS_SUCCESS) {
    cairo_surface_destroy(tinted);
    return nullptr;
  }
  return tinted;
}

}  // namespace lumeris
