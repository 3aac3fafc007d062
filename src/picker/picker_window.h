// PickerWindow: the picker's window. A search field in the header bar, the category sidebar
// (Recents and Favourites first), the character grid and the information pane; every piece of
// data comes from the file service through one PickerConnection, so the window appears at once
// and fills in as the replies arrive.
//
//   PickerWindow window({.application = "org.example.Editor"});
//   window.present();
//
// What it does with the service: "read_recents_favorites" at start and whenever the change
// notification arrives (so pickers in other programs stay in step); "read_categorydata" for
// the sidebar; "search_matched_chars" as the user types (SearchRequests); "search_character_info"
// and "search_related_chars" for the selected character; "add" to recents on every pick; "set"
// for favourites (then it posts the change notification itself, since the service does not
// announce favourites); "set_skintone" for a chosen skin tone; "save_state" per application.
//
// Keyboard: typing anywhere searches; Ctrl+F focuses the search field; Up/Down from the field
// move into the grid; arrows, Page Up/Down, Home/End move in the grid; Enter picks (in the field:
// the selected or first result); the Menu key or Shift+F10 opens the context menu (skin tones,
// favourite); Escape clears the search, or closes the window when there is none.
//
// Thread-safety: a GTK widget: main thread only. Replies and notifications arrive on the main
// loop; none is delivered after the window is destroyed.
#pragma once

#include <gtkmm/box.h>
#include <gtkmm/button.h>
#include <gtkmm/checkbutton.h>
#include <gtkmm/headerbar.h>
#include <gtkmm/label.h>
#include <gtkmm/listbox.h>
#include <gtkmm/menubutton.h>
#include <gtkmm/popover.h>
#include <gtkmm/scrolledwindow.h>
#include <gtkmm/searchentry.h>
#include <gtkmm/window.h>

#include <cstdint>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "client/service_client.h"
#include "picker/character_grid.h"
#include "picker/info_pane.h"
#include "picker/picker_connection.h"
#include "picker/picker_model.h"
#include "picker/picker_state.h"
#include "picker/search_requests.h"
#include "picker/task_queue.h"

namespace lumeris {
class DistributedNotificationObserver;
}

namespace lumeris::picker {

struct PickerOptions {
  // Scopes recents, favourites and skin tones.
  std::string identifier = "com.vantorel.Lumeris.DefaultDataStorage";
  // Scopes the saved state: the program the picker works for.
  std::string application = "com.vantorel.lumeris-picker";
  ServiceClientOptions service;
};

class PickerWindow : public Gtk::Window {
 public:
  explicit PickerWindow(PickerOptions options = {});
  ~PickerWindow() override;

  // Shows the section with `id` as a click in the sidebar does; false when there is none.
  bool ShowSection(const std::string& id);
  // Copies `character` to the clipboard, adds it to recents and closes when the user asked so.
  void Pick(const std::string& character);
  // Opens the context menu (skin tones, favourite) for a cell of the grid.
  void OpenContextMenu(std::size_t index);

  // What tests and benchmarks look at.
  Gtk::SearchEntry& search_entry() { return search_; }
  CharacterGrid& grid() { return grid_; }
  InfoPane& info_pane() { return info_; }
  Gtk::Popover& context_menu() { return context_menu_; }
  // The skin-tone buttons of the open context menu (plain form first), empty when it offers none.
  std::vector<Gtk::Button*> skin_tone_buttons();
  Gtk::Button& favorite_button() { return favorite_button_; }
  const PickerModel& model() const { return model_; }
  // The section the grid shows; "" while it shows search results.
  const std::string& shown_section() const { return shown_section_; }
  // True once the user's data and the categories have arrived.
  bool loaded() const { return user_data_loaded_ && categories_loaded_; }
  // Emitted whenever the grid or the sidebar got new contents.
  sigc::signal<void()>& signal_updated() { return updated_; }

 private:
  void BuildHeader();
  void BuildBody();
  void BuildContextMenu();
  void LoadUserData();
  void LoadCategories();
  void ApplyState(const PickerState& state);
  void SaveState();
  void RebuildSidebar();
  void RefreshGrid();
  void OnSearchChanged();
  void SendSearch(const SearchRequests::Search& search);
  void OnSelectionChanged(std::size_t index);
  void ChooseSkinTone(const std::string& variant);
  void ToggleFavorite(const std::string& character);
  void SetStatus(const std::string& text);
  void StartObserving();
  MessageValue StoreRequest(const char* command) const;

  const PickerOptions options_;
  std::shared_ptr<bool> alive_;  // replies posted to the main loop run only while it lives
  PickerModel model_;
  SearchRequests searches_;
  PickerState state_;
  std::string state_others_;  // the saved state's members the picker does not know
  std::string shown_section_;
  std::string last_section_;  // the section to return to when the search is cleared
  std::string context_character_;
  std::uint64_t info_transaction_ = 0;
  bool user_data_loaded_ = false;
  bool categories_loaded_ = false;
  bool updating_sidebar_ = false;

  Gtk::HeaderBar header_;
  Gtk::SearchEntry search_;
  Gtk::MenuButton options_button_;
  Gtk::Popover options_popover_;
  Gtk::Box options_box_{Gtk::Orientation::VERTICAL, 4};
  Gtk::CheckButton close_after_pick_{"Close after picking"};
  Gtk::CheckButton keep_search_{"Keep the search text"};
  Gtk::Box outer_{Gtk::Orientation::VERTICAL};
  Gtk::Box body_{Gtk::Orientation::HORIZONTAL};
  Gtk::ScrolledWindow sidebar_scroll_;
  Gtk::ListBox sidebar_;
  std::vector<std::string> sidebar_ids_;
  CharacterGrid grid_;
  InfoPane info_;
  Gtk::Label status_;
  Gtk::Popover context_menu_;
  Gtk::Box context_box_{Gtk::Orientation::VERTICAL, 6};
  Gtk::Box skin_tone_box_{Gtk::Orientation::HORIZONTAL, 2};
  Gtk::Button favorite_button_;
  sigc::signal<void()> updated_;

  std::unique_ptr<DistributedNotificationObserver> observer_;
  std::thread observer_thread_;
  std::unique_ptr<TaskQueue> glyph_checks_;
  std::unique_ptr<PickerConnection> connection_;
};

}  // namespace lumeris::picker
