#include "image/format.h"

namespace qk {

const FormatInfo* find_format(uint32_t code) {
    for (const FormatInfo& format : kFormats) {
        if (format.code == code) return &format;
    }
    return nullptr;
}

const YuvLayout& yuv_layout(uint32_t code) {
    static constexpr YuvLayout kNone{};
    const FormatInfo* format = find_format(code);
    return format != nullptr ? format->yuv : kNone;
}

ChromaStart chroma_start(uint32_t format, uint64_t base, int32_t width, int32_t height) {
    const YuvLayout& layout = yuv_layout(format);
    if (!layout.subsampledRows) return {static_cast<uint64_t>(layout.uOffset), static_cast<uint64_t>(layout.vOffset)};
    const uint64_t plane = static_cast<uint64_t>(static_cast<int64_t>(width) * height / 4);
    return {base + layout.uOffset + layout.uPlanes * plane, base + layout.vOffset + layout.vPlanes * plane};
}

int rgb_format_index(uint32_t code) {
    const FormatInfo* format = find_format(code);
    if (format == nullptr || format->family != FormatFamily::kRgb) return -1;
    return static_cast<int>(format - kFormats);
}

}  // namespace qk
