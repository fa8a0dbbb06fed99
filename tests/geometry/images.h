// Small images with recognisable pixels, and snapshots that show whether an
// operation left an image alone.
#ifndef QKCORE_TESTS_GEOMETRY_IMAGES_H
#define QKCORE_TESTS_GEOMETRY_IMAGES_H

#include <gtest/gtest.h>
#include <stdint.h>
#include <string.h>

#include <memory>
#include <string>
#include <vector>

#include "qkcore/qk_image.h"

namespace qktest {

struct Destroy {
    void operator()(QKImage* image) const { QKImage_destroy(image); }
};
using ImagePtr = std::unique_ptr<QKImage, Destroy>;

// The characters of a format code, for test messages.
inline std::string fourcc(uint32_t code) {
    std::string name(reinterpret_cast<const char*>(&code), 4);
    return name.substr(0, name.find('\0'));
}

// Byte i of the buffer becomes (i * 37 + seed) mod 256: all bytes of a buffer
// of up to 256 bytes differ, so a byte taken from the wrong place shows.
inline void fill_distinct(QKImage& image, uint8_t seed = 11) {
    const uint64_t bytes = QKImage_size(&image);
    for (uint64_t i = 0; i < bytes; ++i) image.data[i] = static_cast<uint8_t>(i * 37 + seed);
}

// An owned image of the rule size whose bytes are all set by fill_distinct.
inline ImagePtr distinct_image(int32_t width, int32_t height, uint32_t format, uint8_t seed = 11) {
    ImagePtr image(QKImage_createNew(width, height, format));
    if (image) fill_distinct(*image, seed);
    return image;
}

// RGBA pixel i of a larger image: distinct for i < 65536, opaque.
inline uint32_t rgba_pixel(int i) {
    return static_cast<uint32_t>(i & 0xff) | static_cast<uint32_t>((i >> 8) & 0xff) << 8 |
           static_cast<uint32_t>((i * 7 + 1) & 0xff) << 16 | 0xffu << 24;
}

inline uint32_t pixel_at(const QKImage& image, int32_t x, int32_t y) {
    uint32_t value;
    memcpy(&value, image.data + (static_cast<size_t>(y) * image.width + x) * 4, 4);
    return value;
}

inline void set_pixel(QKImage& image, int32_t x, int32_t y, uint32_t value) {
    memcpy(image.data + (static_cast<size_t>(y) * image.width + x) * 4, &value, 4);
}

// Every field of an image and the bytes of its buffer.
struct Snapshot {
    explicit Snapshot(const QKImage& image)
        : data(image.data), width(image.width), height(image.height), format(image.format),
          isWrapped(image.isWrapped), size(image.size), chromaOffset(image.chromaOffset) {
        if (image.data != nullptr) bytes.assign(image.data, image.data + QKImage_size(&image));
    }
    bool operator==(const Snapshot& other) const {
        return data == other.data && width == other.width && height == other.height && format == other.format &&
               isWrapped == other.isWrapped && size == other.size && chromaOffset == other.chromaOffset &&
               bytes == other.bytes;
    }

    const uint8_t* data;
    int32_t width;
    int32_t height;
    uint32_t format;
    uint32_t isWrapped;
    uint64_t size;
    uint32_t chromaOffset;
    std::vector<uint8_t> bytes;
};

inline ::testing::AssertionResult Unchanged(const QKImage& image, const Snapshot& before) {
    if (Snapshot(image) == before) return ::testing::AssertionSuccess();
    return ::testing::AssertionFailure() << "the image was changed";
}

// The Y, U and V samples of pixel (x, y) of a 4:2:0 image, addressed from its
// own layout description, one sample at a time.
struct Yuv {
    uint8_t y, u, v;
    bool operator==(const Yuv& o) const { return y == o.y && u == o.u && v == o.v; }
};

inline Yuv yuv_at(const QKImage& image, int32_t x, int32_t y) {
    const size_t w = static_cast<size_t>(image.width);
    const size_t base = image.chromaOffset != 0 ? image.chromaOffset : w * image.height;
    const size_t quarter = w * image.height / 4;
    const size_t pair = (y / 2) * w + (x / 2) * 2;     // NV12, NV21: U,V pairs in rows of w bytes
    const size_t planar = (y / 2) * (w / 2) + x / 2;   // YV12, YUVP: planes of rows of w / 2 bytes
    const uint8_t* d = image.data;
    Yuv s{d[y * w + x], 0, 0};
    switch (image.format) {
        case QK_FORMAT_NV12: s.u = d[base + pair], s.v = d[base + pair + 1]; break;
        case QK_FORMAT_NV21: s.v = d[base + pair], s.u = d[base + pair + 1]; break;
        case QK_FORMAT_YV12: s.v = d[base + planar], s.u = d[base + quarter + planar]; break;
        case QK_FORMAT_YUVP: s.u = d[base + planar], s.v = d[base + quarter + planar]; break;
    }
    return s;
}

constexpr uint32_t kYuv420Formats[] = {QK_FORMAT_NV12, QK_FORMAT_NV21, QK_FORMAT_YV12, QK_FORMAT_YUVP};

}  // namespace qktest

#endif  // QKCORE_TESTS_GEOMETRY_IMAGES_H
