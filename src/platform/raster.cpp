#include "platform/raster.h"

#include <stdint.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>
#include <cmath>

#include "platform/memory.h"

#if defined(__SSE2__)
#include <emmintrin.h>  // SSE2 (and the SSE float shuffles): the x86-64 baseline
#elif defined(__ARM_NEON)
#include <arm_neon.h>  // the AArch64 baseline
#endif

namespace qk {
namespace platform {

namespace {

constexpr uint64_t kMaxBitmapBytes = INT32_MAX;

// Copies `count` source pixels, `step` bytes apart, onto consecutive pixels.
inline void copy_run(uint8_t* dst, const uint8_t* src, ptrdiff_t step, int64_t count) {
    for (int64_t i = 0; i < count; ++i) memcpy(dst + i * kBitmapBytesPerPixel, src + i * step, kBitmapBytesPerPixel);
}

// Turns a 4x4 block: target pixel (c + j, r + i), at dst + i rows + j
// pixels, shows the source pixel at src + i * step_r + j * step_c, step_r
// being one pixel forwards or backwards. Four source runs of four pixels
// are loaded along step_r and transposed; backwards, the transposed rows
// are simply stored in the opposite order.
#if defined(__SSE2__)
inline void turn_block(uint8_t* dst, size_t dst_row_bytes, const uint8_t* src, ptrdiff_t step_c, ptrdiff_t step_r) {
    const bool backwards = step_r < 0;
    const uint8_t* first = backwards ? src + 3 * step_r : src;
    const __m128i v0 = _mm_loadu_si128(reinterpret_cast<const __m128i*>(first));
    const __m128i v1 = _mm_loadu_si128(reinterpret_cast<const __m128i*>(first + step_c));
    const __m128i v2 = _mm_loadu_si128(reinterpret_cast<const __m128i*>(first + 2 * step_c));
    const __m128i v3 = _mm_loadu_si128(reinterpret_cast<const __m128i*>(first + 3 * step_c));
    const __m128i t0 = _mm_unpacklo_epi32(v0, v1);
    const __m128i t1 = _mm_unpacklo_epi32(v2, v3);
    const __m128i t2 = _mm_unpackhi_epi32(v0, v1);
    const __m128i t3 = _mm_unpackhi_epi32(v2, v3);
    // Lane i of v0..v3, for i = 0..3.
    const __m128i lanes[4] = {_mm_unpacklo_epi64(t0, t1), _mm_unpackhi_epi64(t0, t1), _mm_unpacklo_epi64(t2, t3),
                              _mm_unpackhi_epi64(t2, t3)};
    for (int i = 0; i < 4; ++i) {
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst + i * dst_row_bytes), lanes[backwards ? 3 - i : i]);
    }
}
#elif defined(__ARM_NEON)
inline void turn_block(uint8_t* dst, size_t dst_row_bytes, const uint8_t* src, ptrdiff_t step_c, ptrdiff_t step_r) {
    const bool backwards = step_r < 0;
    const uint8_t* first = backwards ? src + 3 * step_r : src;
    const uint32x4_t v0 = vld1q_u32(reinterpret_cast<const uint32_t*>(first));
    const uint32x4_t v1 = vld1q_u32(reinterpret_cast<const uint32_t*>(first + step_c));
    const uint32x4_t v2 = vld1q_u32(reinterpret_cast<const uint32_t*>(first + 2 * step_c));
    const uint32x4_t v3 = vld1q_u32(reinterpret_cast<const uint32_t*>(first + 3 * step_c));
    // Lanes 0 and 2 of v0 and v1 interleaved in t01.val[0], lanes 1 and 3 in
    // t01.val[1]; likewise v2 and v3.
    const uint32x4x2_t t01 = vtrnq_u32(v0, v1);
    const uint32x4x2_t t23 = vtrnq_u32(v2, v3);
    const uint32x4_t lanes[4] = {vcombine_u32(vget_low_u32(t01.val[0]), vget_low_u32(t23.val[0])),
                                 vcombine_u32(vget_low_u32(t01.val[1]), vget_low_u32(t23.val[1])),
                                 vcombine_u32(vget_high_u32(t01.val[0]), vget_high_u32(t23.val[0])),
                                 vcombine_u32(vget_high_u32(t01.val[1]), vget_high_u32(t23.val[1]))};
    for (int i = 0; i < 4; ++i) {
        vst1q_u32(reinterpret_cast<uint32_t*>(dst + i * dst_row_bytes), lanes[backwards ? 3 - i : i]);
    }
}
#else
// Other targets: GCC and Clang vector extensions.
typedef uint32_t Lanes __attribute__((vector_size(16)));

inline Lanes load_lanes(const uint8_t* p) {
    Lanes v;
    memcpy(&v, p, sizeof(v));
    return v;
}

inline void turn_block(uint8_t* dst, size_t dst_row_bytes, const uint8_t* src, ptrdiff_t step_c, ptrdiff_t step_r) {
    const bool backwards = step_r < 0;
    const uint8_t* first = backwards ? src + 3 * step_r : src;
    const Lanes v0 = load_lanes(first);
    const Lanes v1 = load_lanes(first + step_c);
    const Lanes v2 = load_lanes(first + 2 * step_c);
    const Lanes v3 = load_lanes(first + 3 * step_c);
    const Lanes t0 = __builtin_shufflevector(v0, v1, 0, 4, 1, 5);
    const Lanes t1 = __builtin_shufflevector(v2, v3, 0, 4, 1, 5);
    const Lanes t2 = __builtin_shufflevector(v0, v1, 2, 6, 3, 7);
    const Lanes t3 = __builtin_shufflevector(v2, v3, 2, 6, 3, 7);
    const Lanes lanes[4] = {__builtin_shufflevector(t0, t1, 0, 1, 4, 5), __builtin_shufflevector(t0, t1, 2, 3, 6, 7),
                            __builtin_shufflevector(t2, t3, 0, 1, 4, 5), __builtin_shufflevector(t2, t3, 2, 3, 6, 7)};
    for (int i = 0; i < 4; ++i) memcpy(dst + i * dst_row_bytes, &lanes[backwards ? 3 - i : i], sizeof(Lanes));
}
#endif

// Scaled rows are written with ordinary stores or, on x86, with streaming
// stores that go past the caches to memory: a destination that does not fit
// in them anyway is then not read in line by line before being overwritten
// (a third of the memory traffic of a doubling). Streaming needs 16-byte
// aligned stores, so only where every target row starts on 16 bytes.
#if defined(__SSE2__)
template <bool kStream>
inline void store_vector(uint8_t* at, __m128i v) {
    if (kStream) {
        _mm_stream_si128(reinterpret_cast<__m128i*>(at), v);
    } else {
        _mm_storeu_si128(reinterpret_cast<__m128i*>(at), v);
    }
}
#endif

// Each of `count` source pixels twice, into dst and, when not null, into
// twin as well (the row below showing the same source row, written from the
// same loads).
template <bool kStream>
inline void double_run(uint8_t* dst, uint8_t* twin, const uint8_t* src, int64_t count) {
    int64_t i = 0;
#if defined(__SSE2__)
    for (; i + 4 <= count; i += 4) {
        const __m128i v = _mm_loadu_si128(reinterpret_cast<const __m128i*>(src + i * kBitmapBytesPerPixel));
        const __m128i low = _mm_unpacklo_epi32(v, v), high = _mm_unpackhi_epi32(v, v);
        const size_t at = static_cast<size_t>(2 * i * kBitmapBytesPerPixel);
        store_vector<kStream>(dst + at, low);
        store_vector<kStream>(dst + at + 16, high);
        if (twin != nullptr) {
            store_vector<kStream>(twin + at, low);
            store_vector<kStream>(twin + at + 16, high);
        }
    }
#elif defined(__ARM_NEON)
    for (; i + 4 <= count; i += 4) {
        const uint32x4_t v = vld1q_u32(reinterpret_cast<const uint32_t*>(src + i * kBitmapBytesPerPixel));
        const size_t at = static_cast<size_t>(2 * i * kBitmapBytesPerPixel);
        // A named pair: clang's intrinsics are macros, where a braced list's
        // comma would split the argument.
        const uint32x4x2_t pair = {{v, v}};
        vst2q_u32(reinterpret_cast<uint32_t*>(dst + at), pair);
        if (twin != nullptr) vst2q_u32(reinterpret_cast<uint32_t*>(twin + at), pair);
    }
#endif
    for (; i < count; ++i) {
        for (uint8_t* row : {dst, twin}) {
            if (row == nullptr) continue;
            memcpy(row + 2 * i * kBitmapBytesPerPixel, src + i * kBitmapBytesPerPixel, kBitmapBytesPerPixel);
            memcpy(row + (2 * i + 1) * kBitmapBytesPerPixel, src + i * kBitmapBytesPerPixel, kBitmapBytesPerPixel);
        }
    }
}

// `count` pixels: the second of each source pair. `ahead`, the source row
// to be read next, is fetched into the cache meanwhile, a line per 16
// source pixels: halving skips every other row, a jump that the hardware's
// prefetching does not foresee. Into the second-level cache (locality 2):
// fetched into the first, the row ran a third slower on x86 (measured).
template <bool kStream>
inline void halve_run(uint8_t* dst, const uint8_t* src, const uint8_t* ahead, int64_t count) {
    int64_t i = 0;
#if defined(__SSE2__)
    for (; i + 4 <= count; i += 4) {
        if (i % 8 == 0) __builtin_prefetch(ahead + 2 * i * kBitmapBytesPerPixel, 0, 2);
        const __m128 a = _mm_loadu_ps(reinterpret_cast<const float*>(src + 2 * i * kBitmapBytesPerPixel));
        const __m128 b = _mm_loadu_ps(reinterpret_cast<const float*>(src + (2 * i + 4) * kBitmapBytesPerPixel));
        store_vector<kStream>(dst + i * kBitmapBytesPerPixel, _mm_castps_si128(_mm_shuffle_ps(a, b, 0xDD)));
    }
#elif defined(__ARM_NEON)
    for (; i + 4 <= count; i += 4) {
        if (i % 8 == 0) __builtin_prefetch(ahead + 2 * i * kBitmapBytesPerPixel, 0, 2);
        const uint32x4x2_t pairs = vld2q_u32(reinterpret_cast<const uint32_t*>(src + 2 * i * kBitmapBytesPerPixel));
        vst1q_u32(reinterpret_cast<uint32_t*>(dst + i * kBitmapBytesPerPixel), pairs.val[1]);
    }
#else
    (void)ahead;
#endif
    for (; i < count; ++i) {
        memcpy(dst + i * kBitmapBytesPerPixel, src + (2 * i + 1) * kBitmapBytesPerPixel, kBitmapBytesPerPixel);
    }
}

#if defined(__SSE2__)
// The four source pixels offset[0..3] bytes into `src`.
inline __m128i gather_vector(const uint8_t* src, const uint32_t* offset) {
    __m128i pixels[4];
    for (int k = 0; k < 4; ++k) {
        int32_t pixel;
        memcpy(&pixel, src + offset[k], sizeof(pixel));
        pixels[k] = _mm_cvtsi32_si128(pixel);
    }
    return _mm_unpacklo_epi64(_mm_unpacklo_epi32(pixels[0], pixels[1]), _mm_unpacklo_epi32(pixels[2], pixels[3]));
}
#endif

// Target pixels [0, count) of `rows` scaled rows, row_bytes apart, all
// showing the same source row: pixel c takes the source pixel offset[c]
// bytes into it. `ahead` as for halve_run, a line per 8 target pixels:
// every line that the row will read, down to halving.
template <bool kStream>
inline void gather_run(uint8_t* dst, size_t row_bytes, int32_t rows, const uint8_t* src, const uint8_t* ahead,
                       const uint32_t* offset, int64_t count) {
    int64_t c = 0;
#if defined(__SSE2__)
    for (; c + 8 <= count; c += 8) {
        __builtin_prefetch(ahead + offset[c], 0, 2);
        const __m128i low = gather_vector(src, offset + c), high = gather_vector(src, offset + c + 4);
        for (int32_t k = 0; k < rows; ++k) {
            store_vector<kStream>(dst + k * row_bytes + c * kBitmapBytesPerPixel, low);
            store_vector<kStream>(dst + k * row_bytes + (c + 4) * kBitmapBytesPerPixel, high);
        }
    }
#endif
    for (; c < count; ++c) {
        if (c % 8 == 0) __builtin_prefetch(ahead + offset[c], 0, 2);
        for (int32_t k = 0; k < rows; ++k) {
            memcpy(dst + k * row_bytes + c * kBitmapBytesPerPixel, src + offset[c], kBitmapBytesPerPixel);
        }
    }
}

// The integers from lo up to, not including, hi.
struct Span {
    int64_t lo;
    int64_t hi;
};

// The values u with lo <= a + k * u < hi, k being +1 or -1.
Span solve(int64_t a, int k, int64_t lo, int64_t hi) {
    if (k > 0) return {lo - a, hi - a};
    return {a - hi + 1, a - lo + 1};
}

struct Rect {
    Span cols;
    Span rows;
    bool empty() const { return cols.lo >= cols.hi || rows.lo >= rows.hi; }
};

// Target pixel (c, r) of a turn shows the source pixel under its centre
// mapped back: sx = x0 + xc * c + xr * r, sy = y0 + yc * c + yr * r. The
// centres land on half-integers, never on a pixel edge, so integers are exact.
struct TurnMap {
    int64_t x0 = 0, y0 = 0;
    int xc = 1, xr = 0, yc = 0, yr = 1;
};

TurnMap turn_map(int quarter_turns, int32_t pivot_x, int32_t pivot_y) {
    const int64_t px = pivot_x;
    const int64_t py = pivot_y;
    TurnMap m;
    switch (((quarter_turns % 4) + 4) % 4) {
        case 0: break;
        case 1: m.x0 = px - py, m.xc = 0, m.xr = 1, m.y0 = px + py - 1, m.yc = -1, m.yr = 0; break;
        case 2: m.x0 = 2 * px - 1, m.xc = -1, m.xr = 0, m.y0 = 2 * py - 1, m.yc = 0, m.yr = -1; break;
        case 3: m.x0 = px + py - 1, m.xc = 0, m.xr = -1, m.y0 = py - px, m.yc = 1, m.yr = 0; break;
    }
    return m;
}

// What a drawing reads: columns [x_lo, x_hi) of every row of the source
// picture, pixel (x, y) at `pixels` + y rows + (x - x_lo) pixels.
struct SourceView {
    const uint8_t* pixels;
    size_t row_bytes;
    int64_t x_lo, x_hi, height;
    const uint8_t* at(int64_t x, int64_t y) const {
        return pixels + y * row_bytes + (x - x_lo) * kBitmapBytesPerPixel;
    }
};

// What a drawing writes: rows [r_lo, r_hi) of the target picture, pixel
// (c, r) at `pixels` + (r - r_lo) rows + c pixels.
struct TargetView {
    uint8_t* pixels;
    size_t row_bytes;
    int64_t width, r_lo, r_hi;
    uint8_t* at(int64_t c, int64_t r) const { return pixels + (r - r_lo) * row_bytes + c * kBitmapBytesPerPixel; }
};

SourceView whole_source(const Bitmap& bitmap) {
    return {bitmap.pixels(), bitmap.row_bytes(), 0, bitmap.width(), bitmap.height()};
}

TargetView whole_target(Bitmap& bitmap) {
    return {bitmap.pixels(), bitmap.row_bytes(), bitmap.width(), 0, bitmap.height()};
}

// Draws the turn of `source` onto `target`, pixels copied as they are, and
// returns the rectangle of target pixels it covered.
Rect draw_turn(const TurnMap& m, const SourceView& source, const TargetView& target) {
    // Each source coordinate follows one target coordinate, so the covered
    // target pixels form a rectangle.
    Span cols = m.xc != 0 ? solve(m.x0, m.xc, source.x_lo, source.x_hi) : solve(m.y0, m.yc, 0, source.height);
    Span rows = m.xr != 0 ? solve(m.x0, m.xr, source.x_lo, source.x_hi) : solve(m.y0, m.yr, 0, source.height);
    const Rect rect{{std::max<int64_t>(cols.lo, 0), std::min<int64_t>(cols.hi, target.width)},
                    {std::max<int64_t>(rows.lo, target.r_lo), std::min<int64_t>(rows.hi, target.r_hi)}};
    if (rect.empty()) return rect;

    const ptrdiff_t row_bytes = static_cast<ptrdiff_t>(source.row_bytes);
    const ptrdiff_t step_c = m.xc * kBitmapBytesPerPixel + m.yc * row_bytes;
    const ptrdiff_t step_r = m.xr * kBitmapBytesPerPixel + m.yr * row_bytes;
    auto source_at = [&](int64_t c, int64_t r) {
        return source.at(m.x0 + m.xc * c + m.xr * r, m.y0 + m.yc * c + m.yr * r);
    };
    if (m.xc != 0) {  // no turn or a half turn: source rows run along target rows
        for (int64_t r = rect.rows.lo; r < rect.rows.hi; ++r) {
            copy_run(target.at(rect.cols.lo, r), source_at(rect.cols.lo, r), step_c, rect.cols.hi - rect.cols.lo);
        }
        return rect;
    }
    // A quarter turn reads the source down its columns. Tiles of 16 target
    // rows (one cache line of each source row) by 256 target columns keep
    // the lines they read in cache; inside, 4x4 blocks are transposed whole.
    constexpr int64_t kTileRows = 16;
    constexpr int64_t kTileCols = 256;
    for (int64_t r0 = rect.rows.lo; r0 < rect.rows.hi; r0 += kTileRows) {
        const int64_t r1 = std::min(r0 + kTileRows, rect.rows.hi);
        for (int64_t c0 = rect.cols.lo; c0 < rect.cols.hi; c0 += kTileCols) {
            const int64_t c1 = std::min(c0 + kTileCols, rect.cols.hi);
            int64_t r = r0;
            for (; r + 4 <= r1; r += 4) {
                int64_t c = c0;
                for (; c + 4 <= c1; c += 4) {
                    turn_block(target.at(c, r), target.row_bytes, source_at(c, r), step_c, step_r);
                }
                // The tail's source address is formed only when there is a
                // tail: past the last column it may lie outside the source.
                for (int64_t i = 0; c < c1 && i < 4; ++i) {
                    copy_run(target.at(c, r + i), source_at(c, r + i), step_c, c1 - c);
                }
            }
            for (; r < r1; ++r) copy_run(target.at(c0, r), source_at(c0, r), step_c, c1 - c0);
        }
    }
    return rect;
}

// Makes every target pixel outside `drawn` transparent black.
void clear_outside(const TargetView& target, const Rect& drawn) {
    const size_t row_bytes = static_cast<size_t>(target.width) * kBitmapBytesPerPixel;
    for (int64_t r = target.r_lo; r < target.r_hi; ++r) {
        if (drawn.empty() || r < drawn.rows.lo || r >= drawn.rows.hi) {
            memset(target.at(0, r), 0, row_bytes);
            continue;
        }
        memset(target.at(0, r), 0, static_cast<size_t>(drawn.cols.lo) * kBitmapBytesPerPixel);
        memset(target.at(drawn.cols.hi, r), 0,
               static_cast<size_t>(target.width - drawn.cols.hi) * kBitmapBytesPerPixel);
    }
}

// A half turn exchanges pixel pairs: no second bitmap needed.
void turn_half_in_place(Bitmap& bitmap, int32_t pivot_x, int32_t pivot_y) {
    // Pixel (c, r) takes (2 px - 1 - c, 2 py - 1 - r): an exchange of pairs
    // inside the covered rectangle, which maps onto itself.
    const int64_t cx = 2 * int64_t{pivot_x} - 1;
    const int64_t cy = 2 * int64_t{pivot_y} - 1;
    const int64_t width = bitmap.width(), height = bitmap.height();
    const Rect covered{{std::max<int64_t>(0, cx + 1 - width), std::min<int64_t>(width, cx + 1)},
                       {std::max<int64_t>(0, cy + 1 - height), std::min<int64_t>(height, cy + 1)}};
    const TargetView all = whole_target(bitmap);
    if (!covered.empty()) {
        // cy is odd, so no row is its own partner.
        for (int64_t r = covered.rows.lo; r < cy - r; ++r) {
            uint8_t* top = all.at(0, r);
            uint8_t* bottom = all.at(0, cy - r);
            for (int64_t c = covered.cols.lo; c < covered.cols.hi; ++c) {
                uint8_t* a = top + c * kBitmapBytesPerPixel;
                uint8_t* b = bottom + (cx - c) * kBitmapBytesPerPixel;
                uint8_t held[kBitmapBytesPerPixel];
                memcpy(held, a, kBitmapBytesPerPixel);
                memcpy(a, b, kBitmapBytesPerPixel);
                memcpy(b, held, kBitmapBytesPerPixel);
            }
        }
    }
    clear_outside(all, covered);
}

// Maps a target index back to the source index under its centre, clamped
// into the source's `limit` pixels.
int32_t source_index(int64_t i, float scale, int32_t limit) {
    const float mapped = std::floor((static_cast<float>(i) + 0.5f) / scale);
    if (!(mapped >= 0)) return 0;
    return mapped >= static_cast<float>(limit) ? limit - 1 : static_cast<int32_t>(mapped);
}

// Goes down the target rows in runs showing the same source row (the row
// under their centres), calling draw(first target row, rows in the run,
// source row, source row of the next run). The next run's row is fetched
// into the cache meanwhile.
template <typename Draw>
void draw_rows(const Bitmap& source, float scale_y, Bitmap& target, Draw draw) {
    int32_t y = source_index(0, scale_y, source.height());
    for (int32_t r = 0; r < target.height();) {
        int32_t same = 1, next = y;
        while (r + same < target.height() && (next = source_index(r + same, scale_y, source.height())) == y) ++same;
        draw(target.row(r), same, source.row(y), source.row(next));
        r += same;
        y = next;
    }
}

// Draws a scaling whose columns are doubled (`doubled`) or halved exactly.
template <bool kStream>
void draw_doubled_or_halved(const Bitmap& source, float scale_y, bool doubled, Bitmap& target) {
    const int64_t width = target.width();
    const size_t row_bytes = target.row_bytes();
    draw_rows(source, scale_y, target, [&](uint8_t* dst, int32_t rows, const uint8_t* from, const uint8_t* ahead) {
        if (!doubled) {
            for (int32_t k = 0; k < rows; ++k) halve_run<kStream>(dst + k * row_bytes, from, ahead, width);
            return;
        }
        // Streamed, two rows at a time from the same loads. Through the
        // cache, one row at a time is faster (measured): the second reads
        // the source row from the first-level cache again.
        const int32_t step = kStream ? 2 : 1;
        for (int32_t k = 0; k < rows; k += step) {
            uint8_t* row = dst + k * row_bytes;
            uint8_t* twin = k + 1 < rows && step == 2 ? row + row_bytes : nullptr;
            double_run<kStream>(row, twin, from, width / 2);
            // An odd width ends on a pixel of its own, doubled too.
            for (uint8_t* last : {row, twin}) {
                if (width % 2 == 0 || last == nullptr) continue;
                memcpy(last + (width - 1) * kBitmapBytesPerPixel, from + (width - 1) / 2 * kBitmapBytesPerPixel,
                       kBitmapBytesPerPixel);
            }
        }
    });
}

// Draws any other scaling through a table of source byte offsets of the
// target columns, computed once per call; in strips of columns so that the
// table lives on the stack (one strip for targets up to kStrip pixels wide).
template <bool kStream>
void draw_through_columns(const Bitmap& source, float scale_x, float scale_y, Bitmap& target) {
    constexpr int64_t kStrip = 4096;
    uint32_t column_offset[kStrip];
    const int64_t width = target.width();
    const size_t row_bytes = target.row_bytes();
    for (int64_t c0 = 0; c0 < width; c0 += kStrip) {
        const int64_t count = std::min(kStrip, width - c0);
        for (int64_t c = 0; c < count; ++c) {
            column_offset[c] =
                static_cast<uint32_t>(source_index(c0 + c, scale_x, source.width())) * kBitmapBytesPerPixel;
        }
        draw_rows(source, scale_y, target, [&](uint8_t* dst, int32_t rows, const uint8_t* from, const uint8_t* ahead) {
            dst += c0 * kBitmapBytesPerPixel;
            // Streamed, the run's rows all from the same loads. Through the
            // cache, its first row, then copies of it.
            gather_run<kStream>(dst, row_bytes, kStream ? rows : 1, from, ahead, column_offset, count);
            for (int32_t k = 1; !kStream && k < rows; ++k) {
                memcpy(dst + k * row_bytes, dst, static_cast<size_t>(count) * kBitmapBytesPerPixel);
            }
        });
    }
}

}  // namespace

