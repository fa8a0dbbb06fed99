// The JPEG codec module "libveljpeginterface.so": the two entry points that
// libqkcore looks up by name after loading the module for each call. Format
// codes and buffer layouts are those of qkcore's images (qkcore/qk_image.h),
// with buffers of exactly the size rule's bytes (QKImage_requiredSize) and
// 4:2:0 chroma right after the luma plane.
//
// Camera formats are coded as they are, never through RGB: the 4:2:0
// formats (NV12, NV21, YV12, YUVP) give and take 4:2:0 streams sample for
// sample, YUYV and YVYU give 4:2:2 streams.
//
// Odd dimensions. The size rule leaves an odd-sized 4:2:0 image room for
// floor(w/2) x floor(h/2) chroma samples of each kind, and the module reads
// and writes them where the library's own conversion code puts them at any
// size (at even sizes, the usual layout):
//   NV12, NV21  floor(h/2) rows of floor(w/2) U,V (V,U) pairs, 2*floor(w/2)
//               bytes a row, from byte w*h;
//   YV12, YUVP  two planes with rows of floor(w/2) bytes, the first (V for
//               YV12, U for YUVP) at byte w*h, the second (w*h)/4 bytes
//               after it.
// Encoding, the last pixel column (row) of an odd width (height) takes the
// chroma of the column (row) before it; an image one pixel wide or high has
// no chroma at all and is coded with neutral chroma (128). Decoding, the
// stream's extra chroma column and row are dropped, and the bytes of the
// buffer that no sample occupies are set to 128. A YUYV or YVYU row of odd
// width ends with a lone pixel of two bytes, its Y and the chroma byte that
// comes first in the format's pairs (U for YUYV, V for YVYU); its other
// chroma is taken from the pair before it (128 in a one-pixel-wide image).
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
// Encodable: the RGB family (coded 4:2:0, alpha ignored), GREY (a grayscale
// stream), the 4:2:0 formats (4:2:0) and YUYV, YVYU (4:2:2); D16, PCL, JPEG
// and unknown codes are refused. A size of 0 means "not recorded": the size
// rule's bytes are read; a nonzero size short of them is refused. Quality
// outside 1..100 is taken as the nearest end.
typedef void* (*FastJpegEncodeFn)(const void* pixels, uint32_t size, int32_t width, int32_t height,
                                  uint32_t format, uint32_t* length, int32_t quality);
void* fastJpegEncode(const void* pixels, uint32_t size, int32_t width, int32_t height, uint32_t format,
                     uint32_t* length, int32_t quality);

// Decodes `size` bytes of JPEG stream into a malloc'ed buffer of `format`
// laid out as qkcore's size rule describes for the picture's dimensions,
// which are written to *width and *height. Returns null, leaving *width and
// *height alone, when the stream is damaged, the picture too large, or the
// format one it does not decode into (the caller then has other ways).
// Decodes into the RGB family (alpha 255), GREY (the luma) and, from 4:2:0
// YCbCr streams only, the 4:2:0 formats (the stream's own planes). A stream
// the codec decodes only with a warning (truncated, corrupt entropy data,
// stray bytes) counts as damaged: a cut-off camera frame is refused rather
// than handed back padded with grey.
typedef void* (*FastJpegDecodeFn)(const void* data, uint32_t size, int32_t* width, int32_t* height,
                                  uint32_t format);
void* fastJpegDecode(const void* data, uint32_t size, int32_t* width, int32_t* height, uint32_t format);

#ifdef __cplusplus
}
#endif

#endif  // VELJPEGINTERFACE_H
