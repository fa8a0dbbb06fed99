// Row kernels for x86-64 with SSSE3. This file alone is compiled with
// -mssse3, and its kernels run only after supported_row_sets() has seen the
// CPU support it. So nothing here may be an inline function that baseline
// code could share (the linker might keep this file's copy): kernels live in
// an anonymous namespace and reach shared code through out-of-line calls.
//
// Each kernel converts whole blocks of 16 pixels (or samples) and leaves the
// rest of the row to its reference kernel. A block is taken only where every
// byte it reads or writes lies within the bytes the reference kernel reads
// or writes for the row; where a store covers bytes that the kernel must not
// change (luma among packed chroma, and the other way round), the block loads
// them first and writes them back unchanged.
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

constexpr int kBlock = 16;

// Two signed 16-bit factors, low and high half of every 32-bit lane, for
// _mm_madd_epi16.
QK_SIMD __m128i factors(int low, int high) {
    return _mm_set1_epi32(
        static_cast<int32_t>(uint32_t{static_cast<uint16_t>(high)} << 16 | static_cast<uint16_t>(low)));
}

// Loads and stores of 16 bytes at any alignment.
QK_SIMD __m128i load(const uint8_t* p) { return _mm_loadu_si128(reinterpret_cast<const __m128i*>(p)); }
QK_SIMD void store(uint8_t* p, __m128i value) { _mm_storeu_si128(reinterpret_cast<__m128i*>(p), value); }

// 16 bytes of each word's low byte and 16 of its high byte, from 32 bytes.
QK_SIMD void split_pairs(__m128i a, __m128i b, __m128i* low, __m128i* high) {
    const __m128i low_bytes = _mm_set1_epi16(0x00ff);
    *low = _mm_packus_epi16(_mm_and_si128(a, low_bytes), _mm_and_si128(b, low_bytes));
    *high = _mm_packus_epi16(_mm_srli_epi16(a, 8), _mm_srli_epi16(b, 8));
}

// Stores 16 bytes into the even bytes of 32 at p, keeping the odd ones.
QK_SIMD void store_even_bytes(uint8_t* p, __m128i value) {
    const __m128i keep = _mm_set1_epi16(static_cast<int16_t>(0xff00));
    const __m128i zero = _mm_setzero_si128();
    store(p, _mm_or_si128(_mm_and_si128(load(p), keep), _mm_unpacklo_epi8(value, zero)));
    store(p + 16, _mm_or_si128(_mm_and_si128(load(p + 16), keep), _mm_unpackhi_epi8(value, zero)));
}

// YUV layout moves ---------------------------------------------------------

// U and V of `step` 2 lie next to each other, of step 4 two bytes apart (in
// the pixel pairs of packed 4:2:2): every format's layout, checked because
// the kernels address both through the lower one.
QK_SIMD bool chroma_paired(const uint8_t* u, const uint8_t* v, int step) {
    const ptrdiff_t apart = u < v ? v - u : u - v;
    return step == 1 || apart == step / 2;
}

// 16 U and 16 V samples, from sample i on.
template <int Step>
QK_SIMD void load_chroma(const uint8_t* u, const uint8_t* v, ptrdiff_t i, __m128i* u_out, __m128i* v_out) {
    if constexpr (Step == 1) {
        *u_out = load(u + i);
        *v_out = load(v + i);
    } else {
        const uint8_t* first = (u < v ? u : v) + i * Step;
        __m128i a = load(first), b = load(first + 16);
        if constexpr (Step == 4) {
            // Bytes 0 and 2 of each word: the pairs of step 2.
            const __m128i low_bytes = _mm_set1_epi16(0x00ff);
            a = _mm_packus_epi16(_mm_and_si128(a, low_bytes), _mm_and_si128(b, low_bytes));
            b = _mm_packus_epi16(_mm_and_si128(load(first + 32), low_bytes),
                                 _mm_and_si128(load(first + 48), low_bytes));
        }
        u < v ? split_pairs(a, b, u_out, v_out) : split_pairs(a, b, v_out, u_out);
    }
}

