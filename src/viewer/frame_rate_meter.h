// Drawing diagnostics for the panel: a frame-rate meter over a frame counter that the panel
// advances, and a logging entry point that writes nothing.
//
//   lumeris::AdvanceFrameCount();                    // once per frame the panel puts on screen
//   auto meter = lumeris::MeasureFrameRate("grid scroll");
//   ... scroll ...
//   meter();  // logs "grid scroll: updates = 42 over 0.700000 second at 60.000fps"
//
// X11 offers no count of the updates the server has put on the screen, so the count is the
// process's frame counter: the panel calls AdvanceFrameCount() each time it finishes drawing a
// frame (after the cairo flush of its window). Time is the monotonic clock (std::chrono::steady_clock),
// so changes of the wall clock do not disturb a measurement.
//
// Thread-safety: the counter is one atomic; AdvanceFrameCount() and FrameCount() may be called
// from any thread. A meter holds copies of its label, count and time; calling it from several
// threads at once is safe (each call only reads them and writes one log line).
#pragma once

#include <cstdint>
#include <functional>
#include <string>

namespace lumeris {

// Adds one to the process's frame counter (which starts at 0; wraps after 2^64 frames).
void AdvanceFrameCount();
// The process's frame counter now.
uint64_t FrameCount();

// A meter that notes the frame counter and the time now. Each call logs, through the platform
// log, "<label>: updates = <frames> over <seconds> second at <rate>fps" (printf format
// "%s: updates = %llu over %f second at %0.3ffps") with the frames and seconds since the meter
// was made (not since its previous call); rate = frames / seconds with nothing guarding a zero
// time (the line then shows inf or nan). The meter may be called any number of times.
std::function<void()> MeasureFrameRate(std::string label);

// Accepts a printf-style format and its arguments and writes nothing: the panel's debug
// logging, switched off in this build.
void DebugNSLog(const char* format, ...) __attribute__((format(printf, 1, 2)));

}  // namespace lumeris
