#include "platform/memory.h"

#include <stdint.h>
#include <stdlib.h>
#include <sys/mman.h>

namespace qk::platform {
namespace {

constexpr size_t kSmallPage = 4096;
constexpr size_t kLargePage = size_t{2} << 20;
// Below this, a buffer spans too few large pages for the hint to matter.
constexpr size_t kHintThreshold = size_t{4} << 20;

}  // namespace

void* allocate_pixels(size_t bytes, bool cleared) {
    void* memory = cleared ? calloc(bytes, 1) : malloc(bytes);
#ifdef MADV_HUGEPAGE
    if (memory != nullptr && bytes >= kHintThreshold) {
        // Only whole large pages inside the buffer; only a hint, ignored where
        // the system offers no large pages.
        const uintptr_t start = (reinterpret_cast<uintptr_t>(memory) + kLargePage - 1) & ~(kLargePage - 1);
        const uintptr_t end = (reinterpret_cast<uintptr_t>(memory) + bytes) & ~(kLargePage - 1);
        if (end > start) madvise(reinterpret_cast<void*>(start), end - start, MADV_HUGEPAGE);
    }
#endif
    if (memory != nullptr && cleared && bytes >= kHintThreshold) {
        volatile uint8_t* bytes_of = static_cast<uint8_t*>(memory);
        for (size_t i = 0; i < bytes; i += kSmallPage) bytes_of[i] = 0;  // zero already: content unchanged
    }
    return memory;
}

}  // namespace qk::platform
