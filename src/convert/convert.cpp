// QKImage_convert: validation, same-format copies, the vendor fast path offer
// and the routing to the four kernels.
#include <stdint.h>
#include <string.h>

#include "convert/kernels.h"
#include "image/checks.h"
#include "image/format.h"
#include "platform/memory.h"
#include "qkcore/qk_converter.h"
#include "qkcore/qk_image.h"
#include "util/log.h"
#include "util/status.h"

namespace {

enum class Family { kRgb, kYuv, kOther };

Family family_of(uint32_t format) {
    if (qk::is_rgb_format(format)) return Family::kRgb;
    if (qk::is_yuv_format(format)) return Family::kYuv;
    return Family::kOther;
}

// memmove where the two overlap, because converting an image into itself is
// a harmless no-op.
void move_bytes(uint8_t* dst, const uint8_t* src, uint64_t bytes) {
    const uintptr_t to = reinterpret_cast<uintptr_t>(dst), from = reinterpret_cast<uintptr_t>(src);
    if (to + bytes <= from || from + bytes <= to) {
        qk::platform::copy_pixels(dst, src, bytes);
    } else {
        memmove(dst, src, bytes);
    }
}

// Same format: one block, or luma and chroma separately when the two images
// record different chroma offsets (0 and width x height name the same place,
// but a block of the recorded size would then run past the picture) or the
// block would miss the chroma.
void copy_same_format(const QKImage& src, QKImage& dst, uint64_t copy_length) {
    if (qk::is_yuv420_format(src.format)) {
        const uint64_t luma_bytes = qk::yuv420_luma_bytes(src.width, src.height);
        const uint64_t chroma_bytes = qk::yuv420_chroma_bytes(src.width, src.height);
        const uint64_t src_base = qk::chroma_base(src);
        const uint64_t dst_base = qk::chroma_base(dst);
        // One block only where it holds both planes and stays inside what
        // the source claims: chroma placed inside the luma plane makes a
        // picture shorter than the size rule.
        if (src.chromaOffset != dst.chromaOffset || copy_length < dst_base + chroma_bytes ||
            copy_length > QKImage_size(&src)) {
            move_bytes(dst.data, src.data, luma_bytes);
            move_bytes(dst.data + dst_base, src.data + src_base, chroma_bytes);
            return;
        }
    }
    move_bytes(dst.data, src.data, copy_length);
}

}  // namespace

int32_t QKImage_convert(const QKImage* src, QKImage* dst) {
    if (src == nullptr || dst == nullptr) return QK_FAIL(QK_ERROR_NULL_PARAM);
    QK_LOG(QK_LOG_DEBUG, "[QKImage] Converting from %dx%d %4.4s to %dx%d %4.4s", src->width, src->height,
           QK_FOURCC_STR(src->format), dst->width, dst->height, QK_FOURCC_STR(dst->format));
    if (src->data == nullptr || dst->data == nullptr) return QK_FAIL(QK_ERROR_INVALID_PARAM);

    const uint64_t needed = QKImage_requiredSize(src->width, src->height, dst->format);
    if (needed == 0) return QK_FAIL(QK_ERROR_INVALID_PARAM);
    // The 4:2:0 formats need an even width and height, the packed 4:2:2
    // formats an even width.
    if (!qk::on_chroma_grid(src->format, src->width, src->height)) return QK_FAIL(QK_ERROR_INVALID_SIZE);
    if (!qk::on_chroma_grid(dst->format, dst->width, dst->height)) return QK_FAIL(QK_ERROR_INVALID_SIZE);

    const Family src_family = family_of(src->format);
    const Family dst_family = family_of(dst->format);
    // The destination takes over the source's dimensions, which must suit its
    // format too: an RGB or GREY source of odd size cannot become 4:2:0 or
    // packed 4:2:2, nor a packed source of odd height 4:2:0.
    if (src_family != Family::kOther && !qk::on_chroma_grid(dst->format, src->width, src->height)) {
        return QK_FAIL(QK_ERROR_INVALID_SIZE);
    }

    const uint64_t capacity = QKImage_size(dst);
    if (capacity < needed) return QK_FAIL(QK_ERROR_INVALID_SIZE);
    // A chroma offset moves the chroma elsewhere in the buffer: it must still
    // end inside the destination's buffer. The source must hold its whole
    // picture where it records its size.
    if (qk::is_yuv420_format(dst->format) &&
        qk::yuv420_extent(qk::chroma_base(dst->chromaOffset, src->width, src->height), src->width, src->height) >
            capacity) {
        return QK_FAIL(QK_ERROR_INVALID_SIZE);
    }
    if (!qk::buffer_holds_image(*src)) return QK_FAIL(QK_ERROR_INVALID_SIZE);
    const uint64_t copy_length = (dst->size != 0 && dst->size == src->size) ? dst->size : needed;

    dst->width = src->width;
    dst->height = src->height;

    if (src->format == dst->format) {
        copy_same_format(*src, *dst, copy_length);
        return QK_OK;
    }
    if (src_family == Family::kRgb && dst_family == Family::kRgb) {
        qk::convert_rgb_to_rgb(*src, *dst);
        return QK_OK;
    }
    if (src_family == Family::kRgb && dst_family == Family::kYuv) {
        if (csc_run(src, dst) == QK_OK) {
            QK_LOG(QK_LOG_DEBUG, "[QKImage] Conversion successful with external CSC module");
            return QK_OK;
        }
        qk::convert_rgb_to_yuv(*src, *dst);
        return QK_OK;
    }
    if (src_family == Family::kYuv && dst_family == Family::kRgb) {
        qk::convert_yuv_to_rgb(*src, *dst);
        return QK_OK;
    }
    if (src_family == Family::kYuv && dst_family == Family::kYuv) {
        qk::convert_yuv_to_yuv(*src, *dst);
        return QK_OK;
    }
    QK_LOG(QK_LOG_ERROR, "[QKImage] Can not convert %4.4s into %4.4s", QK_FOURCC_STR(src->format),
           QK_FOURCC_STR(dst->format));
    return QK_FAIL(QK_ERROR_UNSUPPORTED);
}

QKImage* QKImage_copyAndConvert(const QKImage* src, uint32_t format) {
    if (src == nullptr) return nullptr;
    QKImage* image = QKImage_createNew(src->width, src->height, format);
    if (image == nullptr) return nullptr;
    if (QKImage_convert(src, image) != QK_OK) {
        QKImage_destroy(image);
        return nullptr;
    }
    return image;
}
