// Images over test-owned buffers, filled with a recognisable pattern.
#ifndef QKCORE_TESTS_CONVERT_TEST_IMAGE_H
#define QKCORE_TESTS_CONVERT_TEST_IMAGE_H

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

// A QKImage wrapping its own vector of `bytes` bytes; `size` and
// `chromaOffset` are recorded as given.
class TestImage {
public:
    explicit TestImage(const ImageSpec& spec) : buffer(spec.bytes) {
        for (size_t i = 0; i < spec.bytes; ++i) buffer[i] = static_cast<uint8_t>(i * 7 + 3);
        image.width = spec.width;
        image.height = spec.height;
        image.format = spec.format;
        image.data = buffer.empty() ? nullptr : buffer.data();
        image.isWrapped = image.data != nullptr;
        image.size = spec.size;
        image.chromaOffset = spec.chromaOffset;
    }
    TestImage(uint32_t format, int32_t width, int32_t height, size_t bytes, uint64_t size = 0,
              uint32_t chromaOffset = 0)
        : TestImage(ImageSpec{format, width, height, bytes, size, chromaOffset}) {}
    TestImage(const TestImage&) = delete;
    TestImage& operator=(const TestImage&) = delete;

    void randomize(std::mt19937& random) {
        for (uint8_t& byte : buffer) byte = static_cast<uint8_t>(random());
    }

    std::vector<uint8_t> buffer;
    QKImage image;
};

}  // namespace qktest

#endif  // QKCORE_TESTS_CONVERT_TEST_IMAGE_H