template <int Step>
QK_SIMD void store_chroma(uint8_t* u, uint8_t* v, ptrdiff_t i, __m128i u_in, __m128i v_in) {
    if constexpr (Step == 1) {
        store(u + i, u_in);
        store(v + i, v_in);
    } else {
        uint8_t* first = (u < v ? u : v) + i * Step;
        const __m128i a = u < v ? u_in : v_in, b = u < v ? v_in : u_in;
        const __m128i low = _mm_unpacklo_epi8(a, b), high = _mm_unpackhi_epi8(a, b);
        if constexpr (Step == 2) {
            store(first, low);
            store(first + 16, high);
        } else {
            store_even_bytes(first, low);
            store_even_bytes(first + 32, high);
        }
    }
}

// A block of 16 chroma samples reaches up to 16 * step bytes from the first
// U or V: within the row's samples when a 17th follows.
template <int SrcStep, int DstStep>
void ssse3_chroma_row(const uint8_t* src_u, const uint8_t* src_v, int, uint8_t* dst_u, uint8_t* dst_v, int, int count) {
    ptrdiff_t i = 0;
    if (chroma_paired(src_u, src_v, SrcStep) && chroma_paired(dst_u, dst_v, DstStep)) {
        for (; i + kBlock < count; i += kBlock) {
            __m128i u, v;
            load_chroma<SrcStep>(src_u, src_v, i, &u, &v);
            store_chroma<DstStep>(dst_u, dst_v, i, u, v);
        }
    }
    chroma_row_reference(src_u + i * SrcStep, src_v + i * SrcStep, SrcStep, dst_u + i * DstStep, dst_v + i * DstStep,
                         DstStep, static_cast<int>(count - i));
}

template <int SrcStep, int DstStep>
void ssse3_sample_row(const uint8_t* src, int, uint8_t* dst, int, int count) {
    ptrdiff_t i = 0;
    for (; i + kBlock < count; i += kBlock) {
        __m128i samples, unused;
        if constexpr (SrcStep == 1) {
            samples = load(src + i);
        } else {
            split_pairs(load(src + 2 * i), load(src + 2 * i + 16), &samples, &unused);
        }
        if constexpr (DstStep == 1) {
            store(dst + i, samples);
        } else {
            store_even_bytes(dst + 2 * i, samples);
        }
    }
    sample_row_reference(src + i * SrcStep, SrcStep, dst + i * DstStep, DstStep, static_cast<int>(count - i));
}

constexpr int step_index(int step) { return step == 1 ? 0 : step == 2 ? 1 : step == 4 ? 2 : -1; }

ChromaRow ssse3_chroma(int src_step, int dst_step) {
    constexpr ChromaRow kRows[3][3] = {
        {nullptr, ssse3_chroma_row<1, 2>, ssse3_chroma_row<1, 4>},
        {ssse3_chroma_row<2, 1>, ssse3_chroma_row<2, 2>, ssse3_chroma_row<2, 4>},
        {ssse3_chroma_row<4, 1>, ssse3_chroma_row<4, 2>, ssse3_chroma_row<4, 4>},
    };
    const int s = step_index(src_step), d = step_index(dst_step);
    return s < 0 || d < 0 ? nullptr : kRows[s][d];
}

SampleRow ssse3_sample(int src_step, int dst_step) {
    if (src_step == 2 && dst_step == 1) return ssse3_sample_row<2, 1>;
    if (src_step == 1 && dst_step == 2) return ssse3_sample_row<1, 2>;
    if (src_step == 2 && dst_step == 2) return ssse3_sample_row<2, 2>;
    return nullptr;
}

// RGB pixels -----------------------------------------------------------------

