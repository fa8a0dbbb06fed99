// Images: the QKImage object, pixel-format codes, buffer sizes and the image
// operations.
#ifndef QKCORE_QK_IMAGE_H
#define QKCORE_QK_IMAGE_H

#include <stdint.h>
#include <stdio.h>
#include <stdlib.h>

#include "qk_common.h"

// A format code is four characters, the first in the lowest byte. The codes
// are constant expressions of type uint32_t in both languages (switch cases
// included).
#ifdef __cplusplus
constexpr uint32_t QK_FOURCC(char a, char b, char c, char d) {
    return uint32_t(uint8_t(a)) | uint32_t(uint8_t(b)) << 8 | uint32_t(uint8_t(c)) << 16 |
           uint32_t(uint8_t(d)) << 24;
}
#else
#define QK_FOURCC(a, b, c, d)                                                        \
    ((uint32_t)(uint8_t)(a) | (uint32_t)(uint8_t)(b) << 8 | (uint32_t)(uint8_t)(c) << 16 | \
     (uint32_t)(uint8_t)(d) << 24)
#endif

// RGB family: bytes in memory in the order of the letters.
#define QK_FORMAT_RGBA QK_FOURCC('R', 'G', 'B', 'A')
#define QK_FORMAT_BGRA QK_FOURCC('B', 'G', 'R', 'A')
#define QK_FORMAT_ARGB QK_FOURCC('A', 'R', 'G', 'B')
#define QK_FORMAT_ABGR QK_FOURCC('A', 'B', 'G', 'R')
#define QK_FORMAT_RGB8 QK_FOURCC('R', 'G', 'B', '8')
#define QK_FORMAT_BGR8 QK_FOURCC('B', 'G', 'R', '8')
// YUV family.
#define QK_FORMAT_GREY QK_FOURCC('G', 'R', 'E', 'Y')  // luma only
#define QK_FORMAT_YUYV QK_FOURCC('Y', 'U', 'Y', 'V')  // 4:2:2 Y0 U Y1 V
#define QK_FORMAT_YVYU QK_FOURCC('Y', 'V', 'Y', 'U')  // 4:2:2 Y0 V Y1 U
#define QK_FORMAT_NV12 QK_FOURCC('N', 'V', '1', '2')  // 4:2:0 Y, then UV pairs
#define QK_FORMAT_NV21 QK_FOURCC('N', 'V', '2', '1')  // 4:2:0 Y, then VU pairs
#define QK_FORMAT_YV12 QK_FOURCC('Y', 'V', '1', '2')  // 4:2:0 Y, V plane, U plane
#define QK_FORMAT_YUVP QK_FOURCC('Y', 'U', 'V', 'P')  // 4:2:0 Y, U plane, V plane
// Copy-only formats.
#define QK_FORMAT_D16 QK_FOURCC('D', '1', '6', '\0')  // 16-bit depth samples
#define QK_FORMAT_PCL QK_FOURCC('P', 'C', 'L', '\0')  // 36-byte header + 16 bytes a point
// An encoded stream whose length is the image's recorded size.
#define QK_FORMAT_JPEG QK_FOURCC('J', 'P', 'E', 'G')

// The image object. The field order and widths are a binary contract with
// modules outside the library: do not reorder or resize them.
#ifdef __cplusplus
class QKImage {
public:
    // Frees the buffer unless it is the caller's, and forgets it.
    virtual ~QKImage() {
        if (data != nullptr && isWrapped == 0) free(data);
        data = nullptr;
        isWrapped = 0;
        size = 0;
        chromaOffset = 0;
    }

    uint8_t* data = nullptr;    // pixel buffer, or null
    int32_t width = 0;
    int32_t height = 0;
    uint32_t format = 0;        // format code
    uint32_t isWrapped = 0;     // nonzero: the buffer is the caller's and never freed here
    uint64_t size = 0;          // buffer bytes; 0 means "not recorded: use the size rule"
    uint32_t chromaOffset = 0;  // 4:2:0 chroma start; 0 means right after the luma plane
};
#else
// C sees the same object: the C++ class's table pointer comes first. Only the
// library makes and destroys images (QKImage_create*, QKImage_clone*,
// QKImage_destroy); C code reads and sets the fields, never vtable_.
typedef struct QKImage {
    const void* const* vtable_;
    uint8_t* data;
    int32_t width;
    int32_t height;
    uint32_t format;
    uint32_t isWrapped;
    uint64_t size;
    uint32_t chromaOffset;
} QKImage;
#endif

QK_BEGIN_C_DECLS

// Bytes a buffer of these dimensions and format occupies, or 0 when none can
// be given (a dimension below 1, an encoded or unknown format, or a size that
// would not fit in a signed 32-bit byte count).
QK_API uint64_t QKImage_requiredSize(int32_t width, int32_t height, uint32_t format);
// The image's recorded size when nonzero, else the size rule of its fields;
// 0 for null.
QK_API uint64_t QKImage_size(const QKImage* image);

// Lifecycle. Every image returned here belongs to the caller, who releases it
// with QKImage_destroy.
QK_API QKImage* QKImage_createEmpty(int32_t width, int32_t height, uint32_t format);
QK_API QKImage* QKImage_createNew(int32_t width, int32_t height, uint32_t format);
// Wraps the caller's buffer (never freed by the library). A negative size is
// recorded as 0; a null buffer gives an image without buffer.
QK_API QKImage* QKImage_createWrap(void* data, int32_t width, int32_t height, uint32_t format,
                                   int32_t size, uint32_t chromaOffset);
