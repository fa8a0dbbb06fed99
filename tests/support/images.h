// Test images: owned ones, and ones over a buffer of the test's own; bytes
// that all differ, so a byte taken from the wrong place shows; snapshots that
// show whether an operation left an image alone.
#ifndef QKCORE_TESTS_SUPPORT_IMAGES_H
#define QKCORE_TESTS_SUPPORT_IMAGES_H

#include <stdint.h>
#include <string.h>

#include <algorithm>
#include <functional>
#include <memory>
#include <string>
#include <tuple>
#include <vector>

#include "qkcore/qk_image.h"

namespace qktest {

struct Destroy {
    void operator()(QKImage* image) const { QKImage_destroy(image); }
};
using ImagePtr = std::unique_ptr<QKImage, Destroy>;

// A format code as "%4.4s" prints it, or without the padding.
inline std::string fourcc(uint32_t code, bool padded = false) {
    std::string name(reinterpret_cast<const char*>(&code), 4);
    name = name.substr(0, name.find('\0'));
    return padded ? std::string(4 - name.size(), ' ') + name : name;
}

// The formats that convert to each other.
constexpr uint32_t kConvertibleFormats[13] = {
    QK_FORMAT_RGBA, QK_FORMAT_BGRA, QK_FORMAT_ARGB, QK_FORMAT_ABGR, QK_FORMAT_RGB8, QK_FORMAT_BGR8, QK_FORMAT_GREY,
    QK_FORMAT_YUYV, QK_FORMAT_YVYU, QK_FORMAT_NV12, QK_FORMAT_NV21, QK_FORMAT_YV12, QK_FORMAT_YUVP};

inline bool is_yuv420(uint32_t f) {
    return f == QK_FORMAT_NV12 || f == QK_FORMAT_NV21 || f == QK_FORMAT_YV12 || f == QK_FORMAT_YUVP;
}

// Places of the U and V bytes that cover pixel (x, y) of a width x height
// image whose 4:2:0 chroma starts at `base` (packed 4:2:2 too); false for
// formats without chroma.
inline bool chroma_places(uint32_t format, size_t width, size_t height, size_t base, size_t x, size_t y, size_t* u,
                          size_t* v) {
    const size_t semiPlanar = base + (y / 2) * width + (x / 2) * 2;
    const size_t planar = base + (y / 2) * (width / 2) + x / 2;
    const size_t quarter = width * height / 4;
    const size_t pair = (y * width + x / 2 * 2) * 2;
    switch (format) {
        case QK_FORMAT_NV12: *u = semiPlanar, *v = semiPlanar + 1; return true;
        case QK_FORMAT_NV21: *v = semiPlanar, *u = semiPlanar + 1; return true;
        case QK_FORMAT_YV12: *v = planar, *u = planar + quarter; return true;
        case QK_FORMAT_YUVP: *u = planar, *v = planar + quarter; return true;
        case QK_FORMAT_YUYV: *u = pair + 1, *v = pair + 3; return true;
        case QK_FORMAT_YVYU: *v = pair + 1, *u = pair + 3; return true;
        default: return false;
    }
}

// Byte i becomes (i * 37 + seed) mod 256: every byte of 256 differs.
inline void fill_distinct(uint8_t* bytes, size_t count, uint8_t seed = 11) {
    for (size_t i = 0; i < count; ++i) bytes[i] = static_cast<uint8_t>(i * 37 + seed);
}
inline ImagePtr distinct_image(int32_t width, int32_t height, uint32_t format, uint8_t seed = 11) {
    ImagePtr image(QKImage_createNew(width, height, format));
    fill_distinct(image->data, QKImage_size(image.get()), seed);
    return image;
}

// An image over `bytes` distinct bytes of its own (no buffer for 0) that
// records `size` and `chroma` as given.
struct ImageSpec { uint32_t format; int32_t width, height; size_t bytes; uint64_t size = 0; uint32_t chroma = 0; };
struct Frame {
    explicit Frame(const ImageSpec& spec, uint8_t seed = 11) : buffer(spec.bytes) {
        fill_distinct(buffer.data(), buffer.size(), seed);
        image.data = buffer.empty() ? nullptr : buffer.data();
        image.width = spec.width, image.height = spec.height, image.format = spec.format;
        image.isWrapped = 1, image.size = spec.size, image.chromaOffset = spec.chroma;
    }
    Frame(const Frame&) = delete;
    template <typename Random>
    void randomize(Random& random) { std::generate(buffer.begin(), buffer.end(), std::ref(random)); }
    std::vector<uint8_t> buffer;
    QKImage image;
};

// RGBA pixel number i (i < 65536), its alpha anything from 0 to 255.
inline uint32_t rgba_pixel(int i) {
    return static_cast<uint32_t>(i & 0xffff) | 0x5au << 16 | static_cast<uint32_t>(i * 53 + 7) << 24;
}
inline uint32_t pixel_at(const QKImage& image, int32_t x, int32_t y) {
    return reinterpret_cast<const uint32_t*>(image.data)[static_cast<size_t>(y) * image.width + x];
}
// An RGBA image whose pixel (x, y) is rgba_pixel(y * width + x).
inline ImagePtr numbered_rgba(int32_t width, int32_t height) {
    ImagePtr image(QKImage_createNew(width, height, QK_FORMAT_RGBA));
    for (int32_t i = 0; i < width * height; ++i) reinterpret_cast<uint32_t*>(image->data)[i] = rgba_pixel(i);
    return image;
}

// Every field of an image and the bytes of its buffer; the same for every
// null image.
inline auto snapshot(const QKImage* image) {
    static const QKImage none;
    const QKImage& i = image != nullptr ? *image : none;
    std::vector<uint8_t> bytes;
    if (i.data != nullptr) bytes.assign(i.data, i.data + QKImage_size(&i));
    return std::make_tuple(i.data, i.width, i.height, i.format, i.isWrapped, i.size, i.chromaOffset, bytes);
}

}  // namespace qktest

#endif  // QKCORE_TESTS_SUPPORT_IMAGES_H
