#include "platform/memory.h"

#include <stdint.h>
#include <stdlib.h>
#include <string.h>
#include <sys/mman.h>

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

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

void copy_pixels(void* dst, const void* src, size_t bytes) {
#if defined(__SSE2__)
    auto* out = static_cast<uint8_t*>(dst);
    const auto* in = static_cast<const uint8_t*>(src);
    const bool stream = bytes >= kStreamBytes;
    // Streaming stores need 16-byte aligned addresses.
    const size_t head = stream ? (16 - reinterpret_cast<uintptr_t>(out) % 16) % 16 : 0;
    memcpy(out, in, head);
    size_t i = head;
    const auto blocks = [&](auto store) {
        for (; i + 64 <= bytes; i += 64) {
            __m128i v[4];
            for (int k = 0; k < 4; ++k) v[k] = _mm_loadu_si128(reinterpret_cast<const __m128i*>(in + i + 16 * k));
            for (int k = 0; k < 4; ++k) store(reinterpret_cast<__m128i*>(out + i + 16 * k), v[k]);
        }
    };
    if (stream) {
        blocks([](__m128i* p, __m128i v) { _mm_stream_si128(p, v); });
    } else {
        blocks([](__m128i* p, __m128i v) { _mm_storeu_si128(p, v); });
    }
    memcpy(out + i, in + i, bytes - i);
    if (stream) _mm_sfence();  // the streamed stores reach memory before anyone reads them
#else
    memcpy(dst, src, bytes);
#endif
}

}  // namespace qk::platform
