#include "planes.h"

#include <string.h>

#include "image/format.h"

namespace qk::jpeg {
namespace {

// The per-sample loops work on restrict-qualified rows so that the compiler
// can vectorise them; they are the only pixel work the module does itself.
void deinterleave(const uint8_t* __restrict pairs, uint8_t* __restrict first, uint8_t* __restrict second,
                  size_t count) {
    for (size_t j = 0; j < count; ++j) {
        first[j] = pairs[2 * j];
        second[j] = pairs[2 * j + 1];
    }
}

void interleave(const uint8_t* __restrict first, const uint8_t* __restrict second, uint8_t* __restrict pairs,
                size_t count) {
    for (size_t j = 0; j < count; ++j) {
        pairs[2 * j] = first[j];
        pairs[2 * j + 1] = second[j];
    }
}

}  // namespace

Chroma420 chroma420(int32_t width, int32_t height, uint32_t format) {
    const size_t luma = static_cast<size_t>(width) * static_cast<size_t>(height);
    const size_t samples = static_cast<size_t>(width / 2);
    const size_t rows = static_cast<size_t>(height / 2);
    // The library's own placement, chroma right after luma; at odd sizes the
    // planar formats' second plane leaves a gap after the first, never an
    // overlap.
    const ChromaStart start = chroma_start(format, luma, width, height);
    const size_t step = static_cast<size_t>(yuv_layout(format).chromaStep);
    return {start.u, start.v, step, step * samples, samples, rows};
}

void copy_plane(const uint8_t* src, size_t src_stride, uint8_t* dst, size_t dst_stride, size_t width,
                size_t height) {
    for (size_t r = 0; r < height; ++r) memcpy(dst + r * dst_stride, src + r * src_stride, width);
}

void pad_edges(uint8_t* plane, size_t stride, size_t width, size_t height, size_t padded_width,
               size_t padded_height) {
    if (padded_width > width) {
        for (size_t r = 0; r < height; ++r) {
            uint8_t* row = plane + r * stride;
            memset(row + width, row[width - 1], padded_width - width);
        }
    }
    for (size_t r = height; r < padded_height; ++r) {
        memcpy(plane + r * stride, plane + (height - 1) * stride, padded_width);
    }
}

void gather420(const uint8_t* src, const Chroma420& chroma, uint8_t* u, uint8_t* v, size_t plane_width,
               size_t plane_height) {
    if (chroma.samples == 0 || chroma.rows == 0) {
        // One pixel wide or high: the buffer holds no chroma at all.
        memset(u, kNeutralChroma, plane_width * plane_height);
        memset(v, kNeutralChroma, plane_width * plane_height);
        return;
    }
    if (chroma.step == 1) {
        copy_plane(src + chroma.u, chroma.rowBytes, u, plane_width, chroma.samples, chroma.rows);
        copy_plane(src + chroma.v, chroma.rowBytes, v, plane_width, chroma.samples, chroma.rows);
    } else {
        // Interleaved pairs start with U for NV12 and with V for NV21.
        const bool u_first = chroma.u < chroma.v;
        for (size_t r = 0; r < chroma.rows; ++r) {
            uint8_t* u_row = u + r * plane_width;
            uint8_t* v_row = v + r * plane_width;
            const uint8_t* pairs = src + (u_first ? chroma.u : chroma.v) + r * chroma.rowBytes;
            deinterleave(pairs, u_first ? u_row : v_row, u_first ? v_row : u_row, chroma.samples);
        }
    }
    pad_edges(u, plane_width, chroma.samples, chroma.rows, plane_width, plane_height);
    pad_edges(v, plane_width, chroma.samples, chroma.rows, plane_width, plane_height);
}

void scatter420(const uint8_t* u, const uint8_t* v, size_t plane_width, const Chroma420& chroma, uint8_t* dst) {
    const bool u_first = chroma.u < chroma.v;
    for (size_t r = 0; r < chroma.rows; ++r) {
        const uint8_t* u_row = u + r * plane_width;
        const uint8_t* v_row = v + r * plane_width;
        if (chroma.step == 1) {
            memcpy(dst + chroma.u + r * chroma.rowBytes, u_row, chroma.samples);
            memcpy(dst + chroma.v + r * chroma.rowBytes, v_row, chroma.samples);
        } else {
            uint8_t* pairs = dst + (u_first ? chroma.u : chroma.v) + r * chroma.rowBytes;
            interleave(u_first ? u_row : v_row, u_first ? v_row : u_row, pairs, chroma.samples);
        }
    }
}

void split422(const uint8_t* src, int32_t width, int32_t height, bool u_first, uint8_t* y, uint8_t* u,
              uint8_t* v) {
    const TurboPlanes planes = turbo_planes(width, height, false);
    const size_t w = static_cast<size_t>(width);
    const size_t pairs = w / 2;
    uint8_t* first = u_first ? u : v;
    uint8_t* second = u_first ? v : u;
    for (size_t r = 0; r < planes.lumaHeight; ++r) {
        const uint8_t* __restrict in = src + r * 2 * w;
        uint8_t* __restrict y_row = y + r * planes.lumaWidth;
        uint8_t* __restrict first_row = first + r * planes.chromaWidth;
        uint8_t* __restrict second_row = second + r * planes.chromaWidth;
        for (size_t j = 0; j < pairs; ++j) {
            y_row[2 * j] = in[4 * j];
            first_row[j] = in[4 * j + 1];
            y_row[2 * j + 1] = in[4 * j + 2];
            second_row[j] = in[4 * j + 3];
        }
        if (w % 2 != 0) {
            y_row[w - 1] = y_row[w] = in[4 * pairs];
            first_row[pairs] = in[4 * pairs + 1];
            second_row[pairs] = pairs > 0 ? second_row[pairs - 1] : kNeutralChroma;
        }
    }
}

}  // namespace qk::jpeg
