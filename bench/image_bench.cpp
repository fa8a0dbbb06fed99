// Yardsticks for the image core: a plain memcpy of a frame, and cloning.
#include <benchmark/benchmark.h>
#include <string.h>

#include <vector>

#include "qkcore/qk_image.h"

namespace {

constexpr int32_t kWidth = 4000;
constexpr int32_t kHeight = 3000;

void set_frame_counters(benchmark::State& state, uint64_t bytes) {
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * bytes));
    state.counters["Mpixel/s"] = benchmark::Counter(static_cast<double>(state.iterations()) * kWidth * kHeight / 1e6,
                                                    benchmark::Counter::kIsRate);
}

void BM_Memcpy(benchmark::State& state, uint32_t format) {
    const uint64_t bytes = QKImage_requiredSize(kWidth, kHeight, format);
    std::vector<uint8_t> source(bytes, 1), destination(bytes, 0);
    for (auto _ : state) {
        memcpy(destination.data(), source.data(), bytes);
        benchmark::DoNotOptimize(destination.data());
        benchmark::ClobberMemory();
    }
    set_frame_counters(state, bytes);
}
BENCHMARK_CAPTURE(BM_Memcpy, rgba_4000x3000, QK_FORMAT_RGBA)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_Memcpy, nv21_4000x3000, QK_FORMAT_NV21)->Unit(benchmark::kMillisecond);

void BM_Clone(benchmark::State& state, uint32_t format) {
    QKImage* source = QKImage_createNew(kWidth, kHeight, format);
    memset(source->data, 7, source->size);
    for (auto _ : state) {
        QKImage* clone = QKImage_clone(source);
        benchmark::DoNotOptimize(clone->data);
        QKImage_destroy(clone);
    }
    set_frame_counters(state, source->size);
    QKImage_destroy(source);
}
BENCHMARK_CAPTURE(BM_Clone, rgba_4000x3000, QK_FORMAT_RGBA)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_Clone, nv21_4000x3000, QK_FORMAT_NV21)->Unit(benchmark::kMillisecond);

}  // namespace
