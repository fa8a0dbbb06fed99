// Yardsticks for the image core: a plain memcpy of a frame, and cloning.
#include <benchmark/benchmark.h>
#include <string.h>

#include <vector>

#include "bench_util.h"
#include "qkcore/qk_image.h"

namespace {

using namespace qkbench;

// The yardstick of every frame operation: one plain memcpy of the frame.
void BM_Memcpy(benchmark::State& state, uint32_t format) {
    const int32_t width = static_cast<int32_t>(state.range(0));
    const int32_t height = static_cast<int32_t>(state.range(1));
    const uint64_t bytes = QKImage_requiredSize(width, height, format);
    std::vector<uint8_t> source(bytes, 1), destination(bytes, 0);
    for (auto _ : state) {
        memcpy(destination.data(), source.data(), bytes);
        benchmark::DoNotOptimize(destination.data());
        benchmark::ClobberMemory();
    }
    set_rates(state, int64_t{width} * height, bytes);
}
BENCHMARK_CAPTURE(BM_Memcpy, rgba, QK_FORMAT_RGBA)->Apply(frame_sizes);
BENCHMARK_CAPTURE(BM_Memcpy, nv21, QK_FORMAT_NV21)->Apply(frame_sizes);

void BM_Clone(benchmark::State& state, uint32_t format) {
    QKImage* source = QKImage_createNew(kWidth, kHeight, format);
    memset(source->data, 7, source->size);
    for (auto _ : state) {
        QKImage* clone = QKImage_clone(source);
        benchmark::DoNotOptimize(clone->data);
        QKImage_destroy(clone);
    }
    set_rates(state, int64_t{kWidth} * kHeight, source->size);
    QKImage_destroy(source);
}
BENCHMARK_CAPTURE(BM_Clone, rgba_4000x3000, QK_FORMAT_RGBA)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_Clone, nv21_4000x3000, QK_FORMAT_NV21)->Unit(benchmark::kMillisecond);

}  // namespace
