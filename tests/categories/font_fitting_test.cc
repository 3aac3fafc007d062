#include "categories/font_fitting.h"

#include <pango/pangocairo.h>

#include <cmath>
#include <memory>
#include <string>

#include <gtest/gtest.h>

#include "categories/tinted_image.h"
#include "support/pictures.h"

namespace lumeris {
namespace {

using FontPtr = std::unique_ptr<PangoFontDescription, decltype(&pango_font_description_free)>;

FontPtr Font(const char* description) {
  return FontPtr(pango_font_description_from_string(description), pango_font_description_free);
}

// What the test itself reads from Pango about the one glyph `text` shapes to: the box
// (bottom-up, y up from the baseline), the advance, the font's ascent and descent, in points.
struct Glyph {
  Rect box;
  double advance = 0;
  double ascent = 0;
  double descent = 0;
};

Glyph Measure(const std::string& text, const PangoFontDescription* font) {
  PangoContext* context = pango_font_map_create_context(pango_cairo_font_map_get_default());
  pango_cairo_context_set_resolution(context, 72);
  cairo_font_options_t* options = cairo_font_options_create();
  cairo_font_options_set_hint_metrics(options, CAIRO_HINT_METRICS_OFF);
  cairo_font_options_set_hint_style(options, CAIRO_HINT_STYLE_NONE);
  pango_cairo_context_set_font_options(context, options);
  cairo_font_options_destroy(options);
  PangoLayout* layout = pango_layout_new(context);
  pango_layout_set_font_description(layout, font);
  pango_layout_set_text(layout, text.c_str(), -1);
  const auto* run = static_cast<PangoGlyphItem*>(pango_layout_get_line_readonly(layout, 0)->runs->data);
  PangoRectangle ink, logical;
  pango_font_get_glyph_extents(run->item->analysis.font, run->glyphs->glyphs[0].glyph, &ink, &logical);
  PangoFontMetrics* metrics = pango_font_get_metrics(run->item->analysis.font, nullptr);
  const double unit = PANGO_SCALE;
  Glyph glyph{{ink.x / unit, -(ink.y + ink.height) / unit, ink.width / unit, ink.height / unit},
              logical.width / unit, pango_font_metrics_get_ascent(metrics) / unit,
              pango_font_metrics_get_descent(metrics) / unit};
  pango_font_metrics_unref(metrics);
  g_object_unref(layout);
  g_object_unref(context);
  return glyph;
}

struct Fitted {
  FontPtr font{nullptr, pango_font_description_free};
  Rect glyph_rect{-1, -1, -1, -1};
  double size() const { return pango_font_description_get_size(font.get()) / double{PANGO_SCALE}; }
};

Fitted Fit(const std::string& text, const char* font, Rect target) {
  Fitted fitted;
  fitted.font.reset(FontForCharacterFittingInRect(text, Font(font).get(), &fitted.glyph_rect, target));
  return fitted;
}

TEST(FontFittingTest, OnlyOneGlyphOrAGlyphWithAVariationSelectorFits) {
  const struct {
    const char* text;
    const char* font;
    bool fits;
  } kCases[] = {
      {"A", "DejaVu Sans 100", true},
      {"A\uFE0F", "DejaVu Sans 100", true},          // two glyphs, the second from U+FE0F
      {"\u2764\uFE0F", "Noto Color Emoji 100", true},  // the colour font draws the pair as one glyph
      {"x\u0301", "DejaVu Sans 100", false},         // a second glyph from a combining accent
      {"x\u0301\u0302", "DejaVu Sans 100", false},   // three glyphs
      {"AB", "DejaVu Sans 100", false},
      {"", "DejaVu Sans 100", false},
      {"\xFF", "DejaVu Sans 100", false},  // not UTF-8
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.text);
    Fitted fitted = Fit(c.text, c.font, {0, 0, 40, 40});
    EXPECT_EQ(fitted.font != nullptr, c.fits);
    if (!c.fits) {
      EXPECT_EQ(fitted.glyph_rect, (Rect{-1, -1, -1, -1}));  // left untouched
    }
  }
  // The variation selector changes nothing: same glyph, same size, same rectangle.
  Fitted plain = Fit("A", "DejaVu Sans 100", {0, 0, 40, 40});
  Fitted selected = Fit("A\uFE0F", "DejaVu Sans 100", {0, 0, 40, 40});
  EXPECT_EQ(plain.size(), selected.size());
  EXPECT_EQ(plain.glyph_rect, selected.glyph_rect);
  EXPECT_STREQ(pango_font_description_get_family(plain.font.get()), "DejaVu Sans");
}

// The size is the largest whole size at which the glyph's extents, which scale with the size,
// stay inside the target; the out-rectangle is the glyph box at that size, rounded member by member.
TEST(FontFittingTest, FittedSizeIsTheLargestWholeSizeInsideTheTarget) {
  const struct {
    const char* text;
    const char* font;
    Rect target;
  } kCases[] = {
      {"A", "DejaVu Sans 100", {7, 9, 40, 500}},              // width decides; the origin is ignored
      {"g", "DejaVu Sans 100", {0, 0, 500, 30}},              // height decides, descender below the baseline
      {"\U0001F600", "Noto Color Emoji 100", {0, 0, 33, 33}},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.text);
    const Glyph g = Measure(c.text, Font(c.font).get());
    const double horizontal = std::max(g.box.x + g.box.width, g.advance) - std::min(g.box.x, 0.0);
    const double vertical = std::max(g.ascent, g.box.y + g.box.height) - std::min(-g.descent, g.box.y);
    Fitted fitted = Fit(c.text, c.font, c.target);
    ASSERT_NE(fitted.font, nullptr);
    const double s = fitted.size();
    EXPECT_EQ(s, std::floor(s));
    EXPECT_LE(horizontal * s / 100, c.target.width + 1e-9);
    EXPECT_LE(vertical * s / 100, c.target.height + 1e-9);
    EXPECT_TRUE(horizontal * (s + 1) / 100 > c.target.width || vertical * (s + 1) / 100 > c.target.height);
    const double scale = s / 100;
    EXPECT_EQ(fitted.glyph_rect, (Rect{std::round(g.box.x * scale), std::round(g.box.y * scale),
                                       std::round(g.box.width * scale), std::round(g.box.height * scale)}));
  }
}

