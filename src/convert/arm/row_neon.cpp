// Row kernels for AArch64 with NEON, which every AArch64 CPU has. Compiled
// only for aarch64 targets. Each kernel converts whole blocks of 16 pixels
// (or samples) with vector loads and stores and leaves the rest of the row to
// its reference kernel; a block is taken only where every byte it reads or
// writes lies within the bytes the reference kernel would read or write for
// the row. Stores into every other byte (luma of packed 4:2:2, chroma among
// luma) load the block first and write back the bytes between unchanged.
// A null selector answer leaves the request to the portable set.
#include <arm_neon.h>
#include <stddef.h>
#include <stdint.h>
#include <string.h>

#include <array>
#include <type_traits>
#include <utility>

#include "convert/pixel.h"
#include "convert/row.h"
#include "convert/row_slots.h"

namespace qk {
namespace {

constexpr int kBlock = 16;

template <int F>
constexpr RgbLayout layout() {
    return kFormats[F].rgb;
}

// 16 pixels as one vector per channel; alpha 255 where the layout has none.
struct Pixels {
    uint8x16_t r, g, b, a;
};

template <int F>
inline Pixels load_pixels(const uint8_t* p) {
    constexpr RgbLayout l = layout<F>();
    if constexpr (l.bytesPerPixel == 3) {
        const uint8x16x3_t in = vld3q_u8(p);
        return {in.val[l.rOffset], in.val[l.gOffset], in.val[l.bOffset], vdupq_n_u8(255)};
    } else {
        const uint8x16x4_t in = vld4q_u8(p);
        return {in.val[l.rOffset], in.val[l.gOffset], in.val[l.bOffset], in.val[l.aOffset]};
    }
}

template <int F>
inline void store_pixels(uint8_t* p, const Pixels& px) {
    constexpr RgbLayout l = layout<F>();
    if constexpr (l.bytesPerPixel == 3) {
        uint8x16x3_t out;
        out.val[l.rOffset] = px.r;
        out.val[l.gOffset] = px.g;
        out.val[l.bOffset] = px.b;
        vst3q_u8(p, out);
    } else {
        uint8x16x4_t out;
        out.val[l.rOffset] = px.r;
        out.val[l.gOffset] = px.g;
        out.val[l.bOffset] = px.b;
        out.val[l.aOffset] = px.a;
        vst4q_u8(p, out);
    }
}

// Every other byte of 32, from p: loaded, or stored with the bytes between
// written back as they were.
inline uint8x16_t load_even(const uint8_t* p) { return vld2q_u8(p).val[0]; }
inline void store_even(uint8_t* p, uint8x16_t values) {
    uint8x16x2_t block = vld2q_u8(p);
    block.val[0] = values;
    vst2q_u8(p, block);
}

// U and V rows of `step`: two planes (1), one row of pairs (2), or bytes 1
// and 3 of the pixel pairs of packed 4:2:2 (4), in either order. Steps 2 and
// 4 are read and written together from the lower of the two addresses; rows
// where U and V are not neighbours in that way go to the reference kernel.
template <int Step>
inline bool chroma_together(const uint8_t* u, const uint8_t* v) {
    if constexpr (Step == 1) {
        return true;
    } else {
        return u + Step / 2 == v || v + Step / 2 == u;
    }
}

// A step-4 chroma block spans 64 bytes from its first chroma byte, one past
// its last: it is taken only where one more sample of the row follows.
// (Step-2 luma blocks, likewise, in the luma kernels.)
template <int Step>
constexpr int overreach() {
    return Step == 4 ? 1 : 0;
}

struct Chroma {
    uint8x16_t u, v;
};

// Whether U comes first, in a row of steps 2 and 4 (the kernels' block
// loops are compiled for each order); planes count as U first.
template <int Step>
inline bool u_first(const uint8_t* u, const uint8_t* v) {
    return Step == 1 || u < v;
}
using UFirst = std::true_type;
using VFirst = std::false_type;

template <int Step, bool UIsFirst>
inline Chroma load_chroma(const uint8_t* u, const uint8_t* v) {
    constexpr int second = Step / 2;  // vector of the second sample
    if constexpr (Step == 1) {
        return {vld1q_u8(u), vld1q_u8(v)};
    } else if constexpr (Step == 2) {
        const uint8x16x2_t in = vld2q_u8(UIsFirst ? u : v);
        return {in.val[UIsFirst ? 0 : second], in.val[UIsFirst ? second : 0]};
    } else {
        const uint8x16x4_t in = vld4q_u8(UIsFirst ? u : v);
        return {in.val[UIsFirst ? 0 : second], in.val[UIsFirst ? second : 0]};
    }
}

template <int Step, bool UIsFirst>
inline void store_chroma(uint8_t* u, uint8_t* v, const Chroma& c) {
    constexpr int second = Step / 2;
    if constexpr (Step == 1) {
        vst1q_u8(u, c.u);
        vst1q_u8(v, c.v);
    } else if constexpr (Step == 2) {
        uint8x16x2_t out;
        out.val[UIsFirst ? 0 : second] = c.u;
        out.val[UIsFirst ? second : 0] = c.v;
        vst2q_u8(UIsFirst ? u : v, out);
    } else {
        uint8_t* first = UIsFirst ? u : v;
        uint8x16x4_t block = vld4q_u8(first);
        block.val[UIsFirst ? 0 : second] = c.u;
        block.val[UIsFirst ? second : 0] = c.v;
        vst4q_u8(first, block);
    }
}

// RGB to RGB -----------------------------------------------------------------

template <int S, int D>
void rgb_to_rgb(const uint8_t* src, uint8_t* dst, int width, const RgbToRgbShape& shape) {
    constexpr ptrdiff_t in = layout<S>().bytesPerPixel, out = layout<D>().bytesPerPixel;
    ptrdiff_t x = 0;
    for (; x + kBlock <= width; x += kBlock) store_pixels<D>(dst + x * out, load_pixels<S>(src + x * in));
    rgb_to_rgb_row_reference(src + x * in, dst + x * out, static_cast<int>(width - x), shape);
}

// Same layout on both sides: the reference copies every byte.
template <int F>
void copy_rgb(const uint8_t* src, uint8_t* dst, int width, const RgbToRgbShape&) {
    if (width > 0) memcpy(dst, src, static_cast<size_t>(width) * layout<F>().bytesPerPixel);
}

// 4-byte to 4-byte pixels: the same four bytes in another order, one table
// lookup per 4 pixels, cheaper than de-interleaving loads and stores.
struct ByteOrder {
    uint8_t index[16];
};
template <int S, int D>
constexpr ByteOrder byte_order() {
    constexpr RgbLayout s = layout<S>(), d = layout<D>();
    ByteOrder order{};
    for (int pixel = 0; pixel < 4; ++pixel) {
        uint8_t* out = order.index + 4 * pixel;
        const int in = 4 * pixel;
        out[d.rOffset] = static_cast<uint8_t>(in + s.rOffset);
        out[d.gOffset] = static_cast<uint8_t>(in + s.gOffset);
        out[d.bOffset] = static_cast<uint8_t>(in + s.bOffset);
        out[d.aOffset] = static_cast<uint8_t>(in + s.aOffset);
    }
    return order;
}

template <int S, int D>
void rgb4_to_rgb4(const uint8_t* src, uint8_t* dst, int width, const RgbToRgbShape& shape) {
    static constexpr ByteOrder kOrder = byte_order<S, D>();
    const uint8x16_t order = vld1q_u8(kOrder.index);
    ptrdiff_t x = 0;
    for (; x + kBlock <= width; x += kBlock) {
        uint8x16x4_t pixels = vld1q_u8_x4(src + 4 * x);
        for (uint8x16_t& four : pixels.val) four = vqtbl1q_u8(four, order);
        vst1q_u8_x4(dst + 4 * x, pixels);
    }
    rgb_to_rgb_row_reference(src + 4 * x, dst + 4 * x, static_cast<int>(width - x), shape);
}

template <int S, int D>
constexpr RgbToRgbRow rgb_to_rgb_variant() {
    if constexpr (S == D) {
        return copy_rgb<S>;
    } else if constexpr (layout<S>().bytesPerPixel == 4 && layout<D>().bytesPerPixel == 4) {
        return rgb4_to_rgb4<S, D>;
    } else {
        return rgb_to_rgb<S, D>;
    }
}

template <size_t... I>
constexpr std::array<RgbToRgbRow, sizeof...(I)> rgb_to_rgb_table(std::index_sequence<I...>) {
    return {rgb_to_rgb_variant<I / kRgbFormatCount, I % kRgbFormatCount>()...};
}
constexpr auto kRgbToRgbRows = rgb_to_rgb_table(std::make_index_sequence<kRgbFormatCount * kRgbFormatCount>());

template <int D>
void grey_to_rgb(const uint8_t* luma, uint8_t* dst, int width, const RgbLayout& layout_arg) {
    constexpr ptrdiff_t out = layout<D>().bytesPerPixel;
    ptrdiff_t x = 0;
    for (; x + kBlock <= width; x += kBlock) {
        const uint8x16_t y = vld1q_u8(luma + x);
        store_pixels<D>(dst + x * out, Pixels{y, y, y, vdupq_n_u8(255)});
    }
    grey_to_rgb_row_reference(luma + x, dst + x * out, static_cast<int>(width - x), layout_arg);
}

template <size_t... I>
constexpr std::array<GreyToRgbRow, sizeof...(I)> grey_to_rgb_table(std::index_sequence<I...>) {
    return {grey_to_rgb<I>...};
}
constexpr auto kGreyToRgbRows = grey_to_rgb_table(std::make_index_sequence<kRgbFormatCount>());

// RGB to YUV -----------------------------------------------------------------

// rgb_luma in 16-bit lanes: 19595 r + 38470 g + 7471 b is 256 H + L with
// H = 76 r + 150 g + 29 b and L = 139 r + 70 g + 47 b, each below 2^16, and
// its 16-bit shift is (H + (L >> 8)) >> 8, which stays below 2^16 too.
inline uint8x8_t luma_high(uint16x8_t high, uint16x8_t low) { return vshrn_n_u16(vsraq_n_u16(high, low, 8), 8); }
inline uint8x16_t luma16(const Pixels& px) {
    const uint8x8_t r = vget_low_u8(px.r), g = vget_low_u8(px.g), b = vget_low_u8(px.b);
    const uint8x8_t h76 = vdup_n_u8(76), h150 = vdup_n_u8(150), h29 = vdup_n_u8(29);
    const uint8x8_t l139 = vdup_n_u8(139), l70 = vdup_n_u8(70), l47 = vdup_n_u8(47);
    const uint16x8_t high0 = vmlal_u8(vmlal_u8(vmull_u8(r, h76), g, h150), b, h29);
    const uint16x8_t low0 = vmlal_u8(vmlal_u8(vmull_u8(r, l139), g, l70), b, l47);
    const uint16x8_t high1 = vmlal_high_u8(vmlal_high_u8(vmull_high_u8(px.r, vdupq_n_u8(76)), px.g, vdupq_n_u8(150)),
                                           px.b, vdupq_n_u8(29));
    const uint16x8_t low1 = vmlal_high_u8(vmlal_high_u8(vmull_high_u8(px.r, vdupq_n_u8(139)), px.g, vdupq_n_u8(70)),
                                          px.b, vdupq_n_u8(47));
    return vcombine_u8(luma_high(high0, low0), luma_high(high1, low1));
}
static_assert(76 * 256 + 139 == 19595 && 150 * 256 + 70 == 38470 && 29 * 256 + 47 == 7471 &&
                  255 * (76 + 150 + 29) + 255 < 65536 && 255 * (139 + 70 + 47) < 65536,
              "the luma weights split into two 16-bit sums");

// rgb_chroma_u and rgb_chroma_v of 16 pixels from d = channel - luma.
// d * 36962 >> 16 is one doubling multiply-high by 18481. 46727 is odd and
// above a signed lane: d * 46727 >> 16 is (d * (46727 - 65536) >> 16) + d,
// the same floor, as d * 65536 divides exactly.
inline int16x8_t chroma_u_half(int16x8_t d) { return vaddq_s16(vqdmulhq_n_s16(d, 18481), vdupq_n_s16(128)); }
inline int16x8_t chroma_v_half(int16x8_t d) {
    constexpr int16_t kWeight = 46727 - 65536;
    const int16x8_t scaled = vcombine_s16(vshrn_n_s32(vmull_n_s16(vget_low_s16(d), kWeight), 16),
                                          vshrn_n_s32(vmull_high_n_s16(d, kWeight), 16));
    return vaddq_s16(vaddq_s16(scaled, d), vdupq_n_s16(128));
}
template <int16x8_t (*Half)(int16x8_t)>
inline uint8x16_t chroma16(uint8x16_t channel, uint8x16_t luma) {
    const int16x8_t low = vreinterpretq_s16_u16(vsubl_u8(vget_low_u8(channel), vget_low_u8(luma)));
    const int16x8_t high = vreinterpretq_s16_u16(vsubl_high_u8(channel, luma));
    return vqmovun_high_s16(vqmovun_s16(Half(low)), Half(high));
}

template <int S, int Step>
void rgb_to_luma(const uint8_t* rgb, uint8_t* luma, int width, const RgbToYuvShape& shape) {
    constexpr ptrdiff_t in = layout<S>().bytesPerPixel;
    // A step-2 block writes back the byte after its last sample.
    constexpr int reach = Step == 2 ? 1 : 0;
    ptrdiff_t x = 0;
    for (; x + kBlock + reach <= width; x += kBlock) {
        const uint8x16_t y = luma16(load_pixels<S>(rgb + x * in));
        if constexpr (Step == 1) {
            vst1q_u8(luma + x, y);
        } else {
            store_even(luma + 2 * x, y);
        }
    }
    rgb_to_luma_row_reference(rgb + x * in, luma + x * Step, static_cast<int>(width - x), shape);
}

template <size_t... I>
constexpr std::array<RgbToLumaRow, sizeof...(I)> rgb_to_luma_table(std::index_sequence<I...>) {
    return {rgb_to_luma<I / 2, I % 2 + 1>...};  // luma steps 1, 2
}
constexpr auto kRgbToLumaRows = rgb_to_luma_table(std::make_index_sequence<kRgbFormatCount * 2>());

// 16 pairs a block: the left pixels of 32.
template <int S, int Step>
void rgb_to_chroma(const uint8_t* rgb, uint8_t* u, uint8_t* v, int pairs, const RgbToYuvShape& shape) {
    constexpr ptrdiff_t in = layout<S>().bytesPerPixel;
    ptrdiff_t j = 0;
    const auto blocks = [&](auto order) {
        for (; j + kBlock + overreach<Step>() <= pairs; j += kBlock) {
            const Pixels first = load_pixels<S>(rgb + 2 * j * in);
            const Pixels second = load_pixels<S>(rgb + (2 * j + kBlock) * in);
            const Pixels left{vuzp1q_u8(first.r, second.r), vuzp1q_u8(first.g, second.g),
                              vuzp1q_u8(first.b, second.b), {}};
            const uint8x16_t y = luma16(left);
            store_chroma<Step, decltype(order)::value>(
                u + j * Step, v + j * Step,
                Chroma{chroma16<chroma_u_half>(left.b, y), chroma16<chroma_v_half>(left.r, y)});
        }
    };
    if (chroma_together<Step>(u, v)) u_first<Step>(u, v) ? blocks(UFirst{}) : blocks(VFirst{});
    rgb_to_chroma_row_reference(rgb + 2 * j * in, u + j * Step, v + j * Step, static_cast<int>(pairs - j), shape);
}

template <size_t... I>
constexpr std::array<RgbToChromaRow, sizeof...(I)> rgb_to_chroma_table(std::index_sequence<I...>) {
    return {rgb_to_chroma<I / 3, kChromaSteps[I % 3]>...};
}
constexpr auto kRgbToChromaRows = rgb_to_chroma_table(std::make_index_sequence<kRgbFormatCount * 3>());


// YUV to RGB -----------------------------------------------------------------

// The integer form of row_fast.cpp: per chroma pair the offsets floor(1.402 v),
// floor(-(0.34414 u + 0.71414 v)) and floor(1.772 u) (u = U - 128,
// v = V - 128), each pixel clamp(Y + offset); the pair U = 28, V = 228 takes
// the double path. Red and blue in 16-bit lanes: floor(1.402 v) is
// v + (v * 26346 >> 16) and floor(1.772 u) is 2u + (u * -14942 >> 16) for
// every u, v in [-128, 127], one doubling multiply-high each. Green is
// floor((a + b) / 50000) for a = -17207 u and b = -35707 v: the quotients
// qa = floor(a / 50000) = (u * -22560) >> 16 and
// qb = floor(b / 50000) = ((v * 18726) >> 16) - v, plus one where the
// remainders a - 50000 qa and b - 50000 qb (below 50000, so exact in 16-bit
// products) add up to 50000 or more. Checked below for every pair.
constexpr int16_t kRedHalf = 13173;      // 26346 / 2
constexpr int16_t kBlueHalf = -7471;     // -14942 / 2
constexpr int16_t kGreenUHalf = -11280;  // -22560 / 2
constexpr int16_t kGreenVHalf = 9363;    // 18726 / 2

constexpr int64_t floor_div(int64_t numerator, int64_t denominator) {
    const int64_t quotient = numerator / denominator;
    return quotient * denominator > numerator ? quotient - 1 : quotient;
}
// A doubling multiply-high keeps bits 16.. (32..) of twice the product; `>>`
// of a negative value is arithmetic with GCC and Clang, as in the lanes.
constexpr int64_t doubling_high(int64_t a, int64_t b, int bits) { return (2 * a * b) >> bits; }
constexpr bool integer_offsets_exact() {
    for (int u = -128; u < 128; ++u) {
        if (u + doubling_high(u, kRedHalf, 16) != floor_div(1402 * u, 1000)) return false;
        if (2 * u + doubling_high(u, kBlueHalf, 16) != floor_div(1772 * u, 1000)) return false;
        const int64_t qa = doubling_high(u, kGreenUHalf, 16), ra = (-17207 * u - 50000 * qa) & 0xffff;
        for (int v = -128; v < 128; ++v) {
            const int64_t qb = doubling_high(v, kGreenVHalf, 16) - v, rb = (-35707 * v - 50000 * qb) & 0xffff;
            if (qa + qb + (ra >= 50000 - rb) != floor_div(-34414 * u - 71414 * v, 100000)) return false;
        }
    }
    return true;
}
static_assert(integer_offsets_exact(), "the lane arithmetic must give the integer offsets for every chroma pair");

struct Offsets {
    int16x8_t r, g, b;  // one lane per chroma pair
};

inline Offsets chroma_offsets(uint8x8_t u_bytes, uint8x8_t v_bytes) {
    const int16x8_t u = vreinterpretq_s16_u16(vsubl_u8(u_bytes, vdup_n_u8(128)));
    const int16x8_t v = vreinterpretq_s16_u16(vsubl_u8(v_bytes, vdup_n_u8(128)));
    const int16x8_t qa = vqdmulhq_n_s16(u, kGreenUHalf);
    const int16x8_t qb = vsubq_s16(vqdmulhq_n_s16(v, kGreenVHalf), v);
    // -50000 is 15536 in 16 bits, -35707 is 29829.
    const uint16x8_t ra = vreinterpretq_u16_s16(vmlaq_n_s16(vmulq_n_s16(u, -17207), qa, 15536));
    const uint16x8_t rb = vreinterpretq_u16_s16(vmlaq_n_s16(vmulq_n_s16(v, 29829), qb, 15536));
    const uint16x8_t carry = vcgeq_u16(ra, vsubq_u16(vdupq_n_u16(50000), rb));  // all ones where it carries
    const int16x8_t green = vsubq_s16(vaddq_s16(qa, qb), vreinterpretq_s16_u16(carry));
    return {vaddq_s16(v, vqdmulhq_n_s16(v, kRedHalf)), green,
            vaddq_s16(vaddq_s16(u, u), vqdmulhq_n_s16(u, kBlueHalf))};
}

// clamp(Y + offset) of 16 pixels, pixel 2k and 2k + 1 taking lane k.
// A widening add: the sum's bits are the same for signed and unsigned lanes.
inline uint8x16_t channel(uint8x16_t luma, int16x8_t offset) {
    const uint16x8_t pairs = vreinterpretq_u16_s16(offset);
    const int16x8_t low = vreinterpretq_s16_u16(vaddw_u8(vzip1q_u16(pairs, pairs), vget_low_u8(luma)));
    const int16x8_t high = vreinterpretq_s16_u16(vaddw_high_u8(vzip2q_u16(pairs, pairs), luma));
    return vqmovun_high_s16(vqmovun_s16(low), high);
}

template <int D>
inline void store_yuv_pixels(uint8_t* dst, uint8x16_t luma, const Offsets& offsets) {
    store_pixels<D>(dst, Pixels{channel(luma, offsets.r), channel(luma, offsets.g), channel(luma, offsets.b),
                                vdupq_n_u8(255)});
}

inline bool any_double_path_pair(uint8x8_t u, uint8x8_t v) {
    return vmaxv_u8(vand_u8(vceq_u8(u, vdup_n_u8(28)), vceq_u8(v, vdup_n_u8(228)))) != 0;
}

// 16 pixels (8 chroma pairs) a block. Packed 4:2:2 (luma step 2) reads its
// chroma from the luma row, so U and V must be its bytes 1 and 3.
template <int D, int LumaStep, int ChromaStep, int Rows>
void yuv_to_rgb(const uint8_t* y0, const uint8_t* y1, const uint8_t* u, const uint8_t* v, uint8_t* d0,
                uint8_t* d1, int width, const YuvToRgbShape& shape) {
    constexpr ptrdiff_t out = layout<D>().bytesPerPixel;
    constexpr int kPairs = kBlock / 2;
    ptrdiff_t x = 0;
    const auto blocks = [&](auto order) {
        constexpr bool kUFirst = decltype(order)::value;
        for (; x + kBlock <= width; x += kBlock) {
            const ptrdiff_t j = x / 2;
            uint8x8_t u_bytes, v_bytes;
            uint8x16_t luma0;
            if constexpr (LumaStep == 2) {
                const uint8x8x4_t in = vld4_u8(y0 + 2 * x);
                const uint8x8x2_t luma = vzip_u8(in.val[0], in.val[2]);
                luma0 = vcombine_u8(luma.val[0], luma.val[1]);
                u_bytes = in.val[kUFirst ? 1 : 3];
                v_bytes = in.val[kUFirst ? 3 : 1];
            } else if constexpr (ChromaStep == 2) {
                const uint8x8x2_t in = vld2_u8((kUFirst ? u : v) + 2 * j);
                u_bytes = in.val[kUFirst ? 0 : 1];
                v_bytes = in.val[kUFirst ? 1 : 0];
                luma0 = vld1q_u8(y0 + x);
            } else {
                u_bytes = vld1_u8(u + j);
                v_bytes = vld1_u8(v + j);
                luma0 = vld1q_u8(y0 + x);
            }
            const Offsets offsets = chroma_offsets(u_bytes, v_bytes);
            store_yuv_pixels<D>(d0 + x * out, luma0, offsets);
            if constexpr (Rows == 2) store_yuv_pixels<D>(d1 + x * out, vld1q_u8(y1 + x), offsets);
            if (any_double_path_pair(u_bytes, v_bytes)) {
                for (ptrdiff_t k = j; k < j + kPairs; ++k) {
                    if (u[k * ChromaStep] != 28 || v[k * ChromaStep] != 228) continue;
                    yuv_to_rgb_row_reference(y0 + 2 * k * LumaStep, Rows == 2 ? y1 + 2 * k : nullptr,
                                             u + k * ChromaStep, v + k * ChromaStep, d0 + 2 * k * out,
                                             Rows == 2 ? d1 + 2 * k * out : nullptr, 2, shape);
                }
            }
        }
    };
    const bool order_u = u_first<ChromaStep>(u, v);
    bool vectors = chroma_together<ChromaStep>(u, v);
    if constexpr (LumaStep == 2) vectors = vectors && (order_u ? u : v) == y0 + 1;
    if (vectors) order_u ? blocks(UFirst{}) : blocks(VFirst{});
    yuv_to_rgb_row_reference(y0 + x * LumaStep, Rows == 2 ? y1 + x : nullptr, u + x / 2 * ChromaStep,
                             v + x / 2 * ChromaStep, d0 + x * out, Rows == 2 ? d1 + x * out : nullptr,
                             static_cast<int>(width - x), shape);
}

template <size_t... I>
constexpr std::array<YuvToRgbRow, sizeof...(I)> yuv_to_rgb_table(std::index_sequence<I...>) {
    return {yuv_to_rgb<I / kYuvSourceShapeCount, kYuvSourceShapes[I % kYuvSourceShapeCount].lumaStep,
                       kYuvSourceShapes[I % kYuvSourceShapeCount].chromaStep,
                       kYuvSourceShapes[I % kYuvSourceShapeCount].rows>...};
}
constexpr auto kYuvToRgbRows = yuv_to_rgb_table(std::make_index_sequence<kRgbFormatCount * kYuvSourceShapeCount>());

// YUV to YUV -----------------------------------------------------------------

template <int From, int To>
void sample_row(const uint8_t* src, int src_step, uint8_t* dst, int dst_step, int count) {
    if constexpr (From == 1 && To == 1) {
        if (count > 0) memcpy(dst, src, static_cast<size_t>(count));
    } else {
        // A step-2 block reads or writes the byte after its last sample.
        constexpr int reach = 1;
        ptrdiff_t i = 0;
        for (; i + kBlock + reach <= count; i += kBlock) {
            const uint8x16_t samples = From == 1 ? vld1q_u8(src + i) : load_even(src + 2 * i);
            if constexpr (To == 1) {
                vst1q_u8(dst + i, samples);
            } else {
                store_even(dst + 2 * i, samples);
            }
        }
        sample_row_reference(src + i * From, src_step, dst + i * To, dst_step, static_cast<int>(count - i));
    }
}

template <size_t... I>
constexpr std::array<SampleRow, sizeof...(I)> sample_table(std::index_sequence<I...>) {
    return {sample_row<I / 2 + 1, I % 2 + 1>...};  // luma steps 1, 2
}
constexpr auto kSampleRows = sample_table(std::make_index_sequence<4>());

template <int From, int To>
void chroma_row(const uint8_t* src_u, const uint8_t* src_v, int src_step, uint8_t* dst_u, uint8_t* dst_v,
                int dst_step, int count, bool stream) {
    ptrdiff_t i = 0;
    if constexpr (From == 1 && To == 1) {
        if (count > 0) {
            memcpy(dst_u, src_u, static_cast<size_t>(count));
            memcpy(dst_v, src_v, static_cast<size_t>(count));
        }
        return;
    } else {
        if (chroma_together<From>(src_u, src_v) && chroma_together<To>(dst_u, dst_v)) {
            // U and V move alike: with both pairs swapped the source has U first.
            const uint8_t *from_u = src_u, *from_v = src_v;
            uint8_t *to_u = dst_u, *to_v = dst_v;
            if (!u_first<From>(src_u, src_v)) std::swap(from_u, from_v), std::swap(to_u, to_v);
            constexpr int reach = overreach<From>() > overreach<To>() ? overreach<From>() : overreach<To>();
            const auto blocks = [&](auto order) {
                for (; i + kBlock + reach <= count; i += kBlock) {
                    store_chroma<To, decltype(order)::value>(
                        to_u + i * To, to_v + i * To, load_chroma<From, true>(from_u + i * From, from_v + i * From));
                }
            };
            u_first<To>(to_u, to_v) ? blocks(UFirst{}) : blocks(VFirst{});
        }
    }
    chroma_row_reference(src_u + i * From, src_v + i * From, src_step, dst_u + i * To, dst_v + i * To, dst_step,
                         static_cast<int>(count - i), stream);
}

template <size_t... I>
constexpr std::array<ChromaRow, sizeof...(I)> chroma_table(std::index_sequence<I...>) {
    return {chroma_row<kChromaSteps[I / 3], kChromaSteps[I % 3]>...};
}
constexpr auto kChromaRows = chroma_table(std::make_index_sequence<9>());

// Planar luma and 4:2:0 chroma into packed 4:2:2, 16 pixels a block: the
// chroma pairs in the output's order beside the luma, stored interleaved.
// Each block writes every byte of its pixels, nothing else.
template <int Step>
void pack_row(const uint8_t* luma, const uint8_t* u, const uint8_t* v, int chroma_step, uint8_t* dst,
              uint8_t* dst_u, uint8_t* dst_v, int width) {
    ptrdiff_t x = 0;
    if (chroma_together<Step>(u, v) && chroma_together<4>(dst_u, dst_v) && (dst_u < dst_v ? dst_u : dst_v) == dst + 1) {
        const bool out_u_first = dst_u < dst_v;
        // Step-2 pairs come in the source's order, swapped where the
        // output's differs.
        const bool swap = Step == 2 && u_first<Step>(u, v) != out_u_first;
        const uint8_t* first = out_u_first ? u : v;
        const uint8_t* second = out_u_first ? v : u;
        for (; x + kBlock <= width; x += kBlock) {
            const ptrdiff_t j = x / 2;
            uint8x16_t pairs;
            if constexpr (Step == 1) {
                const uint8x8_t a = vld1_u8(first + j), b = vld1_u8(second + j);
                pairs = vcombine_u8(vzip1_u8(a, b), vzip2_u8(a, b));
            } else {
                pairs = vld1q_u8((u < v ? u : v) + 2 * j);
                if (swap) pairs = vrev16q_u8(pairs);
            }
            vst2q_u8(dst + 2 * x, uint8x16x2_t{{vld1q_u8(luma + x), pairs}});
        }
    }
    const ptrdiff_t j = x / 2;
    pack_row_reference(luma + x, u + j * Step, v + j * Step, chroma_step, dst + 2 * x, dst_u + 4 * j, dst_v + 4 * j,
                       static_cast<int>(width - x));
}

// Selectors ------------------------------------------------------------------

RgbToRgbRow neon_rgb_to_rgb(int src_index, int dst_index) {
    return slot_row(kRgbToRgbRows, rgb_to_rgb_slot(src_index, dst_index), nullptr);
}
RgbToLumaRow neon_rgb_to_luma(int src_index, int luma_step) {
    return slot_row(kRgbToLumaRows, rgb_to_luma_slot(src_index, luma_step), nullptr);
}
RgbToChromaRow neon_rgb_to_chroma(int src_index, int chroma_step) {
    return slot_row(kRgbToChromaRows, rgb_to_chroma_slot(src_index, chroma_step), nullptr);
}
YuvToRgbRow neon_yuv_to_rgb(int dst_index, int luma_step, int chroma_step, int rows) {
    return slot_row(kYuvToRgbRows, yuv_to_rgb_slot(dst_index, luma_step, chroma_step, rows),
                    nullptr);
}
GreyToRgbRow neon_grey_to_rgb(int dst_index) {
    return slot_row(kGreyToRgbRows, grey_to_rgb_slot(dst_index), nullptr);
}
SampleRow neon_sample(int src_step, int dst_step) {
    return slot_row(kSampleRows, sample_slot(src_step, dst_step), nullptr);
}
ChromaRow neon_chroma(int src_step, int dst_step) {
    return slot_row(kChromaRows, chroma_slot(src_step, dst_step), nullptr);
}

// Packed 4:2:2 into planar luma and a row of chroma pairs, 32 pixels a
// block: the four bytes of each pixel pair de-interleaved and stored as luma
// and as pairs, in the output's order.
void unpack_row(const uint8_t* src, const uint8_t* src_u, const uint8_t* src_v, uint8_t* luma, uint8_t* u, uint8_t* v,
                int width) {
    ptrdiff_t x = 0;
    const uint8_t* src_first = src_u < src_v ? src_u : src_v;
    if (chroma_together<4>(src_u, src_v) && src_first == src + 1 && chroma_together<2>(u, v)) {
        // Bytes 1 and 3 of each source pair: U first or V first.
        const int first = u < v ? (src_u < src_v ? 1 : 3) : (src_u < src_v ? 3 : 1);
        for (constexpr int kPixels = 2 * kBlock; x + kPixels <= width; x += kPixels) {
            const uint8x16x4_t in = vld4q_u8(src + 2 * x);
            vst2q_u8(luma + x, uint8x16x2_t{{in.val[0], in.val[2]}});
            vst2q_u8((u < v ? u : v) + x, uint8x16x2_t{{in.val[first], in.val[4 - first]}});
        }
    }
    unpack_row_reference(src + 2 * x, src_u + 2 * x, src_v + 2 * x, luma + x, u + x, v + x,
                         static_cast<int>(width - x));
}
UnpackRow neon_unpack() { return unpack_row; }

PackRow neon_pack(int chroma_step) { return chroma_step == 1 ? pack_row<1> : chroma_step == 2 ? pack_row<2> : nullptr; }

}  // namespace

const RowKernelSet kNeonRows = {"neon",          neon_rgb_to_rgb,  neon_rgb_to_luma, neon_rgb_to_chroma,
                                neon_yuv_to_rgb, neon_grey_to_rgb, neon_sample,      neon_chroma,
                                neon_pack,       neon_unpack};

}  // namespace qk
