// Pixel memory. Buffers come from malloc and go to free like any other, so
// the ownership rules of images hold. Frame-sized ones are mapped in before
// they are handed out, large pages where the system offers them: tens of
// megabytes faulted in a page at a time, on the scattered writes of a turned
// drawing say, cost more than the work done in them.
#ifndef QKCORE_SRC_PLATFORM_MEMORY_H
#define QKCORE_SRC_PLATFORM_MEMORY_H

#include <stddef.h>

namespace qk::platform {

// `bytes` of uninitialised memory, or zeroed when `cleared`; null when memory
// runs out. Release with free().
void* allocate_pixels(size_t bytes, bool cleared = false);

}  // namespace qk::platform

#endif  // QKCORE_SRC_PLATFORM_MEMORY_H
