// Converters: client access to the optional external conversion module, and
// the vendor colour-conversion fast path.
#ifndef QKCORE_QK_CONVERTER_H
#define QKCORE_QK_CONVERTER_H

#include "qk_image.h"

// A converter of the optional module "libqkcore_csc.so", made for one
// conversion (dimensions, source and destination format). Opaque.
typedef struct QKConverter QKConverter;

// The module's entry points, exported by it under these names as plain C
// symbols. It receives the library's QKImage objects as they are.
//   "qk_csc_init": a context for this conversion, or null when the module
//   cannot make it.
typedef void* (*QKCscInitFn)(int32_t width, int32_t height, uint32_t srcFormat, uint32_t dstFormat);
//   "qk_csc_convert": a status, handed to the caller unchanged.
typedef int32_t (*QKCscConvertFn)(void* context, const QKImage* src, QKImage* dst);
//   "qk_csc_release": ends the context.
typedef void (*QKCscReleaseFn)(void* context);

QK_BEGIN_C_DECLS

// Loads the module and makes a converter, or returns null: when the module
// cannot be loaded or lacks an entry point (then no later call tries again,
// for the rest of the process), or when it cannot make this conversion.
QK_API QKConverter* QKConverter_create(int32_t width, int32_t height, uint32_t srcFormat, uint32_t dstFormat);
// Runs the module's conversion and returns its status unchanged (positive
// values included), or QK_ERROR_NULL_PARAM for a null converter, image or
// image buffer. Neither image is checked against the converter's dimensions
// or formats.
QK_API int32_t QKConverter_convert(QKConverter* converter, const QKImage* src, QKImage* dst);
// Ends the module's context and drops the handle; null does nothing.
QK_API void QKConverter_release(QKConverter* converter);

QK_END_C_DECLS

#ifdef __cplusplus
// The platform's colour-conversion fast path (libcsc.so, loaded for each call
// when present). Takes only BGRA to NV12, with the destination already of the
// source's dimensions and large enough; declines every other pair at once
// with QK_ERROR_UNSUPPORTED and no message. Returns QK_OK when the platform
// routine filled the destination, else a negative status with the
// destination untouched. Exported under its C++ (type-mangled) name.
QK_API int32_t csc_run(const QKImage* src, QKImage* dst);
#endif

#endif  // QKCORE_QK_CONVERTER_H