struct ByteMask {
    int8_t byte[16];
};
QK_SIMD __m128i load(const ByteMask& mask) { return _mm_loadu_si128(reinterpret_cast<const __m128i*>(mask.byte)); }

// Blocks of 16 pixels travel as four vectors of four pixels each, packed
// from byte 0 (3-byte pixels leave bytes 12 to 15 zero).
constexpr RgbLayout kCanonical = {4, 0, 1, 2, 3};  // R, G, B, A

// The shuffle from four pixels of layout s to four of layout d; alpha that s
// lacks is zero here and set by alpha_bits.
constexpr ByteMask reorder_mask(RgbLayout s, RgbLayout d) {
    ByteMask mask{};
    for (int i = 0; i < 16; ++i) mask.byte[i] = -128;
    for (int p = 0; p < 4; ++p) {
        const int from = p * s.bytesPerPixel, to = p * d.bytesPerPixel;
        mask.byte[to + d.rOffset] = static_cast<int8_t>(from + s.rOffset);
        mask.byte[to + d.gOffset] = static_cast<int8_t>(from + s.gOffset);
        mask.byte[to + d.bOffset] = static_cast<int8_t>(from + s.bOffset);
        if (d.aOffset >= 0 && s.aOffset >= 0) mask.byte[to + d.aOffset] = static_cast<int8_t>(from + s.aOffset);
    }
    return mask;
}
constexpr ByteMask alpha_bits(RgbLayout s, RgbLayout d) {
    ByteMask mask{};
    for (int p = 0; p < 4 && d.aOffset >= 0 && s.aOffset < 0; ++p) mask.byte[p * d.bytesPerPixel + d.aOffset] = -1;
    return mask;
}

template <int Bpp>
QK_SIMD void load_pixels(const uint8_t* p, __m128i v[4]) {
    if constexpr (Bpp == 4) {
        for (int k = 0; k < 4; ++k) v[k] = load(p + 16 * k);
    } else {
        const __m128i a = load(p), b = load(p + 16), c = load(p + 32);
        v[0] = a;
        v[1] = _mm_alignr_epi8(b, a, 12);
        v[2] = _mm_alignr_epi8(c, b, 8);
        v[3] = _mm_srli_si128(c, 4);
    }
}

template <int Bpp>
QK_SIMD void store_pixels(uint8_t* p, const __m128i v[4]) {
    if constexpr (Bpp == 4) {
        for (int k = 0; k < 4; ++k) store(p + 16 * k, v[k]);
    } else {
        store(p, _mm_or_si128(v[0], _mm_slli_si128(v[1], 12)));
        store(p + 16, _mm_or_si128(_mm_srli_si128(v[1], 4), _mm_slli_si128(v[2], 8)));
        store(p + 32, _mm_or_si128(_mm_srli_si128(v[2], 8), _mm_slli_si128(v[3], 4)));
    }
}

template <int S, int D>
void ssse3_rgb_to_rgb_row(const uint8_t* src, uint8_t* dst, int width, const RgbToRgbShape& shape) {
    constexpr RgbLayout s = kFormats[S].rgb, d = kFormats[D].rgb;
    static constexpr ByteMask kReorder = reorder_mask(s, d), kAlpha = alpha_bits(s, d);
    const __m128i reorder = load(kReorder), alpha = load(kAlpha);
    ptrdiff_t i = 0;
    for (; i + kBlock <= width; i += kBlock) {
        __m128i v[4];
        load_pixels<s.bytesPerPixel>(src + i * s.bytesPerPixel, v);
        for (__m128i& pixels : v) pixels = _mm_or_si128(_mm_shuffle_epi8(pixels, reorder), alpha);
        store_pixels<d.bytesPerPixel>(dst + i * d.bytesPerPixel, v);
    }
    rgb_to_rgb_row_reference(src + i * s.bytesPerPixel, dst + i * d.bytesPerPixel, static_cast<int>(width - i), shape);
}

// RGB to YUV -----------------------------------------------------------------

