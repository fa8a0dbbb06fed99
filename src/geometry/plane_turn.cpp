#include "geometry/plane_turn.h"

#include <stddef.h>
#include <stdint.h>
#include <string.h>

#include <algorithm>

#if defined(__SSE2__)
#include <emmintrin.h>  // the x86-64 baseline
#elif defined(__ARM_NEON)
#include <arm_neon.h>  // the AArch64 baseline
#endif

namespace qk {
namespace {

// One element of `E` bytes from src to dst.
template <int E>
inline void move_element(uint8_t* dst, const uint8_t* src) {
    memcpy(dst, src, E);
}

// A 16-byte vector and the two halves of interleaving E-byte elements of a
// and b (SSE2's unpack, NEON's zip), and the vector's elements reversed.
#if defined(__SSE2__)
#define QK_PLANE_TURN_VECTORS 1
using Vec = __m128i;
inline Vec load(const uint8_t* p) { return _mm_loadu_si128(reinterpret_cast<const __m128i*>(p)); }
inline void store(uint8_t* p, Vec v) { _mm_storeu_si128(reinterpret_cast<__m128i*>(p), v); }
template <int E>
inline Vec zip_lo(Vec a, Vec b) {
    return E == 1 ? _mm_unpacklo_epi8(a, b) : _mm_unpacklo_epi16(a, b);
}
template <int E>
inline Vec zip_hi(Vec a, Vec b) {
    return E == 1 ? _mm_unpackhi_epi8(a, b) : _mm_unpackhi_epi16(a, b);
}
template <int E>
inline Vec reversed(Vec v) {
    // Halves exchanged, then the four 16-bit words of each half reversed;
    // bytes also exchanged inside each word for E = 1.
    v = _mm_shuffle_epi32(v, 0x4E);
    v = _mm_shufflehi_epi16(_mm_shufflelo_epi16(v, 0x1B), 0x1B);
    return E == 1 ? _mm_or_si128(_mm_slli_epi16(v, 8), _mm_srli_epi16(v, 8)) : v;
}
#elif defined(__ARM_NEON)
#define QK_PLANE_TURN_VECTORS 1
using Vec = uint8x16_t;
inline Vec load(const uint8_t* p) { return vld1q_u8(p); }
inline void store(uint8_t* p, Vec v) { vst1q_u8(p, v); }
template <int E>
inline Vec zip_lo(Vec a, Vec b) {
    if (E == 1) return vzip1q_u8(a, b);
    return vreinterpretq_u8_u16(vzip1q_u16(vreinterpretq_u16_u8(a), vreinterpretq_u16_u8(b)));
}
template <int E>
inline Vec zip_hi(Vec a, Vec b) {
    if (E == 1) return vzip2q_u8(a, b);
    return vreinterpretq_u8_u16(vzip2q_u16(vreinterpretq_u16_u8(a), vreinterpretq_u16_u8(b)));
}
template <int E>
inline Vec reversed(Vec v) {
    // Each 8-byte half reversed, then the halves exchanged.
    v = E == 1 ? vrev64q_u8(v) : vreinterpretq_u8_u16(vrev64q_u16(vreinterpretq_u16_u8(v)));
    return vextq_u8(v, v, 8);
}
#endif

// Elements of a vector: a block of kBlock x kBlock elements is transposed
// in registers.
template <int E>
constexpr int kBlock = 16 / E;

// dst element (i, j) (row i, column j) takes src element (j, i), for i in
// [i0, i1) and j in [j0, j1): the edges the blocks leave.
template <int E>
void transpose_scalar(const uint8_t* src, ptrdiff_t src_stride, uint8_t* dst, ptrdiff_t dst_stride, int32_t i0,
                      int32_t i1, int32_t j0, int32_t j1) {
    for (ptrdiff_t i = i0; i < i1; ++i) {
        for (ptrdiff_t j = j0; j < j1; ++j) move_element<E>(dst + i * dst_stride + j * E, src + j * src_stride + i * E);
    }
}

#if defined(QK_PLANE_TURN_VECTORS)
// One block: kBlock source rows of one vector each. Every round interleaves
// row i with row i + kBlock/2; as a bit string, (row, element) is rotated
// left one bit per round, so log2(kBlock) rounds exchange row and element.
template <int E>
inline void transpose_block(const uint8_t* src, ptrdiff_t src_stride, uint8_t* dst, ptrdiff_t dst_stride) {
    constexpr int n = kBlock<E>;
    Vec v[n];
#pragma GCC unroll 16
    for (int i = 0; i < n; ++i) v[i] = load(src + i * src_stride);
#pragma GCC unroll 4
    for (int rounds = 1; rounds < n; rounds *= 2) {
        Vec t[n];
#pragma GCC unroll 8
        for (int i = 0; i < n / 2; ++i) {
            t[2 * i] = zip_lo<E>(v[i], v[i + n / 2]);
            t[2 * i + 1] = zip_hi<E>(v[i], v[i + n / 2]);
        }
#pragma GCC unroll 16
        for (int i = 0; i < n; ++i) v[i] = t[i];
    }
#pragma GCC unroll 16
    for (int i = 0; i < n; ++i) store(dst + i * dst_stride, v[i]);
}
#endif

// dst row i, element j takes src row j, element i, for i < width and j <
// height; either stride may be negative. Tiles of 64 source rows by 256
// bytes write whole cache lines of 256 target rows while the source lines
// they read are still cached.
template <int E>
void transpose(const uint8_t* src, ptrdiff_t src_stride, uint8_t* dst, ptrdiff_t dst_stride, int32_t width,
               int32_t height) {
#if defined(QK_PLANE_TURN_VECTORS)
    constexpr int32_t n = kBlock<E>;
    constexpr ptrdiff_t tile_rows = 64 / E, tile_cols = 256 / E;
    const int32_t block_width = width - width % n, block_height = height - height % n;
    for (ptrdiff_t y0 = 0; y0 < block_height; y0 += tile_rows) {
        const ptrdiff_t y1 = std::min<ptrdiff_t>(y0 + tile_rows, block_height);
        for (ptrdiff_t x0 = 0; x0 < block_width; x0 += tile_cols) {
            const ptrdiff_t x1 = std::min<ptrdiff_t>(x0 + tile_cols, block_width);
            for (ptrdiff_t y = y0; y < y1; y += n) {
                for (ptrdiff_t x = x0; x < x1; x += n) {
                    transpose_block<E>(src + y * src_stride + x * E, src_stride, dst + x * dst_stride + y * E,
                                       dst_stride);
                }
            }
        }
    }
    transpose_scalar<E>(src, src_stride, dst, dst_stride, 0, block_width, block_height, height);
    transpose_scalar<E>(src, src_stride, dst, dst_stride, block_width, width, 0, height);
#else
    transpose_scalar<E>(src, src_stride, dst, dst_stride, 0, width, 0, height);
#endif
}

// dst row r takes src row height-1-r, its elements in reverse order.
template <int E>
void half_turn(const uint8_t* src, ptrdiff_t src_stride, uint8_t* dst, ptrdiff_t dst_stride, int32_t width,
               int32_t height) {
    for (ptrdiff_t r = 0; r < height; ++r) {
        const uint8_t* from = src + (height - 1 - r) * src_stride;
        uint8_t* to = dst + r * dst_stride;
        ptrdiff_t c = 0;
#if defined(QK_PLANE_TURN_VECTORS)
        for (; c + kBlock<E> <= width; c += kBlock<E>) {
            store(to + c * E, reversed<E>(load(from + (width - c - kBlock<E>) * E)));
        }
#endif
        for (; c < width; ++c) move_element<E>(to + c * E, from + (width - 1 - c) * E);
    }
}

template <int E>
void turn(const uint8_t* src, ptrdiff_t src_stride, int32_t width, int32_t height, int orient, uint8_t* dst,
          ptrdiff_t dst_stride) {
    switch (orient) {
        case 0:
            for (ptrdiff_t r = 0; r < height; ++r) {
                memcpy(dst + r * dst_stride, src + r * src_stride, static_cast<size_t>(width) * E);
            }
            break;
        // Source column i becomes target row width-1-i: the transpose's rows
        // are stored from the last target row upwards.
        case 1: transpose<E>(src, src_stride, dst + (width - 1) * dst_stride, -dst_stride, width, height); break;
        case 2: half_turn<E>(src, src_stride, dst, dst_stride, width, height); break;
        // Target row i is source column i read upwards: the source's rows
        // are read from the last one upwards.
        default: transpose<E>(src + (height - 1) * src_stride, -src_stride, dst, dst_stride, width, height); break;
    }
}

// A half turn within the plane: rows r and height-1-r exchanged, each
// reversed, through `row` (width elements).
template <int E>
void half_turn_in_place(uint8_t* plane, int32_t width, int32_t height, uint8_t* row) {
    const ptrdiff_t stride = static_cast<ptrdiff_t>(width) * E;
    for (ptrdiff_t r = 0; r < height - 1 - r; ++r) {
        uint8_t* top = plane + r * stride;
        uint8_t* bottom = plane + (height - 1 - r) * stride;
        memcpy(row, top, static_cast<size_t>(stride));
        half_turn<E>(bottom, stride, top, stride, width, 1);
        half_turn<E>(row, stride, bottom, stride, width, 1);
    }
    if (height % 2 != 0) {
        uint8_t* middle = plane + height / 2 * stride;
        memcpy(row, middle, static_cast<size_t>(stride));
        half_turn<E>(row, stride, middle, stride, width, 1);
    }
}

// The first step of a quarter turn within the plane: target rows [top,
// width) are turned into `rest`, from the source columns they show; then
// the columns that the top rows show are gathered at the end of the plane,
// clear of where the top rows go (2 top <= width), for gathered_rows.
template <int E>
void quarter_turn_in_place(uint8_t* plane, int32_t width, int32_t height, int orient, int32_t top, uint8_t* rest) {
    const ptrdiff_t stride = static_cast<ptrdiff_t>(width) * E;
    // Target row r shows source column width-1-r (orient 1) or r (orient 3).
    const int32_t rest_lo = orient == 1 ? 0 : top;
    turn<E>(plane + rest_lo * E, stride, width - top, height, orient, rest, static_cast<ptrdiff_t>(height) * E);
    if (top == 0) return;
    const int32_t lo = orient == 1 ? width - top : 0;
    const ptrdiff_t kept_stride = static_cast<ptrdiff_t>(top) * E;
    uint8_t* const kept = plane + (static_cast<ptrdiff_t>(width) - top) * height * E;
    // Every row moves towards the end (the gathered rows are shorter and end
    // where the plane does), so the last row moves first and none lands on
    // a row still to move.
    for (ptrdiff_t y = height - 1; y >= 0; --y) {
        memmove(kept + y * kept_stride, plane + y * stride + lo * E, static_cast<size_t>(kept_stride));
    }
}

// Target rows [r0, r1) of a quarter turn, from the gathered columns.
template <int E>
void gathered_rows(uint8_t* plane, int32_t width, int32_t height, int orient, int32_t top, int32_t r0, int32_t r1) {
    const ptrdiff_t kept_stride = static_cast<ptrdiff_t>(top) * E;
    const uint8_t* const kept = plane + (static_cast<ptrdiff_t>(width) - top) * height * E;
    // Gathered column c shows as row top-1-c (orient 1) or c (orient 3).
    const int32_t lo = orient == 1 ? top - r1 : r0;
    turn<E>(kept + lo * E, kept_stride, r1 - r0, height, orient, plane + static_cast<ptrdiff_t>(r0) * height * E,
            static_cast<ptrdiff_t>(height) * E);
}

}  // namespace

void turn_plane_in_place(uint8_t* plane, int32_t width, int32_t height, int element_bytes, int orient, int32_t top,
                         uint8_t* rest) {
    if (width < 1 || height < 1 || orient == 0) return;
    if (orient == 2) {
        if (element_bytes == 2) {
            half_turn_in_place<2>(plane, width, height, rest);
        } else {
            half_turn_in_place<1>(plane, width, height, rest);
        }
    } else if (element_bytes == 2) {
        quarter_turn_in_place<2>(plane, width, height, orient, top, rest);
    } else {
        quarter_turn_in_place<1>(plane, width, height, orient, top, rest);
    }
}

void turn_gathered_rows(uint8_t* plane, int32_t width, int32_t height, int element_bytes, int orient, int32_t top,
                        int32_t r0, int32_t r1) {
    if (r0 >= r1 || orient % 2 == 0) return;
    if (element_bytes == 2) {
        gathered_rows<2>(plane, width, height, orient, top, r0, r1);
    } else {
        gathered_rows<1>(plane, width, height, orient, top, r0, r1);
    }
}

void turn_plane(const uint8_t* src, size_t src_row_bytes, int32_t width, int32_t height, int element_bytes,
                int orient, uint8_t* dst, size_t dst_row_bytes) {
    if (width < 1 || height < 1) return;
    const ptrdiff_t src_stride = static_cast<ptrdiff_t>(src_row_bytes);
    const ptrdiff_t dst_stride = static_cast<ptrdiff_t>(dst_row_bytes);
    if (element_bytes == 2) {
        turn<2>(src, src_stride, width, height, orient, dst, dst_stride);
    } else {
        turn<1>(src, src_stride, width, height, orient, dst, dst_stride);
    }
}

}  // namespace qk
