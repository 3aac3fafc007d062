// Font fitting for the panel's character grid: the largest size, never above the font's own, at
// which one displayed character fits a cell.
//
//   PangoFontDescription* font = pango_font_description_from_string("DejaVu Sans 64");
//   lumeris::Rect glyph;
//   PangoFontDescription* fitted =
//       lumeris::FontForCharacterFittingInRect("A", font, &glyph, {0, 0, 32, 32});
//   if (fitted) { ... draw with it ...; pango_font_description_free(fitted); }
//
// The character is laid out as one line with Pango (cairo font map, 72 dpi, unhinted metrics, so
// one layout unit is one point and sizes are points). It fits only when the line is one run of
// one glyph, or of two glyphs where the second comes from a variation selector U+FE00..U+FE0F
// (e.g. "A" U+FE0F in DejaVu Sans); anything else (a second glyph from any other character, three
// or more glyphs, several runs, the missing glyph, an invisible glyph) gives nothing: the panel
// reports such a character as not fitting.
//
// With B the glyph's bounding box, A its advance, P the font's size and the font's ascender and
// descender (below, y grows upwards from the baseline, so the descender is negative):
//   horizontal extent = max(B.x + B.width, A) - min(B.x, 0)
//   vertical extent   = max(ascender, B.y + B.height) - min(descender, B.y)
//   S = min(floor(target.width * P / horizontal), floor(target.height * P / vertical), P)
// The target's origin is not used.
//
// Coordinates. The glyph box is measured from the baseline with y growing UPWARDS (bottom-up):
// B.y is the lowest point of the ink (negative for ink below the baseline), B.y + B.height the
// highest. Pango measures top-down: its ink rectangle `ink` (pango_font_get_glyph_extents) has
// ink.y = the highest point as a negative offset from the baseline. The mapping used throughout:
//   B.x = ink.x, B.width = ink.width, B.height = ink.height, B.y = -(ink.y + ink.height)
//   ascender = Pango ascent, descender = -(Pango descent)
// The out-rectangle keeps the bottom-up convention; to draw it with cairo at baseline (bx, by):
//   cairo_rectangle(cr, bx + r.x, by - (r.y + r.height), r.width, r.height).
//
// Thread-safety: no shared state; may be called from any thread (Pango's default font map is
// per thread). Ownership: the returned description is the caller's (pango_font_description_free).
#pragma once

#include <pango/pango.h>

#include <string_view>

#include "platform/geometry.h"

namespace lumeris {

// The font of `font`'s family and style at the fitted size S (whole points), or nullptr when the
// text is empty or is not one fitting glyph, no font was found, or S is not a positive number.
// When a font is returned and `out_glyph_rect` is non-null, it receives B scaled by S / P, each
// member rounded half away from zero on its own (bottom-up, see above); otherwise it is untouched.
// `text` is UTF-8; invalid UTF-8 gives nullptr.
PangoFontDescription* FontForCharacterFittingInRect(std::string_view text, const PangoFontDescription* font,
                                                    Rect* out_glyph_rect, Rect target);

}  // namespace lumeris