// Four pixels' (R, G), or (B, G), as 16-bit pairs in 32-bit lanes.
constexpr ByteMask channel_pair_mask(RgbLayout s, int first_offset) {
    ByteMask mask{};
    for (int i = 0; i < 16; ++i) mask.byte[i] = -128;
    for (int p = 0; p < 4; ++p) {
        const int from = p * s.bytesPerPixel;
        mask.byte[4 * p] = static_cast<int8_t>(from + first_offset);
        mask.byte[4 * p + 2] = static_cast<int8_t>(from + s.gOffset);
    }
    return mask;
}

// The luma of four pixels (R, G) and (B, G), 32-bit lanes: the weights add
// up to 65536, and 38470 for G, too big for a signed 16-bit factor, is
// split between the two pairs.
QK_SIMD __m128i luma32(__m128i rg, __m128i bg) {
    const __m128i rg_weights = factors(19595, 19235);
    const __m128i bg_weights = factors(7471, 19235);
    return _mm_srli_epi32(_mm_add_epi32(_mm_madd_epi16(rg, rg_weights), _mm_madd_epi16(bg, bg_weights)), 16);
}

// 16 bytes from four vectors of four 32-bit values in 0..255 (clamped
// otherwise).
QK_SIMD __m128i pack_bytes(__m128i a, __m128i b, __m128i c, __m128i d) {
    return _mm_packus_epi16(_mm_packs_epi32(a, b), _mm_packs_epi32(c, d));
}

template <int S, int Step>
void ssse3_rgb_to_luma_row(const uint8_t* rgb, uint8_t* luma, int width, const RgbToYuvShape& shape) {
    constexpr RgbLayout s = kFormats[S].rgb;
    static constexpr ByteMask kRg = channel_pair_mask(s, s.rOffset), kBg = channel_pair_mask(s, s.bOffset);
    const __m128i rg_mask = load(kRg), bg_mask = load(kBg);
    ptrdiff_t i = 0;
    for (; i + kBlock + (Step == 2) <= width; i += kBlock) {
        __m128i v[4];
        load_pixels<s.bytesPerPixel>(rgb + i * s.bytesPerPixel, v);
        for (__m128i& pixels : v) pixels = luma32(_mm_shuffle_epi8(pixels, rg_mask), _mm_shuffle_epi8(pixels, bg_mask));
        const __m128i bytes = pack_bytes(v[0], v[1], v[2], v[3]);
        if constexpr (Step == 1) {
            store(luma + i, bytes);
        } else {
            store_even_bytes(luma + 2 * i, bytes);
        }
    }
    rgb_to_luma_row_reference(rgb + i * s.bytesPerPixel, luma + i * Step, static_cast<int>(width - i), shape);
}

// (R, G) and (B, G) pairs of pixels 0 and 2 of a vector of four, into lanes
// 0 and 1 (low) or 2 and 3 (high).
constexpr ByteMask even_pixel_mask(RgbLayout s, int first_offset, bool high) {
    ByteMask mask{};
    for (int i = 0; i < 16; ++i) mask.byte[i] = -128;
    for (int k = 0; k < 2; ++k) {
        const int lane = (high ? 2 : 0) + k, from = 2 * k * s.bytesPerPixel;
        mask.byte[4 * lane] = static_cast<int8_t>(from + first_offset);
        mask.byte[4 * lane + 2] = static_cast<int8_t>(from + s.gOffset);
    }
    return mask;
}

// ((x - luma) * factor) >> 16, + 128, for 32-bit x and luma in 0..255: the
// difference fits 16 bits and goes into both halves of its lane, where the
// two halves of `factor` multiply and add it.
QK_SIMD __m128i chroma32(__m128i x, __m128i luma, __m128i factor) {
    const __m128i diff = _mm_sub_epi32(x, luma);
    const __m128i both = _mm_or_si128(_mm_and_si128(diff, _mm_set1_epi32(0xffff)), _mm_slli_epi32(diff, 16));
    return _mm_add_epi32(_mm_srai_epi32(_mm_madd_epi16(both, factor), 16), _mm_set1_epi32(128));
}

