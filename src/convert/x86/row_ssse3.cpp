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
using F = __m128;  // single precision
constexpr int kLanes = 1;

QK_SIMD V load(const uint8_t* p, ptrdiff_t) { return _mm_loadu_si128(reinterpret_cast<const __m128i*>(p)); }
QK_SIMD void store(uint8_t* p, ptrdiff_t, V value) { _mm_storeu_si128(reinterpret_cast<__m128i*>(p), value); }
// 8 bytes into the low half.
QK_SIMD V load_half(const uint8_t* p, ptrdiff_t) { return _mm_loadl_epi64(reinterpret_cast<const __m128i*>(p)); }
QK_SIMD V v_broadcast(const int8_t* bytes) { return _mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes)); }
QK_SIMD V v_and(V a, V b) { return _mm_and_si128(a, b); }
QK_SIMD V v_or(V a, V b) { return _mm_or_si128(a, b); }
QK_SIMD V v_setzero() { return _mm_setzero_si128(); }
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

#define v_add_ps _mm_add_ps
#define v_mul_ps _mm_mul_ps
#define v_set1_ps _mm_set1_ps
#define v_cvtepi32_ps _mm_cvtepi32_ps
#define v_cvttps_epi32 _mm_cvttps_epi32
#define v_add_epi16 _mm_add_epi16
#define v_add_epi32 _mm_add_epi32
#define v_cmpeq_epi8 _mm_cmpeq_epi8
#define v_madd_epi16 _mm_madd_epi16
#define v_movemask_epi8 _mm_movemask_epi8
#define v_mul_epu32 _mm_mul_epu32
#define v_mulhi_epi16 _mm_mulhi_epi16
#define v_packs_epi32 _mm_packs_epi32
#define v_packus_epi16 _mm_packus_epi16
#define v_set1_epi16 _mm_set1_epi16
#define v_set1_epi32 _mm_set1_epi32
#define v_set1_epi8 _mm_set1_epi8
#define v_shuffle_epi8 _mm_shuffle_epi8
#define v_slli_epi32 _mm_slli_epi32
#define v_slli_epi64 _mm_slli_epi64
#define v_srai_epi32 _mm_srai_epi32
#define v_srli_epi16 _mm_srli_epi16
#define v_srli_epi32 _mm_srli_epi32
#define v_srli_epi64 _mm_srli_epi64
#define v_sub_epi16 _mm_sub_epi16
#define v_sub_epi32 _mm_sub_epi32
#define v_unpackhi_epi16 _mm_unpackhi_epi16
#define v_unpackhi_epi8 _mm_unpackhi_epi8
#define v_unpacklo_epi16 _mm_unpacklo_epi16
#define v_unpacklo_epi8 _mm_unpacklo_epi8

#include "convert/x86/row_x86_kernels.inc"

}  // namespace

const RowKernelSet kSsse3Rows = {"ssse3",         simd_rgb_to_rgb,  simd_rgb_to_luma, simd_rgb_to_chroma,
                                 simd_yuv_to_rgb, simd_grey_to_rgb, simd_sample,      simd_chroma};

}  // namespace qk
