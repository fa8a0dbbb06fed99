#include "platform/memory.h"

#include <stdint.h>
#include <stdlib.h>
#include <sys/mman.h>

namespace qk::platform {
namespace {

constexpr size_t kSmallPage = 4096;
constexpr size_t kLargePage = size_t{2} << 20;
// Below this, a buffer spans too few pages for either step to matter.
constexpr size_t kFrameSized = size_t{4} << 20;

// Only whole large pages inside the buffer; only a hint, ignored where the
// system offers no large pages.
void hint_large_pages(void* memory, size_t bytes) {
#ifdef MADV_HUGEPAGE
    const uintptr_t start = (reinterpret_cast<uintptr_t>(memory) + kLargePage - 1) & ~(kLargePage - 1);
    const uintptr_t end = (reinterpret_cast<uintptr_t>(memory) + bytes) & ~(kLargePage - 1);
    if (end > start) madvise(reinterpret_cast<void*>(start), end - start, MADV_HUGEPAGE);
#else
    (void)memory;
    (void)bytes;
#endif
}

// Maps every page in one system call where the kernel can (several times
// cheaper than a fault per page, large or small); otherwise touches one byte
// a page in address order. Contents stay as they are either way.
void populate(void* memory, size_t bytes) {
    const uintptr_t start = reinterpret_cast<uintptr_t>(memory) & ~(kSmallPage - 1);
    const uintptr_t end = reinterpret_cast<uintptr_t>(memory) + bytes;
#ifdef MADV_POPULATE_WRITE
    if (madvise(reinterpret_cast<void*>(start), end - start, MADV_POPULATE_WRITE) == 0) return;
#endif
    volatile uint8_t* bytes_of = static_cast<uint8_t*>(memory);
    for (size_t i = 0; i < bytes; i += kSmallPage) bytes_of[i] = bytes_of[i];
}

}  // namespace

void* allocate_pixels(size_t bytes, bool cleared, bool map_in) {
    void* memory = cleared ? calloc(bytes, 1) : malloc(bytes);
    if (memory != nullptr && bytes >= kFrameSized) {
        hint_large_pages(memory, bytes);
        if (map_in) populate(memory, bytes);
    }
    return memory;
}

}  // namespace qk::platform
