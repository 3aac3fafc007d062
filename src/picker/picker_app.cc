#include "picker/picker_app.h"

#include <CLI/CLI.hpp>
#include <gdkmm/frameclock.h>
#include <glibmm/main.h>
#include <gtkmm/application.h>

#include <chrono>
#include <cstdio>
#include <memory>

#include "picker/picker_window.h"

namespace lumeris::picker {
namespace {

double MillisecondsSince(std::chrono::steady_clock::time_point start) {
  return std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - start).count();
}

// Prints the startup milestones of `window` and quits once it is ready.
void ReportStartup(PickerWindow& window, std::chrono::steady_clock::time_point start) {
  static std::chrono::steady_clock::time_point started;
  started = start;
  window.signal_realize().connect([&window] {
    // After the frame clock's paint phase the first frame has been handed to the display.
    g_signal_connect(window.get_frame_clock()->gobj(), "after-paint", G_CALLBACK(+[](GdkFrameClock* clock, gpointer) {
                       std::printf("first-frame %.1f\n", MillisecondsSince(started));
                       std::fflush(stdout);
                       g_signal_handlers_disconnect_matched(clock, G_SIGNAL_MATCH_DATA, 0, 0, nullptr, nullptr,
                                                            &started);
                     }),
                     &started);
  });
  window.signal_updated().connect([&window] {
    static bool reported = false;
    if (reported || !window.loaded()) return;
    reported = true;
    std::printf("ready %.1f\n", MillisecondsSince(started));
    std::fflush(stdout);
    Glib::signal_idle().connect_once([&window] { window.close(); });
  });
}

}  // namespace

int RunPickerApplication(int argc, char** argv) {
  const auto start = std::chrono::steady_clock::now();
  PickerOptions options;
  bool report_startup = false;
  CLI::App cli("lumeris-picker: pick emoji and symbols; the pick is copied to the clipboard", "lumeris-picker");
  cli.add_option("--application", options.application, "the program the picker works for (saved state)");
  cli.add_option("--identifier", options.identifier, "the storage identifier of recents, favourites and skin tones");
  cli.add_flag("--report-startup", report_startup, "print startup times and quit once ready");
  CLI11_PARSE(cli, argc, argv);

  auto app = Gtk::Application::create("com.vantorel.LumerisPicker", Gio::Application::Flags::NON_UNIQUE);
  std::unique_ptr<PickerWindow> window;
  app->signal_activate().connect([&] {
    window = std::make_unique<PickerWindow>(options);
    if (report_startup) ReportStartup(*window, start);
    app->add_window(*window);
    window->present();
  });
  char* program[] = {argv[0], nullptr};
  const int status = app->run(1, program);
  window.reset();
  return status;
}

}  // namespace lumeris::picker
