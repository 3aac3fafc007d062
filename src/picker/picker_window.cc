#include "picker/picker_window.h"

#include <glib.h>
#include <glibmm/markup.h>
#include <gtkmm/cssprovider.h>
#include <gtkmm/eventcontrollerkey.h>
#include <gtkmm/stylecontext.h>
#include <gtkmm/image.h>
#include <gtkmm/separator.h>

#include "categories/category_catalogue.h"
#include "categories/localization_lookup.h"
#include "categories/system_bundles.h"
#include "picker/category_icon.h"
#include "picker/character_items.h"
#include "platform/distributed_notifications.h"
#include "platform/font_coverage.h"
#include "text/utf8.h"
#include "viewer/notification_names.h"

namespace lumeris::picker {
namespace {

// How many search results and related characters are asked for.
constexpr std::uint64_t kSearchLimit = 300;
constexpr std::uint64_t kRelatedLimit = 40;
constexpr int kIconSize = 20;

constexpr char kStyle[] = R"css(
.picker-info-glyph { font-size: 56px; }
.picker-related button { font-size: 20px; min-width: 32px; padding: 2px; }
)css";

void InstallStyle() {
  static const bool installed = [] {
    auto provider = Gtk::CssProvider::create();
    provider->load_from_data(kStyle);
    Gtk::StyleContext::add_provider_for_display(Gdk::Display::get_default(), provider,
                                                GTK_STYLE_PROVIDER_PRIORITY_APPLICATION);
    return true;
  }();
  (void)installed;
}

// Runs `task` on the main loop unless `alive` is gone by then.
MainThreadPoster PosterFor(const std::shared_ptr<bool>& alive) {
  return [weak = std::weak_ptr<bool>(alive)](std::function<void()> task) {
    struct Posted {
      std::weak_ptr<bool> alive;
      std::function<void()> task;
    };
    g_idle_add_full(
        G_PRIORITY_DEFAULT,
        [](gpointer data) -> gboolean {
          auto* posted = static_cast<Posted*>(data);
          if (posted->alive.lock()) posted->task();
          return G_SOURCE_REMOVE;
        },
        new Posted{weak, std::move(task)}, [](gpointer data) { delete static_cast<Posted*>(data); });
  };
}

std::vector<std::string> Strings(const MessageValue* array) {
  std::vector<std::string> strings;
  const MessageValue::Array* elements = array ? array->AsArray() : nullptr;
  for (std::size_t i = 0; elements && i < elements->size(); ++i) {
    if (const std::string* s = (*elements)[i].AsString()) strings.push_back(*s);
  }
  return strings;
}

MessageValue StringArray(const std::vector<std::string>& strings) {
  MessageValue array = MessageValue::MakeArray();
  for (const std::string& s : strings) array.Append(MessageValue::String(s));
  return array;
}

std::string Placeholder(const std::string& section) {
  if (section == kRecentsSection) return "Characters you pick appear here.";
  if (section == kFavoritesSection) return "Right-click a character to add it to your favourites.";
  return "";
}

}  // namespace

PickerWindow::PickerWindow(PickerOptions options)
    : options_(std::move(options)),
      alive_(std::make_shared<bool>(true)),
      glyph_checks_(std::make_unique<TaskQueue>()),
      connection_(std::make_unique<PickerConnection>(options_.service, PosterFor(alive_))) {
  InstallStyle();
  set_title("Characters");
  set_default_size(780, 500);
  BuildHeader();
  BuildBody();
  BuildContextMenu();
  LoadUserData();
  LoadCategories();
  StartObserving();
}

PickerWindow::~PickerWindow() {
  alive_.reset();
  if (observer_) observer_->Stop();
  if (observer_thread_.joinable()) observer_thread_.join();
  connection_.reset();
  glyph_checks_.reset();
  context_menu_.unparent();
}