template <int S, int Step>
void ssse3_rgb_to_chroma_row(const uint8_t* rgb, uint8_t* u, uint8_t* v, int pairs, const RgbToYuvShape& shape) {
    constexpr RgbLayout s = kFormats[S].rgb;
    static constexpr ByteMask kRgLow = even_pixel_mask(s, s.rOffset, false),
                              kRgHigh = even_pixel_mask(s, s.rOffset, true),
                              kBgLow = even_pixel_mask(s, s.bOffset, false),
                              kBgHigh = even_pixel_mask(s, s.bOffset, true);
    const __m128i rg_low = load(kRgLow), rg_high = load(kRgHigh), bg_low = load(kBgLow), bg_high = load(kBgHigh);
    const __m128i u_factor = factors(18481, 18481);  // 36962
    const __m128i v_factor = factors(23363, 23364);  // 46727
    const __m128i low_half = _mm_set1_epi32(0xffff);
    ptrdiff_t j = 0;
    if (chroma_paired(u, v, Step)) {
        for (; j + kBlock < pairs; j += kBlock) {
            __m128i px[8], us[4], vs[4];
            load_pixels<s.bytesPerPixel>(rgb + 2 * j * s.bytesPerPixel, px);
            load_pixels<s.bytesPerPixel>(rgb + (2 * j + 16) * s.bytesPerPixel, px + 4);
            for (int k = 0; k < 4; ++k) {
                const __m128i rg =
                    _mm_or_si128(_mm_shuffle_epi8(px[2 * k], rg_low), _mm_shuffle_epi8(px[2 * k + 1], rg_high));
                const __m128i bg =
                    _mm_or_si128(_mm_shuffle_epi8(px[2 * k], bg_low), _mm_shuffle_epi8(px[2 * k + 1], bg_high));
                const __m128i y = luma32(rg, bg);
                us[k] = chroma32(_mm_and_si128(bg, low_half), y, u_factor);
                vs[k] = chroma32(_mm_and_si128(rg, low_half), y, v_factor);
            }
            store_chroma<Step>(u, v, j, pack_bytes(us[0], us[1], us[2], us[3]), pack_bytes(vs[0], vs[1], vs[2], vs[3]));
        }
    }
    rgb_to_chroma_row_reference(rgb + 2 * j * s.bytesPerPixel, u + j * Step, v + j * Step, static_cast<int>(pairs - j),
                                shape);
}

// YUV to RGB -----------------------------------------------------------------

// The integer form of row_fast.cpp, eight chroma pairs at a time: red and
// blue offsets floor(1.402 v) and floor(1.772 u) as (c * k) >> 15 (exact for
// every c in -128..127 with these k, which the exhaustive test proves),
// green floor((-34414 u - 71414 v) / 100000) from the exact numerator: half
// of it, made non-negative and below 2^24, is divided by 50000 as
// (x * 21990233) >> 40, exact over that range. The pair (28, 228) takes the
// reference's double path.
struct ChromaOffsets {
    __m128i red, green, blue;  // eight 16-bit offsets, one per pair
};

// Four 32-bit products c * k of the 16-bit c in lanes `c2` (c repeated in
// both halves of each lane) with k = low + high.
QK_SIMD __m128i times(__m128i c2, int low, int high) { return _mm_madd_epi16(c2, factors(low, high)); }

QK_SIMD __m128i divide_by_50000(__m128i x) {
    const __m128i reciprocal = _mm_set1_epi32(21990233);
    const __m128i even = _mm_srli_epi64(_mm_mul_epu32(x, reciprocal), 40);
    const __m128i odd = _mm_slli_epi64(_mm_srli_epi64(_mm_mul_epu32(_mm_srli_epi64(x, 32), reciprocal), 40), 32);
    return _mm_or_si128(even, odd);
}

