#include <stddef.h>
#include <stdint.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>

#include "convert/row.h"
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

// ---- 4:2:0 images: through RGBA, one tile at a time ----

// Output tiles are kTile x kTile pixels at most: their two RGBA copies (the
// source region as it lies, and turned) stay in the second-level cache, and
// rows of 128 pixels leave the row kernels short tails only.
constexpr int32_t kTile = 128;

// Turns a 4:2:0 image with the bytes that converting it to RGBA, turning
// that and converting back would give, without the frame-sized RGBA copy:
// the RGBA of a pixel depends on its own luma and chroma pair only, and the
// chroma written back is that of the top-left pixel of each 2x2 block, so
// each output tile is made from the source region it shows, converted with
// the row kernels of QKImage_convert, turned, and converted back. The
// dimensions are even, so the turn covers every pixel. The turned planes
// take the place of the source's in the caller's buffer, which is why the
// source is read from a copy of its planes: a plane cannot be turned onto
// itself tile by tile without overwriting what later tiles read, and the
// copy takes 1.5 bytes a pixel where the RGBA frame took 4.
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

    const size_t luma_bytes = qk::yuv420_luma_bytes(width, height);
    const size_t chroma_bytes = qk::yuv420_chroma_bytes(width, height);
    // One block: the copy of the planes, then the two RGBA tiles.
    constexpr size_t kTileBytes = size_t{kTile} * kTile * qk::platform::kBitmapBytesPerPixel;
    uint8_t* const source =
        static_cast<uint8_t*>(qk::platform::allocate_pixels(luma_bytes + chroma_bytes + 2 * kTileBytes));
    if (source == nullptr) return QK_FAIL(QK_ERROR_ALLOC_FAILED);
    uint8_t* const region = source + luma_bytes + chroma_bytes;
    uint8_t* const turned_tile = region + kTileBytes;
    memcpy(source, image->data, luma_bytes);
    memcpy(source + luma_bytes, image->data + qk::chroma_base(*image), chroma_bytes);

    const qk::YuvLayout& layout = qk::yuv_layout(image->format);
    const ptrdiff_t step = layout.chromaStep;
    const qk::ChromaStart in = qk::chroma_start(image->format, luma_bytes, width, height);
    const qk::ChromaStart out = qk::chroma_start(
        image->format, qk::chroma_base(image->chromaOffset, out_width, out_height), out_width, out_height);
    const int rgba = qk::rgb_format_index(QK_FORMAT_RGBA);
    const qk::YuvToRgbShape to_rgb_shape{1, layout.chromaStep, 2, qk::kFormats[rgba].rgb};
    const qk::RgbToYuvShape to_yuv_shape{qk::kFormats[rgba].rgb, 1, layout.chromaStep};
    const qk::YuvToRgbRow to_rgb = qk::select_yuv_to_rgb_row(rgba, 1, layout.chromaStep, 2);
    const qk::RgbToLumaRow to_luma = qk::select_rgb_to_luma_row(rgba, 1);
    const qk::RgbToChromaRow to_chroma = qk::select_rgb_to_chroma_row(rgba, layout.chromaStep);
    // The raster layer turns clockwise.
    const int quarter_turns = -orient;

    uint8_t* const data = image->data;
    for (int32_t r0 = 0; r0 < out_height; r0 += kTile) {
        const int32_t rows = std::min(kTile, out_height - r0);
        for (int32_t c0 = 0; c0 < out_width; c0 += kTile) {
            const int32_t cols = std::min(kTile, out_width - c0);
            // The source rectangle [x0, x0 + region_width) x [y0, y0 + region_height)
            // that output columns [c0, c0 + cols) of rows [r0, r0 + rows) show.
            int32_t x0 = c0, y0 = r0;
            switch (orient) {
                case 1: x0 = width - r0 - rows, y0 = c0; break;
                case 2: x0 = width - c0 - cols, y0 = height - r0 - rows; break;
                case 3: x0 = r0, y0 = height - c0 - cols; break;
            }
            const int32_t region_width = exchanged ? rows : cols;
            const int32_t region_height = exchanged ? cols : rows;
            const size_t region_row_bytes = static_cast<size_t>(region_width) * qk::platform::kBitmapBytesPerPixel;
            for (int32_t y = 0; y < region_height; y += 2) {
                const uint8_t* luma = source + static_cast<ptrdiff_t>(y0 + y) * width + x0;
                const ptrdiff_t offset = ((y0 + y) / 2 * static_cast<ptrdiff_t>(width / 2) + x0 / 2) * step;
                uint8_t* pixels = region + y * region_row_bytes;
                to_rgb(luma, luma + width, source + in.u + offset, source + in.v + offset, pixels,
                       pixels + region_row_bytes, region_width, to_rgb_shape);
            }
            const uint8_t* tile = region;
            const size_t tile_row_bytes = static_cast<size_t>(cols) * qk::platform::kBitmapBytesPerPixel;
            if (orient != 0) {
                qk::platform::turn_copy(region, region_row_bytes, region_width, region_height, quarter_turns,
                                        turned_tile, tile_row_bytes);
                tile = turned_tile;
            }
            for (int32_t r = 0; r < rows; ++r) {
                const uint8_t* pixels = tile + r * tile_row_bytes;
                to_luma(pixels, data + static_cast<ptrdiff_t>(r0 + r) * out_width + c0, cols, to_yuv_shape);
                if (r % 2 != 0) continue;
                const ptrdiff_t offset = ((r0 + r) / 2 * static_cast<ptrdiff_t>(out_width / 2) + c0 / 2) * step;
                to_chroma(pixels, data + out.u + offset, data + out.v + offset, cols / 2, to_yuv_shape);
            }
        }
    }
    free(source);
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