void PickerWindow::BuildHeader() {
  search_.set_search_delay(0);
  search_.set_hexpand(true);
  search_.property_placeholder_text() = "Search characters";
  search_.set_key_capture_widget(*this);
  search_.signal_changed().connect(sigc::mem_fun(*this, &PickerWindow::OnSearchChanged));
  search_.signal_activate().connect([this] {
    if (grid_.characters().empty()) return;
    Pick(grid_.characters()[grid_.selected().value_or(0)]);
  });
  search_.signal_stop_search().connect([this] {
    if (search_.get_text().empty()) {
      close();
    } else {
      search_.set_text("");
    }
  });
  auto search_keys = Gtk::EventControllerKey::create();
  search_keys->signal_key_pressed().connect(
      [this](guint keyval, guint, Gdk::ModifierType) {
        if (keyval != GDK_KEY_Down && keyval != GDK_KEY_Up) return false;
        grid_.canvas().grab_focus();
        grid_.Move(keyval == GDK_KEY_Down ? GridMove::kDown : GridMove::kUp);
        return true;
      },
      false);
  search_.add_controller(search_keys);

  options_box_.set_margin(8);
  options_box_.append(close_after_pick_);
  options_box_.append(keep_search_);
  close_after_pick_.signal_toggled().connect([this] {
    state_.close_after_pick = close_after_pick_.get_active();
    SaveState();
  });
  keep_search_.signal_toggled().connect([this] {
    state_.keep_search = keep_search_.get_active();
    SaveState();
  });
  options_popover_.set_child(options_box_);
  options_button_.set_icon_name("open-menu-symbolic");
  options_button_.set_tooltip_text("Options");
  options_button_.set_popover(options_popover_);
  header_.set_title_widget(search_);
  header_.pack_end(options_button_);
  set_titlebar(header_);

  auto window_keys = Gtk::EventControllerKey::create();
  window_keys->set_propagation_phase(Gtk::PropagationPhase::CAPTURE);
  window_keys->signal_key_pressed().connect(
      [this](guint keyval, guint, Gdk::ModifierType state) {
        const bool control = (state & Gdk::ModifierType::CONTROL_MASK) == Gdk::ModifierType::CONTROL_MASK;
        if (control && (keyval == GDK_KEY_f || keyval == GDK_KEY_F)) {
          search_.grab_focus();
          return true;
        }
        if (keyval == GDK_KEY_Escape && !search_.has_focus()) {
          if (search_.get_text().empty()) {
            close();
          } else {
            search_.set_text("");
          }
          return true;
        }
        return false;
      },
      false);
  add_controller(window_keys);
  signal_close_request().connect(
      [this] {
        SaveState();
        // The widgets go with the window: replies still on their way are dropped.
        alive_.reset();
        if (observer_) observer_->Stop();
        return false;
      },
      false);
}

void PickerWindow::BuildBody() {
  sidebar_.set_selection_mode(Gtk::SelectionMode::SINGLE);
  sidebar_.add_css_class("navigation-sidebar");
  sidebar_.signal_row_selected().connect([this](Gtk::ListBoxRow* row) {
    if (updating_sidebar_ || row == nullptr) return;
    const auto index = static_cast<std::size_t>(row->get_index());
    if (index < sidebar_ids_.size()) ShowSection(sidebar_ids_[index]);
  });
  sidebar_scroll_.set_child(sidebar_);
  sidebar_scroll_.set_policy(Gtk::PolicyType::NEVER, Gtk::PolicyType::AUTOMATIC);
  sidebar_scroll_.set_size_request(190, -1);
  body_.append(sidebar_scroll_);
  body_.append(*Gtk::make_managed<Gtk::Separator>(Gtk::Orientation::VERTICAL));
  body_.append(grid_);
  body_.append(*Gtk::make_managed<Gtk::Separator>(Gtk::Orientation::VERTICAL));
  body_.append(info_);
  body_.set_vexpand(true);
  grid_.signal_picked().connect([this](std::size_t index) { Pick(grid_.characters()[index]); });
  grid_.signal_selection_changed().connect(sigc::mem_fun(*this, &PickerWindow::OnSelectionChanged));
  grid_.signal_context_menu().connect(sigc::mem_fun(*this, &PickerWindow::OpenContextMenu));
  info_.signal_related_picked().connect(sigc::mem_fun(*this, &PickerWindow::Pick));
  status_.set_xalign(0);
  status_.set_margin_start(12);
  status_.set_margin_end(12);
  status_.set_margin_top(4);
  status_.set_margin_bottom(4);
  status_.add_css_class("dim-label");
  outer_.append(body_);
  outer_.append(*Gtk::make_managed<Gtk::Separator>(Gtk::Orientation::HORIZONTAL));
  outer_.append(status_);
  set_child(outer_);
  RebuildSidebar();
  grid_.SetCharacters({}, "Loading…");
}

