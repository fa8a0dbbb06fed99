// Images over test-owned buffers, filled with a recognisable pattern.
#ifndef QKCORE_TESTS_CONVERT_TEST_IMAGE_H
#define QKCORE_TESTS_CONVERT_TEST_IMAGE_H

#include <stdint.h>

#include <random>
#include <vector>

#include "qkcore/qk_image.h"

namespace qktest {

// A QKImage wrapping its own vector of `bytes` bytes; `size` and
// `chromaOffset` are recorded as given.
class TestImage {
public:
    TestImage(uint32_t format, int32_t width, int32_t height, size_t bytes, uint64_t size = 0,
              uint32_t chromaOffset = 0)
        : buffer(bytes) {
        for (size_t i = 0; i < bytes; ++i) buffer[i] = static_cast<uint8_t>(i * 7 + 3);
        image.width = width;
        image.height = height;
        image.format = format;
        image.data = buffer.empty() ? nullptr : buffer.data();
        image.isWrapped = image.data != nullptr;
        image.size = size;
        image.chromaOffset = chromaOffset;
    }
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
