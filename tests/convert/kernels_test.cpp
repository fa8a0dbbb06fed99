// The row kernels: their colour arithmetic against the plain formulas over
// the whole input domain (all 2^24 RGB colours and all 2^24 (Y, U, V)), and
// every faster variant against its reference kernel: same random input, every
// layout it is chosen for, widths that leave tails, and a guard zone after the
// output that neither may touch.
#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <vector>

#include "convert/layout.h"
#include "convert/reference_frame.h"
#include "convert/row.h"

namespace {

using qktest::formula_rgb_to_yuv;
using qktest::formula_yuv_to_rgb;
using namespace qk;
using ::testing::Message;

const int kWidths[] = {0, 1, 2, 7, 8, 17, 34, 67};
std::mt19937 random_source(1);

std::vector<uint8_t> random_bytes(size_t count) {
    std::vector<uint8_t> bytes(count);
    for (uint8_t& byte : bytes) byte = static_cast<uint8_t>(random_source());
    return bytes;
}

// Runs `write(reference?, out)` into two equally prefilled buffers with 16
// guard bytes and compares every byte.
template <typename Write>
void expect_same_bytes(size_t outBytes, Write write) {
    std::vector<uint8_t> want(outBytes + 16, 0xC3), got(outBytes + 16, 0xC3);
    write(true, want.data());
    write(false, got.data());
    EXPECT_EQ(got, want);
}

TEST(RowVariants, RgbToRgbAndGreyToRgb) {
    for (int s = 0; s < kRgbFormatCount; ++s) {
        const GreyToRgbRow grey = select_grey_to_rgb_row(s);
        for (int width : kWidths) {
            SCOPED_TRACE(Message() << "grey to " << s << ", width " << width);
            const std::vector<uint8_t> luma = random_bytes(width);
            expect_same_bytes(width * kRgbLayouts[s].bytesPerPixel, [&](bool reference, uint8_t* out) {
                (reference ? grey_to_rgb_row_reference : grey)(luma.data(), out, width, kRgbLayouts[s]);
            });
        }
        for (int d = 0; d < kRgbFormatCount; ++d) {
            const RgbToRgbShape shape{kRgbLayouts[s], kRgbLayouts[d]};
            const RgbToRgbRow fast = select_rgb_to_rgb_row(s, d);
            for (int width : kWidths) {
                SCOPED_TRACE(Message() << s << " to " << d << ", width " << width);
                const std::vector<uint8_t> in = random_bytes(width * shape.src.bytesPerPixel);
                expect_same_bytes(width * shape.dst.bytesPerPixel, [&](bool reference, uint8_t* out) {
                    (reference ? rgb_to_rgb_row_reference : fast)(in.data(), out, width, shape);
                });
            }
        }
    }
}

TEST(RowVariants, RgbToLumaAndChroma) {
    for (int s = 0; s < kRgbFormatCount; ++s) {
        for (int step : {1, 2, 4}) {
            const RgbToYuvShape shape{kRgbLayouts[s], step, step};
            for (int width : kWidths) {
                SCOPED_TRACE(Message() << s << ", step " << step << ", width " << width);
                const std::vector<uint8_t> in = random_bytes(width * shape.src.bytesPerPixel);
                if (step != 4) {
                    const RgbToLumaRow fast = select_rgb_to_luma_row(s, step);
                    expect_same_bytes(width * step, [&](bool reference, uint8_t* out) {
                        (reference ? rgb_to_luma_row_reference : fast)(in.data(), out, width, shape);
                    });
                }
                const RgbToChromaRow fast = select_rgb_to_chroma_row(s, step);
                const int pairs = width / 2;
                expect_same_bytes(2 * pairs * step, [&](bool reference, uint8_t* out) {
                    (reference ? rgb_to_chroma_row_reference : fast)(in.data(), out, out + pairs * step, pairs,
                                                                     shape);
                });
            }
        }
    }
}

TEST(RowVariants, YuvToRgb) {
    struct Source {
        int lumaStep, chromaStep, rows;
    };
    for (int d = 0; d < kRgbFormatCount; ++d) {
        for (Source source : {Source{1, 1, 2}, Source{1, 2, 2}, Source{2, 4, 1}}) {
            const YuvToRgbShape shape{source.lumaStep, source.chromaStep, source.rows, kRgbLayouts[d]};
            const YuvToRgbRow fast = select_yuv_to_rgb_row(d, source.lumaStep, source.chromaStep, source.rows);
            for (int width : kWidths) {
                if (width % 2 != 0) continue;
                SCOPED_TRACE(Message() << d << ", chroma step " << source.chromaStep << ", width " << width);
                const std::vector<uint8_t> luma = random_bytes(2 * width * source.lumaStep);
                std::vector<uint8_t> u = random_bytes(width / 2 * source.chromaStep), v = u;
                for (uint8_t& byte : v) byte = static_cast<uint8_t>(random_source());
                if (width >= 4) {
                    // The one chroma pair whose pixels take the double path.
                    u[source.chromaStep] = 28;
                    v[source.chromaStep] = 228;
                }
                const size_t rowBytes = width * shape.dst.bytesPerPixel;
                expect_same_bytes(2 * rowBytes, [&](bool reference, uint8_t* out) {
                    const uint8_t* y1 = source.rows == 2 ? luma.data() + width : nullptr;
                    uint8_t* d1 = source.rows == 2 ? out + rowBytes : nullptr;
                    (reference ? yuv_to_rgb_row_reference : fast)(luma.data(), y1, u.data(), v.data(), out, d1,
                                                                  width, shape);
                });
            }
        }
    }
}

TEST(RowVariants, SamplesAndChromaBetweenSteps) {
    for (int from : {1, 2, 4}) {
        for (int to : {1, 2, 4}) {
            for (int count : kWidths) {
                SCOPED_TRACE(Message() << from << " to " << to << ", count " << count);
                const std::vector<uint8_t> in = random_bytes(count * from + 1);
                if (from != 4 && to != 4) {
                    const SampleRow fast = select_sample_row(from, to);
                    expect_same_bytes(count * to, [&](bool reference, uint8_t* out) {
                        (reference ? sample_row_reference : fast)(in.data(), from, out, to, count);
                    });
                }
                const ChromaRow fast = select_chroma_row(from, to);
                // V before U on the source side, U before V on the other.
                expect_same_bytes(2 * count * to, [&](bool reference, uint8_t* out) {
                    (reference ? chroma_row_reference : fast)(in.data() + 1, in.data(), from, out, out + count * to,
                                                              to, count);
                });
            }
        }
    }
}

TEST(Exhaustive, RgbToYuvGivesTheFormulaForEveryColour) {
    // One row per red value holding every (green, blue) at an even pixel, the
    // pixel whose colour the chroma is taken from; the odd pixels hold other
    // colours, (255 - r, b, g), so a kernel reading the wrong pixel of a pair shows.
    const int index = rgb_format_index(QK_FORMAT_BGR8);
    const RgbToYuvShape shape{kRgbLayouts[index], 1, 1};
    const RgbToLumaRow lumaRow = select_rgb_to_luma_row(index, 1);
    const RgbToChromaRow chromaRow = select_rgb_to_chroma_row(index, 1);
    constexpr int kPairs = 65536;
    std::vector<uint8_t> bgr(2 * kPairs * 3), luma(2 * kPairs), u(kPairs), v(kPairs);
    long mismatches = 0;
    for (int r = 0; r < 256; ++r) {
        for (int k = 0; k < kPairs; ++k) {
            const uint8_t b = uint8_t(k), g = uint8_t(k >> 8), pair[6] = {b, g, uint8_t(r), g, b, uint8_t(255 - r)};
            std::copy_n(pair, 6, &bgr[6 * k]);
        }
        lumaRow(bgr.data(), luma.data(), 2 * kPairs, shape);
        chromaRow(bgr.data(), u.data(), v.data(), kPairs, shape);
        for (int k = 0; k < kPairs; ++k) {
            const int g = k >> 8, b = k & 255;
            const qktest::Yuv want = formula_rgb_to_yuv(r, g, b), odd = formula_rgb_to_yuv(255 - r, b, g);
            if (luma[2 * k] != want.y || u[k] != want.u || v[k] != want.v || luma[2 * k + 1] != odd.y) {
                if (++mismatches <= 5) ADD_FAILURE() << "R,G,B " << r << "," << g << "," << b;
            }
        }
    }
    EXPECT_EQ(mismatches, 0);
}

TEST(Exhaustive, YuvToRgbMatchesDoublePrecisionForEveryTriple) {
    // For each chroma pair, two rows of 128 lumas (0..127 and 128..255) that
    // share 64 copies of that pair, as a 4:2:0 row pair does.
    const int index = rgb_format_index(QK_FORMAT_RGBA);
    const YuvToRgbShape shape{1, 2, 2, kRgbLayouts[index]};
    const YuvToRgbRow row = select_yuv_to_rgb_row(index, 1, 2, 2);
    constexpr int kWidth = 128;
    std::vector<uint8_t> luma(2 * kWidth), chroma(kWidth), rgba(2 * kWidth * 4);
    for (int i = 0; i < 2 * kWidth; ++i) luma[i] = static_cast<uint8_t>(i);
    long mismatches = 0;
    for (int u = 0; u < 256; ++u) {
        for (int v = 0; v < 256; ++v) {
            for (int j = 0; j < kWidth; ++j) chroma[j] = static_cast<uint8_t>(j % 2 == 0 ? u : v);
            row(luma.data(), luma.data() + kWidth, chroma.data(), chroma.data() + 1, rgba.data(),
                rgba.data() + kWidth * 4, kWidth, shape);
            for (int y = 0; y < 256; ++y) {
                const qktest::Rgb want = formula_yuv_to_rgb(y, u, v);
                const uint8_t* got = &rgba[4 * y];
                if (got[0] != want.r || got[1] != want.g || got[2] != want.b || got[3] != 255) {
                    if (++mismatches <= 5) ADD_FAILURE() << "Y,U,V " << y << "," << u << "," << v;
                }
            }
        }
    }
    EXPECT_EQ(mismatches, 0);
}

}  // namespace
