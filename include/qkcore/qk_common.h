// Definitions shared by every family of the qkcore API: the export marker and
// the status codes that operations return.
#ifndef QKCORE_QK_COMMON_H
#define QKCORE_QK_COMMON_H

#include <stdint.h>

#if defined(QK_BUILDING_LIBRARY)
#define QK_API __attribute__((visibility("default")))
#else
#define QK_API
#endif

// Status codes. Operations that can fail return one of these (signed 32-bit);
// QKImage_allocate and QKImage_wrap return a byte count >= 0 on success
// instead, so callers test only the sign.
enum QKStatus : int32_t {
    QK_OK = 0,
    QK_ERROR_UNKNOWN = -1,
    QK_ERROR_NULL_PARAM = -2,
    QK_ERROR_INVALID_PARAM = -3,
    QK_ERROR_INVALID_SIZE = -4,
    QK_ERROR_ALLOC_FAILED = -5,
    QK_ERROR_UNSUPPORTED = -6,
    QK_ERROR_IO_FAILED = -8,
    QK_ERROR_CODEC_FAILED = -9,
    QK_ERROR_NOT_IMPLEMENTED = -42,
};

#endif  // QKCORE_QK_COMMON_H