void PickerWindow::BuildContextMenu() {
  favorite_button_.add_css_class("flat");
  favorite_button_.signal_clicked().connect([this] {
    context_menu_.popdown();
    ToggleFavorite(context_character_);
  });
  context_box_.set_margin(4);
  context_box_.append(skin_tone_box_);
  context_box_.append(favorite_button_);
  context_menu_.set_child(context_box_);
  context_menu_.set_parent(grid_.canvas());
  context_menu_.set_has_arrow(true);
}

MessageValue PickerWindow::StoreRequest(const char* command) const {
  MessageValue request = MessageValue::MakeDictionary();
  request.Set("command", MessageValue::String(command));
  request.Set("identifier", MessageValue::String(options_.identifier));
  return request;
}

void PickerWindow::LoadUserData() {
  MessageValue request = StoreRequest("read_recents_favorites");
  request.Set("application", MessageValue::String(options_.application));
  connection_->Request(std::move(request), [this](std::optional<MessageValue> reply) {
    if (!reply) {
      SetStatus("The character service cannot be reached.");
      return;
    }
    model_.SetUserData(*reply);
    if (!user_data_loaded_) {
      user_data_loaded_ = true;
      state_ = ParsePickerState(reply->GetData("state"), &state_others_);
      ApplyState(state_);
    }
    RefreshGrid();
  });
}

void PickerWindow::LoadCategories() {
  // The category names come from the bundle's "Categories" list, read off the main thread.
  glyph_checks_->Post([this, post = PosterFor(alive_)] {
    // The emoji test and the glyph checks need the project's font configuration; loading it
    // here keeps it off the way to the first frame.
    LoadLumerisFontConfiguration();
    std::vector<std::string> names;
    if (const std::optional<Bundle> application = OpenApplicationBundle()) {
      for (const CategoryGroup& group :
           ReadAvailableCategories(*application, PreferredLocalizationOfBundle(&*application))) {
        names.insert(names.end(), group.categories.begin(), group.categories.end());
      }
    }
    // The emoji come first.
    std::erase(names, std::string(kEmojiCategoryName));
    names.insert(names.begin(), std::string(kEmojiCategoryName));
    post([this, names = std::move(names)] {
      MessageValue request = MessageValue::MakeDictionary();
      request.Set("command", MessageValue::String("read_categorydata"));
      request.Set("categories", StringArray(names));
      connection_->Request(std::move(request), [this, names](std::optional<MessageValue> reply) {
        if (!reply) return;
        model_.SetCategories(names, reply->Find("result"));
        categories_loaded_ = true;
        RebuildSidebar();
        const std::string wanted = !state_.category.empty() ? state_.category : shown_section_;
        if (!search_.get_text().empty()) {
          updated_.emit();
        } else if (!ShowSection(wanted) && !ShowSection(model_.sections().size() > 2 && model_.sections()[0].characters.empty()
                                                              ? model_.sections()[2].id
                                                              : std::string(kRecentsSection))) {
          updated_.emit();
        }
      });
    });
  });
}

void PickerWindow::ApplyState(const PickerState& state) {
  if (state.window_width > 0 && state.window_height > 0) set_default_size(state.window_width, state.window_height);
  close_after_pick_.set_active(state.close_after_pick);
  keep_search_.set_active(state.keep_search);
  if (state.keep_search && !state.search_text.empty() && search_.get_text().empty()) {
    search_.set_text(state.search_text);
  } else if (!state.category.empty()) {
    ShowSection(state.category);
  } else if (shown_section_.empty() && search_.get_text().empty()) {
    ShowSection(std::string(kRecentsSection));
  }
}

