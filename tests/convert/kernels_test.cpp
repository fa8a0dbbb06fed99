// The row kernels: every kernel set this CPU supports (portable, and each
// SIMD set) against the reference kernel for every layout it serves, each row
// at the very end of its memory, and their colour arithmetic against the
// plain formulas over the whole input domain (all 2^24 RGB colours and all
// 2^24 (Y, U, V)).
#include <gtest/gtest.h>
#include <signal.h>
#include <string.h>
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <functional>
#include <memory>
#include <numeric>
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

// Every kernel set this CPU can run, the portable one first.
std::vector<const RowKernelSet*> every_set() {
    std::vector<const RowKernelSet*> sets{&kPortableRows};
    const SupportedRowSets& supported = supported_row_sets();
    sets.insert(sets.end(), supported.sets, supported.sets + supported.count);
    return sets;
}

// The kernel a set offers (null where it has none), or for no set the
// reference.
template <typename Row, typename... Args>
Row pick(const RowKernelSet* set, Row reference, Row (*RowKernelSet::*selector)(Args...), Args... args) {
    if (set == nullptr) return reference;
    const auto select = set->*selector;
    return select != nullptr ? select(args...) : nullptr;
}
#define QK_PICK(reference, selector, ...)                            \
    auto kernel = pick(set, reference, &RowKernelSet::selector, __VA_ARGS__); \
    if (kernel == nullptr) return false

// A kernel under test: a run over `width` pixels of the reference (no set)
// or of a set's kernel; false where the set has none.
using Run = std::function<bool(const RowKernelSet* set, int width, Rows& rows)>;

std::vector<std::pair<std::string, Run>> every_kernel() {
    std::vector<std::pair<std::string, Run>> all;
    for (int s = 0; s < kRgbFormatCount; ++s) {
        const RgbLayout rgb = kFormats[s].rgb;
        const size_t bpp = size_t(rgb.bytesPerPixel);
        const std::string from = kFormats[s].name;
        all.emplace_back("GREY to " + from, [=](const RowKernelSet* set, int w, Rows& r) {
            QK_PICK(grey_to_rgb_row_reference, greyToRgb, s);
            return kernel(r.in(w), r.out(w * bpp), w, rgb), true;
        });
        // Streamed where the set streams 4-byte pixels, at every alignment.
        for (const bool stream : {false, true}) {
            const std::string how = stream ? " streamed" : "";
            for (int d = 0; d < kRgbFormatCount; ++d) {
                const RgbToRgbShape shape{rgb, kFormats[d].rgb, stream};
                const std::string name = from + " to " + kFormats[d].name + how;
                all.emplace_back(name, [=](const RowKernelSet* set, int w, Rows& r) {
                    QK_PICK(rgb_to_rgb_row_reference, rgbToRgb, s, d);
                    return kernel(r.in(w * bpp), r.out(size_t(w) * shape.dst.bytesPerPixel), w, shape), true;
                });
            }
        }
        for (int step : {1, 2, 4}) {
            const RgbToYuvShape shape{rgb, step, step};
            const std::string name = from + " to step " + std::to_string(step);
            if (step != 4) {
                all.emplace_back(name + " luma", [=](const RowKernelSet* set, int w, Rows& r) {
                    QK_PICK(rgb_to_luma_row_reference, rgbToLuma, s, step);
                    return kernel(r.in(w * bpp), r.out(size_t(w) * step), w, shape), true;
                });
            }
            all.emplace_back(name + " chroma", [=](const RowKernelSet* set, int w, Rows& r) {
                QK_PICK(rgb_to_chroma_row_reference, rgbToChroma, s, step);
                const uint8_t* in = r.in(w / 2 * 2 * bpp);
                const auto [u, v] = r.chroma(true, step, w / 2);
                return kernel(in, u, v, w / 2, shape), true;
            });
        }
        // Planar and semi-planar 4:2:0 (two luma rows over one chroma row)
        // and packed 4:2:2, even widths only. The second chroma pair takes
        // the double path.
        for (int chromaStep : {1, 2, 4}) {
            for (const bool stream : {false, true}) {
                const int lumaStep = chromaStep == 4 ? 2 : 1, rows = 3 - lumaStep;
                const YuvToRgbShape shape{lumaStep, chromaStep, rows, rgb, stream};
                const std::string name =
                    "YUV step " + std::to_string(chromaStep) + " to " + from + (stream ? " streamed" : "");
                all.emplace_back(name, [=](const RowKernelSet* set, int w, Rows& r) {
                    QK_PICK(yuv_to_rgb_row_reference, yuvToRgb, s, lumaStep, chromaStep, rows);
                    const int even = w / 2 * 2;
                    uint8_t* y0 = r.in(size_t(even) * lumaStep);
                    uint8_t* y1 = rows == 2 ? r.in(even) : nullptr;
                    auto [u, v] = rows == 2 ? r.chroma(false, chromaStep, even / 2) : std::pair{y0 + 1, y0 + 3};
                    if (even >= 4) u[chromaStep] = 28, v[chromaStep] = 228;
                    uint8_t* d0 = r.out(even * bpp);
                    uint8_t* d1 = rows == 2 ? r.out(even * bpp) : nullptr;
                    return kernel(y0, y1, u, v, d0, d1, even, shape), true;
                });
            }
        }
    }
    for (int from : {1, 2, 4}) {
        for (int to : {1, 2, 4}) {
            const std::string name = std::to_string(from) + " to " + std::to_string(to);
            if (from != 4 && to != 4) {
                all.emplace_back("samples " + name, [=](const RowKernelSet* set, int w, Rows& r) {
                    QK_PICK(sample_row_reference, sample, from, to);
                    return kernel(r.in(size_t(w) * from), from, r.out(size_t(w) * to), to, w), true;
                });
            }
            // V before U on the source side, U before V on the other.
            for (const bool stream : {false, true}) {
                all.emplace_back("chroma " + name + (stream ? " streamed" : ""),
                                 [=](const RowKernelSet* set, int w, Rows& r) {
                                     QK_PICK(chroma_row_reference, chroma, from, to);
                                     const auto [v, u] = r.chroma(false, from, w);
                                     const auto [du, dv] = r.chroma(true, to, w);
                                     return kernel(u, v, from, du, dv, to, w, stream), true;
                                 });
            }
        }
    }
    // Planar luma and 4:2:0 chroma (V first) into packed 4:2:2, U first or V
    // first: step-2 pairs swapped or not.
    for (int step : {1, 2}) {
        for (int u_at : {1, 3}) {
            all.emplace_back("pack step " + std::to_string(step) + " U at " + std::to_string(u_at),
                             [=](const RowKernelSet* set, int w, Rows& r) {
                                 QK_PICK(pack_row_reference, pack, step);
                                 const int even = w / 2 * 2;
                                 const uint8_t* luma = r.in(even);
                                 const auto [v, u] = r.chroma(false, step, even / 2);
                                 uint8_t* dst = r.out(size_t(even) * 2);
                                 return kernel(luma, u, v, step, dst, dst + u_at, dst + 4 - u_at, even), true;
                             });
        }
    }
    // Packed 4:2:2 (U at byte 1 or 3) into luma and V-first pairs.
    for (int u_at : {1, 3}) {
        all.emplace_back("unpack U at " + std::to_string(u_at), [=](const RowKernelSet* set, int w, Rows& r) {
            const UnpackRow kernel = pick<UnpackRow>(set, unpack_row_reference, &RowKernelSet::unpack);
            if (kernel == nullptr) return false;
            const int even = w / 2 * 2;
            const uint8_t* src = r.in(size_t(even) * 2);
            uint8_t* luma = r.out(even);
            const auto [v, u] = r.chroma(true, 2, even / 2);
            return kernel(src, src + u_at, src + 4 - u_at, luma, u, v, even), true;
        });
    }
    return all;
}

