// Pixel memory. Buffers come from malloc and go to free like any other, so
// the ownership rules of images hold; frame-sized ones also carry a hint
// that large pages may back them, which cuts the cost of first touching tens
// of megabytes from thousands of page faults to a few dozen.
#ifndef QKCORE_SRC_PLATFORM_MEMORY_H
#define QKCORE_SRC_PLATFORM_MEMORY_H

#include <stddef.h>

namespace qk::platform {

// `bytes` of uninitialised memory, or zeroed when `cleared`; null when memory
// runs out. Release with free(). Zeroed frame-sized memory is also touched
// page by page in address order: faulting it in that way is much cheaper
// than on the scattered writes of, say, a turned drawing.
void* allocate_pixels(size_t bytes, bool cleared = false);

}  // namespace qk::platform

#endif  // QKCORE_SRC_PLATFORM_MEMORY_H
