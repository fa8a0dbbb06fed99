// Encoded pictures: the decoder that file loading and JPEG decoding fall
// back to, and the PNG encoder of saving. Both work on the raster layer's
// RGBA bitmaps.
#ifndef QKCORE_SRC_PLATFORM_PICTURE_H
#define QKCORE_SRC_PLATFORM_PICTURE_H

#include <stddef.h>
#include <stdint.h>

#include "platform/raster.h"

namespace qk::platform {

// Decodes a whole JPEG, PNG, WebP or GIF (its first frame) picture into
// `bitmap`, which gets memory of its own holding unpremultiplied RGBA
// (R, G, B, A bytes, tight rows). False, with the bitmap released, for data
// it does not recognise, a damaged or truncated picture, or a picture whose
// RGBA pixels would take more than max_picture_bytes(): that is decided from
// the header, before any pixel memory is taken. Never writes to stderr.
// A GIF's first frame is placed on its logical screen, which is transparent
// black wherever the frame shows nothing; animated WebP and CMYK JPEG
// pictures are refused.
bool decode_picture(const uint8_t* data, size_t size, Bitmap& bitmap);

// Writes the bitmap's RGBA bytes as they are (no premultiplication round
// trip) as a PNG file at `path`, created or cut to the new length, with a
// fast compression setting. False when the file cannot be written in full.
bool write_png_file(const char* path, const Bitmap& bitmap);

// The largest RGBA buffer decode_picture makes: INT32_MAX bytes, the
// library's largest byte count, unless lowered (fuzzers keep it small).
uint64_t max_picture_bytes();
void set_max_picture_bytes(uint64_t bytes);

}  // namespace qk::platform

#endif  // QKCORE_SRC_PLATFORM_PICTURE_H
