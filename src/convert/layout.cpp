#include "convert/layout.h"

#include "image/format.h"

namespace qk {

YuvLayout yuv_layout(const QKImage& image) {
    switch (image.format) {
        case QK_FORMAT_NV12:
        case QK_FORMAT_NV21: {
            const ChromaStart chroma = chroma_start(image);
            return {1, 2, chroma.u, chroma.v, true};
        }
        case QK_FORMAT_YV12:
        case QK_FORMAT_YUVP: {
            const ChromaStart chroma = chroma_start(image);
            return {1, 1, chroma.u, chroma.v, true};
        }
        case QK_FORMAT_YUYV: return {2, 4, 1, 3, false};
        case QK_FORMAT_YVYU: return {2, 4, 3, 1, false};
        case QK_FORMAT_GREY: return {1, 0, 0, 0, false};
        default: return {0, 0, 0, 0, false};
    }
}

}  // namespace qk
