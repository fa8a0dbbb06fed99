#include "convert/layout.h"

#include "image/format.h"

namespace qk {

int rgb_format_index(uint32_t format) {
    for (int i = 0; i < kRgbFormatCount; ++i) {
        if (kRgbFormats[i] == format) return i;
    }
    return -1;
}

YuvLayout yuv_layout(const QKImage& image) {
    const uint64_t base = chroma_base(image);
    // A quarter of the luma plane: the size of one planar chroma plane.
    const uint64_t quarter = static_cast<uint64_t>(image.width) * static_cast<uint64_t>(image.height) / 4;
    switch (image.format) {
        case QK_FORMAT_NV12: return {1, 2, base, base + 1, true};
        case QK_FORMAT_NV21: return {1, 2, base + 1, base, true};
        case QK_FORMAT_YV12: return {1, 1, base + quarter, base, true};
        case QK_FORMAT_YUVP: return {1, 1, base, base + quarter, true};
        case QK_FORMAT_YUYV: return {2, 4, 1, 3, false};
        case QK_FORMAT_YVYU: return {2, 4, 3, 1, false};
        case QK_FORMAT_GREY: return {1, 0, 0, 0, false};
        default: return {0, 0, 0, 0, false};
    }
}

}  // namespace qk
