// Reference row kernels: the conversions exactly as defined, with the layouts
// read at run time. They serve formats without a faster variant, the tails
// that a variant leaves, and the tests as the yardstick for every variant.
#include <stddef.h>

#include "convert/pixel.h"
#include "convert/row.h"
#include "convert/row_loops.h"

namespace qk {

void rgb_to_rgb_row_reference(const uint8_t* src, uint8_t* dst, int width, const RgbToRgbShape& shape) {
    rgb_to_rgb_loop(src, dst, width, shape.src, shape.dst);
}

void rgb_to_luma_row_reference(const uint8_t* rgb, uint8_t* luma, int width, const RgbToYuvShape& shape) {
    rgb_to_luma_loop(rgb, luma, width, shape.src, shape.lumaStep);
}

void rgb_to_chroma_row_reference(const uint8_t* rgb, uint8_t* u, uint8_t* v, int pairs,
                                 const RgbToYuvShape& shape) {
    rgb_to_chroma_loop(rgb, u, v, pairs, shape.src, shape.chromaStep);
}

void yuv_to_rgb_row_reference(const uint8_t* y0, const uint8_t* y1, const uint8_t* u, const uint8_t* v,
                              uint8_t* d0, uint8_t* d1, int width, const YuvToRgbShape& shape) {
    const RgbLayout& d = shape.dst;
    const uint8_t* luma[2] = {y0, y1};
    uint8_t* out[2] = {d0, d1};
    for (ptrdiff_t j = 0; j < width / 2; ++j) {
        const ChromaProducts chroma = chroma_products(u[j * shape.chromaStep], v[j * shape.chromaStep]);
        for (int row = 0; row < shape.rows; ++row) {
            for (ptrdiff_t x = 2 * j; x < 2 * j + 2; ++x) {
                uint8_t* pixel = out[row] + x * d.bytesPerPixel;
                yuv_pixel_double(luma[row][x * shape.lumaStep], chroma, &pixel[d.rOffset], &pixel[d.gOffset],
                                 &pixel[d.bOffset]);
                if (d.aOffset >= 0) pixel[d.aOffset] = 255;
            }
        }
    }
}

void grey_to_rgb_row_reference(const uint8_t* luma, uint8_t* dst, int width, const RgbLayout& layout) {
    grey_to_rgb_loop(luma, dst, width, layout);
}

void sample_row_reference(const uint8_t* src, int src_step, uint8_t* dst, int dst_step, int count) {
    sample_loop(src, src_step, dst, dst_step, count);
}

void chroma_row_reference(const uint8_t* src_u, const uint8_t* src_v, int src_step, uint8_t* dst_u, uint8_t* dst_v,
                          int dst_step, int count, bool) {
    chroma_loop(src_u, src_v, src_step, dst_u, dst_v, dst_step, count);
}

void pack_row_reference(const uint8_t* luma, const uint8_t* u, const uint8_t* v, int chroma_step, uint8_t* dst,
                        uint8_t* dst_u, uint8_t* dst_v, int width) {
    pack_loop(luma, u, v, chroma_step, dst, dst_u, dst_v, width);
}

void unpack_row_reference(const uint8_t* src, const uint8_t* src_u, const uint8_t* src_v, uint8_t* luma, uint8_t* u,
                          uint8_t* v, int width) {
    unpack_loop(src, src_u, src_v, luma, u, v, width);
}

void fill_chroma_row(uint8_t* u, uint8_t* v, int step, int count, uint8_t value) {
    for (ptrdiff_t i = 0; i < count; ++i) u[i * step] = v[i * step] = value;
}

}  // namespace qk
