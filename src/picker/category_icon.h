// Category icons for the sidebar: the icon bytes of a "read_categorydata" entry (a PDF page or
// a TIFF image) drawn at a pixel size and tinted with one colour, as a texture GTK can show.
//
//   Glib::RefPtr<Gdk::Texture> icon = CategoryIconTexture(section.icon, 20, {0.2, 0.2, 0.2, 1});
//
// PDF pages are drawn with poppler into a cairo image surface, TIFF images are decoded by GDK;
// both are then filled with the colour through their alpha (CreateTintedImage), so the icons
// follow the theme's text colour. Icon bytes that are neither, or that do not decode, give a
// null texture (the sidebar then shows the title alone).
//
// Thread-safety: call on the GTK main thread. The texture belongs to the caller.
#pragma once

#include <gdkmm/texture.h>

#include "categories/tinted_image.h"
#include "service/message_value.h"

namespace lumeris::picker {

Glib::RefPtr<Gdk::Texture> CategoryIconTexture(const MessageValue::Bytes& icon, int pixel_size, RGBAColor color);

}  // namespace lumeris::picker
