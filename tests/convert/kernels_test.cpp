// The row kernels: every faster variant against its reference kernel for
// every layout it is chosen for, each row at the very end of its memory, and
// their colour arithmetic against the plain formulas over the whole input
// domain (all 2^24 RGB colours and all 2^24 (Y, U, V)).
#include <gtest/gtest.h>
#include <signal.h>
#include <string.h>
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <functional>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "convert/reference_frame.h"
#include "convert/row.h"
#include "image/format.h"

namespace {

using qktest::formula_rgb_to_yuv;
using qktest::formula_yuv_to_rgb;
using namespace qk;

// The rows of one run of a kernel, each at the very end of memory of its
// own, before a page nobody may touch: a kernel that reads or writes one byte
// past a row faults, in every build. Inputs are random, the same for the
// reference and the variant; outputs start as 0xC3.
class Rows {
public:
    explicit Rows(unsigned seed) : random_(seed) {}
    ~Rows() {
        for (auto [base, span] : maps_) munmap(base, span);
    }
    uint8_t* in(size_t bytes) { return std::generate_n(row(bytes), bytes, std::ref(random_)) - bytes; }
    uint8_t* out(size_t bytes) {
        outs_.emplace_back(static_cast<uint8_t*>(memset(row(bytes), 0xC3, bytes)), bytes);
        return outs_.back().first;
    }
    // U and V rows of `count` samples `step` apart: two planes (1), one row
    // of pairs (2), or in the pixel pairs of a packed 4:2:2 row (4: bytes 1, 3).
    std::pair<uint8_t*, uint8_t*> chroma(bool output, int step, int count) {
        auto row = [&](size_t bytes) { return output ? out(bytes) : in(bytes); };
        if (step == 1) return {row(count), row(count)};
        uint8_t* pairs = row(size_t(count) * step) + (step == 4);
        return {pairs, pairs + step / 2};
    }
    std::vector<uint8_t> written() const {
        std::vector<uint8_t> all;
        for (auto [row, bytes] : outs_) all.insert(all.end(), row, row + bytes);
        return all;
    }

private:
    uint8_t* row(size_t bytes) {
        const size_t page = size_t(sysconf(_SC_PAGESIZE)), span = (bytes + page - 1) / page * page + page;
        void* base = mmap(nullptr, span, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
        if (base == MAP_FAILED || mprotect(static_cast<uint8_t*>(base) + span - page, page, PROT_NONE) != 0) abort();
        maps_.emplace_back(base, span);
        return static_cast<uint8_t*>(base) + span - page - bytes;
    }
    std::mt19937 random_;
    std::vector<std::pair<void*, size_t>> maps_;
    std::vector<std::pair<uint8_t*, size_t>> outs_;
};

// A kernel under test: a run of its reference (true) or of the variant
// chosen for it (false) over `width` pixels.
using Run = std::function<void(bool reference, int width, Rows& rows)>;

std::vector<std::pair<std::string, Run>> every_kernel() {
    std::vector<std::pair<std::string, Run>> all;
    for (int s = 0; s < kRgbFormatCount; ++s) {
        const RgbLayout rgb = kFormats[s].rgb;
        const size_t bpp = size_t(rgb.bytesPerPixel);
        const std::string from = kFormats[s].name;
        all.emplace_back("GREY to " + from, [=](bool ref, int w, Rows& r) {
            (ref ? grey_to_rgb_row_reference : select_grey_to_rgb_row(s))(r.in(w), r.out(w * bpp), w, rgb);
        });
        for (int d = 0; d < kRgbFormatCount; ++d) {
            const RgbToRgbShape shape{rgb, kFormats[d].rgb};
            all.emplace_back(from + " to " + kFormats[d].name, [=](bool ref, int w, Rows& r) {
                (ref ? rgb_to_rgb_row_reference : select_rgb_to_rgb_row(s, d))(
                    r.in(w * bpp), r.out(size_t(w) * shape.dst.bytesPerPixel), w, shape);
            });
        }
        for (int step : {1, 2, 4}) {
            const RgbToYuvShape shape{rgb, step, step};
            const std::string name = from + " to step " + std::to_string(step);
            if (step != 4) {
                all.emplace_back(name + " luma", [=](bool ref, int w, Rows& r) {
                    (ref ? rgb_to_luma_row_reference : select_rgb_to_luma_row(s, step))(
                        r.in(w * bpp), r.out(size_t(w) * step), w, shape);
                });
            }
            all.emplace_back(name + " chroma", [=](bool ref, int w, Rows& r) {
                const uint8_t* in = r.in(w / 2 * 2 * bpp);
                const auto [u, v] = r.chroma(true, step, w / 2);
                (ref ? rgb_to_chroma_row_reference : select_rgb_to_chroma_row(s, step))(in, u, v, w / 2, shape);
            });
        }
        // Planar and semi-planar 4:2:0 (two luma rows over one chroma row)
        // and packed 4:2:2, even widths only. The second chroma pair takes
        // the double path.
        for (int chromaStep : {1, 2, 4}) {
            const int lumaStep = chromaStep == 4 ? 2 : 1, rows = 3 - lumaStep;
            const YuvToRgbShape shape{lumaStep, chromaStep, rows, rgb};
            all.emplace_back("YUV step " + std::to_string(chromaStep) + " to " + from, [=](bool ref, int w, Rows& r) {
                const int even = w / 2 * 2;
                uint8_t* y0 = r.in(size_t(even) * lumaStep);
                uint8_t* y1 = rows == 2 ? r.in(even) : nullptr;
                auto [u, v] = rows == 2 ? r.chroma(false, chromaStep, even / 2) : std::pair{y0 + 1, y0 + 3};
                if (even >= 4) u[chromaStep] = 28, v[chromaStep] = 228;
                uint8_t* d0 = r.out(even * bpp);
                uint8_t* d1 = rows == 2 ? r.out(even * bpp) : nullptr;
                (ref ? yuv_to_rgb_row_reference : select_yuv_to_rgb_row(s, lumaStep, chromaStep, rows))(
                    y0, y1, u, v, d0, d1, even, shape);
            });
        }
    }
    for (int from : {1, 2, 4}) {
        for (int to : {1, 2, 4}) {
            const std::string name = std::to_string(from) + " to " + std::to_string(to);
            if (from != 4 && to != 4) {
                all.emplace_back("samples " + name, [=](bool ref, int w, Rows& r) {
                    (ref ? sample_row_reference : select_sample_row(from, to))(
                        r.in(size_t(w) * from), from, r.out(size_t(w) * to), to, w);
                });
            }
            // V before U on the source side, U before V on the other.
            all.emplace_back("chroma " + name, [=](bool ref, int w, Rows& r) {
                const auto [v, u] = r.chroma(false, from, w);
                const auto [du, dv] = r.chroma(true, to, w);
                (ref ? chroma_row_reference : select_chroma_row(from, to))(u, v, from, du, dv, to, w);
            });
        }
    }
    return all;
}

// What a fault says: the kernel and width that ran past a row.
std::string running;
extern "C" void report_fault(int) {
    write(2, running.data(), running.size());
    _exit(1);
}

// Every width up to 67: tails of every length.
TEST(RowVariants, EveryVariantWritesExactlyTheBytesOfItsReferenceWithinItsRows) {
    signal(SIGSEGV, report_fault);
    for (const auto& [name, run] : every_kernel()) {
        for (int width = 0; width <= 67; ++width) {
            running = name + ", width " + std::to_string(width) + ": a row was overrun\n";
            Rows reference{unsigned(width)}, variant{unsigned(width)};
            run(true, width, reference);
            run(false, width, variant);
            EXPECT_EQ(variant.written(), reference.written()) << name << ", width " << width;
        }
    }
    signal(SIGSEGV, SIG_DFL);
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