bool Bitmap::borrow(uint8_t* pixels, int32_t width, int32_t height) {
    release();
    if (pixels == nullptr || width < 1 || height < 1) return false;
    pixels_ = pixels;
    width_ = width;
    height_ = height;
    return true;
}

bool Bitmap::allocate(int32_t width, int32_t height, bool cleared, bool map_in) {
    release();
    if (width < 1 || height < 1) return false;
    const uint64_t bytes = uint64_t{kBitmapBytesPerPixel} * static_cast<uint64_t>(width) * static_cast<uint64_t>(height);
    if (bytes > kMaxBitmapBytes) return false;
    void* memory = allocate_pixels(bytes, cleared, map_in);
    if (memory == nullptr) return false;
    pixels_ = static_cast<uint8_t*>(memory);
    width_ = width;
    height_ = height;
    owned_ = true;
    return true;
}

void Bitmap::release() {
    if (owned_) free(pixels_);
    pixels_ = nullptr;
    width_ = 0;
    height_ = 0;
    owned_ = false;
}

bool Bitmap::reshape(int32_t width, int32_t height) {
    if (pixels_ == nullptr || width < 1 || height < 1 || int64_t{width} * height != int64_t{width_} * height_) {
        return false;
    }
    width_ = width;
    height_ = height;
    return true;
}

