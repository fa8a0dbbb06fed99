// Row kernels of the pixel-format conversions. Each conversion has a plain
// reference kernel that reads the layouts at run time; faster variants, with
// the layouts fixed at compile time and, where the CPU has them, SIMD
// instructions, are chosen once per call through the select_* functions,
// which fall back to the reference where no variant exists. Every variant
// writes exactly the bytes of its reference kernel.
#ifndef QKCORE_SRC_CONVERT_ROW_H
#define QKCORE_SRC_CONVERT_ROW_H

#include <stdint.h>

#include "image/format.h"

namespace qk {

// RGB to RGB: `width` pixels from src to dst.
//
// `stream` (here, in YuvToRgbShape and for ChromaRow): kernels with
// streaming stores may write 4-byte pixels (and chroma planes and pairs)
// with them, past the caches, for a destination too large to stay there;
// the caller calls finish_streaming() after its last row, before the pixels
// are read.
struct RgbToRgbShape {
    RgbLayout src;
    RgbLayout dst;
    bool stream = false;
};
using RgbToRgbRow = void (*)(const uint8_t* src, uint8_t* dst, int width, const RgbToRgbShape& shape);
void rgb_to_rgb_row_reference(const uint8_t* src, uint8_t* dst, int width, const RgbToRgbShape& shape);
RgbToRgbRow select_rgb_to_rgb_row(int src_index, int dst_index);

// RGB to YUV: the luma of `width` pixels, stored lumaStep bytes apart, and
// the U and V of the left pixel of `pairs` pixel pairs, chromaStep apart.
struct RgbToYuvShape {
    RgbLayout src;
    int lumaStep;
    int chromaStep;
};
using RgbToLumaRow = void (*)(const uint8_t* rgb, uint8_t* luma, int width, const RgbToYuvShape& shape);
using RgbToChromaRow = void (*)(const uint8_t* rgb, uint8_t* u, uint8_t* v, int pairs,
                                const RgbToYuvShape& shape);
void rgb_to_luma_row_reference(const uint8_t* rgb, uint8_t* luma, int width, const RgbToYuvShape& shape);
void rgb_to_chroma_row_reference(const uint8_t* rgb, uint8_t* u, uint8_t* v, int pairs,
                                 const RgbToYuvShape& shape);
RgbToLumaRow select_rgb_to_luma_row(int src_index, int luma_step);
RgbToChromaRow select_rgb_to_chroma_row(int src_index, int chroma_step);

// YUV to RGB: one image row (rows 1: y0 to d0) or two rows sharing one
// chroma row (rows 2: y0 to d0 and y1 to d1). Pixels 2j and 2j+1 use U
// sample j at u[j * chromaStep] and V sample j likewise; width is even.
struct YuvToRgbShape {
    int lumaStep;
    int chromaStep;
    int rows;  // 1 or 2
    RgbLayout dst;
    bool stream = false;
};
using YuvToRgbRow = void (*)(const uint8_t* y0, const uint8_t* y1, const uint8_t* u, const uint8_t* v,
                             uint8_t* d0, uint8_t* d1, int width, const YuvToRgbShape& shape);
void yuv_to_rgb_row_reference(const uint8_t* y0, const uint8_t* y1, const uint8_t* u, const uint8_t* v,
                              uint8_t* d0, uint8_t* d1, int width, const YuvToRgbShape& shape);
YuvToRgbRow select_yuv_to_rgb_row(int dst_index, int luma_step, int chroma_step, int rows);

// GREY to RGB: R = G = B = luma, any width.
using GreyToRgbRow = void (*)(const uint8_t* luma, uint8_t* dst, int width, const RgbLayout& layout);
void grey_to_rgb_row_reference(const uint8_t* luma, uint8_t* dst, int width, const RgbLayout& layout);
GreyToRgbRow select_grey_to_rgb_row(int dst_index);

// YUV to YUV: `count` samples moved from one step to another; chroma moves U
// and V together.
using SampleRow = void (*)(const uint8_t* src, int src_step, uint8_t* dst, int dst_step, int count);
using ChromaRow = void (*)(const uint8_t* src_u, const uint8_t* src_v, int src_step, uint8_t* dst_u, uint8_t* dst_v,
                           int dst_step, int count, bool stream);
void sample_row_reference(const uint8_t* src, int src_step, uint8_t* dst, int dst_step, int count);
void chroma_row_reference(const uint8_t* src_u, const uint8_t* src_v, int src_step, uint8_t* dst_u, uint8_t* dst_v,
                          int dst_step, int count, bool stream);
SampleRow select_sample_row(int src_step, int dst_step);
ChromaRow select_chroma_row(int src_step, int dst_step);
// Planar luma and 4:2:0 chroma (`chromaStep` 1 or 2) to one row of packed
// 4:2:2 in one pass: luma of pixel x to dst[2x], U and V of pair j, read at
// u[j * chromaStep] and v[j * chromaStep], to dst_u[4j] and dst_v[4j]
// (dst + 1 and dst + 3 in either order); width is even.
using PackRow = void (*)(const uint8_t* luma, const uint8_t* u, const uint8_t* v, int chroma_step, uint8_t* dst,
                         uint8_t* dst_u, uint8_t* dst_v, int width);
void pack_row_reference(const uint8_t* luma, const uint8_t* u, const uint8_t* v, int chroma_step, uint8_t* dst,
                        uint8_t* dst_u, uint8_t* dst_v, int width);
PackRow select_pack_row(int chroma_step);
// One row of packed 4:2:2 (luma of pixel x at src[2x], U and V of pair j at
// src_u[4j] and src_v[4j], src + 1 and src + 3 in either order) to planar
// luma and a row of chroma pairs (U at u[2j], V at v[2j], next to each other
// in either order), in one pass; width is even.
using UnpackRow = void (*)(const uint8_t* src, const uint8_t* src_u, const uint8_t* src_v, uint8_t* luma, uint8_t* u,
                           uint8_t* v, int width);
void unpack_row_reference(const uint8_t* src, const uint8_t* src_u, const uint8_t* src_v, uint8_t* luma, uint8_t* u,
                          uint8_t* v, int width);
UnpackRow select_unpack_row();
// Orders streamed stores before whatever follows them (x86); nothing
// elsewhere.
void finish_streaming();

// Sets `count` U and V samples, `step` bytes apart, to `value`.
void fill_chroma_row(uint8_t* u, uint8_t* v, int step, int count, uint8_t value);

// One set of row kernels: a selector per conversion, with the arguments of
// the select_* function it serves. The portable set answers every request;
// an instruction-set set answers null where it has no kernel, and the next
// set is asked. Every kernel a set returns handles any width (tails included)
// and touches no byte outside its rows.
struct RowKernelSet {
    const char* name;
    RgbToRgbRow (*rgbToRgb)(int src_index, int dst_index);
    RgbToLumaRow (*rgbToLuma)(int src_index, int luma_step);
    RgbToChromaRow (*rgbToChroma)(int src_index, int chroma_step);
    YuvToRgbRow (*yuvToRgb)(int dst_index, int luma_step, int chroma_step, int rows);
    GreyToRgbRow (*greyToRgb)(int dst_index);
    SampleRow (*sample)(int src_step, int dst_step);
    ChromaRow (*chroma)(int src_step, int dst_step);
    PackRow (*pack)(int chroma_step);
    UnpackRow (*unpack)();
};

// The compiler-vectorised kernels (row_fast.cpp): baseline instructions only.
extern const RowKernelSet kPortableRows;
// The hand-written ones, each in a file of its own compiled for its
// instruction set; the select_* functions consult those this CPU supports,
// in this order, before the portable set.
#if defined(__x86_64__)
// The 16-bit factors of the YUV to RGB kernels (x86/row_x86_kernels.inc
// derives them).
enum YuvFactor {
    kFactorRedV,
    kFactorBlueU,
    kFactorGreenU,
    kFactorGreenV,
    kFactorGreenULow,
    kFactorGreenVLow,
    kFactorFiftyThousand,
    kYuvFactorCount
};
constexpr int16_t kYuvFactorValues[kYuvFactorCount] = {26346, -14942, -22560, 18726, -17207, 29829, -15536};
// The same, each repeated over 16 bytes and defined in another file, where
// the kernels' compiler cannot see the values: it then reads them from memory
// when registers run short, rather than building them anew in the loop.
struct YuvFactorVectors {
    alignas(16) int16_t word[kYuvFactorCount][8];
};
extern const YuvFactorVectors kYuvFactorVectors;
extern const RowKernelSet kAvx512Rows;  // x86/row_avx512.cpp
extern const RowKernelSet kAvx2Rows;   // x86/row_avx2.cpp
extern const RowKernelSet kSsse3Rows;  // x86/row_ssse3.cpp
#elif defined(__aarch64__)
extern const RowKernelSet kNeonRows;  // arm/row_neon.cpp
#endif

// The instruction-set sets this CPU supports, best first (read once per
// process), whether or not they are enabled. At most 4.
struct SupportedRowSets {
    const RowKernelSet* sets[4];
    int count;
};
const SupportedRowSets& supported_row_sets();
// On by default. Off, the select_* functions return portable kernels only:
// for tests and benchmarks that compare the two. Not for concurrent use with
// conversions in flight.
void set_simd_enabled(bool enabled);
bool simd_enabled();

}  // namespace qk

#endif  // QKCORE_SRC_CONVERT_ROW_H
