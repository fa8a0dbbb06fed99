#include <stddef.h>
#include <stdint.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>

#include "convert/row.h"
#include "geometry/plane_turn.h"
#include "image/checks.h"
#include "image/format.h"
#include "platform/memory.h"
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

// ---- 4:2:0 images: planes turned, then the RGBA round trip row by row ----

// Turns a 4:2:0 image with the bytes that converting it to RGBA, turning
// that and converting back would give, without the frame-sized RGBA copy.
// The RGBA of a pixel depends on its own luma and the chroma pair of its
// 2x2 block only, and with even dimensions a turn maps 2x2 blocks onto 2x2
// blocks: so the planes are turned first, as they are (the chroma planes as
// planes of half the size), and each output pixel then sits over the luma
// and chroma of the pixel it shows. Converting the turned planes to RGBA
// gives the turned RGBA frame, two rows at a time, and converting those rows
// back writes what the RGBA road writes, in its order: the luma of an even
// row, the chroma of its 2x2 blocks (from their top-left pixels, as the
// RGBA road takes them), the luma of the odd row.
//
// The planes turn within the caller's buffer, but for the bottom half of a
// quarter turn's rows (a plane cannot take a quarter turn onto itself
// without overwriting what is still to be read), which go to scratch memory
// and are converted from there; each converted row pair reads only itself.
// The top half is turned into place band by band, each band converted
// right after.
//
// Chroma lying inside the luma plane is turned wholly into scratch memory
// instead, so that the conversion reads only what the RGBA road read.
int32_t rotate_yuv420(QKImage* image, int32_t angle) {
    const int32_t width = image->width;
    const int32_t height = image->height;
    // Refused as the conversions of the RGBA road refuse them.
    if (!qk::on_chroma_grid(image->format, width, height) || !qk::buffer_holds_image(*image) ||
        qk::yuv420_extent(qk::chroma_base(*image), width, height) > QKImage_size(image)) {
        return QK_FAIL(QK_ERROR_INVALID_SIZE);
    }
    const int orient = ((angle / 90) % 4 + 4) % 4;  // counter-clockwise quarter turns
    const bool exchanged = orient % 2 == 1;
    const int32_t out_width = exchanged ? height : width;
    const int32_t out_height = exchanged ? width : height;
    // No pixels (a dimension below 1, which the checks above let through):
    // no bytes to turn, only the dimensions.
    if (width < 1 || height < 1) {
        image->width = out_width;
        image->height = out_height;
        return QK_OK;
    }

    uint8_t* const data = image->data;
    const uint64_t base = qk::chroma_base(*image);
    const size_t luma_bytes = qk::yuv420_luma_bytes(width, height);
    const size_t plane_bytes = qk::yuv420_chroma_bytes(width, height) / 2;
    const bool in_place = base >= luma_bytes;
    // Output rows [0, top) are turned in place, the others into scratch
    // memory; top is even, so that chroma rows split at top / 2.
    const int32_t top = !in_place ? 0 : exchanged ? out_height / 4 * 2 : out_height;
    const size_t rest_luma_bytes = static_cast<size_t>(out_height - top) * out_width;
    const size_t rest_plane_bytes = rest_luma_bytes / 4;
    const size_t rgba_row_bytes = static_cast<size_t>(out_width) * qk::platform::kBitmapBytesPerPixel;
    // One block: the rest of the turned luma, of the turned chroma, and two
    // RGBA rows.
    const size_t scratch_bytes = rest_luma_bytes + 2 * rest_plane_bytes + 2 * rgba_row_bytes;
    uint8_t* const rest = static_cast<uint8_t*>(qk::platform::allocate_pixels(scratch_bytes));
    if (rest == nullptr) return QK_FAIL(QK_ERROR_ALLOC_FAILED);
    uint8_t* const rest_chroma = rest + rest_luma_bytes;
    uint8_t* const even = rest_chroma + 2 * rest_plane_bytes;
    uint8_t* const odd = even + rgba_row_bytes;

    // Chroma pairs turn as one plane of 2-byte elements, separate U and V
    // planes one after the other.
    const qk::YuvLayout& layout = qk::yuv_layout(image->format);
    const int step = layout.chromaStep;
    const int chroma_planes = step == 2 ? 1 : 2;
    uint8_t* const chroma_plane[2] = {data + base, data + base + plane_bytes};
    if (!in_place) {
        qk::turn_plane(data, width, width, height, 1, orient, rest, out_width);
        for (int p = 0; p < chroma_planes; ++p) {
            qk::turn_plane(chroma_plane[p], width / 2 * step, width / 2, height / 2, step, orient,
                           rest_chroma + p * rest_plane_bytes, out_width / 2 * step);
        }
    } else {
        // A half turn's row in `even`.
        qk::turn_plane_in_place(data, width, height, 1, orient, top, exchanged ? rest : even);
        for (int p = 0; p < chroma_planes; ++p) {
            qk::turn_plane_in_place(chroma_plane[p], width / 2, height / 2, step, orient, top / 2,
                                    exchanged ? rest_chroma + p * rest_plane_bytes : even);
        }
    }

    const int rgba = qk::rgb_format_index(QK_FORMAT_RGBA);
    const qk::YuvToRgbShape to_rgb_shape{1, step, 2, qk::kFormats[rgba].rgb};
    const qk::RgbToYuvShape to_yuv_shape{qk::kFormats[rgba].rgb, 1, step};
    const qk::YuvToRgbRow to_rgb = qk::select_yuv_to_rgb_row(rgba, 1, step, 2);
    const qk::RgbToLumaRow to_luma = qk::select_rgb_to_luma_row(rgba, 1);
    const qk::RgbToChromaRow to_chroma = qk::select_rgb_to_chroma_row(rgba, step);
    // U and V of the output, in place and in the scratch memory: a plane and
    // the offset in it (that of the sample in its pair).
    const qk::ChromaStart out = qk::chroma_start(image->format, base, out_width, out_height);
    auto rest_at = [&](uint64_t at) {
        const uint64_t offset = at - base;
        return rest_chroma + (step == 2 ? offset : offset / plane_bytes * rest_plane_bytes);
    };
    const uint8_t* const rest_u = rest_at(out.u);
    const uint8_t* const rest_v = rest_at(out.v);
    const ptrdiff_t chroma_row_bytes = static_cast<ptrdiff_t>(out_width / 2) * step;
    // Rows turned in place by a quarter turn come in bands, each converted
    // while the cache still holds it; as many rows as the plane turn's tiles
    // have source columns, so that each band reads whole tiles.
    constexpr int64_t kBand = 256;
    for (int64_t r0 = 0; r0 < out_height; r0 += kBand) {
        const int64_t r1 = std::min<int64_t>(r0 + kBand, out_height);
        if (exchanged && r0 < top) {
            const int32_t r1_top = static_cast<int32_t>(std::min<int64_t>(r1, top));
            const int32_t r0_top = static_cast<int32_t>(r0);
            qk::turn_gathered_rows(data, width, height, 1, orient, top, r0_top, r1_top);
            for (int p = 0; p < chroma_planes; ++p) {
                qk::turn_gathered_rows(chroma_plane[p], width / 2, height / 2, step, orient, top / 2, r0_top / 2,
                                       r1_top / 2);
            }
        }
        for (ptrdiff_t r = r0; r < r1; r += 2) {
            const ptrdiff_t offset = r / 2 * chroma_row_bytes;
            const ptrdiff_t rest_offset = (r - top) / 2 * chroma_row_bytes;
            const uint8_t* luma = r < top ? data + r * out_width : rest + (r - top) * out_width;
            const uint8_t* u = r < top ? data + out.u + offset : rest_u + rest_offset;
            const uint8_t* v = r < top ? data + out.v + offset : rest_v + rest_offset;
            to_rgb(luma, luma + out_width, u, v, even, odd, out_width, to_rgb_shape);
            to_luma(even, data + r * out_width, out_width, to_yuv_shape);
            to_chroma(even, data + out.u + offset, data + out.v + offset, out_width / 2, to_yuv_shape);
            to_luma(odd, data + (r + 1) * out_width, out_width, to_yuv_shape);
        }
    }
    free(rest);
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
    if (qk::is_yuv420_format(image->format)) return rotate_yuv420(image, angle);
    QK_LOG(QK_LOG_WARN,
           "Rotation is supported on RGBA images only for now: using temporary RGBA copy of this %dx%d '%4.4s' image",
           image->width, image->height, QK_FOURCC_STR(image->format));
    return rotate_through_rgba(image, angle);
}