bool Bitmap::copy_to(void* out, uint64_t capacity) const {
    if (pixels_ == nullptr || out == nullptr || capacity < byte_count()) return false;
    memcpy(out, pixels_, byte_count());
    return true;
}

bool turn_in_place(Bitmap& bitmap, int quarter_turns, int32_t pivot_x, int32_t pivot_y) {
    if (!bitmap.has_pixels()) return false;
    if (quarter_turns % 2 == 0) {
        if (quarter_turns % 4 != 0) turn_half_in_place(bitmap, pivot_x, pivot_y);
        return true;
    }
    const TurnMap m = turn_map(quarter_turns, pivot_x, pivot_y);
    const int64_t width = bitmap.width(), height = bitmap.height();
    // The turned picture is `height` wide and `width` high. Its bottom rows
    // are drawn into memory of their own first; then the top rows need only
    // some source columns, which are gathered at the end of the buffer, clear
    // of where the top rows go, and drawn from there.
    const int32_t turned_width = bitmap.height(), turned_height = bitmap.width();
    const int64_t top = turned_height / 2;
    Bitmap bottom;
    if (!bottom.allocate(turned_width, static_cast<int32_t>(turned_height - top), /*cleared=*/true)) return false;
    draw_turn(m, whole_source(bitmap), TargetView{bottom.pixels(), bottom.row_bytes(), turned_width, top, turned_height});

    // The top rows show source columns x0 + xr * r, r in [0, top): at most
    // `top` of them, so top + kept <= width and the two never meet.
    const int64_t first = m.xr > 0 ? m.x0 : m.x0 - top + 1;
    const int64_t lo = std::clamp<int64_t>(first, 0, width);
    const int64_t hi = std::clamp<int64_t>(first + top, lo, width);
    const size_t kept_row_bytes = static_cast<size_t>(hi - lo) * kBitmapBytesPerPixel;
    uint8_t* const kept = bitmap.pixels() + bitmap.byte_count() - kept_row_bytes * static_cast<size_t>(height);
    // Every row moves towards the end (the gathered picture ends where the
    // buffer does and its rows are shorter), so the last row moves first and
    // none lands on a row still to move.
    for (int64_t y = height - 1; y >= 0; --y) {
        const uint8_t* columns = bitmap.row(static_cast<int32_t>(y)) + lo * kBitmapBytesPerPixel;
        memmove(kept + static_cast<size_t>(y) * kept_row_bytes, columns, kept_row_bytes);
    }
    const TargetView top_rows{bitmap.pixels(), bottom.row_bytes(), turned_width, 0, top};
    clear_outside(top_rows, draw_turn(m, SourceView{kept, kept_row_bytes, lo, hi, height}, top_rows));
    memcpy(top_rows.at(0, top), bottom.pixels(), bottom.byte_count());
    return bitmap.reshape(turned_width, turned_height);
}

