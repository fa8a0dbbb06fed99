// Shared by the benchmarks: the frame sizes, the rate counters, names from
// the format table, and a log hook that keeps per-call messages out of what
// is measured.
#ifndef QKCORE_BENCH_BENCH_UTIL_H
#define QKCORE_BENCH_BENCH_UTIL_H

#include <benchmark/benchmark.h>
#include <ctype.h>
#include <stdint.h>

#include <string>

#include "image/format.h"
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

// A format as benchmark names show it: its name in the table, lower case.
inline std::string format_label(uint32_t format) {
    const qk::FormatInfo* info = qk::find_format(format);
    std::string label = info != nullptr ? info->name : "unknown";
    for (char& c : label) c = static_cast<char>(tolower(static_cast<unsigned char>(c)));
    return label;
}

// Registers fn(state, format, args...) as "<name>/<format label><suffix>".
template <typename Fn, typename... Args>
benchmark::internal::Benchmark* register_for_format(const char* name, uint32_t format, const std::string& suffix,
                                                    Fn fn, Args... args) {
    const std::string full = std::string(name) + "/" + format_label(format) + suffix;
    return benchmark::RegisterBenchmark(full.c_str(), fn, format, args...);
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
