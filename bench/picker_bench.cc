// lumeris-picker's two latencies a person feels, with the service already running:
// - LaunchToFirstFrame: from starting the program to its first frame on screen ("first-frame"
//   of --report-startup, timed from this process); `ready_ms` is until the service's data shows.
// - KeystrokeToGrid: from a change of the search text to the grid drawn with its results, one
//   keystroke at a time through everyday words, in a window of this process.
// Needs an X display (scripts/test-env.sh starts one). Goals: p50 under 300 ms and 30 ms.
#include <gtk/gtk.h>
#include <gtkmm/init.h>
#include <stdio.h>

#include <chrono>
#include <cstdlib>
#include <string>
#include <vector>

#include "bench_service.h"
#include "picker/picker_window.h"

namespace lumeris {
namespace {

using Clock = std::chrono::steady_clock;

double Milliseconds(Clock::duration d) { return std::chrono::duration<double, std::milli>(d).count(); }

// Turns the main loop until `condition` holds or 10 s pass.
bool Await(const std::function<bool()>& condition) {
  const auto deadline = Clock::now() + std::chrono::seconds(10);
  const guint tick = g_timeout_add(5, [](gpointer) -> gboolean { return G_SOURCE_CONTINUE; }, nullptr);
  while (!condition() && Clock::now() < deadline) g_main_context_iteration(nullptr, TRUE);
  g_source_remove(tick);
  return condition();
}

void Report(benchmark::State& state, const char* name, std::vector<double> values) {
  std::sort(values.begin(), values.end());
  if (values.empty()) return;
  state.counters[std::string("p50_") + name] = values[values.size() / 2];
  state.counters[std::string("p90_") + name] = values[values.size() * 9 / 10];
}

void LaunchToFirstFrame(benchmark::State& state) {
  BenchService::Get();
  std::vector<double> first_frames;
  std::vector<double> ready;
  for (auto _ : state) {
    const auto start = Clock::now();
    FILE* out = popen(LUMERIS_BENCH_PICKER " --report-startup", "r");
    if (out == nullptr) return state.SkipWithError("cannot start the picker");
    char line[128];
    std::optional<double> first_frame;
    while (fgets(line, sizeof line, out) != nullptr) {
      const std::string text(line);
      if (text.starts_with("first-frame") && !first_frame) first_frame = Milliseconds(Clock::now() - start);
      if (text.starts_with("ready")) ready.push_back(Milliseconds(Clock::now() - start));
    }
    pclose(out);
    if (!first_frame) return state.SkipWithError("the picker showed no frame");
    first_frames.push_back(*first_frame);
    state.SetIterationTime(*first_frame / 1000);
  }
  Report(state, "first_frame_ms", first_frames);
  Report(state, "ready_ms", ready);
}
BENCHMARK(LaunchToFirstFrame)->UseManualTime()->Iterations(15)->Unit(benchmark::kMillisecond);

void KeystrokeToGrid(benchmark::State& state) {
  BenchService::Get();
  picker::PickerWindow window;
  window.present();
  if (!Await([&] { return window.loaded(); })) return state.SkipWithError("the picker did not load");
  bool updated = false;
  bool drawn = false;
  window.signal_updated().connect([&] { updated = true; });
  window.grid().signal_drawn().connect([&] { drawn = updated; });
  const std::vector<std::string> words = {"heart", "star", "smile", "cat", "fire", "water", "hand", "arrow",
                                          "moon", "sun", "face", "flag", "tree", "music", "check"};
  std::vector<double> keystrokes;
  std::size_t word = 0;
  std::size_t typed = 0;
  for (auto _ : state) {
    if (typed == words[word].size()) {
      window.search_entry().set_text("");
      Await([] { return !g_main_context_pending(nullptr); });
      word = (word + 1) % words.size();
      typed = 0;
    }
    ++typed;
    updated = drawn = false;
    const auto start = Clock::now();
    window.search_entry().set_text(words[word].substr(0, typed));
    if (!Await([&] { return drawn; })) return state.SkipWithError("the grid was not redrawn");
    const double elapsed = Milliseconds(Clock::now() - start);
    keystrokes.push_back(elapsed);
    state.SetIterationTime(elapsed / 1000);
  }
  Report(state, "keystroke_ms", keystrokes);
}
BENCHMARK(KeystrokeToGrid)->UseManualTime()->Iterations(200)->Unit(benchmark::kMillisecond);

}  // namespace
}  // namespace lumeris

int main(int argc, char** argv) {
  setenv("LUMERIS_SYSTEM_ROOT", LUMERIS_BENCH_SYSTEM_ROOT, 0);
  if (!gtk_init_check()) {
    fprintf(stderr, "picker_bench: no X display (run it under scripts/test-env.sh)\n");
    return 1;
  }
  Gtk::init_gtkmm_internals();
  benchmark::Initialize(&argc, argv);
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  return 0;
}
