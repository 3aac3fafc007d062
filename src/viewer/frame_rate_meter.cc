#include "viewer/frame_rate_meter.h"

#include <atomic>
#include <chrono>
#include <cstdio>
#include <utility>

#include "platform/log.h"

namespace lumeris {
namespace {

std::atomic<uint64_t> frame_counter{0};

}  // namespace

void AdvanceFrameCount() { frame_counter.fetch_add(1, std::memory_order_relaxed); }

uint64_t FrameCount() { return frame_counter.load(std::memory_order_relaxed); }

std::function<void()> MeasureFrameRate(std::string label) {
  using Clock = std::chrono::steady_clock;
  return [label = std::move(label), count = FrameCount(), start = Clock::now()] {
    const uint64_t updates = FrameCount() - count;
    const double seconds = std::chrono::duration<double>(Clock::now() - start).count();
    const double rate = static_cast<double>(updates) / seconds;
    char numbers[160];
    std::snprintf(numbers, sizeof numbers, ": updates = %llu over %f second at %0.3ffps",
                  static_cast<unsigned long long>(updates), seconds, rate);
    Log(label + numbers);
  };
}

void DebugNSLog(const char*, ...) {}

}  // namespace lumeris
