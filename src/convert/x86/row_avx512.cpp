// Row kernels for x86-64 with AVX-512 (F and BW). This file alone is
// compiled with -mavx512f -mavx512bw, under the rules of row_avx2.cpp. It
// gives the kernels of row_x86_kernels.inc four 128-bit lanes, and its set
// offers only those from YUV and GREY to RGB: their arithmetic is their
// cost, and the wider vectors and mask compares take a tenth of it (packed
// 4:2:2 to BGRA in cache: 0.84 of libyuv's rate with AVX2, 0.97 here). The
// others, bound by memory or by their shuffles, stay with AVX2, and go
// unused here.
//
// GCC 12's AVX-512 intrinsics leave the upper parts of some results
// undefined in a way its own warnings then report at every use.
#if defined(__GNUC__) && !defined(__clang__)
#pragma GCC diagnostic ignored "-Wmaybe-uninitialized"
#pragma GCC diagnostic ignored "-Wuninitialized"
#endif
#pragma GCC diagnostic ignored "-Wunused-function"
#include <immintrin.h>
#include <stddef.h>
#include <stdint.h>
#include <string.h>

#include <type_traits>
#include <utility>

#include "convert/row.h"

#define QK_SIMD [[gnu::always_inline]] inline

namespace qk {
namespace {

// Four 128-bit lanes, each converting its own block of 16 pixels: lane k's
// bytes lie k * `lane` bytes from the first lane's.
using V = __m512i;
constexpr int kLanes = 4;

QK_SIMD __m128i load16(const uint8_t* p) { return _mm_loadu_si128(reinterpret_cast<const __m128i*>(p)); }
QK_SIMD __m128i load8(const uint8_t* p) { return _mm_loadl_epi64(reinterpret_cast<const __m128i*>(p)); }
// A vector of four pieces that `piece` loads, lane k's from p + k * lane.
QK_SIMD V gather(const uint8_t* p, ptrdiff_t lane, __m128i (*piece)(const uint8_t*)) {
    V v = _mm512_zextsi128_si512(piece(p));
    v = _mm512_inserti32x4(v, piece(p + lane), 1);
    v = _mm512_inserti32x4(v, piece(p + 2 * lane), 2);
    return _mm512_inserti32x4(v, piece(p + 3 * lane), 3);
}
QK_SIMD V load(const uint8_t* p, ptrdiff_t lane) { return gather(p, lane, load16); }
// 8 bytes into the low half of each lane.
QK_SIMD V load_half(const uint8_t* p, ptrdiff_t lane) { return gather(p, lane, load8); }
QK_SIMD void store16(uint8_t* p, __m128i value) { _mm_storeu_si128(reinterpret_cast<__m128i*>(p), value); }
QK_SIMD void stream16(uint8_t* p, __m128i value) { _mm_stream_si128(reinterpret_cast<__m128i*>(p), value); }
// The four lanes of `value`, each stored by `piece`, lane k's at p + k * lane.
QK_SIMD void scatter(uint8_t* p, ptrdiff_t lane, V value, void (*piece)(uint8_t*, __m128i)) {
    piece(p, _mm512_castsi512_si128(value));
    piece(p + lane, _mm512_extracti32x4_epi32(value, 1));
    piece(p + 2 * lane, _mm512_extracti32x4_epi32(value, 2));
    piece(p + 3 * lane, _mm512_extracti32x4_epi32(value, 3));
}
QK_SIMD void store(uint8_t* p, ptrdiff_t lane, V value) { scatter(p, lane, value, store16); }
// store() past the caches, 16-byte aligned.
QK_SIMD void store_streamed(uint8_t* p, ptrdiff_t lane, V value) { scatter(p, lane, value, stream16); }
QK_SIMD V v_broadcast(const int8_t* bytes) {
    return _mm512_broadcast_i32x4(load16(reinterpret_cast<const uint8_t*>(bytes)));
}
QK_SIMD V v_and(V a, V b) { return _mm512_and_si512(a, b); }
QK_SIMD V v_or(V a, V b) { return _mm512_or_si512(a, b); }
QK_SIMD V v_xor(V a, V b) { return _mm512_xor_si512(a, b); }
QK_SIMD V v_setzero() { return _mm512_setzero_si512(); }
QK_SIMD V load_block(const uint8_t* p) { return _mm512_loadu_si512(p); }
QK_SIMD void store_block(uint8_t* p, V value) { _mm512_storeu_si512(p, value); }
QK_SIMD void store_block_streamed(uint8_t* p, V value) { _mm512_stream_si512(reinterpret_cast<__m512i*>(p), value); }
QK_SIMD V widen_half(const uint8_t* p) {
    return _mm512_cvtepu8_epi16(_mm256_loadu_si256(reinterpret_cast<const __m256i*>(p)));
}
// As in row_avx2.cpp, 4-byte groups dealt to the lanes in turn, so that
// each 64 bytes stored are consecutive pixels: lane k holds groups k, k + 4,
// k + 8 and k + 12.
QK_SIMD V arrange_dwords(V a) {
    return _mm512_permutexvar_epi32(_mm512_setr_epi32(0, 4, 8, 12, 1, 5, 9, 13, 2, 6, 10, 14, 3, 7, 11, 15), a);
}
// Packed 4:2:2, 8-byte groups of 4 pixels: lane k takes groups k and k + 4.
QK_SIMD V arrange_qwords(V a) { return _mm512_permutexvar_epi64(_mm512_setr_epi64(0, 4, 1, 5, 2, 6, 3, 7), a); }
// 12 bytes of 3-byte pixels at the start of each lane to the first 48.
QK_SIMD V join_rgb24(V a) {
    return _mm512_permutexvar_epi32(_mm512_setr_epi32(0, 1, 2, 4, 5, 6, 8, 9, 10, 12, 13, 14, 3, 7, 11, 15), a);
}
template <int N>
QK_SIMD V v_alignr(V high, V low) {
    return _mm512_alignr_epi8(high, low, N);
}
template <int N>
QK_SIMD V v_shift_right_bytes(V a) {
    return _mm512_bsrli_epi128(a, N);
}
template <int N>
QK_SIMD V v_shift_left_bytes(V a) {
    return _mm512_bslli_epi128(a, N);
}
// Compares of 16-bit lanes give masks (row_x86_kernels.inc has lanes of
// ones elsewhere): one operation fewer for a carry, two for a test.
#define QK_MASK_REGISTERS
using LaneMask = __mmask32;
QK_SIMD LaneMask lanes_equal_epi16(V a, V b) { return _mm512_cmpeq_epi16_mask(a, b); }
QK_SIMD LaneMask lanes_or(LaneMask a, LaneMask b) { return a | b; }
QK_SIMD bool any_lane(LaneMask lanes) { return lanes != 0; }
// x + 1 in the lanes where a <= b, unsigned.
QK_SIMD V add_one_where_le_epu16(V x, V a, V b) {
    return _mm512_mask_sub_epi16(x, _mm512_cmple_epu16_mask(a, b), x, _mm512_set1_epi32(-1));
}

#define QK_X86_OP(name) _mm512_##name
#include "convert/x86/row_x86_ops.h"

#include "convert/x86/row_x86_kernels.inc"

}  // namespace

// The kernels to RGB only (see the top of this file).
const RowKernelSet kAvx512Rows = {"avx512", nullptr, nullptr, nullptr, simd_yuv_to_rgb, simd_grey_to_rgb,
                                  nullptr,  nullptr, nullptr, nullptr};

}  // namespace qk
