// Internal routines shared by the geometry operations (cropping, drawing).
#ifndef QKCORE_SRC_GEOMETRY_GEOMETRY_H
#define QKCORE_SRC_GEOMETRY_GEOMETRY_H

#include <stdint.h>

#include "qkcore/qk_image.h"

namespace qk {

// A rectangle of `cols` x `lines` pixels at (src_x, src_y) of one image and
// (dst_x, dst_y) of another.
struct Region {
    int32_t src_x;
    int32_t src_y;
    int32_t dst_x;
    int32_t dst_y;
    int32_t cols;
    int32_t lines;
};

// Copies the region between two images of one packed RGB or 4:2:0 format,
// one block copy per row (luma, chroma and plane rows for 4:2:0, whose
// coordinates and sizes must be even), each image with its own chroma base.
// The caller has checked that the region lies inside both images.
void copy_region(const QKImage& src, QKImage& dst, const Region& region);

}  // namespace qk

#endif  // QKCORE_SRC_GEOMETRY_GEOMETRY_H
