// How the kernel sets lay out their tables of row kernels, and where each
// select_* request lands in them. One layout for every set, so that a set
// only fills its tables and the requests are read in one place.
#ifndef QKCORE_SRC_CONVERT_ROW_SLOTS_H
#define QKCORE_SRC_CONVERT_ROW_SLOTS_H

#include <stddef.h>

#include "image/format.h"

namespace qk {

// Chroma steps: two planes, a row of pairs, packed 4:2:2.
constexpr int kChromaSteps[] = {1, 2, 4};
constexpr int chroma_step_index(int step) { return step == 1 ? 0 : step == 2 ? 1 : step == 4 ? 2 : -1; }

// The sources of YUV to RGB rows: 4:2:0 (two rows a chroma row, planar or
// paired chroma) and packed 4:2:2.
struct YuvSourceShape {
    int lumaStep, chromaStep, rows;
};
constexpr YuvSourceShape kYuvSourceShapes[] = {{1, 1, 2}, {1, 2, 2}, {2, 4, 1}};
constexpr int kYuvSourceShapeCount = 3;

// Slots of the tables, -1 for a request no table serves. RGB layouts are
// indexes of the format table; luma steps 1 and 2.
constexpr bool rgb_slot_ok(int index) { return index >= 0 && index < kRgbFormatCount; }
constexpr bool luma_step_ok(int step) { return step == 1 || step == 2; }
constexpr int rgb_to_rgb_slot(int src, int dst) {
    return rgb_slot_ok(src) && rgb_slot_ok(dst) ? src * kRgbFormatCount + dst : -1;
}
constexpr int rgb_to_luma_slot(int src, int luma_step) {
    return rgb_slot_ok(src) && luma_step_ok(luma_step) ? src * 2 + luma_step - 1 : -1;
}
constexpr int rgb_to_chroma_slot(int src, int chroma_step) {
    return rgb_slot_ok(src) && chroma_step_index(chroma_step) >= 0 ? src * 3 + chroma_step_index(chroma_step) : -1;
}
constexpr int yuv_to_rgb_slot(int dst, int luma_step, int chroma_step, int rows) {
    for (int i = 0; rgb_slot_ok(dst) && i < kYuvSourceShapeCount; ++i) {
        const YuvSourceShape& shape = kYuvSourceShapes[i];
        if (shape.lumaStep == luma_step && shape.chromaStep == chroma_step && shape.rows == rows) {
            return dst * kYuvSourceShapeCount + i;
        }
    }
    return -1;
}
constexpr int grey_to_rgb_slot(int dst) { return rgb_slot_ok(dst) ? dst : -1; }
constexpr int sample_slot(int src_step, int dst_step) {
    return luma_step_ok(src_step) && luma_step_ok(dst_step) ? (src_step - 1) * 2 + dst_step - 1 : -1;
}
constexpr int chroma_slot(int src_step, int dst_step) {
    const int src = chroma_step_index(src_step), dst = chroma_step_index(dst_step);
    return src >= 0 && dst >= 0 ? src * 3 + dst : -1;
}

// The kernel in `slot` of a table, or `none` for slot -1.
template <typename Table>
typename Table::value_type slot_row(const Table& table, int slot, typename Table::value_type none) {
    return slot < 0 ? none : table[static_cast<size_t>(slot)];
}

}  // namespace qk

#endif  // QKCORE_SRC_CONVERT_ROW_SLOTS_H
