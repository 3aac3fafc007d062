#include "picker/category_icon.h"

#include <gdk/gdk.h>
#include <poppler.h>

#include <algorithm>
#include <memory>

#include "client/commands/category_command.h"

namespace lumeris::picker {
namespace {

struct SurfaceDestroy {
  void operator()(cairo_surface_t* surface) const { cairo_surface_destroy(surface); }
};
using SurfacePtr = std::unique_ptr<cairo_surface_t, SurfaceDestroy>;

template <typename T>
struct GObjectUnref {
  void operator()(T* object) const { g_object_unref(object); }
};

// The first page of a PDF, scaled to fit a square of `size` pixels and centred.
SurfacePtr DrawPdf(const MessageValue::Bytes& icon, int size) {
  GBytes* bytes = g_bytes_new(icon.data(), icon.size());
  std::unique_ptr<PopplerDocument, GObjectUnref<PopplerDocument>> document(
      poppler_document_new_from_bytes(bytes, nullptr, nullptr));
  g_bytes_unref(bytes);
  if (!document || poppler_document_get_n_pages(document.get()) < 1) return nullptr;
  std::unique_ptr<PopplerPage, GObjectUnref<PopplerPage>> page(poppler_document_get_page(document.get(), 0));
  double width = 0;
  double height = 0;
  poppler_page_get_size(page.get(), &width, &height);
  if (!(width > 0 && height > 0)) return nullptr;
  SurfacePtr surface(cairo_image_surface_create(CAIRO_FORMAT_ARGB32, size, size));
  cairo_t* cr = cairo_create(surface.get());
  const double scale = size / std::max(width, height);
  cairo_translate(cr, (size - width * scale) / 2, (size - height * scale) / 2);
  cairo_scale(cr, scale, scale);
  poppler_page_render(page.get(), cr);
  cairo_destroy(cr);
  return surface;
}

// A TIFF image decoded by GDK, scaled to fit a square of `size` pixels and centred.
SurfacePtr DrawTiff(const MessageValue::Bytes& icon, int size) {
  GBytes* bytes = g_bytes_new(icon.data(), icon.size());
  GdkTexture* texture = gdk_texture_new_from_bytes(bytes, nullptr);
  g_bytes_unref(bytes);
  if (texture == nullptr) return nullptr;
  const int width = gdk_texture_get_width(texture);
  const int height = gdk_texture_get_height(texture);
  SurfacePtr image(cairo_image_surface_create(CAIRO_FORMAT_ARGB32, width, height));
  cairo_surface_flush(image.get());
  gdk_texture_download(texture, cairo_image_surface_get_data(image.get()),
                       static_cast<gsize>(cairo_image_surface_get_stride(image.get())));
  cairo_surface_mark_dirty(image.get());
  g_object_unref(texture);
  SurfacePtr surface(cairo_image_surface_create(CAIRO_FORMAT_ARGB32, size, size));
  cairo_t* cr = cairo_create(surface.get());
  const double scale = static_cast<double>(size) / std::max(width, height);
  cairo_translate(cr, (size - width * scale) / 2, (size - height * scale) / 2);
  cairo_scale(cr, scale, scale);
  cairo_set_source_surface(cr, image.get(), 0, 0);
  cairo_paint(cr);
  cairo_destroy(cr);
  return surface;
}

}  // namespace

Glib::RefPtr<Gdk::Texture> CategoryIconTexture(const MessageValue::Bytes& icon, int pixel_size, RGBAColor color) {
  const std::string_view type = cli::IconType(icon);
  SurfacePtr drawn = type == "PDF" ? DrawPdf(icon, pixel_size) : type == "TIFF" ? DrawTiff(icon, pixel_size) : nullptr;
  if (!drawn) return {};
  SurfacePtr tinted(CreateTintedImage(drawn.get(), color));
  if (!tinted) return {};
  cairo_surface_flush(tinted.get());
  const int stride = cairo_image_surface_get_stride(tinted.get());
  GBytes* pixels = g_bytes_new(cairo_image_surface_get_data(tinted.get()),
                               static_cast<gsize>(stride) * static_cast<gsize>(pixel_size));
  GdkTexture* texture = gdk_memory_texture_new(pixel_size, pixel_size, GDK_MEMORY_DEFAULT, pixels,
                                               static_cast<gsize>(stride));
  g_bytes_unref(pixels);
  return Glib::wrap(texture);
}

}  // namespace lumeris::picker
