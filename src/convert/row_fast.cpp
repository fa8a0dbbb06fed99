// Faster row kernels: the reference kernels' loops with the layouts fixed at
// compile time, in forms the compiler unrolls and vectorises. Plain C++ only;
// each is instantiated for every layout it serves and must store exactly the
// bytes of its reference kernel.
#include <stddef.h>
#include <string.h>

#include <array>
#include <utility>

#include "convert/pixel.h"
#include "convert/row.h"
#include "convert/row_slots.h"
#include "convert/row_loops.h"

namespace qk {
namespace {

// RGB to RGB -----------------------------------------------------------------

template <int S, int D>
void rgb_to_rgb_bytes(const uint8_t* src, uint8_t* dst, int width, const RgbToRgbShape&) {
    rgb_to_rgb_loop(src, dst, width, kFormats[S].rgb, kFormats[D].rgb);
}

static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__, "the word kernels below number bytes from the low end");

constexpr uint32_t byte_at(uint32_t word, int offset) { return (word >> (8 * offset)) & 0xffu; }

// 3-byte to 4-byte pixels, one 32-bit load per pixel: byte-wise loads of
// 3-byte pixels do not vectorise, and this form is about twice as fast. Each
// load reads one byte past its pixel, so the caller keeps the row's last pixel
// for the reference kernel.
template <int S, int D>
void rgb3_to_rgb4_words(const uint8_t* src, uint8_t* dst, ptrdiff_t count) {
    constexpr RgbLayout s = kFormats[S].rgb;
    constexpr RgbLayout d = kFormats[D].rgb;
    for (ptrdiff_t i = 0; i < count; ++i) {
        uint32_t in;
        memcpy(&in, src + 3 * i, sizeof(in));
        const uint32_t out = byte_at(in, s.rOffset) << (8 * d.rOffset) | byte_at(in, s.gOffset) << (8 * d.gOffset) |
                             byte_at(in, s.bOffset) << (8 * d.bOffset) | 0xffu << (8 * d.aOffset);
        memcpy(dst + 4 * i, &out, sizeof(out));
    }
}

template <int S, int D>
void rgb3_to_rgb4(const uint8_t* src, uint8_t* dst, int width, const RgbToRgbShape& shape) {
    const ptrdiff_t body = width > 0 ? width - 1 : 0;
    rgb3_to_rgb4_words<S, D>(src, dst, body);
    rgb_to_rgb_row_reference(src + 3 * body, dst + 4 * body, static_cast<int>(width - body), shape);
}

template <int S, int D>
constexpr RgbToRgbRow rgb_to_rgb_variant() {
    if constexpr (kFormats[S].rgb.bytesPerPixel == 3 && kFormats[D].rgb.bytesPerPixel == 4) {
        return rgb3_to_rgb4<S, D>;
    } else {
        return rgb_to_rgb_bytes<S, D>;
    }
}

template <size_t... I>
constexpr std::array<RgbToRgbRow, sizeof...(I)> rgb_to_rgb_table(std::index_sequence<I...>) {
    return {rgb_to_rgb_variant<I / kRgbFormatCount, I % kRgbFormatCount>()...};
}
constexpr auto kRgbToRgbRows = rgb_to_rgb_table(std::make_index_sequence<kRgbFormatCount * kRgbFormatCount>());

// RGB to YUV -----------------------------------------------------------------

template <int S, int LumaStep>
void rgb_to_luma(const uint8_t* rgb, uint8_t* luma, int width, const RgbToYuvShape&) {
    rgb_to_luma_loop(rgb, luma, width, kFormats[S].rgb, LumaStep);
}

template <int S, int ChromaStep>
void rgb_to_chroma(const uint8_t* rgb, uint8_t* u, uint8_t* v, int pairs, const RgbToYuvShape&) {
    rgb_to_chroma_loop(rgb, u, v, pairs, kFormats[S].rgb, ChromaStep);
}

template <size_t... I>
constexpr std::array<RgbToLumaRow, sizeof...(I)> rgb_to_luma_table(std::index_sequence<I...>) {
    return {rgb_to_luma<I / 2, I % 2 + 1>...};  // luma steps 1, 2
}
constexpr auto kRgbToLumaRows = rgb_to_luma_table(std::make_index_sequence<kRgbFormatCount * 2>());

template <size_t... I>
constexpr std::array<RgbToChromaRow, sizeof...(I)> rgb_to_chroma_table(std::index_sequence<I...>) {
    return {rgb_to_chroma<I / 3, kChromaSteps[I % 3]>...};
}
constexpr auto kRgbToChromaRows = rgb_to_chroma_table(std::make_index_sequence<kRgbFormatCount * 3>());


// YUV to RGB -----------------------------------------------------------------

// YUV to RGB in integers. For every (Y, U, V) the double form of pixel.h
// equals clamp(Y + offset) with per-pair offsets floor(1.402 v),
// floor(-(0.34414 u + 0.71414 v)), floor(1.772 u) (u = U - 128, v = V - 128),
// except at one pair: there the exact green offset is the integer -37, and
// the double steps land just below it for some lumas and on it for others.
// Its pixels take the double path. The tests prove the equivalence over all
// 2^24 inputs.
inline bool chroma_needs_double_path(int u_byte, int v_byte) { return u_byte == 28 && v_byte == 228; }

// The integer chroma offsets: red from V and blue from U rounded down, and
// the two exact terms of the green numerator, whose sum is divided once per
// pair (splitting the floor over the two terms would be off by one where the
// sum is a multiple of 100000).
struct IntegerChroma {
    int16_t red[256];
    int16_t blue[256];
    int32_t greenU[256];
    int32_t greenV[256];
};

constexpr int64_t floor_div(int64_t numerator, int64_t denominator) {
    const int64_t quotient = numerator / denominator;
    return quotient * denominator > numerator ? quotient - 1 : quotient;
}

constexpr IntegerChroma make_integer_chroma() {
    IntegerChroma table{};
    for (int byte = 0; byte < 256; ++byte) {
        const int c = byte - 128;
        table.red[byte] = static_cast<int16_t>(floor_div(1402 * c, 1000));
        table.blue[byte] = static_cast<int16_t>(floor_div(1772 * c, 1000));
        table.greenU[byte] = -34414 * c;
        table.greenV[byte] = -71414 * c;
    }
    return table;
}
constexpr IntegerChroma kIntegerChroma = make_integer_chroma();

// floor(numerator / 100000) for |numerator| below 2 * 10^7: shifted to a
// non-negative value first, where the division rounds down.
inline int green_offset(int32_t numerator) {
    constexpr int32_t kShift = 200;
    return static_cast<int>(static_cast<uint32_t>(numerator + kShift * 100000) / 100000u) - kShift;
}

// Clamping by table: branch-free, and far faster than compare-and-select on
// noisy frames. Luma plus any offset above stays within [-227, 480].
constexpr int kClampBias = 256;
struct ClampTable {
    uint8_t byte[768];
};
constexpr ClampTable make_clamp_table() {
    ClampTable table{};
    for (int i = 0; i < 768; ++i) table.byte[i] = clamp_byte(i - kClampBias);
    return table;
}
constexpr ClampTable kClamp = make_clamp_table();
static_assert(kIntegerChroma.blue[0] + kClampBias >= 0 && 255 + kIntegerChroma.blue[255] + kClampBias < 768,
              "the widest offset, blue, must stay inside the clamp table");

// The clamped channel values of one chroma pair, indexed by luma.
struct PairChannels {
    const uint8_t* red;
    const uint8_t* green;
    const uint8_t* blue;
};

template <int D>
inline void store_rgb(uint8_t* pixel, int luma, const PairChannels& c) {
    constexpr RgbLayout d = kFormats[D].rgb;
    if constexpr (d.bytesPerPixel == 4) {
        // One word store per pixel instead of four byte stores.
        const uint32_t word = uint32_t{c.red[luma]} << (8 * d.rOffset) | uint32_t{c.green[luma]} << (8 * d.gOffset) |
                              uint32_t{c.blue[luma]} << (8 * d.bOffset) | 0xffu << (8 * d.aOffset);
        memcpy(pixel, &word, sizeof(word));
    } else {
        pixel[d.rOffset] = c.red[luma];
        pixel[d.gOffset] = c.green[luma];
        pixel[d.bOffset] = c.blue[luma];
    }
}

template <int D>
inline void store_rgb_double(uint8_t* pixel, int luma, const ChromaProducts& chroma) {
    constexpr RgbLayout d = kFormats[D].rgb;
    yuv_pixel_double(luma, chroma, &pixel[d.rOffset], &pixel[d.gOffset], &pixel[d.bOffset]);
    if constexpr (d.aOffset >= 0) pixel[d.aOffset] = 255;
}

template <int D, int LumaStep, int ChromaStep, int Rows>
void yuv_to_rgb(const uint8_t* y0, const uint8_t* y1, const uint8_t* u, const uint8_t* v, uint8_t* d0,
                uint8_t* d1, int width, const YuvToRgbShape&) {
    constexpr ptrdiff_t bpp = kFormats[D].rgb.bytesPerPixel;
    for (ptrdiff_t j = 0; j < width / 2; ++j) {
        const int ub = u[j * ChromaStep];
        const int vb = v[j * ChromaStep];
        const ptrdiff_t x = 2 * j;
        if (chroma_needs_double_path(ub, vb)) {
            const ChromaProducts chroma = chroma_products(ub, vb);
            store_rgb_double<D>(d0 + x * bpp, y0[x * LumaStep], chroma);
            store_rgb_double<D>(d0 + (x + 1) * bpp, y0[(x + 1) * LumaStep], chroma);
            if constexpr (Rows == 2) {
                store_rgb_double<D>(d1 + x * bpp, y1[x * LumaStep], chroma);
                store_rgb_double<D>(d1 + (x + 1) * bpp, y1[(x + 1) * LumaStep], chroma);
            }
            continue;
        }
        const uint8_t* clamp = kClamp.byte + kClampBias;
        const PairChannels channels{clamp + kIntegerChroma.red[vb],
                                    clamp + green_offset(kIntegerChroma.greenU[ub] + kIntegerChroma.greenV[vb]),
                                    clamp + kIntegerChroma.blue[ub]};
        store_rgb<D>(d0 + x * bpp, y0[x * LumaStep], channels);
        store_rgb<D>(d0 + (x + 1) * bpp, y0[(x + 1) * LumaStep], channels);
        if constexpr (Rows == 2) {
            store_rgb<D>(d1 + x * bpp, y1[x * LumaStep], channels);
            store_rgb<D>(d1 + (x + 1) * bpp, y1[(x + 1) * LumaStep], channels);
        }
    }
}

template <size_t... I>
constexpr std::array<YuvToRgbRow, sizeof...(I)> yuv_to_rgb_table(std::index_sequence<I...>) {
    return {yuv_to_rgb<I / kYuvSourceShapeCount, kYuvSourceShapes[I % kYuvSourceShapeCount].lumaStep,
                       kYuvSourceShapes[I % kYuvSourceShapeCount].chromaStep,
                       kYuvSourceShapes[I % kYuvSourceShapeCount].rows>...};
}
constexpr auto kYuvToRgbRows = yuv_to_rgb_table(std::make_index_sequence<kRgbFormatCount * kYuvSourceShapeCount>());

template <int D>
void grey_to_rgb(const uint8_t* luma, uint8_t* dst, int width, const RgbLayout&) {
    grey_to_rgb_loop(luma, dst, width, kFormats[D].rgb);
}

template <size_t... I>
constexpr std::array<GreyToRgbRow, sizeof...(I)> grey_to_rgb_table(std::index_sequence<I...>) {
    return {grey_to_rgb<I>...};
}
constexpr auto kGreyToRgbRows = grey_to_rgb_table(std::make_index_sequence<kRgbFormatCount>());

// YUV to YUV -----------------------------------------------------------------

template <int SrcStep, int DstStep>
void sample_row(const uint8_t* src, int, uint8_t* dst, int, int count) {
    sample_loop(src, SrcStep, dst, DstStep, count);
}

template <int SrcStep, int DstStep>
void chroma_row(const uint8_t* src_u, const uint8_t* src_v, int, uint8_t* dst_u, uint8_t* dst_v, int, int count, bool) {
    chroma_loop(src_u, src_v, SrcStep, dst_u, dst_v, DstStep, count);
}

template <size_t... I>
constexpr std::array<SampleRow, sizeof...(I)> sample_table(std::index_sequence<I...>) {
    return {sample_row<I / 2 + 1, I % 2 + 1>...};  // luma steps 1, 2
}
constexpr auto kSampleRows = sample_table(std::make_index_sequence<4>());

template <size_t... I>
constexpr std::array<ChromaRow, sizeof...(I)> chroma_table(std::index_sequence<I...>) {
    return {chroma_row<kChromaSteps[I / 3], kChromaSteps[I % 3]>...};
}
constexpr auto kChromaRows = chroma_table(std::make_index_sequence<9>());

template <int ChromaStep>
void pack_row(const uint8_t* luma, const uint8_t* u, const uint8_t* v, int, uint8_t* dst, uint8_t* dst_u,
              uint8_t* dst_v, int width) {
    pack_loop(luma, u, v, ChromaStep, dst, dst_u, dst_v, width);
}

RgbToRgbRow portable_rgb_to_rgb(int src_index, int dst_index) {
    return slot_row(kRgbToRgbRows, rgb_to_rgb_slot(src_index, dst_index), rgb_to_rgb_row_reference);
}
RgbToLumaRow portable_rgb_to_luma(int src_index, int luma_step) {
    return slot_row(kRgbToLumaRows, rgb_to_luma_slot(src_index, luma_step), rgb_to_luma_row_reference);
}
RgbToChromaRow portable_rgb_to_chroma(int src_index, int chroma_step) {
    return slot_row(kRgbToChromaRows, rgb_to_chroma_slot(src_index, chroma_step), rgb_to_chroma_row_reference);
}
YuvToRgbRow portable_yuv_to_rgb(int dst_index, int luma_step, int chroma_step, int rows) {
    return slot_row(kYuvToRgbRows, yuv_to_rgb_slot(dst_index, luma_step, chroma_step, rows),
                    yuv_to_rgb_row_reference);
}
GreyToRgbRow portable_grey_to_rgb(int dst_index) {
    return slot_row(kGreyToRgbRows, grey_to_rgb_slot(dst_index), grey_to_rgb_row_reference);
}
SampleRow portable_sample(int src_step, int dst_step) {
    return slot_row(kSampleRows, sample_slot(src_step, dst_step), sample_row_reference);
}
ChromaRow portable_chroma(int src_step, int dst_step) {
    return slot_row(kChromaRows, chroma_slot(src_step, dst_step), chroma_row_reference);
}

void unpack_row(const uint8_t* src, const uint8_t* src_u, const uint8_t* src_v, uint8_t* luma, uint8_t* u, uint8_t* v,
                int width) {
    unpack_loop(src, src_u, src_v, luma, u, v, width);
}
UnpackRow portable_unpack() { return unpack_row; }

PackRow portable_pack(int chroma_step) {
    return chroma_step == 1 ? pack_row<1> : chroma_step == 2 ? pack_row<2> : pack_row_reference;
}

}  // namespace

const RowKernelSet kPortableRows = {"portable",         portable_rgb_to_rgb, portable_rgb_to_luma,
                                    portable_rgb_to_chroma, portable_yuv_to_rgb, portable_grey_to_rgb,
                                    portable_sample,    portable_chroma,      portable_pack,
                                    portable_unpack};

}  // namespace qk