void PickerWindow::SaveState() {
  // Nothing read yet (do not overwrite the stored state), or already saved on closing.
  if (!user_data_loaded_ || !alive_) return;
  state_.category = last_section_;
  state_.window_width = get_width() > 0 ? get_width() : state_.window_width;
  state_.window_height = get_height() > 0 ? get_height() : state_.window_height;
  state_.search_text = search_.get_text();
  const std::string json = PickerStateJson(state_, state_others_);
  MessageValue request = MessageValue::MakeDictionary();
  request.Set("command", MessageValue::String("save_state"));
  request.Set("data", MessageValue::DataFromBytes(json));
  request.Set("application", MessageValue::String(options_.application));
  connection_->Send(std::move(request));
}

void PickerWindow::RebuildSidebar() {
  updating_sidebar_ = true;
  while (Gtk::Widget* child = sidebar_.get_first_child()) sidebar_.remove(*child);
  sidebar_ids_.clear();
  const Gdk::RGBA color = sidebar_.get_style_context()->get_color();
  const RGBAColor tint{color.get_red(), color.get_green(), color.get_blue(), 0.85};
  for (const Section& section : model_.sections()) {
    auto* row = Gtk::make_managed<Gtk::Box>(Gtk::Orientation::HORIZONTAL, 8);
    row->set_margin_start(4);
    auto* image = Gtk::make_managed<Gtk::Image>();
    image->set_pixel_size(kIconSize);
    if (section.id == kRecentsSection) {
      image->set_from_icon_name("document-open-recent-symbolic");
    } else if (section.id == kFavoritesSection) {
      image->set_from_icon_name("starred-symbolic");
    } else if (Glib::RefPtr<Gdk::Texture> texture = CategoryIconTexture(section.icon, kIconSize, tint)) {
      image->set(texture);
    }
    row->append(*image);
    auto* label = Gtk::make_managed<Gtk::Label>(section.title);
    label->set_xalign(0);
    label->set_ellipsize(Pango::EllipsizeMode::END);
    row->append(*label);
    sidebar_.append(*row);
    sidebar_ids_.push_back(section.id);
  }
  for (std::size_t i = 0; i < sidebar_ids_.size(); ++i) {
    if (sidebar_ids_[i] == shown_section_) sidebar_.select_row(*sidebar_.get_row_at_index(static_cast<int>(i)));
  }
  updating_sidebar_ = false;
}

bool PickerWindow::ShowSection(const std::string& id) {
  const std::optional<std::size_t> index = model_.SectionIndex(id);
  if (!index) return false;
  shown_section_ = id;
  last_section_ = id;
  if (!search_.get_text().empty()) {
    updating_sidebar_ = true;
    search_.set_text("");
    updating_sidebar_ = false;
  }
  updating_sidebar_ = true;
  if (Gtk::ListBoxRow* row = sidebar_.get_row_at_index(static_cast<int>(*index))) sidebar_.select_row(*row);
  updating_sidebar_ = false;
  const Section& section = model_.sections()[*index];
  if (section.check_glyph) {
    // Characters without a glyph in any font like the default one are left out; checking a
    // large category takes a moment, so it runs off the main thread.
    grid_.SetCharacters({}, "Loading…");
    glyph_checks_->Post([this, id, characters = section.characters, post = PosterFor(alive_)] {
      std::vector<std::string> drawn;
      for (const std::string& c : characters) {
        if (DefaultLikeFontDrawsString(DecodeUtf8Lenient(c))) drawn.push_back(c);
      }
      post([this, id, drawn = std::move(drawn)]() mutable {
        if (const std::optional<std::size_t> at = model_.SectionIndex(id)) {
          model_.SetCheckedCharacters(*at, std::move(drawn));
        }
        if (shown_section_ == id) RefreshGrid();
      });
    });
    return true;
  }
  RefreshGrid();
  SaveState();
  return true;
}

