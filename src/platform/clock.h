// The platform's boot-time clock.
#ifndef QKCORE_SRC_PLATFORM_CLOCK_H
#define QKCORE_SRC_PLATFORM_CLOCK_H

#include <stdint.h>

namespace qk::platform {

// Nanoseconds since boot: monotonic, and counting while the device sleeps.
int64_t elapsed_realtime_nano();

// Replaces the clock (tests drive timing probes with it); null restores it.
using ClockFn = int64_t (*)();
void set_clock_for_testing(ClockFn clock);

}  // namespace qk::platform

#endif  // QKCORE_SRC_PLATFORM_CLOCK_H