void turn_copy(const uint8_t* src, size_t src_row_bytes, int32_t width, int32_t height, int quarter_turns,
               uint8_t* dst, size_t dst_row_bytes) {
    if (width < 1 || height < 1) return;
    // Target pixel (c, r) shows source (x0 + xc c + xr r, y0 + yc c + yr r).
    TurnMap m;
    const int q = ((quarter_turns % 4) + 4) % 4;
    switch (q) {
        case 0: break;
        case 1: m.x0 = 0, m.xc = 0, m.xr = 1, m.y0 = height - 1, m.yc = -1, m.yr = 0; break;
        case 2: m.x0 = width - 1, m.xc = -1, m.xr = 0, m.y0 = height - 1, m.yc = 0, m.yr = -1; break;
        case 3: m.x0 = width - 1, m.xc = 0, m.xr = -1, m.y0 = 0, m.yc = 1, m.yr = 0; break;
    }
    const bool exchanged = q % 2 == 1;
    draw_turn(m, SourceView{src, src_row_bytes, 0, width, height},
              TargetView{dst, dst_row_bytes, exchanged ? height : width, 0, exchanged ? width : height});
}

void draw_scaled(const Bitmap& source, float scale_x, float scale_y, Bitmap& target) {
    if (!source.has_pixels() || !target.has_pixels() || !(scale_x > 0) || !(scale_y > 0)) return;
    // Exact doubling (column c shows c / 2) and halving (2c + 1) move whole
    // vectors along whole rows, without a column table.
    bool doubled = true, halved = true;
    for (int64_t c = 0; c < target.width() && (doubled || halved); ++c) {
        const int64_t x = source_index(c, scale_x, source.width());
        doubled = doubled && x == c / 2;
        halved = halved && x == 2 * c + 1;
    }
#if defined(__SSE2__)
    if (target.byte_count() >= kStreamBytes && reinterpret_cast<uintptr_t>(target.pixels()) % 16 == 0 &&
        target.row_bytes() % 16 == 0) {
        if (doubled || halved) {
            draw_doubled_or_halved<true>(source, scale_y, doubled, target);
        } else {
            draw_through_columns<true>(source, scale_x, scale_y, target);
        }
        _mm_sfence();  // the streamed stores reach memory before anyone reads the target
        return;
    }
#endif
    if (doubled || halved) {
        draw_doubled_or_halved<false>(source, scale_y, doubled, target);
    } else {
        draw_through_columns<false>(source, scale_x, scale_y, target);
    }
}

}  // namespace platform
}  // namespace qk