void PickerWindow::RefreshGrid() {
  if (shown_section_.empty()) return;  // search results stay until the next reply
  const std::optional<std::size_t> index = model_.SectionIndex(shown_section_);
  if (!index || model_.sections()[*index].check_glyph) return;
  std::vector<std::string> characters = model_.DisplayedCharacters(*index);
  if (characters == grid_.characters()) {
    updated_.emit();
    return;
  }
  const bool same_section = characters.size() == grid_.characters().size() && *index >= 2;
  if (same_section) {
    grid_.ReplaceCharacters(std::move(characters));
  } else {
    grid_.SetCharacters(std::move(characters), Placeholder(shown_section_));
  }
  updated_.emit();
}

void PickerWindow::OnSearchChanged() {
  if (updating_sidebar_) return;
  const std::string text = search_.get_text();
  if (text.empty()) {
    searches_.TextChanged("");
    if (shown_section_.empty()) {
      shown_section_ = last_section_.empty() ? std::string(kRecentsSection) : last_section_;
      grid_.SetCharacters({});
      RefreshGrid();
    }
    return;
  }
  if (!shown_section_.empty()) {
    shown_section_.clear();
    updating_sidebar_ = true;
    sidebar_.unselect_all();
    updating_sidebar_ = false;
  }
  if (std::optional<SearchRequests::Search> search = searches_.TextChanged(text)) SendSearch(*search);
}

void PickerWindow::SendSearch(const SearchRequests::Search& search) {
  MessageValue request = MessageValue::MakeDictionary();
  request.Set("command", MessageValue::String("search_matched_chars"));
  request.Set("string", MessageValue::String(search.text));
  request.Set("limit", MessageValue::Uint64(kSearchLimit));
  request.Set("transactionID", MessageValue::Uint64(search.transaction));
  connection_->Request(std::move(request), [this, search](std::optional<MessageValue> reply) {
    // A reply that lost its transaction (or none at all) still ends the search in flight.
    const std::uint64_t transaction = reply ? reply->GetUint64("transactionID") : search.transaction;
    const SearchRequests::Outcome outcome = searches_.ReplyArrived(transaction);
    if (outcome.show) {
      std::vector<std::string> results;
      for (const std::string& c : Strings(reply ? reply->Find("result") : nullptr)) {
        results.push_back(model_.Displayed(c));
      }
      grid_.SetCharacters(std::move(results), "No characters match “" + search.text + "”.");
      if (!grid_.characters().empty()) grid_.Select(0);
      updated_.emit();
    }
    if (outcome.next) SendSearch(*outcome.next);
  });
}

void PickerWindow::OnSelectionChanged(std::size_t index) {
  if (index >= grid_.characters().size()) return;
  const std::string character = grid_.characters()[index];
  info_.ShowCharacter(character);
  const std::uint64_t transaction = ++info_transaction_;
  MessageValue info = MessageValue::MakeDictionary();
  info.Set("command", MessageValue::String("search_character_info"));
  info.Set("string", MessageValue::String(character));
  info.Set("transactionID", MessageValue::Uint64(transaction));
  connection_->Request(std::move(info), [this, transaction](std::optional<MessageValue> reply) {
    if (reply && reply->GetUint64("transactionID") == info_transaction_ && transaction == info_transaction_) {
      info_.ShowRecord(reply->Find("result"));
    }
  });
  MessageValue related = MessageValue::MakeDictionary();
  related.Set("command", MessageValue::String("search_related_chars"));
  related.Set("string", MessageValue::String(character));
  related.Set("limit", MessageValue::Uint64(kRelatedLimit));
  related.Set("transactionID", MessageValue::Uint64(transaction));
  connection_->Request(std::move(related), [this, transaction](std::optional<MessageValue> reply) {
    if (reply && reply->GetUint64("transactionID") == info_transaction_ && transaction == info_transaction_) {
      info_.ShowRelated(reply->Find("result"));
      updated_.emit();
    }
  });
}

