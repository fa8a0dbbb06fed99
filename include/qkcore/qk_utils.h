// Small utilities for clients of the library, in C++ only (exported under
// their type-mangled names).
#ifndef QKCORE_QK_UTILS_H
#define QKCORE_QK_UTILS_H

#include <stdint.h>

#include "qk_common.h"

#ifdef __cplusplus
// Sorts keys[first..last] (both included) from largest to smallest, moving
// the parallel name buffers along with their keys. Every name buffer must
// hold 256 bytes and each name must be shorter than 256 characters: names
// move by content, the pointers never change places.
QK_API void sort(int32_t* keys, char** names, int32_t first, int32_t last);

// Exchanges *keyA with *keyB and the contents of the two 256-byte name
// buffers (each is rewritten over its full 256 bytes).
QK_API void swap(int32_t* keyA, int32_t* keyB, char* nameA, char* nameB);
#endif

#endif  // QKCORE_QK_UTILS_H
