// Reference row kernels: the conversions exactly as defined, with the layouts
// read at run time. They serve formats without a faster variant, the tails
// that a variant leaves, and the tests as the yardstick for every variant.
#include <stddef.h>

#include "convert/pixel.h"
#include "convert/row.h"

namespace qk {

void rgb_to_rgb_row_reference(const uint8_t* src, uint8_t* dst, int width, const RgbToRgbShape& shape) {
    const RgbLayout& s = shape.src;
    const RgbLayout& d = shape.dst;
    for (ptrdiff_t i = 0; i < width; ++i) {
        const uint8_t* in = src + i * s.bytesPerPixel;
        uint8_t* out = dst + i * d.bytesPerPixel;
        out[d.rOffset] = in[s.rOffset];
        out[d.gOffset] = in[s.gOffset];
        out[d.bOffset] = in[s.bOffset];
        if (d.aOffset >= 0) out[d.aOffset] = s.aOffset >= 0 ? in[s.aOffset] : 255;
    }
}

void rgb_to_luma_row_reference(const uint8_t* rgb, uint8_t* luma, int width, const RgbToYuvShape& shape) {
    const RgbLayout& s = shape.src;
    for (ptrdiff_t i = 0; i < width; ++i) {
        const uint8_t* in = rgb + i * s.bytesPerPixel;
        luma[i * shape.lumaStep] = static_cast<uint8_t>(rgb_luma(in[s.rOffset], in[s.gOffset], in[s.bOffset]));
    }
}

void rgb_to_chroma_row_reference(const uint8_t* rgb, uint8_t* u, uint8_t* v, int pairs,
                                 const RgbToYuvShape& shape) {
    const RgbLayout& s = shape.src;
    for (ptrdiff_t j = 0; j < pairs; ++j) {
        const uint8_t* in = rgb + 2 * j * s.bytesPerPixel;
        const int r = in[s.rOffset];
        const int b = in[s.bOffset];
        const int y = rgb_luma(r, in[s.gOffset], b);
        u[j * shape.chromaStep] = rgb_chroma_u(b, y);
        v[j * shape.chromaStep] = rgb_chroma_v(r, y);
    }
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
    for (ptrdiff_t i = 0; i < width; ++i) {
        uint8_t* pixel = dst + i * layout.bytesPerPixel;
        pixel[layout.rOffset] = pixel[layout.gOffset] = pixel[layout.bOffset] = luma[i];
        if (layout.aOffset >= 0) pixel[layout.aOffset] = 255;
    }
}

void sample_row_reference(const uint8_t* src, int srcStep, uint8_t* dst, int dstStep, int count) {
    for (ptrdiff_t i = 0; i < count; ++i) dst[i * dstStep] = src[i * srcStep];
}

void chroma_row_reference(const uint8_t* srcU, const uint8_t* srcV, int srcStep, uint8_t* dstU, uint8_t* dstV,
                          int dstStep, int count) {
    for (ptrdiff_t i = 0; i < count; ++i) {
        dstU[i * dstStep] = srcU[i * srcStep];
        dstV[i * dstStep] = srcV[i * srcStep];
    }
}

void fill_chroma_row(uint8_t* u, uint8_t* v, int step, int count, uint8_t value) {
    for (ptrdiff_t i = 0; i < count; ++i) u[i * step] = v[i * step] = value;
}

}  // namespace qk
