#include <stdint.h>

#include <algorithm>

#include "geometry/geometry.h"
#include "image/checks.h"
#include "image/format.h"
#include "qkcore/qk_image.h"
#include "util/log.h"
#include "util/status.h"

namespace {

constexpr const char* kDraw = "QKImage_drawImage";

}  // namespace

int32_t QKImage_drawImage(const QKImage* src, QKImage* dst, int32_t x, int32_t y) {
    if (src == nullptr || dst == nullptr) return QK_FAIL(QK_ERROR_NULL_PARAM);
    if (src->data == nullptr || dst->data == nullptr) return QK_FAIL(QK_ERROR_NULL_PARAM);
    if (QKImage_size(src) == 0 || !qk::buffer_holds_image(*src) || !qk::buffer_holds_image(*dst)) {
        return QK_FAIL(QK_ERROR_INVALID_SIZE);
    }
    if (src->format != dst->format) return QK_FAIL(QK_ERROR_INVALID_PARAM);

    // 64-bit: offsets and sizes near the int32 limits must not wrap.
    const int64_t sw = src->width, sh = src->height, dw = dst->width, dh = dst->height;
    if (dw <= x || dh <= y || sw + x < 0 || sh + y < 0) {
        QK_LOG(QK_LOG_WARN, "In %s, the source image %dx%d is completely out of the destination %dx%d at %d,%d", kDraw,
               src->width, src->height, dst->width, dst->height, x, y);
        return QK_OK;
    }
    if (qk::is_yuv420_format(src->format)) {
        if (!qk::on_chroma_grid(src->format, x, y) || !qk::on_chroma_grid(src->format, sw, sh)) {
            QK_LOG(QK_LOG_ERROR, "Unsupported dimensions for YUV420: %dx%d offset %d,%d", src->width, src->height, x,
                   y);
            return QK_FAIL(QK_ERROR_UNSUPPORTED);
        }
        if (!qk::on_chroma_grid(src->format, dw, dh)) return QK_FAIL(QK_ERROR_INVALID_SIZE);
    } else if (!qk::is_rgb_format(src->format)) {
        return QK_FAIL(QK_ERROR_UNSUPPORTED);
    }

    // The overlap of [x, x + sw) with [0, dw), and likewise for the rows.
    const int64_t cols = std::min(x + sw, dw) - std::max<int64_t>(x, 0);
    const int64_t lines = std::min(y + sh, dh) - std::max<int64_t>(y, 0);
    if (cols < 1 || lines < 1) {
        QK_LOG(QK_LOG_WARN, "Nothing to draw (lines = %d, cols = %d)", static_cast<int32_t>(lines),
               static_cast<int32_t>(cols));
        return QK_OK;
    }
    const qk::Region region{std::max(-x, 0), std::max(-y, 0), std::max(x, 0), std::max(y, 0),
                            static_cast<int32_t>(cols), static_cast<int32_t>(lines)};
    qk::copy_region(*src, *dst, region);
    return QK_OK;
}
