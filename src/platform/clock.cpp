#include "platform/clock.h"

#include <time.h>

#include <atomic>

namespace qk::platform {
namespace {

int64_t boottime_nano() {
    timespec now{};
    clock_gettime(CLOCK_BOOTTIME, &now);
    return static_cast<int64_t>(now.tv_sec) * 1000000000 + now.tv_nsec;
}

std::atomic<ClockFn> g_clock{boottime_nano};

}  // namespace

int64_t elapsed_realtime_nano() { return g_clock.load(std::memory_order_relaxed)(); }

void set_clock_for_testing(ClockFn clock) { g_clock.store(clock != nullptr ? clock : boottime_nano); }

}  // namespace qk::platform
