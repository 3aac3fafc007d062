#include "picker/info_pane.h"

#include <gtkmm/button.h>

#include "client/cli_items.h"
#include "client/cli_output.h"

namespace lumeris::picker {
namespace {

// The record fields worth a line, with their labels; the names field is the title instead, and
// the Wubi fields are empty in this database.
struct DetailField {
  std::string_view tag;
  std::string_view label;
};
constexpr DetailField kDetailFields[] = {
    {"jyom", "Japanese"},  {"krpi", "Korean"},    {"spin", "Pinyin"},  {"tpin", "Pinyin (Taiwan)"},
    {"tzhu", "Zhuyin"},    {"cbai", "Cantonese"}, {"sbix", "Strokes"}, {"tcan", "Cangjie"},
    {"tday", "Dayi"},      {"rsu1", "Radical"},
};

}  // namespace

InfoPane::InfoPane() : Gtk::Box(Gtk::Orientation::VERTICAL, 6) {
  set_size_request(230, -1);
  set_margin(12);
  glyph_.add_css_class("picker-info-glyph");
  glyph_.set_selectable(true);
  name_.set_wrap(true);
  name_.set_justify(Gtk::Justification::CENTER);
  name_.set_max_width_chars(24);
  name_.add_css_class("heading");
  code_points_.add_css_class("dim-label");
  code_points_.set_selectable(true);
  details_.set_wrap(true);
  details_.set_xalign(0);
  details_.set_selectable(true);
  related_title_.set_text("Related");
  related_title_.set_xalign(0);
  related_title_.add_css_class("heading");
  related_box_.set_selection_mode(Gtk::SelectionMode::NONE);
  related_box_.set_max_children_per_line(6);
  related_box_.set_homogeneous(true);
  related_box_.set_valign(Gtk::Align::START);
  related_box_.add_css_class("picker-related");
  related_scroll_.set_child(related_box_);
  related_scroll_.set_vexpand(true);
  related_scroll_.set_policy(Gtk::PolicyType::NEVER, Gtk::PolicyType::AUTOMATIC);
  for (Gtk::Widget* widget : std::initializer_list<Gtk::Widget*>{&glyph_, &name_, &code_points_, &details_,
                                                                  &related_title_, &related_scroll_}) {
    append(*widget);
  }
  ShowCharacter("");
}

void InfoPane::ShowCharacter(const std::string& character) {
  character_ = character;
  glyph_.set_text(character);
  name_.set_text("");
  code_points_.set_text(character.empty() ? "" : cli::CodePoints(character));
  details_.set_text("");
  details_.set_visible(false);
  ShowRelated(nullptr);
}

void InfoPane::ShowRecord(const MessageValue* record) {
  const std::string* names = record ? record->GetString("unam") : nullptr;
  name_.set_text(names ? cli::ShortCharacterName(*names) : "");
  std::string details;
  for (const DetailField& field : kDetailFields) {
    const std::string* value = record ? record->GetString(field.tag) : nullptr;
    if (value == nullptr || value->empty()) continue;
    if (!details.empty()) details += "\n";
    details += std::string(field.label) + ": " + *value;
  }
  details_.set_text(details);
  details_.set_visible(!details.empty());
}

void InfoPane::ShowRelated(const MessageValue* related) {
  while (Gtk::Widget* child = related_box_.get_first_child()) related_box_.remove(*child);
  related_.clear();
  const MessageValue::Array* array = related ? related->AsArray() : nullptr;
  for (std::size_t i = 0; array && i < array->size(); ++i) {
    const std::string* character = (*array)[i].AsString();
    if (character == nullptr || character->empty()) continue;
    if (std::find(related_.begin(), related_.end(), *character) != related_.end()) continue;
    related_.push_back(*character);
    auto* button = Gtk::make_managed<Gtk::Button>(*character);
    button->add_css_class("flat");
    button->set_tooltip_text(cli::CodePoints(*character));
    button->signal_clicked().connect([this, c = *character] { related_picked_.emit(c); });
    related_box_.append(*button);
  }
  related_title_.set_visible(!related_.empty());
  related_scroll_.set_visible(!related_.empty());
}

}  // namespace lumeris::picker
