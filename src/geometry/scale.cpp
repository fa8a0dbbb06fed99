#include <stdint.h>

#include "image/checks.h"
#include "platform/raster.h"
#include "qkcore/qk_image.h"
#include "util/log.h"
#include "util/status.h"

namespace {

constexpr const char* kScale = "QKImage_scale";

bool overlap(const uint8_t* a, uint64_t a_size, const uint8_t* b, uint64_t b_size) {
    const uintptr_t a0 = reinterpret_cast<uintptr_t>(a);
    const uintptr_t b0 = reinterpret_cast<uintptr_t>(b);
    return a0 < b0 + b_size && b0 < a0 + a_size;
}

}  // namespace

int32_t QKImage_scale(const QKImage* src, QKImage* dst) {
    if (src == nullptr || dst == nullptr || src->data == nullptr) return QK_FAIL(QK_ERROR_NULL_PARAM);
    if (src->width < 1 || src->height < 1 || dst->width < 1 || dst->height < 1) {
        QK_LOG(QK_LOG_ERROR, "%s: invalid image dimensions (<=0)", kScale);
        return QK_FAIL(QK_ERROR_INVALID_SIZE);
    }
    if (src->format != QK_FORMAT_RGBA || dst->format != QK_FORMAT_RGBA) {
        QK_LOG(QK_LOG_ERROR, "%s supports only ANDROID_BITMAP format for now", kScale);
        return QK_FAIL(QK_ERROR_INVALID_PARAM);
    }
    // The source is read in full and the destination written in full: a
    // buffer that does not hold its picture is refused before anything is
    // touched.
    if (!qk::buffer_holds_image(*src)) return QK_FAIL(QK_ERROR_INVALID_SIZE);
    if ((dst->data != nullptr || dst->size != 0) && !qk::buffer_holds_image(*dst)) {
        return QK_FAIL(QK_ERROR_INVALID_SIZE);
    }
    if (dst->data == nullptr) {
        const int32_t allocated = QKImage_allocate(dst);
        if (allocated < 0) {
            QK_LOG(QK_LOG_ERROR, "%s: allocation failed (%d bytes)", kScale,
                   static_cast<int32_t>(QKImage_size(dst)));
            return allocated;
        }
    }

    const uint64_t src_bytes = QKImage_requiredSize(src->width, src->height, src->format);
    const uint64_t dst_bytes = QKImage_requiredSize(dst->width, dst->height, dst->format);
    const float scale_x = static_cast<float>(dst->width) / static_cast<float>(src->width);
    const float scale_y = static_cast<float>(dst->height) / static_cast<float>(src->height);
    qk::platform::Bitmap source;
    source.borrow(src->data, src->width, src->height);
    // Resampling goes straight into the destination's buffer, unless that
    // buffer shares memory with the source: then into a bitmap of its own,
    // copied over afterwards. It writes every pixel: nothing to clear first.
    const bool shared = overlap(src->data, src_bytes, dst->data, dst_bytes);
    qk::platform::Bitmap output;
    if (shared) {
        if (!output.allocate(dst->width, dst->height, /*cleared=*/false)) return QK_FAIL(QK_ERROR_ALLOC_FAILED);
    } else {
        output.borrow(dst->data, dst->width, dst->height);
    }
    qk::platform::draw_scaled(source, scale_x, scale_y, output);
    if (shared) output.copy_to(dst->data, dst_bytes);
    return QK_OK;
}
