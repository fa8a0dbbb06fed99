// Where the bytes of each convertible format lie. The conversion kernels
// resolve these once per call and hand them to their row kernels.
#ifndef QKCORE_SRC_CONVERT_LAYOUT_H
#define QKCORE_SRC_CONVERT_LAYOUT_H

#include <stdint.h>

#include "qkcore/qk_image.h"

namespace qk {

// One pixel of an RGB-family format; pixels and rows follow without gaps.
struct RgbLayout {
    int bytesPerPixel;  // 3 or 4
    int rOffset;
    int gOffset;
    int bOffset;
    int aOffset;  // -1: no alpha
};

// The RGB family in a fixed order, so that row kernels can be instantiated
// per format by index.
constexpr int kRgbFormatCount = 6;
inline constexpr uint32_t kRgbFormats[kRgbFormatCount] = {
    QK_FORMAT_RGB8, QK_FORMAT_BGR8, QK_FORMAT_RGBA, QK_FORMAT_BGRA, QK_FORMAT_ARGB, QK_FORMAT_ABGR,
};
inline constexpr RgbLayout kRgbLayouts[kRgbFormatCount] = {
    {3, 0, 1, 2, -1},  // RGB8
    {3, 2, 1, 0, -1},  // BGR8
    {4, 0, 1, 2, 3},   // RGBA
    {4, 2, 1, 0, 3},   // BGRA
    {4, 1, 2, 3, 0},   // ARGB
    {4, 3, 2, 1, 0},   // ABGR
};

// Index into kRgbFormats, or -1 outside the RGB family.
int rgb_format_index(uint32_t format);

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
