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

// Bytes a 4:2:0 image of these (positive) dimensions reaches into its buffer:
// its luma plane, and width x height / 2 bytes of chroma from the chroma base.
inline uint64_t yuv420_extent(uint32_t chromaOffset, int32_t width, int32_t height) {
    const uint64_t luma = static_cast<uint64_t>(width) * static_cast<uint64_t>(height);
    const uint64_t chroma_end = chroma_base(chromaOffset, width, height) + luma / 2;
    return chroma_end > luma ? chroma_end : luma;
}

// Where the U and V samples of a 4:2:0 image start: NV12 and NV21 interleave
// them from the chroma base, YV12 and YUVP hold two planes of
// (width x height) / 4 bytes each.
struct ChromaStart {
    uint64_t u;
    uint64_t v;
};
inline ChromaStart chroma_start(const QKImage& image) {
    const uint64_t base = chroma_base(image);
    const uint64_t plane = static_cast<uint64_t>(static_cast<int64_t>(image.width) * image.height / 4);
    switch (image.format) {
        case QK_FORMAT_NV12: return {base, base + 1};
        case QK_FORMAT_NV21: return {base + 1, base};
        case QK_FORMAT_YV12: return {base + plane, base};
        default: return {base, base + plane};  // YUVP
    }
}

// True when the image's buffer holds the whole picture that its width,
// height and format describe. A recorded size is checked against everything
// the picture occupies, 4:2:0 chroma at a separate chromaOffset included;
// without a recorded size the rule size is all there is to go by, and a
// chromaOffset past the luma plane is the caller's promise. A picture too
// large for any byte count never fits. Images with nothing to read (a
// dimension below 1, encoded or unknown formats) pass: the operations refuse
// them on their own terms.
bool buffer_holds_image(const QKImage& image);

}  // namespace qk

#endif  // QKCORE_SRC_IMAGE_FORMAT_H
