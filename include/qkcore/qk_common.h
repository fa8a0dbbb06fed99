// Definitions shared by every family of the qkcore API: the export marker, the
// C-linkage brackets, and the status codes that operations return. Every
// public header compiles as C++17 and as C11; the plain names (images,
// converters, options, the log hook) have C linkage in both, the C++-only
// parts sit behind __cplusplus.
#ifndef QKCORE_QK_COMMON_H
#define QKCORE_QK_COMMON_H

#include <stdint.h>

#if defined(QK_BUILDING_LIBRARY)
#define QK_API __attribute__((visibility("default")))
#else
#define QK_API
#endif

#ifdef __cplusplus
#define QK_BEGIN_C_DECLS extern "C" {
#define QK_END_C_DECLS }
#else
#define QK_BEGIN_C_DECLS
#define QK_END_C_DECLS
#endif

// An enumeration with a fixed underlying type. C has none before C23, so
// there the constants are plain enumerators (all of them fit an int) and
// the type's name stands for the underlying type.
#ifdef __cplusplus
#define QK_TYPED_ENUM(name, type) enum name : type
#else
#define QK_TYPED_ENUM(name, type) \
    typedef type name;            \
    enum
#endif

// Status codes. Operations that can fail return one of these (signed 32-bit);
// QKImage_allocate and QKImage_wrap return a byte count >= 0 on success
// instead, so callers test only the sign.
QK_TYPED_ENUM(QKStatus, int32_t) {
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
