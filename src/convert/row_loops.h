// The row loops shared by the reference kernels, which pass layouts and steps
// read at run time, and by their faster variants, which pass compile-time
// constants. Always inlined, so that constant layouts fold into the loop and
// the compiler can unroll and vectorise it.
#ifndef QKCORE_SRC_CONVERT_ROW_LOOPS_H
#define QKCORE_SRC_CONVERT_ROW_LOOPS_H

#include <stddef.h>
#include <stdint.h>

#include "convert/pixel.h"
#include "image/format.h"

#define QK_ROW_LOOP [[gnu::always_inline]] inline

namespace qk {

QK_ROW_LOOP void rgb_to_rgb_loop(const uint8_t* src, uint8_t* dst, ptrdiff_t width, RgbLayout s, RgbLayout d) {
    for (ptrdiff_t i = 0; i < width; ++i) {
        const uint8_t* in = src + i * s.bytesPerPixel;
        uint8_t* out = dst + i * d.bytesPerPixel;
        out[d.rOffset] = in[s.rOffset];
        out[d.gOffset] = in[s.gOffset];
        out[d.bOffset] = in[s.bOffset];
        if (d.aOffset >= 0) out[d.aOffset] = s.aOffset >= 0 ? in[s.aOffset] : 255;
    }
}

QK_ROW_LOOP void rgb_to_luma_loop(const uint8_t* rgb, uint8_t* luma, ptrdiff_t width, RgbLayout s, int luma_step) {
    for (ptrdiff_t i = 0; i < width; ++i) {
        const uint8_t* in = rgb + i * s.bytesPerPixel;
        luma[i * luma_step] = static_cast<uint8_t>(rgb_luma(in[s.rOffset], in[s.gOffset], in[s.bOffset]));
    }
}

// U and V from the left pixel of each pair.
QK_ROW_LOOP void rgb_to_chroma_loop(const uint8_t* rgb, uint8_t* u, uint8_t* v, ptrdiff_t pairs, RgbLayout s,
                                    int chroma_step) {
    for (ptrdiff_t j = 0; j < pairs; ++j) {
        const uint8_t* in = rgb + 2 * j * s.bytesPerPixel;
        const int r = in[s.rOffset];
        const int b = in[s.bOffset];
        const int y = rgb_luma(r, in[s.gOffset], b);
        u[j * chroma_step] = rgb_chroma_u(b, y);
        v[j * chroma_step] = rgb_chroma_v(r, y);
    }
}

QK_ROW_LOOP void grey_to_rgb_loop(const uint8_t* luma, uint8_t* dst, ptrdiff_t width, RgbLayout d) {
    for (ptrdiff_t i = 0; i < width; ++i) {
        uint8_t* pixel = dst + i * d.bytesPerPixel;
        pixel[d.rOffset] = pixel[d.gOffset] = pixel[d.bOffset] = luma[i];
        if (d.aOffset >= 0) pixel[d.aOffset] = 255;
    }
}

QK_ROW_LOOP void sample_loop(const uint8_t* src, int src_step, uint8_t* dst, int dst_step, ptrdiff_t count) {
    for (ptrdiff_t i = 0; i < count; ++i) dst[i * dst_step] = src[i * src_step];
}

QK_ROW_LOOP void chroma_loop(const uint8_t* src_u, const uint8_t* src_v, int src_step, uint8_t* dst_u, uint8_t* dst_v,
                             int dst_step, ptrdiff_t count) {
    for (ptrdiff_t i = 0; i < count; ++i) {
        dst_u[i * dst_step] = src_u[i * src_step];
        dst_v[i * dst_step] = src_v[i * src_step];
    }
}

QK_ROW_LOOP void pack_loop(const uint8_t* luma, const uint8_t* u, const uint8_t* v, int chroma_step, uint8_t* dst,
                           uint8_t* dst_u, uint8_t* dst_v, ptrdiff_t width) {
    for (ptrdiff_t j = 0; j < width / 2; ++j) {
        dst[4 * j] = luma[2 * j];
        dst_u[4 * j] = u[j * chroma_step];
        dst[4 * j + 2] = luma[2 * j + 1];
        dst_v[4 * j] = v[j * chroma_step];
    }
}

QK_ROW_LOOP void unpack_loop(const uint8_t* src, const uint8_t* src_u, const uint8_t* src_v, uint8_t* luma,
                             uint8_t* u, uint8_t* v, ptrdiff_t width) {
    for (ptrdiff_t j = 0; j < width / 2; ++j) {
        luma[2 * j] = src[4 * j];
        luma[2 * j + 1] = src[4 * j + 2];
        u[2 * j] = src_u[4 * j];
        v[2 * j] = src_v[4 * j];
    }
}

}  // namespace qk

#endif  // QKCORE_SRC_CONVERT_ROW_LOOPS_H
