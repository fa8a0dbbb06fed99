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

[[maybe_unused]] const bool kRegistered = [] {
    for (uint32_t format : {QK_FORMAT_RGBA, QK_FORMAT_NV21}) {
        register_for_format("BM_Memcpy", format, "", BM_Memcpy)->Apply(frame_sizes);
        register_for_format("BM_Clone", format, "_4000x3000", BM_Clone)->Unit(benchmark::kMillisecond);
    }
    return true;
}();

}  // namespace
