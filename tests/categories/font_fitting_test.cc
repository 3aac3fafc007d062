#include "categories/font_fitting.h"

#include <pango/pangocairo.h>

#include <cstring>
#include <memory>
#include <string>

#include <gtest/gtest.h>

#include "categories/tinted_image.h"
#include "support/pictures.h"

// Fontconfig's configuration and Pango's font caches (filled by a thread of Pango's own) live
// until the process ends and are never freed; the leak checker is told to pass over them.
extern "C" const char* __lsan_default_suppressions() {
  return "leak:libfontconfig.so\nleak:libpangoft2-1.0.so\n";
}

namespace lumeris {
namespace {

using FontPtr = std::unique_ptr<PangoFontDescription, decltype(&pango_font_description_free)>;
FontPtr Font(const char* name) { return {pango_font_description_from_string(name), pango_font_description_free}; }

struct Fitted {
  FontPtr font{nullptr, pango_font_description_free};
  Rect rect{-1, -1, -1, -1};
  double size() const { return pango_font_description_get_size(font.get()) / double{PANGO_SCALE}; }
};
Fitted Fit(const char* text, const char* font, Rect target) {
  Fitted fitted;
  fitted.font.reset(FontForCharacterFittingInRect(text, Font(font).get(), &fitted.rect, target));
  return fitted;
}

// The largest whole size at which the glyph's extents stay inside the target, never above the
// font's own; the out-rectangle is the ink box at that size (y up from the baseline), rounded.
// Only one glyph, or a glyph and a variation selector's, fits: else no font (size 0 here) and the
// rectangle left untouched. Sizes are those of the DejaVu and Noto Color Emoji fonts the project
// installs.
TEST(FontFittingTest, FitsOneGlyphAtTheLargestWholeSizeInsideTheTarget) {
  const Rect kUntouched{-1, -1, -1, -1};
  const struct { const char* text; const char* font; Rect target; double size; Rect rect; } kCases[] = {
      {"A", "DejaVu Sans 100", {7, 9, 40, 500}, 58, {0, 0, 39, 42}},  // width decides; the origin is not used
      {"A\uFE0F", "DejaVu Sans 100", {7, 9, 40, 500}, 58, {0, 0, 39, 42}},  // U+FE0F's glyph is not measured
      {"g", "DejaVu Sans 100", {0, 0, 500, 30}, 25, {1, -5, 12, 19}},  // height decides, from the descent up
      {".", "DejaVu Sans 100", {0, 0, 20, 500}, 62, {7, 0, 6, 8}},     // narrower than its advance: the advance decides
      {"\U0001F600", "Noto Color Emoji 100", {0, 0, 33, 33}, 26, {0, -6, 32, 31}},
      {"\u2764\uFE0F", "Noto Color Emoji 100", {0, 0, 33, 33}, 26, {0, -6, 32, 31}},  // shaped into one glyph
      {"A", "DejaVu Sans 100", {0, 0, 1000, 1000}, 100, {1, 0, 67, 73}},  // larger target: size unchanged
      {"x\u0301", "DejaVu Sans 100", {0, 0, 40, 40}, 0, kUntouched},    // a second glyph from a combining accent
      {"x\u0301\u0302", "DejaVu Sans 100", {0, 0, 40, 40}, 0, kUntouched},  // three glyphs
      {"", "DejaVu Sans 100", {0, 0, 40, 40}, 0, kUntouched},
  };
  for (const auto& c : kCases) {
    const Fitted fitted = Fit(c.text, c.font, c.target);
    EXPECT_EQ(fitted.font ? fitted.size() : 0, c.size) << c.text;
    EXPECT_EQ(fitted.rect, c.rect) << c.text;
    const char* family = fitted.font ? pango_font_description_get_family(fitted.font.get()) : nullptr;
    EXPECT_EQ(family ? family + std::string(" 100") : c.font, c.font);
  }
}

TEST(TintedImageTest, FillsTheSourceAlphaWithTheColour) {
  // Opaque red, half-covering green, transparent, opaque white (premultiplied).
  cairo_surface_t* source = cairo_image_surface_create(CAIRO_FORMAT_ARGB32, 4, 1);
  cairo_surface_flush(source);
  const uint32_t kSource[] = {0xFFFF0000, 0x80008000, 0x00000000, 0xFFFFFFFF};
  std::memcpy(cairo_image_surface_get_data(source), kSource, sizeof kSource);
  cairo_surface_mark_dirty(source);
  cairo_surface_t* tinted = CreateTintedImage(source, {0, 0, 1, 1});
  ASSERT_NE(tinted, nullptr);
  EXPECT_EQ(cairo_image_surface_get_width(tinted), 4);
  EXPECT_EQ(cairo_image_surface_get_height(tinted), 1);
  const uint32_t kExpected[] = {0xFF0000FF, 0x80000080, 0x00000000, 0xFF0000FF};
  for (int x = 0; x < 4; ++x) EXPECT_EQ(testing::PixelAt(tinted, x, 0), kExpected[x]) << "x = " << x;
  EXPECT_EQ(CreateTintedImage(nullptr, {}), nullptr);
  for (cairo_surface_t* s : {source, tinted}) cairo_surface_destroy(s);
}

// The fitted "g" drawn in its 40 x 40 cell, its lowest ink two points above the bottom: no ink
// outside the out-rectangle (y up from the baseline, as the header says; a pixel of rounding
// allowed). Tinted with the selection blue, every pixel keeps the glyph's coverage.
TEST(TintedImageTest, TintsAFittedGlyphAtItsCoverage) {
  const Fitted cell = Fit("g", "DejaVu Sans 100", {0, 0, 40, 40});
  ASSERT_NE(cell.font, nullptr);
  cairo_surface_t* glyph = cairo_image_surface_create(CAIRO_FORMAT_ARGB32, 40, 40);
  cairo_t* cr = cairo_create(glyph);
  PangoLayout* layout = pango_cairo_create_layout(cr);
  pango_cairo_context_set_resolution(pango_layout_get_context(layout), 72);
  pango_layout_set_font_description(layout, cell.font.get());
  pango_layout_set_text(layout, "g", -1);
  const double baseline = 38 + cell.rect.y;
  cairo_move_to(cr, 0, baseline - pango_layout_get_baseline(layout) / double{PANGO_SCALE});
  pango_cairo_show_layout(cr, layout);
  g_object_unref(layout);
  cairo_destroy(cr);
  cairo_surface_t* tinted = CreateTintedImage(glyph, {0.0, 0.48, 1.0, 1.0});
  const Rect& r = cell.rect;
  int opaque = 0, wrong = 0;
  for (int y = 0; y < 40; ++y) {
    for (int x = 0; x < 40; ++x) {
      const uint32_t alpha = testing::PixelAt(glyph, x, y) >> 24, tint = testing::PixelAt(tinted, x, y);
      const bool in_box = x >= r.x - 1 && x <= r.x + r.width && y >= baseline - r.y - r.height - 1 && y <= baseline - r.y;
      opaque += alpha == 0xFF;
      wrong += (alpha > 0 && !in_box) || (tint >> 24) != alpha || (alpha == 0xFF && tint != 0xFF007AFFu);
    }
  }
  EXPECT_GT(opaque, 10);
  EXPECT_EQ(wrong, 0);
  EXPECT_TRUE(testing::WritePicture(tinted, "fitted_glyph"));
  for (cairo_surface_t* s : {glyph, tinted}) cairo_surface_destroy(s);
}

}  // namespace
}  // namespace lumeris