// What a fault says: the kernel and width that ran past a row.
std::string running;
extern "C" void report_fault(int) {
    write(2, running.data(), running.size());
    _exit(1);
}

// Every width up to 67: tails of every length; and long rows, at and past
// the widest whose chroma the x86 4:2:0 kernels make once for both rows, and
// one whose 4-byte pixels start 16 bytes past a 64-byte boundary, as
// malloc's do (streamed, the blocks then start from the next boundary).
TEST(RowVariants, EveryVariantWritesExactlyTheBytesOfItsReferenceWithinItsRows) {
    signal(SIGSEGV, report_fault);
    std::vector<int> widths(68);
    std::iota(widths.begin(), widths.end(), 0);
    widths.insert(widths.end(), {2044, 2048, 2082});
    for (const RowKernelSet* set : every_set()) {
        for (const auto& [kernel, run] : every_kernel()) {
            const std::string name = std::string(set->name) + " " + kernel;
            for (int width : widths) {
                running = name + ", width " + std::to_string(width) + ": a row was overrun\n";
                Rows reference{unsigned(width)}, variant{unsigned(width)};
                if (!run(set, width, variant)) break;
                run(nullptr, width, reference);
                EXPECT_EQ(variant.written(), reference.written()) << name << ", width " << width;
            }
        }
    }
    signal(SIGSEGV, SIG_DFL);
}

// The best set this CPU supports that has the kernel answers first; turned
// off, only the portable set does.
TEST(RowSelection, SimdSetsComeFirstUnlessTurnedOff) {
    const int s = rgb_format_index(QK_FORMAT_RGBA), d = rgb_format_index(QK_FORMAT_BGRA);
    const SupportedRowSets& supported = supported_row_sets();
    RgbToRgbRow best = nullptr;
    for (int i = 0; i < supported.count && best == nullptr; ++i) {
        if (supported.sets[i]->rgbToRgb != nullptr) best = supported.sets[i]->rgbToRgb(s, d);
    }
    EXPECT_EQ(select_rgb_to_rgb_row(s, d), best != nullptr ? best : kPortableRows.rgbToRgb(s, d));
    set_simd_enabled(false);
    EXPECT_EQ(select_rgb_to_rgb_row(s, d), kPortableRows.rgbToRgb(s, d));
    set_simd_enabled(true);
}

