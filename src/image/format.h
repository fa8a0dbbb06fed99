// Format families and buffer geometry shared by the image operations.
#ifndef QKCORE_SRC_IMAGE_FORMAT_H
#define QKCORE_SRC_IMAGE_FORMAT_H

#include <stdint.h>

#include "qkcore/qk_image.h"

namespace qk {

inline bool is_rgb_format(uint32_t f) {
    return f == QK_FORMAT_RGBA || f == QK_FORMAT_BGRA || f == QK_FORMAT_ARGB || f == QK_FORMAT_ABGR ||
           f == QK_FORMAT_RGB8 || f == QK_FORMAT_BGR8;
}
inline bool is_yuv420_format(uint32_t f) {
    return f == QK_FORMAT_NV12 || f == QK_FORMAT_NV21 || f == QK_FORMAT_YV12 || f == QK_FORMAT_YUVP;
}
inline bool is_packed422_format(uint32_t f) { return f == QK_FORMAT_YUYV || f == QK_FORMAT_YVYU; }
inline bool is_yuv_format(uint32_t f) {
    return is_yuv420_format(f) || is_packed422_format(f) || f == QK_FORMAT_GREY;
}

// Bytes per pixel of the RGB family (3 or 4), 0 for other formats.
inline int rgb_bytes_per_pixel(uint32_t f) {
    if (f == QK_FORMAT_RGB8 || f == QK_FORMAT_BGR8) return 3;
    return is_rgb_format(f) ? 4 : 0;
}

// Offset of a 4:2:0 image's first chroma plane: its chromaOffset when
// nonzero, else right after the width x height luma plane. 64-bit so that
// callers can compare it with a buffer size without wrapping. The first form
// serves images about to take other dimensions.
inline uint64_t chroma_base(uint32_t chromaOffset, int32_t width, int32_t height) {
    if (chromaOffset != 0) return chromaOffset;
    return static_cast<uint64_t>(static_cast<int64_t>(width) * height);
}
inline uint64_t chroma_base(const QKImage& image) {
    return chroma_base(image.chromaOffset, image.width, image.height);
}

}  // namespace qk

#endif  // QKCORE_SRC_IMAGE_FORMAT_H
