// The checks the image operations share: whether a buffer holds its
// picture, whether sizes and positions suit a format's chroma sampling, and
// how far a 4:2:0 picture reaches into its buffer. Each operation makes them
// in its own order, which decides the status it returns.
#ifndef QKCORE_SRC_IMAGE_CHECKS_H
#define QKCORE_SRC_IMAGE_CHECKS_H

#include <stdint.h>

#include "image/format.h"
#include "qkcore/qk_image.h"

namespace qk {

// True when x and y, a size or a position, lie on the format's chroma grid:
// both even for 4:2:0, x even for packed 4:2:2, anything for other formats.
// Odd values are refused, never rounded.
inline bool on_chroma_grid(uint32_t format, int64_t x, int64_t y) {
    return (x % 2 == 0 || !chroma_pairs_columns(format)) && (y % 2 == 0 || !chroma_pairs_rows(format));
}

// Bytes a 4:2:0 picture of these (positive) dimensions reaches into its
// buffer with its chroma at `base`: its luma plane, and its chroma from there.
inline uint64_t yuv420_extent(uint64_t base, int32_t width, int32_t height) {
    const uint64_t luma = yuv420_luma_bytes(width, height);
    const uint64_t chroma_end = base + yuv420_chroma_bytes(width, height);
    return chroma_end > luma ? chroma_end : luma;
}

// True when the image's buffer holds the whole picture that its width,
// height and format describe. A recorded size is checked against everything
// the picture occupies, 4:2:0 chroma at a separate chromaOffset included;
// without a recorded size the rule size is all there is to go by, and a
// chromaOffset past the luma plane is the caller's promise. A picture too
// large for any byte count never fits. Images with nothing to read (a
// dimension below 1, encoded or unknown formats) pass: the operations refuse
// them on their own terms.
bool buffer_holds_image(const QKImage& image);

}  // namespace qk

#endif  // QKCORE_SRC_IMAGE_CHECKS_H