void PickerWindow::Pick(const std::string& character) {
  if (character.empty()) return;
  get_clipboard()->set_text(character);
  MessageValue request = StoreRequest("add");
  request.Set("target", MessageValue::String("recents"));
  request.Set("item", MessageValue::String(EntityIDForCharacter(character)));
  connection_->Send(std::move(request));
  SetStatus(character + "  copied to the clipboard");
  if (state_.close_after_pick) close();
}

std::vector<Gtk::Button*> PickerWindow::skin_tone_buttons() {
  std::vector<Gtk::Button*> buttons;
  for (Gtk::Widget* child = skin_tone_box_.get_first_child(); child; child = child->get_next_sibling()) {
    if (auto* button = dynamic_cast<Gtk::Button*>(child)) buttons.push_back(button);
  }
  return buttons;
}

void PickerWindow::OpenContextMenu(std::size_t index) {
  if (index >= grid_.characters().size()) return;
  context_character_ = grid_.characters()[index];
  while (Gtk::Widget* child = skin_tone_box_.get_first_child()) skin_tone_box_.remove(*child);
  const std::vector<std::string> variants = SkinToneVariants(context_character_);
  for (const std::string& variant : variants) {
    auto* button = Gtk::make_managed<Gtk::Button>();
    auto* label = Gtk::make_managed<Gtk::Label>();
    label->set_markup("<span size=\"xx-large\">" + Glib::Markup::escape_text(variant) + "</span>");
    button->set_child(*label);
    button->add_css_class("flat");
    if (variant == context_character_) button->add_css_class("suggested-action");
    button->signal_clicked().connect([this, variant] { ChooseSkinTone(variant); });
    skin_tone_box_.append(*button);
  }
  skin_tone_box_.set_visible(!variants.empty());
  // Favourites keep what was picked; a toned emoji is a favourite of its own.
  favorite_button_.set_label(model_.IsFavorite(context_character_) ? "Remove from Favourites" : "Add to Favourites");
  context_menu_.set_pointing_to(grid_.CellRectangle(index));
  context_menu_.popup();
}

void PickerWindow::ChooseSkinTone(const std::string& variant) {
  context_menu_.popdown();
  MessageValue request = StoreRequest("set_skintone");
  request.Set("item", MessageValue::String(EntityIDForCharacter(variant)));
  connection_->Send(std::move(request));
  model_.RememberSkinTone(variant);
  if (shown_section_.empty()) {
    std::vector<std::string> shown = grid_.characters();
    for (std::string& c : shown) c = model_.Displayed(SkinToneVariants(c).empty() ? c : SkinToneVariants(c)[0]);
    grid_.ReplaceCharacters(std::move(shown));
  } else {
    RefreshGrid();
  }
  Pick(variant);
}

void PickerWindow::ToggleFavorite(const std::string& character) {
  const bool adding = !model_.IsFavorite(character);
  MessageValue request = StoreRequest("set");
  request.Set("target", MessageValue::String("favorites"));
  request.Set("array", StringArray(model_.FavoriteIDsToggling(character)));
  // The service does not announce favourites: once it has stored them, tell every picker.
  connection_->SendConfirmed(std::move(request),
                             [] { PostDistributedNotification(kLMLumerisRecentsChangedNotification); });
  SetStatus(character + (adding ? "  added to Favourites" : "  removed from Favourites"));
}

void PickerWindow::SetStatus(const std::string& text) { status_.set_text(text); }

void PickerWindow::StartObserving() {
  observer_ = DistributedNotificationObserver::Open(std::string(kLMLumerisRecentsChangedNotification));
  if (!observer_) {
    SetStatus("No session bus: changes made by other programs show after a restart.");
    return;
  }
  observer_thread_ = std::thread([this, post = PosterFor(alive_)] {
    observer_->Run([this, &post](const DistributedNotification&) { post([this] { LoadUserData(); }); });
  });
}

}  // namespace lumeris::picker
