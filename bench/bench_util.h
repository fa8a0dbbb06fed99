// Shared by the benchmarks: the frame sizes, the rate counters, names from
// the format table, and a log hook that keeps per-call messages out of what
// is measured.
#ifndef QKCORE_BENCH_BENCH_UTIL_H
#define QKCORE_BENCH_BENCH_UTIL_H

#include <benchmark/benchmark.h>
#include <ctype.h>
#include <stdint.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "image/format.h"
#include "qkcore/qk_image.h"
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

// A frame as a caller hands it over: a plain malloc'ed buffer, without the
// large-page hint the library gives its own frame-sized buffers, every page
// written before timing, wrapped so that the library never frees it. With
// `noise`, the same seeded bytes in every benchmark, alpha opaque as a
// camera's; otherwise zeros.
class CallerFrame {
public:
    CallerFrame(int32_t width, int32_t height, uint32_t format, bool noise)
        : bytes_(QKImage_requiredSize(width, height, format)), data_(static_cast<uint8_t*>(malloc(bytes_))) {
        memset(data_, 0, bytes_);
        if (noise) {
            std::mt19937 random(11);
            for (uint64_t i = 0; i < bytes_; i += 4) {
                const uint32_t word = random();
                memcpy(data_ + i, &word, std::min<uint64_t>(4, bytes_ - i));
            }
            const qk::FormatInfo* info = qk::find_format(format);
            if (info != nullptr && info->family == qk::FormatFamily::kRgb && info->rgb.aOffset >= 0) {
                for (uint64_t i = info->rgb.aOffset; i < bytes_; i += 4) data_[i] = 255;
            }
        }
        image_ = QKImage_createWrap(data_, width, height, format, static_cast<int32_t>(bytes_), 0);
    }
    ~CallerFrame() {
        QKImage_destroy(image_);
        free(data_);
    }
    CallerFrame(const CallerFrame&) = delete;
    CallerFrame& operator=(const CallerFrame&) = delete;

    QKImage* image() const { return image_; }
    uint8_t* data() const { return data_; }
    uint64_t size() const { return bytes_; }

private:
    uint64_t bytes_;
    uint8_t* data_;
    QKImage* image_ = nullptr;
};

// The source and destination frames of a benchmark that makes one call per
// frame: as many pairs as fill 64 MiB (twice this machine's last-level
// cache), taken in turn, so that each call meets its frames cold, as it does
// a camera's, never left in the caches by the call before.
class FrameRing {
public:
    FrameRing(int32_t width, int32_t height, uint32_t from, int32_t out_width, int32_t out_height, uint32_t to) {
        constexpr uint64_t kColdBytes = uint64_t{64} << 20;
        const uint64_t pair = QKImage_requiredSize(width, height, from) + QKImage_requiredSize(out_width, out_height, to);
        for (uint64_t filled = 0; filled < kColdBytes; filled += pair) {
            sources_.push_back(std::make_unique<CallerFrame>(width, height, from, /*noise=*/true));
            targets_.push_back(std::make_unique<CallerFrame>(out_width, out_height, to, /*noise=*/false));
        }
    }

    CallerFrame& source() const { return *sources_[next_]; }
    CallerFrame& target() const { return *targets_[next_]; }
    void advance() { next_ = (next_ + 1) % sources_.size(); }

private:
    std::vector<std::unique_ptr<CallerFrame>> sources_, targets_;
    size_t next_ = 0;
};

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
