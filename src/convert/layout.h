// Where the bytes of a YUV-family image lie. The conversion kernels resolve
// these once per call and hand them to their row kernels, as they do the RGB
// layouts of the format table.
#ifndef QKCORE_SRC_CONVERT_LAYOUT_H
#define QKCORE_SRC_CONVERT_LAYOUT_H

#include <stdint.h>

#include "image/format.h"
#include "qkcore/qk_image.h"

namespace qk {

// Where the samples of a YUV-family image lie. Luma sample x of row y is at
// (y * width + x) * lumaStep; U sample j of chroma row r at
// uOffset + (r * width / 2 + j) * chromaStep, V likewise from vOffset.
struct YuvLayout {
    int lumaStep;         // 1 or 2
    int chromaStep;       // 1, 2 or 4; 0 for GREY, which has no chroma
    uint64_t uOffset;     // from the buffer start
    uint64_t vOffset;
    bool subsampledRows;  // 4:2:0: one chroma row serves two image rows
};

// The layout of an image of the YUV family, with the image's own chroma base
// and dimensions. Other formats give a layout without luma (lumaStep 0).
YuvLayout yuv_layout(const QKImage& image);

}  // namespace qk

#endif  // QKCORE_SRC_CONVERT_LAYOUT_H
