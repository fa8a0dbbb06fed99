// The four conversion kernels behind QKImage_convert. Each takes a validated
// pair (both buffers present and large enough, the destination already
// carrying the source's dimensions, even where its formats need it) and
// writes the whole destination image. They cannot fail.
#ifndef QKCORE_SRC_CONVERT_KERNELS_H
#define QKCORE_SRC_CONVERT_KERNELS_H

#include "qkcore/qk_image.h"

namespace qk {

// Between two different RGB-family formats.
void convert_rgb_to_rgb(const QKImage& src, QKImage& dst);
// RGB family to GREY, packed 4:2:2 or 4:2:0.
void convert_rgb_to_yuv(const QKImage& src, QKImage& dst);
// YUV family (GREY included) to the RGB family.
void convert_yuv_to_rgb(const QKImage& src, QKImage& dst);
// Between two different YUV-family formats.
void convert_yuv_to_yuv(const QKImage& src, QKImage& dst);

}  // namespace qk

#endif  // QKCORE_SRC_CONVERT_KERNELS_H
