// JPEG encoding and decoding through the library's exported functions (the
// codec module loaded per call, as a caller gets it), PNG saving, and
// beside them the same work done by TurboJPEG and libpng directly on the
// same frames: the yardsticks. Compare the rates of neighbouring rows; the
// "bytes" counter of the PNG rows gives the file sizes.
#include <benchmark/benchmark.h>
#include <png.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <turbojpeg.h>
#include <unistd.h>

#include <algorithm>
#include <random>
#include <string>
#include <vector>

#include "bench_util.h"
#include "qkcore/qk_image.h"

namespace {

using namespace qkbench;

constexpr int kQuality = 95;

// A camera-like picture: smooth gradients, sensor noise, and sharp edges of
// a few bars and fine lines.
std::vector<uint8_t> camera_rgba(int32_t width, int32_t height) {
    std::vector<uint8_t> rgba(static_cast<size_t>(width) * height * 4);
    std::mt19937 random(5);
    std::uniform_int_distribution<int> noise(-3, 3);
    for (int32_t y = 0; y < height; ++y) {
        for (int32_t x = 0; x < width; ++x) {
            uint8_t* p = &rgba[(static_cast<size_t>(y) * width + x) * 4];
            const bool bar = (x / (width / 16)) % 4 == 1 && y > height / 3 && y < 2 * height / 3;
            const bool line = (y % 64) < 2 && x > width / 2;
            int r = 255 * x / width, g = 255 * y / height, b = 128 + 100 * ((x + y) % 512 < 256 ? 1 : -1) / 2;
            if (bar) r = 240, g = 40, b = 30;
            if (line) r = g = b = 10;
            const int n = noise(random);
            p[0] = static_cast<uint8_t>(std::clamp(r + n, 0, 255));
            p[1] = static_cast<uint8_t>(std::clamp(g + n, 0, 255));
            p[2] = static_cast<uint8_t>(std::clamp(b + n, 0, 255));
            p[3] = 255;
        }
    }
    return rgba;
}

struct Frame {
    Frame(int32_t width, int32_t height) : rgba_bytes(camera_rgba(width, height)) {
        QuietLog quiet;
        rgba = QKImage_createWrap(rgba_bytes.data(), width, height, QK_FORMAT_RGBA, 0, 0);
        nv21 = QKImage_copyAndConvert(rgba, QK_FORMAT_NV21);
        yuvp = QKImage_copyAndConvert(rgba, QK_FORMAT_YUVP);
    }
    ~Frame() {
        QKImage_destroy(rgba);
        QKImage_destroy(nv21);
        QKImage_destroy(yuvp);
    }
    const uint8_t* planes[3];
    const uint8_t** yuvp_planes() {
        const size_t luma = static_cast<size_t>(yuvp->width) * yuvp->height;
        planes[0] = yuvp->data, planes[1] = yuvp->data + luma, planes[2] = yuvp->data + luma + luma / 4;
        return planes;
    }
    std::vector<uint8_t> rgba_bytes;
    QKImage* rgba;
    QKImage* nv21;
    QKImage* yuvp;
};

int32_t width_of(const benchmark::State& state) { return static_cast<int32_t>(state.range(0)); }
int32_t height_of(const benchmark::State& state) { return static_cast<int32_t>(state.range(1)); }

void encode_with_library(benchmark::State& state, uint32_t format) {
    QuietLog quiet;
    Frame frame(width_of(state), height_of(state));
    const QKImage* image = format == QK_FORMAT_NV21 ? frame.nv21 : frame.rgba;
    uint64_t bytes = 0;
    for (auto _ : state) {
        QKImage* jpeg = QKImage_encodeToJpeg(image, kQuality);
        if (jpeg == nullptr) return state.SkipWithError("encoding failed (is the codec module built?)");
        bytes = jpeg->size;
        QKImage_destroy(jpeg);
    }
    set_rates(state, int64_t{frame.rgba->width} * frame.rgba->height);
    state.counters["bytes"] = static_cast<double>(bytes);
}

void BM_EncodeNv21(benchmark::State& state) { encode_with_library(state, QK_FORMAT_NV21); }
void BM_EncodeRgba(benchmark::State& state) { encode_with_library(state, QK_FORMAT_RGBA); }

// What a caller without a YUV encoder does: convert to RGBA, encode that.
void BM_EncodeNv21ThroughRgba(benchmark::State& state) {
    QuietLog quiet;
    Frame frame(width_of(state), height_of(state));
    QKImage* rgba = QKImage_createNew(frame.nv21->width, frame.nv21->height, QK_FORMAT_RGBA);
    for (auto _ : state) {
        QKImage_convert(frame.nv21, rgba);
        QKImage* jpeg = QKImage_encodeToJpeg(rgba, kQuality);
        if (jpeg == nullptr) return state.SkipWithError("encoding failed");
        QKImage_destroy(jpeg);
    }
    set_rates(state, int64_t{rgba->width} * rgba->height);
    QKImage_destroy(rgba);
}

void BM_TurboEncodeYuvPlanes(benchmark::State& state) {
    Frame frame(width_of(state), height_of(state));
    tjhandle handle = tjInitCompress();
    for (auto _ : state) {
        unsigned char* jpeg = nullptr;
        unsigned long size = 0;
        if (tjCompressFromYUVPlanes(handle, frame.yuvp_planes(), frame.yuvp->width, nullptr, frame.yuvp->height,
                                    TJSAMP_420, &jpeg, &size, kQuality, 0) != 0) {
            return state.SkipWithError(tjGetErrorStr2(handle));
        }
        tjFree(jpeg);
    }
    set_rates(state, int64_t{frame.yuvp->width} * frame.yuvp->height);
    tjDestroy(handle);
}

void BM_TurboEncodeRgba(benchmark::State& state) {
    Frame frame(width_of(state), height_of(state));
    tjhandle handle = tjInitCompress();
    for (auto _ : state) {
        unsigned char* jpeg = nullptr;
        unsigned long size = 0;
        if (tjCompress2(handle, frame.rgba->data, frame.rgba->width, 0, frame.rgba->height, TJPF_RGBA, &jpeg, &size,
                        TJSAMP_420, kQuality, 0) != 0) {
            return state.SkipWithError(tjGetErrorStr2(handle));
        }
        tjFree(jpeg);
    }
    set_rates(state, int64_t{frame.rgba->width} * frame.rgba->height);
    tjDestroy(handle);
}

// One 4:2:0 stream of the frame, decoded by every decoding benchmark.
std::vector<uint8_t> frame_stream(Frame& frame) {
    tjhandle handle = tjInitCompress();
    unsigned char* jpeg = nullptr;
    unsigned long size = 0;
    tjCompressFromYUVPlanes(handle, frame.yuvp_planes(), frame.yuvp->width, nullptr, frame.yuvp->height, TJSAMP_420,
                            &jpeg, &size, kQuality, 0);
    std::vector<uint8_t> stream(jpeg, jpeg + size);
    tjFree(jpeg);
    tjDestroy(handle);
    return stream;
}

void decode_with_library(benchmark::State& state, uint32_t format) {
    QuietLog quiet;
    Frame frame(width_of(state), height_of(state));
    const std::vector<uint8_t> stream = frame_stream(frame);
    QKImage* target = QKImage_createEmpty(0, 0, format);
    for (auto _ : state) {
        if (QKImage_decodeFromJpeg(target, stream.data(), stream.size()) != QK_OK) {
            return state.SkipWithError("decoding failed");
        }
        benchmark::DoNotOptimize(target->data);
        QKImage_deallocate(target);
    }
    set_rates(state, int64_t{frame.rgba->width} * frame.rgba->height);
    QKImage_destroy(target);
}

void BM_DecodeToNv21(benchmark::State& state) { decode_with_library(state, QK_FORMAT_NV21); }
void BM_DecodeToRgba(benchmark::State& state) { decode_with_library(state, QK_FORMAT_RGBA); }

void BM_TurboDecodeYuvPlanes(benchmark::State& state) {
    Frame frame(width_of(state), height_of(state));
    const std::vector<uint8_t> stream = frame_stream(frame);
    tjhandle handle = tjInitDecompress();
    std::vector<uint8_t> out(frame.yuvp->size);
    const size_t luma = static_cast<size_t>(frame.yuvp->width) * frame.yuvp->height;
    unsigned char* planes[3] = {out.data(), out.data() + luma, out.data() + luma + luma / 4};
    for (auto _ : state) {
        if (tjDecompressToYUVPlanes(handle, stream.data(), stream.size(), planes, frame.yuvp->width, nullptr,
                                    frame.yuvp->height, 0) != 0) {
            return state.SkipWithError(tjGetErrorStr2(handle));
        }
        benchmark::ClobberMemory();
    }
    set_rates(state, int64_t{frame.yuvp->width} * frame.yuvp->height);
    tjDestroy(handle);
}

// Into one buffer reused by every call, and into a new buffer each call:
// what our decoding hands back (a picture in memory of its own), malloc'ed
// as TurboJPEG's own tjAlloc does. Frames of 32 MB and more come fresh from
// the system each time with glibc, and the pages it zeroes cost about 5 ms
// at 4000x3000; smaller ones are reused from the heap.
void turbo_decode_rgba(benchmark::State& state, bool new_buffer) {
    Frame frame(width_of(state), height_of(state));
    const std::vector<uint8_t> stream = frame_stream(frame);
    tjhandle handle = tjInitDecompress();
    std::vector<uint8_t> reused(new_buffer ? 0 : frame.rgba_bytes.size());
    for (auto _ : state) {
        uint8_t* out = new_buffer ? static_cast<uint8_t*>(malloc(frame.rgba_bytes.size())) : reused.data();
        const int failed = tjDecompress2(handle, stream.data(), stream.size(), out, frame.rgba->width, 0,
                                         frame.rgba->height, TJPF_RGBA, 0);
        benchmark::ClobberMemory();
        if (new_buffer) free(out);
        if (failed != 0) return state.SkipWithError(tjGetErrorStr2(handle));
    }
    set_rates(state, int64_t{frame.rgba->width} * frame.rgba->height);
    tjDestroy(handle);
}

void BM_TurboDecodeRgba(benchmark::State& state) { turbo_decode_rgba(state, false); }
void BM_TurboDecodeRgbaNewBuffer(benchmark::State& state) { turbo_decode_rgba(state, true); }

std::string scratch_png() { return "/tmp/qkcore-bench-" + std::to_string(getpid()) + ".png"; }

long file_bytes(const std::string& path) {
    FILE* file = fopen(path.c_str(), "rb");
    if (file == nullptr) return 0;
    fseek(file, 0, SEEK_END);
    const long bytes = ftell(file);
    fclose(file);
    return bytes;
}

void BM_SavePng(benchmark::State& state) {
    QuietLog quiet;
    Frame frame(width_of(state), height_of(state));
    const std::string path = scratch_png();
    for (auto _ : state) {
        if (QKImage_saveToFile(frame.rgba, path.c_str(), kQuality) != QK_OK) return state.SkipWithError("save failed");
    }
    set_rates(state, int64_t{frame.rgba->width} * frame.rgba->height);
    state.counters["bytes"] = static_cast<double>(file_bytes(path));
    unlink(path.c_str());
}

// libpng with its default settings (zlib level 6, adaptive filtering).
void BM_LibpngDefaultSave(benchmark::State& state) {
    Frame frame(width_of(state), height_of(state));
    const std::string path = scratch_png();
    for (auto _ : state) {
        FILE* file = fopen(path.c_str(), "wb");
        png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
        png_infop info = png_create_info_struct(png);
        png_init_io(png, file);
        png_set_IHDR(png, info, frame.rgba->width, frame.rgba->height, 8, PNG_COLOR_TYPE_RGBA, PNG_INTERLACE_NONE,
                     PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
        png_write_info(png, info);
        for (int32_t y = 0; y < frame.rgba->height; ++y) {
            png_write_row(png, frame.rgba->data + static_cast<size_t>(y) * frame.rgba->width * 4);
        }
        png_write_end(png, nullptr);
        png_destroy_write_struct(&png, &info);
        fclose(file);
    }
    set_rates(state, int64_t{frame.rgba->width} * frame.rgba->height);
    state.counters["bytes"] = static_cast<double>(file_bytes(path));
    unlink(path.c_str());
}

BENCHMARK(BM_EncodeNv21)->Apply(frame_sizes);
BENCHMARK(BM_TurboEncodeYuvPlanes)->Apply(frame_sizes);
BENCHMARK(BM_EncodeNv21ThroughRgba)->Apply(frame_sizes);
BENCHMARK(BM_EncodeRgba)->Apply(frame_sizes);
BENCHMARK(BM_TurboEncodeRgba)->Apply(frame_sizes);
BENCHMARK(BM_DecodeToNv21)->Apply(frame_sizes);
BENCHMARK(BM_TurboDecodeYuvPlanes)->Apply(frame_sizes);
BENCHMARK(BM_DecodeToRgba)->Apply(frame_sizes);
BENCHMARK(BM_TurboDecodeRgba)->Apply(frame_sizes);
BENCHMARK(BM_TurboDecodeRgbaNewBuffer)->Apply(frame_sizes);
BENCHMARK(BM_SavePng)->Apply(frame_sizes);
BENCHMARK(BM_LibpngDefaultSave)->Apply(frame_sizes);

}  // namespace
