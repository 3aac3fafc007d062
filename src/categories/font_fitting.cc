#include "categories/font_fitting.h"

#include <pango/pangocairo.h>

#include <algorithm>
#include <cmath>
#include <memory>

namespace lumeris {
namespace {

template <typename T>
struct GObjectUnref {
  void operator()(T* object) const { g_object_unref(object); }
};
template <typename T>
using GObjectPtr = std::unique_ptr<T, GObjectUnref<T>>;

struct FontDescriptionFree {
  void operator()(PangoFontDescription* description) const { pango_font_description_free(description); }
};
using FontDescriptionPtr = std::unique_ptr<PangoFontDescription, FontDescriptionFree>;

// A context in which one layout unit is one point and glyph outlines are not snapped to pixels.
GObjectPtr<PangoContext> PointContext() {
  GObjectPtr<PangoContext> context(pango_font_map_create_context(pango_cairo_font_map_get_default()));
  pango_cairo_context_set_resolution(context.get(), 72.0);
  cairo_font_options_t* options = cairo_font_options_create();
  cairo_font_options_set_hint_metrics(options, CAIRO_HINT_METRICS_OFF);
  cairo_font_options_set_hint_style(options, CAIRO_HINT_STYLE_NONE);
  pango_cairo_context_set_font_options(context.get(), options);
  cairo_font_options_destroy(options);
  return context;
}

// A glyph that draws something: not the missing glyph (Pango's unknown-glyph flag) and not the
// invisible glyph that shaping puts for hidden characters.
bool IsDrawnGlyph(PangoGlyph glyph) {
  return glyph != 0 && glyph != PANGO_GLYPH_EMPTY && (glyph & PANGO_GLYPH_UNKNOWN_FLAG) == 0;
}

struct ChosenGlyph {
  PangoGlyph glyph = 0;
  PangoFont* font = nullptr;  // borrowed from the layout
};

// The glyph that stands for the whole line, when the line is one run of one glyph, or of two
// where the second glyph comes from a variation selector U+FE00..U+FE0F.
ChosenGlyph ChooseGlyph(PangoLayoutLine* line, std::string_view text) {
  ChosenGlyph chosen;
  if (line == nullptr || line->runs == nullptr || line->runs->next != nullptr) return chosen;
  const auto* run = static_cast<const PangoGlyphItem*>(line->runs->data);
  const PangoGlyphString* glyphs = run->glyphs;
  chosen.font = run->item->analysis.font;
  if (glyphs->num_glyphs == 1) {
    chosen.glyph = glyphs->glyphs[0].glyph;
  } else if (glyphs->num_glyphs == 2) {
    // log_clusters are byte offsets into the item's text.
    const size_t index = static_cast<size_t>(run->item->offset) + static_cast<size_t>(glyphs->log_clusters[1]);
    if (index < text.size()) {
      const gunichar c = g_utf8_get_char(text.data() + index);
      if (c >= 0xFE00 && c <= 0xFE0F) chosen.glyph = glyphs->glyphs[0].glyph;
    }
  }
  if (!IsDrawnGlyph(chosen.glyph)) chosen.glyph = 0;
  return chosen;
}

double Units(int pango_units) { return static_cast<double>(pango_units) / PANGO_SCALE; }

}  // namespace

PangoFontDescription* FontForCharacterFittingInRect(std::string_view text, const PangoFontDescription* font,
                                                    Rect* out_glyph_rect, Rect target) {
  if (text.empty() || font == nullptr) return nullptr;
  if (!g_utf8_validate(text.data(), static_cast<gssize>(text.size()), nullptr)) return nullptr;

  GObjectPtr<PangoContext> context = PointContext();
  GObjectPtr<PangoLayout> layout(pango_layout_new(context.get()));
  pango_layout_set_single_paragraph_mode(layout.get(), TRUE);
  pango_layout_set_font_description(layout.get(), font);
  pango_layout_set_text(layout.get(), text.data(), static_cast<int>(text.size()));

  const ChosenGlyph chosen = ChooseGlyph(pango_layout_get_line_readonly(layout.get(), 0), text);
  if (chosen.glyph == 0 || chosen.font == nullptr) return nullptr;

  PangoRectangle ink;
  PangoRectangle logical;
  pango_font_get_glyph_extents(chosen.font, chosen.glyph, &ink, &logical);
  // Bottom-up glyph box (see the header for the mapping from Pango's top-down rectangle).
  const Rect box{Units(ink.x), -Units(ink.y + ink.height), Units(ink.width), Units(ink.height)};
  const double advance = Units(logical.width);
  PangoFontMetrics* metrics = pango_font_get_metrics(chosen.font, nullptr);
  const double ascender = Units(pango_font_metrics_get_ascent(metrics));
  const double descender = -Units(pango_font_metrics_get_descent(metrics));
  pango_font_metrics_unref(metrics);

  FontDescriptionPtr fitted(pango_font_describe(chosen.font));
  const double size = Units(pango_font_description_get_size(fitted.get()));

  const double horizontal = std::max(box.x + box.width, advance) - std::min(box.x, 0.0);
  const double vertical = std::max(ascender, box.y + box.height) - std::min(descender, box.y);
  const double fitted_size = std::min({std::floor(target.width * size / horizontal),
                                       std::floor(target.height * size / vertical), size});
  // Also false for not-a-number (a zero target over a zero extent).
  if (!(fitted_size > 0)) return nullptr;

  if (out_glyph_rect != nullptr) {
    const double scale = fitted_size / size;
    *out_glyph_rect = Rect{std::round(box.x * scale), std::round(box.y * scale), std::round(box.width * scale),
                           std::round(box.height * scale)};
  }
  const int pango_size = static_cast<int>(fitted_size * PANGO_SCALE);
  if (pango_font_description_get_size_is_absolute(fitted.get())) {
    pango_font_description_set_absolute_size(fitted.get(), pango_size);
  } else {
    pango_font_description_set_size(fitted.get(), pango_size);
  }
  return fitted.release();
}

}  // namespace lumeris
