// The JPEG codec module "libveljpeginterface.so": the two entry points that
// libqkcore looks up by name after loading the module for each call. Format
// codes and buffer layouts are those of qkcore's images (qkcore/qk_image.h).
#ifndef VELJPEGINTERFACE_H
#define VELJPEGINTERFACE_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

// Compresses width x height pixels of `format` read from `pixels` (at most
// `size` bytes when size is nonzero) at quality 1..100. Returns a malloc'ed
// buffer holding the whole JPEG stream, its length written to *length, or
// null when the format cannot be encoded, the sizes do not fit, or the
// codec fails. The buffer outlives the module: release it with free().
typedef void* (*FastJpegEncodeFn)(const void* pixels, uint32_t size, int32_t width, int32_t height,
                                  uint32_t format, uint32_t* length, int32_t quality);
void* fastJpegEncode(const void* pixels, uint32_t size, int32_t width, int32_t height, uint32_t format,
                     uint32_t* length, int32_t quality);

// Decodes `size` bytes of JPEG stream into a malloc'ed buffer of `format`
// laid out as qkcore's size rule describes for the picture's dimensions,
// which are written to *width and *height. Returns null, leaving *width and
// *height alone, when the stream is damaged, the picture too large, or the
// format one it does not decode into (the caller then has other ways).
typedef void* (*FastJpegDecodeFn)(const void* data, uint32_t size, int32_t* width, int32_t* height,
                                  uint32_t format);
void* fastJpegDecode(const void* data, uint32_t size, int32_t* width, int32_t* height, uint32_t format);

#ifdef __cplusplus
}
#endif

#endif  // VELJPEGINTERFACE_H
