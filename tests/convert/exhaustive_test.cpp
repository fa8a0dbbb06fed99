// The colour arithmetic of the row kernels against the plain formulas over
// the whole input domain: all 2^24 RGB colours and all 2^24 (Y, U, V).
#include <gtest/gtest.h>

#include <vector>

#include "convert/formulas.h"
#include "convert/layout.h"
#include "convert/row.h"

namespace {

using qktest::formula_rgb_to_yuv;
using qktest::formula_yuv_to_rgb;

TEST(Exhaustive, RgbToYuvGivesTheFormulaForEveryColour) {
    // One row per red value holding every (green, blue) at an even pixel, the
    // pixel whose colour the chroma is taken from; the odd pixels hold other
    // colours, so a kernel reading the wrong pixel of a pair shows.
    const int index = qk::rgb_format_index(QK_FORMAT_BGR8);
    const qk::RgbToYuvShape shape{qk::kRgbLayouts[index], 1, 1};
    const qk::RgbToLumaRow lumaRow = qk::select_rgb_to_luma_row(index, 1);
    const qk::RgbToChromaRow chromaRow = qk::select_rgb_to_chroma_row(index, 1);
    constexpr int kPairs = 65536;
    std::vector<uint8_t> bgr(2 * kPairs * 3), luma(2 * kPairs), u(kPairs), v(kPairs);
    long mismatches = 0;
    for (int r = 0; r < 256; ++r) {
        for (int k = 0; k < kPairs; ++k) {
            uint8_t* pair = &bgr[6 * k];
            pair[0] = static_cast<uint8_t>(k), pair[1] = static_cast<uint8_t>(k >> 8), pair[2] = static_cast<uint8_t>(r);
            // The odd pixel is (255 - r, b, g).
            pair[3] = static_cast<uint8_t>(k >> 8), pair[4] = static_cast<uint8_t>(k), pair[5] = static_cast<uint8_t>(255 - r);
        }
        lumaRow(bgr.data(), luma.data(), 2 * kPairs, shape);
        chromaRow(bgr.data(), u.data(), v.data(), kPairs, shape);
        for (int k = 0; k < kPairs; ++k) {
            const int g = k >> 8, b = k & 255;
            const qktest::Yuv want = formula_rgb_to_yuv(r, g, b);
            const qktest::Yuv odd = formula_rgb_to_yuv(255 - r, b, g);
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
    const int index = qk::rgb_format_index(QK_FORMAT_RGBA);
    const qk::YuvToRgbShape shape{1, 2, 2, qk::kRgbLayouts[index]};
    const qk::YuvToRgbRow row = qk::select_yuv_to_rgb_row(index, 1, 2, 2);
    constexpr int kWidth = 128;
    std::vector<uint8_t> luma(2 * kWidth), chroma(kWidth), rgba(2 * kWidth * 4);
    for (int i = 0; i < 2 * kWidth; ++i) luma[i] = static_cast<uint8_t>(i);
    long mismatches = 0;
    for (int u = 0; u < 256; ++u) {
        for (int v = 0; v < 256; ++v) {
            for (int j = 0; j < kWidth / 2; ++j) chroma[2 * j] = static_cast<uint8_t>(u), chroma[2 * j + 1] = static_cast<uint8_t>(v);
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
