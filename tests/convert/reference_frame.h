// Test images over buffers of their own, and a plain, pixel-by-pixel
// reference conversion of whole images, with every format's byte positions
// spelled out rather than taken from the library's layout tables.
#ifndef QKCORE_TESTS_CONVERT_REFERENCE_FRAME_H
#define QKCORE_TESTS_CONVERT_REFERENCE_FRAME_H

#include <stdint.h>

#include <random>
#include <vector>

#include "qkcore/qk_image.h"

namespace qktest {

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
