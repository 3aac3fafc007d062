#include "picker/character_grid.h"

#include <gtkmm/eventcontrollerfocus.h>
#include <gtkmm/eventcontrollerkey.h>
#include <gtkmm/eventcontrollerscroll.h>
#include <gtkmm/gestureclick.h>
#include <gtkmm/gesturelongpress.h>
#include <pango/pangocairo.h>

#include <cmath>

#include "categories/font_fitting.h"

namespace lumeris::picker {
namespace {

// The room left around a glyph inside its cell, on each side.
constexpr int kCellPadding = 4;
// The largest size a character is drawn at; the fitting helper only ever shrinks it.
constexpr char kBaseFont[] = "Sans 28";
// Characters that do not fit as one glyph (sequences without a ligature, lone marks) are drawn
// at this size, centred on their line.
constexpr char kFallbackFont[] = "Sans 14";

void RoundedRectangle(cairo_t* cr, double x, double y, double size, double radius) {
  cairo_new_sub_path(cr);
  cairo_arc(cr, x + size - radius, y + radius, radius, -M_PI / 2, 0);
  cairo_arc(cr, x + size - radius, y + size - radius, radius, 0, M_PI / 2);
  cairo_arc(cr, x + radius, y + size - radius, radius, M_PI / 2, M_PI);
  cairo_arc(cr, x + radius, y + radius, radius, M_PI, 3 * M_PI / 2);
  cairo_close_path(cr);
}

// A layout on `cr` that measures in points at 72 dpi without hinted metrics, as the fitting
// helper measures, so its sizes and ink boxes hold on screen.
PangoLayout* PointLayout(cairo_t* cr) {
  PangoLayout* layout = pango_cairo_create_layout(cr);
  PangoContext* context = pango_layout_get_context(layout);
  pango_cairo_context_set_resolution(context, 72.0);
  cairo_font_options_t* options = cairo_font_options_create();
  cairo_font_options_set_hint_metrics(options, CAIRO_HINT_METRICS_OFF);
  cairo_font_options_set_hint_style(options, CAIRO_HINT_STYLE_NONE);
  pango_cairo_context_set_font_options(context, options);
  cairo_font_options_destroy(options);
  pango_layout_context_changed(layout);
  pango_layout_set_single_paragraph_mode(layout, TRUE);
  return layout;
}

}  // namespace

CharacterGrid::CharacterGrid(int cell_size)
    : Gtk::Box(Gtk::Orientation::HORIZONTAL),
      cell_size_(cell_size),
      adjustment_(Gtk::Adjustment::create(0, 0, 0)),
      scrollbar_(adjustment_, Gtk::Orientation::VERTICAL),
      base_font_(pango_font_description_from_string(kBaseFont)) {
  canvas_.set_hexpand(true);
  canvas_.set_vexpand(true);
  canvas_.set_focusable(true);
  canvas_.set_draw_func(sigc::mem_fun(*this, &CharacterGrid::Draw));
  connections_.push_back(canvas_.signal_resize().connect([this](int, int) { UpdateLayout(); }));
  connections_.push_back(adjustment_->signal_value_changed().connect([this] { canvas_.queue_draw(); }));
  append(canvas_);
  append(scrollbar_);

  auto scroll = Gtk::EventControllerScroll::create();
  scroll->set_flags(Gtk::EventControllerScroll::Flags::VERTICAL);
  connections_.push_back(scroll->signal_scroll().connect(
      [this](double, double dy) {
        adjustment_->set_value(adjustment_->get_value() + dy * cell_size_);
        return true;
      },
      false));
  canvas_.add_controller(scroll);

  auto click = Gtk::GestureClick::create();
  click->set_button(0);
  connections_.push_back(click->signal_pressed().connect([this, click = click.get()](int, double x, double y) {
    canvas_.grab_focus();
    const std::optional<std::size_t> index = CellAt(x, y);
    if (!index) return;
    ChangeSelection(*index);
    if (click->get_current_button() == GDK_BUTTON_SECONDARY) context_menu_.emit(*index);
  }));
  connections_.push_back(click->signal_released().connect([this, click = click.get()](int, double x, double y) {
    const std::optional<std::size_t> index = CellAt(x, y);
    if (click->get_current_button() == GDK_BUTTON_PRIMARY && index && index == navigation_.selected()) {
      picked_.emit(*index);
    }
  }));
  canvas_.add_controller(click);

  auto long_press = Gtk::GestureLongPress::create();
  connections_.push_back(long_press->signal_pressed().connect([this, click = click.get()](double x, double y) {
    click->reset();  // the press became a long press: its release picks nothing
    if (const std::optional<std::size_t> index = CellAt(x, y)) {
      ChangeSelection(*index);
      context_menu_.emit(*index);
    }
  }));
  canvas_.add_controller(long_press);

  auto keys = Gtk::EventControllerKey::create();
  connections_.push_back(keys->signal_key_pressed().connect(sigc::mem_fun(*this, &CharacterGrid::OnKey), false));
  canvas_.add_controller(keys);

  auto focus = Gtk::EventControllerFocus::create();
  connections_.push_back(focus->signal_enter().connect([this] { canvas_.queue_draw(); }));
  connections_.push_back(focus->signal_leave().connect([this] { canvas_.queue_draw(); }));
  canvas_.add_controller(focus);
}

CharacterGrid::~CharacterGrid() {
  // The canvas may still report a focus change or a resize while it is taken down.
  for (sigc::connection& connection : connections_) connection.disconnect();
  for (auto& [character, fitted] : fitted_) {
    if (fitted.font) pango_font_description_free(fitted.font);
  }
  pango_font_description_free(base_font_);
}

void CharacterGrid::SetCharacters(std::vector<std::string> characters, std::string placeholder) {
  characters_ = std::move(characters);
  placeholder_ = std::move(placeholder);
  navigation_.Reset(characters_.size(), navigation_.columns());
  adjustment_->set_value(0);
  UpdateLayout();
  canvas_.queue_draw();
}

void CharacterGrid::ReplaceCharacters(std::vector<std::string> characters) {
  if (characters.size() != characters_.size()) return SetCharacters(std::move(characters));
  characters_ = std::move(characters);
  canvas_.queue_draw();
}

void CharacterGrid::UpdateLayout() {
  const int width = canvas_.get_width();
  const int height = canvas_.get_height();
  navigation_.SetColumns(width > 0 ? static_cast<std::size_t>(width / cell_size_) : 1);
  const double content = static_cast<double>(navigation_.rows() * static_cast<std::size_t>(cell_size_));
  adjustment_->configure(std::min(adjustment_->get_value(), std::max(0.0, content - height)), 0, content,
                         cell_size_, std::max(cell_size_, height - cell_size_), height);
  scrollbar_.set_visible(content > height);
}

std::optional<std::size_t> CharacterGrid::CellAt(double x, double y) const {
  const double left = (canvas_.get_width() - static_cast<double>(navigation_.columns()) * cell_size_) / 2;
  if (x < left || y < 0) return std::nullopt;
  const auto column = static_cast<std::size_t>((x - left) / cell_size_);
  const auto row = static_cast<std::size_t>((y + adjustment_->get_value()) / cell_size_);
  if (column >= navigation_.columns()) return std::nullopt;
  const std::size_t index = row * navigation_.columns() + column;
  return index < characters_.size() ? std::optional<std::size_t>(index) : std::nullopt;
}

Gdk::Rectangle CharacterGrid::CellRectangle(std::size_t index) const {
  const std::size_t columns = navigation_.columns();
  const double left = (canvas_.get_width() - static_cast<double>(columns) * cell_size_) / 2;
  const int x = static_cast<int>(left) + static_cast<int>(index % columns) * cell_size_;
  const int y = static_cast<int>(index / columns) * cell_size_ - static_cast<int>(adjustment_->get_value());
  return Gdk::Rectangle(x, y, cell_size_, cell_size_);
}

void CharacterGrid::ScrollTo(std::size_t index) {
  const double top = static_cast<double>(index / navigation_.columns() * static_cast<std::size_t>(cell_size_));
  const double value = adjustment_->get_value();
  const double page = adjustment_->get_page_size();
  if (page <= 0) return;  // not laid out yet: the top row is in view
  if (top < value) {
    adjustment_->set_value(top);
  } else if (top + cell_size_ > value + page) {
    adjustment_->set_value(top + cell_size_ - page);
  }
}

void CharacterGrid::ChangeSelection(std::size_t index) {
  const std::optional<std::size_t> before = navigation_.selected();
  navigation_.Select(index);
  ScrollTo(index);
  canvas_.queue_draw();
  if (navigation_.selected() != before) selection_changed_.emit(index);
}

void CharacterGrid::Select(std::size_t index) {
  if (index < characters_.size()) ChangeSelection(index);
}

bool CharacterGrid::Move(GridMove move) {
  const auto page_rows = static_cast<std::size_t>(std::max(1, canvas_.get_height() / cell_size_));
  if (!navigation_.Apply(move, page_rows)) return false;
  ScrollTo(*navigation_.selected());
  canvas_.queue_draw();
  selection_changed_.emit(*navigation_.selected());
  return true;
}

bool CharacterGrid::OnKey(guint keyval, guint, Gdk::ModifierType state) {
  const bool shift = (state & Gdk::ModifierType::SHIFT_MASK) == Gdk::ModifierType::SHIFT_MASK;
  switch (keyval) {
    case GDK_KEY_Left: return Move(GridMove::kLeft) || true;
    case GDK_KEY_Right: return Move(GridMove::kRight) || true;
    case GDK_KEY_Up: return Move(GridMove::kUp) || true;
    case GDK_KEY_Down: return Move(GridMove::kDown) || true;
    case GDK_KEY_Page_Up: return Move(GridMove::kPageUp) || true;
    case GDK_KEY_Page_Down: return Move(GridMove::kPageDown) || true;
    case GDK_KEY_Home: return Move(GridMove::kHome) || true;
    case GDK_KEY_End: return Move(GridMove::kEnd) || true;
    case GDK_KEY_Return:
    case GDK_KEY_KP_Enter:
    case GDK_KEY_space:
      if (navigation_.selected()) picked_.emit(*navigation_.selected());
      return true;
    case GDK_KEY_Menu:
      if (navigation_.selected()) context_menu_.emit(*navigation_.selected());
      return true;
    case GDK_KEY_F10:
      if (!shift || !navigation_.selected()) return false;
      context_menu_.emit(*navigation_.selected());
      return true;
    default:
      return false;
  }
}

const CharacterGrid::FittedGlyph& CharacterGrid::Fitted(const std::string& character) {
  auto found = fitted_.find(character);
  if (found != fitted_.end()) return found->second;
  const double inner = cell_size_ - 2 * kCellPadding;
  FittedGlyph fitted;
  fitted.font = FontForCharacterFittingInRect(character, base_font_, &fitted.glyph, Rect{0, 0, inner, inner});
  return fitted_.emplace(character, fitted).first->second;
}

void CharacterGrid::Draw(const Cairo::RefPtr<Cairo::Context>& context, int width, int height) {
  cairo_t* cr = context->cobj();
  const Gdk::RGBA foreground = get_style_context()->get_color();
  if (characters_.empty()) {
    PangoLayout* layout = pango_cairo_create_layout(cr);
    pango_layout_set_text(layout, placeholder_.c_str(), -1);
    pango_layout_set_width(layout, (width - 24) * PANGO_SCALE);
    pango_layout_set_alignment(layout, PANGO_ALIGN_CENTER);
    pango_layout_set_wrap(layout, PANGO_WRAP_WORD);
    cairo_set_source_rgba(cr, foreground.get_red(), foreground.get_green(), foreground.get_blue(), 0.6);
    cairo_move_to(cr, 12, height / 3.0);
    pango_cairo_show_layout(cr, layout);
    g_object_unref(layout);
    drawn_.emit();
    return;
  }
  const std::size_t columns = navigation_.columns();
  const double left = std::floor((width - static_cast<double>(columns) * cell_size_) / 2);
  const double offset = adjustment_->get_value();
  const auto first_row = static_cast<std::size_t>(offset / cell_size_);
  const auto last_row = static_cast<std::size_t>((offset + height) / cell_size_);
  PangoLayout* layout = PointLayout(cr);
  PangoFontDescription* fallback = pango_font_description_from_string(kFallbackFont);
  for (std::size_t row = first_row; row <= last_row; ++row) {
    for (std::size_t column = 0; column < columns; ++column) {
      const std::size_t index = row * columns + column;
      if (index >= characters_.size()) break;
      const double x = left + static_cast<double>(column) * cell_size_;
      const double y = static_cast<double>(row) * cell_size_ - offset;
      if (navigation_.selected() == index) {
        RoundedRectangle(cr, x + 1, y + 1, cell_size_ - 2, 6);
        cairo_set_source_rgba(cr, 0.21, 0.52, 0.89, canvas_.has_focus() ? 0.35 : 0.2);
        cairo_fill(cr);
      }
      const std::string& character = characters_[index];
      const FittedGlyph& fitted = Fitted(character);
      cairo_set_source_rgba(cr, foreground.get_red(), foreground.get_green(), foreground.get_blue(), 1);
      pango_layout_set_font_description(layout, fitted.font ? fitted.font : fallback);
      pango_layout_set_text(layout, character.data(), static_cast<int>(character.size()));
      const double baseline = static_cast<double>(pango_layout_get_baseline(layout)) / PANGO_SCALE;
      if (fitted.font) {
        // The glyph box is measured upwards from the baseline: centre it in the cell.
        const Rect& g = fitted.glyph;
        const double bx = x + cell_size_ / 2.0 - (g.x + g.width / 2);
        const double by = y + cell_size_ / 2.0 + (g.y + g.height / 2);
        cairo_move_to(cr, std::round(bx), std::round(by - baseline));
      } else {
        PangoRectangle logical;
        pango_layout_get_extents(layout, nullptr, &logical);
        cairo_move_to(cr, x + (cell_size_ - static_cast<double>(logical.width) / PANGO_SCALE) / 2,
                      y + (cell_size_ - static_cast<double>(logical.height) / PANGO_SCALE) / 2);
      }
      pango_cairo_show_layout(cr, layout);
    }
  }
  pango_font_description_free(fallback);
  g_object_unref(layout);
  drawn_.emit();
}

}  // namespace lumeris::picker
