// Category icons: a small PDF page (32 x 32 points) showing a representative text in black,
// drawn with Pango and cairo in "DejaVu Sans" alone. When that font cannot draw `text`, the icon
// shows `fallback_text` instead (for example a script code), so no icon shows empty boxes; a text
// too large for the page is drawn smaller, so none is clipped.
//
// Thread-safety: each call makes its own surfaces; callers may draw icons from several threads.
#pragma once

#include <filesystem>
#include <string>

namespace lumeris::resources {

// Writes the icon to `path` (a ".pdf" file); false when the file cannot be written.
bool WriteIconPdf(const std::filesystem::path& path, const std::string& text, const std::string& fallback_text);

}  // namespace lumeris::resources
