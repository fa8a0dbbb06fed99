// Pixel-format conversion through QKImage_convert, one benchmark per kernel
// family at 1920x1080 and 4000x3000. Yardstick: BM_Memcpy in image_bench.cpp.
#include <benchmark/benchmark.h>
#include <string.h>

#include <random>
#include <vector>

#include "bench_util.h"
#include "qkcore/qk_image.h"

namespace {

using namespace qkbench;

QKImage* random_image(int32_t width, int32_t height, uint32_t format) {
    QKImage* image = QKImage_createNew(width, height, format);
    std::mt19937 random(11);
    for (uint64_t i = 0; i < image->size; ++i) image->data[i] = static_cast<uint8_t>(random());
    return image;
}

void BM_Convert(benchmark::State& state, uint32_t from, uint32_t to) {
    const int32_t width = static_cast<int32_t>(state.range(0));
    const int32_t height = static_cast<int32_t>(state.range(1));
    QuietLog quiet;  // the start line of every call is not what we measure
    QKImage* src = random_image(width, height, from);
    QKImage* dst = QKImage_createNew(width, height, to);
    for (auto _ : state) {
        if (QKImage_convert(src, dst) != QK_OK) state.SkipWithError("conversion failed");
        benchmark::DoNotOptimize(dst->data);
        benchmark::ClobberMemory();
    }
    set_rates(state, int64_t{width} * height, dst->size);
    QKImage_destroy(src);
    QKImage_destroy(dst);
}

#define QK_CONVERT_BENCH(name, from, to) BENCHMARK_CAPTURE(BM_Convert, name, from, to)->Apply(frame_sizes)

// RGB to YUV
QK_CONVERT_BENCH(bgra_to_nv12, QK_FORMAT_BGRA, QK_FORMAT_NV12);
QK_CONVERT_BENCH(rgba_to_nv21, QK_FORMAT_RGBA, QK_FORMAT_NV21);
QK_CONVERT_BENCH(rgb8_to_yuvp, QK_FORMAT_RGB8, QK_FORMAT_YUVP);
QK_CONVERT_BENCH(rgba_to_grey, QK_FORMAT_RGBA, QK_FORMAT_GREY);
// YUV to RGB
QK_CONVERT_BENCH(nv21_to_rgba, QK_FORMAT_NV21, QK_FORMAT_RGBA);
QK_CONVERT_BENCH(nv12_to_bgra, QK_FORMAT_NV12, QK_FORMAT_BGRA);
QK_CONVERT_BENCH(yuvp_to_rgb8, QK_FORMAT_YUVP, QK_FORMAT_RGB8);
QK_CONVERT_BENCH(yuyv_to_bgra, QK_FORMAT_YUYV, QK_FORMAT_BGRA);
QK_CONVERT_BENCH(grey_to_bgra, QK_FORMAT_GREY, QK_FORMAT_BGRA);
// YUV layouts
QK_CONVERT_BENCH(nv12_to_nv21, QK_FORMAT_NV12, QK_FORMAT_NV21);
QK_CONVERT_BENCH(nv12_to_yuvp, QK_FORMAT_NV12, QK_FORMAT_YUVP);
QK_CONVERT_BENCH(yuyv_to_nv12, QK_FORMAT_YUYV, QK_FORMAT_NV12);
QK_CONVERT_BENCH(yuvp_to_yuyv, QK_FORMAT_YUVP, QK_FORMAT_YUYV);
// RGB reordering
QK_CONVERT_BENCH(rgba_to_bgra, QK_FORMAT_RGBA, QK_FORMAT_BGRA);
QK_CONVERT_BENCH(rgb8_to_rgba, QK_FORMAT_RGB8, QK_FORMAT_RGBA);
// Same format
QK_CONVERT_BENCH(copy_nv21, QK_FORMAT_NV21, QK_FORMAT_NV21);
QK_CONVERT_BENCH(copy_rgba, QK_FORMAT_RGBA, QK_FORMAT_RGBA);

}  // namespace
