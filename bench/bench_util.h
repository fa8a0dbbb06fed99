// Shared by the benchmarks: the frame sizes, the rate counters, and a log
// hook that keeps per-call messages out of what is measured.
#ifndef QKCORE_BENCH_BENCH_UTIL_H
#define QKCORE_BENCH_BENCH_UTIL_H

#include <benchmark/benchmark.h>
#include <stdint.h>

#include "qkcore/qk_log.h"

namespace qkbench {

constexpr int32_t kWidth = 4000;
constexpr int32_t kHeight = 3000;

// Runs a benchmark taking (width, height) arguments at 1920x1080 and 4000x3000.
inline void frame_sizes(benchmark::internal::Benchmark* benchmark) {
    benchmark->Args({1920, 1080})->Args({kWidth, kHeight})->Unit(benchmark::kMillisecond);
}

// "Mpixel/s" for `pixels` per iteration, and bytes per second when given.
inline void set_rates(benchmark::State& state, int64_t pixels, uint64_t bytes = 0) {
    if (bytes != 0) state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * bytes));
    state.counters["Mpixel/s"] = benchmark::Counter(static_cast<double>(state.iterations()) * pixels / 1e6,
                                                    benchmark::Counter::kIsRate);
}

// Silences the library's messages for the scope.
class QuietLog {
public:
    QuietLog() : saved_(HX_LogMsg) { HX_LogMsg = quiet; }
    ~QuietLog() { HX_LogMsg = saved_; }
    QuietLog(const QuietLog&) = delete;
    QuietLog& operator=(const QuietLog&) = delete;

private:
    static int quiet(int, ...) { return 0; }
    QKLogFn saved_;
};

}  // namespace qkbench

#endif  // QKCORE_BENCH_BENCH_UTIL_H
