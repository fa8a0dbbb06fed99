// Converters: client access to the optional external conversion module, and
// the vendor colour-conversion fast path.
#ifndef QKCORE_QK_CONVERTER_H
#define QKCORE_QK_CONVERTER_H

#include "qk_image.h"

// The platform's colour-conversion fast path (libcsc.so, loaded for each call
// when present). Takes only BGRA to NV12, with the destination already of the
// source's dimensions and large enough; declines every other pair at once
// with QK_ERROR_UNSUPPORTED and no message. Returns QK_OK when the platform
// routine filled the destination, else a negative status with the
// destination untouched. Exported under its C++ (type-mangled) name.
QK_API int32_t csc_run(const QKImage* src, QKImage* dst);

#endif  // QKCORE_QK_CONVERTER_H
