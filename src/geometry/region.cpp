#include <stdint.h>
#include <string.h>

#include <algorithm>

#include "geometry/geometry.h"
#include "image/format.h"

namespace qk {

namespace {

// Copies `rows` rows of `row_bytes` bytes. When an image is drawn into
// itself the rows may overlap: they are then taken in the order that reads
// every source row before it is overwritten.
void copy_rows(const uint8_t* src, int64_t src_stride, uint8_t* dst, int64_t dst_stride, int64_t row_bytes,
               int64_t rows) {
    if (row_bytes <= 0 || rows <= 0) return;
    const size_t length = static_cast<size_t>(row_bytes);
    if (reinterpret_cast<uintptr_t>(dst) > reinterpret_cast<uintptr_t>(src)) {
        for (int64_t r = rows - 1; r >= 0; --r) memmove(dst + r * dst_stride, src + r * src_stride, length);
    } else {
        for (int64_t r = 0; r < rows; ++r) memmove(dst + r * dst_stride, src + r * src_stride, length);
    }
}

// Copies a cols x lines block of a plane with `unit` bytes per sample and
// rows of `width` samples.
void copy_block(const uint8_t* src_plane, int64_t src_width, int64_t src_x, int64_t src_y, uint8_t* dst_plane,
                int64_t dst_width, int64_t dst_x, int64_t dst_y, int64_t cols, int64_t lines, int unit) {
    copy_rows(src_plane + (src_y * src_width + src_x) * unit, src_width * unit,
              dst_plane + (dst_y * dst_width + dst_x) * unit, dst_width * unit, cols * unit, lines);
}

}  // namespace

void copy_region(const QKImage& src, QKImage& dst, const Region& region) {
    const int64_t sw = src.width, dw = dst.width;
    const int64_t sx = region.src_x, sy = region.src_y, dx = region.dst_x, dy = region.dst_y;
    const int64_t cols = region.cols, lines = region.lines;
    const int bytes_per_pixel = rgb_bytes_per_pixel(src.format);
    if (bytes_per_pixel != 0) {
        copy_block(src.data, sw, sx, sy, dst.data, dw, dx, dy, cols, lines, bytes_per_pixel);
        return;
    }

    copy_block(src.data, sw, sx, sy, dst.data, dw, dx, dy, cols, lines, 1);
    const ChromaStart from = chroma_start(src);
    const ChromaStart to = chroma_start(dst);
    if (yuv_layout(src.format).chromaStep == 2) {
        // One plane of U,V pairs: rows of `width` bytes, pairs copied as they stand.
        copy_block(src.data + std::min(from.u, from.v), sw, sx, sy / 2, dst.data + std::min(to.u, to.v), dw, dx,
                   dy / 2, cols, lines / 2, 1);
        return;
    }
    // Two planes, V and U, of half-width rows.
    copy_block(src.data + from.v, sw / 2, sx / 2, sy / 2, dst.data + to.v, dw / 2, dx / 2, dy / 2, cols / 2,
               lines / 2, 1);
    copy_block(src.data + from.u, sw / 2, sx / 2, sy / 2, dst.data + to.u, dw / 2, dx / 2, dy / 2, cols / 2,
               lines / 2, 1);
}

}  // namespace qk
