// Quarter turns of a plane of samples (a luma plane, a chroma plane, or a
// plane of interleaved chroma pairs) from one buffer into another, moved
// as they are: the first step of turning a 4:2:0 image.
#ifndef QKCORE_SRC_GEOMETRY_PLANE_TURN_H
#define QKCORE_SRC_GEOMETRY_PLANE_TURN_H

#include <stddef.h>
#include <stdint.h>

namespace qk {

// Turns a plane of `width` x `height` elements of `element_bytes` bytes (1
// or 2) by `orient` counter-clockwise quarter turns (0..3) as displayed:
// target element (c, r) shows source element (width-1-r, c) for 1,
// (width-1-c, height-1-r) for 2 and (r, height-1-c) for 3. Rows are
// `src_row_bytes` and `dst_row_bytes` apart; the target is height wide for
// odd orients, and must not overlap the source.
void turn_plane(const uint8_t* src, size_t src_row_bytes, int32_t width, int32_t height, int element_bytes,
                int orient, uint8_t* dst, size_t dst_row_bytes);

// The same turn within the plane's own bytes (rows of width elements
// before, of height elements after a quarter turn). A half turn is made
// whole, through `rest` as a row of width elements; no turn leaves the plane
// as it is. A quarter turn is only begun: its target rows [top, width) go
// to `rest` (rows of height elements), top <= width / 2, and the source
// columns that rows [0, top) show are gathered at the end of the plane,
// from where turn_gathered_rows turns them into place, a few rows at a
// time if the caller likes (the plane's bytes between are unspecified).
void turn_plane_in_place(uint8_t* plane, int32_t width, int32_t height, int element_bytes, int orient, int32_t top,
                         uint8_t* rest);
// Target rows [r0, r1), r1 <= top, of a quarter turn that turn_plane_in_place
// began with these arguments.
void turn_gathered_rows(uint8_t* plane, int32_t width, int32_t height, int element_bytes, int orient, int32_t top,
                        int32_t r0, int32_t r1);

}  // namespace qk

#endif  // QKCORE_SRC_GEOMETRY_PLANE_TURN_H