QK_SIMD ChromaOffsets chroma_offsets(__m128i u8, __m128i v8) {
    const __m128i zero = _mm_setzero_si128(), bias = _mm_set1_epi16(128);
    const __m128i u = _mm_sub_epi16(_mm_unpacklo_epi8(u8, zero), bias);
    const __m128i v = _mm_sub_epi16(_mm_unpacklo_epi8(v8, zero), bias);
    const __m128i uu[2] = {_mm_unpacklo_epi16(u, u), _mm_unpackhi_epi16(u, u)};
    const __m128i vv[2] = {_mm_unpacklo_epi16(v, v), _mm_unpackhi_epi16(v, v)};
    const __m128i uv[2] = {_mm_unpacklo_epi16(u, v), _mm_unpackhi_epi16(u, v)};
    __m128i red[2], green[2], blue[2];
    for (int h = 0; h < 2; ++h) {
        red[h] = _mm_srai_epi32(times(vv[h], 22970, 22971), 15);
        blue[h] = _mm_srai_epi32(times(uu[h], 29032, 29033), 15);
        // -17207 u - 35707 v, plus 136 * 50000.
        const __m128i half = _mm_add_epi32(_mm_add_epi32(times(uv[h], -17207, -17854), times(vv[h], -17853, 0)),
                                           _mm_set1_epi32(136 * 50000));
        green[h] = _mm_sub_epi32(divide_by_50000(half), _mm_set1_epi32(136));
    }
    return {_mm_packs_epi32(red[0], red[1]), _mm_packs_epi32(green[0], green[1]), _mm_packs_epi32(blue[0], blue[1])};
}

// 16 pixels of one row: their luma and the offsets of their 8 pairs, stored
// in layout D.
template <int D>
QK_SIMD void store_row(uint8_t* dst, __m128i luma, const ChromaOffsets& c) {
    constexpr RgbLayout d = kFormats[D].rgb;
    static constexpr ByteMask kReorder = reorder_mask(kCanonical, d);
    const __m128i zero = _mm_setzero_si128();
    const __m128i y[2] = {_mm_unpacklo_epi8(luma, zero), _mm_unpackhi_epi8(luma, zero)};
    auto channel = [&](__m128i offsets) {
        return _mm_packus_epi16(_mm_add_epi16(y[0], _mm_unpacklo_epi16(offsets, offsets)),
                                _mm_add_epi16(y[1], _mm_unpackhi_epi16(offsets, offsets)));
    };
    const __m128i r = channel(c.red), g = channel(c.green), b = channel(c.blue), a = _mm_set1_epi8(-1);
    const __m128i rg[2] = {_mm_unpacklo_epi8(r, g), _mm_unpackhi_epi8(r, g)};
    const __m128i ba[2] = {_mm_unpacklo_epi8(b, a), _mm_unpackhi_epi8(b, a)};
    __m128i v[4] = {_mm_unpacklo_epi16(rg[0], ba[0]), _mm_unpackhi_epi16(rg[0], ba[0]),
                    _mm_unpacklo_epi16(rg[1], ba[1]), _mm_unpackhi_epi16(rg[1], ba[1])};
    if constexpr (d.bytesPerPixel == 3 || d.rOffset != 0 || d.gOffset != 1 || d.bOffset != 2) {
        const __m128i reorder = load(kReorder);
        for (__m128i& pixels : v) pixels = _mm_shuffle_epi8(pixels, reorder);
    }
    store_pixels<d.bytesPerPixel>(dst, v);
}

template <int LumaStep>
QK_SIMD __m128i load_luma(const uint8_t* luma) {
    if constexpr (LumaStep == 1) {
        return load(luma);
    } else {
        __m128i samples, unused;
        split_pairs(load(luma), load(luma + 16), &samples, &unused);
        return samples;
    }
}

