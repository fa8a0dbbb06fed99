#include <stdint.h>

#include "geometry/geometry.h"
#include "image/checks.h"
#include "image/format.h"
#include "qkcore/qk_image.h"
#include "util/status.h"

int32_t QKImage_crop(const QKImage* src, QKImage* dst, int32_t x, int32_t y) {
    if (src == nullptr || dst == nullptr) return QK_FAIL(QK_ERROR_NULL_PARAM);
    if (src->data == nullptr) return QK_FAIL(QK_ERROR_NULL_PARAM);
    if (QKImage_size(src) == 0 || !qk::buffer_holds_image(*src)) return QK_FAIL(QK_ERROR_INVALID_SIZE);
    if (src->format != dst->format) return QK_FAIL(QK_ERROR_INVALID_PARAM);
    // The rectangle is the destination's own size, so it must lie inside the
    // source (64-bit sums: no wrap for extreme values).
    const int32_t width = dst->width;
    const int32_t height = dst->height;
    if (x < 0 || int64_t{x} + width > src->width) return QK_FAIL(QK_ERROR_INVALID_SIZE);
    if (y < 0 || int64_t{y} + height > src->height) return QK_FAIL(QK_ERROR_INVALID_SIZE);
    // A destination that brings its own buffer, or a preset size for the one
    // it is about to get, must hold the whole rectangle in its format.
    if (dst->data != nullptr || dst->size != 0) {
        if (width < 1 || height < 1 || !qk::buffer_holds_image(*dst)) return QK_FAIL(QK_ERROR_INVALID_SIZE);
    }
    const int32_t allocated = QKImage_allocate(dst);
    if (allocated < 0) return allocated;

    const qk::Region region{x, y, 0, 0, width, height};
    if (qk::is_rgb_format(dst->format)) {
        qk::copy_region(*src, *dst, region);
        return QK_OK;
    }
    if (!qk::is_yuv420_format(dst->format)) return QK_FAIL(QK_ERROR_UNSUPPORTED);
    // One chroma sample covers 2x2 pixels: the corner and both images' sizes
    // lie on that grid.
    if (!qk::on_chroma_grid(dst->format, x, y) || !qk::on_chroma_grid(dst->format, src->width, src->height) ||
        !qk::on_chroma_grid(dst->format, width, height)) {
        return QK_FAIL(QK_ERROR_INVALID_SIZE);
    }
    qk::copy_region(*src, *dst, region);
    return QK_OK;
}
