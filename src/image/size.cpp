#include <stdint.h>

#include "image/format.h"
#include "qkcore/qk_image.h"

// Sizes are computed in 64 bits and refused past the signed 32-bit range of
// byte counts, so a size that wrapped can never reach an allocation.
uint64_t QKImage_requiredSize(int32_t width, int32_t height, uint32_t format) {
    if (width < 1 || height < 1) return 0;
    const uint64_t pixels = static_cast<uint64_t>(width) * static_cast<uint64_t>(height);
    // Every format takes at least a byte a pixel, so more pixels than that is
    // out of range, and below it no rule can wrap (PCL's 16 x 2^62 would).
    if (pixels > INT32_MAX) return 0;
    const qk::FormatInfo* info = qk::find_format(format);
    const uint64_t size = info != nullptr ? info->size.bytes(pixels) : 0;
    return size > INT32_MAX ? 0 : size;
}

uint64_t QKImage_size(const QKImage* image) {
    if (image == nullptr) return 0;
    if (image->size != 0) return image->size;
    return QKImage_requiredSize(image->width, image->height, image->format);
}
