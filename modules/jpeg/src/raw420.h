// NV12/NV21 frames compressed through libjpeg's raw-data interface, one
// iMCU row at a time: luma is read where it lies, and only the chroma of
// the row being compressed is de-interleaved, into a scratch that stays in
// cache, rather than the whole frame's chroma into planes first.
#ifndef QKCORE_MODULES_JPEG_SRC_RAW420_H
#define QKCORE_MODULES_JPEG_SRC_RAW420_H

#include <stdint.h>

#include "planes.h"

namespace qk::jpeg {

// Whether the frame can go this way: interleaved chroma, a width of whole
// MCUs and an even height (no column padding, every chroma row present).
inline bool raw420_fits(int32_t width, int32_t height, const Chroma420& chroma) {
    return chroma.step == 2 && width % 16 == 0 && height % 2 == 0;
}

// The stream, a malloc'ed block of *length bytes, byte for byte what
// TurboJPEG compresses from the same planes; nullptr on failure.
void* compress_raw420(const uint8_t* pixels, int32_t width, int32_t height, const Chroma420& chroma, int quality,
                      uint32_t* length);

}  // namespace qk::jpeg

#endif  // QKCORE_MODULES_JPEG_SRC_RAW420_H
