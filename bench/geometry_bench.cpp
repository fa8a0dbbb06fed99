// Geometry on 4000x3000 frames: quarter and half turns, scaling, cropping
// and drawing. Yardsticks: BM_Memcpy in image_bench.cpp (a quarter turn
// should stay within three times two frame copies) and BM_MemcpyRows below
// (crop and draw should run at the speed of one memcpy per row).
#include <benchmark/benchmark.h>
#include <string.h>

#include <string>
#include <utility>

#include "bench_util.h"
#include "qkcore/qk_image.h"

namespace {

using namespace qkbench;

QKImage* make_frame(int32_t width, int32_t height, uint32_t format) {
    QKImage* image = QKImage_createNew(width, height, format);
    for (uint64_t i = 0; i < image->size; ++i) image->data[i] = static_cast<uint8_t>(i * 7 + 3);
    if (format == QK_FORMAT_RGBA) {
        for (uint64_t i = 3; i < image->size; i += 4) image->data[i] = 255;  // opaque: the camera case
    }
    return image;
}

void BM_Rotate(benchmark::State& state, uint32_t format, int32_t angle) {
    QuietLog quiet;
    QKImage* image = make_frame(kWidth, kHeight, format);
    for (auto _ : state) {
        const int32_t status = QKImage_rotate(image, angle);
        if (status != QK_OK) {
            state.SkipWithError("QKImage_rotate failed");
            break;
        }
        benchmark::DoNotOptimize(image->data);
        benchmark::ClobberMemory();
    }
    set_rates(state, int64_t{kWidth} * kHeight);
    QKImage_destroy(image);
}
[[maybe_unused]] const bool kRotations = [] {
    for (auto [format, angle] : {std::pair{QK_FORMAT_RGBA, 90}, {QK_FORMAT_RGBA, 180}, {QK_FORMAT_RGBA, 270},
                                 {QK_FORMAT_NV21, 90}}) {
        register_for_format("BM_Rotate", format, "_" + std::to_string(angle), BM_Rotate, angle)
            ->Unit(benchmark::kMillisecond);
    }
    return true;
}();

// The destination's buffer exists before timing: the allocation is the
// caller's, not the resampling's.
void BM_Scale(benchmark::State& state, int32_t width, int32_t height) {
    QuietLog quiet;
    QKImage* source = make_frame(kWidth, kHeight, QK_FORMAT_RGBA);
    QKImage* target = QKImage_createNew(width, height, QK_FORMAT_RGBA);
    memset(target->data, 0, target->size);
    for (auto _ : state) {
        if (QKImage_scale(source, target) != QK_OK) {
            state.SkipWithError("QKImage_scale failed");
            break;
        }
        benchmark::DoNotOptimize(target->data);
        benchmark::ClobberMemory();
    }
    set_rates(state, int64_t{width} * height);
    QKImage_destroy(target);
    QKImage_destroy(source);
}
BENCHMARK_CAPTURE(BM_Scale, rgba_half, kWidth / 2, kHeight / 2)->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_Scale, rgba_double, kWidth * 2, kHeight * 2)->Unit(benchmark::kMillisecond);

// A centred half-size rectangle, into a destination that has its buffer.
void BM_Crop(benchmark::State& state, uint32_t format) {
    QKImage* source = make_frame(kWidth, kHeight, format);
    QKImage* target = QKImage_createNew(kWidth / 2, kHeight / 2, format);
    memset(target->data, 0, target->size);
    for (auto _ : state) {
        if (QKImage_crop(source, target, kWidth / 4, kHeight / 4) != QK_OK) {
            state.SkipWithError("QKImage_crop failed");
            break;
        }
        benchmark::DoNotOptimize(target->data);
        benchmark::ClobberMemory();
    }
    set_rates(state, int64_t{kWidth / 2} * (kHeight / 2), target->size);
    QKImage_destroy(target);
    QKImage_destroy(source);
}
[[maybe_unused]] const bool kCropRegistered = [] {
    for (uint32_t format : {QK_FORMAT_RGBA, QK_FORMAT_NV12}) {
        register_for_format("BM_Crop", format, "_centre_half", BM_Crop)->Unit(benchmark::kMicrosecond);
    }
    return true;
}();

// A half-size picture drawn into the centre of a frame.
void BM_Draw(benchmark::State& state, uint32_t format) {
    QKImage* picture = make_frame(kWidth / 2, kHeight / 2, format);
    QKImage* frame = make_frame(kWidth, kHeight, format);
    for (auto _ : state) {
        if (QKImage_drawImage(picture, frame, kWidth / 4, kHeight / 4) != QK_OK) {
            state.SkipWithError("QKImage_drawImage failed");
            break;
        }
        benchmark::DoNotOptimize(frame->data);
        benchmark::ClobberMemory();
    }
    set_rates(state, int64_t{kWidth / 2} * (kHeight / 2), picture->size);
    QKImage_destroy(frame);
    QKImage_destroy(picture);
}
[[maybe_unused]] const bool kDrawRegistered = [] {
    for (uint32_t format : {QK_FORMAT_RGBA, QK_FORMAT_NV12}) {
        register_for_format("BM_Draw", format, "_centre_half", BM_Draw)->Unit(benchmark::kMicrosecond);
    }
    return true;
}();

// Yardstick for crop and draw: the rows of the centred half-size rectangle
// copied with one plain memcpy each (luma, then chroma rows for NV12).
void BM_MemcpyRows(benchmark::State& state, uint32_t format) {
    QKImage* frame = make_frame(kWidth, kHeight, format);
    QKImage* part = make_frame(kWidth / 2, kHeight / 2, format);
    const bool rgba = format == QK_FORMAT_RGBA;
    const size_t unit = rgba ? 4 : 1;
    const size_t src_stride = kWidth * unit, dst_stride = kWidth / 2 * unit;
    auto copy_rows = [&](const uint8_t* src, uint8_t* dst, int rows) {
        for (int r = 0; r < rows; ++r) memcpy(dst + r * dst_stride, src + r * src_stride, dst_stride);
    };
    for (auto _ : state) {
        copy_rows(frame->data + (kHeight / 4 * kWidth + kWidth / 4) * unit, part->data, kHeight / 2);
        if (!rgba) {
            copy_rows(frame->data + kWidth * kHeight + kHeight / 8 * kWidth + kWidth / 4,
                      part->data + kWidth / 2 * (kHeight / 2), kHeight / 4);
        }
        benchmark::DoNotOptimize(part->data);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * part->size));
    QKImage_destroy(part);
    QKImage_destroy(frame);
}
[[maybe_unused]] const bool kMemcpyRowsRegistered = [] {
    for (uint32_t format : {QK_FORMAT_RGBA, QK_FORMAT_NV12}) {
        register_for_format("BM_MemcpyRows", format, "_centre_half", BM_MemcpyRows)->Unit(benchmark::kMicrosecond);
    }
    return true;
}();

}  // namespace