TEST(FontFittingTest, GlyphNarrowerThanItsAdvanceIsFittedByItsAdvance) {
  const Glyph dot = Measure(".", Font("DejaVu Sans 100").get());
  ASSERT_LT(dot.box.x + dot.box.width, dot.advance);
  ASSERT_GE(dot.box.x, 0);
  Fitted fitted = Fit(".", "DejaVu Sans 100", {0, 0, 20, 1000});
  ASSERT_NE(fitted.font, nullptr);
  EXPECT_EQ(fitted.size(), std::floor(20 * 100 / dot.advance));
}

TEST(FontFittingTest, LargerTargetKeepsTheFontSize) {
  const Glyph a = Measure("A", Font("DejaVu Sans 20").get());
  Fitted fitted = Fit("A", "DejaVu Sans 20", {0, 0, 1000, 1000});
  ASSERT_NE(fitted.font, nullptr);
  EXPECT_EQ(fitted.size(), 20);
  EXPECT_EQ(fitted.glyph_rect, (Rect{std::round(a.box.x), std::round(a.box.y), std::round(a.box.width),
                                     std::round(a.box.height)}));

  // The picture: the fitted glyph drawn in its 40 x 40 cell, its out-rectangle outlined in red.
  Fitted cell = Fit("g", "DejaVu Sans 100", {0, 0, 40, 40});
  ASSERT_NE(cell.font, nullptr);
  cairo_surface_t* surface = cairo_image_surface_create(CAIRO_FORMAT_ARGB32, 40, 40);
  cairo_t* cr = cairo_create(surface);
  cairo_set_source_rgb(cr, 1, 1, 1);
  cairo_paint(cr);
  PangoLayout* layout = pango_cairo_create_layout(cr);
  pango_cairo_context_set_resolution(pango_layout_get_context(layout), 72);
  pango_layout_set_font_description(layout, cell.font.get());
  pango_layout_set_text(layout, "g", -1);
  const double baseline = 40 + cell.glyph_rect.y - 2;  // the lowest ink two points above the cell's bottom
  cairo_move_to(cr, 0, baseline - pango_layout_get_baseline(layout) / double{PANGO_SCALE});
  cairo_set_source_rgb(cr, 0, 0, 0);
  pango_cairo_show_layout(cr, layout);
  const Rect& r = cell.glyph_rect;
  cairo_rectangle(cr, r.x + 0.5, baseline - (r.y + r.height) + 0.5, r.width, r.height);
  cairo_set_source_rgb(cr, 1, 0, 0);
  cairo_set_line_width(cr, 1);
  cairo_stroke(cr);
  g_object_unref(layout);
  cairo_destroy(cr);
  EXPECT_TRUE(testing::WritePicture(surface, "fitted_glyph"));
  cairo_surface_destroy(surface);
}

