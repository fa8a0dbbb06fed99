// Row kernels of the pixel-format conversions. Each conversion has a plain
// reference kernel that reads the layouts at run time; faster variants with
// the layouts fixed at compile time are chosen once per call through the
// select_* functions, which fall back to the reference where no variant
// exists. Every variant writes exactly the bytes of its reference kernel.
#ifndef QKCORE_SRC_CONVERT_ROW_H
#define QKCORE_SRC_CONVERT_ROW_H

#include <stdint.h>

#include "image/format.h"

namespace qk {

// RGB to RGB: `width` pixels from src to dst.
struct RgbToRgbShape {
    RgbLayout src;
    RgbLayout dst;
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
                           int dst_step, int count);
void sample_row_reference(const uint8_t* src, int src_step, uint8_t* dst, int dst_step, int count);
void chroma_row_reference(const uint8_t* src_u, const uint8_t* src_v, int src_step, uint8_t* dst_u, uint8_t* dst_v,
                          int dst_step, int count);
SampleRow select_sample_row(int src_step, int dst_step);
ChromaRow select_chroma_row(int src_step, int dst_step);
// Sets `count` U and V samples, `step` bytes apart, to `value`.
void fill_chroma_row(uint8_t* u, uint8_t* v, int step, int count, uint8_t value);

}  // namespace qk

#endif  // QKCORE_SRC_CONVERT_ROW_H
