// Row kernels for x86-64 with SSSE3. This file alone is compiled with
// -mssse3, and its kernels run only after supported_row_sets() has seen the
// CPU support it. So nothing here may be an inline function that baseline
// code could share (the linker might keep this file's copy): kernels live in
// an anonymous namespace and reach shared code through out-of-line calls.
//
// The kernels themselves are in row_x86_kernels.inc, shared with
// row_avx2.cpp; this file gives them one 128-bit lane.
#include <immintrin.h>
#include <stddef.h>
#include <stdint.h>
#include <string.h>

#include <type_traits>
#include <utility>

#include "convert/row.h"

// The helpers of the kernels: always inlined, so that vectors stay in
// registers and constants are loaded once per row.
#define QK_SIMD [[gnu::always_inline]] inline

namespace qk {
namespace {

// One 128-bit lane: a block of 16 pixels a step. The kernels name their
// operations v_*, which row_avx2.cpp maps to two lanes.
using V = __m128i;
constexpr int kLanes = 1;

QK_SIMD V load(const uint8_t* p, ptrdiff_t) { return _mm_loadu_si128(reinterpret_cast<const __m128i*>(p)); }
QK_SIMD void store(uint8_t* p, ptrdiff_t, V value) { _mm_storeu_si128(reinterpret_cast<__m128i*>(p), value); }
// store() past the caches, 16-byte aligned.
QK_SIMD void store_streamed(uint8_t* p, ptrdiff_t, V value) { _mm_stream_si128(reinterpret_cast<__m128i*>(p), value); }
// 8 bytes into the low half.
QK_SIMD V load_half(const uint8_t* p, ptrdiff_t) { return _mm_loadl_epi64(reinterpret_cast<const __m128i*>(p)); }
QK_SIMD V v_broadcast(const int8_t* bytes) { return _mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes)); }
QK_SIMD V v_and(V a, V b) { return _mm_and_si128(a, b); }
QK_SIMD V v_or(V a, V b) { return _mm_or_si128(a, b); }
QK_SIMD V v_xor(V a, V b) { return _mm_xor_si128(a, b); }
QK_SIMD V v_setzero() { return _mm_setzero_si128(); }
// A block's 16 bytes, and 8 bytes widened to 16-bit lanes.
QK_SIMD V load_block(const uint8_t* p) { return _mm_loadu_si128(reinterpret_cast<const __m128i*>(p)); }
QK_SIMD void store_block(uint8_t* p, V value) { _mm_storeu_si128(reinterpret_cast<__m128i*>(p), value); }
QK_SIMD void store_block_streamed(uint8_t* p, V value) { _mm_stream_si128(reinterpret_cast<__m128i*>(p), value); }
QK_SIMD V widen_half(const uint8_t* p) { return _mm_unpacklo_epi8(load_half(p, 0), _mm_setzero_si128()); }
// With one lane, the order the in-lane operations see is the order in
// memory (see row_avx2.cpp).
QK_SIMD V arrange_dwords(V a) { return a; }
QK_SIMD V arrange_qwords(V a) { return a; }
QK_SIMD V join_rgb24(V a) { return a; }
template <int N>
QK_SIMD V v_alignr(V high, V low) {
    return _mm_alignr_epi8(high, low, N);
}
template <int N>
QK_SIMD V v_shift_right_bytes(V a) {
    return _mm_srli_si128(a, N);
}
template <int N>
QK_SIMD V v_shift_left_bytes(V a) {
    return _mm_slli_si128(a, N);
}

#define QK_X86_OP(name) _mm_##name
#include "convert/x86/row_x86_ops.h"

#include "convert/x86/row_x86_kernels.inc"

}  // namespace

const RowKernelSet kSsse3Rows = {"ssse3",         simd_rgb_to_rgb,  simd_rgb_to_luma, simd_rgb_to_chroma,
                                 simd_yuv_to_rgb, simd_grey_to_rgb, simd_sample,      simd_chroma,
                                simd_pack,   simd_unpack};

}  // namespace qk
