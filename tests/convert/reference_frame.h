// The yardsticks of the conversion tests: the colour formulas written out
// plainly (deliberately independent of src/convert: division and floor where
// the library uses shifts and tables), test images over buffers of their own,
// and a pixel-by-pixel reference conversion of whole images, with every
// format's byte positions spelled out rather than taken from the library's
// layout tables.
#ifndef QKCORE_TESTS_CONVERT_REFERENCE_FRAME_H
#define QKCORE_TESTS_CONVERT_REFERENCE_FRAME_H

#include <math.h>
#include <stdint.h>

#include <random>
#include <vector>

#include "qkcore/qk_image.h"

namespace qktest {

struct Rgb {
    int r, g, b;
};
struct Yuv {
    int y, u, v;
};

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

struct ImageSpec {
    uint32_t format;
    int32_t width, height;
    size_t bytes;  // buffer length; 0: no buffer
    uint64_t size = 0;
    uint32_t chromaOffset = 0;
};

// A QKImage wrapping a vector of `bytes` patterned bytes; `size` and
// `chromaOffset` are recorded as given.
struct TestImage {
    explicit TestImage(const ImageSpec& spec) : buffer(spec.bytes) {
        for (size_t i = 0; i < spec.bytes; ++i) buffer[i] = static_cast<uint8_t>(i * 7 + 3);
        image.width = spec.width, image.height = spec.height, image.format = spec.format;
        image.data = buffer.empty() ? nullptr : buffer.data();
        image.isWrapped = 1, image.size = spec.size, image.chromaOffset = spec.chromaOffset;
    }
    TestImage(const TestImage&) = delete;
    void randomize(std::mt19937& random) {
        for (uint8_t& byte : buffer) byte = static_cast<uint8_t>(random());
    }
    std::vector<uint8_t> buffer;
    QKImage image;
};

// The formats that convert to each other.
extern const uint32_t kConvertibleFormats[13];

// The bytes `dst` must hold after converting `src` into it: `dst`'s current
// buffer (its first `capacity` bytes) with every byte the conversion defines
// overwritten. `dst` keeps its own format and chroma offset; the source's
// dimensions apply.
std::vector<uint8_t> reference_conversion(const QKImage& src, const QKImage& dst, uint64_t capacity);

}  // namespace qktest

#endif  // QKCORE_TESTS_CONVERT_REFERENCE_FRAME_H