TEST(TintedImageTest, FillsTheSourceAlphaWithTheColour) {
  // One row: opaque red, half-covered green, transparent, opaque white.
  cairo_surface_t* source = cairo_image_surface_create(CAIRO_FORMAT_ARGB32, 4, 1);
  cairo_surface_flush(source);
  auto* pixels = reinterpret_cast<uint32_t*>(cairo_image_surface_get_data(source));
  pixels[0] = 0xFFFF0000;
  pixels[1] = 0x80008000;
  pixels[2] = 0x00000000;
  pixels[3] = 0xFFFFFFFF;
  cairo_surface_mark_dirty(source);

  cairo_surface_t* tinted = CreateTintedImage(source, {0, 0, 1, 1});
  ASSERT_NE(tinted, nullptr);
  EXPECT_EQ(cairo_image_surface_get_width(tinted), 4);
  EXPECT_EQ(cairo_image_surface_get_height(tinted), 1);
  const uint32_t kExpected[] = {0xFF0000FF, 0x80000080, 0x00000000, 0xFF0000FF};
  for (int x = 0; x < 4; ++x) EXPECT_EQ(testing::PixelAt(tinted, x, 0), kExpected[x]) << "x = " << x;
  cairo_surface_destroy(tinted);
  cairo_surface_destroy(source);

  // No alpha channel: every pixel is covered.
  cairo_surface_t* opaque = cairo_image_surface_create(CAIRO_FORMAT_RGB24, 2, 2);
  cairo_surface_t* filled = CreateTintedImage(opaque, {1, 0, 0, 1});
  ASSERT_NE(filled, nullptr);
  EXPECT_EQ(testing::PixelAt(filled, 1, 1), 0xFFFF0000u);
  cairo_surface_destroy(filled);
  cairo_surface_destroy(opaque);
  EXPECT_EQ(CreateTintedImage(nullptr, {}), nullptr);
}

TEST(TintedImageTest, TintsAnIcon) {
  // A ring with a soft edge, tinted with the selection blue.
  cairo_surface_t* icon = cairo_image_surface_create(CAIRO_FORMAT_ARGB32, 48, 48);
  cairo_t* cr = cairo_create(icon);
  cairo_set_source_rgb(cr, 0.9, 0.6, 0.1);
  cairo_arc(cr, 24, 24, 18, 0, 2 * M_PI);
  cairo_set_line_width(cr, 6);
  cairo_stroke(cr);
  cairo_destroy(cr);
  cairo_surface_t* tinted = CreateTintedImage(icon, {0.0, 0.48, 1.0, 1.0});
  ASSERT_NE(tinted, nullptr);
  EXPECT_EQ(testing::PixelAt(tinted, 24, 24), 0u);             // the hole stays transparent
  EXPECT_EQ(testing::PixelAt(tinted, 24 + 18, 24), 0xFF007AFFu);  // on the ring: the colour
  EXPECT_TRUE(testing::WritePicture(tinted, "tinted_icon"));
  cairo_surface_destroy(tinted);
  cairo_surface_destroy(icon);
}

}  // namespace
}  // namespace lumeris
