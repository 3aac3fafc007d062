// The lumeris-picker program: its command line and its GTK application.
//
//   lumeris-picker [--application ID] [--identifier ID]
//
// --application names the program the picker works for (its saved state is kept per
// application); --identifier scopes recents, favourites and skin tones. --report-startup prints
// "first-frame" when the window's first frame is on screen and "ready" once the service's data is
// shown, each with the milliseconds since the program started, then quits (for the benchmarks).
//
// Thread-safety: call from the main thread, once.
#pragma once

namespace lumeris::picker {

// Runs the picker until its window closes; the program's exit status.
int RunPickerApplication(int argc, char** argv);

}  // namespace lumeris::picker
