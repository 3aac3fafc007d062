// CharacterGrid: the picker's grid of characters, a drawing area beside its own scroll bar.
// Only the visible rows are drawn, with Pango through cairo; each character is drawn at the
// font size the font-fitting helper (categories/font_fitting.h) chooses for the cell, centred on
// its ink box, so a grid of ten thousand characters costs no more than one screenful.
//
// Mouse: a click selects and picks; a right click or a long press asks for the context menu.
// Keyboard (when the grid has the focus): arrows, Page Up/Down, Home/End move the selection,
// Enter picks, the Menu key or Shift+F10 asks for the context menu.
//
// Thread-safety: a GTK widget: main thread only. The fitted fonts are cached per character for
// the widget's life.
#pragma once

#include <gtkmm/adjustment.h>
#include <gtkmm/box.h>
#include <gtkmm/drawingarea.h>
#include <gtkmm/scrollbar.h>
#include <pango/pango.h>

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <unordered_map>
#include <vector>

#include "picker/grid_navigation.h"
#include "platform/geometry.h"

namespace lumeris::picker {

class CharacterGrid : public Gtk::Box {
 public:
  // Cells are `cell_size` pixels square.
  explicit CharacterGrid(int cell_size = 44);
  ~CharacterGrid() override;

  // New contents: nothing selected, scrolled to the top; `placeholder` shows when it is empty.
  void SetCharacters(std::vector<std::string> characters, std::string placeholder = {});
  // Same contents with some characters changed in place (a skin tone): selection and scroll kept.
  void ReplaceCharacters(std::vector<std::string> characters);
  const std::vector<std::string>& characters() const { return characters_; }

  std::optional<std::size_t> selected() const { return navigation_.selected(); }
  // Selects `index` and scrolls it into view.
  void Select(std::size_t index);
  // Moves the selection as a key would; false when it did not move.
  bool Move(GridMove move);
  // The cell's rectangle in the canvas's coordinates (for a popover).
  Gdk::Rectangle CellRectangle(std::size_t index) const;
  Gtk::DrawingArea& canvas() { return canvas_; }

  // A cell was picked (click or Enter).
  sigc::signal<void(std::size_t)>& signal_picked() { return picked_; }
  // The selection moved to a cell.
  sigc::signal<void(std::size_t)>& signal_selection_changed() { return selection_changed_; }
  // The context menu is wanted for a cell.
  sigc::signal<void(std::size_t)>& signal_context_menu() { return context_menu_; }
  // The canvas has been drawn (for the benchmarks' timing).
  sigc::signal<void()>& signal_drawn() { return drawn_; }

 private:
  struct FittedGlyph {
    PangoFontDescription* font = nullptr;  // owned; nullptr: the character does not fit one cell
    Rect glyph;
  };

  void Draw(const Cairo::RefPtr<Cairo::Context>& context, int width, int height);
  const FittedGlyph& Fitted(const std::string& character);
  void UpdateLayout();
  void ScrollTo(std::size_t index);
  std::optional<std::size_t> CellAt(double x, double y) const;
  bool OnKey(guint keyval, guint keycode, Gdk::ModifierType state);
  void ChangeSelection(std::size_t index);

  const int cell_size_;
  Gtk::DrawingArea canvas_;
  Glib::RefPtr<Gtk::Adjustment> adjustment_;
  Gtk::Scrollbar scrollbar_;

  std::vector<std::string> characters_;
  std::string placeholder_;
  GridNavigation navigation_;
  PangoFontDescription* base_font_;  // owned
  std::unordered_map<std::string, FittedGlyph> fitted_;

  sigc::signal<void(std::size_t)> picked_;
  sigc::signal<void(std::size_t)> selection_changed_;
  sigc::signal<void(std::size_t)> context_menu_;
  sigc::signal<void()> drawn_;
  std::vector<sigc::connection> connections_;  // to this object, cut when it goes
};

}  // namespace lumeris::picker
