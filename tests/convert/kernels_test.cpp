// The row kernels: every faster variant against its reference kernel for
// every layout it is chosen for, and their colour arithmetic against the
// plain formulas over the whole input domain (all 2^24 RGB colours and all
// 2^24 (Y, U, V)).
#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <random>
#include <string>
#include <tuple>
#include <vector>

#include "convert/reference_frame.h"
#include "convert/row.h"
#include "image/format.h"

namespace {

using qktest::formula_rgb_to_yuv;
using qktest::formula_yuv_to_rgb;
using namespace qk;

// A kernel under test: the bytes it writes for `width` pixels, and a run of
// its reference (true) or of the variant chosen for it (false) from `in`,
// whose first 1024 bytes may hold luma and the next two 1024 U and V.
struct Kernel {
    std::string name;
    std::function<size_t(int width)> out_bytes;
    std::function<void(bool reference, int width, uint8_t* in, uint8_t* out)> run;
};

std::vector<Kernel> every_kernel() {
    std::vector<Kernel> all;
    auto add = [&all](const std::string& name, auto out_bytes, auto run) { all.push_back({name, out_bytes, run}); };
    for (int s = 0; s < kRgbFormatCount; ++s) {
        const RgbLayout rgb = kFormats[s].rgb;
        const std::string from = std::to_string(s);
        add("grey to " + from, [=](int w) { return size_t(w) * rgb.bytesPerPixel; },
            [=](bool ref, int w, uint8_t* in, uint8_t* out) {
                (ref ? grey_to_rgb_row_reference : select_grey_to_rgb_row(s))(in, out, w, rgb);
            });
        for (int d = 0; d < kRgbFormatCount; ++d) {
            const RgbToRgbShape shape{rgb, kFormats[d].rgb};
            add(from + " to " + std::to_string(d), [=](int w) { return size_t(w) * shape.dst.bytesPerPixel; },
                [=](bool ref, int w, uint8_t* in, uint8_t* out) {
                    (ref ? rgb_to_rgb_row_reference : select_rgb_to_rgb_row(s, d))(in, out, w, shape);
                });
        }
        for (int step : {1, 2, 4}) {
            const RgbToYuvShape shape{rgb, step, step};
            const std::string name = from + " to step " + std::to_string(step);
            if (step != 4) {
                add(name + " luma", [=](int w) { return size_t(w) * step; },
                    [=](bool ref, int w, uint8_t* in, uint8_t* out) {
                        (ref ? rgb_to_luma_row_reference : select_rgb_to_luma_row(s, step))(in, out, w, shape);
                    });
            }
            add(name + " chroma", [=](int w) { return size_t(w / 2) * 2 * step; },
                [=](bool ref, int w, uint8_t* in, uint8_t* out) {
                    (ref ? rgb_to_chroma_row_reference : select_rgb_to_chroma_row(s, step))(
                        in, out, out + w / 2 * step, w / 2, shape);
                });
        }
        // Even widths only; one chroma pair whose pixels take the double path.
        for (auto [lumaStepOf, chromaStepOf, rowsOf] : {std::tuple{1, 1, 2}, {1, 2, 2}, {2, 4, 1}}) {
            // Structured bindings cannot be captured before C++20.
            const int lumaStep = lumaStepOf, chromaStep = chromaStepOf, rows = rowsOf;
            const YuvToRgbShape shape{lumaStep, chromaStep, rows, rgb};
            add("YUV step " + std::to_string(chromaStep) + " to " + from,
                [=](int w) { return size_t(w / 2) * 4 * rgb.bytesPerPixel; },
                [=](bool ref, int w, uint8_t* in, uint8_t* out) {
                    const int even = w / 2 * 2;
                    in[1024 + chromaStep] = 28, in[2048 + chromaStep] = 228;
                    (ref ? yuv_to_rgb_row_reference : select_yuv_to_rgb_row(s, lumaStep, chromaStep, rows))(
                        in, rows == 2 ? in + even : nullptr, in + 1024, in + 2048, out,
                        rows == 2 ? out + even * rgb.bytesPerPixel : nullptr, even, shape);
                });
        }
    }
    for (int from : {1, 2, 4}) {
        for (int to : {1, 2, 4}) {
            const std::string name = std::to_string(from) + " to " + std::to_string(to);
            if (from != 4 && to != 4) {
                add("samples " + name, [=](int w) { return size_t(w) * to; },
                    [=](bool ref, int w, uint8_t* in, uint8_t* out) {
                        (ref ? sample_row_reference : select_sample_row(from, to))(in, from, out, to, w);
                    });
            }
            // V before U on the source side, U before V on the other.
            add("chroma " + name, [=](int w) { return size_t(w) * 2 * to; },
                [=](bool ref, int w, uint8_t* in, uint8_t* out) {
                    const ChromaRow row = ref ? chroma_row_reference : select_chroma_row(from, to);
                    row(in + 1, in, from, out, out + w * to, to, w);
                });
        }
    }
    return all;
}

// Same random input, widths that leave tails, and 16 guard bytes after the
// output that neither kernel may touch.
TEST(RowVariants, EveryVariantWritesExactlyTheBytesOfItsReference) {
    std::mt19937 random(1);
    for (const Kernel& kernel : every_kernel()) {
        for (int width : {0, 1, 2, 7, 8, 17, 34, 67}) {
            std::vector<uint8_t> in(3072);
            for (uint8_t& byte : in) byte = static_cast<uint8_t>(random());
            std::vector<uint8_t> want(kernel.out_bytes(width) + 16, 0xC3), got = want;
            kernel.run(true, width, in.data(), want.data());
            kernel.run(false, width, in.data(), got.data());
            EXPECT_EQ(got, want) << kernel.name << ", width " << width;
        }
    }
}

TEST(Exhaustive, RgbToYuvGivesTheFormulaForEveryColour) {
    // One row per red value holding every (green, blue) at an even pixel, the
    // pixel whose colour the chroma is taken from; the odd pixels hold other
    // colours, (255 - r, b, g), so a kernel reading the wrong pixel of a pair shows.
    const int index = rgb_format_index(QK_FORMAT_BGR8);
    const RgbToYuvShape shape{kFormats[index].rgb, 1, 1};
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
    const YuvToRgbShape shape{1, 2, 2, kFormats[index].rgb};
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