// For every kernel set, on a 3-byte and a 4-byte layout.
TEST(Exhaustive, RgbToYuvGivesTheFormulaForEveryColour) {
    // One row per red value holding every (green, blue) at an even pixel, the
    // pixel whose colour the chroma is taken from; the odd pixels hold other
    // colours, (255 - r, b, g), so a kernel reading the wrong pixel of a pair shows.
    constexpr int kPairs = 65536;
    for (const RowKernelSet* set : every_set()) {
        for (uint32_t format : {QK_FORMAT_BGR8, QK_FORMAT_ARGB}) {
            const int index = rgb_format_index(format);
            const RgbLayout layout = kFormats[index].rgb;
            const RgbToYuvShape shape{layout, 1, 1};
            const RgbToLumaRow lumaRow = set->rgbToLuma ? set->rgbToLuma(index, 1) : nullptr;
            const RgbToChromaRow chromaRow = set->rgbToChroma ? set->rgbToChroma(index, 1) : nullptr;
            if (lumaRow == nullptr || chromaRow == nullptr) continue;
            const int bpp = layout.bytesPerPixel;
            std::vector<uint8_t> rgb(2 * kPairs * bpp, 7), luma(2 * kPairs), u(kPairs), v(kPairs);
            long mismatches = 0;
            for (int r = 0; r < 256; ++r) {
                for (int k = 0; k < kPairs; ++k) {
                    const uint8_t b = uint8_t(k), g = uint8_t(k >> 8);
                    uint8_t* pair = &rgb[2 * k * bpp];
                    pair[layout.rOffset] = uint8_t(r), pair[layout.gOffset] = g, pair[layout.bOffset] = b;
                    pair += bpp;
                    pair[layout.rOffset] = uint8_t(255 - r), pair[layout.gOffset] = b, pair[layout.bOffset] = g;
                }
                lumaRow(rgb.data(), luma.data(), 2 * kPairs, shape);
                chromaRow(rgb.data(), u.data(), v.data(), kPairs, shape);
                for (int k = 0; k < kPairs; ++k) {
                    const int g = k >> 8, b = k & 255;
                    const qktest::Yuv want = formula_rgb_to_yuv(r, g, b), odd = formula_rgb_to_yuv(255 - r, b, g);
                    if (luma[2 * k] != want.y || u[k] != want.u || v[k] != want.v || luma[2 * k + 1] != odd.y) {
                        if (++mismatches <= 5) {
                            ADD_FAILURE() << set->name << " " << kFormats[index].name << " R,G,B " << r << "," << g
                                          << "," << b;
                        }
                    }
                }
            }
            EXPECT_EQ(mismatches, 0) << set->name << " " << kFormats[index].name;
        }
    }
}

TEST(Exhaustive, YuvToRgbMatchesDoublePrecisionForEveryTriple) {
    // For each chroma pair, two rows of 128 lumas (0..127 and 128..255) that
    // share 64 copies of that pair, as a 4:2:0 row pair does.
    constexpr int kWidth = 128;
    for (const RowKernelSet* set : every_set()) {
        for (uint32_t format : {QK_FORMAT_RGB8, QK_FORMAT_BGRA}) {
            const int index = rgb_format_index(format);
            const RgbLayout layout = kFormats[index].rgb;
            const YuvToRgbShape shape{1, 2, 2, layout};
            const YuvToRgbRow row = set->yuvToRgb ? set->yuvToRgb(index, 1, 2, 2) : nullptr;
            if (row == nullptr) continue;
            const int bpp = layout.bytesPerPixel;
            std::vector<uint8_t> luma(2 * kWidth), chroma(kWidth), out(2 * kWidth * bpp);
            for (int i = 0; i < 2 * kWidth; ++i) luma[i] = static_cast<uint8_t>(i);
            long mismatches = 0;
            for (int u = 0; u < 256; ++u) {
                for (int v = 0; v < 256; ++v) {
                    for (int j = 0; j < kWidth; ++j) chroma[j] = static_cast<uint8_t>(j % 2 == 0 ? u : v);
                    row(luma.data(), luma.data() + kWidth, chroma.data(), chroma.data() + 1, out.data(),
                        out.data() + kWidth * bpp, kWidth, shape);
                    for (int y = 0; y < 256; ++y) {
                        const qktest::Rgb want = formula_yuv_to_rgb(y, u, v);
                        const uint8_t* got = &out[bpp * y];
                        if (got[layout.rOffset] != want.r || got[layout.gOffset] != want.g ||
                            got[layout.bOffset] != want.b || (bpp == 4 && got[layout.aOffset] != 255)) {
                            if (++mismatches <= 5) {
                                ADD_FAILURE() << set->name << " " << kFormats[index].name << " Y,U,V " << y << ","
                                              << u << "," << v;
                            }
                        }
                    }
                }
            }
            EXPECT_EQ(mismatches, 0) << set->name << " " << kFormats[index].name;
        }
    }
}

}  // namespace
