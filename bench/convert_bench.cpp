// Pixel-format conversion through QKImage_convert, one benchmark per kernel
// family at 1920x1080 and 4000x3000. Yardstick: BM_Convert/memcpy_* below
// (and BM_Memcpy in image_bench.cpp, on warm buffers).
#include <benchmark/benchmark.h>
#include <string.h>

#include <string>

#include "bench_util.h"
#include "qkcore/qk_image.h"

namespace {

using namespace qkbench;

// The caller's frames, cold (FrameRing), and rates per second of wall-clock
// time: what a caller timing its own calls on camera frames sees on the same
// machine.
void BM_Convert(benchmark::State& state, uint32_t from, uint32_t to) {
    const int32_t width = static_cast<int32_t>(state.range(0));
    const int32_t height = static_cast<int32_t>(state.range(1));
    QuietLog quiet;  // the start line of every call is not what we measure
    FrameRing frames(width, height, from, width, height, to);
    for (auto _ : state) {
        if (QKImage_convert(frames.source().image(), frames.target().image()) != QK_OK) {
            state.SkipWithError("conversion failed");
        }
        benchmark::DoNotOptimize(frames.target().data());
        benchmark::ClobberMemory();
        frames.advance();
    }
    set_rates(state, int64_t{width} * height, frames.target().size());
}

// The yardstick of the layout moves, beside them: a plain memcpy of a frame
// of the destination format, on frames as cold ("BM_Convert/memcpy_yuyv").
// A move writes as many bytes and reads no more.
void BM_ConvertMemcpy(benchmark::State& state, uint32_t format) {
    const int32_t width = static_cast<int32_t>(state.range(0));
    const int32_t height = static_cast<int32_t>(state.range(1));
    FrameRing frames(width, height, format, width, height, format);
    for (auto _ : state) {
        memcpy(frames.target().data(), frames.source().data(), frames.target().size());
        benchmark::DoNotOptimize(frames.target().data());
        benchmark::ClobberMemory();
        frames.advance();
    }
    set_rates(state, int64_t{width} * height, frames.target().size());
}

// Named after the formats: "BM_Convert/nv21_to_rgba", "BM_Convert/copy_nv21".
const struct {
    uint32_t from, to;
} kConversions[] = {
    // RGB to YUV
    {QK_FORMAT_BGRA, QK_FORMAT_NV12},
    {QK_FORMAT_RGBA, QK_FORMAT_NV21},
    {QK_FORMAT_RGB8, QK_FORMAT_YUVP},
    {QK_FORMAT_RGBA, QK_FORMAT_GREY},
    // YUV to RGB
    {QK_FORMAT_NV21, QK_FORMAT_RGBA},
    {QK_FORMAT_NV12, QK_FORMAT_BGRA},
    {QK_FORMAT_YUVP, QK_FORMAT_RGB8},
    {QK_FORMAT_YUYV, QK_FORMAT_BGRA},
    {QK_FORMAT_GREY, QK_FORMAT_BGRA},
    // YUV layouts
    {QK_FORMAT_NV12, QK_FORMAT_NV21},
    {QK_FORMAT_NV12, QK_FORMAT_YUVP},
    {QK_FORMAT_YUYV, QK_FORMAT_NV12},
    {QK_FORMAT_YUVP, QK_FORMAT_YUYV},
    // RGB reordering
    {QK_FORMAT_RGBA, QK_FORMAT_BGRA},
    {QK_FORMAT_RGB8, QK_FORMAT_RGBA},
    // Same format
    {QK_FORMAT_NV21, QK_FORMAT_NV21},
    {QK_FORMAT_RGBA, QK_FORMAT_RGBA},
};

[[maybe_unused]] const bool kRegistered = [] {
    for (const auto& c : kConversions) {
        const std::string name = c.from == c.to ? "BM_Convert/copy_" + format_label(c.from)
                                                : "BM_Convert/" + format_label(c.from) + "_to_" + format_label(c.to);
        benchmark::RegisterBenchmark(name.c_str(), BM_Convert, c.from, c.to)->Apply(frame_sizes)->UseRealTime();
    }
    for (uint32_t format : {QK_FORMAT_NV12, QK_FORMAT_YUYV}) {
        const std::string name = "BM_Convert/memcpy_" + format_label(format);
        benchmark::RegisterBenchmark(name.c_str(), BM_ConvertMemcpy, format)->Apply(frame_sizes)->UseRealTime();
    }
    return true;
}();

}  // namespace
