// The decoders behind decode_picture, one per format, and the size limit
// they all apply. Each takes data whose signature has been recognised and
// leaves the bitmap without pixels when it returns false.
#ifndef QKCORE_SRC_PLATFORM_PICTURE_FORMATS_H
#define QKCORE_SRC_PLATFORM_PICTURE_FORMATS_H

#include <stddef.h>
#include <stdint.h>

#include "platform/raster.h"

namespace qk::platform {

// Whether a width x height picture may be decoded: both dimensions at least
// 1 and its RGBA pixels within max_picture_bytes(). Asked from the header,
// before the decoder or the bitmap takes any memory in proportion to it.
bool picture_size_allowed(uint64_t width, uint64_t height);

bool decode_jpeg(const uint8_t* data, size_t size, Bitmap& bitmap);
bool decode_png(const uint8_t* data, size_t size, Bitmap& bitmap);
bool decode_webp(const uint8_t* data, size_t size, Bitmap& bitmap);
bool decode_gif(const uint8_t* data, size_t size, Bitmap& bitmap);

}  // namespace qk::platform

#endif  // QKCORE_SRC_PLATFORM_PICTURE_FORMATS_H
