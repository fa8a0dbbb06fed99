// Row kernels for x86-64 with AVX2. This file alone is compiled with
// -mavx2, and its kernels run only after supported_row_sets() has seen the
// CPU support it. So nothing here may be an inline function that baseline
// code could share (the linker might keep this file's copy): kernels live in
// an anonymous namespace and reach shared code through out-of-line calls.
//
// The kernels themselves are in row_x86_kernels.inc, shared with
// row_ssse3.cpp; this file gives them two 128-bit lanes.
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

// Two 128-bit lanes, each converting its own block of 16 pixels as
// row_ssse3.cpp does: every load and store names the distance `lane` from
// the first lane's bytes to the second's, and the in-lane operations of
// AVX2 (byte shuffles, packs, unpacks) then need no lane crossing.
using V = __m256i;
constexpr int kLanes = 2;

QK_SIMD V load(const uint8_t* p, ptrdiff_t lane) {
    return _mm256_inserti128_si256(_mm256_castsi128_si256(_mm_loadu_si128(reinterpret_cast<const __m128i*>(p))),
                                   _mm_loadu_si128(reinterpret_cast<const __m128i*>(p + lane)), 1);
}
QK_SIMD void store(uint8_t* p, ptrdiff_t lane, V value) {
    _mm_storeu_si128(reinterpret_cast<__m128i*>(p), _mm256_castsi256_si128(value));
    _mm_storeu_si128(reinterpret_cast<__m128i*>(p + lane), _mm256_extracti128_si256(value, 1));
}
// store() past the caches, 16-byte aligned.
QK_SIMD void store_streamed(uint8_t* p, ptrdiff_t lane, V value) {
    _mm_stream_si128(reinterpret_cast<__m128i*>(p), _mm256_castsi256_si128(value));
    _mm_stream_si128(reinterpret_cast<__m128i*>(p + lane), _mm256_extracti128_si256(value, 1));
}
// 8 bytes into the low half of each lane.
QK_SIMD V load_half(const uint8_t* p, ptrdiff_t lane) {
    return _mm256_inserti128_si256(_mm256_castsi128_si256(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(p))),
                                   _mm_loadl_epi64(reinterpret_cast<const __m128i*>(p + lane)), 1);
}
QK_SIMD V v_broadcast(const int8_t* bytes) {
    return _mm256_broadcastsi128_si256(_mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes)));
}
QK_SIMD V v_and(V a, V b) { return _mm256_and_si256(a, b); }
QK_SIMD V v_or(V a, V b) { return _mm256_or_si256(a, b); }
QK_SIMD V v_xor(V a, V b) { return _mm256_xor_si256(a, b); }
QK_SIMD V v_setzero() { return _mm256_setzero_si256(); }
// A block's 32 bytes, and 16 bytes widened to 16-bit lanes.
QK_SIMD V load_block(const uint8_t* p) { return _mm256_loadu_si256(reinterpret_cast<const __m256i*>(p)); }
QK_SIMD void store_block(uint8_t* p, V value) { _mm256_storeu_si256(reinterpret_cast<__m256i*>(p), value); }
QK_SIMD void store_block_streamed(uint8_t* p, V value) { _mm256_stream_si256(reinterpret_cast<__m256i*>(p), value); }
QK_SIMD V widen_half(const uint8_t* p) {
    return _mm256_cvtepu8_epi16(_mm_loadu_si128(reinterpret_cast<const __m128i*>(p)));
}
// The YUV to RGB kernels take 32 pixels of a row at a time with whole-vector
// loads and stores. Their in-lane operations would interleave the channels
// of pixels 0 to 15 into lane 0 and 16 to 31 into lane 1 and so split every
// 32-byte store; with the luma's (and chroma pairs') 4-byte groups dealt
// alternately to the lanes first, lane 0 holding pixels 0-3, 8-11, 16-19,
// 24-27, each 32 bytes stored are consecutive pixels.
QK_SIMD V arrange_dwords(V a) { return _mm256_permutevar8x32_epi32(a, _mm256_setr_epi32(0, 2, 4, 6, 1, 3, 5, 7)); }
// The same for 16 packed 4:2:2 pixels, 4 to 8 bytes: lane 0 takes pixels
// 0-3 and 8-11.
QK_SIMD V arrange_qwords(V a) { return _mm256_permute4x64_epi64(a, 0xd8); }
// 12 bytes of 3-byte pixels at the start of each lane to the first 24.
QK_SIMD V join_rgb24(V a) { return _mm256_permutevar8x32_epi32(a, _mm256_setr_epi32(0, 1, 2, 4, 5, 6, 3, 7)); }
template <int N>
QK_SIMD V v_alignr(V high, V low) {
    return _mm256_alignr_epi8(high, low, N);
}
template <int N>
QK_SIMD V v_shift_right_bytes(V a) {
    return _mm256_srli_si256(a, N);
}
template <int N>
QK_SIMD V v_shift_left_bytes(V a) {
    return _mm256_slli_si256(a, N);
}

#define QK_X86_OP(name) _mm256_##name
#include "convert/x86/row_x86_ops.h"

#include "convert/x86/row_x86_kernels.inc"

}  // namespace

const RowKernelSet kAvx2Rows = {"avx2",          simd_rgb_to_rgb,  simd_rgb_to_luma, simd_rgb_to_chroma,
                                simd_yuv_to_rgb, simd_grey_to_rgb, simd_sample,      simd_chroma,
                                simd_pack,   simd_unpack};

}  // namespace qk