// Eight U and eight V samples in the low halves.
template <int Step>
QK_SIMD void load_chroma8(const uint8_t* u, const uint8_t* v, ptrdiff_t j, __m128i* u_out, __m128i* v_out) {
    if constexpr (Step == 1) {
        *u_out = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(u + j));
        *v_out = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(v + j));
    } else {
        const uint8_t* first = (u < v ? u : v) + j * Step;
        __m128i a = load(first);
        if constexpr (Step == 4) {
            const __m128i low_bytes = _mm_set1_epi16(0x00ff);
            a = _mm_packus_epi16(_mm_and_si128(a, low_bytes), _mm_and_si128(load(first + 16), low_bytes));
        }
        split_pairs(a, a, u < v ? u_out : v_out, u < v ? v_out : u_out);
    }
}

template <int D, int LumaStep, int ChromaStep, int Rows>
void ssse3_yuv_to_rgb_row(const uint8_t* y0, const uint8_t* y1, const uint8_t* u, const uint8_t* v, uint8_t* d0,
                          uint8_t* d1, int width, const YuvToRgbShape& shape) {
    constexpr ptrdiff_t bpp = kFormats[D].rgb.bytesPerPixel;
    // Packed 4:2:2 reads 32 bytes from the first chroma sample: past the row
    // unless another pair follows.
    constexpr int kSlack = ChromaStep == 4 ? 2 : 0;
    ptrdiff_t x = 0;
    if (chroma_paired(u, v, ChromaStep)) {
        for (; x + kBlock + kSlack <= width; x += kBlock) {
            const ptrdiff_t j = x / 2;
            __m128i u8, v8;
            load_chroma8<ChromaStep>(u, v, j, &u8, &v8);
            const int special = _mm_movemask_epi8(
                _mm_and_si128(_mm_cmpeq_epi8(u8, _mm_set1_epi8(28)), _mm_cmpeq_epi8(v8, _mm_set1_epi8(-28))));
            if ((special & 0xff) != 0) {
                yuv_to_rgb_row_reference(y0 + x * LumaStep, Rows == 2 ? y1 + x * LumaStep : nullptr, u + j * ChromaStep,
                                         v + j * ChromaStep, d0 + x * bpp, Rows == 2 ? d1 + x * bpp : nullptr, kBlock,
                                         shape);
                continue;
            }
            const ChromaOffsets offsets = chroma_offsets(u8, v8);
            store_row<D>(d0 + x * bpp, load_luma<LumaStep>(y0 + x * LumaStep), offsets);
            if constexpr (Rows == 2) store_row<D>(d1 + x * bpp, load_luma<LumaStep>(y1 + x * LumaStep), offsets);
        }
    }
    const ptrdiff_t j = x / 2;
    yuv_to_rgb_row_reference(y0 + x * LumaStep, Rows == 2 ? y1 + x * LumaStep : nullptr, u + j * ChromaStep,
                             v + j * ChromaStep, d0 + x * bpp, Rows == 2 ? d1 + x * bpp : nullptr,
                             static_cast<int>(width - x), shape);
}

template <int D>
void ssse3_grey_to_rgb_row(const uint8_t* luma, uint8_t* dst, int width, const RgbLayout& layout) {
    constexpr ptrdiff_t bpp = kFormats[D].rgb.bytesPerPixel;
    const __m128i zero = _mm_setzero_si128();
    ptrdiff_t i = 0;
    for (; i + kBlock <= width; i += kBlock) store_row<D>(dst + i * bpp, load(luma + i), {zero, zero, zero});
    grey_to_rgb_row_reference(luma + i, dst + i * bpp, static_cast<int>(width - i), layout);
}

// Selectors ------------------------------------------------------------------

// Tables of kernels, a type of this file's own: std::array's members would
// be inline functions shared with baseline code.
template <typename Row, size_t N>
struct Table {
    Row row[N];
    Row operator[](size_t i) const { return row[i]; }
};

