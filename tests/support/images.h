// Small images whose bytes all differ, and snapshots that show whether an
// operation left an image alone.
#ifndef QKCORE_TESTS_SUPPORT_IMAGES_H
#define QKCORE_TESTS_SUPPORT_IMAGES_H

#include <stdint.h>
#include <string.h>

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

inline std::string fourcc(uint32_t code) {
    std::string name(reinterpret_cast<const char*>(&code), 4);
    return name.substr(0, name.find('\0'));
}

// Byte i becomes (i * 37 + seed) mod 256: in buffers of up to 256 bytes every
// byte differs, so a byte taken from the wrong place shows.
inline void fill_distinct(QKImage& image, uint8_t seed = 11) {
    for (uint64_t i = 0; i < QKImage_size(&image); ++i) image.data[i] = static_cast<uint8_t>(i * 37 + seed);
}

inline ImagePtr distinct_image(int32_t width, int32_t height, uint32_t format, uint8_t seed = 11) {
    ImagePtr image(QKImage_createNew(width, height, format));
    fill_distinct(*image, seed);
    return image;
}

// Opaque RGBA pixel number i, distinct for i < 65536.
inline uint32_t rgba_pixel(int i) {
    return static_cast<uint32_t>(i & 0xff) | static_cast<uint32_t>((i >> 8) & 0xff) << 8 | 0x5au << 16 | 0xffu << 24;
}

inline uint32_t pixel_at(const QKImage& image, int32_t x, int32_t y) {
    uint32_t value;
    memcpy(&value, image.data + (static_cast<size_t>(y) * image.width + x) * 4, 4);
    return value;
}

// An RGBA image whose pixel (x, y) is rgba_pixel(y * width + x).
inline ImagePtr numbered_rgba(int32_t width, int32_t height) {
    ImagePtr image(QKImage_createNew(width, height, QK_FORMAT_RGBA));
    for (int32_t i = 0; i < width * height; ++i) {
        const uint32_t pixel = rgba_pixel(i);
        memcpy(image->data + 4 * i, &pixel, 4);
    }
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

inline bool is_yuv420(uint32_t f) {
    return f == QK_FORMAT_NV12 || f == QK_FORMAT_NV21 || f == QK_FORMAT_YV12 || f == QK_FORMAT_YUVP;
}

// What pixel (x, y) of a packed RGB or 4:2:0 image holds: its own bytes, or
// its Y, U and V samples, each addressed on its own from the format's layout
// and the image's chroma base.
inline std::vector<uint8_t> pixel_bytes(const QKImage& image, int32_t x, int32_t y) {
    const size_t w = static_cast<size_t>(image.width);
    if (!is_yuv420(image.format)) {
        const size_t bpp = QKImage_requiredSize(1, 1, image.format);
        return std::vector<uint8_t>(image.data + (y * w + x) * bpp, image.data + (y * w + x + 1) * bpp);
    }
    const size_t base = image.chromaOffset != 0 ? image.chromaOffset : w * image.height;
    const size_t quarter = w * image.height / 4;
    const uint8_t* d = image.data + base;
    const size_t pair = (y / 2) * w + (x / 2) * 2;   // NV12, NV21: U,V pairs in rows of w bytes
    const size_t plane = (y / 2) * (w / 2) + x / 2;  // YV12, YUVP: planes with rows of w / 2 bytes
    const uint8_t luma = image.data[y * w + x];
    switch (image.format) {
        case QK_FORMAT_NV12: return {luma, d[pair], d[pair + 1]};
        case QK_FORMAT_NV21: return {luma, d[pair + 1], d[pair]};
        case QK_FORMAT_YV12: return {luma, d[quarter + plane], d[plane]};
        default: return {luma, d[plane], d[quarter + plane]};  // YUVP
    }
}

constexpr uint32_t kDrawFormats[] = {QK_FORMAT_RGBA, QK_FORMAT_RGB8, QK_FORMAT_NV12,
                                     QK_FORMAT_NV21, QK_FORMAT_YV12, QK_FORMAT_YUVP};

}  // namespace qktest

#endif  // QKCORE_TESTS_SUPPORT_IMAGES_H
