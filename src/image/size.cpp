#include <stdint.h>

#include "image/format.h"
#include "qkcore/qk_image.h"

namespace {

// Bytes of a w x h buffer of the format, or 0 when the format has no size rule.
uint64_t rule_size(uint64_t pixels, uint32_t format) {
    switch (format) {
        case QK_FORMAT_RGBA:
        case QK_FORMAT_BGRA:
        case QK_FORMAT_ARGB:
        case QK_FORMAT_ABGR: return 4 * pixels;
        case QK_FORMAT_RGB8:
        case QK_FORMAT_BGR8: return 3 * pixels;
        case QK_FORMAT_GREY: return pixels;
        case QK_FORMAT_YUYV:
        case QK_FORMAT_YVYU:
        case QK_FORMAT_D16: return 2 * pixels;
        case QK_FORMAT_NV12:
        case QK_FORMAT_NV21:
        case QK_FORMAT_YV12:
        case QK_FORMAT_YUVP: return (3 * pixels + 1) / 2;
        case QK_FORMAT_PCL: return 16 * pixels + 36;
        default: return 0;
    }
}

}  // namespace

// Sizes are computed in 64 bits and refused past the signed 32-bit range of
// byte counts, so a size that wrapped can never reach an allocation.
uint64_t QKImage_requiredSize(int32_t width, int32_t height, uint32_t format) {
    if (width < 1 || height < 1) return 0;
    const uint64_t pixels = static_cast<uint64_t>(width) * static_cast<uint64_t>(height);
    // Every format takes at least a byte a pixel, so more pixels than that is
    // out of range, and below it no rule can wrap (PCL's 16 x 2^62 would).
    if (pixels > INT32_MAX) return 0;
    const uint64_t size = rule_size(pixels, format);
    return size > INT32_MAX ? 0 : size;
}

uint64_t QKImage_size(const QKImage* image) {
    if (image == nullptr) return 0;
    if (image->size != 0) return image->size;
    return QKImage_requiredSize(image->width, image->height, image->format);
}

namespace qk {

bool buffer_holds_image(const QKImage& image) {
    uint64_t needed = QKImage_requiredSize(image.width, image.height, image.format);
    if (needed == 0) {
        // Dimensions whose picture passes the largest byte count fit no
        // buffer, whatever size it records. Without a size rule or with a
        // dimension below 1 there is no picture to read.
        return image.width < 1 || image.height < 1 || QKImage_requiredSize(1, 1, image.format) == 0;
    }
    if (image.size != 0 && image.size != 0 && image.chromaOffset != 0 && is_yuv420_format(image.format)) {
        needed = yuv420_extent(image.chromaOffset, image.width, image.height);
    }
    return QKImage_size(&image) >= needed;
}

}  // namespace qk