template <size_t... I>
constexpr Table<RgbToRgbRow, sizeof...(I)> rgb_to_rgb_rows(std::index_sequence<I...>) {
    return {ssse3_rgb_to_rgb_row<I / kRgbFormatCount, I % kRgbFormatCount>...};
}
constexpr auto kRgbToRgbRows = rgb_to_rgb_rows(std::make_index_sequence<kRgbFormatCount * kRgbFormatCount>());

template <size_t... I>
constexpr Table<RgbToLumaRow, sizeof...(I)> luma_rows(std::index_sequence<I...>) {
    return {ssse3_rgb_to_luma_row<I / 2, I % 2 + 1>...};
}
constexpr auto kLumaRows = luma_rows(std::make_index_sequence<kRgbFormatCount * 2>());

constexpr int kSteps[] = {1, 2, 4};
template <size_t... I>
constexpr Table<RgbToChromaRow, sizeof...(I)> chroma_rows(std::index_sequence<I...>) {
    return {ssse3_rgb_to_chroma_row<I / 3, kSteps[I % 3]>...};
}
constexpr auto kChromaRows = chroma_rows(std::make_index_sequence<kRgbFormatCount * 3>());

// 4:2:0 with planar or paired chroma, and packed 4:2:2.
template <size_t... I>
constexpr Table<YuvToRgbRow, sizeof...(I)> yuv_rows(std::index_sequence<I...>) {
    return {ssse3_yuv_to_rgb_row<I / 3, (I % 3 == 2 ? 2 : 1), kSteps[I % 3], (I % 3 == 2 ? 1 : 2)>...};
}
constexpr auto kYuvRows = yuv_rows(std::make_index_sequence<kRgbFormatCount * 3>());

template <size_t... I>
constexpr Table<GreyToRgbRow, sizeof...(I)> grey_rows(std::index_sequence<I...>) {
    return {ssse3_grey_to_rgb_row<I>...};
}
constexpr auto kGreyRows = grey_rows(std::make_index_sequence<kRgbFormatCount>());

bool rgb_index(int index) { return index >= 0 && index < kRgbFormatCount; }

RgbToRgbRow ssse3_rgb_to_rgb(int src_index, int dst_index) {
    if (!rgb_index(src_index) || !rgb_index(dst_index)) return nullptr;
    return kRgbToRgbRows[src_index * kRgbFormatCount + dst_index];
}
RgbToLumaRow ssse3_rgb_to_luma(int src_index, int luma_step) {
    if (!rgb_index(src_index) || (luma_step != 1 && luma_step != 2)) return nullptr;
    return kLumaRows[src_index * 2 + luma_step - 1];
}
RgbToChromaRow ssse3_rgb_to_chroma(int src_index, int chroma_step) {
    if (!rgb_index(src_index) || step_index(chroma_step) < 0) return nullptr;
    return kChromaRows[src_index * 3 + step_index(chroma_step)];
}
GreyToRgbRow ssse3_grey_to_rgb(int dst_index) { return rgb_index(dst_index) ? kGreyRows[dst_index] : nullptr; }
YuvToRgbRow ssse3_yuv_to_rgb(int dst_index, int luma_step, int chroma_step, int rows) {
    if (!rgb_index(dst_index)) return nullptr;
    const int shape = step_index(chroma_step);
    const bool known =
        (shape == 2 && luma_step == 2 && rows == 1) || (shape >= 0 && shape < 2 && luma_step == 1 && rows == 2);
    return known ? kYuvRows[dst_index * 3 + shape] : nullptr;
}

}  // namespace

const RowKernelSet kSsse3Rows = {"ssse3",          ssse3_rgb_to_rgb,  ssse3_rgb_to_luma, ssse3_rgb_to_chroma,
                                 ssse3_yuv_to_rgb, ssse3_grey_to_rgb, ssse3_sample,      ssse3_chroma};

}  // namespace qk
