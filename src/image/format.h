// Every format code the library knows, described once: its name, its
// family, its size rule and where its bytes lie. The size rule, the family
// tests, the conversion's layouts, the codec module and the command-line tool
// all read this table: a new format is one more row plus the kernels that
// serve it.
#ifndef QKCORE_SRC_IMAGE_FORMAT_H
#define QKCORE_SRC_IMAGE_FORMAT_H

#include <stdint.h>

#include "qkcore/qk_image.h"

namespace qk {

enum class FormatFamily : uint8_t {
    kRgb,        // packed R, G, B (and A) bytes
    kYuv420,     // a luma plane, then one U and one V sample for each 2x2 pixels
    kPacked422,  // luma and chroma interleaved, one U and one V for each 2x1 pixels
    kGrey,       // luma only
    kCopyOnly,   // pixels the library copies but never converts (D16, PCL)
    kEncoded,    // a stream whose length the image records (JPEG)
};

// Bytes of a buffer of `pixels` pixels: `header` bytes, then bytes per pixel
// as the fraction numerator / denominator, rounded up. No rule (encoded
// formats): denominator 0.
struct SizeRule {
    uint32_t numerator;
    uint32_t denominator;
    uint32_t header;

    // 0 without a rule. The caller keeps `pixels` small enough not to wrap.
    constexpr uint64_t bytes(uint64_t pixels) const {
        return denominator == 0 ? 0 : header + (numerator * pixels + denominator - 1) / denominator;
    }
};

// One pixel of an RGB-family format; pixels and rows follow without gaps.
struct RgbLayout {
    int bytesPerPixel;  // 3 or 4
    int rOffset;
    int gOffset;
    int bOffset;
    int aOffset;  // -1: no alpha
};

// Where the samples of a YUV-family format lie. Luma sample x of row y is at
// (y * width + x) * lumaStep; U sample j of chroma row r at
// u + (r * width / 2 + j) * chromaStep, V likewise from v, where u (v) is
// uOffset (vOffset) bytes plus uPlanes (vPlanes) chroma planes of
// width x height / 4 bytes past the chroma base for 4:2:0, and uOffset
// (vOffset) bytes from the buffer start for packed 4:2:2.
struct YuvLayout {
    int lumaStep;         // 1 or 2
    int chromaStep;       // 1, 2 or 4; 0 for GREY, which has no chroma
    bool subsampledRows;  // 4:2:0: one chroma row serves two image rows
    int uOffset;
    int uPlanes;
    int vOffset;
    int vPlanes;
};

struct FormatInfo {
    uint32_t code;
    const char* name;
    FormatFamily family;
    SizeRule size;
    RgbLayout rgb;  // the RGB family's pixel; zero for other formats
    YuvLayout yuv;  // 4:2:0, packed 4:2:2 and GREY; zero (lumaStep 0) for other formats
};

// The RGB family comes first, in a fixed order: its row kernels are
// instantiated per format by index into the table.
constexpr int kRgbFormatCount = 6;

inline constexpr FormatInfo kFormats[] = {
    // Code, name, family; size rule {numerator, denominator, header}; RGB
    // layout {bytes a pixel, R, G, B, A}; YUV layout {luma step, chroma step,
    // subsampled rows, U offset, U planes, V offset, V planes}.
    {QK_FORMAT_RGB8, "RGB8", FormatFamily::kRgb, {3, 1, 0}, {3, 0, 1, 2, -1}, {}},
    {QK_FORMAT_BGR8, "BGR8", FormatFamily::kRgb, {3, 1, 0}, {3, 2, 1, 0, -1}, {}},
    {QK_FORMAT_RGBA, "RGBA", FormatFamily::kRgb, {4, 1, 0}, {4, 0, 1, 2, 3}, {}},
    {QK_FORMAT_BGRA, "BGRA", FormatFamily::kRgb, {4, 1, 0}, {4, 2, 1, 0, 3}, {}},
    {QK_FORMAT_ARGB, "ARGB", FormatFamily::kRgb, {4, 1, 0}, {4, 1, 2, 3, 0}, {}},
    {QK_FORMAT_ABGR, "ABGR", FormatFamily::kRgb, {4, 1, 0}, {4, 3, 2, 1, 0}, {}},
    {QK_FORMAT_GREY, "GREY", FormatFamily::kGrey, {1, 1, 0}, {}, {1, 0, false, 0, 0, 0, 0}},
    {QK_FORMAT_YUYV, "YUYV", FormatFamily::kPacked422, {2, 1, 0}, {}, {2, 4, false, 1, 0, 3, 0}},
    {QK_FORMAT_YVYU, "YVYU", FormatFamily::kPacked422, {2, 1, 0}, {}, {2, 4, false, 3, 0, 1, 0}},
    // U V pairs, V U pairs, a V plane then a U plane, a U plane then a V plane.
    {QK_FORMAT_NV12, "NV12", FormatFamily::kYuv420, {3, 2, 0}, {}, {1, 2, true, 0, 0, 1, 0}},
    {QK_FORMAT_NV21, "NV21", FormatFamily::kYuv420, {3, 2, 0}, {}, {1, 2, true, 1, 0, 0, 0}},
    {QK_FORMAT_YV12, "YV12", FormatFamily::kYuv420, {3, 2, 0}, {}, {1, 1, true, 0, 1, 0, 0}},
    {QK_FORMAT_YUVP, "YUVP", FormatFamily::kYuv420, {3, 2, 0}, {}, {1, 1, true, 0, 0, 0, 1}},
    {QK_FORMAT_D16, "D16", FormatFamily::kCopyOnly, {2, 1, 0}, {}, {}},
    // A 36-byte header, its first word the point count, then 16 bytes a point.
    {QK_FORMAT_PCL, "PCL", FormatFamily::kCopyOnly, {16, 1, 36}, {}, {}},
    {QK_FORMAT_JPEG, "JPEG", FormatFamily::kEncoded, {0, 0, 0}, {}, {}},
};

namespace detail {
constexpr bool rgb_rows_first() {
    int index = 0;
    for (const FormatInfo& format : kFormats) {
        if ((index++ < kRgbFormatCount) != (format.family == FormatFamily::kRgb)) return false;
    }
    return true;
}
// The size rule's range check relies on this: below 2^31 pixels no rule wraps.
constexpr bool every_rule_at_least_a_byte_a_pixel() {
    for (const FormatInfo& format : kFormats) {
        if (format.size.denominator != 0 && format.size.numerator < format.size.denominator) return false;
    }
    return true;
}
}  // namespace detail
static_assert(detail::rgb_rows_first(), "the RGB family, and only it, fills the first kRgbFormatCount rows");
static_assert(detail::every_rule_at_least_a_byte_a_pixel(), "every size rule takes a byte a pixel or more");

// The row of a format code; null for codes the library does not know.
const FormatInfo* find_format(uint32_t code);

inline bool format_in(uint32_t code, FormatFamily family) {
    const FormatInfo* format = find_format(code);
    return format != nullptr && format->family == family;
}
inline bool is_rgb_format(uint32_t f) { return format_in(f, FormatFamily::kRgb); }
inline bool is_yuv420_format(uint32_t f) { return format_in(f, FormatFamily::kYuv420); }
inline bool is_packed422_format(uint32_t f) { return format_in(f, FormatFamily::kPacked422); }
// 4:2:0, packed 4:2:2 or GREY.
inline bool is_yuv_format(uint32_t f) {
    const FormatInfo* format = find_format(f);
    return format != nullptr && (format->family == FormatFamily::kYuv420 ||
                                 format->family == FormatFamily::kPacked422 || format->family == FormatFamily::kGrey);
}

// Index of an RGB-family format in kFormats (below kRgbFormatCount), or -1
// outside the RGB family.
int rgb_format_index(uint32_t code);

// The YUV layout of a format: lumaStep 0 outside the YUV family.
const YuvLayout& yuv_layout(uint32_t code);

// Whether one chroma sample serves two columns (4:2:0 and packed 4:2:2) and
// two rows (4:2:0): the dimensions such a format needs even.
inline bool chroma_pairs_columns(uint32_t code) { return yuv_layout(code).chromaStep != 0; }
inline bool chroma_pairs_rows(uint32_t code) { return yuv_layout(code).subsampledRows; }

// Bytes per pixel of the RGB family (3 or 4), 0 for other formats.
inline int rgb_bytes_per_pixel(uint32_t f) {
    const FormatInfo* format = find_format(f);
    return format != nullptr ? format->rgb.bytesPerPixel : 0;
}

// Offset of a 4:2:0 image's first chroma plane: its chromaOffset when
// nonzero, else right after the width x height luma plane. 64-bit so that
// callers can compare it with a buffer size without wrapping. The first form
// serves images about to take other dimensions.
inline uint64_t chroma_base(uint32_t chroma_offset, int32_t width, int32_t height) {
    if (chroma_offset != 0) return chroma_offset;
    return static_cast<uint64_t>(static_cast<int64_t>(width) * height);
}
inline uint64_t chroma_base(const QKImage& image) {
    return chroma_base(image.chromaOffset, image.width, image.height);
}

// Bytes of a 4:2:0 picture's luma plane, and of its chroma (a U and a V
// sample for each 2x2 pixels, width x height / 2 bytes in all), for positive
// dimensions.
inline uint64_t yuv420_luma_bytes(int32_t width, int32_t height) {
    return static_cast<uint64_t>(width) * static_cast<uint64_t>(height);
}
inline uint64_t yuv420_chroma_bytes(int32_t width, int32_t height) { return yuv420_luma_bytes(width, height) / 2; }

// Where the first U and V samples of a YUV-family picture lie, from the
// buffer start; for 4:2:0 from the given chroma base. GREY gives {0, 0}.
struct ChromaStart {
    uint64_t u;
    uint64_t v;
};
ChromaStart chroma_start(uint32_t format, uint64_t base, int32_t width, int32_t height);
inline ChromaStart chroma_start(const QKImage& image) {
    return chroma_start(image.format, chroma_base(image), image.width, image.height);
}

}  // namespace qk

#endif  // QKCORE_SRC_IMAGE_FORMAT_H