// Gives an image without buffer an owned one; returns the buffer's byte count
// or a negative status.
QK_API int32_t QKImage_allocate(QKImage* image);
QK_API void QKImage_deallocate(QKImage* image);
QK_API void QKImage_reset(QKImage* image);
QK_API void QKImage_destroy(QKImage* image);
// An owned copy of the source's pixels (4:2:0 chroma kept at a separate
// offset is gathered right behind the luma); null for a source without
// buffer or size rule. A source that records fewer bytes than its picture
// gives those bytes, and the rest of the clone is zero.
QK_API QKImage* QKImage_clone(const QKImage* source);
// The source's width, height and format, without buffer.
QK_API QKImage* QKImage_cloneHeader(const QKImage* source);
// Makes the image use the caller's buffer (its own owned buffer is freed
// first); returns the buffer's byte count or a negative status.
QK_API int32_t QKImage_wrap(QKImage* image, void* data, int32_t size, uint32_t chromaOffset);

// Conversion. Converts the whole source into the destination's format, in the
// destination's existing buffer (never allocated here): the destination takes
// the source's width and height, and its buffer must hold the result.
// Same-format images are copied; D16 and PCL copy only to themselves. Returns
// QK_OK or a negative status; on failure the destination's pixels are
// untouched.
QK_API int32_t QKImage_convert(const QKImage* src, QKImage* dst);
// A new image of the source's size in `format`, converted from the source;
// null on any failure. The caller releases it with QKImage_destroy.
QK_API QKImage* QKImage_copyAndConvert(const QKImage* src, uint32_t format);

// Geometry.

// Turns the image in place by `angle` degrees, any multiple of 90 (negative
// and beyond a full turn included); positive angles turn counter-clockwise
// as displayed. A quarter or three-quarter turn exchanges width and height.
// The buffer is rewritten, never reallocated. RGBA pixels are turned
// directly; other formats go through a temporary RGBA copy. An odd dimension
// shifts the picture by one pixel: the uncovered row or column becomes
// transparent black (RGBA).
QK_API int32_t QKImage_rotate(QKImage* image, int32_t angle);
// Resamples an RGBA source to the destination's width and height (nearest
// pixel). A destination without buffer gets one of width x height x 4 bytes.
QK_API int32_t QKImage_scale(const QKImage* src, QKImage* dst);
// Copies the rectangle at (x, y) of the source, of the destination's width
// and height, into the destination (same format: packed RGB, or 4:2:0 with
// even coordinates and sizes). A destination without buffer gets one.
QK_API int32_t QKImage_crop(const QKImage* src, QKImage* dst, int32_t x, int32_t y);
// Overwrites the destination with the source placed at (x, y), clipped to
// the destination; offsets may be negative. Same format on both sides:
// packed RGB, or 4:2:0 with even offsets and sizes. Nothing is blended.
QK_API int32_t QKImage_drawImage(const QKImage* src, QKImage* dst, int32_t x, int32_t y);

// Codecs and files.

// Compresses the image's pixels, in its own format, with the JPEG codec
// module "libveljpeginterface.so" (loaded for this call). Quality 1..100 is
// used as given, any other value as 85. Returns a new image of format JPEG
// that owns the stream (its size is the stream's length), or null.
QK_API QKImage* QKImage_encodeToJpeg(const QKImage* image, int32_t quality);
// Decodes a picture held in memory into the image, in the image's format;
// width and height become the picture's. JPEG data goes to the codec module
// first (its buffer then replaces the image's), any picture the platform
// decoder knows (JPEG, PNG, WebP, GIF) comes through RGBA otherwise. An image
// without buffer gets one; an existing buffer too small for the picture is
// refused with QK_ERROR_INVALID_SIZE before any pixel is written.
QK_API int32_t QKImage_decodeFromJpeg(QKImage* image, const void* data, uint64_t size);
// Saves the image to `path`; the path picks the kind: ".jpeg" or ".jpg"
// anywhere in it (letter case ignored) gives a JPEG file, ".png" a PNG file,
// anything else the raw bytes of the buffer. JPEG and raw files report file
// errors only in the log (the status stays QK_OK).
QK_API int32_t QKImage_saveToFile(const QKImage* image, const char* path, int32_t quality);
// Loads a file into the image: decoded when it is a picture (as
// QKImage_decodeFromJpeg), otherwise taken as raw pixels of the width,
// height and format the image already has.
QK_API int32_t QKImage_loadFromFile(QKImage* image, const char* path);

QK_END_C_DECLS

#ifdef __cplusplus
// Writes `size` bytes to `path` (created, or cut to the new length), in as
// many writes as the system needs; the outcome is only logged. Exported
// under its C++ (type-mangled) name.
QK_API void save_to_file(const char* path, unsigned char* data, unsigned int size);
// The length of the open stream in bytes, or -1; the stream's position is
// left where it was. Exported under its C++ (type-mangled) name.
QK_API int64_t fsize(FILE* stream);
#endif

#endif  // QKCORE_QK_IMAGE_H
