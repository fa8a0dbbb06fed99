// Choosing row kernels: the instruction sets this CPU supports are read once
// per process; each select_* asks their kernel sets, best first, and then the
// portable set, which answers every request.
#include <atomic>

#if defined(__x86_64__)
#include <emmintrin.h>
#endif

#include "convert/row.h"

namespace qk {
namespace {

std::atomic<bool> g_simd_enabled{true};

SupportedRowSets detect_row_sets() {
    SupportedRowSets supported{};
#if defined(__x86_64__)
    // libgcc's checks include the operating system's saving of the AVX
    // registers, not only the CPUID bits.
    __builtin_cpu_init();
    if (__builtin_cpu_supports("avx512f") && __builtin_cpu_supports("avx512bw"))
        supported.sets[supported.count++] = &kAvx512Rows;
    if (__builtin_cpu_supports("avx2")) supported.sets[supported.count++] = &kAvx2Rows;
    if (__builtin_cpu_supports("ssse3")) supported.sets[supported.count++] = &kSsse3Rows;
#elif defined(__aarch64__)
    supported.sets[supported.count++] = &kNeonRows;  // NEON is baseline on AArch64
#endif
    return supported;
}

// The first kernel that an enabled set offers, else the portable one.
template <typename Row, typename... Args>
Row choose(Row (*RowKernelSet::*selector)(Args...), Args... args) {
    if (simd_enabled()) {
        const SupportedRowSets& supported = supported_row_sets();
        for (int i = 0; i < supported.count; ++i) {
            const auto select = supported.sets[i]->*selector;
            if (select == nullptr) continue;
            if (const Row row = select(args...)) return row;
        }
    }
    return (kPortableRows.*selector)(args...);
}

}  // namespace

const SupportedRowSets& supported_row_sets() {
    static const SupportedRowSets supported = detect_row_sets();
    return supported;
}

void set_simd_enabled(bool enabled) { g_simd_enabled.store(enabled, std::memory_order_relaxed); }
bool simd_enabled() { return g_simd_enabled.load(std::memory_order_relaxed); }

RgbToRgbRow select_rgb_to_rgb_row(int src_index, int dst_index) {
    return choose(&RowKernelSet::rgbToRgb, src_index, dst_index);
}
RgbToLumaRow select_rgb_to_luma_row(int src_index, int luma_step) {
    return choose(&RowKernelSet::rgbToLuma, src_index, luma_step);
}
RgbToChromaRow select_rgb_to_chroma_row(int src_index, int chroma_step) {
    return choose(&RowKernelSet::rgbToChroma, src_index, chroma_step);
}
YuvToRgbRow select_yuv_to_rgb_row(int dst_index, int luma_step, int chroma_step, int rows) {
    return choose(&RowKernelSet::yuvToRgb, dst_index, luma_step, chroma_step, rows);
}
GreyToRgbRow select_grey_to_rgb_row(int dst_index) { return choose(&RowKernelSet::greyToRgb, dst_index); }
SampleRow select_sample_row(int src_step, int dst_step) {
    return choose(&RowKernelSet::sample, src_step, dst_step);
}
ChromaRow select_chroma_row(int src_step, int dst_step) {
    return choose(&RowKernelSet::chroma, src_step, dst_step);
}

#if defined(__x86_64__)
constexpr YuvFactorVectors repeat_factors() {
    YuvFactorVectors vectors{};
    for (int f = 0; f < kYuvFactorCount; ++f) {
        for (int16_t& word : vectors.word[f]) word = kYuvFactorValues[f];
    }
    return vectors;
}
const YuvFactorVectors kYuvFactorVectors = repeat_factors();
#endif

void finish_streaming() {
#if defined(__x86_64__)
    _mm_sfence();
#endif
}

PackRow select_pack_row(int chroma_step) { return choose(&RowKernelSet::pack, chroma_step); }
UnpackRow select_unpack_row() { return choose(&RowKernelSet::unpack); }

}  // namespace qk
