#include "platform/raster.h"

#include <stdint.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>
#include <cmath>

#include "platform/memory.h"

namespace qk {
namespace platform {

namespace {

constexpr uint64_t kMaxBitmapBytes = INT32_MAX;

// x / 255 rounded to nearest, exact for x in [0, 255 * 255].
inline unsigned div255(unsigned x) {
    x += 128;
    return (x + (x >> 8)) >> 8;
}

// Premultiplied source-over: result = src + dst x (255 - src alpha) / 255.
// An opaque source pixel, or a transparent-black target pixel, is a plain
// copy: the common cases stay as fast as a copy.
inline void blend_pixel(uint8_t* dst, const uint8_t* src) {
    const unsigned alpha = src[3];
    if (alpha != 255) {
        uint32_t existing;
        memcpy(&existing, dst, sizeof(existing));
        if (existing != 0) {
            const unsigned keep = 255 - alpha;
            for (int i = 0; i < kBitmapBytesPerPixel; ++i) {
                // Colour bytes above alpha are not premultiplied; saturate them.
                const unsigned value = src[i] + div255(dst[i] * keep);
                dst[i] = static_cast<uint8_t>(value > 255 ? 255 : value);
            }
            return;
        }
    }
    memcpy(dst, src, kBitmapBytesPerPixel);
}

// Blends `count` source pixels, `step` bytes apart, onto consecutive pixels.
inline void blend_run(uint8_t* dst, const uint8_t* src, ptrdiff_t step, int64_t count) {
    for (int64_t i = 0; i < count; ++i) blend_pixel(dst + i * kBitmapBytesPerPixel, src + i * step);
}

// Four pixels as one vector (GCC and Clang vector extensions: SSE2 on x86,
// NEON on ARM).
typedef uint32_t Lanes __attribute__((vector_size(16)));

inline Lanes load_lanes(const uint8_t* p) {
    Lanes v;
    memcpy(&v, p, sizeof(v));
    return v;
}

// A pixel value with only its alpha byte set, whatever the byte order.
inline uint32_t alpha_mask() {
    const uint8_t bytes[kBitmapBytesPerPixel] = {0, 0, 0, 0xff};
    uint32_t mask;
    memcpy(&mask, bytes, sizeof(mask));
    return mask;
}

// Turns a 4x4 block: target pixel (c + j, r + i), at dst + i rows + j
// pixels, shows the source pixel at src + i * step_r + j * step_c, step_r
// being one pixel forwards or backwards. An opaque block is transposed four
// pixels at a time; any other blends pixel by pixel.
inline void turn_block(uint8_t* dst, size_t dst_row_bytes, const uint8_t* src, ptrdiff_t step_c, ptrdiff_t step_r) {
    const bool backwards = step_r < 0;
    const uint8_t* first = backwards ? src + 3 * step_r : src;
    Lanes v0 = load_lanes(first);
    Lanes v1 = load_lanes(first + step_c);
    Lanes v2 = load_lanes(first + 2 * step_c);
    Lanes v3 = load_lanes(first + 3 * step_c);
    const Lanes all = v0 & v1 & v2 & v3;
    const uint32_t mask = alpha_mask();
    if ((all[0] & all[1] & all[2] & all[3] & mask) != mask) {
        for (int i = 0; i < 4; ++i) blend_run(dst + i * dst_row_bytes, src + i * step_r, step_c, 4);
        return;
    }
    if (backwards) {
        v0 = __builtin_shufflevector(v0, v0, 3, 2, 1, 0);
        v1 = __builtin_shufflevector(v1, v1, 3, 2, 1, 0);
        v2 = __builtin_shufflevector(v2, v2, 3, 2, 1, 0);
        v3 = __builtin_shufflevector(v3, v3, 3, 2, 1, 0);
    }
    // Target row i is lane i of v0..v3.
    const Lanes t0 = __builtin_shufflevector(v0, v1, 0, 4, 1, 5);
    const Lanes t1 = __builtin_shufflevector(v2, v3, 0, 4, 1, 5);
    const Lanes t2 = __builtin_shufflevector(v0, v1, 2, 6, 3, 7);
    const Lanes t3 = __builtin_shufflevector(v2, v3, 2, 6, 3, 7);
    const Lanes rows[4] = {__builtin_shufflevector(t0, t1, 0, 1, 4, 5), __builtin_shufflevector(t0, t1, 2, 3, 6, 7),
                           __builtin_shufflevector(t2, t3, 0, 1, 4, 5), __builtin_shufflevector(t2, t3, 2, 3, 6, 7)};
    for (int i = 0; i < 4; ++i) memcpy(dst + i * dst_row_bytes, &rows[i], sizeof(Lanes));
}

// The values u with 0 <= a + k * u < n, for k = +1 or -1, as [lo, hi).
struct Span {
    int64_t lo;
    int64_t hi;
};
Span solve(int64_t a, int k, int64_t n) {
    if (k > 0) return {-a, n - a};
    return {a - n + 1, a + 1};
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

bool Bitmap::allocate(int32_t width, int32_t height, bool cleared) {
    release();
    if (width < 1 || height < 1) return false;
    const uint64_t bytes = uint64_t{kBitmapBytesPerPixel} * static_cast<uint64_t>(width) * static_cast<uint64_t>(height);
    if (bytes > kMaxBitmapBytes) return false;
    void* memory = allocate_pixels(bytes, cleared);
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

void Bitmap::clear() {
    if (pixels_ != nullptr) memset(pixels_, 0, byte_count());
}

bool Bitmap::copy_to(void* out, uint64_t capacity) const {
    if (pixels_ == nullptr || out == nullptr || capacity < byte_count()) return false;
    memcpy(out, pixels_, byte_count());
    return true;
}

void draw_turned(const Bitmap& source, int quarter_turns, int32_t pivot_x, int32_t pivot_y, Bitmap& target) {
    if (!source.has_pixels() || !target.has_pixels()) return;
    const int64_t px = pivot_x;
    const int64_t py = pivot_y;
    // Target pixel (c, r) shows the source pixel under its centre mapped back:
    // sx = x0 + xc * c + xr * r, sy = y0 + yc * c + yr * r. The centres land
    // on half-integers, never on a pixel edge, so integers are exact.
    int64_t x0 = 0, y0 = 0;
    int xc = 1, xr = 0, yc = 0, yr = 1;
    switch (((quarter_turns % 4) + 4) % 4) {
        case 0: break;
        case 1: x0 = px - py, xc = 0, xr = 1, y0 = px + py - 1, yc = -1, yr = 0; break;
        case 2: x0 = 2 * px - 1, xc = -1, xr = 0, y0 = 2 * py - 1, yc = 0, yr = -1; break;
        case 3: x0 = px + py - 1, xc = 0, xr = -1, y0 = py - px, yc = 1, yr = 0; break;
    }

    // Each source coordinate follows one target coordinate, so the covered
    // target pixels form a rectangle.
    const int64_t sw = source.width();
    const int64_t sh = source.height();
    Span cols = xc != 0 ? solve(x0, xc, sw) : solve(y0, yc, sh);
    Span rows = xr != 0 ? solve(x0, xr, sw) : solve(y0, yr, sh);
    cols = {std::max<int64_t>(cols.lo, 0), std::min<int64_t>(cols.hi, target.width())};
    rows = {std::max<int64_t>(rows.lo, 0), std::min<int64_t>(rows.hi, target.height())};
    if (cols.lo >= cols.hi || rows.lo >= rows.hi) return;

    const ptrdiff_t step_c = (xc + yc * sw) * kBitmapBytesPerPixel;
    const ptrdiff_t step_r = (xr + yr * sw) * kBitmapBytesPerPixel;
    auto source_at = [&](int64_t c, int64_t r) {
        return source.row(static_cast<int32_t>(y0 + yc * c + yr * r)) + (x0 + xc * c + xr * r) * kBitmapBytesPerPixel;
    };
    auto target_at = [&](int64_t c, int64_t r) { return target.row(static_cast<int32_t>(r)) + c * kBitmapBytesPerPixel; };
    if (xc != 0) {  // no turn or a half turn: source rows run along target rows
        for (int64_t r = rows.lo; r < rows.hi; ++r) {
            blend_run(target_at(cols.lo, r), source_at(cols.lo, r), step_c, cols.hi - cols.lo);
        }
        return;
    }
    // A quarter turn reads the source down its columns. Tiles of 16 target
    // rows (one cache line of each source row) by 256 target columns keep
    // the lines they read in cache; inside, 4x4 blocks are transposed whole.
    constexpr int64_t kTileRows = 16;
    constexpr int64_t kTileCols = 256;
    for (int64_t r0 = rows.lo; r0 < rows.hi; r0 += kTileRows) {
        const int64_t r1 = std::min(r0 + kTileRows, rows.hi);
        for (int64_t c0 = cols.lo; c0 < cols.hi; c0 += kTileCols) {
            const int64_t c1 = std::min(c0 + kTileCols, cols.hi);
            int64_t r = r0;
            for (; r + 4 <= r1; r += 4) {
                int64_t c = c0;
                for (; c + 4 <= c1; c += 4) {
                    turn_block(target_at(c, r), target.row_bytes(), source_at(c, r), step_c, step_r);
                }
                for (int64_t i = 0; i < 4; ++i) blend_run(target_at(c, r + i), source_at(c, r + i), step_c, c1 - c);
            }
            for (; r < r1; ++r) blend_run(target_at(c0, r), source_at(c0, r), step_c, c1 - c0);
        }
    }
}

void turn_half_in_place(Bitmap& bitmap, int32_t pivot_x, int32_t pivot_y) {
    if (!bitmap.has_pixels()) return;
    // Pixel (c, r) takes (2 px - 1 - c, 2 py - 1 - r): an exchange of pairs
    // inside the covered rectangle, which maps onto itself.
    const int64_t cx = 2 * int64_t{pivot_x} - 1;
    const int64_t cy = 2 * int64_t{pivot_y} - 1;
    const int64_t width = bitmap.width(), height = bitmap.height();
    const Span cols{std::max<int64_t>(0, cx + 1 - width), std::min<int64_t>(width, cx + 1)};
    const Span rows{std::max<int64_t>(0, cy + 1 - height), std::min<int64_t>(height, cy + 1)};
    if (cols.lo >= cols.hi || rows.lo >= rows.hi) {
        bitmap.clear();
        return;
    }
    auto at = [&](int64_t c, int64_t r) { return bitmap.row(static_cast<int32_t>(r)) + c * kBitmapBytesPerPixel; };
    // cy is odd, so no row is its own partner.
    for (int64_t r = rows.lo; r < cy - r; ++r) {
        uint8_t* top = at(0, r);
        uint8_t* bottom = at(0, cy - r);
        for (int64_t c = cols.lo; c < cols.hi; ++c) {
            uint8_t* a = top + c * kBitmapBytesPerPixel;
            uint8_t* b = bottom + (cx - c) * kBitmapBytesPerPixel;
            uint8_t held[kBitmapBytesPerPixel];
            memcpy(held, a, kBitmapBytesPerPixel);
            memcpy(a, b, kBitmapBytesPerPixel);
            memcpy(b, held, kBitmapBytesPerPixel);
        }
    }
    // What the turned picture does not cover.
    for (int64_t r = 0; r < height; ++r) {
        if (r < rows.lo || r >= rows.hi) {
            memset(at(0, r), 0, bitmap.row_bytes());
            continue;
        }
        memset(at(0, r), 0, static_cast<size_t>(cols.lo) * kBitmapBytesPerPixel);
        memset(at(cols.hi, r), 0, static_cast<size_t>(width - cols.hi) * kBitmapBytesPerPixel);
    }
}

void draw_scaled(const Bitmap& source, float scale_x, float scale_y, Bitmap& target) {
    if (!source.has_pixels() || !target.has_pixels() || !(scale_x > 0) || !(scale_y > 0)) return;
    // Maps a target index back to the source index under its centre.
    auto source_index = [](int64_t i, float scale, int32_t limit) {
        const float mapped = std::floor((static_cast<float>(i) + 0.5f) / scale);
        if (!(mapped >= 0)) return 0;
        return mapped >= static_cast<float>(limit) ? limit - 1 : static_cast<int32_t>(mapped);
    };

    // Source byte offsets of the target columns, computed once per call; in
    // strips of columns so that the table lives on the stack (one strip for
    // targets up to kStrip pixels wide).
    constexpr int64_t kStrip = 4096;
    uint32_t column_offset[kStrip];
    const int64_t width = target.width();
    for (int64_t c0 = 0; c0 < width; c0 += kStrip) {
        const int64_t count = std::min(kStrip, width - c0);
        for (int64_t c = 0; c < count; ++c) {
            column_offset[c] =
                static_cast<uint32_t>(source_index(c0 + c, scale_x, source.width())) * kBitmapBytesPerPixel;
        }
        for (int32_t r = 0; r < target.height(); ++r) {
            const uint8_t* src = source.row(source_index(r, scale_y, source.height()));
            uint8_t* dst = target.row(r) + c0 * kBitmapBytesPerPixel;
            for (int64_t c = 0; c < count; ++c) blend_pixel(dst + c * kBitmapBytesPerPixel, src + column_offset[c]);
        }
    }
}

}  // namespace platform
}  // namespace qk
