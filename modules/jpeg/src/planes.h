// Where the camera formats keep their samples, and the passes that move
// them between a buffer and the separate planes TurboJPEG reads and writes.
// At even sizes luma never moves: TurboJPEG takes the luma plane where it
// lies; only odd sizes, whose planes TurboJPEG pads, go through copies.
#ifndef QKCORE_MODULES_JPEG_SRC_PLANES_H
#define QKCORE_MODULES_JPEG_SRC_PLANES_H

#include <stddef.h>
#include <stdint.h>

namespace qk::jpeg {

// The value of chroma that carries no colour.
constexpr uint8_t kNeutralChroma = 128;

// The chroma of a 4:2:0 buffer of w x h pixels as the library places it at
// any size (see veljpeginterface.h): `rows` rows of `samples` U and V
// samples; U sample j of row r at u + r * rowBytes + j * step, V likewise
// from v.
struct Chroma420 {
    size_t u, v;      // byte offsets in the buffer
    size_t step;      // 1: two planes; 2: interleaved pairs
    size_t rowBytes;  // samples * step
    size_t samples;   // floor(w / 2)
    size_t rows;      // floor(h / 2)
};
Chroma420 chroma420(int32_t width, int32_t height, uint32_t format);

// The planes TurboJPEG reads and writes for a w x h picture sampled 4:2:0
// (or 4:2:2: `half_height` false), rows as wide as the planes: chroma of
// ceil(w/2) x ceil(h/2) (x h) samples, and luma padded to whole chroma
// samples, one column (row) more than the picture at an odd width (height).
struct TurboPlanes {
    size_t lumaWidth, lumaHeight, chromaWidth, chromaHeight;
};
inline TurboPlanes turbo_planes(int32_t width, int32_t height, bool half_height) {
    const size_t w = static_cast<size_t>(width), h = static_cast<size_t>(height);
    const size_t luma_height = half_height ? h + h % 2 : h;
    return {w + w % 2, luma_height, (w + 1) / 2, half_height ? luma_height / 2 : h};
}

// Copies width x height samples between planes with rows of the strides.
void copy_plane(const uint8_t* src, size_t src_stride, uint8_t* dst, size_t dst_stride, size_t width,
                size_t height);
// Completes the width x height samples at the start of a plane (rows of
// `stride`) to padded_width x padded_height by repeating the last column and
// the last row.
void pad_edges(uint8_t* plane, size_t stride, size_t width, size_t height, size_t padded_width,
               size_t padded_height);

// Fills TurboJPEG's U and V planes (plane_width x plane_height, rows of
// plane_width) from a 4:2:0 buffer. Columns and rows the buffer has no
// chroma for repeat the last ones it has; neutral chroma when it has none.
void gather420(const uint8_t* src, const Chroma420& chroma, uint8_t* u, uint8_t* v, size_t plane_width,
               size_t plane_height);

// Writes the first `samples` x `rows` samples of TurboJPEG's U and V planes
// (rows of plane_width) into a 4:2:0 buffer; the rest of the planes is
// dropped.
void scatter420(const uint8_t* u, const uint8_t* v, size_t plane_width, const Chroma420& chroma, uint8_t* dst);

// Splits packed 4:2:2 rows (2 * width bytes each) into TurboJPEG's planes
// for the picture (turbo_planes(width, height, false)). `u_first`: the pairs
// are Y U Y V (YUYV), else Y V Y U (YVYU). The lone last pixel of an odd
// width brings its Y and first chroma byte; its other chroma repeats the
// pair before it, and its Y fills the luma padding.
void split422(const uint8_t* src, int32_t width, int32_t height, bool u_first, uint8_t* y, uint8_t* u,
              uint8_t* v);

}  // namespace qk::jpeg

#endif  // QKCORE_MODULES_JPEG_SRC_PLANES_H
