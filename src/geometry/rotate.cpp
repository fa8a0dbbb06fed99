#include <stdint.h>

#include "platform/raster.h"
#include "qkcore/qk_image.h"
#include "util/log.h"
#include "util/status.h"

namespace {

// Turns an RGBA image that has a buffer in place by `angle` degrees (a
// multiple of 90); QKImage_rotate's RGBA path. QK_OK, or a failure status
// with its report and the image unchanged.
int32_t rotate_rgba(QKImage* image, int32_t angle) {
    const int32_t width = image->width;
    const int32_t height = image->height;
    // Counter-clockwise quarter turns as displayed, 0..3.
    const int orient = ((angle / 90) % 4 + 4) % 4;
    const bool exchanged = orient % 2 == 1;
    const int32_t out_width = exchanged ? height : width;
    const int32_t out_height = exchanged ? width : height;
    // Integer pivots: for an odd dimension the turned picture lands one pixel
    // short, and the far output row or column stays uncovered.
    int32_t pivot_x = width / 2;
    int32_t pivot_y = height / 2;
    if (orient == 1) pivot_y = width / 2;
    if (orient == 3) pivot_x = height / 2;
    QK_LOG(QK_LOG_DEBUG,
           "Rotation parameters: angle = %d, orient = %d, in w/h = %dx%d, out w/h = %dx%d, pivot = %d,%d", angle,
           orient, width, height, out_width, out_height, pivot_x, pivot_y);

    // The turned picture is written back over the whole buffer, so the buffer
    // must be exactly one picture: a larger one would keep stale bytes past
    // it, a smaller one cannot be read in full.
    const uint64_t picture_bytes = QKImage_requiredSize(width, height, image->format);
    if (picture_bytes == 0 || QKImage_size(image) != picture_bytes) return QK_FAIL(QK_ERROR_INVALID_SIZE);
    // No turn: the bytes stay as they are.
    if (orient == 0) return QK_OK;

    qk::platform::Bitmap picture;
    picture.borrow(image->data, width, height);
    // The raster layer turns clockwise: the library's counter-clockwise angle
    // is negated. Pixels are copied as they are, translucent ones included;
    // the uncovered row or column ends up transparent black.
    if (!qk::platform::turn_in_place(picture, -(angle / 90), pivot_x, pivot_y)) {
        return QK_FAIL(QK_ERROR_ALLOC_FAILED);
    }
    image->width = out_width;
    image->height = out_height;
    return QK_OK;
}

// ---- Images in other formats: turned through a temporary RGBA copy ----

// Converts to a temporary RGBA image, turns it, and converts back into the
// caller's buffer, stopping at the first failure. The temporary owns only the
// buffer it allocates, freed when it goes out of scope on every path.
int32_t rotate_through_rgba(QKImage* image, int32_t angle) {
    QKImage rgba;
    rgba.width = image->width;
    rgba.height = image->height;
    rgba.format = QK_FORMAT_RGBA;
    const int32_t allocated = QKImage_allocate(&rgba);
    if (allocated < 0) return allocated;
    int32_t status = QKImage_convert(image, &rgba);
    if (status == QK_OK) status = rotate_rgba(&rgba, angle);
    if (status == QK_OK) status = QKImage_convert(&rgba, image);
    return status;
}

}  // namespace

// ---- Entry point ----

int32_t QKImage_rotate(QKImage* image, int32_t angle) {
    if (image == nullptr || image->data == nullptr) return QK_FAIL(QK_ERROR_NULL_PARAM);
    if (angle % 90 != 0) return QK_FAIL(QK_ERROR_INVALID_PARAM);
    if (QKImage_size(image) == 0) return QK_FAIL(QK_ERROR_INVALID_SIZE);
    if (image->format == QK_FORMAT_RGBA) return rotate_rgba(image, angle);
    QK_LOG(QK_LOG_WARN,
           "Rotation is supported on RGBA images only for now: using temporary RGBA copy of this %dx%d '%4.4s' image",
           image->width, image->height, QK_FOURCC_STR(image->format));
    return rotate_through_rgba(image, angle);
}
