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

void copy_plane(const uint8_t* src, size_t srcStride, uint8_t* dst, size_t dstStride, size_t width,
                size_t height) {
    for (size_t r = 0; r < height; ++r) memcpy(dst + r * dstStride, src + r * srcStride, width);
}

void pad_edges(uint8_t* plane, size_t stride, size_t width, size_t height, size_t paddedWidth,
               size_t paddedHeight) {
    if (paddedWidth > width) {
        for (size_t r = 0; r < height; ++r) {
            uint8_t* row = plane + r * stride;
            memset(row + width, row[width - 1], paddedWidth - width);
        }
    }
    for (size_t r = height; r < paddedHeight; ++r) {
        memcpy(plane + r * stride, plane + (height - 1) * stride, paddedWidth);
    }
}

void gather420(const uint8_t* src, const Chroma420& chroma, uint8_t* u, uint8_t* v, size_t planeWidth,
               size_t planeHeight) {
    if (chroma.samples == 0 || chroma.rows == 0) {
        // One pixel wide or high: the buffer holds no chroma at all.
        memset(u, kNeutralChroma, planeWidth * planeHeight);
        memset(v, kNeutralChroma, planeWidth * planeHeight);
        return;
    }
    if (chroma.step == 1) {
        copy_plane(src + chroma.u, chroma.rowBytes, u, planeWidth, chroma.samples, chroma.rows);
        copy_plane(src + chroma.v, chroma.rowBytes, v, planeWidth, chroma.samples, chroma.rows);
    } else {
        // Interleaved pairs start with U for NV12 and with V for NV21.
        const bool uFirst = chroma.u < chroma.v;
        for (size_t r = 0; r < chroma.rows; ++r) {
            uint8_t* uRow = u + r * planeWidth;
            uint8_t* vRow = v + r * planeWidth;
            const uint8_t* pairs = src + (uFirst ? chroma.u : chroma.v) + r * chroma.rowBytes;
            deinterleave(pairs, uFirst ? uRow : vRow, uFirst ? vRow : uRow, chroma.samples);
        }
    }
    pad_edges(u, planeWidth, chroma.samples, chroma.rows, planeWidth, planeHeight);
    pad_edges(v, planeWidth, chroma.samples, chroma.rows, planeWidth, planeHeight);
}

void scatter420(const uint8_t* u, const uint8_t* v, size_t planeWidth, const Chroma420& chroma, uint8_t* dst) {
    const bool uFirst = chroma.u < chroma.v;
    for (size_t r = 0; r < chroma.rows; ++r) {
        const uint8_t* uRow = u + r * planeWidth;
        const uint8_t* vRow = v + r * planeWidth;
        if (chroma.step == 1) {
            memcpy(dst + chroma.u + r * chroma.rowBytes, uRow, chroma.samples);
            memcpy(dst + chroma.v + r * chroma.rowBytes, vRow, chroma.samples);
        } else {
            uint8_t* pairs = dst + (uFirst ? chroma.u : chroma.v) + r * chroma.rowBytes;
            interleave(uFirst ? uRow : vRow, uFirst ? vRow : uRow, pairs, chroma.samples);
        }
    }
}

void split422(const uint8_t* src, int32_t width, int32_t height, bool uFirst, uint8_t* y, uint8_t* u,
              uint8_t* v) {
    const TurboPlanes planes = turbo_planes(width, height, false);
    const size_t w = static_cast<size_t>(width);
    const size_t pairs = w / 2;
    uint8_t* first = uFirst ? u : v;
    uint8_t* second = uFirst ? v : u;
    for (size_t r = 0; r < planes.lumaHeight; ++r) {
        const uint8_t* __restrict in = src + r * 2 * w;
        uint8_t* __restrict yRow = y + r * planes.lumaWidth;
        uint8_t* __restrict firstRow = first + r * planes.chromaWidth;
        uint8_t* __restrict secondRow = second + r * planes.chromaWidth;
        for (size_t j = 0; j < pairs; ++j) {
            yRow[2 * j] = in[4 * j];
            firstRow[j] = in[4 * j + 1];
            yRow[2 * j + 1] = in[4 * j + 2];
            secondRow[j] = in[4 * j + 3];
        }
        if (w % 2 != 0) {
            yRow[w - 1] = yRow[w] = in[4 * pairs];
            firstRow[pairs] = in[4 * pairs + 1];
            secondRow[pairs] = pairs > 0 ? secondRow[pairs - 1] : kNeutralChroma;
        }
    }
}

}  // namespace qk::jpeg
