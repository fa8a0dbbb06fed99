// Our conversions, quarter turns and scaling beside libyuv's, the yardstick,
// on the same frames at 1920x1080 and 4000x3000: "BM_Yuv/<operation>/ours/W/H"
// next to "BM_Yuv/<operation>/libyuv/W/H". Both sides run single-threaded on
// the caller's plain malloc'ed buffers, cold as a camera's (FrameRing), ours
// wrapped and reached through the exported functions, nothing allocated per
// call. Rates
// are per second of CPU time, which other work on a shared machine disturbs
// less than the wall-clock rates of BM_Convert. libyuv works in limited
// range and rounds its own way: compare speed only. bench/ratios.sh prints
// the pairs as a table.
//
// libyuv names its packed formats after a 32-bit word, so its bytes in
// memory run the other way: libyuv ARGB is our BGRA, ABGR our RGBA, RAW our
// RGB8 and I420 our YUVP.
#include <benchmark/benchmark.h>
#include <libyuv.h>

#include <string>

#include "bench_util.h"
#include "qkcore/qk_image.h"

namespace {

using namespace qkbench;

enum class Kind { kConvert, kRotate, kScale };

// libyuv's call for one operation: the source of width x height and the
// destination of out_width x out_height, each in our contiguous layout
// (4:2:0 chroma right after the luma plane).
using LibyuvCall = int (*)(const uint8_t* src, int width, int height, uint8_t* dst, int out_width,
                           int out_height);

struct Operation {
    const char* name;
    Kind kind;
    uint32_t from, to;  // our formats; a turn or a scale keeps its format
    int scale_num, scale_den;
    LibyuvCall libyuv;
};

// libyuv's plane pointers into our contiguous 4:2:0 layouts.
uint8_t* chroma(uint8_t* frame, int width, int height) { return frame + static_cast<size_t>(width) * height; }
const uint8_t* chroma(const uint8_t* frame, int width, int height) {
    return frame + static_cast<size_t>(width) * height;
}
uint8_t* second_plane(uint8_t* frame, int width, int height) {
    return chroma(frame, width, height) + static_cast<size_t>(width / 2) * (height / 2);
}
const uint8_t* second_plane(const uint8_t* frame, int width, int height) {
    return chroma(frame, width, height) + static_cast<size_t>(width / 2) * (height / 2);
}

const Operation kOperations[] = {
    // RGB to YUV
    {"bgra_to_nv12", Kind::kConvert, QK_FORMAT_BGRA, QK_FORMAT_NV12, 1, 1,
     [](const uint8_t* s, int w, int h, uint8_t* d, int, int) {
         return libyuv::ARGBToNV12(s, w * 4, d, w, chroma(d, w, h), w, w, h);
     }},
    {"rgba_to_nv21", Kind::kConvert, QK_FORMAT_RGBA, QK_FORMAT_NV21, 1, 1,
     [](const uint8_t* s, int w, int h, uint8_t* d, int, int) {
         return libyuv::ABGRToNV21(s, w * 4, d, w, chroma(d, w, h), w, w, h);
     }},
    {"rgb8_to_yuvp", Kind::kConvert, QK_FORMAT_RGB8, QK_FORMAT_YUVP, 1, 1,
     [](const uint8_t* s, int w, int h, uint8_t* d, int, int) {
         return libyuv::RAWToI420(s, w * 3, d, w, chroma(d, w, h), w / 2, second_plane(d, w, h), w / 2, w, h);
     }},
    // YUV to RGB
    {"nv21_to_rgba", Kind::kConvert, QK_FORMAT_NV21, QK_FORMAT_RGBA, 1, 1,
     [](const uint8_t* s, int w, int h, uint8_t* d, int, int) {
         return libyuv::NV21ToABGR(s, w, chroma(s, w, h), w, d, w * 4, w, h);
     }},
    {"nv12_to_bgra", Kind::kConvert, QK_FORMAT_NV12, QK_FORMAT_BGRA, 1, 1,
     [](const uint8_t* s, int w, int h, uint8_t* d, int, int) {
         return libyuv::NV12ToARGB(s, w, chroma(s, w, h), w, d, w * 4, w, h);
     }},
    {"yuvp_to_rgb8", Kind::kConvert, QK_FORMAT_YUVP, QK_FORMAT_RGB8, 1, 1,
     [](const uint8_t* s, int w, int h, uint8_t* d, int, int) {
         return libyuv::I420ToRAW(s, w, chroma(s, w, h), w / 2, second_plane(s, w, h), w / 2, d, w * 3, w, h);
     }},
    {"yuyv_to_bgra", Kind::kConvert, QK_FORMAT_YUYV, QK_FORMAT_BGRA, 1, 1,
     [](const uint8_t* s, int w, int h, uint8_t* d, int, int) {
         return libyuv::YUY2ToARGB(s, w * 2, d, w * 4, w, h);
     }},
    // YUV layouts. libyuv's NV21ToNV12 copies the luma and swaps each chroma
    // pair, which is NV12 to NV21 as well.
    {"nv12_to_nv21", Kind::kConvert, QK_FORMAT_NV12, QK_FORMAT_NV21, 1, 1,
     [](const uint8_t* s, int w, int h, uint8_t* d, int, int) {
         return libyuv::NV21ToNV12(s, w, chroma(s, w, h), w, d, w, chroma(d, w, h), w, w, h);
     }},
    {"yuyv_to_nv12", Kind::kConvert, QK_FORMAT_YUYV, QK_FORMAT_NV12, 1, 1,
     [](const uint8_t* s, int w, int h, uint8_t* d, int, int) {
         return libyuv::YUY2ToNV12(s, w * 2, d, w, chroma(d, w, h), w, w, h);
     }},
    // RGB reordering. This libyuv has no RAWToABGR; RGB24ToARGB appends alpha
    // without reordering, which on R,G,B bytes gives R,G,B,A: the same work.
    {"rgba_to_bgra", Kind::kConvert, QK_FORMAT_RGBA, QK_FORMAT_BGRA, 1, 1,
     [](const uint8_t* s, int w, int h, uint8_t* d, int, int) {
         return libyuv::ABGRToARGB(s, w * 4, d, w * 4, w, h);
     }},
    {"rgb8_to_rgba", Kind::kConvert, QK_FORMAT_RGB8, QK_FORMAT_RGBA, 1, 1,
     [](const uint8_t* s, int w, int h, uint8_t* d, int, int) {
         return libyuv::RGB24ToARGB(s, w * 3, d, w * 4, w, h);
     }},
    // A quarter turn counter-clockwise (libyuv's kRotate270). Ours turns the
    // frame in place, with a scratch buffer of its own: NV12's planes turned,
    // half of their rows into it, then converted through two RGBA rows at a
    // time back into NV12; libyuv writes a second buffer, NV12 into I420
    // planes.
    {"rgba_rotate_90", Kind::kRotate, QK_FORMAT_RGBA, QK_FORMAT_RGBA, 1, 1,
     [](const uint8_t* s, int w, int h, uint8_t* d, int, int) {
         return libyuv::ARGBRotate(s, w * 4, d, h * 4, w, h, libyuv::kRotate270);
     }},
    {"nv12_rotate_90", Kind::kRotate, QK_FORMAT_NV12, QK_FORMAT_NV12, 1, 1,
     [](const uint8_t* s, int w, int h, uint8_t* d, int, int) {
         return libyuv::NV12ToI420Rotate(s, w, chroma(s, w, h), w, d, h, chroma(d, h, w), h / 2,
                                         second_plane(d, h, w), h / 2, w, h, libyuv::kRotate270);
     }},
    // Nearest-pixel scaling; rates count the destination's pixels.
    {"rgba_scale_half", Kind::kScale, QK_FORMAT_RGBA, QK_FORMAT_RGBA, 1, 2,
     [](const uint8_t* s, int w, int h, uint8_t* d, int dw, int dh) {
         return libyuv::ARGBScale(s, w * 4, w, h, d, dw * 4, dw, dh, libyuv::kFilterNone);
     }},
    {"rgba_scale_double", Kind::kScale, QK_FORMAT_RGBA, QK_FORMAT_RGBA, 2, 1,
     [](const uint8_t* s, int w, int h, uint8_t* d, int dw, int dh) {
         return libyuv::ARGBScale(s, w * 4, w, h, d, dw * 4, dw, dh, libyuv::kFilterNone);
     }},
};

// One call of ours on the wrapped frames. A turn turns the source itself:
// its width and height trade places on every call, which costs the same
// each time.
int32_t run_ours(const Operation& op, QKImage* src, QKImage* dst) {
    switch (op.kind) {
        case Kind::kConvert: return QKImage_convert(src, dst);
        case Kind::kRotate: return QKImage_rotate(src, 90);
        case Kind::kScale: return QKImage_scale(src, dst);
    }
    return QK_ERROR_INVALID_PARAM;
}

void BM_Yuv(benchmark::State& state, const Operation& op, bool ours) {
    const int32_t width = static_cast<int32_t>(state.range(0));
    const int32_t height = static_cast<int32_t>(state.range(1));
    const int32_t out_width = width * op.scale_num / op.scale_den;
    const int32_t out_height = height * op.scale_num / op.scale_den;
    QuietLog quiet;  // the start line of every call is not what we measure
    FrameRing frames(width, height, op.from, out_width, out_height, op.to);
    for (auto _ : state) {
        CallerFrame& source = frames.source();
        CallerFrame& target = frames.target();
        const int result = ours ? run_ours(op, source.image(), target.image())
                                : op.libyuv(source.data(), width, height, target.data(), out_width, out_height);
        if (result != 0) {
            state.SkipWithError(ours ? "our call failed" : "libyuv failed");
            break;
        }
        benchmark::DoNotOptimize(target.data());
        benchmark::DoNotOptimize(source.data());
        benchmark::ClobberMemory();
        frames.advance();
    }
    set_rates(state, op.kind == Kind::kScale ? int64_t{out_width} * out_height : int64_t{width} * height);
}

[[maybe_unused]] const bool kRegistered = [] {
    for (const Operation& op : kOperations) {
        for (bool ours : {true, false}) {
            const std::string name = std::string("BM_Yuv/") + op.name + (ours ? "/ours" : "/libyuv");
            benchmark::RegisterBenchmark(name.c_str(), BM_Yuv, op, ours)->Apply(frame_sizes);
        }
    }
    return true;
}();

}  // namespace
