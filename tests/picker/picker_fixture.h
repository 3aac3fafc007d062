// PickerTest: a real file service in an isolated user environment (ServiceTest) and real picker
// windows on the test run's X server. Await() turns the GLib main loop until a condition holds,
// so tests wait for events, never for time. Tests skip when no display can be opened.
// Not thread-safe: each object belongs to the test's thread.
#pragma once

#include <gtk/gtk.h>
#include <gtkmm/init.h>

#include <chrono>
#include <functional>
#include <memory>

#include "picker/picker_window.h"
#include "support/service_fixture.h"

namespace lumeris::testing {

class PickerTest : public ServiceTest {
 protected:
  void SetUp() override {
    static const bool display = [] {
      // Drawing with cairo, not OpenGL: the GL driver that GDK would load under the virtual X
      // server is software-only there, and it leaves an allocation behind when it is unloaded.
      setenv("GDK_DEBUG", "gl-disable", 0);
      setenv("GSK_RENDERER", "cairo", 0);
      if (!gtk_init_check()) return false;
      Gtk::init_gtkmm_internals();
      return true;
    }();
    if (!display) GTEST_SKIP() << "no X display (run under scripts/test-env.sh)";
    ServiceTest::SetUp();
  }

  // A picker window on the running service, shown, with its data loaded.
  std::unique_ptr<picker::PickerWindow> OpenPicker() {
    picker::PickerOptions options;
    options.application = "com.example.PickerTest";
    options.service.start_on_demand = false;
    auto window = std::make_unique<picker::PickerWindow>(options);
    window->present();
    picker::PickerWindow* shown = window.get();
    EXPECT_TRUE(Await([shown] { return shown->loaded(); })) << "the picker did not load its data";
    return window;
  }

  // Turns the main loop until `condition` holds; false after `timeout`.
  static bool Await(const std::function<bool()>& condition, std::chrono::seconds timeout = std::chrono::seconds(20)) {
    const auto deadline = std::chrono::steady_clock::now() + timeout;
    // Wakes the loop now and then, so the condition is looked at even when nothing happens.
    const guint tick = g_timeout_add(25, [](gpointer) -> gboolean { return G_SOURCE_CONTINUE; }, nullptr);
    bool met = condition();
    while (!met && std::chrono::steady_clock::now() < deadline) {
      g_main_context_iteration(nullptr, TRUE);
      met = condition();
    }
    g_source_remove(tick);
    return met;
  }

  // The index of `character` in the picker's grid, or -1.
  static long CellOf(picker::PickerWindow& window, const std::string& character) {
    const auto& cells = window.grid().characters();
    for (std::size_t i = 0; i < cells.size(); ++i) {
      if (cells[i] == character) return static_cast<long>(i);
    }
    return -1;
  }

  // Types `text` into the search field and waits until the grid starts with `first`.
  static bool SearchFor(picker::PickerWindow& window, const std::string& text, const std::string& first) {
    window.search_entry().set_text(text);
    return Await([&] { return !window.grid().characters().empty() && window.grid().characters()[0] == first; });
  }
};

}  // namespace lumeris::testing
