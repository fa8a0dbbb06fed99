// The yardsticks of the conversion tests: the colour formulas written out
// plainly (deliberately independent of src/convert: division and floor where
// the library uses shifts and tables), and a pixel-by-pixel reference
// conversion of whole images, with every format's byte positions spelled out
// rather than taken from the library's layout tables.
#ifndef QKCORE_TESTS_CONVERT_REFERENCE_FRAME_H
#define QKCORE_TESTS_CONVERT_REFERENCE_FRAME_H

#include <math.h>
#include <stdint.h>

#include <vector>

#include "qkcore/qk_image.h"
#include "support/images.h"

namespace qktest {

struct Rgb { int r, g, b; };
struct Yuv { int y, u, v; };

inline int clamp255(int value) { return value < 0 ? 0 : (value > 255 ? 255 : value); }

inline Yuv formula_rgb_to_yuv(int r, int g, int b) {
    const int y = static_cast<int>((19595u * r + 38470u * g + 7471u * b) / 65536u);
    const int u = clamp255(static_cast<int>(floor((b - y) * 36962 / 65536.0)) + 128);
    const int v = clamp255(static_cast<int>(floor((r - y) * 46727 / 65536.0)) + 128);
    return {y, u, v};
}

// Double precision, in the defined order of operations, truncated, clamped.
inline Rgb formula_yuv_to_rgb(int luma, int u_byte, int v_byte) {
    const double u = u_byte - 128, v = v_byte - 128, y = luma;
    const double gu = u * 0.34414, bu = u * 1.772, gv = v * 0.71414, rv = v * 1.402;
    return {clamp255(static_cast<int>(y + rv)), clamp255(static_cast<int>((y - gu) - gv)),
            clamp255(static_cast<int>(y + bu))};
}

// The bytes `dst` must hold after converting `src` into it: `dst`'s current
// buffer (its first `capacity` bytes) with every byte the conversion defines
// overwritten. `dst` keeps its own format and chroma offset; the source's
// dimensions apply.
std::vector<uint8_t> reference_conversion(const QKImage& src, const QKImage& dst, uint64_t capacity);

}  // namespace qktest

#endif  // QKCORE_TESTS_CONVERT_REFERENCE_FRAME_H
