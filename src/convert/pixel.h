// Per-pixel colour arithmetic shared by the row kernels: full-range BT.601,
// fixed point from RGB to YUV, double precision from YUV to RGB (the faster
// kernels' exact integer equivalent lives with them).
#ifndef QKCORE_SRC_CONVERT_PIXEL_H
#define QKCORE_SRC_CONVERT_PIXEL_H

#include <stdint.h>

namespace qk {

constexpr uint8_t clamp_byte(int value) {
    return static_cast<uint8_t>(value < 0 ? 0 : (value > 255 ? 255 : value));
}

// RGB to YUV. The luma weights add up to exactly 65536, so no clamp is needed
// and no rounding bias is added.
inline int rgb_luma(uint32_t r, uint32_t g, uint32_t b) {
    return static_cast<int>((19595u * r + 38470u * g + 7471u * b) >> 16);
}
// `>>` of a negative product is an arithmetic shift (rounds towards minus
// infinity) with every compiler we target.
inline uint8_t rgb_chroma_u(int b, int luma) { return clamp_byte((((b - luma) * 36962) >> 16) + 128); }
inline uint8_t rgb_chroma_v(int r, int luma) { return clamp_byte((((r - luma) * 46727) >> 16) + 128); }

// YUV to RGB in double precision: the defining form. The four products are
// made once per chroma pair.
struct ChromaProducts {
    double gu, bu, gv, rv;
};
inline ChromaProducts chroma_products(int u_byte, int v_byte) {
    const double u = u_byte - 128;
    const double v = v_byte - 128;
    return {u * 0.34414, u * 1.772, v * 0.71414, v * 1.402};
}
// Truncation towards zero, then clamping.
inline uint8_t double_channel(double value) { return clamp_byte(static_cast<int32_t>(value)); }
inline void yuv_pixel_double(int luma, const ChromaProducts& c, uint8_t* r, uint8_t* g, uint8_t* b) {
    const double y = luma;
    *r = double_channel(y + c.rv);
    *g = double_channel((y - c.gu) - c.gv);
    *b = double_channel(y + c.bu);
}

}  // namespace qk

#endif  // QKCORE_SRC_CONVERT_PIXEL_H
