// Pixel memory. Buffers come from malloc and go to free like any other, so
// the ownership rules of images hold. Frame-sized ones are mapped in before
// they are handed out, large pages where the system offers them: tens of
// megabytes faulted in a page at a time, on the scattered writes of a turned
// drawing say, cost more than the work done in them.
#ifndef QKCORE_SRC_PLATFORM_MEMORY_H
#define QKCORE_SRC_PLATFORM_MEMORY_H

#include <stddef.h>
#include <stdint.h>

namespace qk::platform {

// `bytes` of uninitialised memory, or zeroed when `cleared`; null when memory
// runs out. Release with free(). Without `map_in`, pages arrive as they are
// first written, for a decoder whose data may run out long before the
// picture it claims does.
void* allocate_pixels(size_t bytes, bool cleared = false, bool map_in = true);

// Whether a decoder should have `bytes` of pixels mapped in at once for a
// picture coded in `encoded_bytes`. Camera frames compress 10 to 50 times
// and flat pictures some hundreds; a stream thousands of times shorter than
// the picture its header claims is damaged, and decoding it then costs the
// pages written before its data runs out, not the whole claim.
inline bool worth_mapping_in(uint64_t bytes, uint64_t encoded_bytes) { return bytes / 4096 <= encoded_bytes; }

// Pixels written from this many bytes of destination on go past the caches
// to memory where the instruction set has streaming stores (x86): beyond a
// core's share of the last-level cache on most machines (1.5 to 4 MB), a
// frame is not kept there anyway, and ordinary stores would first read in
// every line they overwrite.
constexpr uint64_t kStreamBytes = uint64_t{4} << 20;

// memcpy for planes of pixels, which do not overlap: past the caches from
// kStreamBytes on where the instruction set has streaming stores, and
// through them with plain vector moves below (on x86 these outran the C
// library's memcpy on cold frames of 2 to 18 MB, by a fifth and more).
void copy_pixels(void* dst, const void* src, size_t bytes);

}  // namespace qk::platform

#endif  // QKCORE_SRC_PLATFORM_MEMORY_H
