// InfoPane: the picker's information about the selected character: the character large, its
// name, its code points, the readings and codes its information record holds (for a Han
// character: Japanese, Korean, Mandarin and Cantonese readings, strokes, input codes), and its
// related characters as buttons.
//
//   pane.ShowCharacter("α");                 // clears what belonged to the previous one
//   pane.ShowRecord(info_reply_result);      // "search_character_info"
//   pane.ShowRelated(related_reply_result);  // "search_related_chars"
//
// Thread-safety: a GTK widget: main thread only.
#pragma once

#include <gtkmm/box.h>
#include <gtkmm/flowbox.h>
#include <gtkmm/label.h>
#include <gtkmm/scrolledwindow.h>

#include <string>
#include <vector>

#include "service/message_value.h"

namespace lumeris::picker {

class InfoPane : public Gtk::Box {
 public:
  InfoPane();

  void ShowCharacter(const std::string& character);
  void ShowRecord(const MessageValue* record);
  void ShowRelated(const MessageValue* related);

  const std::string& character() const { return character_; }
  // The related characters now shown, in order.
  const std::vector<std::string>& related() const { return related_; }
  // The name line now shown ("" while none).
  std::string name() const { return name_.get_text(); }

  // A related character was clicked.
  sigc::signal<void(const std::string&)>& signal_related_picked() { return related_picked_; }

 private:
  std::string character_;
  std::vector<std::string> related_;
  Gtk::Label glyph_;
  Gtk::Label name_;
  Gtk::Label code_points_;
  Gtk::Label details_;
  Gtk::Label related_title_;
  Gtk::FlowBox related_box_;
  Gtk::ScrolledWindow related_scroll_;
  sigc::signal<void(const std::string&)> related_picked_;
};

}  // namespace lumeris::picker
